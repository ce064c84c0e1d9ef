#include "DesignTestSupport.h"

#include <gtest/gtest.h>

using tsd_test::attachRef;
using tsd_test::fatalText;
using tsd_test::MessageCapture;

namespace {

std::vector<Tsd_BaseObj*> items(const Tsd_BaseObjList* list) {
    std::vector<Tsd_BaseObj*> out;
    Tsd_BaseObjListIter iter(list);
    while (Tsd_BaseObj* obj = iter.next())
        out.push_back(obj);
    return out;
}

} // namespace

TEST(Design, AddMoveAndTrashQueries) {
    Tsd_Design design;
    auto* a = new Tsd_TNMGroup("a");
    auto* b = new Tsd_UserGroup("b");
    design.addGroup(a);
    design.addGroup(b);
    design.addGroup(nullptr); // ignored
    EXPECT_EQ(items(design.getGroupList()), (std::vector<Tsd_BaseObj*>{a, b}));

    EXPECT_TRUE(design.moveGroupToTrash(a));
    EXPECT_TRUE(design.isGroupTrashed(a));
    EXPECT_FALSE(design.isGroupTrashed(b));
    EXPECT_FALSE(design.isGroupTrashed(nullptr));
    // Already trashed: nothing changes.
    EXPECT_FALSE(design.moveGroupToTrash(a));
    EXPECT_EQ(items(design.getGroupTrash()), (std::vector<Tsd_BaseObj*>{a}));
    EXPECT_EQ(items(design.getGroupList()), (std::vector<Tsd_BaseObj*>{b}));
    EXPECT_EQ(design.getGroupList()->getCount(), 2); // the hole stays
    // A null argument never removes a hole.
    EXPECT_FALSE(design.moveGroupToTrash(nullptr));
    EXPECT_EQ(design.getGroupTrash()->getCount(), 1);

    auto* spec = new Tsd_Period("TS01");
    design.addEndpointSpec(spec);
    EXPECT_TRUE(design.moveEndpointSpecToTrash(spec));
    EXPECT_TRUE(design.isEndpointSpecTrashed(spec));
    auto* control = new Tsd_PathControl("d1", true);
    design.addPathControl(control);
    EXPECT_FALSE(design.isPathControlTrashed(control));
    EXPECT_TRUE(design.movePathControlToTrash(control));
    EXPECT_TRUE(design.isPathControlTrashed(control));
}

TEST(Design, FindsCompareExactlyAndSearchTrashOnlyWhenAsked) {
    Tsd_Design design;
    auto* first = new Tsd_TNMGroup("clk");
    auto* second = new Tsd_UserGroup("clk");
    auto* unnamed = new Tsd_UserGroup(nullptr);
    auto* gone = new Tsd_TNMGroup("gone");
    design.addGroup(unnamed);
    design.addGroup(first);
    design.addGroup(second);
    design.addGroup(gone);
    design.moveGroupToTrash(gone);

    EXPECT_EQ(design.findGroupByUserName("clk", false), first); // the first added wins
    EXPECT_EQ(design.findGroupByUserName("CLK", false), nullptr);
    EXPECT_EQ(design.findGroupByUserName("gone", false), nullptr);
    EXPECT_EQ(design.findGroupByUserName("gone", true), gone);
    EXPECT_EQ(design.findGroupByUserName("", true), nullptr);

    auto* clock = new Tsd_ClkGroup("clk_net");
    design.addClockGroup(clock);
    EXPECT_EQ(design.findClockGroupByNetName("clk_net", false), clock);
    EXPECT_EQ(design.findClockGroupByNetName("clk", false), nullptr);

    auto* global = new Tsd_TIGGroup(nullptr);
    auto* tig = new Tsd_TIGGroup("TS01");
    auto* upper = new Tsd_TIGGroup("GLOBAL");
    design.addTIGGroup(upper);
    design.addTIGGroup(tig);
    design.addTIGGroup(global);
    EXPECT_EQ(design.findTIGByTSid(nullptr, false), global);
    EXPECT_EQ(design.findTIGByTSid("", false), global);
    EXPECT_EQ(design.findTIGByTSid("TS01", false), tig);
    EXPECT_EQ(design.findTIGByTSid("GLOBAL", false), upper);

    auto* path = new Tsd_DelayPath("TS01");
    auto* trashedSpec = new Tsd_Period("TS02");
    design.addEndpointSpec(path);
    design.addEndpointSpec(trashedSpec);
    design.moveEndpointSpecToTrash(trashedSpec);
    EXPECT_EQ(design.findEndpointSpecByTSid("TS01", false), path);
    EXPECT_EQ(design.findEndpointSpecByTSid("TS02", false), nullptr);
    EXPECT_EQ(design.findEndpointSpecByTSid("TS02", true), trashedSpec);
    EXPECT_EQ(design.findEndpointSpecByTSid("ts01", true), nullptr);
}

TEST(Design, AnObjectOfTheWrongClassInATypedListIsFatal) {
    MessageCapture capture;
    Tsd_Design design;
    design.getGroupList()->addObj(new Tsd_Period("TS01"));
    design.getClockGroupList()->addObj(new Tsd_TNMGroup("t"));
    design.getTIGGroupList()->addObj(new Tsd_ClkGroup("c"));
    design.getEndpointSpecList()->addObj(new Tsd_Offset());
    int code = 0;
    EXPECT_EQ(fatalText([&] { design.findGroupByUserName("x", false); }, &code),
              "Non-group object.\n");
    EXPECT_EQ(code, 2);
    EXPECT_EQ(fatalText([&] { design.findClockGroupByNetName("x", false); }),
              "Non-clock group object.\n");
    EXPECT_EQ(fatalText([&] { design.findTIGByTSid("x", false); }), "Non-TIG object.\n");
    EXPECT_EQ(fatalText([&] { design.findEndpointSpecByTSid("x", false); }),
              "Non-endpoint spec object.\n");
}

TEST(Design, DestructionDeletesActiveAndTrashedObjectsOnce) {
    int destroyed = 0;
    {
        Tsd_Design design;
        auto* active = new Tsd_TNMGroup("a");
        auto* trashed = new Tsd_ClkGroup("c");
        auto* twice = new Tsd_ThruGroup("t");
        attachRef(active, "a", &destroyed);
        attachRef(trashed, "c", &destroyed);
        attachRef(twice, "t", &destroyed);
        design.addGroup(active);
        design.addClockGroup(trashed);
        design.moveClockGroupToTrash(trashed);
        // A caller that adds an object twice must not cause a double delete.
        design.addGroup(twice);
        design.addGroup(twice);
        auto* global = new Tsd_TIGGroup("global");
        design.addTIGGroup(global);
        design.setGlobalTIG(global); // not deleted separately
    }
    EXPECT_EQ(destroyed, 3);
}

TEST(Design, ReferenceTypeAndGlobalTIG) {
    Tsd_Design plain;
    EXPECT_EQ(plain.getRefType(), nullptr);
    Tsd_Design typed("MM_TSREF");
    EXPECT_STREQ(typed.getRefType(), "MM_TSREF");
    EXPECT_EQ(typed.getGlobalTIG(), nullptr);
    auto* tig = new Tsd_TIGGroup(nullptr);
    typed.addTIGGroup(tig);
    typed.setGlobalTIG(tig);
    EXPECT_EQ(typed.getGlobalTIG(), tig);

    // A derived design may set the type.
    struct Typed : Tsd_Design {
        Typed() { setRefType("MY_REF"); }
    } derived;
    EXPECT_STREQ(derived.getRefType(), "MY_REF");
}

TEST(Design, DumpOfAnEmptyDesign) {
    Tsd_Design design;
    std::string expected = "Tsd_Design\n";
    for (const char* list : {"m_groups", "m_clockGroups", "m_tigGroups", "m_endpointSpecs",
                             "m_offsetSpecs", "m_netSpecs", "m_pathControls", "m_portSpecs"}) {
        expected += std::string("   ") + list + ":\n";
        expected += "      active objects:\n      trashed objects:\n";
    }
    expected += "   global TIG is not installed\n";
    EXPECT_EQ(tsd_test::dumpText(design), expected);
}

TEST(Design, DumpNestsObjectsAndNamesTheReferenceType) {
    Tsd_Design design("MM_TSREF");
    auto* clk = new Tsd_TNMGroup("clk");
    auto* old = new Tsd_TNMGroup("old");
    design.addGroup(clk);
    design.addGroup(old);
    design.moveGroupToTrash(old);
    auto* global = new Tsd_TIGGroup(nullptr);
    design.addTIGGroup(global);
    design.setGlobalTIG(global);
    std::string text = tsd_test::dumpText(design, 1);
    std::string expected = "   Tsd_Design\n"
                           "      design refType \"MM_TSREF\"\n"
                           "      m_groups:\n"
                           "         active objects:\n"
                           "            Tsd_TNMGroup\n"
                           "               name = clk\n"
                           "               references:\n"
                           "         trashed objects:\n"
                           "            Tsd_TNMGroup\n"
                           "               name = old\n"
                           "               references:\n"
                           "      m_clockGroups:\n"
                           "         active objects:\n"
                           "         trashed objects:\n"
                           "      m_tigGroups:\n"
                           "         active objects:\n"
                           "            Tsd_TIGGroup\n"
                           "               name = global\n"
                           "               references:\n"
                           "         trashed objects:\n";
    EXPECT_EQ(text.substr(0, expected.size()), expected);
    EXPECT_NE(text.find("      global TIG is installed\n"), std::string::npos);
}
