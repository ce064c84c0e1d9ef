#include "host/ConstraintLexer.h"

#include <gtest/gtest.h>

#include <cstring>

using namespace tsd_constraint;

namespace {

std::size_t scan(const char* text, bool allowSign = true) {
    return scanNumber(text, std::strlen(text), allowSign);
}

TEST(ConstraintLexer, NumberScanStopsWhereTheNumberEnds) {
    EXPECT_EQ(scan("10ns"), 2u);
    EXPECT_EQ(scan("2.5"), 3u);
    EXPECT_EQ(scan(".5us"), 2u);
    EXPECT_EQ(scan("5."), 2u);
    EXPECT_EQ(scan("1e-3US"), 4u);
    EXPECT_EQ(scan("1E+3"), 4u);
    EXPECT_EQ(scan("2e"), 1u); // no exponent digits: "e" is left for the unit
    EXPECT_EQ(scan("2e+"), 1u);
    EXPECT_EQ(scan("-2ns"), 2u);
    EXPECT_EQ(scan("-2ns", false), 0u);
    EXPECT_EQ(scan("+."), 0u);
    EXPECT_EQ(scan("."), 0u);
    EXPECT_EQ(scan("inf"), 0u);
    EXPECT_EQ(scan("TS01"), 0u);
    EXPECT_EQ(scanNumber("12", 1, true), 1u); // never past the given length
}

TEST(ConstraintLexer, KeywordsIgnoreCaseAndNeedTheWholeWord) {
    EXPECT_EQ(classifyWord("timegrp", 7), KW_TIMEGRP);
    EXPECT_EQ(classifyWord("Input_Jitter", 12), KW_INPUT_JITTER);
    EXPECT_EQ(classifyWord("TO", 2), KW_TO);
    EXPECT_EQ(classifyWord("TOO", 3), KW_NONE);
    EXPECT_EQ(classifyWord("TIMEGRPS", 8), KW_NONE);
    EXPECT_EQ(classifyWord("TIMEGRP", 4), KW_NONE);
    EXPECT_EQ(classifyWord("REFERENCE_PIN", 13), KW_REFERENCE_PIN);
    EXPECT_EQ(classifyWord("", 0), KW_NONE);
}

} // namespace
