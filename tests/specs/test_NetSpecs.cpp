#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <string>

using tsd_test::dumpText;
using tsd_test::fatalText;
using tsd_test::NamedRef;
using tsd_test::Prop;
using tsd_test::propOf;
using TV = Tsd_TimeValue;

TEST(NetTiming, PropertyValuesAndExclusiveKinds) {
    Tsd_NetTiming t;
    t.setPeriodValue(TV(10000, TV::UNITS_PS));
    t.setDutyCyclePercent(50, true);
    EXPECT_EQ(propOf(t), (Prop{"TS_PERIOD", "10000:pS:HIGH:50%"}));
    t.setPeriodValue(TV(8000, TV::UNITS_PS)); // keeps duty cycle and jitter
    t.setDutyCycleValue(TV(3000, TV::UNITS_PS), false);
    t.setInputJitter(TV(100, TV::UNITS_PS));
    EXPECT_EQ(propOf(t), (Prop{"TS_PERIOD", "8000:pS:LOW:3000:pS:INPUT_JITTER:100:pS"}));
    t.setDutyCyclePercent(0, true); // a zero percent is no duty cycle
    EXPECT_EQ(propOf(t).value, "8000:pS:INPUT_JITTER:100:pS");

    t.setMaxDelayValue(TV(2.5, TV::UNITS_NS));
    EXPECT_EQ(propOf(t), (Prop{"TS_MAXDELAY", "2.5:nS"}));
    EXPECT_FALSE(t.hasPeriod() || t.hasDutyCycle() || t.hasInputJitter());
    EXPECT_EQ(t.getPeriodValue().value, 0.0);
    t.setMaxSkewValue(TV(500, TV::UNITS_PS));
    EXPECT_EQ(propOf(t), (Prop{"TS_MAXSKEW", "500:pS"}));
    EXPECT_FALSE(t.hasMaxDelay());
    t.setPeriodValue(TV(5, TV::UNITS_NS));
    EXPECT_FALSE(t.hasMaxSkew());

    tsd_test::MessageCapture capture;
    Tsd_NetTiming none;
    EXPECT_EQ(fatalText([&] { propOf(none); }), "No delays in net spec.\n");
    none.setDutyCyclePercent(50, true);
    EXPECT_EQ(fatalText([&] { none.getDutyCycleValue(); }), "No duty cycle without period.\n");
    none.setPeriodValue(TV(100, TV::UNITS_MHZ));
    TV v = none.getDutyCycleValue();
    EXPECT_DOUBLE_EQ(v.value, 5);
    EXPECT_EQ(v.units, TV::UNITS_NS);
}

TEST(NetTiming, OwnsItsReferencesAndDumps) {
    int destroyed = 0;
    {
        Tsd_NetTiming t;
        t.setPeriodValue(TV(8, TV::UNITS_NS));
        t.setDutyCyclePercent(50, true);
        t.setInputJitter(TV(100, TV::UNITS_PS));
        t.setScope("top/u1");
        (new NamedRef("net", &destroyed))->setOwner(&t);
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
    }
    EXPECT_EQ(destroyed, 1);
}

TEST(PathControl, PropertyCopyAndDump) {
    EXPECT_EQ(propOf(Tsd_PathControl("reg_sr_o", true)), (Prop{"ENABLE", "reg_sr_o"}));
    EXPECT_EQ(propOf(Tsd_PathControl(nullptr, false)), (Prop{"DISABLE", ""}));
    auto source = std::make_unique<Tsd_PathControl>("tilo", false);
    source->setScope("core");
    Tsd_PathControl copy(*source);
    source.reset();
    EXPECT_EQ(dumpText(copy), "Tsd_PathControl\n"
                              "   DISABLE\n"
                              "   delay name: tilo\n"
                              "   constraint scope: core\n");
    EXPECT_EQ(dumpText(Tsd_PathControl(nullptr, true)),
              "Tsd_PathControl\n   ENABLE\n   delay name NULL\n");
}

TEST(PortTiming, PropertyOwnershipAndDump) {
    tsd_test::MessageCapture capture;
    Tsd_ClkGroup clk("clk_in"), odd("/");
    int destroyed = 0;
    {
        Tsd_PortTiming t("FEEDBACK");
        EXPECT_EQ(fatalText([&] { propOf(t); }), "FEEDBACK constraint has no value.\n");
        t.setConstraintValue(TV(1500, TV::UNITS_PS));
        EXPECT_EQ(propOf(t), (Prop{"TS_FEEDBACK", "1500:pS"}));
        t.setSecondaryGroup(&odd);
        EXPECT_EQ(propOf(t), (Prop{"TS_FEEDBACK", "1500:pS:NET:\"/\""}));
        t.setSecondaryGroup(&clk);
        EXPECT_EQ(propOf(t).value, "1500:pS:NET:clk_in");
        t.setScope("io");
        (new NamedRef("port", &destroyed))->setOwner(&t);
        EXPECT_EQ(dumpText(t), "Tsd_PortTiming\n"
                               "   name: FEEDBACK\n"
                               "   value: 1500 pS\n"
                               "   secondary group: clk_in\n"
                               "   constraint scope: io\n"
                               "   references:\n"
                               "      owner defined\n");
    }
    EXPECT_EQ(destroyed, 1);
    EXPECT_EQ(dumpText(Tsd_PortTiming(nullptr)),
              "Tsd_PortTiming\n   name unset\n   value unset\n   secondary group unset\n"
              "   references:\n");
}
