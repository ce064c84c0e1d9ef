#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>

using tsd_test::dumpText;
using tsd_test::fatalText;
using tsd_test::MessageCapture;
using tsd_test::Prop;
using tsd_test::propOf;
using TV = Tsd_TimeValue;

TEST(Period, PropertyValues) {
    Tsd_TNMGroup clk("clk"), clk2("clk2"), sys("sys"), odd("#clk");
    Tsd_Period ts01("TS01");
    ts01.setDelayValue(TV(10, TV::UNITS_NS));

    Tsd_Period a("TS02");
    a.setPeriodGroup(&clk);
    a.setDelayValue(TV(10, TV::UNITS_NS));
    a.setDutyCyclePercent(50, true);
    EXPECT_EQ(propOf(a), (Prop{"TS02", "PERIOD:clk:10:nS:HIGH:50%"}));

    Tsd_Period b("TS03");
    b.setPeriodGroup(&clk2);
    b.setLinkData(&ts01, true, 2);
    b.setPhase(TV(2.5, TV::UNITS_NS), true);
    b.setDutyCycleValue(TV(4, TV::UNITS_NS), false);
    EXPECT_EQ(propOf(b), (Prop{"TS03", "PERIOD:clk2:TS01*2:PHASE:+:2.5:nS:LOW:4:nS"}));

    Tsd_Period c("TS04");
    c.setPeriodGroup(&sys);
    c.setDelayValue(TV(100, TV::UNITS_MHZ));
    c.setInputJitter(TV(200, TV::UNITS_PS));
    c.setPriority(3);
    EXPECT_EQ(propOf(c), (Prop{"TS04", "PERIOD:sys:100:MHz:INPUT_JITTER:200:pS:PRIORITY:3"}));

    Tsd_Period d("TS05");
    d.setPeriodGroup(&odd);
    d.setDelayValue(TV(10000, TV::UNITS_PS));
    d.setDutyCyclePercent(33.3333333333, false);
    d.setPhase(TV(1, TV::UNITS_NS), false);
    d.setInputJitter(TV(0.5, TV::UNITS_NS));
    d.setPriority(0);
    EXPECT_EQ(propOf(d), (Prop{"TS05", "PERIOD:\"#clk\":10000:pS:PHASE:-:1:nS:LOW:33.333333333%"
                                       ":INPUT_JITTER:0.5:nS:PRIORITY:0"}));

    Tsd_Period pending("TS06");
    pending.setPeriodGroup(&clk);
    pending.setLinkData(nullptr, false, 2);
    EXPECT_EQ(propOf(pending).value, "PERIOD:clk:");
}

TEST(Period, PropertyBuffersAreSharedByAllSpecifications) {
    Tsd_TNMGroup clk("clk");
    Tsd_Period p("TS01");
    p.setPeriodGroup(&clk);
    p.setDelayValue(TV(1, TV::UNITS_NS));
    const char* name = nullptr;
    const char* value = nullptr;
    ASSERT_TRUE(p.getProp(name, value));
    Tsd_PathControl control("d", true);
    propOf(control);
    EXPECT_STREQ(name, "ENABLE");
    EXPECT_STREQ(value, "d");
}

TEST(Period, DutyCycleValue) {
    MessageCapture capture;
    Tsd_Period p("TS02");
    p.setDelayValue(TV(10, TV::UNITS_NS));
    p.setDutyCyclePercent(40, true);
    TV v = p.getDutyCycleValue();
    EXPECT_DOUBLE_EQ(v.value, 4);
    EXPECT_EQ(v.units, TV::UNITS_NS);

    p.setDelayValue(TV(100, TV::UNITS_MHZ)); // a frequency: the duty cycle is in nS
    p.setDutyCyclePercent(50, false);
    v = p.getDutyCycleValue();
    EXPECT_DOUBLE_EQ(v.value, 5);
    EXPECT_EQ(v.units, TV::UNITS_NS);

    Tsd_Period base("TS01");
    base.setDelayValue(TV(10, TV::UNITS_NS));
    Tsd_Period linked("TS03");
    linked.setLinkData(&base, true, 2);
    linked.setDutyCyclePercent(25, true);
    v = linked.getDutyCycleValue();
    EXPECT_DOUBLE_EQ(v.value, 5);
    EXPECT_EQ(v.units, TV::UNITS_NS);

    Tsd_Period none("TS04");
    none.setDelayValue(TV(8000, TV::UNITS_PS));
    v = none.getDutyCycleValue();
    EXPECT_EQ(v.value, 0.0);
    EXPECT_EQ(v.units, TV::UNITS_PS);

    // An absolute value needs no period at all.
    Tsd_Period absolute("TS05");
    absolute.setDutyCycleValue(TV(3, TV::UNITS_NS), true);
    EXPECT_EQ(absolute.getDutyCycleValue().value, 3.0);
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST(Period, DutyCycleThroughABadLinkIsFatal) {
    MessageCapture capture;
    Tsd_Period a("TS01"), b("TS02");
    a.setLinkData(&b, true, 1);
    b.setLinkData(&a, true, 1);
    a.setDutyCyclePercent(50, true);
    int code = 0;
    EXPECT_EQ(fatalText([&] { a.getDutyCycleValue(); }, &code),
              "Bad link on TS01 getting duty cycle.\n");
    EXPECT_EQ(code, 2);
    EXPECT_TRUE(capture.sink.errors().empty()); // checked without reporting
    Tsd_Period c("TS03");
    c.setDelayValue(TV(10, TV::UNITS_NS));
    Tsd_Period zero("TS04");
    zero.setLinkData(&c, false, 0);
    EXPECT_EQ(fatalText([&] { zero.getDutyCycleValue(); }),
              "Bad link on TS04 getting duty cycle.\n");
}

TEST(Period, DutyCycleFormsReplaceEachOther) {
    Tsd_Period p("TS01");
    EXPECT_FALSE(p.hasDutyCycle());
    p.setDutyCyclePercent(30, true);
    EXPECT_TRUE(p.hasDutyCycle());
    EXPECT_TRUE(p.isDutyCyclePercent());
    EXPECT_TRUE(p.dutyCycleHigh());
    p.setDutyCycleValue(TV(2, TV::UNITS_NS), false);
    EXPECT_FALSE(p.isDutyCyclePercent());
    EXPECT_EQ(p.getDutyCyclePercent(), 0.0);
    EXPECT_FALSE(p.dutyCycleHigh());
    EXPECT_TRUE(p.hasDutyCycle());
    p.setDutyCyclePercent(30, false);
    p.setDelayValue(TV(10, TV::UNITS_NS));
    EXPECT_DOUBLE_EQ(p.getDutyCycleValue().value, 3); // the absolute value is gone
    p.setDutyCyclePercent(0, true);
    EXPECT_FALSE(p.hasDutyCycle());
}

TEST(Period, PhaseAndJitter) {
    Tsd_Period p("TS01");
    EXPECT_FALSE(p.hasPhase());
    p.setPhase(TV(2, TV::UNITS_NS), true);
    EXPECT_TRUE(p.hasPhase());
    EXPECT_TRUE(p.phaseIsPositive());
    p.setPhase(TV(0, TV::UNITS_NS), false); // a zero phase is not kept
    EXPECT_FALSE(p.hasPhase());
    EXPECT_FALSE(p.phaseIsPositive());
    TV zero = p.getPhaseValue();
    EXPECT_EQ(zero.value, 0.0);
    EXPECT_EQ(zero.units, TV::UNITS_PS);

    EXPECT_FALSE(p.hasInputJitter());
    EXPECT_EQ(p.getInputJitterValue().units, TV::UNITS_PS);
    p.setInputJitter(TV(100, TV::UNITS_PS));
    p.setInputJitter(TV(150, TV::UNITS_PS));
    EXPECT_EQ(p.getInputJitterValue().value, 150.0);
    p.clearInputJitter();
    EXPECT_FALSE(p.hasInputJitter());
}

TEST(Period, MissingPartsAreFatal) {
    MessageCapture capture;
    Tsd_TNMGroup clk("clk");
    Tsd_Period p("TS09");
    p.setDelayValue(TV(1, TV::UNITS_NS));
    int code = 0;
    EXPECT_EQ(fatalText([&] { propOf(p); }, &code), "Group missing from period TS09.\n");
    EXPECT_EQ(code, 2);
    Tsd_Period q("TS10");
    q.setPeriodGroup(&clk);
    EXPECT_EQ(fatalText([&] { propOf(q); }, &code), "Spec TS10 has no delay data.\n");
    EXPECT_EQ(code, 2);
}

TEST(Period, CopiesOwnTheirValues) {
    Tsd_TNMGroup clk("clk");
    auto p = std::make_unique<Tsd_Period>("TS01");
    p->setPeriodGroup(&clk);
    p->setDelayValue(TV(10, TV::UNITS_NS));
    p->setDutyCycleValue(TV(3, TV::UNITS_NS), true);
    p->setPhase(TV(1, TV::UNITS_NS), true);
    p->setInputJitter(TV(50, TV::UNITS_PS));
    p->setPriority(4);
    Tsd_Period copy(*p);
    const std::string before = propOf(copy).value;
    EXPECT_EQ(before, "PERIOD:clk:10:nS:PHASE:+:1:nS:HIGH:3:nS:INPUT_JITTER:50:pS:PRIORITY:4");
    p->setDutyCycleValue(TV(7, TV::UNITS_NS), false);
    p->setPhase(TV(9, TV::UNITS_NS), false);
    p->setInputJitter(TV(1, TV::UNITS_PS));
    p->setDelayValue(TV(20, TV::UNITS_NS));
    p.reset();
    EXPECT_EQ(propOf(copy).value, before);
}

TEST(Period, DumpGolden) {
    Tsd_TNMGroup clk("clk");
    Tsd_Period base("TS01");
    Tsd_Period p("TS02");
    p.setPeriodGroup(&clk);
    p.setLinkData(&base, true, 2);
    p.setDutyCyclePercent(50, true);
    p.setPhase(TV(2.5, TV::UNITS_NS), false);
    p.setInputJitter(TV(100, TV::UNITS_PS));
    EXPECT_EQ(dumpText(p), "Tsd_Period TS02\n"
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
    Tsd_Period q("TS03");
    q.setDutyCycleValue(TV(4, TV::UNITS_NS), false);
    q.setPhase(TV(1, TV::UNITS_NS), true);
    const std::string head = "Tsd_Period TS03\n"
                             "   period group unset\n"
                             "   absolute duty cycle: LOW 4 nS\n"
                             "   percent duty cycle unset\n"
                             "   phase: 1 nS +\n"
                             "   input jitter unset\n";
    EXPECT_EQ(dumpText(q).substr(0, head.size()), head);
}
