// Tying the messages of a build to property lines: by the context a stored
// property is processed under, by the names a message quotes, and with
// identical lines each getting their own messages.
#include "Diagnostics.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <sstream>
#include <string>
#include <vector>

using tsd_cli::attributeBuildMessages;
using tsd_cli::Diagnostic;
using tsd_cli::processingContext;
using tsd_cli::PropKind;
using tsd_cli::PropStore;
using tsd_cli::RawMessage;
using tsd_cli::Severity;

namespace {

struct Prop {
    PropKind kind;
    std::uint32_t line;
    const char* name;
    const char* value;
    const char* element = "";
    std::uint32_t column = 0; // as a statement file's records have them
};

// The records of "f.props".
PropStore store(const std::vector<Prop>& props) {
    PropStore store;
    store.addFile("f.props", "");
    for (const Prop& p : props) {
        tsd_cli::StoredProp record;
        record.kind = p.kind;
        record.line = p.line;
        record.column = p.column;
        record.element = store.keep(p.element);
        record.name = store.keep(p.name);
        record.value = store.keep(p.value);
        record.inArena =
            tsd_cli::StoredProp::Element | tsd_cli::StoredProp::Name | tsd_cli::StoredProp::Value;
        store.add(record);
    }
    return store;
}

RawMessage error(const std::string& text, const std::string& context = "") {
    return {MessageSeverity::Error, text + "\n", context};
}

RawMessage status(const std::string& text) {
    return {MessageSeverity::Status, text + "\n", ""};
}

// "line: text" (or "line:column: text") for each diagnostic, details indented.
std::vector<std::string> lines(const std::vector<Diagnostic>& diags) {
    std::vector<std::string> out;
    for (const Diagnostic& d : diags) {
        std::string column = d.column > 0 ? ":" + std::to_string(d.column) : "";
        out.push_back(std::to_string(d.line) + column + ": " + d.text);
        for (const std::string& detail : d.details)
            out.push_back("  " + detail);
    }
    return out;
}

using Lines = std::vector<std::string>;

} // namespace

TEST(Attribution, ContextsOfStoredLines) {
    PropStore props = store({
        {PropKind::Ref, 1, "TS_TNM", "a", "e1"},
        {PropKind::Group, 2, "g", "a"},
        {PropKind::Spec, 3, "TS01", "FROM a TO nope 1 ns"},
        {PropKind::Spec, 4, "TS02", "FROM x TO y 1 ns"},
    });
    std::string spec1 = processingContext(props, props[2]);
    std::string spec2 = processingContext(props, props[3]);
    EXPECT_EQ(spec1, "Processing TIMESPEC definition \"TS01=FROM a TO nope 1 ns\": ");
    EXPECT_EQ(processingContext(props, props[1]), "Processing TIMEGRP definition \"g=a\": ");

    auto diags =
        attributeBuildMessages(props,
                               {error(spec1 + "no nope", spec1), error(spec2 + "no x", spec2),
                                error(spec2 + "no y", spec2)},
                               "f.props");
    EXPECT_EQ(lines(diags),
              (Lines{"3: " + spec1 + "no nope", "4: " + spec2 + "no x", "4: " + spec2 + "no y"}));
    EXPECT_EQ(diags[0].file, "f.props");
    EXPECT_EQ(diags[0].severity, Severity::Error);
}

TEST(Attribution, IdenticalLinesEachGetTheirMessages) {
    PropStore props = store({
        {PropKind::Spec, 1, "TS01", "FROM a TO b 1 qq"},
        {PropKind::Spec, 2, "TS02", "FROM c TO d 1 ns"},
        {PropKind::Spec, 3, "TS01", "FROM a TO b 1 qq"},
        {PropKind::Spec, 4, "TS01", "FROM a TO b 1 qq"},
    });
    std::string ctx = processingContext(props, props[0]);
    // Line 1 reports twice with different texts, line 3 the same two, line 4
    // only the first: a repeated text moves on to the next identical line.
    auto diags =
        attributeBuildMessages(props,
                               {error("first", ctx), error("second", ctx), error("first", ctx),
                                error("second", ctx), error("first", ctx)},
                               "f.props");
    EXPECT_EQ(lines(diags), (Lines{"1: first", "1: second", "3: first", "3: second", "4: first"}));
}

TEST(Attribution, ContextlessMessagesGoToTheLineTheyQuote) {
    PropStore props = store({
        {PropKind::Ref, 1, "ts_tig", "TS88", "r1"},
        {PropKind::Ref, 2, "TS_OFFSET", "IN 2 ns BEFORE clk TIMEGRP regs", "n1"},
        {PropKind::Group, 3, "top", "\"a b\":other"},
        {PropKind::Group, 4, "loop", "loop2"},
        {PropKind::Spec, 5, "OFFSET", "IN 1 ns BEFORE other_clk"},
        {PropKind::Spec, 6, "TS05", "FROM a TO b TS77 / 2"},
        {PropKind::Ref, 7, "TS_FEEDBACK", "1 ns NET fb", "n2"},
        {PropKind::Group, 8, "odd", "'q\" was referenced in one or more TIMEGRP definitions'"},
    });
    auto diags = attributeBuildMessages(
        props,
        {
            error("A group named \"a b\" was referenced in one or more TIMEGRP definitions, but "
                  "was never defined by a TIMEGRP or TNM property."),
            error("Circular group definition encountered from user group \"loop\", as follows:"),
            status("   loop=loop2"),
            status("   loop2=loop"),
            error("Group \"regs\" is used as the register group in one or more OFFSET "
                  "specifications. This group is not defined by a TIMEGRP, TNM or TPSYNC "
                  "property."),
            error("The following spec(s) referenced the Tsd_ClkGroup \"other_clk\", but no such "
                  "TS_CLKGRP reference property was added to the builder:"),
            status("   OFFSET=IN 1000 pS BEFORE other_clk"),
            error("The following spec(s) referenced the Tsd_ClkGroup \"fb\", but no such "
                  "TS_CLKGRP reference property was added to the builder:"),
            error("Specification \"TS05\" is defined in terms of a specification with TSid "
                  "\"TS77\", which does not exist."),
            error("Specification \"TS05\" is defined in terms of a circular TSid link, as "
                  "follows:"),
            error("Delay expression for specification \"TS05\" contains a division by zero: "
                  "\"TS77 / 0\""),
            error("Specification \"TS05\" is defined in terms of specification \"TS03\", which "
                  "is an ignored path."),
            error("One or more TIG directives were specified for a specification with TSid "
                  "\"TS88\", which does not exist."),
            // The name is the longest that fits, even with the rest of the text in it.
            error("A group named \"q\" was referenced in one or more TIMEGRP definitions\" was "
                  "referenced in one or more TIMEGRP definitions, but was never defined."),
        },
        "f.props");
    std::vector<int> got;
    for (const Diagnostic& d : diags)
        got.push_back(d.line);
    EXPECT_EQ(got, (std::vector<int>{3, 4, 2, 5, 7, 6, 6, 6, 6, 1, 8}));
    EXPECT_EQ(diags[1].details, (std::vector<std::string>{"   loop=loop2", "   loop2=loop"}));
    EXPECT_EQ(diags[3].details,
              (std::vector<std::string>{"   OFFSET=IN 1000 pS BEFORE other_clk"}));
}

TEST(Attribution, ClockNetMessagesGoToEachSpecTheyList) {
    // Two and three specs on one missing clock net each; the records with
    // a column stand for statements.
    PropStore props = store({
        {PropKind::Spec, 1, "TS_IFCLK", "PERIOD IFCLK_grp 20 ns"},
        {PropKind::Spec, 2, "OFFSET", "IN 2 ns BEFORE IFCLK"},
        {PropKind::Ref, 3, "TS_OFFSET", "IN 2 ns BEFORE IFCLK", "n1"},
        {PropKind::Spec, 4, "TS20", "TIMEGRP pads OFFSET = OUT 4 ns AFTER IFCLK"},
        {PropKind::Spec, 5, "OFFSET", "IN 3 BEFORE CLK2", "", 10},
        {PropKind::Ref, 6, "TS_FEEDBACK", "1 ns NET CLK2", "fb", 12},
        {PropKind::Spec, 7, "OFFSET", "IN:3:nS:BEFORE:CLK2", "", 14},
    });
    const std::string header =
        "The following spec(s) referenced the Tsd_ClkGroup \"%\", but no such TS_CLKGRP "
        "reference property was added to the builder:";
    auto about = [&header](const std::string& clock) {
        std::string text = header;
        return text.replace(text.find('%'), 1, clock);
    };
    // The library lists the specs in its own order and with its own units:
    // each goes to the record it stands for, the same shape to the first
    // free one, a time without a unit by its words alone.
    auto diags = attributeBuildMessages(
        props,
        {error(about("IFCLK")), status("   OFFSET=IN 2000 pS BEFORE IFCLK"),
         status("   TIMEGRP pads OFFSET=OUT 4000 pS AFTER IFCLK"),
         status("   OFFSET=IN 2000 pS BEFORE IFCLK"), error(about("CLK2")),
         status("   FEEDBACK=1000 pS NET CLK2"), status("   OFFSET=IN 3000 pS BEFORE CLK2"),
         status("   OFFSET=IN 3000 pS BEFORE CLK2")},
        "f.props");
    EXPECT_EQ(lines(diags), (Lines{
                                "2: " + about("IFCLK"),
                                "     OFFSET=IN 2000 pS BEFORE IFCLK",
                                "4: " + about("IFCLK"),
                                "     TIMEGRP pads OFFSET=OUT 4000 pS AFTER IFCLK",
                                "3: " + about("IFCLK"),
                                "     OFFSET=IN 2000 pS BEFORE IFCLK",
                                "6:12: " + about("CLK2"),
                                "     FEEDBACK=1000 pS NET CLK2",
                                "7:14: " + about("CLK2"),
                                "     OFFSET=IN 3000 pS BEFORE CLK2",
                                "5:10: " + about("CLK2"),
                                "     OFFSET=IN 3000 pS BEFORE CLK2",
                            }));
}

TEST(Attribution, WhatCannotBeTiedToALineNamesTheFile) {
    PropStore props = store({{PropKind::Group, 1, "g", "a"}});
    auto diags = attributeBuildMessages(
        props,
        {error("A group named \"zz\" was referenced in one or more TIMEGRP definitions, but was "
               "never defined by a TIMEGRP or TNM property."),
         {MessageSeverity::InternalError, "something odd\n", ""},
         status("A status line that stands alone")},
        "f.props");
    ASSERT_EQ(diags.size(), 3u);
    for (const Diagnostic& d : diags) {
        EXPECT_EQ(d.file, "f.props");
        EXPECT_EQ(d.line, 0);
    }
    EXPECT_EQ(diags[1].severity, Severity::InternalError);
    EXPECT_EQ(diags[2].severity, Severity::Note);
    EXPECT_EQ(diags[2].text, "A status line that stands alone");
}

TEST(Attribution, PrintedFormKeepsTheCaretUnderItsCharacter) {
    Diagnostic diag;
    diag.file = "f.props";
    diag.line = 7;
    diag.text = "ctx: Encountered bad token \"qq\" in TIMESPEC:\nTS02=FROM a TO b 1 qq\n"
                "                   ^";
    diag.details = {"   detail"};
    std::ostringstream out;
    tsd_cli::printDiagnostic(out, diag);
    std::string text = out.str();
    EXPECT_EQ(text, "f.props:7: error: ctx: Encountered bad token \"qq\" in TIMESPEC:\n"
                    "   TS02=FROM a TO b 1 qq\n"
                    "                      ^\n"
                    "   detail\n");
    std::size_t echo = text.find("TS02");
    std::size_t caret = text.find('^');
    std::size_t echoColumn = echo - text.rfind('\n', echo) - 1;
    std::size_t caretColumn = caret - text.rfind('\n', caret) - 1;
    EXPECT_EQ(caretColumn - echoColumn, std::string("TS02=FROM a TO b 1 ").size());

    diag.file.clear();
    diag.line = 0;
    diag.text = "x";
    diag.details.clear();
    std::ostringstream bare;
    tsd_cli::printDiagnostic(bare, diag);
    EXPECT_EQ(bare.str(), "tsd: error: x\n");
}
