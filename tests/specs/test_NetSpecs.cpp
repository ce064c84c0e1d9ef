#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>

using tsd_test::dumpText;
using tsd_test::fatalText;
using tsd_test::MessageCapture;
using tsd_test::NamedRef;
using tsd_test::Prop;
using tsd_test::propOf;
using TV = Tsd_TimeValue;

TEST(NetTiming, PropertyValues) {
    Tsd_NetTiming a;
    a.setPeriodValue(TV(10000, TV::UNITS_PS));
    a.setDutyCyclePercent(50, true);
    EXPECT_EQ(propOf(a), (Prop{"TS_PERIOD", "10000:pS:HIGH:50%"}));

    Tsd_NetTiming b;
    b.setPeriodValue(TV(8000, TV::UNITS_PS));
    b.setDutyCycleValue(TV(3000, TV::UNITS_PS), false);
    b.setInputJitter(TV(100, TV::UNITS_PS));
    EXPECT_EQ(propOf(b), (Prop{"TS_PERIOD", "8000:pS:LOW:3000:pS:INPUT_JITTER:100:pS"}));

    Tsd_NetTiming c;
    c.setMaxSkewValue(TV(500, TV::UNITS_PS));
    EXPECT_EQ(propOf(c), (Prop{"TS_MAXSKEW", "500:pS"}));

    Tsd_NetTiming d;
    d.setMaxDelayValue(TV(2.5, TV::UNITS_NS));
    EXPECT_EQ(propOf(d), (Prop{"TS_MAXDELAY", "2.5:nS"}));

    Tsd_NetTiming e;
    e.setPeriodValue(TV(100, TV::UNITS_MHZ));
    e.setDutyCyclePercent(0, true); // no duty cycle: only the jitter follows
    e.setInputJitter(TV(50, TV::UNITS_PS));
    EXPECT_EQ(propOf(e), (Prop{"TS_PERIOD", "100:MHz:INPUT_JITTER:50:pS"}));

    Tsd_NetTiming f;
    f.setPeriodValue(TV(10, TV::UNITS_NS));
    f.setDutyCyclePercent(12.5, false);
    EXPECT_EQ(propOf(f).value, "10:nS:LOW:12.5%");
    EXPECT_STREQ(f.getUserString(), "PERIOD=10 nS LOW 12.5%");
}

TEST(NetTiming, KindsOfLimitExcludeEachOther) {
    Tsd_NetTiming t;
    t.setPeriodValue(TV(10, TV::UNITS_NS));
    t.setDutyCyclePercent(40, true);
    t.setInputJitter(TV(1, TV::UNITS_NS));
    t.setMaxDelayValue(TV(3, TV::UNITS_NS));
    EXPECT_FALSE(t.hasPeriod());
    EXPECT_FALSE(t.hasDutyCycle());
    EXPECT_FALSE(t.hasInputJitter());
    EXPECT_TRUE(t.hasMaxDelay());
    EXPECT_EQ(t.getPeriodValue().value, 0.0);
    EXPECT_EQ(t.getPeriodValue().units, TV::UNITS_PS);

    t.setMaxSkewValue(TV(1, TV::UNITS_NS));
    EXPECT_FALSE(t.hasMaxDelay());
    EXPECT_TRUE(t.hasMaxSkew());
    t.setMaxDelayValue(TV(2, TV::UNITS_NS));
    EXPECT_FALSE(t.hasMaxSkew());
    t.setPeriodValue(TV(5, TV::UNITS_NS));
    EXPECT_FALSE(t.hasMaxDelay());
    EXPECT_FALSE(t.hasMaxSkew());
    EXPECT_TRUE(t.hasPeriod());

    // A period keeps its duty cycle and jitter when it is replaced.
    t.setDutyCycleValue(TV(2, TV::UNITS_NS), true);
    t.setInputJitter(TV(10, TV::UNITS_PS));
    t.setPeriodValue(TV(6, TV::UNITS_NS));
    EXPECT_TRUE(t.hasDutyCycle());
    EXPECT_TRUE(t.hasInputJitter());
    t.clearInputJitter();
    EXPECT_FALSE(t.hasInputJitter());
    EXPECT_EQ(t.getInputJitterValue().value, 0.0);
}

TEST(NetTiming, DutyCycleValue) {
    MessageCapture capture;
    Tsd_NetTiming t;
    t.setPeriodValue(TV(10, TV::UNITS_NS));
    t.setDutyCycleValue(TV(3, TV::UNITS_NS), true);
    t.setDutyCyclePercent(25, false);
    EXPECT_TRUE(t.isDutyCyclePercent());
    EXPECT_FALSE(t.dutyCycleHigh());
    TV v = t.getDutyCycleValue(); // from the period: the absolute value is gone
    EXPECT_DOUBLE_EQ(v.value, 2.5);
    EXPECT_EQ(v.units, TV::UNITS_NS);
    t.setDutyCycleValue(TV(4, TV::UNITS_NS), true);
    EXPECT_FALSE(t.isDutyCyclePercent());
    EXPECT_EQ(t.getDutyCyclePercent(), 0.0);
    EXPECT_EQ(t.getDutyCycleValue().value, 4.0);

    t.setPeriodValue(TV(100, TV::UNITS_MHZ));
    t.setDutyCyclePercent(50, true);
    v = t.getDutyCycleValue();
    EXPECT_DOUBLE_EQ(v.value, 5);
    EXPECT_EQ(v.units, TV::UNITS_NS);

    Tsd_NetTiming skew;
    skew.setMaxSkewValue(TV(1, TV::UNITS_NS));
    skew.setDutyCyclePercent(50, true);
    int code = 0;
    EXPECT_EQ(fatalText([&] { skew.getDutyCycleValue(); }, &code),
              "No duty cycle without period.\n");
    EXPECT_EQ(code, 2);
}

TEST(NetTiming, NoLimitIsFatal) {
    MessageCapture capture;
    Tsd_NetTiming t;
    int code = 0;
    EXPECT_EQ(fatalText([&] { propOf(t); }, &code), "No delays in net spec.\n");
    EXPECT_EQ(code, 2);
}

TEST(NetTiming, OwnsItsReferences) {
    int destroyed = 0;
    {
        Tsd_NetTiming t;
        EXPECT_TRUE(t.refOwner());
        EXPECT_EQ(static_cast<Tsd_BaseObj&>(t).getNetTiming(), &t);
        (new NamedRef("a", &destroyed))->setOwner(&t);
        (new NamedRef("b", &destroyed))->setOwner(&t);
    }
    EXPECT_EQ(destroyed, 2);
}

TEST(NetTiming, DumpGolden) {
    Tsd_NetTiming t;
    t.setPeriodValue(TV(8, TV::UNITS_NS));
    t.setDutyCyclePercent(50, true);
    t.setInputJitter(TV(100, TV::UNITS_PS));
    t.setScope("top/u1");
    (new NamedRef("net"))->setOwner(&t);
    EXPECT_EQ(dumpText(t, 1), "   Tsd_NetTiming\n"
                              "      period value: 8 nS\n"
                              "      absolute duty cycle unset\n"
                              "      percent duty cycle: HIGH 50.000000%\n"
                              "      input jitter: 100 pS\n"
                              "      max-delay value unset\n"
                              "      max-skew value unset\n"
                              "      constraint scope: top/u1\n"
                              "      references:\n"
                              "         owner defined\n");
    Tsd_NetTiming s;
    s.setMaxSkewValue(TV(500, TV::UNITS_PS));
    s.setDutyCycleValue(TV(1, TV::UNITS_NS), false);
    EXPECT_EQ(dumpText(s), "Tsd_NetTiming\n"
                           "   period value unset\n"
                           "   absolute duty cycle: LOW 1 nS\n"
                           "   percent duty cycle unset\n"
                           "   input jitter unset\n"
                           "   max-delay value unset\n"
                           "   max-skew value: 500 pS\n"
                           "   references:\n");
}

TEST(PathControl, PropertyCopyAndDump) {
    Tsd_PathControl enable("reg_sr_o", true);
    EXPECT_EQ(propOf(enable), (Prop{"ENABLE", "reg_sr_o"}));
    Tsd_PathControl disable(nullptr, false);
    EXPECT_EQ(propOf(disable), (Prop{"DISABLE", ""}));
    EXPECT_EQ(static_cast<Tsd_BaseObj&>(enable).getPathControl(), &enable);
    EXPECT_FALSE(enable.refOwner());

    auto source = std::make_unique<Tsd_PathControl>("tilo", false);
    source->setScope("core");
    source->setTSid("TSx");
    Tsd_PathControl copy(*source);
    source.reset();
    EXPECT_STREQ(copy.getDelayName(), "tilo");
    EXPECT_FALSE(copy.isEnabled());
    EXPECT_STREQ(copy.getScope(), "core");
    EXPECT_STREQ(copy.getTSid(), "TSx");

    EXPECT_EQ(dumpText(copy), "Tsd_PathControl\n"
                              "   DISABLE\n"
                              "   delay name: tilo\n"
                              "   constraint scope: core\n");
    EXPECT_EQ(dumpText(Tsd_PathControl(nullptr, true)), "Tsd_PathControl\n"
                                                        "   ENABLE\n"
                                                        "   delay name NULL\n");
}

TEST(PortTiming, PropertyValues) {
    MessageCapture capture;
    Tsd_PortTiming t("FEEDBACK");
    int code = 0;
    EXPECT_EQ(fatalText([&] { propOf(t); }, &code), "FEEDBACK constraint has no value.\n");
    EXPECT_EQ(code, 2);
    t.setConstraintValue(TV(1500, TV::UNITS_PS));
    EXPECT_EQ(propOf(t), (Prop{"TS_FEEDBACK", "1500:pS"}));
    Tsd_ClkGroup clk("clk_in");
    t.setSecondaryGroup(&clk);
    EXPECT_EQ(propOf(t), (Prop{"TS_FEEDBACK", "1500:pS:NET:clk_in"}));
    Tsd_ClkGroup odd("/");
    t.setSecondaryGroup(&odd);
    EXPECT_EQ(propOf(t).value, "1500:pS:NET:\"/\"");
    EXPECT_STREQ(t.getUserString(), "FEEDBACK=1500 pS NET \"/\"");
}

TEST(PortTiming, AccessorsAndOwnership) {
    int destroyed = 0;
    Tsd_ClkGroup clk("clk");
    {
        Tsd_PortTiming t("FEEDBACK");
        EXPECT_STREQ(t.getConstraintName(), "FEEDBACK");
        EXPECT_EQ(t.getConstraintValue().value, 0.0);
        EXPECT_EQ(t.getConstraintValue().units, TV::UNITS_PS);
        EXPECT_EQ(t.getSecondaryGroup(), nullptr);
        t.setConstraintValue(TV(1, TV::UNITS_NS));
        t.setConstraintValue(TV(2, TV::UNITS_NS));
        EXPECT_EQ(t.getConstraintValue().value, 2.0);
        t.setSecondaryGroup(&clk);
        EXPECT_EQ(t.getSecondaryGroup(), &clk);
        EXPECT_TRUE(t.refOwner());
        EXPECT_EQ(static_cast<Tsd_BaseObj&>(t).getPortTiming(), &t);
        (new NamedRef("p", &destroyed))->setOwner(&t);
    }
    EXPECT_EQ(destroyed, 1);
    EXPECT_STREQ(clk.getName(), "clk"); // the group is not the port timing's
}

TEST(PortTiming, DumpGolden) {
    Tsd_ClkGroup clk("clk_in");
    Tsd_PortTiming t("FEEDBACK");
    t.setConstraintValue(TV(1.5, TV::UNITS_NS));
    t.setSecondaryGroup(&clk);
    t.setScope("io");
    (new NamedRef("port"))->setOwner(&t);
    EXPECT_EQ(dumpText(t), "Tsd_PortTiming\n"
                           "   name: FEEDBACK\n"
                           "   value: 1.5 nS\n"
                           "   secondary group: clk_in\n"
                           "   constraint scope: io\n"
                           "   references:\n"
                           "      owner defined\n");
    EXPECT_EQ(dumpText(Tsd_PortTiming(nullptr)), "Tsd_PortTiming\n"
                                                 "   name unset\n"
                                                 "   value unset\n"
                                                 "   secondary group unset\n"
                                                 "   references:\n");
}
