#include "../design/DesignTestSupport.h"

#include "tsd/Tsd_Annotator.h"

#include <gtest/gtest.h>

using tsd_test::attachRef;
using tsd_test::fatalText;
using tsd_test::MessageCapture;
using tsd_test::NamedRef;
using Prop = std::pair<std::string, std::string>;

namespace {

Tsd_TimeValue ns(double v) {
    return Tsd_TimeValue(v, Tsd_TimeValue::UNITS_NS);
}

std::vector<Prop> groupProps(Tsd_Annotator& annotator) {
    std::vector<Prop> out;
    const char* name = nullptr;
    const char* value = nullptr;
    while (annotator.getNextGroupProp(name, value))
        out.emplace_back(name, value);
    return out;
}

struct SpecProp {
    std::string name, value, scope;
    bool operator==(const SpecProp& o) const {
        return name == o.name && value == o.value && scope == o.scope;
    }
};

std::ostream& operator<<(std::ostream& os, const SpecProp& p) {
    return os << p.name << "=" << p.value << " [" << p.scope << "]";
}

std::vector<SpecProp> specProps(Tsd_Annotator& annotator) {
    std::vector<SpecProp> out;
    const char* name = nullptr;
    const char* value = nullptr;
    const char* scope = nullptr;
    while (annotator.getNextSpecProp(name, value, scope))
        out.push_back({name ? name : "<null>", value ? value : "<null>", scope ? scope : ""});
    return out;
}

// A design filled by hand with one object of every kind the annotator visits.
struct Filled {
    Tsd_Design design;
    Tsd_TNMGroup* ffs = new Tsd_TNMGroup("ffs");
    Tsd_ClkGroup* clk = new Tsd_ClkGroup("clk");
    Tsd_TIGGroup* tig = new Tsd_TIGGroup("TS01");
    Tsd_NetOffset* netOffset = new Tsd_NetOffset();
    Tsd_NetTiming* netTiming = new Tsd_NetTiming();
    NamedRef* ffsRef;
    NamedRef* clkRef;
    NamedRef* tigRef;
    NamedRef* netOffsetRef;
    NamedRef* netTimingRef;

    Filled() {
        ffsRef = attachRef(ffs, "ff1");
        clkRef = attachRef(clk, "clk_net");
        tigRef = attachRef(tig, "ram1");
        netOffsetRef = attachRef(netOffset, "data_in");
        netTimingRef = attachRef(netTiming, "n1");
        auto* user = new Tsd_UserGroup("grp");
        user->addGroup(ffs, Tsd_UserGroup::EDGE_RISING, false);
        auto* second = new Tsd_UserGroup("*odd");
        second->addGroup(user, Tsd_UserGroup::EDGE_ANY, false);
        design.addGroup(ffs);
        design.addGroup(user);
        design.addGroup(second);
        design.addClockGroup(clk);
        design.addTIGGroup(tig);

        auto* path = new Tsd_DelayPath("TS01");
        path->setStart(user);
        path->setEnd(ffs);
        path->setDelayValue(ns(10));
        path->setScope("top/core");
        path->setIgnoreGroup(tig);
        auto* period = new Tsd_Period("TS02");
        period->setPeriodGroup(ffs);
        period->setDelayValue(Tsd_TimeValue(100, Tsd_TimeValue::UNITS_MHZ));
        period->setDutyCyclePercent(50, true);
        design.addEndpointSpec(path);
        design.addEndpointSpec(period);

        auto* offset = new Tsd_Offset();
        offset->setClockPad(clk);
        offset->setOffsetValue(ns(2));
        netOffset->setClockPad(clk);
        netOffset->setOffsetValue(ns(1));
        netOffset->setIn(false);
        netOffset->setBefore(false);
        netOffset->setScope("io");
        auto* groupOffset = new Tsd_GroupOffset();
        groupOffset->setClockPad(clk);
        groupOffset->setPadGroup(user);
        groupOffset->setOffsetValue(ns(3));
        design.addOffsetSpec(offset);
        design.addOffsetSpec(netOffset);
        design.addOffsetSpec(groupOffset);
        design.addPathControl(new Tsd_PathControl("arc_1", false));

        netTiming->setMaxSkewValue(Tsd_TimeValue(500, Tsd_TimeValue::UNITS_PS));
        design.addNetSpec(netTiming);
    }
};

// An endpoint spec without a property of its own.
class Mute : public Tsd_EndpointSpec {
public:
    Mute() : Tsd_EndpointSpec("TS99") {}
};

} // namespace

TEST(Annotator, EmptyDesignYieldsNothingAndKeepsYieldingNothing) {
    Tsd_Design design;
    Tsd_Annotator annotator(&design);
    const char* name = "x";
    const char* value = "y";
    const char* scope = "z";
    for (int i = 0; i < 3; ++i) {
        EXPECT_FALSE(annotator.getNextGroupProp(name, value));
        EXPECT_FALSE(annotator.getNextSpecProp(name, value, scope));
    }
    EXPECT_EQ(name, nullptr);
    EXPECT_EQ(value, nullptr);
    EXPECT_EQ(scope, nullptr);
}

TEST(Annotator, GroupsThenSpecsInListOrderSkippingReferenceHolders) {
    Filled f;
    Tsd_Annotator annotator(&f.design);
    EXPECT_EQ(groupProps(annotator), (std::vector<Prop>{{"grp", "RISING:ffs"}, {"*odd", "grp"}}));
    EXPECT_EQ(specProps(annotator),
              (std::vector<SpecProp>{
                  {"TS01", "FROM:grp:TO:ffs:10:nS", "top/core"},
                  {"TS02", "PERIOD:ffs:100:MHz:HIGH:50%", ""},
                  {"OFFSET", "IN:2:nS:BEFORE:clk", ""},
                  {"TS_GROUP_BASED_OFFSET", "TIMEGRP:grp:OFFSET=IN:3:nS:BEFORE:clk", ""},
                  {"DISABLE", "arc_1", ""}}));
}

TEST(Annotator, TwoArgumentOverloadsMatch) {
    Filled f;
    Tsd_Annotator withScope(&f.design);
    Tsd_Annotator without(&f.design);
    std::vector<SpecProp> full = specProps(withScope);
    std::vector<Prop> plain;
    const char* name = nullptr;
    const char* value = nullptr;
    while (without.getNextSpecProp(name, value))
        plain.emplace_back(name, value);
    ASSERT_EQ(plain.size(), full.size());
    for (size_t i = 0; i < plain.size(); ++i)
        EXPECT_EQ(plain[i], (Prop{full[i].name, full[i].value}));

    const char* scope = nullptr;
    ASSERT_TRUE(withScope.getRefProp(f.netOffsetRef, name, value, scope));
    std::string n4 = name, v4 = value, s4 = scope;
    ASSERT_TRUE(without.getRefProp(f.netOffsetRef, name, value));
    EXPECT_EQ(n4, name);
    EXPECT_EQ(v4, value);
    EXPECT_EQ(s4, "io");
}

TEST(Annotator, ReferencePropertiesComeFromTheirOwners) {
    Filled f;
    Tsd_Annotator annotator(&f.design);
    const char* name = nullptr;
    const char* value = nullptr;
    const char* scope = "stale";
    struct Case {
        NamedRef* ref;
        const char* name;
        const char* value;
    };
    for (const Case& c :
         {Case{f.ffsRef, "TS_TNM", "ffs"}, Case{f.clkRef, "TS_CLKGRP", "clk"},
          Case{f.tigRef, "TS_TIG", "TS01"}, Case{f.netOffsetRef, "TS_OFFSET", "OUT:1:nS:AFTER:clk"},
          Case{f.netTimingRef, "TS_MAXSKEW", "500:pS"}}) {
        ASSERT_TRUE(annotator.getRefProp(c.ref, name, value, scope)) << c.name;
        EXPECT_STREQ(name, c.name);
        EXPECT_STREQ(value, c.value);
    }
    EXPECT_EQ(scope, nullptr); // the net timing has no scope
    NamedRef loose("x");
    EXPECT_FALSE(annotator.getRefProp(&loose, name, value, scope));
    EXPECT_FALSE(annotator.getRefProp(nullptr, name, value, scope));
    EXPECT_EQ(name, nullptr);
    EXPECT_EQ(value, nullptr);
}

TEST(Annotator, ReferencesOfTrashedOwnersHaveNoProperty) {
    Filled f;
    // The only TNM reference goes; trim trashes the TNM group, the user
    // groups that only include it, the specs on them, and the TIG group of
    // the trashed path.
    f.ffsRef->trim();
    ASSERT_TRUE(f.design.trim());
    Tsd_Annotator annotator(&f.design);
    const char* name = nullptr;
    const char* value = nullptr;
    EXPECT_FALSE(annotator.getRefProp(f.tigRef, name, value));
    EXPECT_EQ(name, nullptr);
    EXPECT_EQ(value, nullptr);
    EXPECT_TRUE(annotator.getRefProp(f.clkRef, name, value));
    EXPECT_TRUE(groupProps(annotator).empty());
    std::vector<SpecProp> specs = specProps(annotator);
    ASSERT_EQ(specs.size(), 2u);
    EXPECT_EQ(specs[0].name, "OFFSET");
    EXPECT_EQ(specs[1].name, "DISABLE");
}

TEST(Annotator, ASpecWithoutPropertyIsAnInternalErrorAndTheWalkGoesOn) {
    MessageCapture capture;
    Tsd_Design design;
    design.addEndpointSpec(new Mute());
    design.addPathControl(new Tsd_PathControl("d", true));
    Tsd_Annotator annotator(&design);
    const char* name = "x";
    const char* value = "y";
    EXPECT_TRUE(annotator.getNextSpecProp(name, value));
    EXPECT_EQ(name, nullptr);
    ASSERT_EQ(capture.sink.records.size(), 1u);
    EXPECT_EQ(capture.sink.records[0].severity, MessageSeverity::InternalError);
    EXPECT_EQ(capture.sink.records[0].text,
              "getProp() returned FALSE on spec no property for object.\n");
    EXPECT_TRUE(annotator.getNextSpecProp(name, value));
    EXPECT_STREQ(name, "ENABLE");
    EXPECT_FALSE(annotator.getNextSpecProp(name, value));
}

TEST(Annotator, NullDesignIsFatalAndDumpSaysLittle) {
    MessageCapture capture;
    int code = 0;
    EXPECT_EQ(fatalText([] { Tsd_Annotator annotator(nullptr); }, &code),
              "NULL design in Tsd_Annotator.\n");
    EXPECT_EQ(code, 2);
    Tsd_Design design;
    Tsd_Annotator annotator(&design);
    EXPECT_EQ(tsd_test::dumpText(annotator, 1),
              "   Tsd_Annotator\n      nothing interesting to report\n");
}
