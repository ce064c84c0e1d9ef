#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <limits>

using tsd_test::fatalText;
using tsd_test::MessageCapture;
using TV = Tsd_TimeValue;

TEST(TimeValue, DefaultIsZeroPicoseconds) {
    TV v;
    EXPECT_EQ(v.value, 0.0);
    EXPECT_EQ(v.units, TV::UNITS_PS);
    EXPECT_STREQ(v.getString(":"), "0:pS");
    EXPECT_EQ(v.getValue(TV::UNITS_NS), 0.0);
    EXPECT_EQ(v.getValue(TV::UNITS_MS), 0.0);
}

TEST(TimeValue, ConversionsGoThroughPicoseconds) {
    struct Case {
        double value;
        TV::Units from;
        TV::Units to;
        double expected;
    };
    const Case cases[] = {
        {10, TV::UNITS_NS, TV::UNITS_MHZ, 100},  {100, TV::UNITS_MHZ, TV::UNITS_NS, 10},
        {1, TV::UNITS_US, TV::UNITS_KHZ, 1000},  {2, TV::UNITS_GHZ, TV::UNITS_PS, 500},
        {10, TV::UNITS_NS, TV::UNITS_PS, 10000}, {1, TV::UNITS_MS, TV::UNITS_US, 1000},
        {2500, TV::UNITS_PS, TV::UNITS_NS, 2.5}, {1, TV::UNITS_GHZ, TV::UNITS_MHZ, 1000},
        {250, TV::UNITS_MHZ, TV::UNITS_NS, 4},   {1, TV::UNITS_KHZ, TV::UNITS_MS, 1},
    };
    for (const Case& c : cases)
        EXPECT_DOUBLE_EQ(TV(c.value, c.from).getValue(c.to), c.expected)
            << c.value << " " << TV::getUnitWord(c.from) << " -> " << TV::getUnitWord(c.to);
    EXPECT_DOUBLE_EQ(TV(3, TV::UNITS_NS).getPicoSeconds(), 3000);
}

TEST(TimeValue, ZeroFrequencyIsInfinityExceptInItsOwnUnit) {
    TV zero(0.0, TV::UNITS_GHZ);
    EXPECT_EQ(zero.getValue(TV::UNITS_GHZ), 0.0);
    EXPECT_EQ(zero.getValue(TV::UNITS_PS), std::numeric_limits<double>::infinity());
    EXPECT_EQ(zero.getValue(TV::UNITS_NS), std::numeric_limits<double>::infinity());
    // A zero time in a frequency unit is an infinite frequency as well.
    EXPECT_EQ(TV(0.0, TV::UNITS_NS).getValue(TV::UNITS_MHZ),
              std::numeric_limits<double>::infinity());
}

TEST(TimeValue, ChangeUnitsRoundTrip) {
    TV v(10, TV::UNITS_NS);
    v.changeUnits(TV::UNITS_MHZ);
    EXPECT_EQ(v.units, TV::UNITS_MHZ);
    EXPECT_DOUBLE_EQ(v.value, 100);
    v.changeUnits(TV::UNITS_NS);
    EXPECT_EQ(v.units, TV::UNITS_NS);
    EXPECT_DOUBLE_EQ(v.value, 10);

    TV odd(0.1 + 0.2, TV::UNITS_US);
    double before = odd.value;
    odd.changeUnits(TV::UNITS_US); // same unit: bit for bit unchanged
    EXPECT_EQ(std::memcmp(&before, &odd.value, sizeof before), 0);
}

TEST(TimeValue, UnknownUnitsAreFatalInConversionsAndSilentInText) {
    MessageCapture capture;
    TV bad(5, static_cast<TV::Units>(9));
    int code = 0;
    EXPECT_EQ(fatalText([&] { (void)bad.getValue(TV::UNITS_NS); }, &code), "Unit unmatched.\n");
    EXPECT_EQ(code, 2);
    EXPECT_EQ(fatalText([&] { (void)TV(5, TV::UNITS_NS).getValue(static_cast<TV::Units>(-1)); }),
              "Unit unmatched.\n");
    EXPECT_EQ(bad.getValue(static_cast<TV::Units>(9)), 5.0); // same unit: no lookup
    capture.sink.clear();
    EXPECT_STREQ(bad.getString(":"), "5:");
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST(TimeValue, GetStringForms) {
    EXPECT_STREQ(TV(1.5, TV::UNITS_NS).getString(":"), "1.5:nS");
    EXPECT_STREQ(TV(20, TV::UNITS_NS).getString(":"), "20:nS");
    EXPECT_STREQ(TV(0.000000001, TV::UNITS_NS).getString(":"), "0.000000001:nS");
    EXPECT_STREQ(TV(0.0000000004, TV::UNITS_NS).getString(":"), "0:nS");
    EXPECT_STREQ(TV(10, TV::UNITS_NS).getString(nullptr), "10nS");
    EXPECT_STREQ(TV(10, TV::UNITS_NS).getString(" "), "10 nS");
    EXPECT_STREQ(TV(100, TV::UNITS_MHZ).getString(":"), "100:MHz");
    EXPECT_STREQ(TV(2, TV::UNITS_KHZ).getString(""), "2kHz");
    EXPECT_STREQ(TV(1, TV::UNITS_GHZ).getString(":"), "1:GHz");
    EXPECT_STREQ(TV(3, TV::UNITS_US).getString(":"), "3:uS");
    EXPECT_STREQ(TV(4, TV::UNITS_MS).getString(":"), "4:mS");
    EXPECT_STREQ(TV(7, TV::UNITS_PS).getString(":"), "7:pS");
}

TEST(TimeValue, GetStringIsOverwrittenByTheNextCall) {
    const char* first = TV(1, TV::UNITS_NS).getString(":");
    TV(2, TV::UNITS_PS).getString(":");
    EXPECT_STREQ(first, "2:pS");
}

TEST(FormatNumber, CanonicalNumberText) {
    struct Case {
        double d;
        const char* text;
    };
    const Case cases[] = {
        {10, "10"},
        {2.5, "2.5"},
        {0.1, "0.1"},
        {1.23456789012, "1.23456789"},
        {-3.75, "-3.75"},
        {0.0000000001, "0"},
        {1000000, "1000000"},
        {0, "0"},
        {33.3333333333, "33.333333333"},
        {-0.0000000001, "-0"},
        {1e20, "100000000000000000000"},
    };
    for (const Case& c : cases)
        EXPECT_STREQ(formatNumber(c.d), c.text) << c.d;
    EXPECT_STREQ(formatNumber(std::numeric_limits<double>::infinity()), "inf");
}
