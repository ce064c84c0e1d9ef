#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <string>

using tsd_test::MessageCapture;

TEST(StaticBuf, CatGrowsByWholeIncrements) {
    Tsd_StaticBuf buf(32, 16);
    EXPECT_EQ(buf.getLimit(), 32);
    EXPECT_EQ(buf.getSize(), 1);
    EXPECT_STREQ(buf.getBuffer(), "");
    buf.cat(std::string(40, 'a').c_str());
    EXPECT_EQ(buf.getLimit(), 48);
    EXPECT_EQ(buf.getSize(), 41);
    buf.cat(std::string(7, 'b').c_str()); // 48 - 41 = 7 still fits
    EXPECT_EQ(buf.getLimit(), 48);
    EXPECT_EQ(buf.getSize(), 48);
    buf.cat("c"); // one more byte needs one increment
    EXPECT_EQ(buf.getLimit(), 64);
    EXPECT_EQ(std::string(buf), std::string(40, 'a') + std::string(7, 'b') + "c");
    buf.cat(std::string(100, 'd').c_str()); // several increments at once
    EXPECT_EQ(buf.getLimit(), 160);
    EXPECT_EQ(buf.getSize(), 149);
}

TEST(StaticBuf, CopyGrowsUntilTheTextIsBelowTheLimit) {
    Tsd_StaticBuf buf(32, 16);
    buf.copy(std::string(31, 'x').c_str());
    EXPECT_EQ(buf.getLimit(), 32);
    EXPECT_EQ(buf.getSize(), 32);
    buf.copy(std::string(32, 'y').c_str());
    EXPECT_EQ(buf.getLimit(), 48);
    EXPECT_EQ(buf.getSize(), 33);
    buf.copy("short"); // never shrinks
    EXPECT_EQ(buf.getLimit(), 48);
    EXPECT_STREQ(buf, "short");
}

TEST(StaticBuf, NullAndEmptyArguments) {
    Tsd_StaticBuf buf(16, 8);
    buf.copy("abc");
    buf.cat(nullptr);
    buf.cat("");
    EXPECT_STREQ(buf, "abc");
    EXPECT_EQ(buf.getSize(), 4);
    buf.copy("");
    EXPECT_STREQ(buf, "");
    EXPECT_EQ(buf.getSize(), 1);
    buf.copy("abc");
    buf.copy(nullptr);
    EXPECT_EQ(buf.getSize(), 1);
    buf.copy("abc");
    buf.clear();
    EXPECT_STREQ(buf, "");
    EXPECT_EQ(buf.getSize(), 1);
    EXPECT_EQ(buf.getLimit(), 16);
}

TEST(StaticBuf, ArgumentsPointingIntoTheBufferItself) {
    Tsd_StaticBuf buf(8, 4);
    buf.copy("abcdef");
    buf.cat(buf.getBuffer()); // appending itself forces a reallocation
    EXPECT_STREQ(buf, "abcdefabcdef");
    buf.copy(buf.getBuffer() + 6);
    EXPECT_STREQ(buf, "abcdef");
    Tsd_StaticBuf small(4, 4);
    small.copy("abc");
    small.copy(small.getBuffer() + 1);
    EXPECT_STREQ(small, "bc");
}

TEST(StaticBuf, NonPositiveSizesStillGrow) {
    Tsd_StaticBuf buf(0, 0);
    buf.cat("hello");
    EXPECT_STREQ(buf, "hello");
    EXPECT_EQ(buf.getLimit(), 6);
}

TEST(StaticBuf, DumpStatsReportsStateAsStatusMessages) {
    MessageCapture capture;
    Tsd_StaticBuf buf(32, 16);
    buf.copy("hello");
    buf.clear();
    buf.dumpStats();
    EXPECT_EQ(
        capture.sink.statuses(),
        (std::vector<std::string>{"Tsd_StaticBuf::dumpStats()\n", "   current limit: 32\n",
                                  "   current size:  1\n", "   contents: \n",
                                  "   length validation: okay\n", "   limit validation: okay\n"}));
}

// Quoted: a first character that cannot begin a bare name, or a name that
// would not read back as itself (blanks, separators, quotes, member keywords).
TEST(AnnoName, QuotesOnlyNamesThatWouldNotReadBack) {
    struct Case {
        const char* name;
        const char* expected;
    };
    const Case cases[] = {
        {"clk", "clk"},
        {"$clk", "$clk"},
        {"<clk>", "<clk>"},
        {"/top", "/top"},
        {"9ns", "9ns"},
        {"&a", "&a"},
        {"_a", "_a"},
        {"-a", "-a"},
        {"/", "\"/\""},
        {"//x", "\"//x\""},
        {"*grp", "\"*grp\""},
        {".x", "\".x\""},
        {" lead", "\" lead\""},
        {"FFS(d*)", "FFS(d*)"},
        {"", "\"\""},
        {"a b", "\"a b\""},
        {"both ", "\"both \""},
        {"a\tb", "\"a\tb\""},
        {"a:b", "\"a:b\""},
        {"a=b", "\"a=b\""},
        {"a;b", "\"a;b\""},
        {"it's", "\"it's\""},
        {"\"q", "'\"q'"},
        {"a\"b'c", "\"a\"\"b'c\""},
        {"rising", "\"rising\""},
        {"EXCEPT", "\"EXCEPT\""},
        {"TRANSHI", "\"TRANSHI\""},
        {"RISING_1", "RISING_1"},
        {"FFS(\"x\")", "'FFS(\"x\")'"},
    };
    for (const Case& c : cases)
        EXPECT_STREQ(Tsd_Util::getAnnoName(c.name), c.expected) << "name: " << c.name;
    EXPECT_STREQ(Tsd_Util::getAnnoName(nullptr), "\"\"");
}

TEST(AnnoName, ResultIsValidUntilTheNextCall) {
    const char* first = Tsd_Util::getAnnoName("alpha");
    Tsd_Util::getAnnoName("*beta");
    EXPECT_STREQ(first, "\"*beta\"");
    std::string longName(100, 'n');
    EXPECT_EQ(std::string(Tsd_Util::getAnnoName(longName.c_str())), longName);
}
