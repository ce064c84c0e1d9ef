#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>

using tsd_test::NamedRef;
using tsd_test::Prop;
using tsd_test::propOf;
using TV = Tsd_TimeValue;
using UG = Tsd_UserGroup;

TEST(Offset, TheThreeOffsetsShareOneText) {
    Tsd_ClkGroup clk("clk"), fb("clk_fb");
    Tsd_TNMGroup regs("outregs"), pads("data_pads");
    const struct {
        std::function<void(Tsd_Offset&)> set;
        const char* value;
    } cases[] = {
        {[](Tsd_Offset& o) { o.setOffsetValue(TV(2, TV::UNITS_NS)); }, "IN:2:nS:BEFORE:clk"},
        {[](Tsd_Offset&) {}, "IN::BEFORE:clk"},
        {[&](Tsd_Offset& o) {
             o.setIn(false);
             o.setBefore(false);
             o.setOffsetValue(TV(5, TV::UNITS_NS));
             o.setRegGroup(&regs);
             o.setRegGroupEdge(UG::EDGE_FALLING);
         },
         "OUT:5:nS:AFTER:clk:TIMEGRP:outregs:FALLING"},
        {[&](Tsd_Offset& o) {
             o.setOffsetValue(TV(1, TV::UNITS_NS));
             o.setDataValid(TV(3, TV::UNITS_NS));
             o.setReferencePin(&fb);
             o.setRefClockEdge(UG::EDGE_RISING);
         },
         "IN:1:nS:VALID:3:nS:BEFORE:clk:REFERENCE_PIN:clk_fb:HIGH"},
        {[&](Tsd_Offset& o) { // set in the opposite order of the text
             o.setRegGroupEdge(UG::EDGE_RISING);
             o.setRefClockEdge(UG::EDGE_FALLING);
             o.setRegGroup(&regs);
             o.setReferencePin(&fb);
         },
         "IN::BEFORE:clk:REFERENCE_PIN:clk_fb:TIMEGRP:outregs:LOW:RISING"},
        {[](Tsd_Offset& o) {
             o.setRefClockEdge(UG::EDGE_TRANSHI);
             o.setRegGroupEdge(static_cast<UG::Edge>(8));
         },
         "IN::BEFORE:clk:TRANSHI:"},
    };
    for (const auto& c : cases) {
        Tsd_Offset global;
        Tsd_NetOffset net;
        Tsd_GroupOffset group;
        group.setPadGroup(&pads);
        for (Tsd_Offset* o :
             {&global, static_cast<Tsd_Offset*>(&net), static_cast<Tsd_Offset*>(&group)}) {
            o->setClockPad(&clk);
            c.set(*o);
        }
        EXPECT_EQ(propOf(global), (Prop{"OFFSET", c.value}));
        EXPECT_EQ(propOf(net), (Prop{"TS_OFFSET", c.value}));
        EXPECT_EQ(propOf(group), (Prop{"TS_GROUP_BASED_OFFSET",
                                       std::string("TIMEGRP:data_pads:OFFSET=") + c.value}));
    }
}

TEST(Offset, UserStringsAndMissingGroups) {
    Tsd_ClkGroup clk("clk");
    Tsd_TNMGroup pads("data_pads");
    Tsd_GroupOffset o;
    o.setClockPad(&clk);
    o.setPadGroup(&pads);
    o.setOffsetValue(TV(2, TV::UNITS_NS));
    EXPECT_STREQ(o.getUserString(), "TIMEGRP data_pads OFFSET=IN 2 nS BEFORE clk");
    Tsd_NetOffset net;
    net.setClockPad(&clk);
    EXPECT_STREQ(net.getUserString(), "OFFSET=IN  BEFORE clk");
    // No clock pad or pad group: an empty quoted name instead of a crash.
    Tsd_GroupOffset bare;
    EXPECT_EQ(propOf(bare).value, "TIMEGRP:\"\":OFFSET=IN::BEFORE:\"\"");
}

TEST(Offset, CopiesOwnTheirValuesAndNetOffsetsTheirReferences) {
    Tsd_ClkGroup clk("clk");
    auto source = std::make_unique<Tsd_Offset>();
    source->setClockPad(&clk);
    source->setOffsetValue(TV(2, TV::UNITS_NS));
    source->setDataValid(TV(4, TV::UNITS_NS));
    source->setScope("top");
    Tsd_Offset copy(*source);
    source->setOffsetValue(TV(9, TV::UNITS_NS));
    source->clearDataValid();
    source.reset();
    EXPECT_EQ(propOf(copy).value, "IN:2:nS:VALID:4:nS:BEFORE:clk");
    EXPECT_STREQ(copy.getScope(), "top");

    int destroyed = 0;
    auto* moved = new NamedRef("moved", &destroyed);
    {
        Tsd_NetOffset net;
        (new NamedRef("a", &destroyed))->setOwner(&net);
        moved->setOwner(&net);
        moved->setOwner(&clk);
    }
    EXPECT_EQ(destroyed, 1);
    EXPECT_EQ(moved->getOwner(), &clk);
}

TEST(Offset, DumpGolden) {
    Tsd_ClkGroup clk("clk"), fb("clk_fb");
    Tsd_TNMGroup pads("data_pads");
    Tsd_GroupOffset g;
    g.setPadGroup(&pads);
    g.setClockPad(&clk);
    g.setOffsetValue(TV(2, TV::UNITS_NS));
    g.setReferencePin(&fb);
    g.setRefClockEdge(UG::EDGE_RISING);
    g.setIn(false);
    g.setScope("core");
    EXPECT_EQ(tsd_test::dumpText(g), "Tsd_GroupOffset\n"
                                     "   pad group: data_pads\n"
                                     "   Tsd_Offset\n"
                                     "      offset value: 2 nS\n"
                                     "      BEFORE\n"
                                     "      OUT\n"
                                     "      clock group: clk\n"
                                     "      register group unset\n"
                                     "      reference pin group: clk_fb\n"
                                     "      data valid unset\n"
                                     "      reference clock edge: Rising\n"
                                     "      register group edge unset\n"
                                     "      constraint scope: core\n");
    Tsd_NetOffset net;
    (new NamedRef("n"))->setOwner(&net);
    net.setRegGroupEdge(UG::EDGE_TRANSLO);
    const std::string text = tsd_test::dumpText(net);
    EXPECT_EQ(text.substr(0, 56), "Tsd_NetOffset\n   references:\n      owner defined\n   Tsd_");
    EXPECT_NE(text.find("\n      register group edge: Transparent Low\n"), std::string::npos);
}
