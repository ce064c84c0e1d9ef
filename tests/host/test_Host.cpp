// The host layer: the formatter, messages and dump streams, and the two
// constraint parsers, whose forms and errors are in logical.cases and
// net.cases.
#include "ConstraintRecorders.h"
#include "TsdTestSupport.h"

#include "internal/Tsd_Report.h"

using namespace tsd_test;

TEST(Format, ConversionsWideStringsAndMalformedInput) {
    // An unpaired high surrogate, and a low one alone.
    const char16_t highAlone[] = {u'a', static_cast<char16_t>(0xD800), 0};
    const char16_t lowAlone[] = {static_cast<char16_t>(0xDC00), 0};
    const struct {
        std::string actual;
        const char* expected;
    } cases[] = {
        {formatMessage("%d|%5d|%-4d|%ld|%lld|%i", 7, 42, 3, 123456789L, -5LL, 9),
         "7|   42|3   |123456789|-5|9"},
        {formatMessage("%u %x %X %o %hd %lu %llx", 10u, 255u, 255u, 8u, 70000, 7ul, 255ull),
         "10 ff FF 10 4464 7 ff"},
        {formatMessage("%.9f %g %e", 2.5, 0.5, 1000.0), "2.500000000 0.5 1.000000e+03"},
        {formatMessage("%s and %.3s and %c", "abc", "abcdef", 'x'), "abc and abc and x"},
        {formatMessage("%*d|%.*f|%.*f", 4, 1, 2, 3.14159, -1, 2.5), "   1|3.14|2"},
        {formatMessage("100%% sure"), "100% sure"},
        {formatMessage("%zUnable to parse.\n", u"Processing \"A=B\": "),
         "Processing \"A=B\": Unable to parse.\n"},
        {formatMessage("[%z][%8z]", u"", u"ab"), "[][      ab]"},
        // Non-ASCII text and a surrogate pair come out as UTF-8; an unpaired
        // surrogate is replaced, never read past.
        {formatMessage("%z", u"\u00e9\U0001F600"), "\xc3\xa9\xf0\x9f\x98\x80"},
        {formatMessage("%z|%z", highAlone, lowAlone), "a\xef\xbf\xbd|\xef\xbf\xbd"},
        {formatMessage("%s|%z", static_cast<const char*>(nullptr),
                       static_cast<const char16_t*>(nullptr)),
         "(null)|(null)"},
        {formatMessage(nullptr), ""},
        {formatMessage("ends with %"), "ends with %"},
        {formatMessage("unknown %y conversion"), "unknown %y conversion"},
    };
    for (const auto& c : cases)
        EXPECT_EQ(c.actual, c.expected);
    int n = 0;
    EXPECT_EQ(formatMessage("a%nb", &n), "ab"); // never written through
    EXPECT_EQ(n, 0);
    std::string big(5000, 'x'); // long results are not truncated
    EXPECT_EQ(formatMessage("<%s>", big.c_str()), "<" + big + ">");
    EXPECT_EQ(formatMessage("%.9f", 1e300).size(), 311u);

    const char* first = formatString("%d-%s", 1, "one"); // held until the next call
    EXPECT_STREQ(first, "1-one");
    formatString("%d", 2);
    EXPECT_STREQ(first, "2");
    EXPECT_EQ(std::u16string(translateMessage("TSDatabase", "caf\xc3\xa9 %s", "A").get()),
              u"caf\u00e9 A");
}

TEST(Format, Utf8ToUtf16RefusesWhatIsNotUtf8) {
    const char* text = "a\xc3\xa9\xe2\x82\xac\xf0\x9f\x98\x80z";
    EXPECT_EQ(utf16ToUtf8(utf8ToUtf16(text).c_str()), text);
    // A truncated sequence, a stray continuation byte, an overlong encoding,
    // an encoded surrogate, a byte no sequence starts with.
    EXPECT_EQ(utf8ToUtf16("x\xe2\x82"), u"x\ufffd");
    EXPECT_EQ(utf8ToUtf16("\x80y"), u"\ufffdy");
    EXPECT_EQ(utf8ToUtf16("\xc0\xaf"), u"\ufffd");
    EXPECT_EQ(utf8ToUtf16("\xed\xa0\x80|\xff"), u"\ufffd|\ufffd");
    EXPECT_EQ(std::u16string(copyWide(nullptr).get()), u"");
    EXPECT_EQ(utf16ToUtf8(nullptr), "");
    EXPECT_EQ(utf8ToUtf16(nullptr), u"");
}

TEST(Messages, RecordsReachTheSinkInstalledAndTheDefaultSinkWritesLines) {
    {
        MessageCapture capture;
        Message msg = MessageManager::createObject("TSDatabase", "mod.cpp", 17, "1.0");
        msg.error("%zbad %s\n", u"ctx: ", "thing");
        msg.internalError("broken %d\n", 3);
        {
            CapturingSink inner; // a scoped sink gives the previous one back
            ScopedMessageSink guard(&inner);
            msg.status("inner\n");
            EXPECT_EQ(inner.records.size(), 1u);
        }
        msg.status("   %s\n", "detail");
        EXPECT_EQ(capture.sink.transcript(),
                  "error: ctx: bad thing\ninternal error: broken 3\nstatus:    detail\n");
        const MessageRecord& first = capture.sink.records[0];
        EXPECT_EQ(first.domain + first.sourceFile, "TSDatabasemod.cpp");
        EXPECT_EQ(first.line, 17);
        EXPECT_EQ(first.fatalCode, 0);
        EXPECT_EQ(msg.revision(), "1.0");

        int code = 0;
        EXPECT_EQ(fatalText([] { TSD_MSG().fatal(2, "Unit unmatched.\n"); }, &code),
                  "Unit unmatched.\n");
        EXPECT_EQ(code, 2);
        EXPECT_EQ(capture.sink.records.back().fatalCode, 2);

        capture.sink.clear();
        const bool was = MessageManager::debugTraceEnabled();
        MessageManager::setDebugTrace(false);
        MessageManager::debugTrace("checkLink() failed for spec %s.\n", "TS01");
        MessageManager::setDebugTrace(true);
        MessageManager::debugTrace("checkLink() failed for spec %s.\n", "TS02");
        MessageManager::setDebugTrace(was);
        EXPECT_EQ(capture.sink.transcript(), "debug: checkLink() failed for spec TS02.\n");
    }
    ScopedMessageSink useDefault(nullptr);
    testing::internal::CaptureStderr();
    TSD_MSG().error("%zUnable to parse TIMEGRP definition.\n", u"Processing: ");
    TSD_MSG().status("   %s", "detail");
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "TSDatabase: error: Processing: Unable to parse TIMEGRP definition.\n"
              "TSDatabase: status:    detail\n");
}

TEST(MessagesDeathTest, FatalEndsTheProcessWithItsCodeWhenTheSinkReturns) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    EXPECT_EXIT(TSD_MSG().fatal(2, "NULL design in Tsd_Annotator.\n"), ::testing::ExitedWithCode(2),
                "TSDatabase: fatal error: NULL design in Tsd_Annotator\\.");
}

TEST(DumpStream, TextIntegersAndBoundedIndents) {
    std::ostringstream out;
    DumpStream stream(out);
    stream << "count: " << static_cast<std::int16_t>(-3) << " " << static_cast<std::int32_t>(70000)
           << DumpStream::endl
           << static_cast<const char*>(nullptr) << "end" << DumpStream::endl;
    EXPECT_EQ(out.str(), "count: -3 70000\nend\n");
    EXPECT_STREQ(tsd_detail::indent(0), "");
    EXPECT_STREQ(tsd_detail::indent(2), "      ");
    EXPECT_EQ(std::string(tsd_detail::indent(31)).size(), 93u);
    EXPECT_EQ(std::string(tsd_detail::indent(40)).size(), 93u);
    EXPECT_STREQ(tsd_detail::indent(-1), "");
}

TEST(ConstraintParsers, FormsAndErrors) {
    RecordingLogicalParser logical;
    expectCases("host/logical.cases",
                [&](const std::string& text) { return logical.result(text.c_str()); });
    RecordingNetParser net;
    expectCases("host/net.cases",
                [&](const std::string& text) { return net.result(text.c_str()); });
    // A null or empty text is an empty one; every error code has its text.
    for (const char* text : {(const char*)nullptr, ""}) {
        EXPECT_EQ(logical.result(text), "error: no constraint in the text at 1 ''");
        EXPECT_EQ(net.result(text), "error: no constraint in the text ''");
    }
    for (int code = CONSTRAINT_ERR_EMPTY; code <= CONSTRAINT_ERR_TOO_LONG; ++code)
        EXPECT_STRNE(constraintErrorText(code), "error") << code;
    EXPECT_STREQ(constraintErrorText(0), "error");
}

TEST(ConstraintParsers, ACallbackAnsweringFalseFailsTheParseWithoutError) {
    const char* logicalTexts[] = {
        "ENABLE=a ;",
        "OFFSET=IN:2:BEFORE:clk ;",
        "TIMEGRP:p:OFFSET=IN:2:BEFORE:clk ;",
        "OFFSET=IN:2:BEFORE:clk:TIMEGRP:r ;",
        "TIMEGRP:p:OFFSET=IN:2:BEFORE:clk:TIMEGRP:r ;",
        "TIMESPEC TS1=FROM:a:1 ;",
        "TIMESPEC TS1=PERIOD:c:1 ;",
        "TIMESPEC TS1=TIG ;",
        "TIMESPEC TS1=DROP_SPEC ;",
        "TIMEGRP A=b ;",
    };
    const char* netTexts[] = {"PERIOD=1:ns ;", "MAXDELAY=1 ;", "MAXSKEW=1 ;",
                              "OFFSET=IN:1:BEFORE:c ;", "FEEDBACK=1:NET:c ;"};
    RecordingLogicalParser logical;
    RecordingNetParser net;
    logical.answer = net.answer = false;
    LogicalConstraintParser logicalDefaults; // whose callbacks accept everything
    NetConstraintParser netDefaults;
    for (const char* text : logicalTexts) {
        EXPECT_EQ(logical.result(text), "<1 calls, 0 errors, failed>") << text;
        EXPECT_FALSE(logicalDefaults.parse(text)) << text;
    }
    for (const char* text : netTexts) {
        EXPECT_EQ(net.result(text), "<1 calls, 0 errors, failed>") << text;
        EXPECT_FALSE(netDefaults.parse(text)) << text;
    }
    EXPECT_TRUE(logicalDefaults.parse("TIMEGRP A=b"));

    // The adaptor reports its own error from cb_portpair and answers false;
    // the parser must not overwrite it with one of its own.
    struct Rejecting : RecordingNetParser {
        bool cb_portpair(const char*, double, const char* kind, const char*) override {
            cb_error(0, kind);
            return false;
        }
    } rejecting;
    EXPECT_EQ(rejecting.result("FEEDBACK=1:PIN:c ;"), "error: error 'PIN'");
}

// Buffers are reused: strings of one parse are those of that parse, after a
// longer or shorter text, and a parse started from a callback leaves the
// strings of the outer callback intact.
TEST(ConstraintParsers, BuffersAreReusedSafely) {
    RecordingLogicalParser p;
    std::string many = "TIMEGRP big=";
    for (int i = 0; i < 500; ++i)
        many += "member_" + std::to_string(i) + ":";
    many += "EXCEPT:last ;";
    ASSERT_FALSE(p.parse(many.c_str()));
    ASSERT_FALSE(p.parse("TIMEGRP s=x ;"));
    ASSERT_EQ(p.calls.size(), 2u);
    EXPECT_NE(p.calls[0].find("member_499"), std::string::npos);
    EXPECT_EQ(p.calls[1], "TIMEGRP s in=[x] ex=[]");

    struct Nesting : RecordingLogicalParser {
        std::string seen;
        bool cb_timegrp(const char* name,
                        const std::vector<std::pair<const char*, ParserEdge>>& includes,
                        const std::vector<const char*>& excludes,
                        const ConstraintHandle* h) override {
            bool innerFailed = parse("TIMESPEC TS_INNER=PERIOD:inner_clock:1 ;");
            seen = std::string(name) + "/" + includes[0].first + "/" + (innerFailed ? "f" : "ok");
            return RecordingLogicalParser::cb_timegrp(name, includes, excludes, h);
        }
    } nesting;
    ASSERT_FALSE(nesting.parse("TIMEGRP outer=first_member ;"));
    EXPECT_EQ(nesting.seen, "outer/first_member/ok");
    ASSERT_EQ(nesting.calls.size(), 2u);
    EXPECT_EQ(nesting.calls[1], "TIMEGRP outer in=[first_member] ex=[]");
}
