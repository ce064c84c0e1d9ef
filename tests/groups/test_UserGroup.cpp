#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

using tsd_test::dumpText;
using tsd_test::MessageCapture;
using tsd_test::Prop;
using tsd_test::propOf;
using UG = Tsd_UserGroup;

namespace {

// The members of one list as "EDGE name" strings, in order.
std::vector<std::string> members(const UG& g, bool excludes) {
    std::vector<std::string> out;
    Tsd_UserGroupIter iter(&g, excludes);
    UG::Edge edge = UG::EDGE_ANY;
    while (Tsd_PredefGroup* m = iter.next(edge))
        out.push_back(std::to_string(edge) + " " + m->getName());
    return out;
}

} // namespace

TEST(UserGroup, TypeQueries) {
    UG g("u");
    Tsd_BaseObj& obj = g;
    EXPECT_EQ(obj.getUserGroup(), &g);
    EXPECT_EQ(obj.getPredefGroup(), &g);
    EXPECT_EQ(obj.getTermGroup(), &g);
    EXPECT_EQ(obj.getGroup(), &g);
    EXPECT_EQ(obj.getTNMGroup(), nullptr);
    EXPECT_FALSE(obj.refOwner());
    Tsd_GroupRef entry(&g, UG::EDGE_RISING);
    EXPECT_EQ(entry.getGroup(), nullptr);
    EXPECT_EQ(propOf(entry).name, "<no property>");
    EXPECT_EQ(dumpText(entry), "");
}

TEST(UserGroup, TimegrpValue) {
    Tsd_TNMGroup ffs("FFS"), clkgrp("clkgrp"), slow("slow_ffs"), fast("fast"), star("*odd");
    Tsd_TNMGroup slash("//x"), quoteFree("/top/a");
    struct Member {
        Tsd_PredefGroup* group;
        UG::Edge edge;
        bool exclude;
    };
    struct Case {
        const char* name;
        std::vector<Member> members;
        const char* value;
    };
    const std::vector<Case> cases = {
        {"grp",
         {{&ffs, UG::EDGE_ANY, false},
          {&clkgrp, UG::EDGE_RISING, false},
          {&slow, UG::EDGE_ANY, true}},
         "FFS:RISING:clkgrp:EXCEPT:slow_ffs"},
        {"edges",
         {{&ffs, UG::EDGE_FALLING, false},
          {&ffs, UG::EDGE_TRANSHI, false},
          {&ffs, UG::EDGE_TRANSLO, false},
          {&ffs, static_cast<UG::Edge>(9), false}},
         "FALLING:FFS:TRANSHI:FFS:TRANSLO:FFS:FFS"},
        {"onlyExcluded", {{&slow, UG::EDGE_ANY, true}}, ":EXCEPT:slow_ffs"},
        {"twoExcluded",
         {{&fast, UG::EDGE_ANY, false}, {&slow, UG::EDGE_ANY, true}, {&ffs, UG::EDGE_RISING, true}},
         "fast:EXCEPT:slow_ffs:RISING:FFS"},
        {"quoted",
         {{&star, UG::EDGE_ANY, false},
          {&slash, UG::EDGE_ANY, false},
          {&quoteFree, UG::EDGE_ANY, false}},
         "\"*odd\":\"//x\":/top/a"},
        {"empty", {}, ""},
    };
    for (const Case& c : cases) {
        UG g(c.name);
        for (const Member& m : c.members)
            g.addGroup(m.group, m.edge, m.exclude);
        EXPECT_EQ(propOf(g), (Prop{c.name, c.value}));
    }
    UG unnamed(nullptr);
    unnamed.addGroup(&ffs, UG::EDGE_ANY, false);
    EXPECT_EQ(propOf(unnamed), (Prop{"", "FFS"}));
    // A user group as a member, and a member without a name.
    UG outer("outer");
    UG nameless(nullptr);
    outer.addGroup(&unnamed, UG::EDGE_ANY, false);
    outer.addGroup(&nameless, UG::EDGE_RISING, false);
    EXPECT_EQ(propOf(outer), (Prop{"outer", "\"\":RISING:\"\""}));
}

TEST(UserGroup, AddRemoveAndClear) {
    Tsd_TNMGroup a("a"), b("b");
    UG g("g");
    g.addGroup(&a, UG::EDGE_RISING, false);
    g.addGroup(&b, UG::EDGE_ANY, false);
    g.addGroup(&a, UG::EDGE_FALLING, false);
    g.addGroup(&a, UG::EDGE_ANY, true);
    EXPECT_EQ(members(g, false), (std::vector<std::string>{"0 a", "4 b", "1 a"}));

    EXPECT_TRUE(g.removeGroup(&a, false)); // both included entries, whatever the edge
    EXPECT_EQ(members(g, false), (std::vector<std::string>{"4 b"}));
    EXPECT_EQ(members(g, true), (std::vector<std::string>{"4 a"})); // excluded one stays
    EXPECT_FALSE(g.removeGroup(&a, false));
    EXPECT_FALSE(g.removeGroup(nullptr, false));
    EXPECT_TRUE(g.removeGroup(&a, true));
    EXPECT_EQ(propOf(g).value, "b");

    // A null member is refused: it would hide every member added after it.
    g.addGroup(nullptr, UG::EDGE_ANY, false);
    g.addGroup(&a, UG::EDGE_ANY, false);
    EXPECT_EQ(propOf(g).value, "b:a");

    g.clearDef();
    EXPECT_EQ(propOf(g), (Prop{"g", ""}));
    g.addGroup(&b, UG::EDGE_ANY, true);
    EXPECT_EQ(propOf(g).value, ":EXCEPT:b");
}

TEST(UserGroup, CopiesHaveTheirOwnEntriesAndShareTheMembers) {
    Tsd_TNMGroup a("a"), b("b"), c("c");
    auto source = std::make_unique<UG>("src");
    source->addGroup(&a, UG::EDGE_RISING, false);
    source->addGroup(&b, UG::EDGE_ANY, false);
    source->addGroup(&c, UG::EDGE_ANY, true);
    source->removeGroup(&a, false); // a hole that the copy drops

    UG copy(*source);
    EXPECT_EQ(propOf(copy), (Prop{"src", "b:EXCEPT:c"}));
    Tsd_UserGroupIter iter(&copy, false);
    UG::Edge edge = UG::EDGE_RISING;
    EXPECT_EQ(iter.next(edge), &b); // the same member object
    EXPECT_EQ(edge, UG::EDGE_ANY);

    copy.clearDef();
    copy.setName("copy");
    EXPECT_EQ(propOf(*source), (Prop{"src", "b:EXCEPT:c"}));
    source->addGroup(&a, UG::EDGE_ANY, false);
    source.reset(); // the copy does not depend on the source
    EXPECT_EQ(propOf(copy), (Prop{"copy", ""}));
}

TEST(UserGroupIter, WalksIndependentlyAndSkipsHoles) {
    Tsd_TNMGroup a("a"), b("b"), c("c");
    UG g("g");
    g.addGroup(&a, UG::EDGE_ANY, false);
    g.addGroup(&b, UG::EDGE_FALLING, false);
    g.addGroup(&c, UG::EDGE_ANY, false);
    Tsd_UserGroupIter first(&g, false);
    Tsd_UserGroupIter second(&g, false);
    UG::Edge edge = UG::EDGE_ANY;
    EXPECT_EQ(first.next(edge), &a);
    g.removeGroup(&b, false); // removed during the walk
    EXPECT_EQ(first.next(edge), &c);
    EXPECT_EQ(first.next(edge), nullptr);
    EXPECT_EQ(second.next(edge), &a);
    EXPECT_EQ(second.next(edge), &c);

    Tsd_UserGroupIter none(nullptr, false);
    EXPECT_EQ(none.next(edge), nullptr);
    Tsd_UserGroupIter noExcludes(&g, true);
    EXPECT_EQ(noExcludes.next(edge), nullptr);
}

TEST(UserGroup, DumpGolden) {
    Tsd_TNMGroup ffs("FFS"), clk("clkgrp"), slow("*slow");
    UG g("grp");
    g.addGroup(&ffs, UG::EDGE_ANY, false);
    g.addGroup(&clk, UG::EDGE_RISING, false);
    g.addGroup(&clk, UG::EDGE_TRANSLO, false);
    g.addGroup(&slow, UG::EDGE_FALLING, true);
    g.addGroup(&ffs, UG::EDGE_TRANSHI, true);
    g.addGroup(&ffs, static_cast<UG::Edge>(7), true);
    EXPECT_EQ(dumpText(g, 1), "   Tsd_UserGroup\n"
                              "      name = grp\n"
                              "      included groups:\n"
                              "         FFS - Any edge\n"
                              "         clkgrp - Rising Edge\n"
                              "         clkgrp - Transparent Low\n"
                              "      excluded groups:\n"
                              "         *slow - Falling Edge\n"
                              "         FFS - Transparent High\n"
                              "         FFS - \n");
    EXPECT_EQ(dumpText(UG(nullptr)), "Tsd_UserGroup\n"
                                     "   unnamed\n"
                                     "   included groups:\n"
                                     "   excluded groups:\n");
}

class CircularGroups : public ::testing::Test {
protected:
    UG* group(const char* name) {
        m_groups.push_back(std::make_unique<UG>(name));
        return m_groups.back().get();
    }
    MessageCapture capture;

private:
    std::vector<std::unique_ptr<UG>> m_groups;
};

TEST_F(CircularGroups, SelfInclusionListsTheGroupOnce) {
    UG* p = group("P");
    Tsd_TNMGroup ffs("FFS");
    p->addGroup(&ffs, UG::EDGE_ANY, false);
    p->addGroup(p, UG::EDGE_ANY, false);
    EXPECT_EQ(p->checkInExcludes(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Circular group definition encountered from user group \"P\", as follows:\n"
              "status:    P=FFS:P\n");
}

TEST_F(CircularGroups, TwoGroupCircleIsNamedFromWhereTheCheckStarts) {
    UG* p = group("P");
    UG* q = group("Q");
    p->addGroup(q, UG::EDGE_RISING, false);
    q->addGroup(p, UG::EDGE_ANY, false);
    EXPECT_EQ(p->checkInExcludes(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Circular group definition encountered from user group \"P\", as follows:\n"
              "status:    P=RISING:Q\n"
              "status:    Q=P\n");
    capture.sink.clear();
    EXPECT_EQ(q->checkInExcludes(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Circular group definition encountered from user group \"Q\", as follows:\n"
              "status:    Q=P\n"
              "status:    P=RISING:Q\n");
    capture.sink.clear();
    EXPECT_EQ(q->checkInExcludes(false), 1);
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST_F(CircularGroups, CircleThroughAnExcludedMember) {
    UG* p = group("P");
    UG* q = group("Q");
    Tsd_TNMGroup ffs("FFS");
    p->addGroup(&ffs, UG::EDGE_ANY, false);
    p->addGroup(q, UG::EDGE_ANY, true);
    q->addGroup(p, UG::EDGE_ANY, false);
    EXPECT_EQ(p->checkInExcludes(true), 1);
    EXPECT_EQ(capture.sink.statuses(),
              (std::vector<std::string>{"   P=FFS:EXCEPT:Q\n", "   Q=P\n"}));
}

TEST_F(CircularGroups, SharedMembersWithoutCircleCountNothing) {
    UG* p = group("P");
    UG* q = group("Q");
    UG* r = group("R");
    UG* s = group("S");
    Tsd_TNMGroup ffs("FFS");
    p->addGroup(q, UG::EDGE_ANY, false);
    p->addGroup(r, UG::EDGE_ANY, false);
    q->addGroup(s, UG::EDGE_ANY, false);
    r->addGroup(s, UG::EDGE_ANY, true);
    s->addGroup(&ffs, UG::EDGE_ANY, false);
    EXPECT_EQ(p->checkInExcludes(true), 0);
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST_F(CircularGroups, EveryRouteIntoACircleCountsSeparately) {
    // P includes Q and R; both include S; S and T include each other.
    UG* p = group("P");
    UG* q = group("Q");
    UG* r = group("R");
    UG* s = group("S");
    UG* t = group("T");
    p->addGroup(q, UG::EDGE_ANY, false);
    p->addGroup(r, UG::EDGE_ANY, false);
    q->addGroup(s, UG::EDGE_ANY, false);
    r->addGroup(s, UG::EDGE_ANY, false);
    s->addGroup(t, UG::EDGE_ANY, false);
    t->addGroup(s, UG::EDGE_ANY, false);
    EXPECT_EQ(p->checkInExcludes(true), 2);
    EXPECT_EQ(capture.sink.errors().size(), 2u);
    EXPECT_EQ(capture.sink.statuses(),
              (std::vector<std::string>{"   P=Q:R\n", "   Q=S\n", "   S=T\n", "   T=S\n",
                                        "   P=Q:R\n", "   R=S\n", "   S=T\n", "   T=S\n"}));
}

TEST_F(CircularGroups, LongChainsAndWideLatticesStayCheap) {
    // A chain deeper than any call stack would take, closed at the end.
    const int depth = 100000;
    std::vector<UG*> chain;
    for (int i = 0; i < depth; ++i)
        chain.push_back(group(("C" + std::to_string(i)).c_str()));
    for (int i = 0; i + 1 < depth; ++i)
        chain[i]->addGroup(chain[i + 1], UG::EDGE_ANY, false);
    EXPECT_EQ(chain[0]->checkInExcludes(false), 0);
    chain.back()->addGroup(chain[depth / 2], UG::EDGE_ANY, false);
    EXPECT_EQ(chain[0]->checkInExcludes(false), 1);

    // 64 levels of two groups that both include both groups of the next
    // level: 2^64 routes, none of them circular.
    UG* top = group("top");
    std::vector<UG*> level = {top};
    for (int i = 0; i < 64; ++i) {
        std::vector<UG*> next = {group("L"), group("R")};
        for (UG* g : level)
            for (UG* n : next)
                g->addGroup(n, UG::EDGE_ANY, false);
        level = next;
    }
    EXPECT_EQ(top->checkInExcludes(true), 0);
    EXPECT_TRUE(capture.sink.records.empty());
}
