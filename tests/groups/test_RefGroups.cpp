#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <memory>

using tsd_test::NamedRef;
using tsd_test::Prop;
using tsd_test::propOf;
using P = Tsd_PredefGroup;

TEST(RefGroups, PropertiesAndTIGids) {
    const std::unique_ptr<Tsd_Group> groups[] = {
        std::make_unique<Tsd_TNMGroup>("clk_ffs"),   std::make_unique<Tsd_SyncGroup>("s1"),
        std::make_unique<Tsd_ThruGroup>("/top/mux"), std::make_unique<Tsd_TIGGroup>("TS01"),
        std::make_unique<Tsd_TIGGroup>(""),          std::make_unique<Tsd_ClkGroup>(nullptr)};
    const Prop expected[] = {{"TS_TNM", "clk_ffs"}, {"TS_TPSYNC", "s1"},  {"TS_TPTHRU", "/top/mux"},
                             {"TS_TIG", "TS01"},    {"TS_TIG", "global"}, {"TS_CLKGRP", ""}};
    for (int i = 0; i < 6; ++i) {
        EXPECT_EQ(propOf(*groups[i]), expected[i]);
        EXPECT_TRUE(groups[i]->refOwner());
    }
    EXPECT_STREQ(groups[0]->getUserString(), "TNM=clk_ffs");

    EXPECT_STREQ(Tsd_TIGGroup("TS01").getTIGid(), "TS01");
    for (const char* global : {(const char*)nullptr, "", "global", "GLOBAL"})
        EXPECT_EQ(Tsd_TIGGroup(global).getTIGid(), nullptr);
    // Emptied after construction, a TIG still names no TSid.
    Tsd_TIGGroup renamed("TS01");
    renamed.setName("");
    EXPECT_EQ(renamed.getTIGid(), nullptr);
}

TEST(PredefGroup, KeywordsAndTNMPatterns) {
    EXPECT_EQ(P::convertStringToPredefType("rams"), P::PREDEF_RAMS);
    EXPECT_EQ(P::convertStringToPredefType("Other"), P::PREDEF_OTHER);
    EXPECT_EQ(P::convertStringToPredefType("FFS "), P::PREDEF_NONE);
    EXPECT_EQ(P::convertStringToPredefType(nullptr), P::PREDEF_NONE);
    EXPECT_STREQ(P::convertPredefTypeToString(P::PREDEF_LATCHES), "LATCHES");
    EXPECT_EQ(P::convertPredefTypeToString(P::PREDEF_NONE), nullptr);

    const struct {
        const char* name;
        P::PredefType type;
        bool simple;
    } cases[] = {
        {"FFS", P::PREDEF_FFS, true},         {"ffs", P::PREDEF_FFS, true},
        {"pads", P::PREDEF_PADS, true},       {"FFS  (q*)", P::PREDEF_FFS, false},
        {"FFS\t\n(x)", P::PREDEF_FFS, false}, {"LATCHES(a)", P::PREDEF_LATCHES, false},
        {"PPS", P::PREDEF_PPS, true},         {"PADSX", P::PREDEF_NONE, false},
        {"RAMS_1", P::PREDEF_NONE, false},    {"FFS ", P::PREDEF_NONE, false},
        {"OTHER(a)", P::PREDEF_NONE, false},  {"mygroup", P::PREDEF_NONE, false},
        {nullptr, P::PREDEF_NONE, false},
    };
    for (const auto& c : cases) {
        Tsd_TNMGroup g(c.name);
        EXPECT_EQ(g.getPredefTypeForPattern(), c.type) << (c.name ? c.name : "null");
        EXPECT_EQ(g.isSimpleWildcardPattern(), c.simple) << (c.name ? c.name : "null");
    }
}

TEST(RefGroups, DumpGolden) {
    Tsd_TNMGroup tnm("clk_ffs");
    (new NamedRef("a"))->setOwner(&tnm);
    EXPECT_EQ(tsd_test::dumpText(tnm, 1), "   Tsd_TNMGroup\n"
                                          "      name = clk_ffs\n"
                                          "      references:\n"
                                          "         owner defined\n");
    EXPECT_EQ(tsd_test::dumpText(Tsd_ClkGroup(nullptr)),
              "Tsd_ClkGroup\n   unnamed\n   references:\n");
}

TEST(RefGroups, DestroyingAGroupDestroysOnlyTheReferencesItStillHolds) {
    int destroyed = 0;
    Tsd_SyncGroup other("other");
    auto* moved = new NamedRef("moved", &destroyed);
    {
        Tsd_TNMGroup tnm("g");
        (new NamedRef("a", &destroyed))->setOwner(&tnm);
        moved->setOwner(&tnm);
        moved->setOwner(&other); // leaves a hole
        auto* twice = new NamedRef("twice", &destroyed);
        twice->setOwner(&tnm);
        tnm.addRef(twice); // held twice, destroyed once
    }
    EXPECT_EQ(destroyed, 2);
    EXPECT_EQ(moved->getOwner(), &other);
}
