// The annotator over a design filled by hand: what it writes, in which order,
// with which scope, and what it withholds. Written texts of built designs
// are in the builder's scenarios.
#include "TsdTestSupport.h"

#include "tsd/Tsd_Annotator.h"

using namespace tsd_test;

namespace {

// Every property the annotator hands out, one a line, with its scope.
std::string written(Tsd_Design& design, const std::vector<NamedRef*>& refs) {
    Tsd_Annotator withScope(&design), without(&design);
    std::string out;
    const char *name = "x", *value = "y", *scope = "z";
    while (withScope.getNextGroupProp(name, value))
        out += std::string("group ") + name + " = " + value + "\n";
    EXPECT_FALSE(withScope.getNextGroupProp(name, value)); // an exhausted walk stays so
    EXPECT_TRUE(name == nullptr && value == nullptr);
    while (withScope.getNextSpecProp(name, value, scope)) {
        out += std::string("spec ") + name + " = " + value;
        out += scope != nullptr ? std::string(" [") + scope + "]\n" : "\n";
        // The overload without scope gives the same.
        const char *plainName = nullptr, *plainValue = nullptr;
        EXPECT_TRUE(without.getNextSpecProp(plainName, plainValue));
        EXPECT_EQ(std::string(plainName) + plainValue, std::string(name) + value);
    }
    EXPECT_FALSE(without.getNextSpecProp(name, value));
    EXPECT_FALSE(withScope.getNextSpecProp(name, value, scope));
    EXPECT_TRUE(name == nullptr && value == nullptr && scope == nullptr);
    for (NamedRef* ref : refs) {
        scope = "stale";
        if (withScope.getRefProp(ref, name, value, scope)) {
            out += "ref " + ref->name() + " " + name + " = " + value;
            out += scope != nullptr ? std::string(" [") + scope + "]\n" : "\n";
        } else {
            EXPECT_TRUE(name == nullptr && value == nullptr && scope == nullptr);
            out += "ref " + ref->name() + " withheld\n";
        }
    }
    return out;
}

} // namespace

TEST(Annotator, WritesGroupsThenSpecsAndReferencesOfLiveOwners) {
    Tsd_Design design;
    auto* ffs = new Tsd_TNMGroup("ffs");
    auto* clk = new Tsd_ClkGroup("clk");
    auto* tig = new Tsd_TIGGroup("TS01");
    auto* netOffset = new Tsd_NetOffset();
    auto* netTiming = new Tsd_NetTiming();
    NamedRef loose("loose");
    std::vector<NamedRef*> refs = {attachRef(ffs, "ff1"),      attachRef(clk, "clk_net"),
                                   attachRef(tig, "ram1"),     attachRef(netOffset, "data_in"),
                                   attachRef(netTiming, "n1"), &loose};
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
    design.addEndpointSpec(path);
    design.addEndpointSpec(period);
    auto* offset = new Tsd_Offset();
    offset->setClockPad(clk);
    offset->setOffsetValue(ns(2));
    netOffset->setClockPad(clk);
    netOffset->setOffsetValue(ns(1));
    netOffset->setScope("io");
    auto* groupOffset = new Tsd_GroupOffset();
    groupOffset->setClockPad(clk);
    groupOffset->setPadGroup(user);
    design.addOffsetSpec(offset);
    design.addOffsetSpec(netOffset);
    design.addOffsetSpec(groupOffset);
    design.addPathControl(new Tsd_PathControl("arc_1", false));
    netTiming->setMaxSkewValue(Tsd_TimeValue(500, Tsd_TimeValue::UNITS_PS));
    design.addNetSpec(netTiming);
    auto* port = new Tsd_PortTiming("FEEDBACK");
    port->setConstraintValue(ns(1));
    port->setSecondaryGroup(clk);
    design.addPortTiming(port);
    refs.push_back(attachRef(port, "fb"));

    std::string text = written(design, refs);
    // The only TNM reference goes: trim trashes the TNM group, the user
    // groups that only include it, the specs on them, the TIG group of the
    // trashed path: their references are withheld.
    refs[0]->trim();
    refs.erase(refs.begin());
    ASSERT_TRUE(design.trim());
    design.moveOffsetSpecToTrash(netOffset);
    design.moveNetSpecToTrash(netTiming);
    design.movePortTimingToTrash(port);
    expectGolden("annotator/annotator.golden", text + "--- after trim\n" + written(design, refs));
}

TEST(Annotator, ASpecWithoutPropertyIsAnInternalErrorAndTheWalkGoesOn) {
    MessageCapture capture;
    struct Mute : Tsd_EndpointSpec {
        Mute() : Tsd_EndpointSpec("TS99") {}
    };
    Tsd_Design design;
    design.addEndpointSpec(new Mute());
    design.addPathControl(new Tsd_PathControl("d", true));
    Tsd_Annotator annotator(&design);
    const char* name = "x";
    const char* value = "y";
    EXPECT_TRUE(annotator.getNextSpecProp(name, value));
    EXPECT_EQ(name, nullptr);
    EXPECT_EQ(capture.sink.transcript(), "internal error: getProp() returned FALSE on spec no "
                                         "property for object.\n");
    EXPECT_TRUE(annotator.getNextSpecProp(name, value));
    EXPECT_STREQ(name, "ENABLE");
    EXPECT_FALSE(annotator.getNextSpecProp(name, value));
    EXPECT_FALSE(annotator.getRefProp(nullptr, name, value));

    int code = 0;
    EXPECT_EQ(fatalText([] { Tsd_Annotator none(nullptr); }, &code),
              "NULL design in Tsd_Annotator.\n");
    EXPECT_EQ(code, 2);
    EXPECT_EQ(dumpText(annotator, 1), "   Tsd_Annotator\n      nothing interesting to report\n");
}
