// The parser adaptors' callbacks, called the way the host parsers call them.
#include "TsdTestSupport.h"

#include "tsd/Tsd_Builder.h"
#include "tsd/Tsd_Parsers.h"

#include <gtest/gtest.h>

using tsd_test::fatalText;
using tsd_test::MessageCapture;
using tsd_test::NamedRef;

namespace {

constexpr int kNone = LogicalConstraintParser::kNoPriority;

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

    // Takes the parser's result.
    template <class T>
    std::unique_ptr<T> take() {
        std::unique_ptr<Tsd_Spec> spec(parser.getNewSpec());
        parser.setNewSpec(nullptr);
        return std::unique_ptr<T>(spec != nullptr ? dynamic_cast<T*>(spec.release()) : nullptr);
    }
    template <class T>
    std::unique_ptr<T> takeNet() {
        std::unique_ptr<Tsd_Spec> spec(net.getNewSpec());
        net.setNewSpec(nullptr);
        return std::unique_ptr<T>(spec != nullptr ? dynamic_cast<T*>(spec.release()) : nullptr);
    }
};

} // namespace

TEST(SpecGroupParser, PeriodsKeepTheirFormAndLoseNothing) {
    Fixture f;
    // A time stays in pS; a frequency is kept as MHz.
    f.parser.cb_tspec_period("TS01", "clk_ffs", nullptr, false, 10000, true, true, 0, false, 0, 40,
                             nullptr, kNone, nullptr);
    auto period = f.take<Tsd_Period>();
    ASSERT_NE(period, nullptr);
    EXPECT_EQ(period->getDelayValue().units, Tsd_TimeValue::UNITS_PS);
    EXPECT_DOUBLE_EQ(period->getDelayValue().value, 10000);
    EXPECT_TRUE(period->dutyCycleHigh()); // not LOW
    EXPECT_DOUBLE_EQ(period->getDutyCyclePercent(), 40);
    EXPECT_FALSE(period->hasPriority());

    double jitter = 200;
    f.parser.cb_tspec_period("TS02", "clk_ffs", nullptr, false, 10000, false, true, 0, true, 3000,
                             25, &jitter, 3, nullptr);
    period = f.take<Tsd_Period>();
    ASSERT_NE(period, nullptr);
    EXPECT_EQ(period->getDelayValue().units, Tsd_TimeValue::UNITS_MHZ);
    EXPECT_DOUBLE_EQ(period->getDelayValue().value, 100);
    // The time is tested before the percent here.
    EXPECT_FALSE(period->isDutyCyclePercent());
    EXPECT_FALSE(period->dutyCycleHigh());
    EXPECT_DOUBLE_EQ(period->getDutyCycleValue().value, 3000);
    EXPECT_DOUBLE_EQ(period->getInputJitterValue().value, 200);
    EXPECT_EQ(period->getPriority(), 3);
}

TEST(SpecGroupParser, LinkedPeriodsTakeTheirPhaseAndDefaultFactor) {
    Fixture f;
    f.builder.addSpecProp("TS01", "PERIOD clk_ffs 10 ns"); // not yet in the design
    f.parser.cb_tspec_period("TS02", "clk_ffs", "TS01", false, 0, true, false, 1500, false, 0, 0,
                             nullptr, kNone, nullptr);
    auto period = f.take<Tsd_Period>();
    ASSERT_NE(period, nullptr);
    EXPECT_TRUE(period->isLinked());
    EXPECT_EQ(period->getLinkedSpec(), nullptr); // pending
    EXPECT_TRUE(period->isLinkMultiplied());     // no factor: times 1
    EXPECT_DOUBLE_EQ(period->getLinkFactor(), 1.0);
    ASSERT_TRUE(period->hasPhase());
    EXPECT_FALSE(period->phaseIsPositive());
    EXPECT_DOUBLE_EQ(period->getPhaseValue().value, 1500);
}

TEST(SpecGroupParser, AnUnknownGroupDiscardsTheHalfBuiltSpec) {
    MessageCapture capture;
    Fixture f;
    f.parser.cb_tspec_period("TS01", "nope", nullptr, false, 10000, true, true, 0, false, 0, 0,
                             nullptr, kNone, nullptr);
    EXPECT_EQ(f.parser.getNewSpec(), nullptr);
    f.parser.cb_tspec_maxdelay("TS02", true, true, {"a", "nope", "b"}, nullptr, false, 1000, true,
                               kNone, false, nullptr);
    EXPECT_EQ(f.parser.getNewSpec(), nullptr);
    f.parser.cb_tspec_tig("TS03", true, false, {"nope"}, kNone, nullptr);
    EXPECT_EQ(f.parser.getNewSpec(), nullptr);
    EXPECT_EQ(f.builder.getNumError(), 3);
}

TEST(SpecGroupParser, FromThruToByFlagsAndPosition) {
    Fixture f;
    f.parser.cb_tspec_maxdelay("TS01", true, true, {"a", "t1", "b"}, nullptr, false, 5000, true, 7,
                               true, nullptr);
    auto path = f.take<Tsd_DelayPath>();
    ASSERT_NE(path, nullptr);
    EXPECT_STREQ(path->getStart()->getName(), "a");
    EXPECT_STREQ(path->getEnd()->getName(), "b");
    Tsd_PathThruIter thru(path.get());
    EXPECT_STREQ(thru.next()->getName(), "t1");
    EXPECT_EQ(thru.next(), nullptr);
    EXPECT_TRUE(path->isDataPathOnly());
    EXPECT_EQ(path->getPriority(), 7);

    f.parser.cb_tspec_maxdelay("TS02", true, false, {"a"}, nullptr, false, 5000, true, kNone, false,
                               nullptr);
    path = f.take<Tsd_DelayPath>();
    EXPECT_STREQ(path->getStart()->getName(), "a");
    EXPECT_EQ(path->getEnd(), nullptr);

    // A single name with both flags is the start.
    f.parser.cb_tspec_tig("TS03", true, true, {"c"}, kNone, nullptr);
    path = f.take<Tsd_DelayPath>();
    EXPECT_STREQ(path->getStart()->getName(), "c");
    EXPECT_EQ(path->getEnd(), nullptr);
    EXPECT_TRUE(path->isIgnored());
    EXPECT_FALSE(path->isLinked());

    f.parser.cb_tspec_maxdelay("TS04", false, false, {"t1", "t2"}, nullptr, false, 5000, true,
                               kNone, false, nullptr);
    path = f.take<Tsd_DelayPath>();
    EXPECT_EQ(path->getStart(), nullptr);
    auto iter = path->createThruIter();
    ASSERT_NE(iter, nullptr);
    EXPECT_STREQ(iter->next()->getName(), "t1");
    EXPECT_STREQ(iter->next()->getName(), "t2");
}

TEST(SpecGroupParser, TimegrpMembersEdgesAndSelfReference) {
    MessageCapture capture;
    MessageManager::setDebugTrace(true);
    Fixture f;
    Tsd_UserGroup group("g");
    f.parser.setNewGroup(&group);
    f.parser.cb_timegrp(
        "ignored",
        {{"a", PARSER_EDGE_RISING}, {"g", PARSER_EDGE_NONE}, {"b", static_cast<ParserEdge>(17)}},
        {"c"}, nullptr);
    MessageManager::setDebugTrace(false);
    EXPECT_EQ(f.parser.getNewGroup(), &group);
    const char* name = nullptr;
    const char* value = nullptr;
    group.getProp(name, value);
    EXPECT_STREQ(value, "RISING:a:g:b:EXCEPT:c");
    EXPECT_EQ(capture.sink.texts(MessageSeverity::Debug),
              (std::vector<std::string>{"Direct circular definition in user group \"g\".\n"}));

    // One member of the wrong kind refuses the definition, though the
    // others were added.
    Tsd_UserGroup other("h");
    f.parser.setNewGroup(&other);
    f.parser.cb_timegrp("h", {{"a", PARSER_EDGE_NONE}, {"t1", PARSER_EDGE_NONE}}, {}, nullptr);
    EXPECT_EQ(f.parser.getNewGroup(), nullptr);
    group.getProp(name, value);
    other.getProp(name, value);
    EXPECT_STREQ(value, "a");

    // Without a group to fill, a TIMEGRP fails the parse.
    EXPECT_FALSE(f.parser.cb_timegrp("x", {{"a", PARSER_EDGE_NONE}}, {}, nullptr));
}

TEST(SpecGroupParser, EdgesConvertAndErrorsAreRecorded) {
    EXPECT_EQ(Tsd_SpecGroupParser::convertPrefEdge(PARSER_EDGE_FALLING),
              Tsd_UserGroup::EDGE_FALLING);
    EXPECT_EQ(Tsd_SpecGroupParser::convertPrefEdge(PARSER_EDGE_TRANSLO),
              Tsd_UserGroup::EDGE_TRANSLO);
    EXPECT_EQ(Tsd_SpecGroupParser::convertPrefEdge(PARSER_EDGE_NONE), Tsd_UserGroup::EDGE_ANY);
    EXPECT_EQ(Tsd_SpecGroupParser::convertPrefEdge(static_cast<ParserEdge>(-3)),
              Tsd_UserGroup::EDGE_ANY);

    Fixture f;
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

TEST(SpecGroupParser, OffsetsFillTheCommonPartsAndLookUpTheirGroups) {
    MessageCapture capture;
    Fixture f;
    double valid = 3000;
    f.parser.cb_troffset("a", false, 5000, &valid, false, "clk", "b", "low", nullptr);
    auto offset = f.take<Tsd_GroupOffset>();
    ASSERT_NE(offset, nullptr);
    EXPECT_FALSE(offset->isIn());
    EXPECT_FALSE(offset->isBefore());
    EXPECT_DOUBLE_EQ(offset->getOffsetValue().value, 5000);
    EXPECT_DOUBLE_EQ(offset->getDataValidValue().value, 3000);
    EXPECT_EQ(offset->getRefClockEdge(), Tsd_UserGroup::EDGE_FALLING);
    EXPECT_STREQ(offset->getClockPad()->getName(), "clk");
    EXPECT_STREQ(offset->getPadGroup()->getName(), "a");
    EXPECT_STREQ(offset->getRegGroup()->getName(), "b");

    // A missing register group discards the offset, after both lookups.
    f.parser.cb_troffset("nope1", true, 0, nullptr, true, "clk", "nope2", nullptr, nullptr);
    EXPECT_EQ(f.parser.getNewSpec(), nullptr);
    EXPECT_EQ(capture.sink.errors().size(), 2u);

    EXPECT_EQ(
        fatalText([&] { f.parser.cb_offset(true, 1000, nullptr, true, "clk", "RISING", nullptr); }),
        "Unexpected high_low value \"RISING\".\n");
}

TEST(SpecGroupParser, WhatTheReducerRemovedIsApplied) {
    Fixture f;
    ASSERT_FALSE(f.parser.parse2("OFFSET = IN BEFORE clk REFERENCE_PIN fb FALLING ;"));
    auto offset = f.take<Tsd_Offset>();
    ASSERT_NE(offset, nullptr);
    EXPECT_FALSE(offset->hasOffsetValue()); // the reduced text's 0 is not kept
    EXPECT_STREQ(offset->getReferencePin()->getName(), "fb");
    EXPECT_EQ(offset->getRegGroupEdge(), Tsd_UserGroup::EDGE_FALLING);
    EXPECT_EQ(offset->getRefClockEdge(), Tsd_UserGroup::EDGE_ANY);
}

namespace {

// A builder that knows no clock nets at all.
class NoClocks : public Tsd_Builder {
protected:
    Tsd_ClkGroup* getClkGroupForSpec(const char*) override { return nullptr; }
};

} // namespace

TEST(NetParser, CallbacksMakeOneNetSpecEach) {
    Fixture f;
    double jitter = 100;
    f.net.cb_period(8000, true, 3000, 25, &jitter);
    auto timing = f.takeNet<Tsd_NetTiming>();
    ASSERT_NE(timing, nullptr);
    // The percent is tested first here: the time is dropped.
    EXPECT_TRUE(timing->isDutyCyclePercent());
    EXPECT_FALSE(timing->dutyCycleHigh());
    EXPECT_DOUBLE_EQ(timing->getDutyCyclePercent(), 25);
    EXPECT_TRUE(timing->hasInputJitter());

    f.net.cb_maxskew(500);
    timing = f.takeNet<Tsd_NetTiming>();
    EXPECT_TRUE(timing->hasMaxSkew());
    f.net.cb_maxdelay(700);
    timing = f.takeNet<Tsd_NetTiming>();
    EXPECT_DOUBLE_EQ(timing->getMaxDelayValue().value, 700);

    // A register group not yet known stays pending; the offset is kept.
    f.net.cb_offset(true, 2000, nullptr, true, "clk", "later", "HIGH");
    auto offset = f.takeNet<Tsd_NetOffset>();
    ASSERT_NE(offset, nullptr);
    EXPECT_EQ(offset->getRegGroup(), nullptr);
    EXPECT_EQ(offset->getRefClockEdge(), Tsd_UserGroup::EDGE_RISING);

    EXPECT_TRUE(f.net.cb_portpair("FEEDBACK", 1500, "NET", "fbclk"));
    auto port = f.takeNet<Tsd_PortTiming>();
    ASSERT_NE(port, nullptr);
    EXPECT_STREQ(port->getSecondaryGroup()->getName(), "fbclk");

    // Only NET is a kind: any other is a bad token and fails the parse.
    EXPECT_FALSE(f.net.cb_portpair("FEEDBACK", 1500, "PIN", "fbclk"));
    EXPECT_STREQ(f.net.getBadToken(), "PIN");
    EXPECT_EQ(f.net.getNewSpec(), nullptr);
    f.net.clearError();
    EXPECT_EQ(f.net.getBadToken(), nullptr);
}

TEST(NetParser, AnUnknownClockLeavesNoSpecButTheParseSucceeds) {
    NoClocks builder;
    Tsd_NetParser net(&builder);
    EXPECT_FALSE(net.parse2("FEEDBACK=1500:pS:NET:fbclk ;"));
    EXPECT_EQ(net.getNewSpec(), nullptr);
    EXPECT_FALSE(net.parse2("OFFSET=IN:2:nS:BEFORE:clk ;"));
    EXPECT_EQ(net.getNewSpec(), nullptr);
}
