#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>

using tsd_test::fatalText;
using tsd_test::propOf;
using TV = Tsd_TimeValue;

TEST(Period, PropertyValues) {
    Tsd_TNMGroup clk("clk"), odd("#clk");
    Tsd_Period ts01("TS01");
    const struct {
        Tsd_TermGroup* group;
        std::function<void(Tsd_Period&)> set;
        const char* value;
    } cases[] = {
        {&clk, [](Tsd_Period& p) { p.setDutyCyclePercent(50, true); }, "PERIOD:clk:10:nS:HIGH:50%"},
        {&clk,
         [&](Tsd_Period& p) {
             p.setLinkData(&ts01, true, 2);
             p.setPhase(TV(2.5, TV::UNITS_NS), true);
             p.setDutyCycleValue(TV(4, TV::UNITS_NS), false);
         },
         "PERIOD:clk:TS01*2:PHASE:+:2.5:nS:LOW:4:nS"},
        {&clk,
         [](Tsd_Period& p) {
             p.setDelayValue(TV(100, TV::UNITS_MHZ));
             p.setInputJitter(TV(200, TV::UNITS_PS));
             p.setPriority(3);
         },
         "PERIOD:clk:100:MHz:INPUT_JITTER:200:pS:PRIORITY:3"},
        {&odd,
         [](Tsd_Period& p) {
             p.setDelayValue(TV(10000, TV::UNITS_PS));
             p.setPhase(TV(1, TV::UNITS_NS), false);
             p.setDutyCyclePercent(33.3333333333, false);
         },
         "PERIOD:\"#clk\":10000:pS:PHASE:-:1:nS:LOW:33.333333333%"},
        {&clk, [](Tsd_Period& p) { p.setLinkData(nullptr, false, 2); }, "PERIOD:clk:"},
    };
    for (const auto& c : cases) {
        Tsd_Period p("TS02");
        p.setPeriodGroup(c.group);
        p.setDelayValue(TV(10, TV::UNITS_NS));
        c.set(p);
        EXPECT_EQ(propOf(p), (tsd_test::Prop{"TS02", c.value}));
    }
    tsd_test::MessageCapture capture;
    Tsd_Period none("TS09");
    EXPECT_EQ(fatalText([&] { propOf(none); }), "Group missing from period TS09.\n");
    none.setPeriodGroup(&clk);
    EXPECT_EQ(fatalText([&] { propOf(none); }), "Spec TS09 has no delay data.\n");
}

TEST(Period, DutyCycleValue) {
    tsd_test::MessageCapture capture;
    Tsd_Period base("TS01");
    base.setDelayValue(TV(10, TV::UNITS_NS));
    base.setDutyCyclePercent(40, true);
    EXPECT_DOUBLE_EQ(base.getDutyCycleValue().value, 4);

    Tsd_Period linked("TS02"); // through the link: 25 % of 20 nS
    linked.setLinkData(&base, true, 2);
    linked.setDutyCycleValue(TV(3, TV::UNITS_NS), true);
    linked.setDutyCyclePercent(25, true); // replaces the absolute value
    TV v = linked.getDutyCycleValue();
    EXPECT_DOUBLE_EQ(v.value, 5);
    EXPECT_EQ(v.units, TV::UNITS_NS);

    base.setDelayValue(TV(100, TV::UNITS_MHZ)); // from a frequency, in nS
    base.setDutyCyclePercent(50, false);
    v = base.getDutyCycleValue();
    EXPECT_DOUBLE_EQ(v.value, 5);
    EXPECT_EQ(v.units, TV::UNITS_NS);
    base.setDutyCyclePercent(0, true);
    EXPECT_FALSE(base.hasDutyCycle());

    base.setLinkData(&linked, true, 1); // now a circle
    EXPECT_EQ(fatalText([&] { linked.getDutyCycleValue(); }),
              "Bad link on TS02 getting duty cycle.\n");
    EXPECT_TRUE(capture.sink.errors().empty()); // checked without reporting

    base.setPhase(TV(0, TV::UNITS_NS), true); // a zero phase is not kept
    EXPECT_FALSE(base.hasPhase());
    EXPECT_TRUE(base.phaseIsPositive());
}

TEST(Period, CopiesOwnTheirValuesAndDump) {
    Tsd_TNMGroup clk("clk");
    Tsd_Period ts01("TS01");
    auto p = std::make_unique<Tsd_Period>("TS02");
    p->setPeriodGroup(&clk);
    p->setLinkData(&ts01, true, 2);
    p->setDutyCyclePercent(50, true);
    p->setPhase(TV(2.5, TV::UNITS_NS), false);
    p->setInputJitter(TV(100, TV::UNITS_PS));
    Tsd_Period copy(*p);
    p->setPhase(TV(9, TV::UNITS_NS), true);
    p->setInputJitter(TV(1, TV::UNITS_PS));
    p.reset();
    EXPECT_EQ(tsd_test::dumpText(copy), "Tsd_Period TS02\n"
                                        "   period group: clk\n"
                                        "   absolute duty cycle unset\n"
                                        "   percent duty cycle: HIGH 50.000000%\n"
                                        "   phase: 2.5 nS -\n"
                                        "   input jitter: 100 pS\n"
                                        "   Tsd_EndpointSpec TS02\n"
                                        "      delay unset\n"
                                        "      link: TS01*2\n"
                                        "      priority unset\n"
                                        "      holds no TIG group\n");
    copy.setDutyCycleValue(TV(4, TV::UNITS_NS), false);
    EXPECT_NE(tsd_test::dumpText(copy).find("\n   absolute duty cycle: LOW 4 nS\n"
                                            "   percent duty cycle unset\n"),
              std::string::npos);
}
