#include "tsd/host/Messages.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>

TEST(Format, PrintfConversionsAreHonoured) {
    EXPECT_EQ(formatMessage("%d|%5d|%-4d|%ld|%lld", 7, 42, 3, 123456789L, -5LL),
              "7|   42|3   |123456789|-5");
    EXPECT_EQ(formatMessage("%u %x %X %o %hd", 10u, 255u, 255u, 8u, 70000), "10 ff FF 10 4464");
    EXPECT_EQ(formatMessage("%.9f %g %e", 2.5, 0.5, 1000.0), "2.500000000 0.5 1.000000e+03");
    EXPECT_EQ(formatMessage("%s and %.3s and %c", "abc", "abcdef", 'x'), "abc and abc and x");
    EXPECT_EQ(formatMessage("%*d|%.*f", 4, 1, 2, 3.14159), "   1|3.14");
    EXPECT_EQ(formatMessage("100%% sure"), "100% sure");
}

TEST(Format, WideStringConversion) {
    EXPECT_EQ(formatMessage("%zUnable to parse.\n", u"Processing \"A=B\": "),
              "Processing \"A=B\": Unable to parse.\n");
    EXPECT_EQ(formatMessage("[%z]", u""), "[]");
    EXPECT_EQ(formatMessage("[%8z]", u"ab"), "[      ab]");
    // Non-ASCII text and a surrogate pair come out as UTF-8.
    EXPECT_EQ(formatMessage("%z", u"\u00e9\U0001F600"), "\xc3\xa9\xf0\x9f\x98\x80");
    // An unpaired surrogate is replaced, never read past.
    EXPECT_EQ(formatMessage("%z", u"a\xd800"), "a\xef\xbf\xbd");
}

TEST(Format, NullAndMalformedInputAreSafe) {
    EXPECT_EQ(formatMessage("%s|%z", static_cast<const char*>(nullptr),
                            static_cast<const char16_t*>(nullptr)),
              "(null)|(null)");
    EXPECT_EQ(formatMessage(nullptr), "");
    EXPECT_EQ(formatMessage("ends with %"), "ends with %");
    EXPECT_EQ(formatMessage("unknown %y conversion"), "unknown %y conversion");
    int n = 0;
    EXPECT_EQ(formatMessage("a%nb", &n), "ab");
    EXPECT_EQ(n, 0);
}

TEST(Format, LongResultsAreNotTruncated) {
    std::string big(5000, 'x');
    EXPECT_EQ(formatMessage("<%s>", big.c_str()), "<" + big + ">");
    std::string huge = formatMessage("%.9f", 1e300);
    EXPECT_EQ(huge.size(), 301u + 10u);
}

TEST(Format, FormatStringHoldsItsResultUntilTheNextCall) {
    const char* first = formatString("%d-%s", 1, "one");
    EXPECT_STREQ(first, "1-one");
    std::string copy = first;
    const char* second = formatString("%d", 2);
    EXPECT_STREQ(second, "2");
    EXPECT_EQ(copy, "1-one");
}

TEST(Format, TranslateMessageReturnsAnOwnedWideString) {
    std::unique_ptr<char16_t[]> text =
        translateMessage("TSDatabase", "Processing TIMEGRP definition \"%s=%s\": ", "A", "B");
    EXPECT_EQ(std::u16string(text.get()), u"Processing TIMEGRP definition \"A=B\": ");
    EXPECT_EQ(std::u16string(translateMessage("TSDatabase", "caf\xc3\xa9").get()), u"caf\u00e9");
}

TEST(Format, Utf8RoundTripAndInvalidBytes) {
    const char* text = "a\xc3\xa9\xe2\x82\xac\xf0\x9f\x98\x80z";
    EXPECT_EQ(utf16ToUtf8(utf8ToUtf16(text).c_str()), text);
    // A truncated sequence at the end and a stray continuation byte.
    EXPECT_EQ(utf8ToUtf16("x\xe2\x82"), u"x\ufffd");
    EXPECT_EQ(utf8ToUtf16("\x80y"), u"\ufffdy");
    // Overlong encodings are rejected.
    EXPECT_EQ(utf8ToUtf16("\xc0\xaf"), u"\ufffd");
    EXPECT_EQ(std::u16string(copyWide(nullptr).get()), u"");
}
