#include "TsdTestSupport.h"

#include "internal/Tsd_Report.h"

#include <gtest/gtest.h>

#include <sstream>

using tsd_test::CapturingSink;
using tsd_test::MessageCapture;

TEST(Messages, EveryKindReachesTheSinkAsARecord) {
    MessageCapture capture;
    Message msg = MessageManager::createObject("TSDatabase", "mod.cpp", 17, "1.0");
    msg.error("%zbad %s\n", u"ctx: ", "thing");
    msg.internalError("broken %d\n", 3);
    msg.status("   %s\n", "detail");
    ASSERT_EQ(capture.sink.records.size(), 3u);
    const MessageRecord& first = capture.sink.records[0];
    EXPECT_EQ(first.severity, MessageSeverity::Error);
    EXPECT_EQ(first.domain, "TSDatabase");
    EXPECT_EQ(first.text, "ctx: bad thing\n");
    EXPECT_EQ(first.sourceFile, "mod.cpp");
    EXPECT_EQ(first.line, 17);
    EXPECT_EQ(first.fatalCode, 0);
    EXPECT_EQ(capture.sink.records[1].severity, MessageSeverity::InternalError);
    EXPECT_EQ(capture.sink.records[2].text, "   detail\n");
    EXPECT_EQ(msg.revision(), "1.0");
}

TEST(Messages, FatalCarriesItsCodeAndATestSinkKeepsTheProcess) {
    MessageCapture capture;
    int code = 0;
    std::string text = tsd_test::fatalText([] { TSD_MSG().fatal(2, "Unit unmatched.\n"); }, &code);
    EXPECT_EQ(text, "Unit unmatched.\n");
    EXPECT_EQ(code, 2);
    ASSERT_EQ(capture.sink.records.size(), 1u);
    EXPECT_EQ(capture.sink.records[0].severity, MessageSeverity::Fatal);
    EXPECT_EQ(capture.sink.records[0].fatalCode, 2);
}

TEST(MessagesDeathTest, FatalEndsTheProcessWithItsCodeWhenTheSinkReturns) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    EXPECT_EXIT(TSD_MSG().fatal(2, "NULL design in Tsd_Annotator.\n"), ::testing::ExitedWithCode(2),
                "TSDatabase: fatal error: NULL design in Tsd_Annotator\\.");
}

TEST(Messages, DebugTraceIsDiscardedUnlessSwitchedOn) {
    MessageCapture capture;
    bool was = MessageManager::debugTraceEnabled();
    MessageManager::setDebugTrace(false);
    MessageManager::debugTrace("checkLink() failed for spec %s.\n", "TS01");
    EXPECT_TRUE(capture.sink.records.empty());
    MessageManager::setDebugTrace(true);
    MessageManager::debugTrace("checkLink() failed for spec %s.\n", "TS01");
    ASSERT_EQ(capture.sink.records.size(), 1u);
    EXPECT_EQ(capture.sink.records[0].severity, MessageSeverity::Debug);
    EXPECT_EQ(capture.sink.records[0].text, "checkLink() failed for spec TS01.\n");
    MessageManager::setDebugTrace(was);
}

TEST(Messages, ScopedSinkRestoresThePreviousSink) {
    CapturingSink outer;
    ScopedMessageSink guardOuter(&outer);
    {
        CapturingSink inner;
        ScopedMessageSink guardInner(&inner);
        TSD_MSG().status("inner\n");
        EXPECT_EQ(inner.records.size(), 1u);
    }
    TSD_MSG().status("outer\n");
    ASSERT_EQ(outer.records.size(), 1u);
    EXPECT_EQ(outer.records[0].text, "outer\n");
}

TEST(Messages, DefaultSinkWritesOneLinePerMessageWithSeverityAndDomain) {
    ScopedMessageSink useDefault(nullptr);
    testing::internal::CaptureStderr();
    TSD_MSG().error("%zUnable to parse TIMEGRP definition.\n", u"Processing: ");
    TSD_MSG().status("   %s\n", "detail");
    std::string err = testing::internal::GetCapturedStderr();
    EXPECT_EQ(err, "TSDatabase: error: Processing: Unable to parse TIMEGRP definition.\n"
                   "TSDatabase: status:    detail\n");
}

TEST(DumpStream, WritesTextAndIntegersToAnyStream) {
    std::ostringstream out;
    DumpStream stream(out);
    stream << "count: " << static_cast<std::int16_t>(-3) << " " << static_cast<std::int32_t>(70000)
           << DumpStream::endl
           << static_cast<const char*>(nullptr) << "end" << DumpStream::endl;
    EXPECT_EQ(out.str(), "count: -3 70000\nend\n");
}

TEST(DumpStream, IndentIsThreeBlanksPerLevelAndBounded) {
    EXPECT_STREQ(tsd_detail::indent(0), "");
    EXPECT_STREQ(tsd_detail::indent(2), "      ");
    EXPECT_EQ(std::string(tsd_detail::indent(31)).size(), 93u);
    EXPECT_EQ(std::string(tsd_detail::indent(40)).size(), 93u);
    EXPECT_STREQ(tsd_detail::indent(-1), "");
}
