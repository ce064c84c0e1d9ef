// Reference groups, predefined-group keywords and patterns, and user groups:
// their properties and dumps (groups.golden), member entries and the search
// for circular definitions.
#include "TsdTestSupport.h"
#include "internal/Tsd_GroupCircles.h"

#include <memory>

using namespace tsd_test;
using P = Tsd_PredefGroup;
using UG = Tsd_UserGroup;

TEST(Groups, PropertiesAndDumps) {
    std::string text;
    auto add = [&](const std::string& title, const Tsd_BaseObj& obj) {
        text += "== " + title + "\n" + describe(obj);
    };
    Tsd_TNMGroup tnm("clk_ffs"), ffs("FFS"), slow("*slow");
    attachRef(&tnm, "a");
    add("TNM group with a reference", tnm);
    add("TPSYNC group", Tsd_SyncGroup("s1"));
    add("TPTHRU group", Tsd_ThruGroup("/top/mux"));
    add("TIG group of a TSid", Tsd_TIGGroup("TS01"));
    add("TIG group without TSid", Tsd_TIGGroup(""));
    add("unnamed clock group", Tsd_ClkGroup(nullptr));

    UG a("a"), b(nullptr), c("c");
    a.addGroup(&ffs, UG::EDGE_ANY, false);
    a.addGroup(&tnm, UG::EDGE_RISING, false);
    a.addGroup(&slow, UG::EDGE_TRANSHI, true);
    a.addGroup(&ffs, UG::EDGE_TRANSLO, true);
    add("user group", a);
    b.addGroup(&slow, UG::EDGE_ANY, true);
    add("unnamed user group of excludes only", b);
    c.addGroup(&ffs, UG::EDGE_FALLING, false);
    c.addGroup(&b, static_cast<UG::Edge>(9), false); // no edge word; unnamed member
    add("user group with an unknown edge", c);

    // Entries: removal takes every entry of a member from one list, a null
    // member is refused (it would end every walk), copies keep their own.
    UG g("g");
    g.addGroup(&tnm, UG::EDGE_RISING, false);
    g.addGroup(&ffs, UG::EDGE_ANY, false);
    g.addGroup(&tnm, UG::EDGE_FALLING, false);
    g.addGroup(&tnm, UG::EDGE_ANY, true);
    g.addGroup(nullptr, UG::EDGE_ANY, false);
    UG copy(g);
    EXPECT_TRUE(g.removeGroup(&tnm, false));
    EXPECT_FALSE(g.removeGroup(&tnm, false));
    EXPECT_FALSE(g.removeGroup(nullptr, true));
    g.addGroup(&slow, UG::EDGE_ANY, false);
    add("user group after removing an included member and adding one", g);
    UG copyOfHoles(g);
    g.clearDef();
    add("cleared user group", g);
    add("copy made before the removal", copy);
    add("copy made after it", copyOfHoles);
    expectGolden("groups/groups.golden", text);
}

TEST(Groups, TIGidsAndGroupsDestroyOnlyTheReferencesTheyHold) {
    EXPECT_STREQ(Tsd_TIGGroup("TS01").getTIGid(), "TS01");
    for (const char* global : {(const char*)nullptr, "", "global", "GLOBAL"})
        EXPECT_EQ(Tsd_TIGGroup(global).getTIGid(), nullptr);
    Tsd_TIGGroup renamed("TS01"); // emptied after construction: still no TSid
    renamed.setName("");
    EXPECT_EQ(renamed.getTIGid(), nullptr);

    int destroyed = 0;
    Tsd_SyncGroup other("other");
    auto* moved = new NamedRef("moved", &destroyed);
    {
        Tsd_TNMGroup tnm("g");
        attachRef(&tnm, "a", &destroyed);
        moved->setOwner(&tnm);
        moved->setOwner(&other); // leaves a hole
        NamedRef* twice = attachRef(&tnm, "twice", &destroyed);
        tnm.addRef(twice); // held twice, destroyed once
    }
    EXPECT_EQ(destroyed, 2);
    EXPECT_EQ(moved->getOwner(), &other);
}

TEST(Groups, PredefinedKeywordsAndTNMPatterns) {
    EXPECT_EQ(P::convertStringToPredefType("rams"), P::PREDEF_RAMS);
    EXPECT_EQ(P::convertStringToPredefType("Other"), P::PREDEF_OTHER);
    EXPECT_EQ(P::convertStringToPredefType("FFS "), P::PREDEF_NONE);
    EXPECT_EQ(P::convertStringToPredefType(nullptr), P::PREDEF_NONE);
    EXPECT_STREQ(P::convertPredefTypeToString(P::PREDEF_LATCHES), "LATCHES");
    EXPECT_EQ(P::convertPredefTypeToString(P::PREDEF_NONE), nullptr);
    const struct {
        const char* name;
        P::PredefType type;
        bool simple;
    } cases[] = {
        {"FFS", P::PREDEF_FFS, true},         {"ffs", P::PREDEF_FFS, true},
        {"pads", P::PREDEF_PADS, true},       {"FFS  (q*)", P::PREDEF_FFS, false},
        {"FFS\t\n(x)", P::PREDEF_FFS, false}, {"LATCHES(a)", P::PREDEF_LATCHES, false},
        {"PPS", P::PREDEF_PPS, true},         {"PADSX", P::PREDEF_NONE, false},
        {"RAMS_1", P::PREDEF_NONE, false},    {"FFS ", P::PREDEF_NONE, false},
        {"OTHER(a)", P::PREDEF_NONE, false},  {"mygroup", P::PREDEF_NONE, false},
        {nullptr, P::PREDEF_NONE, false},
    };
    for (const auto& c : cases) {
        Tsd_TNMGroup g(c.name);
        EXPECT_EQ(g.getPredefTypeForPattern(), c.type) << (c.name ? c.name : "null");
        EXPECT_EQ(g.isSimpleWildcardPattern(), c.simple) << (c.name ? c.name : "null");
    }
}

namespace {

// Each case runs twice: with the groups' marks free, and with them taken by
// another holder, when a search keeps its own table.
class CircularGroups : public ::testing::TestWithParam<bool> {
protected:
    CircularGroups() {
        if (GetParam())
            m_taken = std::make_unique<tsd_detail::UserGroupMarks>();
    }
    UG* group(const std::string& name) {
        m_groups.push_back(std::make_unique<UG>(name.c_str()));
        return m_groups.back().get();
    }
    static void include(UG* g, UG* member, bool exclude = false) {
        g->addGroup(member, UG::EDGE_ANY, exclude);
    }
    MessageCapture capture;

private:
    std::unique_ptr<tsd_detail::UserGroupMarks> m_taken;
    std::vector<std::unique_ptr<UG>> m_groups;
};

} // namespace

TEST_P(CircularGroups, EveryRouteCountsAndIsListedFromWhereTheCheckStarts) {
    UG* q = group("Q");
    UG* r = group("R");
    q->addGroup(r, UG::EDGE_RISING, false);
    include(r, q, true); // through an excluded member
    EXPECT_EQ(r->checkInExcludes(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Circular group definition encountered from user group \"R\", as follows:\n"
              "status:    R=:EXCEPT:Q\n"
              "status:    Q=RISING:R\n");
    capture.sink.clear();
    EXPECT_EQ(q->checkInExcludes(false), 1);
    EXPECT_TRUE(capture.sink.records.empty());

    // P includes Q2 and R2, which both include S; S and T include each
    // other: two routes reach the circle.
    UG *p = group("P"), *q2 = group("Q2"), *r2 = group("R2"), *s = group("S"), *t = group("T");
    include(p, q2);
    include(p, r2);
    include(q2, s);
    include(r2, s);
    EXPECT_EQ(p->checkInExcludes(true), 0);
    include(s, t);
    include(t, s);
    EXPECT_EQ(p->checkInExcludes(true), 2);
    EXPECT_EQ(capture.sink.statuses(),
              (std::vector<std::string>{"   P=Q2:R2\n", "   Q2=S\n", "   S=T\n", "   T=S\n",
                                        "   P=Q2:R2\n", "   R2=S\n", "   S=T\n", "   T=S\n"}));
}

TEST_P(CircularGroups, DeepChainsAndWideLatticesStayCheap) {
    std::vector<UG*> chain;
    for (int i = 0; i < 50000; ++i) { // deeper than a recursive walk could go
        chain.push_back(group("C" + std::to_string(i)));
        if (i > 0)
            include(chain[i - 1], chain[i]);
    }
    EXPECT_EQ(chain[0]->checkInExcludes(false), 0);
    include(chain.back(), chain[100]);
    EXPECT_EQ(chain[0]->checkInExcludes(false), 1);

    // 64 levels of two groups that both include both groups below: 2^64
    // routes and no circle.
    std::vector<UG*> level = {group("top")};
    UG* top = level[0];
    for (int i = 0; i < 64; ++i) {
        std::vector<UG*> next = {group("L"), group("R")};
        for (UG* g : level)
            for (UG* n : next)
                include(g, n);
        level = next;
    }
    EXPECT_EQ(top->checkInExcludes(true), 0);
}

INSTANTIATE_TEST_SUITE_P(MarksFreeOrTaken, CircularGroups, ::testing::Bool());
