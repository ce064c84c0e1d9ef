#include "TsdTestSupport.h"

#include "tsd/Tsd_Parsers.h"

#include <gtest/gtest.h>

using Edge = Tsd_UserGroup::Edge;

namespace {

struct Reduction {
    const char* text;
    bool reduced;
    const char* reducedText;
    const char* refPin;
    Edge regEdge;
    bool hasValue;
};

} // namespace

TEST(OffsetBonusParser, ReducesOnlyTextsWithSpecialFeatures) {
    const Reduction cases[] = {
        // The worked example: value left out, reference pin and register edge.
        {"TIMEGRP pads OFFSET = IN BEFORE clk REFERENCE_PIN clkout RISING ;", true,
         "TIMEGRP:pads:OFFSET=IN:0:BEFORE:clk: ;", "clkout", Tsd_UserGroup::EDGE_RISING, false},
        {"OFFSET = IN 2 ns BEFORE clk FALLING ;", true, "OFFSET=IN:2:ns:BEFORE:clk: ;", "",
         Tsd_UserGroup::EDGE_FALLING, true},
        {"OFFSET = OUT AFTER clk ;", true, "OFFSET=OUT:0:AFTER:clk: ;", "", Tsd_UserGroup::EDGE_ANY,
         false},
        // Canonical property text as the offsets write it.
        {"OFFSET=IN:1:nS:VALID:3:nS:BEFORE:clk:REFERENCE_PIN:clk_fb:HIGH ;", true,
         "OFFSET=IN:1:nS:VALID:3:nS:BEFORE:clk:HIGH: ;", "clk_fb", Tsd_UserGroup::EDGE_ANY, true},
        {"OFFSET=OUT:5:nS:AFTER:clk:TIMEGRP:outregs:FALLING ;", true,
         "OFFSET=OUT:5:nS:AFTER:clk:TIMEGRP:outregs: ;", "", Tsd_UserGroup::EDGE_FALLING, true},
        // Later occurrences win.
        {"OFFSET=IN:2:nS:BEFORE:clk:RISING:FALLING:REFERENCE_PIN:a:REFERENCE_PIN:b ;", true,
         "OFFSET=IN:2:nS:BEFORE:clk: ;", "b", Tsd_UserGroup::EDGE_FALLING, true},
        // A quoted token with a blank is written back in double quotes; so is
        // one with '=', which would otherwise split when parsed again.
        {"OFFSET = IN 2 ns BEFORE 'my clk' RISING ;", true, "OFFSET=IN:2:ns:BEFORE:\"my clk\": ;",
         "", Tsd_UserGroup::EDGE_RISING, true},
        {"OFFSET = IN 2 ns BEFORE \"a=b\" RISING ;", true, "OFFSET=IN:2:ns:BEFORE:\"a=b\": ;", "",
         Tsd_UserGroup::EDGE_RISING, true},
        // Patterns stay one token, as the parsers read them; a token that
        // holds a double quote is written in single quotes.
        {"TIMEGRP pads (\"A<*>\") OFFSET = IN 2 ns BEFORE clk TIMEGRP FFS('a b') RISING ;", true,
         "TIMEGRP:pads(A<*>):OFFSET=IN:2:ns:BEFORE:clk:TIMEGRP:\"FFS(a b)\": ;", "",
         Tsd_UserGroup::EDGE_RISING, true},
        {"OFFSET = IN 2 ns BEFORE \"a\"\"b\" REFERENCE_PIN 'p\"' ;", true,
         "OFFSET=IN:2:ns:BEFORE:'a\"b': ;", "p\"", Tsd_UserGroup::EDGE_ANY, true},
        // Nothing special: parsed as given.
        {"OFFSET = IN 2 ns BEFORE clk ;", false, "", "", Tsd_UserGroup::EDGE_ANY, true},
        {"TIMESPEC TS01=FROM:a:TO:b:10:nS ;", false, "", "", Tsd_UserGroup::EDGE_ANY, true},
        // A trailing REFERENCE_PIN has no pin: it stays and ends the scan.
        {"OFFSET=IN:2:nS:BEFORE:clk:REFERENCE_PIN ;", false, "", "", Tsd_UserGroup::EDGE_ANY, true},
        // TIMEGRP needs six tokens; OFFSET must stand where expected.
        {"TIMEGRP pads OFFSET IN BEFORE ;", false, "", "", Tsd_UserGroup::EDGE_ANY, true},
        {"IN OFFSET BEFORE clk RISING ;", false, "", "", Tsd_UserGroup::EDGE_ANY, true},
        {"OFFSET IN ;", false, "", "", Tsd_UserGroup::EDGE_ANY, true},
        {"", false, "", "", Tsd_UserGroup::EDGE_ANY, true},
    };
    Tsd_OffsetBonusParser reducer;
    for (const Reduction& c : cases) {
        SCOPED_TRACE(c.text);
        EXPECT_EQ(reducer.reduceOffset(c.text), c.reduced);
        EXPECT_STREQ(reducer.getReducedText(), c.reducedText);
        EXPECT_EQ(reducer.getRefPin(), c.refPin);
        EXPECT_EQ(reducer.getRegEdge(), c.regEdge);
        EXPECT_EQ(reducer.hasValue(), c.hasValue);
    }
    EXPECT_FALSE(reducer.reduceOffset(nullptr));
}

TEST(OffsetBonusParser, EachTextStartsFromAFreshState) {
    Tsd_OffsetBonusParser reducer;
    ASSERT_TRUE(reducer.reduceOffset("OFFSET=IN:BEFORE:clk:REFERENCE_PIN:p:RISING ;"));
    EXPECT_FALSE(reducer.reduceOffset("OFFSET=IN:2:nS:BEFORE:clk ;"));
    EXPECT_STREQ(reducer.getReducedText(), "");
    EXPECT_EQ(reducer.getRefPin(), "");
    EXPECT_EQ(reducer.getRegEdge(), Tsd_UserGroup::EDGE_ANY);
    EXPECT_TRUE(reducer.hasValue());
}

TEST(OffsetBonusParser, SwitchesAreOffUnlessTheEnvironmentSetsThem) {
    // The test program runs without either variable.
    EXPECT_FALSE(Tsd_OffsetBonusParser::isDisabled());
    EXPECT_FALSE(Tsd_OffsetBonusParser::isDebugEnabled());
}
