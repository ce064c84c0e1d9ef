#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <sstream>
#include <string>

using tsd_test::fatalText;
using tsd_test::MessageCapture;
using TV = Tsd_TimeValue;

namespace {

// The specifications of one test, made on first use of their TSid.
class Specs {
public:
    Tsd_DelayPath* operator[](const std::string& tsid) {
        auto& slot = m_specs[tsid];
        if (!slot)
            slot = std::make_unique<Tsd_DelayPath>(tsid.c_str());
        return slot.get();
    }
    Tsd_DelayPath* delay(const std::string& tsid, double value, TV::Units units) {
        (*this)[tsid]->setDelayValue(TV(value, units));
        return (*this)[tsid];
    }
    Tsd_DelayPath* link(const std::string& tsid, const std::string& to, bool multiply,
                        double factor) {
        (*this)[tsid]->setLinkData((*this)[to], multiply, factor);
        return (*this)[tsid];
    }

private:
    std::map<std::string, std::unique_ptr<Tsd_DelayPath>> m_specs;
};

} // namespace

TEST(EndpointSpec, LinkArithmeticKeepsTheUnitAtTheEndOfTheChain) {
    const struct {
        double value;
        TV::Units units;
        bool multiply;
        double factor;
        double expected;
        const char* text;
    } cases[] = {
        {10, TV::UNITS_NS, true, 2, 20, "TS02*2"},
        {10, TV::UNITS_NS, false, 2.5, 4, "TS02/2.5"},
        {100, TV::UNITS_MHZ, true, 2, 200, "TS02*2"},
        {1, TV::UNITS_GHZ, false, 4, 0.25, "TS02/4"},
    };
    for (const auto& c : cases) {
        Specs s;
        s.delay("TS02", c.value, c.units);
        TV v = s.link("TS01", "TS02", c.multiply, c.factor)->getDelayValue();
        EXPECT_DOUBLE_EQ(v.value, c.expected) << c.text;
        EXPECT_EQ(v.units, c.units) << c.text;
        EXPECT_EQ(tsd_test::propOf(*s["TS01"]).value, c.text);
    }
    MessageCapture capture;
    Specs s;
    s.delay("TS04", 5, TV::UNITS_NS)->setIgnored(); // an ignored end with a delay is sound
    s.link("TS03", "TS04", false, 4);
    s.link("TS02", "TS03", true, 2);
    s.link("TS01", "TS02", true, 1);
    EXPECT_DOUBLE_EQ(s["TS01"]->getDelayValue().value, 2.5);
    EXPECT_EQ(s["TS01"]->checkLink(true), 0);
    s["TS09"]->setIgnored(); // a TIG path needs no delay
    EXPECT_EQ(s["TS09"]->checkLink(true), 0);
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST(EndpointSpec, CheckLinkCountsAndReportsWhatIsWrong) {
    MessageCapture capture;
    Specs s;
    s["TS09"]->setIgnored();
    s.link("TS02", "TS09", true, 3);
    s.link("TS01", "TS02", true, 2);
    EXPECT_EQ(s["TS01"]->checkLink(false), 1);
    EXPECT_TRUE(capture.sink.records.empty());
    EXPECT_EQ(s["TS01"]->checkLink(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Specification \"TS01\" is defined in terms of specification \"TS09\", "
              "which is an ignored path.\n");

    capture.sink.clear();
    s.delay("TS12", 10, TV::UNITS_NS);
    EXPECT_EQ(s.link("TS11", "TS12", false, 0)->checkLink(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Delay expression for specification \"TS11\" contains a division by zero: "
              "\"TS12 / 0\"\n");

    capture.sink.clear();
    s.link("TS23", "TS22", false, 2);
    s.link("TS22", "TS23", true, 1.5);
    EXPECT_EQ(s.link("TS21", "TS22", true, 1)->checkLink(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Specification \"TS21\" is defined in terms of a circular TSid link, as "
              "follows:\n"
              "status:    TS21 is defined as TS22 * 1\n"
              "status:    TS22 is defined as TS23 * 1.5\n"
              "status:    TS23 is defined as TS22 / 2\n");

    // Two zero divisors, then a circle: the walk goes on past each divisor.
    s.link("TS33", "TS32", false, 0);
    s.link("TS32", "TS33", false, 0);
    EXPECT_EQ(s.link("TS31", "TS32", true, 1)->checkLink(false), 3);
}

TEST(EndpointSpec, BrokenChainsAreFatal) {
    MessageCapture capture;
    Specs s;
    s["TS01"]->setLinkData(nullptr, true, 2); // pending
    int code = 0;
    EXPECT_EQ(fatalText([&] { s["TS01"]->checkLink(true); }, &code), "NULL link in spec TS01.\n");
    EXPECT_EQ(code, 2);
    EXPECT_EQ(fatalText([&] { s["TS01"]->getDelayValue(); }),
              "Unresolved link or ignored spec in getDelayValue() on spec TS01\n");
    s["TS09"]->setIgnored();
    EXPECT_EQ(fatalText([&] { s.link("TS02", "TS09", true, 1)->getDelayValue(); }),
              "Unresolved link or ignored spec in getDelayValue() on spec TS09\n");
    s.delay("TS06", 10, TV::UNITS_NS);
    s.link("TS05", "TS06", false, 0);
    EXPECT_EQ(fatalText([&] { s.link("TS07", "TS05", true, 2)->getDelayValue(); }),
              "Divide by zero in spec TS05\n");
    EXPECT_EQ(fatalText([] { Tsd_Period p(nullptr); }), "Tsd_EndpointSpec with NULL TSid\n");

    // A circle that nobody checked ends in a message, not a stack overflow.
    s.link("TS13", "TS12", true, 1);
    s.link("TS12", "TS13", true, 1);
    EXPECT_EQ(fatalText([&] { s.link("TS11", "TS12", true, 1)->getDelayValue(); }, &code),
              "Circular TSid link in getDelayValue() on spec TS11\n");
    EXPECT_EQ(code, 2);
}

TEST(EndpointSpec, LongChainsNeedNoDeepStack) {
    std::vector<std::unique_ptr<Tsd_DelayPath>> specs;
    specs.push_back(std::make_unique<Tsd_DelayPath>("TS0"));
    specs[0]->setDelayValue(TV(1, TV::UNITS_PS));
    for (int i = 1; i <= 100000; ++i) {
        specs.push_back(std::make_unique<Tsd_DelayPath>(("TS" + std::to_string(i)).c_str()));
        specs[i]->setLinkData(specs[i - 1].get(), i % 2 == 0, 2.0); // doubled, then halved
    }
    EXPECT_EQ(specs.back()->checkLink(false), 0);
    EXPECT_DOUBLE_EQ(specs.back()->getDelayValue().value, 1.0);
}

TEST(EndpointSpec, CopiesAndDump) {
    Tsd_DelayPath target("TS02");
    Tsd_TIGGroup tig("TS01");
    auto source = std::make_unique<Tsd_DelayPath>("TS01");
    source->setLinkData(&target, false, 2.5);
    source->setPriority(3);
    source->setIgnoreGroup(&tig);
    source->setScope("core");
    Tsd_DelayPath copy(*source);
    source->setLinkData(&target, true, 9);
    source.reset();

    std::ostringstream out;
    DumpStream stream(out);
    copy.Tsd_EndpointSpec::dump(stream, 0);
    EXPECT_EQ(out.str(), "Tsd_EndpointSpec TS01\n"
                         "   delay unset\n"
                         "   link: TS02/2.5\n"
                         "   priority: 3\n"
                         "   holds TIG group: TS01\n"
                         "   constraint scope: core\n");
    copy.setLinkData(nullptr, true, 2);
    EXPECT_NE(tsd_test::dumpText(copy).find("\n      link with NULL TSid pointer\n"),
              std::string::npos);
}

// -1 is "no priority" to callers; written as -1 in the text, it is kept for
// the written text and the dump, and forgotten by setPriority/clearPriority.
TEST(EndpointSpec, PriorityWrittenAsMinusOne) {
    Tsd_DelayPath path("TS01");
    path.setDelayValue(TV(1, TV::UNITS_NS));
    path.setWrittenPriority(-1);
    EXPECT_FALSE(path.hasPriority());
    EXPECT_EQ(path.getPriority(), -1);
    EXPECT_TRUE(path.hasWrittenPriority());
    Tsd_DelayPath copy(path);
    EXPECT_NE(tsd_test::dumpText(copy).find("\n      priority: -1\n"), std::string::npos);

    const struct {
        void (*change)(Tsd_DelayPath&);
        bool written;
    } cases[] = {
        {[](Tsd_DelayPath& p) { p.setPriority(-1); }, false},
        {[](Tsd_DelayPath& p) { p.clearPriority(); }, false},
        {[](Tsd_DelayPath& p) { p.setWrittenPriority(4); }, true},
        {[](Tsd_DelayPath& p) { p.setPriority(0); }, true},
    };
    for (const auto& c : cases) {
        Tsd_DelayPath p(copy);
        c.change(p);
        EXPECT_EQ(p.hasWrittenPriority(), c.written);
        EXPECT_EQ(p.hasPriority(), p.getPriority() != -1);
    }
}
