// The OFFSET reducer (reductions.cases) and the parser adaptors' callbacks,
// called the way the host parsers call them.
#include "TsdTestSupport.h"

#include "tsd/Tsd_Builder.h"
#include "tsd/Tsd_Parsers.h"

#include <functional>

using namespace tsd_test;

namespace {

constexpr int kNone = LogicalConstraintParser::kNoPriority;

const char* edgeName(Tsd_UserGroup::Edge edge) {
    return edge == Tsd_UserGroup::EDGE_RISING    ? "RISING"
           : edge == Tsd_UserGroup::EDGE_FALLING ? "FALLING"
           : edge == Tsd_UserGroup::EDGE_ANY     ? "-"
                                                 : "?";
}

// A builder with a few groups and clocks defined by reference properties.
struct Fixture {
    Tsd_Builder builder;
    Tsd_SpecGroupParser parser{&builder};
    Tsd_NetParser net{&builder};

    Fixture() {
        for (const char* tnm : {"a", "b", "c", "clk_ffs"})
            builder.addRefProp(new NamedRef(tnm), "TS_TNM", tnm);
        builder.addRefProp(new NamedRef("t"), "TS_TPTHRU", "t1");
        builder.addRefProp(new NamedRef("t"), "TS_TPTHRU", "t2");
    }

    // Takes the result of the logical (or the net) adaptor.
    template <class T>
    std::unique_ptr<T> take(bool ofNet = false) {
        std::unique_ptr<Tsd_Spec> spec(ofNet ? net.getNewSpec() : parser.getNewSpec());
        (ofNet ? net.setNewSpec(nullptr) : parser.setNewSpec(nullptr));
        return std::unique_ptr<T>(spec != nullptr ? dynamic_cast<T*>(spec.release()) : nullptr);
    }
};

} // namespace

// One reducer for every case: each text starts from a fresh state.
TEST(OffsetBonusParser, ReducesOnlyTextsWithSpecialFeatures) {
    Tsd_OffsetBonusParser reducer;
    expectCases("parsers/reductions.cases", [&](const std::string& text) {
        const bool reduced = reducer.reduceOffset(text.c_str());
        return std::string(reduced ? "reduced " : "kept ") + reducer.getReducedText() +
               " | pin=" + reducer.getRefPin() + " edge=" + edgeName(reducer.getRegEdge()) +
               (reducer.hasValue() ? " value" : " no value");
    });
    EXPECT_FALSE(reducer.reduceOffset(nullptr));
    // The test program runs without either switch.
    EXPECT_FALSE(Tsd_OffsetBonusParser::isDisabled() || Tsd_OffsetBonusParser::isDebugEnabled());
}

TEST(SpecGroupParser, PeriodsKeepTheirFormAndLoseNothing) {
    Fixture f;
    // A time stays in pS; a frequency is kept as MHz.
    f.parser.cb_tspec_period("TS01", "clk_ffs", nullptr, false, 10000, true, true, 0, false, 0, 40,
                             nullptr, kNone, nullptr);
    auto period = f.take<Tsd_Period>();
    ASSERT_NE(period, nullptr);
    EXPECT_EQ(propText(*period), "TS01 = PERIOD:clk_ffs:10000:pS:HIGH:40%");
    double jitter = 200;
    // Both duty cycles given: the time is tested before the percent here.
    f.parser.cb_tspec_period("TS02", "clk_ffs", nullptr, false, 10000, false, true, 0, true, 3000,
                             25, &jitter, 3, nullptr);
    period = f.take<Tsd_Period>();
    ASSERT_NE(period, nullptr);
    EXPECT_EQ(propText(*period),
              "TS02 = PERIOD:clk_ffs:100:MHz:LOW:3000:pS:INPUT_JITTER:200:pS:PRIORITY:3");

    f.builder.addSpecProp("TS01", "PERIOD clk_ffs 10 ns"); // not yet in the design
    f.parser.cb_tspec_period("TS03", "clk_ffs", "TS01", false, 0, true, false, 1500, false, 0, 0,
                             nullptr, kNone, nullptr);
    period = f.take<Tsd_Period>();
    ASSERT_NE(period, nullptr);
    EXPECT_EQ(period->getLinkedSpec(), nullptr); // pending
    EXPECT_TRUE(period->isLinkMultiplied());     // no factor: times 1
    EXPECT_DOUBLE_EQ(period->getLinkFactor(), 1.0);
    ASSERT_TRUE(period->hasPhase());
    EXPECT_FALSE(period->phaseIsPositive());
    EXPECT_DOUBLE_EQ(period->getPhaseValue().value, 1500);
}

TEST(SpecGroupParser, PathsByFlagsAndPositionAndUnknownGroups) {
    MessageCapture capture;
    Fixture f;
    using Names = std::vector<const char*>;
    const struct {
        std::function<void(Tsd_SpecGroupParser&)> call;
        const char* written;
    } cases[] = {
        {[](Tsd_SpecGroupParser& p) {
             p.cb_tspec_maxdelay("TS01", true, true, Names{"a", "t1", "b"}, nullptr, false, 5000,
                                 true, 7, true, nullptr);
         },
         "TS01 = FROM:a:THRU:t1:TO:b:5000:pS:DATAPATHONLY:PRIORITY:7"},
        {[](Tsd_SpecGroupParser& p) {
             p.cb_tspec_maxdelay("TS02", true, false, Names{"a", "t2"}, nullptr, false, 5000, true,
                                 kNone, false, nullptr);
         },
         "TS02 = FROM:a:THRU:t2:5000:pS"},
        {[](Tsd_SpecGroupParser& p) { // a single name with both flags is the start
             p.cb_tspec_tig("TS03", true, true, Names{"c"}, kNone, nullptr);
         },
         "TS03 = FROM:c:TIG"},
        {[](Tsd_SpecGroupParser& p) {
             p.cb_tspec_maxdelay("TS04", false, false, Names{"t1", "t2"}, nullptr, false, 5000,
                                 true, kNone, false, nullptr);
         },
         "TS04 = THRU:t1:THRU:t2:5000:pS"},
        {[](Tsd_SpecGroupParser& p) { // the unknown group is reported, the spec discarded
             p.cb_tspec_period("TS05", "nope", nullptr, false, 10000, true, true, 0, false, 0, 0,
                               nullptr, kNone, nullptr);
         },
         "none"},
        {[](Tsd_SpecGroupParser& p) {
             p.cb_tspec_maxdelay("TS06", true, true, Names{"a", "nope", "b"}, nullptr, false, 1000,
                                 true, kNone, false, nullptr);
         },
         "none"},
        {[](Tsd_SpecGroupParser& p) {
             p.cb_tspec_tig("TS07", true, false, Names{"nope"}, kNone, nullptr);
         },
         "none"},
    };
    for (const auto& c : cases) {
        c.call(f.parser);
        auto path = f.take<Tsd_EndpointSpec>();
        EXPECT_EQ(path != nullptr ? propText(*path) : "none", c.written);
    }
    EXPECT_EQ(f.builder.getNumError(), 3);
    EXPECT_EQ(capture.sink.errors().size(), 3u);
}

TEST(SpecGroupParser, TimegrpMembersEdgesAndErrors) {
    MessageCapture capture;
    MessageManager::setDebugTrace(true);
    Fixture f;
    Tsd_UserGroup group("g"), other("h");
    f.parser.setNewGroup(&group);
    f.parser.cb_timegrp("ignored",
                        {{"a", PARSER_EDGE_RISING},
                         {"g", PARSER_EDGE_NONE},
                         {"b", static_cast<ParserEdge>(17)},
                         {"c", PARSER_EDGE_TRANSHI},
                         {"a", PARSER_EDGE_TRANSLO},
                         {"b", PARSER_EDGE_FALLING}},
                        {"c"}, nullptr);
    MessageManager::setDebugTrace(false);
    EXPECT_EQ(f.parser.getNewGroup(), &group);
    EXPECT_EQ(propText(group), "g = RISING:a:g:b:TRANSHI:c:TRANSLO:a:FALLING:b:EXCEPT:c");
    EXPECT_EQ(capture.sink.transcript(),
              "debug: Direct circular definition in user group \"g\".\n");
    // One member of the wrong kind refuses the definition, though the
    // others were added; without a group to fill, a TIMEGRP fails.
    f.parser.setNewGroup(&other);
    f.parser.cb_timegrp("h", {{"a", PARSER_EDGE_NONE}, {"t1", PARSER_EDGE_NONE}}, {}, nullptr);
    EXPECT_EQ(f.parser.getNewGroup(), nullptr);
    EXPECT_EQ(propText(other), "h = a");
    EXPECT_FALSE(f.parser.cb_timegrp("x", {{"a", PARSER_EDGE_NONE}}, {}, nullptr));
    EXPECT_EQ(Tsd_SpecGroupParser::convertPrefEdge(static_cast<ParserEdge>(-3)),
              Tsd_UserGroup::EDGE_ANY);

    f.parser.cb_error(3, 14, "BOGUS");
    EXPECT_STREQ(f.parser.getBadToken(), "BOGUS");
    EXPECT_EQ(f.parser.getBadOffset(), 14);
    f.parser.cb_error(3, 0, "ignored"); // column 0 clears and records nothing
    EXPECT_EQ(f.parser.getBadToken(), nullptr);
    EXPECT_EQ(f.parser.getBadOffset(), -1);
    f.parser.cb_error(3, 2, "x");
    f.parser.clearError();
    EXPECT_EQ(f.parser.getBadToken(), nullptr);
}

TEST(SpecGroupParser, OffsetsLookUpTheirGroupsAndTakeWhatTheReducerRemoved) {
    MessageCapture capture;
    Fixture f;
    double valid = 3000;
    f.parser.cb_troffset("a", false, 5000, &valid, false, "clk", "b", "low", nullptr);
    auto offset = f.take<Tsd_GroupOffset>();
    ASSERT_NE(offset, nullptr);
    EXPECT_EQ(propText(*offset),
              "TS_GROUP_BASED_OFFSET = TIMEGRP:a:OFFSET=OUT:5000:pS:VALID:3000:pS:AFTER:clk:"
              "TIMEGRP:b:LOW");
    // A missing register group discards the offset, after both lookups.
    f.parser.cb_troffset("nope1", true, 0, nullptr, true, "clk", "nope2", nullptr, nullptr);
    EXPECT_EQ(f.parser.getNewSpec(), nullptr);
    EXPECT_EQ(capture.sink.errors().size(), 2u);
    EXPECT_EQ(
        fatalText([&] { f.parser.cb_offset(true, 1000, nullptr, true, "clk", "RISING", nullptr); }),
        "Unexpected high_low value \"RISING\".\n");

    ASSERT_FALSE(f.parser.parse2("OFFSET = IN BEFORE clk REFERENCE_PIN fb FALLING ;"));
    auto reduced = f.take<Tsd_Offset>();
    ASSERT_NE(reduced, nullptr);
    EXPECT_EQ(propText(*reduced), "OFFSET = IN::BEFORE:clk:REFERENCE_PIN:fb:FALLING");
}

TEST(NetParser, CallbacksMakeOneNetSpecEach) {
    Fixture f;
    double jitter = 100;
    // Both duty cycles given: the percent is tested first here.
    f.net.cb_period(8000, true, 3000, 25, &jitter);
    auto timing = f.take<Tsd_NetTiming>(true);
    ASSERT_NE(timing, nullptr);
    EXPECT_EQ(propText(*timing), "TS_PERIOD = 8000:pS:LOW:25%:INPUT_JITTER:100:pS");
    f.net.cb_maxdelay(700);
    EXPECT_EQ(propText(*f.take<Tsd_NetTiming>(true)), "TS_MAXDELAY = 700:pS");
    // A register group not yet known stays pending; the offset is kept.
    f.net.cb_offset(true, 2000, nullptr, true, "clk", "later", "HIGH");
    auto offset = f.take<Tsd_NetOffset>(true);
    ASSERT_NE(offset, nullptr);
    EXPECT_EQ(propText(*offset), "TS_OFFSET = IN:2000:pS:BEFORE:clk:HIGH");
    EXPECT_TRUE(f.net.cb_portpair("FEEDBACK", 1500, "NET", "fbclk"));
    EXPECT_EQ(propText(*f.take<Tsd_PortTiming>(true)), "TS_FEEDBACK = 1500:pS:NET:fbclk");
    // Only NET is a kind: any other is a bad token and fails the parse.
    EXPECT_FALSE(f.net.cb_portpair("FEEDBACK", 1500, "PIN", "fbclk"));
    EXPECT_STREQ(f.net.getBadToken(), "PIN");
    EXPECT_EQ(f.net.getNewSpec(), nullptr);
    f.net.clearError();
    EXPECT_EQ(f.net.getBadToken(), nullptr);

    // A builder that knows no clock nets: no spec, but the parse succeeds.
    struct NoClocks : Tsd_Builder {
        Tsd_ClkGroup* getClkGroupForSpec(const char*) override { return nullptr; }
    } noClocks;
    Tsd_NetParser net(&noClocks);
    for (const char* text : {"FEEDBACK=1500:pS:NET:fbclk ;", "OFFSET=IN:2:nS:BEFORE:clk ;"}) {
        EXPECT_FALSE(net.parse2(text));
        EXPECT_EQ(net.getNewSpec(), nullptr);
    }
}
