#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

using tsd_test::MessageCapture;
using tsd_test::Prop;
using tsd_test::propOf;
using UG = Tsd_UserGroup;

TEST(UserGroup, TimegrpValues) {
    Tsd_TNMGroup ffs("FFS"), clkgrp("clkgrp"), slow("slow_ffs"), odd("*odd");
    UG a("a");
    a.addGroup(&ffs, UG::EDGE_ANY, false);
    a.addGroup(&clkgrp, UG::EDGE_RISING, false);
    a.addGroup(&slow, UG::EDGE_ANY, true);
    EXPECT_EQ(propOf(a), (Prop{"a", "FFS:RISING:clkgrp:EXCEPT:slow_ffs"}));

    UG b(nullptr);
    b.addGroup(&slow, UG::EDGE_ANY, true);
    b.addGroup(&odd, UG::EDGE_TRANSLO, true);
    EXPECT_EQ(propOf(b), (Prop{"", ":EXCEPT:slow_ffs:TRANSLO:\"*odd\""}));

    UG c("c");
    c.addGroup(&ffs, UG::EDGE_FALLING, false);
    c.addGroup(&ffs, UG::EDGE_TRANSHI, false);
    c.addGroup(&b, static_cast<UG::Edge>(9), false); // no prefix; unnamed member
    EXPECT_EQ(propOf(c).value, "FALLING:FFS:TRANSHI:FFS:\"\"");
    EXPECT_EQ(propOf(UG("empty")).value, "");
}

TEST(UserGroup, RemoveClearAndCopy) {
    Tsd_TNMGroup a("a"), b("b");
    UG g("g");
    g.addGroup(&a, UG::EDGE_RISING, false);
    g.addGroup(&b, UG::EDGE_ANY, false);
    g.addGroup(&a, UG::EDGE_FALLING, false);
    g.addGroup(&a, UG::EDGE_ANY, true);
    // A null member is refused: it would end every walk and hide what follows.
    g.addGroup(nullptr, UG::EDGE_ANY, false);
    UG copy(g);

    EXPECT_TRUE(g.removeGroup(&a, false)); // both included entries
    EXPECT_FALSE(g.removeGroup(&a, false));
    EXPECT_EQ(propOf(g).value, "b:EXCEPT:a");
    g.addGroup(&a, UG::EDGE_ANY, false);
    EXPECT_EQ(propOf(g).value, "b:a:EXCEPT:a"); // after the hole

    UG copyOfHoles(g);
    g.clearDef();
    EXPECT_EQ(propOf(g), (Prop{"g", ""}));
    // Copies keep their own entries and share the members.
    EXPECT_EQ(propOf(copy).value, "RISING:a:b:FALLING:a:EXCEPT:a");
    EXPECT_EQ(propOf(copyOfHoles).value, "b:a:EXCEPT:a");
    Tsd_UserGroupIter iter(&copyOfHoles, false);
    UG::Edge edge = UG::EDGE_RISING;
    EXPECT_EQ(iter.next(edge), &b);
    EXPECT_EQ(edge, UG::EDGE_ANY);
}

TEST(UserGroup, DumpGolden) {
    Tsd_TNMGroup ffs("FFS"), slow("*slow");
    UG g("grp");
    g.addGroup(&ffs, UG::EDGE_ANY, false);
    g.addGroup(&ffs, UG::EDGE_RISING, false);
    g.addGroup(&slow, UG::EDGE_TRANSHI, true);
    EXPECT_EQ(tsd_test::dumpText(g, 1), "   Tsd_UserGroup\n"
                                        "      name = grp\n"
                                        "      included groups:\n"
                                        "         FFS - Any edge\n"
                                        "         FFS - Rising Edge\n"
                                        "      excluded groups:\n"
                                        "         *slow - Transparent High\n");
}

class CircularGroups : public ::testing::Test {
protected:
    UG* group(const std::string& name) {
        m_groups.push_back(std::make_unique<UG>(name.c_str()));
        return m_groups.back().get();
    }
    static void include(UG* g, UG* member, bool exclude = false) {
        g->addGroup(member, UG::EDGE_ANY, exclude);
    }
    MessageCapture capture;

private:
    std::vector<std::unique_ptr<UG>> m_groups;
};

TEST_F(CircularGroups, NamedFromWhereTheCheckStarts) {
    UG* p = group("P");
    include(p, p);
    EXPECT_EQ(p->checkInExcludes(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Circular group definition encountered from user group \"P\", as follows:\n"
              "status:    P=P\n");

    UG* q = group("Q");
    UG* r = group("R");
    q->addGroup(r, UG::EDGE_RISING, false);
    include(r, q, true); // through an excluded member
    capture.sink.clear();
    EXPECT_EQ(r->checkInExcludes(true), 1);
    EXPECT_EQ(capture.sink.transcript(),
              "error: Circular group definition encountered from user group \"R\", as follows:\n"
              "status:    R=:EXCEPT:Q\n"
              "status:    Q=RISING:R\n");
    capture.sink.clear();
    EXPECT_EQ(q->checkInExcludes(false), 1);
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST_F(CircularGroups, EveryRouteCountsSeparately) {
    // P includes Q and R, which both include S.
    UG *p = group("P"), *q = group("Q"), *r = group("R"), *s = group("S"), *t = group("T");
    include(p, q);
    include(p, r);
    include(q, s);
    include(r, s);
    EXPECT_EQ(p->checkInExcludes(true), 0);
    include(s, t); // S and T include each other: two routes reach the circle
    include(t, s);
    EXPECT_EQ(p->checkInExcludes(true), 2);
    EXPECT_EQ(capture.sink.statuses(),
              (std::vector<std::string>{"   P=Q:R\n", "   Q=S\n", "   S=T\n", "   T=S\n",
                                        "   P=Q:R\n", "   R=S\n", "   S=T\n", "   T=S\n"}));
}

TEST_F(CircularGroups, DeepChainsAndWideLatticesStayCheap) {
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
