// Time values and numbers, TSid links, and the property texts and dumps of
// every specification class (specs.golden).
#include "TsdTestSupport.h"

#include <cstring>
#include <functional>
#include <limits>
#include <map>
#include <memory>

using namespace tsd_test;
using TV = Tsd_TimeValue;
using UG = Tsd_UserGroup;

TEST(TimeValue, ConversionsGoThroughPicoseconds) {
    const struct {
        double value;
        TV::Units from, to;
        double expected;
    } cases[] = {
        {10, TV::UNITS_NS, TV::UNITS_MHZ, 100},  {100, TV::UNITS_MHZ, TV::UNITS_NS, 10},
        {1, TV::UNITS_US, TV::UNITS_KHZ, 1000},  {2, TV::UNITS_GHZ, TV::UNITS_PS, 500},
        {10, TV::UNITS_NS, TV::UNITS_PS, 10000}, {1, TV::UNITS_MS, TV::UNITS_US, 1000},
        {2500, TV::UNITS_PS, TV::UNITS_NS, 2.5}, {1, TV::UNITS_GHZ, TV::UNITS_MHZ, 1000},
        {250, TV::UNITS_MHZ, TV::UNITS_NS, 4},   {1, TV::UNITS_KHZ, TV::UNITS_MS, 1},
    };
    for (const auto& c : cases)
        EXPECT_DOUBLE_EQ(TV(c.value, c.from).getValue(c.to), c.expected)
            << c.value << " " << TV::getUnitWord(c.from) << " -> " << TV::getUnitWord(c.to);
    const double inf = std::numeric_limits<double>::infinity();
    EXPECT_EQ(TV().getValue(TV::UNITS_MS), 0.0); // the default: 0 pS
    EXPECT_EQ(TV(0.0, TV::UNITS_GHZ).getValue(TV::UNITS_GHZ), 0.0);
    EXPECT_EQ(TV(0.0, TV::UNITS_GHZ).getValue(TV::UNITS_NS), inf);
    EXPECT_EQ(TV(0.0, TV::UNITS_NS).getValue(TV::UNITS_MHZ), inf);

    TV v(10, TV::UNITS_NS);
    v.changeUnits(TV::UNITS_MHZ);
    EXPECT_EQ(v.units, TV::UNITS_MHZ);
    EXPECT_DOUBLE_EQ(v.value, 100);
    TV odd(0.1 + 0.2, TV::UNITS_US);
    const double before = odd.value;
    odd.changeUnits(TV::UNITS_US); // the same unit: bit for bit unchanged
    EXPECT_EQ(std::memcmp(&before, &odd.value, sizeof before), 0);

    MessageCapture capture;
    TV bad(5, static_cast<TV::Units>(9));
    int code = 0;
    EXPECT_EQ(fatalText([&] { (void)bad.getValue(TV::UNITS_NS); }, &code), "Unit unmatched.\n");
    EXPECT_EQ(code, 2);
    EXPECT_EQ(fatalText([&] { (void)ns(5).getValue(static_cast<TV::Units>(-1)); }),
              "Unit unmatched.\n");
    EXPECT_EQ(bad.getValue(static_cast<TV::Units>(9)), 5.0); // the same unit needs no row
    EXPECT_STREQ(bad.getString(":"), "5:");                  // and its text no message
}

TEST(TimeValue, TextOfValuesAndNumbers) {
    const struct {
        TV value;
        const char* separator;
        const char* text;
    } values[] = {
        {TV(), ":", "0:pS"},
        {ns(1.5), ":", "1.5:nS"},
        {ns(0.000000001), ":", "0.000000001:nS"},
        {ns(0.0000000004), ":", "0:nS"},
        {ns(10), nullptr, "10nS"},
        {ns(10), " ", "10 nS"},
        {TV(100, TV::UNITS_MHZ), ":", "100:MHz"},
        {TV(2, TV::UNITS_KHZ), "", "2kHz"},
        {TV(1, TV::UNITS_GHZ), ":", "1:GHz"},
        {TV(3, TV::UNITS_US), ":", "3:uS"},
        {TV(4, TV::UNITS_MS), ":", "4:mS"},
        {TV(7, TV::UNITS_PS), ":", "7:pS"},
    };
    for (const auto& c : values)
        EXPECT_STREQ(c.value.getString(c.separator), c.text);
    const char* first = ns(1).getString(":"); // overwritten by the next call
    TV(2, TV::UNITS_PS).getString(":");
    EXPECT_STREQ(first, "2:pS");

    const struct {
        double d;
        const char* text;
    } numbers[] = {
        {10, "10"},
        {2.5, "2.5"},
        {0.1, "0.1"},
        {1.23456789012, "1.23456789"},
        {-3.75, "-3.75"},
        {0.0000000001, "0"},
        {0, "0"},
        {33.3333333333, "33.333333333"},
        {-0.0000000001, "-0"},
        {1e20, "100000000000000000000"},
        {std::numeric_limits<double>::infinity(), "inf"},
    };
    for (const auto& c : numbers)
        EXPECT_STREQ(formatNumber(c.d), c.text) << c.d;
}

namespace {

// The delay paths of one test, made on first use of their TSid.
class Specs {
public:
    Tsd_DelayPath* operator[](const std::string& tsid) {
        auto& slot = m_specs[tsid];
        if (!slot)
            slot = std::make_unique<Tsd_DelayPath>(tsid.c_str());
        return slot.get();
    }
    Tsd_DelayPath* delay(const std::string& tsid, TV value) {
        (*this)[tsid]->setDelayValue(value);
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
        TV value;
        bool multiply;
        double factor;
        double expected;
        const char* text;
    } cases[] = {
        {ns(10), true, 2, 20, "TS02*2"},
        {ns(10), false, 2.5, 4, "TS02/2.5"},
        {TV(100, TV::UNITS_MHZ), true, 2, 200, "TS02*2"},
        {TV(1, TV::UNITS_GHZ), false, 4, 0.25, "TS02/4"},
    };
    for (const auto& c : cases) {
        Specs s;
        s.delay("TS02", c.value);
        TV v = s.link("TS01", "TS02", c.multiply, c.factor)->getDelayValue();
        EXPECT_DOUBLE_EQ(v.value, c.expected) << c.text;
        EXPECT_EQ(v.units, c.value.units) << c.text;
        EXPECT_EQ(propText(*s["TS01"]), std::string("TS01 = ") + c.text);
    }
    MessageCapture capture;
    Specs s;
    s.delay("TS04", ns(5))->setIgnored(); // an ignored end with a delay is sound
    s.link("TS03", "TS04", false, 4);
    s.link("TS02", "TS03", true, 2);
    s.link("TS01", "TS02", true, 1);
    EXPECT_DOUBLE_EQ(s["TS01"]->getDelayValue().value, 2.5);
    EXPECT_EQ(s["TS01"]->checkLink(true), 0);
    s["TS09"]->setIgnored(); // a TIG path needs no delay
    EXPECT_EQ(s["TS09"]->checkLink(true), 0);
    EXPECT_TRUE(capture.sink.records.empty());

    // A chain deeper than a recursive walk could go, doubled and halved.
    std::vector<std::unique_ptr<Tsd_DelayPath>> chain;
    chain.push_back(std::make_unique<Tsd_DelayPath>("TS0"));
    chain[0]->setDelayValue(TV(1, TV::UNITS_PS));
    for (int i = 1; i <= 100000; ++i) {
        chain.push_back(std::make_unique<Tsd_DelayPath>(("TS" + std::to_string(i)).c_str()));
        chain[i]->setLinkData(chain[i - 1].get(), i % 2 == 0, 2.0);
    }
    EXPECT_EQ(chain.back()->checkLink(false), 0);
    EXPECT_DOUBLE_EQ(chain.back()->getDelayValue().value, 1.0);
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
    s.delay("TS12", ns(10));
    EXPECT_EQ(s.link("TS11", "TS12", false, 0)->checkLink(true), 1);
    s.link("TS23", "TS22", false, 2);
    s.link("TS22", "TS23", true, 1.5);
    EXPECT_EQ(s.link("TS21", "TS22", true, 1)->checkLink(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Specification \"TS01\" is defined in terms of specification \"TS09\", "
              "which is an ignored path.\n"
              "error: Delay expression for specification \"TS11\" contains a division by zero: "
              "\"TS12 / 0\"\n"
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
    s["TS09"]->setIgnored();
    s.delay("TS06", ns(10));
    s.link("TS05", "TS06", false, 0);
    s.link("TS13", "TS12", true, 1);
    s.link("TS12", "TS13", true, 1);
    const struct {
        std::function<void()> body;
        const char* message;
    } cases[] = {
        {[&] { s["TS01"]->checkLink(true); }, "NULL link in spec TS01.\n"},
        {[&] { s["TS01"]->getDelayValue(); },
         "Unresolved link or ignored spec in getDelayValue() on spec TS01\n"},
        {[&] { s.link("TS02", "TS09", true, 1)->getDelayValue(); },
         "Unresolved link or ignored spec in getDelayValue() on spec TS09\n"},
        {[&] { s.link("TS07", "TS05", true, 2)->getDelayValue(); },
         "Divide by zero in spec TS05\n"},
        {[] { Tsd_Period p(nullptr); }, "Tsd_EndpointSpec with NULL TSid\n"},
        // A circle nobody checked ends in a message, not a stack overflow.
        {[&] { s.link("TS11", "TS12", true, 1)->getDelayValue(); },
         "Circular TSid link in getDelayValue() on spec TS11\n"},
    };
    for (const auto& c : cases) {
        int code = 0;
        EXPECT_EQ(fatalText(c.body, &code), c.message);
        EXPECT_EQ(code, 2);
    }
}

// -1 is "no priority" to callers; written as -1 in the text, it is kept for
// the written text and the dump, and forgotten by setPriority/clearPriority.
TEST(EndpointSpec, PriorityWrittenAsMinusOne) {
    Tsd_DelayPath path("TS01");
    path.setDelayValue(ns(1));
    path.setWrittenPriority(-1);
    EXPECT_FALSE(path.hasPriority());
    EXPECT_EQ(path.getPriority(), -1);
    const struct {
        void (*change)(Tsd_DelayPath&);
        bool written;
    } cases[] = {
        {[](Tsd_DelayPath&) {}, true},
        {[](Tsd_DelayPath& p) { p.setPriority(-1); }, false},
        {[](Tsd_DelayPath& p) { p.clearPriority(); }, false},
        {[](Tsd_DelayPath& p) { p.setWrittenPriority(4); }, true},
        {[](Tsd_DelayPath& p) { p.setPriority(0); }, true},
    };
    for (const auto& c : cases) {
        Tsd_DelayPath p(path); // copies keep the written -1
        c.change(p);
        EXPECT_EQ(p.hasWrittenPriority(), c.written);
        EXPECT_EQ(p.hasPriority(), p.getPriority() != -1);
    }
}

TEST(Specs, DelayValuesOfDutyCyclesAndThruIterators) {
    MessageCapture capture;
    Tsd_Period base("TS01");
    base.setDelayValue(ns(10));
    base.setDutyCyclePercent(40, true);
    EXPECT_DOUBLE_EQ(base.getDutyCycleValue().value, 4);
    Tsd_Period linked("TS02"); // through the link: 25 % of 20 nS
    linked.setLinkData(&base, true, 2);
    linked.setDutyCycleValue(ns(3), true);
    linked.setDutyCyclePercent(25, true); // replaces the absolute value
    EXPECT_DOUBLE_EQ(linked.getDutyCycleValue().value, 5);
    base.setDelayValue(TV(100, TV::UNITS_MHZ)); // from a frequency, in nS
    base.setDutyCyclePercent(50, false);
    EXPECT_EQ(base.getDutyCycleValue().units, TV::UNITS_NS);
    EXPECT_DOUBLE_EQ(base.getDutyCycleValue().value, 5);
    base.setLinkData(&linked, true, 1); // now a circle, checked without a report
    EXPECT_EQ(fatalText([&] { linked.getDutyCycleValue(); }),
              "Bad link on TS02 getting duty cycle.\n");
    EXPECT_TRUE(capture.sink.errors().empty());

    Tsd_NetTiming net;
    EXPECT_EQ(fatalText([&] { net.getDutyCycleValue(); }), "No duty cycle without period.\n");
    net.setPeriodValue(TV(100, TV::UNITS_MHZ));
    net.setDutyCyclePercent(50, true);
    EXPECT_EQ(net.getDutyCycleValue().units, TV::UNITS_NS);
    EXPECT_DOUBLE_EQ(net.getDutyCycleValue().value, 5);
    net.setMaxSkewValue(TV(500, TV::UNITS_PS)); // a net timing is of one kind
    EXPECT_FALSE(net.hasPeriod() || net.hasDutyCycle() || net.hasInputJitter());
    EXPECT_EQ(net.getPeriodValue().value, 0.0);
    net.setPeriodValue(ns(5));
    EXPECT_FALSE(net.hasMaxSkew() || net.hasMaxDelay());

    // Each optional time reads back what was set, and zero once cleared.
    Tsd_Period period("TS03");
    Tsd_GroupOffset offset;
    const std::vector<std::pair<std::function<void(const TV&)>, std::function<TV()>>> values{
        {[&](const TV& v) { net.setMaxDelayValue(v); }, [&] { return net.getMaxDelayValue(); }},
        {[&](const TV& v) { net.setMaxSkewValue(v); }, [&] { return net.getMaxSkewValue(); }},
        {[&](const TV& v) { net.setPeriodValue(v); }, [&] { return net.getPeriodValue(); }},
        {[&](const TV& v) { net.setInputJitter(v); }, [&] { return net.getInputJitterValue(); }},
        {[&](const TV& v) { period.setInputJitter(v); },
         [&] { return period.getInputJitterValue(); }},
        {[&](const TV& v) { offset.setOffsetValue(v); }, [&] { return offset.getOffsetValue(); }},
    };
    for (std::size_t i = 0; i < values.size(); ++i) {
        SCOPED_TRACE(i);
        values[i].first(ns(static_cast<double>(i) + 1));
        EXPECT_DOUBLE_EQ(values[i].second().value, static_cast<double>(i) + 1);
    }
    net.clearInputJitter();
    period.clearInputJitter();
    offset.removeOffsetValue();
    for (std::size_t i = 3; i < values.size(); ++i)
        EXPECT_EQ(values[i].second().value, 0.0);
    EXPECT_EQ(offset.getDataValidValue().value, 0.0);

    Tsd_ThruGroup t1("t1"), t2("t2");
    Tsd_DelayPath p("TS01");
    EXPECT_EQ(p.createThruIter(), nullptr);
    p.addThru(&t1);
    p.addThru(&t2);
    EXPECT_FALSE(p.removeThru(nullptr)); // a hole is not a group
    auto iter = p.createThruIter();
    ASSERT_NE(iter, nullptr);
    EXPECT_EQ(iter->next(), &t1);
    EXPECT_TRUE(p.removeThru(&t1));
    EXPECT_FALSE(p.removeThru(&t1));
    EXPECT_TRUE(p.removeThru(&t2));
    EXPECT_EQ(p.createThruIter(), nullptr);
}

// Every object is described by a copy where the class has one, made before
// its source changes and goes: the copy must own what it holds.
TEST(Specs, PropertiesAndDumps) {
    std::string text;
    auto add = [&](const std::string& title, const Tsd_BaseObj& obj, bool dump = true) {
        text += "== " + title + "\n" + (dump ? describe(obj) : propText(obj) + "\n");
    };
    Tsd_TNMGroup a("ffs_a"), b("ffs_b"), pads("pads"), odd("*x"), clk2("clk"), hash("#clk");
    Tsd_ThruGroup t1("t1"), t2("t2"), t3("t3");
    Tsd_ClkGroup clk("clk"), fb("clk_fb"), slash("/");
    Tsd_TIGGroup tig("TS01");
    Tsd_DelayPath ts01("TS01"), ts02("TS02");

    // Delay paths: ends, THRU points, delay or link or TIG, flags, priority.
    const struct {
        Tsd_TermGroup *start, *end;
        std::vector<Tsd_ThruGroup*> thru;
        std::function<void(Tsd_DelayPath&)> set;
    } paths[] = {
        {&a, &b, {}, [](Tsd_DelayPath& p) { p.setDelayValue(ns(10)); }},
        {&pads,
         &a,
         {&t1, &t2},
         [&](Tsd_DelayPath& p) {
             p.setLinkData(&ts01, false, 2);
             p.setDataPathOnly();
         }},
        {&b,
         &pads,
         {},
         [](Tsd_DelayPath& p) {
             p.setIgnored();
             p.setPriority(1);
         }},
        {nullptr,
         &b,
         {&t2, &t1},
         [](Tsd_DelayPath& p) {
             p.setDelayValue(TV(10000, TV::UNITS_PS));
             p.setPriority(0);
         }},
        {&a,
         nullptr,
         {},
         [](Tsd_DelayPath& p) { // a delay wins over TIG
             p.setDelayValue(ns(10));
             p.setIgnored();
         }},
        {&odd,
         nullptr,
         {},
         [](Tsd_DelayPath& p) {
             p.setIgnored();
             p.setDataPathOnly();
         }},
        {nullptr, nullptr, {}, [](Tsd_DelayPath&) {}},
    };
    for (const auto& c : paths) {
        auto p = std::make_unique<Tsd_DelayPath>("TS10");
        p->setStart(c.start);
        p->setEnd(c.end);
        for (Tsd_ThruGroup* t : c.thru)
            p->addThru(t);
        c.set(*p);
        Tsd_DelayPath copy(*p);
        p->setLinkData(&ts02, true, 9);
        p.reset();
        add("delay path", copy, &c == &paths[1] || &c == &paths[5]);
    }
    {
        Tsd_DelayPath p("TS03");
        p.setDelayValue(ns(1));
        for (Tsd_ThruGroup* t : {&t1, &t2, &t3})
            p.addThru(t);
        p.removeThru(&t2); // a removed THRU point leaves no trace
        p.setLinkData(&ts02, false, 2.5);
        p.setWrittenPriority(3);
        p.setIgnoreGroup(&tig);
        p.setScope("core");
        add("delay path with a removed THRU point, priority, TIG group and scope", p);
        p.setLinkData(nullptr, true, 2);
        add("delay path with a pending link", p);
    }

    // Periods.
    const struct {
        Tsd_TermGroup* group;
        std::function<void(Tsd_Period&)> set;
    } periods[] = {
        {&clk2, [](Tsd_Period& p) { p.setDutyCyclePercent(50, true); }},
        {&clk2,
         [&](Tsd_Period& p) {
             p.setLinkData(&ts01, true, 2);
             p.setPhase(ns(2.5), true);
             p.setDutyCycleValue(ns(4), false);
         }},
        {&clk2,
         [](Tsd_Period& p) {
             p.setDelayValue(TV(100, TV::UNITS_MHZ));
             p.setInputJitter(TV(200, TV::UNITS_PS));
             p.setPriority(3);
         }},
        {&hash,
         [](Tsd_Period& p) {
             p.setDelayValue(TV(10000, TV::UNITS_PS));
             p.setPhase(ns(1), false);
             p.setDutyCyclePercent(33.3333333333, false);
         }},
        {&clk2, [](Tsd_Period& p) { p.setLinkData(nullptr, false, 2); }},
        {&clk2, [](Tsd_Period& p) { p.setPhase(TV(0, TV::UNITS_NS), false); }},
    };
    for (const auto& c : periods) {
        auto p = std::make_unique<Tsd_Period>("TS02");
        p->setPeriodGroup(c.group);
        p->setDelayValue(ns(10));
        c.set(*p);
        Tsd_Period copy(*p);
        p->setPhase(ns(9), true);
        p->setInputJitter(ns(1));
        p.reset();
        add("period", copy, &c != &periods[0] && &c != &periods[4] && &c != &periods[5]);
    }
    {
        Tsd_Period p("TS09"); // no delay at all
        p.setPeriodGroup(&clk2);
        add("period without delay", p, false);
        Tsd_Period unset("TS08");
        add("period without group", unset);
    }

    // Offsets: the three kinds share one text.
    const std::function<void(Tsd_Offset&)> offsets[] = {
        [](Tsd_Offset& o) { o.setOffsetValue(ns(2)); },
        [](Tsd_Offset&) {},
        [&](Tsd_Offset& o) {
            o.setIn(false);
            o.setBefore(false);
            o.setOffsetValue(ns(5));
            o.setRegGroup(&a);
            o.setRegGroupEdge(UG::EDGE_FALLING);
        },
        [&](Tsd_Offset& o) {
            o.setOffsetValue(ns(1));
            o.setDataValid(ns(3));
            o.setReferencePin(&fb);
            o.setRefClockEdge(UG::EDGE_RISING);
        },
        [&](Tsd_Offset& o) { // set in the opposite order of the text
            o.setRegGroupEdge(UG::EDGE_RISING);
            o.setRefClockEdge(UG::EDGE_FALLING);
            o.setRegGroup(&a);
            o.setReferencePin(&fb);
        },
        [](Tsd_Offset& o) {
            o.setRefClockEdge(UG::EDGE_TRANSHI);
            o.setRegGroupEdge(UG::EDGE_TRANSLO);
        },
        [](Tsd_Offset& o) { o.setRegGroupEdge(static_cast<UG::Edge>(8)); },
    };
    for (const auto& set : offsets) {
        auto global = std::make_unique<Tsd_Offset>();
        auto group = std::make_unique<Tsd_GroupOffset>();
        Tsd_NetOffset net;
        group->setPadGroup(&pads);
        for (Tsd_Offset* o : {global.get(), static_cast<Tsd_Offset*>(group.get()),
                              static_cast<Tsd_Offset*>(&net)}) {
            o->setClockPad(&clk);
            set(*o);
        }
        Tsd_Offset globalCopy(*global);
        Tsd_GroupOffset groupCopy(*group);
        global->setDataValid(ns(7));
        global.reset();
        group.reset();
        const bool dump = &set == &offsets[5];
        add("offset", globalCopy, dump);
        add("group offset", groupCopy, dump);
        add("net offset", net, dump);
        text += std::string("user strings: ") + groupCopy.getUserString() + " / " +
                net.getUserString() + "\n";
    }
    {
        Tsd_GroupOffset bare; // no clock pad or pad group: empty quoted names
        bare.clearDataValid();
        add("group offset without groups", bare);
        Tsd_NetOffset net;
        attachRef(&net, "n");
        net.setScope("io");
        add("net offset with a reference", net);
    }

    // Net timings: each setter makes it a timing of one kind.
    {
        Tsd_NetTiming t;
        add("net timing without delays", t, false);
        t.setPeriodValue(TV(10000, TV::UNITS_PS));
        t.setDutyCyclePercent(50, true);
        add("net period", t, false);
        t.setPeriodValue(TV(8000, TV::UNITS_PS)); // keeps duty cycle and jitter
        t.setDutyCycleValue(TV(3000, TV::UNITS_PS), false);
        t.setInputJitter(TV(100, TV::UNITS_PS));
        t.setScope("top/u1");
        attachRef(&t, "net");
        add("net period with absolute duty cycle and jitter", t);
        t.setDutyCyclePercent(0, true); // a zero percent is no duty cycle
        add("net period without duty cycle", t, false);
        t.setMaxDelayValue(ns(2.5));
        add("net max delay", t);
        t.setMaxSkewValue(TV(500, TV::UNITS_PS));
        add("net max skew", t, false);
    }

    // Path controls and port timings.
    {
        auto control = std::make_unique<Tsd_PathControl>("tilo", false);
        control->setScope("core");
        Tsd_PathControl copy(*control);
        control.reset();
        add("path control", copy);
        add("path control named oddly", Tsd_PathControl("reg sr:o", true), false);
        add("path control without name", Tsd_PathControl(nullptr, true));
        Tsd_PortTiming port("FEEDBACK");
        add("port timing without value", port, false);
        port.setConstraintValue(TV(1500, TV::UNITS_PS));
        add("port timing", port, false);
        port.setSecondaryGroup(&slash);
        add("port timing on an odd net", port, false);
        port.setSecondaryGroup(&clk);
        port.setScope("io");
        attachRef(&port, "port");
        add("port timing on a clock net", port);
        add("unnamed port timing", Tsd_PortTiming(nullptr));
    }
    expectGolden("specs/specs.golden", text);
}
