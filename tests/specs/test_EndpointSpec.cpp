#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <memory>
#include <sstream>
#include <string>
#include <vector>

using tsd_test::dumpText;
using tsd_test::fatalText;
using tsd_test::MessageCapture;
using TV = Tsd_TimeValue;

namespace {

// Keeps the specs of one test and links them by TSid.
class Chain {
public:
    Tsd_DelayPath* spec(const char* tsid) {
        for (auto& s : m_specs)
            if (std::string(s->getTSid()) == tsid)
                return s.get();
        m_specs.push_back(std::make_unique<Tsd_DelayPath>(tsid));
        return m_specs.back().get();
    }
    Tsd_DelayPath* delay(const char* tsid, double value, TV::Units units) {
        Tsd_DelayPath* s = spec(tsid);
        s->setDelayValue(TV(value, units));
        return s;
    }
    Tsd_DelayPath* link(const char* tsid, const char* to, bool multiply, double factor) {
        Tsd_DelayPath* s = spec(tsid);
        s->setLinkData(spec(to), multiply, factor);
        return s;
    }

private:
    std::vector<std::unique_ptr<Tsd_DelayPath>> m_specs;
};

} // namespace

TEST(EndpointSpec, LinkArithmeticKeepsTheUnitAtTheEndOfTheChain) {
    struct Case {
        double value;
        TV::Units units;
        bool multiply;
        double factor;
        double expected;
        const char* text;
    };
    const Case cases[] = {
        {10, TV::UNITS_NS, true, 2, 20, "TS02*2"},
        {10, TV::UNITS_NS, false, 2.5, 4, "TS02/2.5"},
        {100, TV::UNITS_MHZ, true, 2, 200, "TS02*2"}, // the number scales, the unit stays
        {8000, TV::UNITS_PS, false, 4, 2000, "TS02/4"},
        {1, TV::UNITS_GHZ, true, 0.5, 0.5, "TS02*0.5"},
        {3, TV::UNITS_US, false, 3, 1, "TS02/3"},
    };
    for (const Case& c : cases) {
        Chain chain;
        chain.delay("TS02", c.value, c.units);
        Tsd_DelayPath* ts01 = chain.link("TS01", "TS02", c.multiply, c.factor);
        TV v = ts01->getDelayValue();
        EXPECT_DOUBLE_EQ(v.value, c.expected) << c.text;
        EXPECT_EQ(v.units, c.units) << c.text;
        EXPECT_EQ(tsd_test::propOf(*ts01).value, c.text);
        EXPECT_EQ(ts01->checkLink(true), 0);
    }
}

TEST(EndpointSpec, ChainsApplyEveryLink) {
    MessageCapture capture;
    Chain chain;
    chain.delay("TS04", 5, TV::UNITS_NS);
    chain.link("TS03", "TS04", false, 4);
    chain.link("TS02", "TS03", true, 2);
    Tsd_DelayPath* ts01 = chain.link("TS01", "TS02", true, 1);
    TV v = ts01->getDelayValue();
    EXPECT_DOUBLE_EQ(v.value, 2.5);
    EXPECT_EQ(v.units, TV::UNITS_NS);
    EXPECT_EQ(ts01->checkLink(true), 0);
    // A chain that ends at an ignored spec with a delay is sound.
    chain.spec("TS04")->setIgnored();
    EXPECT_EQ(ts01->checkLink(true), 0);
    EXPECT_DOUBLE_EQ(ts01->getDelayValue().value, 2.5);
    EXPECT_TRUE(capture.sink.records.empty());

    // Frequencies through a chain: 100 MHz / 4 * 2.
    Chain f;
    f.delay("TSC", 100, TV::UNITS_MHZ);
    f.link("TSB", "TSC", false, 4);
    TV fv = f.link("TSA", "TSB", true, 2)->getDelayValue();
    EXPECT_DOUBLE_EQ(fv.value, 50);
    EXPECT_EQ(fv.units, TV::UNITS_MHZ);
}

TEST(EndpointSpec, CheckLinkOnSpecsThatNeedNoChain) {
    MessageCapture capture;
    Chain chain;
    Tsd_DelayPath* direct = chain.delay("TS01", 1, TV::UNITS_NS);
    EXPECT_EQ(direct->checkLink(true), 0);
    Tsd_DelayPath* tig = chain.spec("TS09");
    tig->setIgnored();
    EXPECT_EQ(tig->checkLink(true), 0); // a TIG path without delay
    tig->setLinkData(nullptr, true, 1);
    EXPECT_EQ(tig->checkLink(true), 0); // ignored comes before the link test
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST(EndpointSpec, CheckLinkReportsAnIgnoredEnd) {
    MessageCapture capture;
    Chain chain;
    chain.spec("TS09")->setIgnored();
    chain.link("TS02", "TS09", true, 3);
    Tsd_DelayPath* ts01 = chain.link("TS01", "TS02", true, 2);
    EXPECT_EQ(ts01->checkLink(false), 1);
    EXPECT_TRUE(capture.sink.records.empty());
    EXPECT_EQ(ts01->checkLink(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Specification \"TS01\" is defined in terms of specification \"TS09\", "
              "which is an ignored path.\n");
}

TEST(EndpointSpec, CheckLinkCountsZeroDivisorsAndGoesOn) {
    MessageCapture capture;
    Chain chain;
    chain.delay("TS02", 10, TV::UNITS_NS);
    Tsd_DelayPath* ts01 = chain.link("TS01", "TS02", false, 0);
    EXPECT_EQ(ts01->checkLink(false), 1);
    EXPECT_TRUE(capture.sink.records.empty());
    EXPECT_EQ(ts01->checkLink(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Delay expression for specification \"TS01\" contains a division by zero: "
              "\"TS02 / 0\"\n");
    // Multiplying by zero is no division.
    EXPECT_EQ(chain.link("TS03", "TS02", true, 0)->checkLink(true), 0);
    EXPECT_EQ(chain.spec("TS03")->getDelayValue().value, 0.0);
}

TEST(EndpointSpec, CheckLinkReportsCirclesWithTheWholeWalk) {
    MessageCapture capture;
    Chain two;
    two.link("TS02", "TS01", true, 1);
    Tsd_DelayPath* ts01 = two.link("TS01", "TS02", true, 1);
    EXPECT_EQ(ts01->checkLink(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Specification \"TS01\" is defined in terms of a circular TSid link, as "
              "follows:\n"
              "status:    TS01 is defined as TS02 * 1\n"
              "status:    TS02 is defined as TS01 * 1\n");

    capture.sink.clear();
    Chain lead;
    lead.link("TS03", "TS02", false, 2);
    lead.link("TS02", "TS03", true, 1.5);
    Tsd_DelayPath* start = lead.link("TS01", "TS02", true, 1);
    EXPECT_EQ(start->checkLink(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Specification \"TS01\" is defined in terms of a circular TSid link, as "
              "follows:\n"
              "status:    TS01 is defined as TS02 * 1\n"
              "status:    TS02 is defined as TS03 * 1.5\n"
              "status:    TS03 is defined as TS02 / 2\n");

    capture.sink.clear();
    Chain self;
    Tsd_DelayPath* ts05 = self.link("TS05", "TS05", true, 2);
    EXPECT_EQ(ts05->checkLink(false), 1);
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST(EndpointSpec, ZeroDivisorsAndACircleAddUp) {
    MessageCapture capture;
    Chain chain;
    chain.link("TS03", "TS02", false, 0);
    chain.link("TS02", "TS03", false, 0);
    Tsd_DelayPath* ts01 = chain.link("TS01", "TS02", true, 1);
    EXPECT_EQ(ts01->checkLink(true), 3);
    EXPECT_EQ(capture.sink.errors().size(), 3u);
    EXPECT_EQ(capture.sink.statuses().size(), 3u);
}

TEST(EndpointSpec, UnresolvedAndBrokenChainsAreFatal) {
    MessageCapture capture;
    Chain chain;
    Tsd_DelayPath* pending = chain.spec("TS01");
    pending->setLinkData(nullptr, true, 2);
    int code = 0;
    EXPECT_EQ(fatalText([&] { pending->checkLink(true); }, &code), "NULL link in spec TS01.\n");
    EXPECT_EQ(code, 2);
    EXPECT_EQ(fatalText([&] { pending->getDelayValue(); }, &code),
              "Unresolved link or ignored spec in getDelayValue() on spec TS01\n");
    EXPECT_EQ(code, 2);

    // The message names the spec where the chain breaks.
    chain.spec("TS09")->setIgnored();
    chain.link("TS02", "TS09", true, 1);
    EXPECT_EQ(fatalText([&] { chain.spec("TS02")->getDelayValue(); }),
              "Unresolved link or ignored spec in getDelayValue() on spec TS09\n");
    chain.link("TS03", "TS04", true, 1);
    chain.spec("TS04");
    EXPECT_EQ(fatalText([&] { chain.spec("TS03")->checkLink(false); }),
              "NULL link in spec TS04.\n");

    chain.delay("TS06", 10, TV::UNITS_NS);
    chain.link("TS05", "TS06", false, 0);
    chain.link("TS07", "TS05", true, 2);
    EXPECT_EQ(fatalText([&] { chain.spec("TS07")->getDelayValue(); }, &code),
              "Divide by zero in spec TS05\n");
    EXPECT_EQ(code, 2);
}

TEST(EndpointSpec, GetDelayValueOnACircleEndsInAFatalMessage) {
    MessageCapture capture;
    Chain chain;
    chain.link("TS03", "TS02", true, 1);
    chain.link("TS02", "TS03", true, 1);
    Tsd_DelayPath* ts01 = chain.link("TS01", "TS02", true, 1);
    int code = 0;
    EXPECT_EQ(fatalText([&] { ts01->getDelayValue(); }, &code),
              "Circular TSid link in getDelayValue() on spec TS01\n");
    EXPECT_EQ(code, 2);
    Tsd_DelayPath* self = chain.link("TS08", "TS08", false, 2);
    EXPECT_EQ(fatalText([&] { self->getDelayValue(); }),
              "Circular TSid link in getDelayValue() on spec TS08\n");
}

TEST(EndpointSpec, LongChainsNeedNoDeepStack) {
    // Deeper than a recursive walk could go on the call stack.
    const int length = 100000;
    std::vector<std::unique_ptr<Tsd_DelayPath>> specs;
    specs.push_back(std::make_unique<Tsd_DelayPath>("TS0"));
    specs.back()->setDelayValue(TV(1, TV::UNITS_PS));
    for (int i = 1; i <= length; ++i) {
        specs.push_back(std::make_unique<Tsd_DelayPath>(("TS" + std::to_string(i)).c_str()));
        // Alternately doubled and halved: the value comes back to 1.
        specs.back()->setLinkData(specs[i - 1].get(), i % 2 == 0, 2.0);
    }
    EXPECT_EQ(specs.back()->checkLink(false), 0);
    EXPECT_DOUBLE_EQ(specs.back()->getDelayValue().value, 1.0);
}

TEST(EndpointSpec, DelayAndLinkReplaceEachOther) {
    Chain chain;
    Tsd_DelayPath* other = chain.delay("TS02", 1, TV::UNITS_NS);
    Tsd_DelayPath* s = chain.spec("TS01");
    EXPECT_FALSE(s->isLinked());
    EXPECT_EQ(s->getLinkedSpec(), nullptr);
    EXPECT_FALSE(s->isLinkMultiplied());
    EXPECT_EQ(s->getLinkFactor(), 0.0);
    s->setLinkData(other, true, 3);
    EXPECT_TRUE(s->isLinked());
    EXPECT_EQ(s->getLinkedSpec(), other);
    EXPECT_TRUE(s->isLinkMultiplied());
    EXPECT_EQ(s->getLinkFactor(), 3.0);
    s->setDelayValue(TV(7, TV::UNITS_NS));
    EXPECT_FALSE(s->isLinked());
    EXPECT_TRUE(s->hasDelayValue());
    s->setLinkData(nullptr, false, 2); // pending
    EXPECT_FALSE(s->hasDelayValue());
    EXPECT_TRUE(s->isLinked());
    EXPECT_EQ(s->getLinkedSpec(), nullptr);
    EXPECT_FALSE(s->isLinkMultiplied());
    EXPECT_EQ(s->getLinkFactor(), 2.0);
}

TEST(EndpointSpec, PriorityAndIgnoreGroup) {
    Tsd_Period p("TS01");
    EXPECT_FALSE(p.hasPriority());
    EXPECT_EQ(p.getPriority(), -1);
    p.setPriority(0);
    EXPECT_TRUE(p.hasPriority());
    p.setPriority(-1);
    EXPECT_FALSE(p.hasPriority());
    p.setPriority(5);
    p.clearPriority();
    EXPECT_FALSE(p.hasPriority());
    Tsd_TIGGroup tig("TS01");
    p.setIgnoreGroup(&tig);
    EXPECT_EQ(p.getIgnoreGroup(), &tig);
    EXPECT_FALSE(p.isIgnored()); // a period is never an ignored path
}

TEST(EndpointSpec, FormatLink) {
    Tsd_DelayPath ts02("TS02");
    Tsd_EndpointSpec::LinkData times{&ts02, true, 2};
    Tsd_EndpointSpec::LinkData divided{&ts02, false, 2.5};
    Tsd_EndpointSpec::LinkData zero{&ts02, false, 0};
    Tsd_EndpointSpec::LinkData pending{nullptr, true, 2};
    EXPECT_STREQ(formatLink(&times, ""), "TS02*2");
    EXPECT_STREQ(formatLink(&divided, ""), "TS02/2.5");
    EXPECT_STREQ(formatLink(&divided, nullptr), "TS02/2.5");
    EXPECT_STREQ(formatLink(&zero, " "), "TS02 / 0");
    EXPECT_STREQ(formatLink(&times, " "), "TS02 * 2");
    EXPECT_EQ(formatLink(&pending, ""), nullptr);
    EXPECT_EQ(formatLink(nullptr, ""), nullptr);
    ts02.setTSid(nullptr);
    EXPECT_EQ(formatLink(&times, ""), nullptr);
}

TEST(EndpointSpec, NullTSidIsFatal) {
    MessageCapture capture;
    int code = 0;
    EXPECT_EQ(fatalText([] { Tsd_DelayPath path(nullptr); }, &code),
              "Tsd_EndpointSpec with NULL TSid\n");
    EXPECT_EQ(code, 2);
    EXPECT_EQ(fatalText([] { auto p = std::make_unique<Tsd_Period>(nullptr); }),
              "Tsd_EndpointSpec with NULL TSid\n");
}

TEST(EndpointSpec, CopiesOwnTheirDelayAndLink) {
    Tsd_DelayPath target("TS02");
    auto source = std::make_unique<Tsd_DelayPath>("TS01");
    source->setLinkData(&target, false, 4);
    source->setScope("top/sub");
    source->setPriority(2);
    Tsd_DelayPath copy(*source);
    source->setLinkData(&target, true, 9);
    source.reset();
    EXPECT_STREQ(copy.getTSid(), "TS01");
    EXPECT_STREQ(copy.getScope(), "top/sub");
    EXPECT_EQ(copy.getLinkedSpec(), &target);
    EXPECT_FALSE(copy.isLinkMultiplied());
    EXPECT_EQ(copy.getLinkFactor(), 4.0);
    EXPECT_EQ(copy.getPriority(), 2);

    Tsd_DelayPath direct("TS03");
    direct.setDelayValue(TV(3, TV::UNITS_NS));
    Tsd_DelayPath directCopy(direct);
    direct.setDelayValue(TV(5, TV::UNITS_NS));
    EXPECT_EQ(directCopy.getDelayValue().value, 3.0);
}

TEST(EndpointSpec, DumpGolden) {
    Tsd_DelayPath ts02("TS02");
    Tsd_TIGGroup tig("TS01");
    Tsd_DelayPath spec("TS01");
    spec.setLinkData(&ts02, false, 2.5);
    spec.setPriority(3);
    spec.setIgnoreGroup(&tig);
    spec.setScope("core");
    // The endpoint part alone, as a subclass's dump writes it.
    const Tsd_EndpointSpec& base = spec;
    std::ostringstream out;
    DumpStream stream(out);
    base.Tsd_EndpointSpec::dump(stream, 0);
    EXPECT_EQ(out.str(), "Tsd_EndpointSpec TS01\n"
                         "   delay unset\n"
                         "   link: TS02/2.5\n"
                         "   priority: 3\n"
                         "   holds TIG group: TS01\n"
                         "   constraint scope: core\n");

    Tsd_Period period("TS05");
    period.setDelayValue(TV(10, TV::UNITS_NS));
    std::ostringstream out2;
    DumpStream stream2(out2);
    period.Tsd_EndpointSpec::dump(stream2, 1);
    EXPECT_EQ(out2.str(), "   Tsd_EndpointSpec TS05\n"
                          "      delay: 10 nS\n"
                          "      link unset\n"
                          "      priority unset\n"
                          "      holds no TIG group\n");

    period.setLinkData(nullptr, true, 2);
    std::ostringstream out3;
    DumpStream stream3(out3);
    period.Tsd_EndpointSpec::dump(stream3, 0);
    EXPECT_NE(out3.str().find("\n   link with NULL TSid pointer\n"), std::string::npos);
}
