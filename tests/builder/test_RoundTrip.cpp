// Every constraint form the system writes is built, written back, built
// again and written again: the second text equals the first.
#include "BuilderTestSupport.h"

#include <gtest/gtest.h>

using tsd_test::build;
using tsd_test::Built;
using tsd_test::MessageCapture;
using tsd_test::PropSet;

namespace {

// References that define the groups and clock nets the corpus names.
const std::vector<tsd_test::RefProp> kBaseRefs = {
    {"ff1", "TS_TNM", "ffs_a"},        {"ff2", "TS_TNM", "ffs_b"},
    {"ff3", "ts_tnm", "ffs_b"},        {"pad1", "TS_TNM", "pads"},
    {"ram1", "TS_TNM", "ram"},         {"ff4", "TS_TNM", "FFS(d*)"},
    {"n_t1", "TS_TPTHRU", "t1"},       {"n_t2", "TS_TPTHRU", "t2"},
    {"sync1", "TS_TPSYNC", "syncgrp"}, {"clknet", "TS_CLKGRP", "clk"},
    {"fbnet", "TS_CLKGRP", "clk_fb"},
};

PropSet corpus() {
    PropSet set;
    set.refs = kBaseRefs;
    // Reference properties of every kind.
    set.refs.push_back({"ram2", "TS_TIG", "TS03"});
    set.refs.push_back({"ram3", "TS_TIG", ""}); // the global TIG
    set.refs.push_back({"n_clk", "TS_PERIOD", "10 ns HIGH 50%"});
    set.refs.push_back({"n_clk2", "TS_PERIOD", "8000:pS:LOW:3000:pS:INPUT_JITTER:100:pS"});
    set.refs.push_back({"n_d", "TS_MAXDELAY", "2 ns"});
    set.refs.push_back({"n_s", "TS_MAXSKEW", "500:pS"});
    set.refs.push_back({"n_in", "TS_OFFSET", "IN 2 ns BEFORE clk"});
    set.refs.push_back({"n_out", "TS_OFFSET", "OUT:1:nS:VALID:2:nS:AFTER:clk:TIMEGRP:regs:HIGH"});
    set.refs.push_back({"n_fb", "TS_FEEDBACK", "1.5 ns NET clk_fb"});

    set.groups = {
        {"grp", "ffs_a:RISING:ffs_b:EXCEPT:ram"},
        {"all", "grp pads"},
        {"fwd", "later"}, // defined by the next property
        {"later", "FALLING ffs_b"},
        {"*odd", "ffs_a"},
        {"regs", "ffs_a:ffs_b"},
        {"excl", ":EXCEPT:ram"},
        {"edges", "TRANSHI:ffs_a:TRANSLO:grp:RISING:\"*odd\""},
        {"pattern", "FFS(d*)"},
    };
    set.specs = {
        {"TS01", "FROM:grp:TO:ffs_b:10:nS"},
        {"TS02", "FROM pads THRU t1 THRU t2 TO ffs_a TS01 / 2 DATAPATHONLY"},
        {"TS03", "FROM:ram:TO:pads:TIG:PRIORITY:1"},
        {"TS04", "PERIOD grp 10 ns HIGH 50%"},
        {"TS05", "PERIOD:all:TS04*2:PHASE:+:2.5:nS:LOW:4:nS"},
        {"TS06", "PERIOD:syncgrp:100:MHz:INPUT_JITTER:200:pS:PRIORITY:3"},
        {"TS07", "TO:ffs_b:5:nS"},
        {"TS08", "FROM:ffs_a:3:nS"},
        {"TS09", "PERIOD:\"*odd\":1:GHz"},
        {"TS10", "FROM:FFS(d*):TO:ram:1.25:nS"},
        {"TS11", "FROM:grp:TO:ram:TS99*3"}, // TS99 comes later
        {"TS99", "FROM:ffs_a:TO:ffs_b:7:nS"},
        {"ts12", "FROM:regs:THRU:t1:TO:pads:TS99/2.5:PRIORITY:0"},
        {"OFFSET", "IN 2 ns VALID 3 ns BEFORE clk"},
        {"OFFSET", "OUT:5:nS:AFTER:clk:TIMEGRP:regs:FALLING"},
        {"OFFSET", "IN:1:nS:VALID:3:nS:BEFORE:clk:REFERENCE_PIN:clk_fb:HIGH"},
        {"OFFSET", "OUT AFTER clk"},
        {"TS_GROUP_BASED_OFFSET", "TIMEGRP:pads:OFFSET=IN:2:nS:BEFORE:clk"},
        {"TS_GROUP_BASED_OFFSET", "TIMEGRP pads OFFSET = IN 2 ns BEFORE clk TIMEGRP regs LOW"},
        {"ENABLE", "arc_1"},
        {"disable", "arc_2"},
    };
    return set;
}

// Names with blanks, separators, quotes and member keywords in every place a
// name stands, predefined-group patterns however spelt, and PRIORITY -1 on
// every spec kind that has a priority.
PropSet awkwardCorpus() {
    PropSet set;
    set.refs = {
        {"e1", "TS_TNM", "my group"},
        {"e2", "TS_TNM", "a:b=c;d"},
        {"e3", "TS_TNM", "say \"hi\""},
        {"e4", "TS_TNM", "it's \"x\""},
        {"e5", "TS_TNM", "RISING"},
        {"e6", "TS_TNM", "FFS(data*)"},
        {"e7", "TS_TNM", "pads(A<*>)"},
        {"e8", "TS_TNM", "FFS(a b)"},
        {"t1", "TS_TPTHRU", "thru 1"},
        {"t2", "TS_TPTHRU", "thru\"2"},
        {"c1", "TS_CLKGRP", "clk a"},
        {"c2", "TS_CLKGRP", "clk'b"},
        {"c3", "TS_CLKGRP", "fb:net"},
        {"n1", "TS_FEEDBACK", "1 ns NET \"fb:net\""},
        {"n2", "TS_OFFSET", "IN 1 ns BEFORE 'clk a' TIMEGRP \"my group\""},
    };
    set.groups = {
        {"both ", "\"my group\" FALLING \"a:b=c;d\" EXCEPT 'say \"hi\"'"},
        {"my grp", "\"RISING\" \"both \" \"it's \"\"x\"\"\""},
        {"q\"g", "pads (\"A<*>\") EXCEPT FFS (\"data*\")"},
    };
    set.specs = {
        {"TS01", "FROM \"both \" THRU \"thru 1\" THRU 'thru\"2' TO \"my grp\" 5 ns PRIORITY -1"},
        {"TS02", "PERIOD \"a:b=c;d\" 10 ns HIGH 50% PRIORITY -1"},
        {"TS03", "FROM FFS(\"data*\") TO 'q\"g' TIG PRIORITY -1"},
        {"TS04", "FROM FFS (data*) TO \"it's \"\"x\"\"\" TS02 * 2 PRIORITY -1"},
        {"TS05", "PERIOD FFS('a b') TS02 / 2 PRIORITY -1"},
        {"TS 6", "THRU \"thru 1\" TO pads (\"A<*>\") 1 ns"},
        {"TS07", "FROM \"my group\" TO \"both \" \"TS 6\" / 4"},
        {"OFFSET", "IN 2 ns BEFORE \"clk a\" TIMEGRP \"both \" REFERENCE_PIN \"fb:net\""},
        {"TS_G",
         "TIMEGRP FFS (\"a b\") OFFSET = OUT 1 ns AFTER \"clk'b\" TIMEGRP \"RISING\" RISING"},
        {"ENABLE", "\"reg sr:o\""},
    };
    return set;
}

} // namespace

TEST(RoundTrip, EveryFormReadsBackToTheSameText) {
    for (PropSet input : {corpus(), awkwardCorpus()}) {
        MessageCapture capture;
        Built first = build(input);
        ASSERT_NE(first.design, nullptr) << capture.sink.transcript();
        EXPECT_TRUE(first.refused.empty());
        PropSet written = first.writeBack();

        Built second = build(written);
        ASSERT_NE(second.design, nullptr) << capture.sink.transcript() << written;
        PropSet rewritten = second.writeBack();
        EXPECT_EQ(written, rewritten);
        EXPECT_EQ(capture.sink.errors(), std::vector<std::string>{});

        // Everything came back: every group, spec and reference.
        EXPECT_EQ(written.groups.size(), input.groups.size());
        EXPECT_EQ(written.specs.size(), input.specs.size());
        EXPECT_EQ(written.refs.size(), input.refs.size());
    }
}

TEST(RoundTrip, AwkwardNamesAreQuotedAndPatternsCanonical) {
    MessageCapture capture;
    Built built = build(awkwardCorpus());
    ASSERT_NE(built.design, nullptr) << capture.sink.transcript();
    PropSet written = built.writeBack();
    using P = std::pair<std::string, std::string>;
    EXPECT_EQ(written.groups,
              (std::vector<P>{{"both ", "\"my group\":FALLING:\"a:b=c;d\":EXCEPT:'say \"hi\"'"},
                              {"my grp", "\"RISING\":\"both \":\"it's \"\"x\"\"\""},
                              {"q\"g", "pads(A<*>):EXCEPT:FFS(data*)"}}));
    EXPECT_EQ(
        written.specs,
        (std::vector<P>{
            {"TS01",
             "FROM:\"both \":THRU:\"thru 1\":THRU:'thru\"2':TO:\"my grp\":5000:pS:PRIORITY:-1"},
            {"TS02", "PERIOD:\"a:b=c;d\":10000:pS:HIGH:50%:PRIORITY:-1"},
            {"TS03", "FROM:FFS(data*):TO:'q\"g':TIG:PRIORITY:-1"},
            {"TS04", "FROM:FFS(data*):TO:\"it's \"\"x\"\"\":TS02*2:PRIORITY:-1"},
            {"TS05", "PERIOD:\"FFS(a b)\":TS02/2:PRIORITY:-1"},
            {"TS 6", "THRU:\"thru 1\":TO:pads(A<*>):1000:pS"},
            {"TS07", "FROM:\"my group\":TO:\"both \":\"TS 6\"/4"},
            {"OFFSET", "IN:2000:pS:BEFORE:\"clk a\":REFERENCE_PIN:\"fb:net\":TIMEGRP:\"both \""},
            {"TS_GROUP_BASED_OFFSET",
             "TIMEGRP:\"FFS(a b)\":OFFSET=OUT:1000:pS:AFTER:\"clk'b\":TIMEGRP:\"RISING\":RISING"},
            {"ENABLE", "\"reg sr:o\""}}));
    EXPECT_EQ(written.refs[13], (tsd_test::RefProp{"n1", "TS_FEEDBACK", "1000:pS:NET:\"fb:net\""}));
    EXPECT_EQ(
        written.refs[14],
        (tsd_test::RefProp{"n2", "TS_OFFSET", "IN:1000:pS:BEFORE:\"clk a\":TIMEGRP:\"my group\""}));
}

TEST(RoundTrip, CanonicalTextOfEachForm) {
    MessageCapture capture;
    Built built = build(corpus());
    ASSERT_NE(built.design, nullptr) << capture.sink.transcript();
    PropSet written = built.writeBack();
    using P = std::pair<std::string, std::string>;
    EXPECT_EQ(written.groups,
              (std::vector<P>{{"grp", "ffs_a:RISING:ffs_b:EXCEPT:ram"},
                              {"all", "grp:pads"},
                              {"fwd", "later"},
                              {"later", "FALLING:ffs_b"},
                              {"*odd", "ffs_a"},
                              {"regs", "ffs_a:ffs_b"},
                              {"excl", ":EXCEPT:ram"},
                              {"edges", "TRANSHI:ffs_a:TRANSLO:grp:RISING:\"*odd\""},
                              {"pattern", "FFS(d*)"}}));
    EXPECT_EQ(
        written.specs,
        (std::vector<P>{
            {"TS01", "FROM:grp:TO:ffs_b:10000:pS"},
            {"TS02", "FROM:pads:THRU:t1:THRU:t2:TO:ffs_a:TS01/2:DATAPATHONLY"},
            {"TS03", "FROM:ram:TO:pads:TIG:PRIORITY:1"},
            {"TS04", "PERIOD:grp:10000:pS:HIGH:50%"},
            {"TS05", "PERIOD:all:TS04*2:PHASE:+:2500:pS:LOW:4000:pS"},
            {"TS06", "PERIOD:syncgrp:100:MHz:INPUT_JITTER:200:pS:PRIORITY:3"},
            {"TS07", "TO:ffs_b:5000:pS"},
            {"TS08", "FROM:ffs_a:3000:pS"},
            {"TS09", "PERIOD:\"*odd\":1000:MHz"},
            {"TS10", "FROM:FFS(d*):TO:ram:1250:pS"},
            {"TS11", "FROM:grp:TO:ram:TS99*3"},
            {"TS99", "FROM:ffs_a:TO:ffs_b:7000:pS"},
            {"ts12", "FROM:regs:THRU:t1:TO:pads:TS99/2.5:PRIORITY:0"},
            {"OFFSET", "IN:2000:pS:VALID:3000:pS:BEFORE:clk"},
            {"OFFSET", "OUT:5000:pS:AFTER:clk:TIMEGRP:regs:FALLING"},
            {"OFFSET", "IN:1000:pS:VALID:3000:pS:BEFORE:clk:REFERENCE_PIN:clk_fb:HIGH"},
            {"OFFSET", "OUT::AFTER:clk"},
            {"TS_GROUP_BASED_OFFSET", "TIMEGRP:pads:OFFSET=IN:2000:pS:BEFORE:clk"},
            {"TS_GROUP_BASED_OFFSET", "TIMEGRP:pads:OFFSET=IN:2000:pS:BEFORE:clk:TIMEGRP:regs:LOW"},
            {"ENABLE", "arc_1"},
            {"DISABLE", "arc_2"}}));
    std::vector<tsd_test::RefProp> refs(written.refs.begin() + kBaseRefs.size(),
                                        written.refs.end());
    EXPECT_EQ(refs,
              (std::vector<tsd_test::RefProp>{
                  {"ram2", "TS_TIG", "TS03"},
                  {"ram3", "TS_TIG", "global"},
                  {"n_clk", "TS_PERIOD", "10000:pS:HIGH:50%"},
                  {"n_clk2", "TS_PERIOD", "8000:pS:LOW:3000:pS:INPUT_JITTER:100:pS"},
                  {"n_d", "TS_MAXDELAY", "2000:pS"},
                  {"n_s", "TS_MAXSKEW", "500:pS"},
                  {"n_in", "TS_OFFSET", "IN:2000:pS:BEFORE:clk"},
                  {"n_out", "TS_OFFSET", "OUT:1000:pS:VALID:2000:pS:AFTER:clk:TIMEGRP:regs:HIGH"},
                  {"n_fb", "TS_FEEDBACK", "1500:pS:NET:clk_fb"}}));
    EXPECT_EQ(written.refs[2], (tsd_test::RefProp{"ff3", "TS_TNM", "ffs_b"}));
    // The global TIG and the TIG of TS03 are installed.
    ASSERT_NE(built.design->getGlobalTIG(), nullptr);
    EXPECT_STREQ(built.design->findEndpointSpecByTSid("TS03", false)->getIgnoreGroup()->getName(),
                 "TS03");
}
