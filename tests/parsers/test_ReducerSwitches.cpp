// Runs with QOR_TSD_NO_SPECIAL_PARSER and QOR_TSD_DEBUG_SPECIAL_PARSER set.
#include "TsdTestSupport.h"

#include "tsd/Tsd_Builder.h"
#include "tsd/Tsd_Parsers.h"

#include <gtest/gtest.h>

using tsd_test::MessageCapture;

TEST(ReducerSwitches, AreReadFromTheEnvironment) {
    EXPECT_TRUE(Tsd_OffsetBonusParser::isDisabled());
    EXPECT_TRUE(Tsd_OffsetBonusParser::isDebugEnabled());
}

TEST(ReducerSwitches, DisabledTheTextReachesTheParserUnchanged) {
    MessageCapture capture;
    Tsd_Builder builder;
    builder.addSpecProp("OFFSET", "IN 2 ns BEFORE clk REFERENCE_PIN fb");
    EXPECT_EQ(builder.buildTSDesign(), nullptr);
    ASSERT_FALSE(capture.sink.errors().empty());
    EXPECT_NE(capture.sink.errors()[0].find("Encountered bad token \"REFERENCE_PIN\""),
              std::string::npos)
        << capture.sink.errors()[0];
    // The reducer itself was never asked, so it reported nothing.
    EXPECT_TRUE(capture.sink.statuses().empty());
}

TEST(ReducerSwitches, TheDebugReportListsWhatWasFound) {
    MessageCapture capture;
    Tsd_OffsetBonusParser reducer;
    ASSERT_TRUE(reducer.reduceOffset("OFFSET = IN BEFORE clk REFERENCE_PIN fb RISING ;"));
    EXPECT_EQ(capture.sink.statuses(),
              (std::vector<std::string>{"Detected special features in OFFSET:\n",
                                        "  original : OFFSET = IN BEFORE clk REFERENCE_PIN fb "
                                        "RISING ;\n",
                                        "  reduced  : OFFSET=IN:0:BEFORE:clk: ;\n",
                                        "  has value: false\n", "  ref pin  : fb\n",
                                        "  reg edge : RISING\n"}));
}
