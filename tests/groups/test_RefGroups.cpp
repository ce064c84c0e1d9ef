#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>

using tsd_test::dumpText;
using tsd_test::MessageCapture;
using tsd_test::NamedRef;
using tsd_test::Prop;
using tsd_test::propOf;

namespace {

std::unique_ptr<Tsd_Group> makeGroup(const std::string& kind, const char* name) {
    if (kind == "TNM")
        return std::make_unique<Tsd_TNMGroup>(name);
    if (kind == "SYNC")
        return std::make_unique<Tsd_SyncGroup>(name);
    if (kind == "THRU")
        return std::make_unique<Tsd_ThruGroup>(name);
    if (kind == "TIG")
        return std::make_unique<Tsd_TIGGroup>(name);
    return std::make_unique<Tsd_ClkGroup>(name);
}

} // namespace

TEST(RefGroups, TypeQueriesFollowTheClassTree) {
    struct Case {
        const char* kind;
        bool term, predef, tnm, sync, thru, tig, clk;
    };
    const Case cases[] = {
        {"TNM", true, true, true, false, false, false, false},
        {"SYNC", true, false, false, true, false, false, false},
        {"THRU", false, false, false, false, true, false, false},
        {"TIG", false, false, false, false, false, true, false},
        {"CLK", false, false, false, false, false, false, true},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.kind);
        std::unique_ptr<Tsd_Group> g = makeGroup(c.kind, "g");
        Tsd_BaseObj& obj = *g;
        EXPECT_EQ(obj.getGroup(), g.get());
        EXPECT_EQ(obj.getTermGroup() != nullptr, c.term);
        EXPECT_EQ(obj.getPredefGroup() != nullptr, c.predef);
        EXPECT_EQ(obj.getTNMGroup() != nullptr, c.tnm);
        EXPECT_EQ(obj.getSyncGroup() != nullptr, c.sync);
        EXPECT_EQ(obj.getThruGroup() != nullptr, c.thru);
        EXPECT_EQ(obj.getTIGGroup() != nullptr, c.tig);
        EXPECT_EQ(obj.getClkGroup() != nullptr, c.clk);
        EXPECT_EQ(obj.getUserGroup(), nullptr);
        EXPECT_EQ(obj.getSpec(), nullptr);
        EXPECT_TRUE(obj.refOwner());
    }
}

TEST(RefGroups, PropertyIsTheReferencePropertyAndTheName) {
    struct Case {
        const char* kind;
        const char* name;
        Prop expected;
    };
    const Case cases[] = {
        {"TNM", "clk_ffs", {"TS_TNM", "clk_ffs"}},
        {"TNM", "FFS(data*)", {"TS_TNM", "FFS(data*)"}},
        {"SYNC", "sync1", {"TS_TPSYNC", "sync1"}},
        {"THRU", "/top/mux", {"TS_TPTHRU", "/top/mux"}}, // written unquoted
        {"TIG", "TS01", {"TS_TIG", "TS01"}},
        {"TIG", nullptr, {"TS_TIG", "global"}},
        {"CLK", "sysclk", {"TS_CLKGRP", "sysclk"}},
        {"CLK", nullptr, {"TS_CLKGRP", ""}},
    };
    for (const Case& c : cases) {
        std::unique_ptr<Tsd_Group> g = makeGroup(c.kind, c.name);
        EXPECT_EQ(propOf(*g), c.expected) << c.kind;
    }
}

TEST(RefGroups, PropertyBuffersAreSharedByAllGroups) {
    Tsd_TNMGroup tnm("a");
    Tsd_ClkGroup clk("b");
    const char* name1 = nullptr;
    const char* value1 = nullptr;
    ASSERT_TRUE(tnm.getProp(name1, value1));
    const char* name2 = nullptr;
    const char* value2 = nullptr;
    ASSERT_TRUE(clk.getProp(name2, value2));
    EXPECT_EQ(name1, name2);
    EXPECT_EQ(value1, value2);
    EXPECT_STREQ(name1, "TS_CLKGRP");
    EXPECT_STREQ(value1, "b");
}

TEST(RefGroups, UserStringDropsThePrefix) {
    Tsd_TNMGroup tnm("clk_ffs");
    EXPECT_STREQ(tnm.getUserString(), "TNM=clk_ffs");
    Tsd_ThruGroup thru("t:1");
    EXPECT_STREQ(thru.getUserString(), "TPTHRU=t 1");
}

TEST(TIGGroup, GlobalNameAndTIGid) {
    MessageCapture capture;
    struct Case {
        const char* name;
        const char* expectedName;
        const char* tigId; // null: global
    };
    const Case cases[] = {
        {nullptr, "global", nullptr},  {"", "global", nullptr},  {"global", "global", nullptr},
        {"GLOBAL", "GLOBAL", nullptr}, {"TS01", "TS01", "TS01"}, {"globalx", "globalx", "globalx"},
    };
    for (const Case& c : cases) {
        Tsd_TIGGroup g(c.name);
        EXPECT_STREQ(g.getName(), c.expectedName);
        if (c.tigId == nullptr)
            EXPECT_EQ(g.getTIGid(), nullptr) << c.expectedName;
        else
            EXPECT_STREQ(g.getTIGid(), c.tigId);
    }
    // Emptied or cleared after construction, a TIG names no TSid.
    Tsd_TIGGroup renamed("TS01");
    renamed.setName("");
    EXPECT_EQ(renamed.getTIGid(), nullptr);
    renamed.setName(nullptr);
    EXPECT_EQ(renamed.getTIGid(), nullptr);
    EXPECT_TRUE(capture.sink.records.empty());

    // Other groups have no TIG id.
    Tsd_TNMGroup tnm("TS01");
    EXPECT_EQ(tnm.getTIGid(), nullptr);
    ASSERT_EQ(capture.sink.records.size(), 1u);
    EXPECT_EQ(capture.sink.records[0].severity, MessageSeverity::InternalError);
}

TEST(PredefGroup, KeywordConversions) {
    using P = Tsd_PredefGroup;
    const struct {
        const char* text;
        P::PredefType type;
    } toType[] = {
        {"FFS", P::PREDEF_FFS},    {"rams", P::PREDEF_RAMS},   {"Latches", P::PREDEF_LATCHES},
        {"PADS", P::PREDEF_PADS},  {"pps", P::PREDEF_PPS},     {"OTHER", P::PREDEF_OTHER},
        {"FFS ", P::PREDEF_NONE},  {"FF", P::PREDEF_NONE},     {"", P::PREDEF_NONE},
        {nullptr, P::PREDEF_NONE}, {"FFS(a)", P::PREDEF_NONE},
    };
    for (const auto& c : toType)
        EXPECT_EQ(P::convertStringToPredefType(c.text), c.type) << (c.text ? c.text : "null");

    const char* words[] = {"FFS", "LATCHES", "PADS", "RAMS", "PPS", "OTHER"};
    for (int i = 0; i < 6; ++i)
        EXPECT_STREQ(P::convertPredefTypeToString(static_cast<P::PredefType>(i)), words[i]);
    EXPECT_EQ(P::convertPredefTypeToString(P::PREDEF_NONE), nullptr);
    EXPECT_EQ(P::convertPredefTypeToString(static_cast<P::PredefType>(-1)), nullptr);
}

TEST(TNMGroup, PatternClassification) {
    using P = Tsd_PredefGroup;
    const struct {
        const char* name;
        P::PredefType type;
        bool simple;
    } cases[] = {
        {"FFS", P::PREDEF_FFS, true},
        {"ffs", P::PREDEF_FFS, true},
        {"pads", P::PREDEF_PADS, true},
        {"FFS  (q*)", P::PREDEF_FFS, false},
        {"FFS(data*)", P::PREDEF_FFS, false},
        {"FFS\t\n(x)", P::PREDEF_FFS, false},
        {"LATCHES(a)", P::PREDEF_LATCHES, false},
        {"RAMS(mem/*)", P::PREDEF_RAMS, false},
        {"PPS", P::PREDEF_PPS, true},
        {"PADSX", P::PREDEF_NONE, false},
        {"RAMS_1", P::PREDEF_NONE, false},
        {"FFS x(", P::PREDEF_NONE, false},
        {"FFS ", P::PREDEF_NONE, false}, // blanks, then the end: not a pattern
        {"OTHER", P::PREDEF_NONE, false},
        {"OTHER(a)", P::PREDEF_NONE, false},
        {"mygroup", P::PREDEF_NONE, false},
        {"FF", P::PREDEF_NONE, false},
        {"", P::PREDEF_NONE, false},
        {nullptr, P::PREDEF_NONE, false},
    };
    for (const auto& c : cases) {
        Tsd_TNMGroup g(c.name);
        const char* shown = c.name != nullptr ? c.name : "null";
        EXPECT_EQ(g.getPredefTypeForPattern(), c.type) << shown;
        EXPECT_EQ(g.isSimpleWildcardPattern(), c.simple) << shown;
    }
}

TEST(RefGroups, DumpGolden) {
    Tsd_TNMGroup tnm("clk_ffs");
    auto* a = new NamedRef("a");
    auto* b = new NamedRef("b");
    a->setOwner(&tnm);
    b->setOwner(&tnm);
    EXPECT_EQ(dumpText(tnm, 1), "   Tsd_TNMGroup\n"
                                "      name = clk_ffs\n"
                                "      references:\n"
                                "         owner defined\n"
                                "         owner defined\n");
    Tsd_ClkGroup clk(nullptr);
    EXPECT_EQ(dumpText(clk), "Tsd_ClkGroup\n"
                             "   unnamed\n"
                             "   references:\n");
    EXPECT_EQ(dumpText(Tsd_SyncGroup("s")), "Tsd_SyncGroup\n   name = s\n   references:\n");
    EXPECT_EQ(dumpText(Tsd_ThruGroup("t")), "Tsd_ThruGroup\n   name = t\n   references:\n");
    EXPECT_EQ(dumpText(Tsd_TIGGroup(nullptr)), "Tsd_TIGGroup\n   name = global\n   references:\n");
}

TEST(RefGroups, DestroyingAGroupDestroysTheReferencesItStillHolds) {
    int destroyed = 0;
    auto other = std::make_unique<Tsd_SyncGroup>("other");
    auto* moved = new NamedRef("moved", &destroyed);
    {
        Tsd_TNMGroup tnm("g");
        (new NamedRef("a", &destroyed))->setOwner(&tnm);
        (new NamedRef("b", &destroyed))->setOwner(&tnm);
        moved->setOwner(&tnm);
        auto* trimmed = new NamedRef("t", &destroyed);
        trimmed->setOwner(&tnm);
        trimmed->trim(); // leaves a hole
        EXPECT_EQ(destroyed, 1);
        moved->setOwner(other.get()); // a second hole
        // Added twice by hand, destroyed once.
        auto* twice = new NamedRef("twice", &destroyed);
        twice->setOwner(&tnm);
        tnm.addRef(twice);
    }
    EXPECT_EQ(destroyed, 4);
    EXPECT_EQ(moved->getOwner(), other.get());
    other.reset();
    EXPECT_EQ(destroyed, 5);
}

TEST(Group, SetNameReplacesAndAcceptsNull) {
    Tsd_ClkGroup g("first");
    g.setName("second");
    g.setName("third");
    EXPECT_STREQ(g.getName(), "third");
    g.setName(g.getName()); // its own text
    EXPECT_STREQ(g.getName(), "third");
    g.setName(nullptr);
    EXPECT_EQ(g.getName(), nullptr);
    EXPECT_EQ(propOf(g), (Prop{"TS_CLKGRP", ""}));
}
