#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>

using tsd_test::dumpText;
using tsd_test::NamedRef;
using tsd_test::Prop;
using tsd_test::propOf;
using TV = Tsd_TimeValue;
using UG = Tsd_UserGroup;

namespace {

struct Groups {
    Tsd_ClkGroup clk{"clk"};
    Tsd_ClkGroup clkFb{"clk_fb"};
    Tsd_TNMGroup outregs{"outregs"};
    Tsd_TNMGroup dataPads{"data_pads"};
};

} // namespace

TEST(Offset, SharedTextForEveryCombination) {
    Groups g;
    struct Case {
        const char* label;
        std::function<void(Tsd_Offset&)> set;
        const char* value;
    };
    const Case cases[] = {
        {"default", [&](Tsd_Offset& o) { o.setOffsetValue(TV(2, TV::UNITS_NS)); },
         "IN:2:nS:BEFORE:clk"},
        {"no value", [](Tsd_Offset&) {}, "IN::BEFORE:clk"},
        {"removed value",
         [](Tsd_Offset& o) {
             o.setOffsetValue(TV(2, TV::UNITS_NS));
             o.removeOffsetValue();
         },
         "IN::BEFORE:clk"},
        {"out after group edge",
         [&](Tsd_Offset& o) {
             o.setIn(false);
             o.setBefore(false);
             o.setOffsetValue(TV(5, TV::UNITS_NS));
             o.setRegGroup(&g.outregs);
             o.setRegGroupEdge(UG::EDGE_FALLING);
         },
         "OUT:5:nS:AFTER:clk:TIMEGRP:outregs:FALLING"},
        {"valid, reference pin, clock edge",
         [&](Tsd_Offset& o) {
             o.setOffsetValue(TV(1, TV::UNITS_NS));
             o.setDataValid(TV(3, TV::UNITS_NS));
             o.setReferencePin(&g.clkFb);
             o.setRefClockEdge(UG::EDGE_RISING);
         },
         "IN:1:nS:VALID:3:nS:BEFORE:clk:REFERENCE_PIN:clk_fb:HIGH"},
        {"order is fixed",
         [&](Tsd_Offset& o) {
             o.setRegGroupEdge(UG::EDGE_RISING);
             o.setRegGroup(&g.outregs);
             o.setRefClockEdge(UG::EDGE_FALLING);
             o.setReferencePin(&g.clkFb);
             o.setOffsetValue(TV(2000, TV::UNITS_PS));
         },
         "IN:2000:pS:BEFORE:clk:REFERENCE_PIN:clk_fb:TIMEGRP:outregs:LOW:RISING"},
        {"transparency edges",
         [&](Tsd_Offset& o) {
             o.setRefClockEdge(UG::EDGE_TRANSHI);
             o.setRegGroupEdge(UG::EDGE_TRANSLO);
         },
         "IN::BEFORE:clk:TRANSHI:TRANSLO"},
        {"edges outside the table",
         [&](Tsd_Offset& o) {
             o.setRefClockEdge(static_cast<UG::Edge>(8));
             o.setRegGroupEdge(static_cast<UG::Edge>(-1));
         },
         "IN::BEFORE:clk::"},
    };
    for (const Case& c : cases) {
        Tsd_Offset global;
        global.setClockPad(&g.clk);
        c.set(global);
        EXPECT_EQ(propOf(global), (Prop{"OFFSET", c.value})) << c.label;

        Tsd_NetOffset net;
        net.setClockPad(&g.clk);
        c.set(net);
        EXPECT_EQ(propOf(net), (Prop{"TS_OFFSET", c.value})) << c.label;

        Tsd_GroupOffset group;
        group.setClockPad(&g.clk);
        group.setPadGroup(&g.dataPads);
        c.set(group);
        EXPECT_EQ(propOf(group), (Prop{"TS_GROUP_BASED_OFFSET",
                                       std::string("TIMEGRP:data_pads:OFFSET=") + c.value}))
            << c.label;
    }
}

TEST(Offset, NamesAreQuotedWhereNeeded) {
    Tsd_ClkGroup clk("/"), pin("//pin");
    Tsd_TNMGroup pads("*pads"), regs("9regs");
    Tsd_GroupOffset o;
    o.setClockPad(&clk);
    o.setReferencePin(&pin);
    o.setPadGroup(&pads);
    o.setRegGroup(&regs);
    EXPECT_EQ(propOf(o).value,
              "TIMEGRP:\"*pads\":OFFSET=IN::BEFORE:\"/\":REFERENCE_PIN:\"//pin\":TIMEGRP:9regs");
}

TEST(Offset, MissingClockPadOrPadGroupWriteAnEmptyName) {
    Tsd_Offset o;
    EXPECT_EQ(propOf(o).value, "IN::BEFORE:\"\"");
    Tsd_GroupOffset g;
    EXPECT_EQ(propOf(g).value, "TIMEGRP:\"\":OFFSET=IN::BEFORE:\"\"");
    EXPECT_STREQ(g.getUserString(), "TIMEGRP \"\" OFFSET=IN  BEFORE \"\"");
}

TEST(Offset, GroupOffsetUserStringIsTheValueWithBlanks) {
    Groups g;
    Tsd_GroupOffset o;
    o.setClockPad(&g.clk);
    o.setPadGroup(&g.dataPads);
    o.setOffsetValue(TV(2, TV::UNITS_NS));
    EXPECT_STREQ(o.getUserString(), "TIMEGRP data_pads OFFSET=IN 2 nS BEFORE clk");
    // The other offsets keep the base form, with their property name.
    Tsd_Offset global;
    global.setClockPad(&g.clk);
    EXPECT_STREQ(global.getUserString(), "OFFSET=IN  BEFORE clk");
    Tsd_NetOffset net;
    net.setClockPad(&g.clk);
    EXPECT_STREQ(net.getUserString(), "OFFSET=IN  BEFORE clk"); // TS_ dropped for holders
}

TEST(Offset, DefaultsAndAccessors) {
    Tsd_Offset o;
    EXPECT_EQ(o.getTSid(), nullptr);
    EXPECT_EQ(o.getScope(), nullptr);
    EXPECT_TRUE(o.isIn());
    EXPECT_TRUE(o.isBefore());
    EXPECT_EQ(o.getRefClockEdge(), UG::EDGE_ANY);
    EXPECT_EQ(o.getRegGroupEdge(), UG::EDGE_ANY);
    EXPECT_FALSE(o.hasOffsetValue());
    EXPECT_FALSE(o.hasDataValid());
    EXPECT_EQ(o.getOffsetValue().value, 0.0);
    EXPECT_EQ(o.getOffsetValue().units, TV::UNITS_PS);
    EXPECT_EQ(o.getDataValidValue().units, TV::UNITS_PS);
    o.setDataValid(TV(3, TV::UNITS_NS));
    EXPECT_TRUE(o.hasDataValid());
    o.clearDataValid();
    EXPECT_FALSE(o.hasDataValid());

    Tsd_BaseObj& obj = o;
    EXPECT_EQ(obj.getOffset(), &o);
    EXPECT_EQ(obj.getSpec(), &o);
    EXPECT_EQ(obj.getGroupOffset(), nullptr);
    EXPECT_EQ(obj.getNetOffset(), nullptr);
    EXPECT_EQ(obj.getEndpointSpec(), nullptr);
    EXPECT_FALSE(obj.refOwner());
    Tsd_GroupOffset go;
    EXPECT_EQ(static_cast<Tsd_BaseObj&>(go).getGroupOffset(), &go);
    EXPECT_FALSE(go.refOwner());
    Tsd_NetOffset no;
    EXPECT_EQ(static_cast<Tsd_BaseObj&>(no).getNetOffset(), &no);
    EXPECT_TRUE(no.refOwner());
}

TEST(Offset, CopiesOwnTheirValues) {
    Groups g;
    auto source = std::make_unique<Tsd_GroupOffset>();
    source->setClockPad(&g.clk);
    source->setPadGroup(&g.dataPads);
    source->setRegGroup(&g.outregs);
    source->setReferencePin(&g.clkFb);
    source->setOffsetValue(TV(2, TV::UNITS_NS));
    source->setDataValid(TV(4, TV::UNITS_NS));
    source->setIn(false);
    source->setBefore(false);
    source->setRefClockEdge(UG::EDGE_FALLING);
    source->setRegGroupEdge(UG::EDGE_RISING);
    source->setTSid("TS_OFS");
    source->setScope("top");
    Tsd_GroupOffset copy(*source);
    const Prop before = propOf(copy);
    EXPECT_EQ(before.value, "TIMEGRP:data_pads:OFFSET=OUT:2:nS:VALID:4:nS:AFTER:clk:"
                            "REFERENCE_PIN:clk_fb:TIMEGRP:outregs:LOW:RISING");
    source->setOffsetValue(TV(9, TV::UNITS_NS));
    source->setDataValid(TV(9, TV::UNITS_NS));
    source.reset();
    EXPECT_EQ(propOf(copy), before);
    EXPECT_STREQ(copy.getTSid(), "TS_OFS");
    EXPECT_STREQ(copy.getScope(), "top");

    Tsd_Offset plain;
    plain.setClockPad(&g.clk);
    plain.setOffsetValue(TV(1, TV::UNITS_NS));
    Tsd_Offset plainCopy(plain);
    plain.removeOffsetValue();
    EXPECT_EQ(plainCopy.getOffsetValue().value, 1.0);
}

TEST(NetOffset, DestroyingItDestroysTheReferencesItStillHolds) {
    int destroyed = 0;
    Tsd_TNMGroup elsewhere("elsewhere");
    auto* moved = new NamedRef("moved", &destroyed);
    {
        Tsd_NetOffset net;
        (new NamedRef("a", &destroyed))->setOwner(&net);
        (new NamedRef("b", &destroyed))->setOwner(&net);
        moved->setOwner(&net);
        moved->setOwner(&elsewhere);
    }
    EXPECT_EQ(destroyed, 2);
    EXPECT_EQ(moved->getOwner(), &elsewhere);
}

TEST(Offset, DumpGolden) {
    Groups g;
    Tsd_Offset o;
    o.setClockPad(&g.clk);
    o.setOffsetValue(TV(2, TV::UNITS_NS));
    o.setRefClockEdge(UG::EDGE_RISING);
    o.setScope("core");
    EXPECT_EQ(dumpText(o), "Tsd_Offset\n"
                           "   offset value: 2 nS\n"
                           "   BEFORE\n"
                           "   IN\n"
                           "   clock group: clk\n"
                           "   register group unset\n"
                           "   reference pin group unset\n"
                           "   data valid unset\n"
                           "   reference clock edge: Rising\n"
                           "   register group edge unset\n"
                           "   constraint scope: core\n");

    Tsd_GroupOffset go;
    go.setPadGroup(&g.dataPads);
    go.setIn(false);
    go.setBefore(false);
    go.setRegGroup(&g.outregs);
    go.setReferencePin(&g.clkFb);
    go.setDataValid(TV(1.5, TV::UNITS_NS));
    go.setRefClockEdge(UG::EDGE_TRANSLO);
    go.setRegGroupEdge(UG::EDGE_TRANSHI);
    EXPECT_EQ(dumpText(go), "Tsd_GroupOffset\n"
                            "   pad group: data_pads\n"
                            "   Tsd_Offset\n"
                            "      offset value unset\n"
                            "      AFTER\n"
                            "      OUT\n"
                            "      clock group unset\n"
                            "      register group: outregs\n"
                            "      reference pin group: clk_fb\n"
                            "      data valid: 1.5 nS\n"
                            "      reference clock edge: Transparent Low\n"
                            "      register group edge: Transparent High\n");

    Tsd_NetOffset no;
    no.setClockPad(&g.clk);
    no.setRegGroupEdge(UG::EDGE_FALLING);
    (new NamedRef("n"))->setOwner(&no);
    EXPECT_EQ(dumpText(no), "Tsd_NetOffset\n"
                            "   references:\n"
                            "      owner defined\n"
                            "   Tsd_Offset\n"
                            "      offset value unset\n"
                            "      BEFORE\n"
                            "      IN\n"
                            "      clock group: clk\n"
                            "      register group unset\n"
                            "      reference pin group unset\n"
                            "      data valid unset\n"
                            "      reference clock edge unset\n"
                            "      register group edge: Falling\n");
    Tsd_GroupOffset bare;
    const std::string head = "Tsd_GroupOffset\n   pad group unset\n   Tsd_Offset\n";
    EXPECT_EQ(dumpText(bare).substr(0, head.size()), head);
}
