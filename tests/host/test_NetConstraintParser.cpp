#include "ConstraintRecorders.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using tsd_test::RecordingNetParser;

namespace {

std::string parseOne(RecordingNetParser& p, const char* text) {
    p.clear();
    bool failed = p.parse(text);
    std::string result = p.only();
    for (const auto& e : p.errors)
        result += " code " + std::to_string(e.code) + " token '" + e.token + "'";
    return failed ? result + " (parse failed)" : result;
}

TEST(NetParser, Forms) {
    struct Case {
        const char* text;
        const char* call;
    };
    const std::vector<Case> cases = {
        // texts the library forms from what it writes back
        {"PERIOD=10000:pS:HIGH:50% ;", "PERIOD 10000 duty=HIGH/0/50% jitter=-"},
        {"PERIOD=8000:pS:LOW:3000:pS:INPUT_JITTER:100:pS ;",
         "PERIOD 8000 duty=LOW/3000/0% jitter=100"},
        {"MAXDELAY=500:pS ;", "MAXDELAY 500"},
        {"MAXSKEW=500:pS ;", "MAXSKEW 500"},
        {"OFFSET=IN:2:nS:BEFORE:clk:TIMEGRP:regs:HIGH ;",
         "OFFSET IN 2000 valid=- BEFORE clk hl=HIGH reg=regs"},
        {"OFFSET=IN:1:nS:VALID:3:nS:BEFORE:clk ;",
         "OFFSET IN 1000 valid=3000 BEFORE clk hl=(null) reg=(null)"},
        {"FEEDBACK=1500:pS:NET:clkfb ;", "PORTPAIR FEEDBACK 1500 kind=NET group=clkfb"},
        {"FEEDBACK=1500:pS:NET:\"*fb\" ;", "PORTPAIR FEEDBACK 1500 kind=NET group=*fb"},
        {"OFFSET=OUT:0:AFTER:clk: ;", "OFFSET OUT 0 valid=- AFTER clk hl=(null) reg=(null)"},
        // written by hand
        {"PERIOD = 10 ns HIGH 50 ;", "PERIOD 10000 duty=HIGH/0/50% jitter=-"},
        {"period = 100 MHz ;", "PERIOD 10000 duty=HIGH/0/0% jitter=-"},
        {"MAXDELAY = 0.5ns;", "MAXDELAY 500"},
        {"MAXSKEW = 0 ;", "MAXSKEW 0"},
        {"OFFSET = OUT 3 AFTER \"clk a\" LOW ;",
         "OFFSET OUT 3000 valid=- AFTER clk a hl=LOW reg=(null)"},
        {"Feedback = -1.5 ns net clkfb ;", "PORTPAIR FEEDBACK -1500 kind=net group=clkfb"},
        {"OFFSET = IN 2 BEFORE clk TIMEGRP FFS (\"a b\") ;",
         "OFFSET IN 2000 valid=- BEFORE clk hl=(null) reg=FFS(a b)"},
        // any word stands as the port-pair kind; the adaptor judges it
        {"FEEDBACK = 1 ns PIN clkfb ;", "PORTPAIR FEEDBACK 1000 kind=PIN group=clkfb"},
    };
    RecordingNetParser p;
    for (const Case& c : cases)
        EXPECT_EQ(parseOne(p, c.text), c.call) << c.text;
}

TEST(NetParser, SpellingsOfOneConstraintAgree) {
    const std::vector<std::vector<const char*>> groups = {
        {"PERIOD=8000:pS:LOW:3000:pS:INPUT_JITTER:100:pS ;",
         "PERIOD = 8 ns LOW 3 ns INPUT_JITTER 0.1 ns ;",
         "period=8ns low 3000ps input_jitter 100ps;"},
        {"OFFSET=IN:2:nS:BEFORE:clk:TIMEGRP:regs:HIGH ;",
         "OFFSET = IN 2 ns BEFORE clk HIGH TIMEGRP regs ;",
         "OFFSET = IN 2000 ps BEFORE 'clk' TIMEGRP \"regs\" HIGH;"},
        {"FEEDBACK=1500:pS:NET:clkfb ;", "FEEDBACK = 1.5 ns NET clkfb ;",
         "FEEDBACK=1.5:NET:clkfb;"},
    };
    RecordingNetParser p;
    for (const auto& group : groups) {
        std::string first = parseOne(p, group[0]);
        EXPECT_EQ(first.find("parse failed"), std::string::npos) << first;
        for (const char* text : group)
            EXPECT_EQ(parseOne(p, text), first) << text;
    }
}

TEST(NetParser, SyntaxErrorsReportToken) {
    struct Case {
        const char* text;
        int code;
        const char* token;
    };
    const std::vector<Case> cases = {
        {"", CONSTRAINT_ERR_EMPTY, ""},
        {"TS_PERIOD=10:ns ;", CONSTRAINT_ERR_UNKNOWN_KEYWORD, "TS_PERIOD"},
        {"TIMESPEC TS01=TIG ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, "TIMESPEC"},
        {"PERIOD=10:ns:PHASE:1:ns ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, "PHASE"},
        {"PERIOD=10:ns:PRIORITY:1 ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, "PRIORITY"},
        {"PERIOD=TS01*2 ;", CONSTRAINT_ERR_EXPECTED_VALUE, "TS01*2"},
        {"PERIOD=0:ns ;", CONSTRAINT_ERR_OUT_OF_RANGE, "0"},
        {"PERIOD=10:ns:HIGH:101% ;", CONSTRAINT_ERR_OUT_OF_RANGE, "101%"},
        {"MAXDELAY=100:MHz ;", CONSTRAINT_ERR_BAD_UNIT, "MHz"},
        {"MAXSKEW=-1:ns ;", CONSTRAINT_ERR_OUT_OF_RANGE, "-1"},
        {"MAXSKEW=1e400 ;", CONSTRAINT_ERR_OUT_OF_RANGE, "1e400"},
        {"MAXDELAY 500 ps ;", CONSTRAINT_ERR_EXPECTED_EQUALS, "500"},
        {"MAXDELAY=500:pS:500:pS ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, "500"},
        {"FEEDBACK=1500:pS ;", CONSTRAINT_ERR_EXPECTED_NAME, ";"},
        {"FEEDBACK=1500:pS:NET ;", CONSTRAINT_ERR_EXPECTED_NAME, ";"},
        {"FEEDBACK=1500:pS:NET:a:b ;", CONSTRAINT_ERR_UNKNOWN_KEYWORD, "b"},
        {"TIMEGRP:p:OFFSET=IN:2:BEFORE:clk ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, "TIMEGRP"},
        {"OFFSET=IN:2:BEFORE:clk:FALLING ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, "FALLING"},
        {"OFFSET=IN:2:BEFORE ;", CONSTRAINT_ERR_EXPECTED_NAME, ";"},
        {"OFFSET=IN:2:BEFORE:\"clk ;", CONSTRAINT_ERR_UNBALANCED_QUOTE, "\"clk ;"},
        {"MAXSKEW=5::ns ;", CONSTRAINT_ERR_STRAY_SEPARATOR, ":"},
        {"MAXSKEW=5:ns", CONSTRAINT_ERR_MISSING_SEMICOLON, ""},
        {"MAXSKEW=5:ns ; x", CONSTRAINT_ERR_TRAILING_TEXT, "x"},
    };
    RecordingNetParser p;
    for (const Case& c : cases) {
        p.clear();
        EXPECT_TRUE(p.parse(c.text)) << c.text;
        EXPECT_TRUE(p.calls.empty()) << c.text;
        ASSERT_EQ(p.errors.size(), 1u) << c.text;
        EXPECT_EQ(p.errors[0].code, c.code)
            << c.text << " (" << constraintErrorText(p.errors[0].code) << ")";
        EXPECT_EQ(p.errors[0].token, c.token) << c.text;
    }
}

TEST(NetParser, CallbackAnsweringFalseFailsTheParseWithoutError) {
    const char* texts[] = {"PERIOD=1:ns ;", "MAXDELAY=1 ;", "MAXSKEW=1 ;", "OFFSET=IN:1:BEFORE:c ;",
                           "FEEDBACK=1:NET:c ;"};
    RecordingNetParser p;
    p.answer = false;
    for (const char* text : texts) {
        p.clear();
        EXPECT_TRUE(p.parse(text)) << text;
        EXPECT_EQ(p.calls.size(), 1u) << text;
        EXPECT_TRUE(p.errors.empty()) << text;
    }
    NetConstraintParser defaults;
    for (const char* text : texts)
        EXPECT_FALSE(defaults.parse(text)) << text;
}

// The adaptor reports its own error from cb_portpair and answers false; the
// parser must not overwrite that error with one of its own.
TEST(NetParser, ErrorRaisedByACallbackIsTheOnlyError) {
    struct Rejecting : RecordingNetParser {
        bool cb_portpair(const char*, double, const char* kind, const char*) override {
            cb_error(0, kind);
            return false;
        }
    } p;
    EXPECT_TRUE(p.parse("FEEDBACK=1:PIN:c ;"));
    ASSERT_EQ(p.errors.size(), 1u);
    EXPECT_EQ(p.errors[0].token, "PIN");
}

} // namespace
