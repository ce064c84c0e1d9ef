#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using tsd_test::fatalText;
using tsd_test::propOf;
using TV = Tsd_TimeValue;

TEST(DelayPath, PropertyValues) {
    Tsd_TNMGroup a("ffs_a"), b("ffs_b"), pads("pads"), odd("*x");
    Tsd_ThruGroup t1("t1"), t2("t2");
    Tsd_DelayPath ts01("TS01");
    const struct {
        Tsd_TermGroup *start, *end;
        std::vector<Tsd_ThruGroup*> thru;
        int delay; // 0 none, 1 10 nS, 2 TS01/2, 3 10000 pS
        bool ignored, dataPathOnly;
        int priority;
        const char* value;
    } cases[] = {
        {&a, &b, {}, 1, false, false, -1, "FROM:ffs_a:TO:ffs_b:10:nS"},
        {&pads,
         &a,
         {&t1, &t2},
         2,
         false,
         true,
         -1,
         "FROM:pads:THRU:t1:THRU:t2:TO:ffs_a:TS01/2:DATAPATHONLY"},
        {&b, &pads, {}, 0, true, false, 1, "FROM:ffs_b:TO:pads:TIG:PRIORITY:1"},
        {nullptr,
         &b,
         {&t2, &t1},
         3,
         false,
         false,
         0,
         "THRU:t2:THRU:t1:TO:ffs_b:10000:pS:PRIORITY:0"},
        {&a, nullptr, {}, 1, true, false, -1, "FROM:ffs_a:10:nS"}, // a delay wins over TIG
        {&odd, nullptr, {}, 0, true, true, -1, "FROM:\"*x\":TIG:DATAPATHONLY"},
    };
    for (const auto& c : cases) {
        Tsd_DelayPath p("TS10");
        p.setStart(c.start);
        p.setEnd(c.end);
        for (Tsd_ThruGroup* t : c.thru)
            p.addThru(t);
        if (c.delay == 1 || c.delay == 3)
            p.setDelayValue(c.delay == 1 ? TV(10, TV::UNITS_NS) : TV(10000, TV::UNITS_PS));
        if (c.delay == 2)
            p.setLinkData(&ts01, false, 2);
        if (c.ignored)
            p.setIgnored();
        if (c.dataPathOnly)
            p.setDataPathOnly();
        if (c.priority >= 0)
            p.setPriority(c.priority);
        EXPECT_EQ(propOf(p), (tsd_test::Prop{"TS10", c.value}));
    }
    tsd_test::MessageCapture capture;
    Tsd_DelayPath none("TS07");
    EXPECT_EQ(fatalText([&] { propOf(none); }), "Spec TS07 has no delay data.\n");
}

TEST(DelayPath, RemovedThruGroupsLeaveNoTrace) {
    Tsd_ThruGroup t1("t1"), t2("t2"), t3("t3");
    Tsd_DelayPath p("TS01");
    p.setDelayValue(TV(1, TV::UNITS_NS));
    EXPECT_EQ(p.createThruIter(), nullptr);
    p.addThru(&t1);
    p.addThru(&t2);
    p.addThru(&t3);
    EXPECT_TRUE(p.removeThru(&t2));
    EXPECT_FALSE(p.removeThru(&t2));
    EXPECT_FALSE(p.removeThru(nullptr)); // a hole is not a group

    Tsd_DelayPath copy(p);
    p.removeThru(&t1);
    p.removeThru(&t3);
    EXPECT_EQ(p.createThruIter(), nullptr);
    EXPECT_EQ(propOf(copy).value, "THRU:t1:THRU:t3:1:nS");
    auto iter = copy.createThruIter();
    ASSERT_NE(iter, nullptr);
    EXPECT_EQ(iter->next(), &t1);
    EXPECT_EQ(iter->next(), &t3);
    EXPECT_EQ(iter->next(), nullptr);
}

TEST(DelayPath, DumpGolden) {
    Tsd_TNMGroup a("a");
    Tsd_ThruGroup t("t");
    Tsd_DelayPath p("TS01");
    p.setStart(&a);
    p.addThru(&t);
    p.setIgnored();
    p.setDataPathOnly();
    p.setDelayValue(TV(2.5, TV::UNITS_NS));
    Tsd_DelayPath copy(p); // copies both flags
    EXPECT_EQ(tsd_test::dumpText(copy), "Tsd_DelayPath TS01\n"
                                        "   start group: a\n"
                                        "   end group unset\n"
                                        "   thru group: t\n"
                                        "   is ignored path\n"
                                        "   analyze data path only\n"
                                        "   Tsd_EndpointSpec TS01\n"
                                        "      delay: 2.5 nS\n"
                                        "      link unset\n"
                                        "      priority unset\n"
                                        "      holds no TIG group\n");
}
