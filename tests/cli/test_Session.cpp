// A session end to end in the process: reading, handing over, building,
// withdrawing references, and what a fatal library message leaves behind.
#include "Hints.h"
#include "Session.h"

#include <gtest/gtest.h>

#include <iostream>
#include <string>
#include <vector>

using tsd_cli::Diagnostic;
using tsd_cli::InputFile;
using tsd_cli::Session;
using tsd_cli::Severity;

namespace {

InputFile text(const std::string& name, const std::string& body) {
    InputFile input;
    input.path = name;
    input.displayName = name;
    input.text = body;
    return input;
}

std::vector<std::string> where(const Session& session) {
    std::vector<std::string> out;
    for (const Diagnostic& d : session.diagnostics())
        out.push_back(d.file + ":" + std::to_string(d.line) + ": " + d.text);
    return out;
}

using Lines = std::vector<std::string>;

// Each diagnostic as printed, details included, without the file name.
Lines said(const Session& session) {
    Lines out;
    for (const Diagnostic& diag : session.diagnostics()) {
        std::string printed;
        tsd_cli::appendDiagnostic(printed, diag);
        out.push_back(printed.substr(printed.find(':') + 1));
    }
    return out;
}

const char* kSmallDesign = "ref ff1 TS_TNM = regs\n"
                           "ref ff2 TS_TNM = regs\n"
                           "ref pad TS_TNM = pads\n"
                           "ref ram_we TS_TIG = TS02\n"
                           "group all = regs pads\n"
                           "spec TS01 = PERIOD all 10 ns\n"
                           "spec TS02 = FROM pads TO regs TS01 / 2\n";

} // namespace

TEST(Session, BuildsAndKeepsOneRecordPerRefLine) {
    Session session;
    session.load({text("a.props", std::string(kSmallDesign) + "ref ff1 TS_TNM = more\n")});
    ASSERT_TRUE(session.build()) << testing::PrintToString(where(session));
    EXPECT_EQ(session.countOf(tsd_cli::PropKind::Ref), 5);
    ASSERT_EQ(session.store().size(), 8u);
    for (std::size_t i : {0, 1, 2, 3, 7})
        EXPECT_NE(session.refOf(i), nullptr) << i;
    EXPECT_EQ(session.refOf(4), nullptr);
    EXPECT_EQ(session.refOf(1)->element(), "ff2");
    // Two records of one TNM group stand for different elements; records of
    // one element in different groups for the same.
    EXPECT_FALSE(session.refOf(0)->isEqual(session.refOf(1)));
    EXPECT_TRUE(session.refOf(0)->isEqual(session.refOf(7)));
    // An object walks to its records in input order.
    Tsd_Group* regs = session.design().findGroupByUserName("regs", false);
    EXPECT_EQ(session.recordsOwnedBy(regs), (std::vector<std::size_t>{0, 1}));
}

TEST(Session, WithdrawTakesEveryRecordOfTheElementOnce) {
    Session session;
    session.load({text("a.props", std::string(kSmallDesign) + "ref ff1 TS_TNM = more\n")});
    ASSERT_TRUE(session.build());
    EXPECT_EQ(session.withdraw({"ff1", "nothing", "ff1"}), (std::vector<int>{2, 0, 0}));
    EXPECT_EQ(session.withdraw({"ff1"}), std::vector<int>{0});
    EXPECT_EQ(session.refOf(0), nullptr);
    EXPECT_NE(session.refOf(1), nullptr);

    std::vector<std::string> trashed;
    session.design().onTrashed = [&](Tsd_BaseObj* obj, Tsd_Design::TrimReason) {
        trashed.push_back(obj->getGroup() != nullptr ? obj->getGroup()->getName() : "?");
    };
    EXPECT_TRUE(session.design().trim());
    EXPECT_EQ(trashed, Lines{"more"});
}

TEST(Session, MessagesGoToTheirLinesInFileOrder) {
    Session session;
    session.load({text("a.props", "group g = regs nowhere\n"
                                  "spec TS01 = FROM regs TO nope 1 ns\n"
                                  "spec TS02 = DROP_SPEC\n"
                                  "ref x TS_PERIOD = 10 furlongs\n"
                                  "ref y TS_TNM = regs\n"
                                  "spec PERIOD = x\n"
                                  "ref z TS_BOGUS = x\n"
                                  "junk\n"),
                  text("b.props", "ref q TS_TPSYNC = regs\n")});
    EXPECT_FALSE(session.build());
    EXPECT_EQ(where(session),
              (Lines{
                  "a.props:1: A group named \"nowhere\" was referenced in one or more TIMEGRP "
                  "definitions, but was never defined by a TIMEGRP or TNM property.",
                  "a.props:2: Processing TIMESPEC definition \"TS01=FROM regs TO nope 1 ns\": No "
                  "TNM, TPSYNC or user group named \"nope\" is defined.",
                  "a.props:3: DROP_SPEC is not supported in property files: leave out the "
                  "definition of \"TS02\" instead",
                  "a.props:4: Encountered bad token \"furlongs\" in specification.",
                  "a.props:6: \"PERIOD\" is not a specification name: use a TSid (TS...), OFFSET, "
                  "ENABLE, DISABLE or TIMEGRP...",
                  "a.props:7: \"TS_BOGUS\" is not a reference property: use TS_TNM, TS_TPTHRU, "
                  "TS_TPSYNC, TS_TIG, TS_CLKGRP, TS_OFFSET, TS_PERIOD, TS_MAXDELAY, TS_MAXSKEW or "
                  "TS_FEEDBACK",
                  "a.props:8: unknown keyword \"junk\" at the start of the line (expected group, "
                  "spec or ref)",
                  "b.props:1: The identifier \"regs\" is used for both a TPSYNC group and a TNM "
                  "group. Group identifiers must be unique.",
              }));
    EXPECT_EQ(session.errorCount(), 8);
    EXPECT_EQ(session.displayFile(), "");
    EXPECT_EQ(session.fileNames(), (Lines{"a.props", "b.props"}));
    // The refused records were never owned; the session freed them.
    EXPECT_EQ(session.store().size(), 8u);
    EXPECT_EQ(session.refOf(3), nullptr);
    EXPECT_NE(session.refOf(4), nullptr);
}

TEST(Session, AFailedBuildLeavesTheDesignToTheSession) {
    Session session;
    session.load({text("a.props", "ref ff1 TS_TNM = regs\ngroup g = regs missing\n")});
    EXPECT_FALSE(session.build());
    EXPECT_FALSE(session.built());
    // The design and its records are still there to look at.
    EXPECT_NE(session.design().findGroupByUserName("regs", false), nullptr);
    EXPECT_EQ(session.refOf(0)->getOwner(), session.design().findGroupByUserName("regs", false));
}

TEST(Session, UnreadableInputsAreIoErrors) {
    EXPECT_THROW(tsd_cli::readInput("/nonexistent/x.props"), tsd_cli::IoError);
    EXPECT_THROW(tsd_cli::readInput("/"), tsd_cli::IoError);
    Session session;
    EXPECT_THROW(session.load(std::vector<std::string>{"/nonexistent/x.props"}), tsd_cli::IoError);
    EXPECT_EQ(session.store().size(), 0u);
}

using SessionDeathTest = testing::Test;

TEST(SessionDeathTest, AFatalMessageIsPrintedAtItsLineAndEndsTheRunWithItsCode) {
    EXPECT_EXIT(
        {
            Session session;
            session.load({text("a.props", "group g = regs\n")});
            session.build();
            // A library misuse that only a program can make: the message goes
            // through the session's sink, then the library ends the process.
            Tsd_Annotator annotator(nullptr);
        },
        testing::ExitedWithCode(2),
        "a.props:1: error: A group named \"regs\".*\n"
        "a.props: fatal error: NULL design in Tsd_Annotator.");
}

TEST(SessionDeathTest, TheFatalHandlerRunsBeforeTheEnd) {
    EXPECT_EXIT(
        {
            Session session;
            session.setFatalHandler([&session] {
                std::cerr << "handler saw " << session.diagnostics().size() << " diagnostic(s)\n";
            });
            session.load({text("a.props", "group g = a\n")});
            Tsd_Annotator annotator(nullptr);
        },
        testing::ExitedWithCode(2), "handler saw 1 diagnostic\\(s\\)");
}

// What the tool supplies in place of the netlist and the architecture, for
// what only the session's interface reaches: nets that another reader names
// as nets of the design, files that are not property files, and the order
// in which references come; and the hint index against the plain search.
TEST(Session, SuppliesWhatTheNetlistDefines) {
    struct Case {
        const char* what;
        const char* props;
        Lines designNets;
        bool assume;
        Lines said; // each the beginning of a diagnostic
    } cases[] = {
        {"nets of the design clock offsets and feedbacks",
         "spec OFFSET = IN 2 ns BEFORE ifclk\nref fb TS_FEEDBACK = 1 ns NET fbclk\n",
         {"ifclk", "fbclk"},
         false,
         {}},
        {"other nets stay errors",
         "spec OFFSET = IN 2 ns BEFORE ifclk\nref fb TS_FEEDBACK = 1 ns NET fbclk\n",
         {"ifclk"},
         false,
         {"2: error: The following spec(s) referenced the Tsd_ClkGroup \"fbclk\""}},
        {"a clock record after the offset that names the net defines it",
         "ref n1 TS_OFFSET = IN 2 ns BEFORE c\nref cb TS_CLKGRP = c\n",
         {},
         true,
         {}},
        {"a TNM record after the net offset that names it defines the group",
         "ref n1 TS_OFFSET = IN 2 ns BEFORE c TIMEGRP FFS\nref cb TS_CLKGRP = c\n"
         "ref x TS_TNM = FFS\nref y TS_TNM = other\n",
         {},
         true,
         {}},
        {"a later definition wins over the netlist and the architecture",
         "group a = b FFS\ngroup b = c\ngroup FFS = d\nref d1 TS_TNM = d\n"
         "spec TS01 = FROM a TO RAMS 1 ns\n",
         {},
         true,
         {"2: note: \"c\" is taken as a group of the netlist"}},
        {"a word that is no link leaves no specification behind",
         "spec ENABLE = TS_x\nspec TS01 = FROM TS_a TO TS_b 1 ns\n",
         {},
         true,
         {"2: note: \"TS_a\" is taken as a group of the netlist",
          "2: note: \"TS_b\" is taken as a group of the netlist"}},
        {"a property file alone is not told of the option",
         "spec TS01 = TO a 1 ns\n",
         {},
         false,
         {"1: error: Processing TIMESPEC definition \"TS01=TO a 1 ns\": No TNM, TPSYNC or user "
          "group named \"a\" is defined.\n"}},
    };
    for (const Case& c : cases) {
        Session session;
        for (const std::string& net : c.designNets)
            session.addDesignNet(net);
        session.setAssumeNetlist(c.assume);
        session.load({text("a.props", c.props)});
        session.build();
        Lines got = said(session);
        ASSERT_EQ(got.size(), c.said.size()) << c.what << "\n" << testing::PrintToString(got);
        for (std::size_t i = 0; i < got.size(); ++i)
            EXPECT_EQ(got[i].rfind(c.said[i], 0), 0u) << c.what << "\n" << got[i];
    }
}

TEST(Session, WhatStandsInForTheNetlistAfterTheBuild) {
    Session session;
    session.setAssumeNetlist(true);
    session.load({text("a.props", "ref n1 TS_OFFSET = IN 2 ns BEFORE c TIMEGRP FFS\n"
                                  "ref cb TS_CLKGRP = c\nref x TS_TNM = FFS\n"
                                  "spec ENABLE = TS_x\n")});
    ASSERT_TRUE(session.build());
    Tsd_Design& design = session.design();
    // The records took the clock group and the register group over.
    Tsd_ClkGroup* clock = design.findClockGroupByNetName("c", false);
    ASSERT_NE(clock, nullptr);
    EXPECT_EQ(session.recordsOwnedBy(clock), std::vector<std::size_t>{1});
    Tsd_BaseObjListIter offsets(design.getOffsetSpecList());
    Tsd_Offset* offset = offsets.next()->getOffset();
    ASSERT_NE(offset->getRegGroup(), nullptr);
    EXPECT_NE(offset->getRegGroup()->getTNMGroup(), nullptr);
    EXPECT_EQ(design.findEndpointSpecByTSid("TS_x", false), nullptr);
    EXPECT_EQ(session.assumedCount(), 0);
}

TEST(Session, AFileWithoutReferenceRecordsIsToldOfTheOption) {
    for (bool assume : {false, true}) {
        Session session;
        session.setAssumeNetlist(assume);
        std::uint32_t file = session.addFile(text("a.stmts", "TIMESPEC TS01 = FROM a TO b 1 ns;"));
        for (const char* name : {"TS01", "TS02"}) {
            tsd_cli::StoredProp record;
            record.kind = tsd_cli::PropKind::Spec;
            record.file = file;
            record.line = 1;
            record.name = session.store().keep(name);
            record.value = session.store().keep(name[3] == '1' ? "TO a 1 ns" : "TO b 2 ns");
            record.inArena = tsd_cli::StoredProp::Name | tsd_cli::StoredProp::Value;
            session.add(record);
        }
        session.build();
        Lines got = said(session);
        if (assume) {
            EXPECT_EQ(got, (Lines{"1: note: \"a\" is taken as a group of the netlist\n",
                                  "1: note: \"b\" is taken as a group of the netlist\n"}));
            EXPECT_EQ(session.assumedCount(), 2);
            continue;
        }
        ASSERT_EQ(got.size(), 2u) << testing::PrintToString(got);
        const char* option = "   (with --assume-netlist, names that the files use but never "
                             "define are taken as defined by the netlist)\n";
        EXPECT_NE(got[0].find(option), std::string::npos) << got[0];
        EXPECT_EQ(got[1].find(option), std::string::npos) << got[1];
    }
}

TEST(Session, IndexedHintsAgreeWithTheFullSearch) {
    const std::vector<std::string> defined = {"clk_grp", "CLK_GRP2", "data_ffs", "TS01",
                                              "TS02",    "ab",       "a",        "abcdefgh"};
    tsd_cli::NameHints hints(defined);
    for (const char* name : {"Clk_Grp", "clk_gpr", "clk_grp3", "dta_fs", "dat_", "TS03", "ac", "xy",
                             "clk_grp", "b", "abcdefghij", "abcdef", "ts01", "A"})
        EXPECT_EQ(hints.closest(name), tsd_cli::closestName(name, defined)) << name;
    // Past its budget an index gives only hints of the same letters in
    // another case.
    tsd_cli::NameHints tight(defined, 3);
    EXPECT_EQ(tight.closest("TS03").value_or(""), "TS01"); // two comparisons
    EXPECT_EQ(tight.closest("clk_gpr").value_or(""), "clk_grp");
    EXPECT_EQ(tight.closest("dta_fs").value_or(""), "");
    EXPECT_EQ(tight.didYouMean("Clk_Grp"), "did you mean \"clk_grp\"?");
}
