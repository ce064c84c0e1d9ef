#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

using tsd_test::dumpText;
using tsd_test::fatalText;
using tsd_test::MessageCapture;
using tsd_test::Prop;
using tsd_test::propOf;
using TV = Tsd_TimeValue;

namespace {

std::vector<std::string> thruNames(const Tsd_DelayPath& path) {
    std::vector<std::string> out;
    Tsd_PathThruIter iter(&path);
    while (Tsd_ThruGroup* g = iter.next())
        out.push_back(g->getName());
    return out;
}

} // namespace

TEST(DelayPath, PropertyValues) {
    Tsd_TNMGroup ffsA("ffs_a"), ffsB("ffs_b"), pads("pads"), ffs("ffs"), ram("ram"), odd("*x");
    Tsd_ThruGroup t1("t1"), t2("t2");
    Tsd_DelayPath ts01("TS01");
    ts01.setDelayValue(TV(5, TV::UNITS_NS));
    struct Case {
        const char* tsid;
        Tsd_TermGroup* start;
        std::vector<Tsd_ThruGroup*> thru;
        Tsd_TermGroup* end;
        int delay; // 0: none, 1: 10 nS, 2: TS01/2, 3: 10000 pS
        bool ignored, dataPathOnly;
        int priority;
        const char* value;
    };
    const std::vector<Case> cases = {
        {"TS10", &ffsA, {}, &ffsB, 1, false, false, -1, "FROM:ffs_a:TO:ffs_b:10:nS"},
        {"TS11",
         &pads,
         {&t1, &t2},
         &ffs,
         2,
         false,
         true,
         -1,
         "FROM:pads:THRU:t1:THRU:t2:TO:ffs:TS01/2:DATAPATHONLY"},
        {"TS12", &ram, {}, &pads, 0, true, false, 1, "FROM:ram:TO:pads:TIG:PRIORITY:1"},
        {"TS13", &ffsA, {}, nullptr, 1, false, false, -1, "FROM:ffs_a:10:nS"},
        {"TS14", nullptr, {}, &ffsB, 1, false, false, -1, "TO:ffs_b:10:nS"},
        {"TS15",
         nullptr,
         {&t2, &t1},
         nullptr,
         3,
         false,
         false,
         0,
         "THRU:t2:THRU:t1:10000:pS:PRIORITY:0"},
        {"TS16", &ffsA, {}, &ffsB, 1, true, false, -1, "FROM:ffs_a:TO:ffs_b:10:nS"}, // delay wins
                                                                                     // over TIG
        {"TS17",
         &odd,
         {},
         &ffs,
         0,
         true,
         true,
         12,
         "FROM:\"*x\":TO:ffs:TIG:DATAPATHONLY:PRIORITY:12"},
    };
    for (const Case& c : cases) {
        Tsd_DelayPath p(c.tsid);
        p.setStart(c.start);
        p.setEnd(c.end);
        for (Tsd_ThruGroup* t : c.thru)
            p.addThru(t);
        if (c.delay == 1)
            p.setDelayValue(TV(10, TV::UNITS_NS));
        else if (c.delay == 2)
            p.setLinkData(&ts01, false, 2);
        else if (c.delay == 3)
            p.setDelayValue(TV(10000, TV::UNITS_PS));
        if (c.ignored)
            p.setIgnored();
        if (c.dataPathOnly)
            p.setDataPathOnly();
        if (c.priority >= 0)
            p.setPriority(c.priority);
        EXPECT_EQ(propOf(p), (Prop{c.tsid, c.value}));
    }
}

TEST(DelayPath, PendingLinkWritesAnEmptyDelay) {
    Tsd_TNMGroup a("a");
    Tsd_DelayPath p("TS01");
    p.setStart(&a);
    p.setLinkData(nullptr, true, 2);
    EXPECT_EQ(propOf(p).value, "FROM:a:");
}

TEST(DelayPath, NoDelayDataIsFatalUnlessIgnored) {
    MessageCapture capture;
    Tsd_DelayPath p("TS07");
    int code = 0;
    EXPECT_EQ(fatalText([&] { propOf(p); }, &code), "Spec TS07 has no delay data.\n");
    EXPECT_EQ(code, 2);
    p.setIgnored();
    EXPECT_EQ(propOf(p).value, "TIG");
    EXPECT_EQ(p.checkLink(true), 0);
    EXPECT_EQ(fatalText([&] { p.getDelayValue(); }),
              "Unresolved link or ignored spec in getDelayValue() on spec TS07\n");
    p.clearIgnored();
    EXPECT_FALSE(p.isIgnored());
}

TEST(DelayPath, ThruListHolesAreSkippedEverywhere) {
    Tsd_ThruGroup t1("t1"), t2("t2"), t3("t3"), other("other");
    Tsd_DelayPath p("TS01");
    p.setDelayValue(TV(1, TV::UNITS_NS));
    EXPECT_EQ(p.createThruIter(), nullptr);
    p.addThru(nullptr); // not added
    EXPECT_EQ(p.createThruIter(), nullptr);
    p.addThru(&t1);
    p.addThru(&t2);
    p.addThru(&t3);
    EXPECT_TRUE(p.removeThru(&t2));
    EXPECT_FALSE(p.removeThru(&t2));
    EXPECT_FALSE(p.removeThru(&other));
    EXPECT_FALSE(p.removeThru(nullptr)); // a hole is no group

    EXPECT_EQ(propOf(p).value, "THRU:t1:THRU:t3:1:nS");
    EXPECT_EQ(thruNames(p), (std::vector<std::string>{"t1", "t3"}));
    std::unique_ptr<Tsd_PathThruIter> iter = p.createThruIter();
    ASSERT_NE(iter, nullptr);
    EXPECT_EQ(iter->next(), &t1);
    EXPECT_EQ(iter->next(), &t3);
    EXPECT_EQ(iter->next(), nullptr);
    Tsd_DelayPath copy(p);
    EXPECT_EQ(thruNames(copy), (std::vector<std::string>{"t1", "t3"}));
    EXPECT_NE(dumpText(p).find("   thru group: t1\n   thru group: t3\n"), std::string::npos);

    p.removeThru(&t1);
    p.removeThru(&t3);
    EXPECT_EQ(p.createThruIter(), nullptr);
    Tsd_PathThruIter none(nullptr);
    EXPECT_EQ(none.next(), nullptr);
    // The copy keeps its own list.
    EXPECT_EQ(thruNames(copy), (std::vector<std::string>{"t1", "t3"}));
}

TEST(DelayPath, CopiesKeepEachFlag) {
    Tsd_TNMGroup a("a"), b("b");
    Tsd_DelayPath p("TS01");
    p.setStart(&a);
    p.setEnd(&b);
    p.setDataPathOnly();
    p.setDelayValue(TV(2, TV::UNITS_NS));
    Tsd_DelayPath copy(p);
    EXPECT_TRUE(copy.isDataPathOnly());
    EXPECT_FALSE(copy.isIgnored());
    EXPECT_EQ(copy.getStart(), &a);
    EXPECT_EQ(copy.getEnd(), &b);
    p.setIgnored();
    p.clearDataPathOnly();
    Tsd_DelayPath copy2(p);
    EXPECT_TRUE(copy2.isIgnored());
    EXPECT_FALSE(copy2.isDataPathOnly());
    // isIgnored answers through the base class too.
    const Tsd_EndpointSpec& base = copy2;
    EXPECT_TRUE(base.isIgnored());
}

TEST(DelayPath, TypeQueries) {
    Tsd_DelayPath p("TS01");
    Tsd_BaseObj& obj = p;
    EXPECT_EQ(obj.getDelayPath(), &p);
    EXPECT_EQ(obj.getEndpointSpec(), &p);
    EXPECT_EQ(obj.getSpec(), &p);
    EXPECT_EQ(obj.getPeriod(), nullptr);
    EXPECT_EQ(obj.getGroup(), nullptr);
    EXPECT_FALSE(obj.refOwner());
}

TEST(DelayPath, DumpGolden) {
    Tsd_TNMGroup a("a"), b("b");
    Tsd_ThruGroup t("t");
    Tsd_DelayPath p("TS01");
    p.setStart(&a);
    p.setEnd(&b);
    p.addThru(&t);
    p.setIgnored();
    p.setDataPathOnly();
    p.setDelayValue(TV(2.5, TV::UNITS_NS));
    EXPECT_EQ(dumpText(p), "Tsd_DelayPath TS01\n"
                           "   start group: a\n"
                           "   end group: b\n"
                           "   thru group: t\n"
                           "   is ignored path\n"
                           "   analyze data path only\n"
                           "   Tsd_EndpointSpec TS01\n"
                           "      delay: 2.5 nS\n"
                           "      link unset\n"
                           "      priority unset\n"
                           "      holds no TIG group\n");
    Tsd_DelayPath bare("TS02");
    const std::string head = "Tsd_DelayPath TS02\n"
                             "   start group unset\n"
                             "   end group unset\n";
    EXPECT_EQ(dumpText(bare).substr(0, head.size()), head);
}
