#include "BuilderTestSupport.h"

#include <gtest/gtest.h>

using tsd_test::fatalText;
using tsd_test::MessageCapture;
using tsd_test::NamedRef;
using tsd_test::OpenBuilder;

TEST(BuilderIntake, PropertyNamesTheBuilderKnows) {
    Tsd_Builder builder;
    for (const char* name : {"ts01", "TS", "disable", "ENABLE", "Offset", "TIMEGRP", "timegrp_x"})
        EXPECT_TRUE(builder.addSpecProp(name, "x")) << name;
    for (const char* name : {"PERIOD", "T", "", "TIMEGR"})
        EXPECT_FALSE(builder.addSpecProp(name, "x")) << name;
    EXPECT_FALSE(builder.addSpecProp(nullptr, "x"));
    EXPECT_TRUE(builder.addUserGroupProp("anything", nullptr));
    EXPECT_FALSE(builder.addUserGroupProp(nullptr, "x"));

    for (const char* name : {"ts_tnm", "Ts_FeedBack", "TS_TPTHRU", "TS_TPSYNC", "TS_TIG",
                             "TS_CLKGRP", "TS_OFFSET", "TS_PERIOD", "TS_MAXDELAY", "TS_MAXSKEW"})
        EXPECT_TRUE(Tsd_Builder::isRefProp(name)) << name;
    for (const char* name : {"TS_FOO", "TSTNM", "", "TS_", "TS_TNMX", "XTS_TNM"})
        EXPECT_FALSE(Tsd_Builder::isRefProp(name)) << name;
    EXPECT_FALSE(Tsd_Builder::isRefProp(nullptr));
}

TEST(BuilderIntake, ReferencePropertiesWithOneValueShareOneGroup) {
    Tsd_Builder builder;
    auto* a = new NamedRef("a");
    auto* b = new NamedRef("b");
    ASSERT_TRUE(builder.addRefProp(a, "TS_TNM", "clk_ffs"));
    ASSERT_TRUE(builder.addRefProp(b, "ts_tnm", "clk_ffs"));
    EXPECT_EQ(a->getOwner(), b->getOwner());
    EXPECT_NE(a->getOwner()->getTNMGroup(), nullptr);
    EXPECT_EQ(a->getOwner()->getRefList()->getCount(), 2);
    std::unique_ptr<Tsd_Design> design(builder.buildTSDesign());
    ASSERT_NE(design, nullptr);
    EXPECT_EQ(design->findGroupByUserName("clk_ffs", false), a->getOwner());
}

TEST(BuilderIntake, OneIdentifierForTwoKindsOfGroupIsAnError) {
    MessageCapture capture;
    Tsd_Builder builder;
    auto* tnm = new NamedRef("a");
    ASSERT_TRUE(builder.addRefProp(tnm, "TS_TNM", "g"));
    NamedRef sync("b");
    EXPECT_FALSE(builder.addRefProp(&sync, "TS_TPSYNC", "g"));
    EXPECT_EQ(sync.getOwner(), nullptr);
    NamedRef thru("c");
    EXPECT_FALSE(builder.addRefProp(&thru, "TS_TPTHRU", "g"));
    ASSERT_TRUE(builder.addRefProp(new NamedRef("d"), "TS_TPTHRU", "t"));
    NamedRef tnm2("e");
    EXPECT_FALSE(builder.addRefProp(&tnm2, "TS_TNM", "t"));
    EXPECT_EQ(capture.sink.errors(),
              (std::vector<std::string>{
                  "The identifier \"g\" is used for both a TPSYNC group and a TNM group. Group "
                  "identifiers must be unique.\n",
                  "The identifier \"g\" is used for both a TPTHRU group and a TNM group. Group "
                  "identifiers must be unique.\n",
                  "The identifier \"t\" is used for both a TNM group and a TPTHRU group. Group "
                  "identifiers must be unique.\n"}));
    EXPECT_EQ(builder.getNumError(), 3);
    EXPECT_EQ(builder.buildTSDesign(), nullptr); // errors from intake fail the build
}

TEST(BuilderIntake, UnknownNamesAndNullReferencesAreRefusedQuietly) {
    MessageCapture capture;
    Tsd_Builder builder;
    NamedRef ref("r");
    EXPECT_FALSE(builder.addRefProp(&ref, "TS_NOTHING", "x"));
    EXPECT_FALSE(builder.addRefProp(&ref, "PERIOD", "x"));
    EXPECT_FALSE(builder.addRefProp(nullptr, "TS_TNM", "x"));
    EXPECT_EQ(ref.getOwner(), nullptr);
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST(BuilderIntake, ClockGroupsMadeForSpecsAreTakenOverByTheirProperty) {
    MessageCapture capture;
    Tsd_Builder builder;
    auto* offsetNet = new NamedRef("d");
    ASSERT_TRUE(builder.addRefProp(offsetNet, "TS_OFFSET", "IN 2 ns BEFORE clk"));
    Tsd_Offset* offset = offsetNet->getOwner()->getOffset();
    ASSERT_NE(offset, nullptr);
    auto* clockNet = new NamedRef("c");
    ASSERT_TRUE(builder.addRefProp(clockNet, "TS_CLKGRP", "clk"));
    EXPECT_EQ(clockNet->getOwner(), offset->getClockPad());
    std::unique_ptr<Tsd_Design> design(builder.buildTSDesign());
    EXPECT_NE(design, nullptr) << capture.sink.transcript();
}

TEST(BuilderIntake, NetLevelPropertiesMakeOneSpecPerReference) {
    MessageCapture capture;
    Tsd_Builder builder;
    auto* a = new NamedRef("a");
    auto* b = new NamedRef("b");
    auto* fb = new NamedRef("fb");
    ASSERT_TRUE(builder.addRefProp(a, "TS_PERIOD", "10 ns HIGH 40%"));
    ASSERT_TRUE(builder.addRefProp(b, "TS_PERIOD", "10 ns HIGH 40%"));
    ASSERT_TRUE(builder.addRefProp(new NamedRef("c"), "TS_CLKGRP", "fbclk"));
    ASSERT_TRUE(builder.addRefProp(fb, "TS_FEEDBACK", "1 ns NET fbclk"));
    EXPECT_NE(a->getOwner(), b->getOwner());
    Tsd_NetTiming* net = a->getOwner()->getNetTiming();
    ASSERT_NE(net, nullptr);
    EXPECT_DOUBLE_EQ(net->getDutyCycleValue().getPicoSeconds(), 4000);
    ASSERT_NE(fb->getOwner()->getPortTiming(), nullptr);
    std::unique_ptr<Tsd_Design> design(builder.buildTSDesign());
    ASSERT_NE(design, nullptr) << capture.sink.transcript();
    EXPECT_EQ(design->getNetSpecList()->getCount(), 2);
    EXPECT_EQ(design->getPortTimingList()->getCount(), 1);
}

TEST(BuilderIntake, BadNetLevelValuesAreCountedWithoutCaret) {
    MessageCapture capture;
    Tsd_Builder builder;
    NamedRef bad("n");
    EXPECT_FALSE(builder.addRefProp(&bad, "TS_PERIOD", "fast please"));
    NamedRef wrongKind("m");
    EXPECT_FALSE(builder.addRefProp(&wrongKind, "TS_FEEDBACK", "1 ns PIN fbclk"));
    std::vector<std::string> errors = capture.sink.errors();
    ASSERT_EQ(errors.size(), 2u);
    EXPECT_EQ(errors[0].rfind("Encountered bad token \"", 0), 0u) << errors[0];
    EXPECT_NE(errors[0].find("\" in specification.\n"), std::string::npos);
    EXPECT_EQ(errors[1], "Encountered bad token \"PIN\" in specification.\n");
    EXPECT_EQ(builder.getNumError(), 2);
    EXPECT_EQ(builder.buildTSDesign(), nullptr);
}

TEST(BuilderIntake, AnAlreadyOwnedReferenceIsFatal) {
    MessageCapture capture;
    Tsd_Builder builder;
    auto* ref = new NamedRef("r");
    ASSERT_TRUE(builder.addRefProp(ref, "TS_TNM", "g"));
    int code = 0;
    EXPECT_EQ(fatalText([&] { builder.addRefProp(ref, "TS_TPTHRU", "t"); }, &code),
              "Already-owned referenced passed to Tsd_Builder::addRefProp(). The reference is "
              "already owned by object TNM=g, and is being added to TS_TPTHRU=t.\n");
    EXPECT_EQ(code, 2);
}

TEST(BuilderIntake, ContextAndCounters) {
    OpenBuilder builder;
    EXPECT_EQ(std::u16string(builder.getContext()), u"");
    builder.setContext(translateMessage("TSDatabase", "Reading %s: ", "a.props"));
    EXPECT_EQ(std::u16string(builder.getContext()), u"Reading a.props: ");
    builder.setContext(static_cast<const char16_t*>(nullptr));
    EXPECT_EQ(std::u16string(builder.getContext()), u"");

    // The 16-bit counters stop at their largest value instead of wrapping
    // round to a count that would let a failed build pass.
    builder.addError(30000);
    builder.addError(30000);
    EXPECT_EQ(builder.getNumError(), 32767);
    builder.addWarning(2);
    EXPECT_EQ(builder.getNumWarning(), 2);
    EXPECT_EQ(builder.buildTSDesign(), nullptr);
}

TEST(BuilderIntake, BuilderWithoutADesignMustBeGivenOne) {
    MessageCapture capture;
    {
        OpenBuilder builder(false);
        NamedRef ref("r");
        EXPECT_EQ(fatalText([&] { builder.addRefProp(&ref, "TS_TNM", "g"); }),
                  "Tsd_Builder has no design: call initBaseBuilder() first.\n");
    }
    Tsd_Design own;
    OpenBuilder builder(false);
    builder.initBaseBuilder(&own);
    EXPECT_EQ(fatalText([&] { builder.initBaseBuilder(&own); }),
              "Cannot init base builder or re-init derived builder.\n");
    OpenBuilder creating;
    EXPECT_EQ(fatalText([&] { creating.initBaseBuilder(&own); }),
              "Cannot init base builder or re-init derived builder.\n");
}
