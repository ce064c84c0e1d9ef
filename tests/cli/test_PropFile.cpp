// The property-file reader and writer: what each line reads as, what is
// refused with which message, and that every name is written so that it
// reads back as itself.
#include "PropFile.h"
#include "Statements.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using tsd_cli::formatPropLine;
using tsd_cli::LineStatus;
using tsd_cli::parsePropLine;
using tsd_cli::PropFields;
using tsd_cli::PropKind;
using tsd_cli::quoteWord;
using tsd_cli::valueWords;

namespace {

// A parsed line with its names unescaped.
struct Parsed {
    LineStatus status;
    PropKind kind = PropKind::Group;
    std::string element;
    std::string name;
    std::string value;
    std::string error;
};

Parsed parse(const std::string& text) {
    Parsed parsed;
    PropFields prop;
    parsed.status = parsePropLine(text, prop, parsed.error);
    parsed.kind = prop.kind;
    parsed.element = prop.element.str();
    parsed.name = prop.name.str();
    parsed.value = std::string(prop.value);
    return parsed;
}

} // namespace

TEST(PropFile, BlankAndCommentLinesAreSkipped) {
    for (const char* text : {"", "   ", "\t", "# a comment", "   # indented", "\r", "#group a = b"})
        EXPECT_EQ(parse(text).status, LineStatus::Blank) << '"' << text << '"';
}

TEST(PropFile, PropertyLines) {
    struct Case {
        const char* text;
        PropKind kind;
        const char* element;
        const char* name;
        const char* value;
    } cases[] = {
        {"group a = b c", PropKind::Group, "", "a", "b c"},
        {"group a=b", PropKind::Group, "", "a", "b"},
        {"  spec\tTS01 \t=\t FROM a TO b 1 ns  \t", PropKind::Spec, "", "TS01", "FROM a TO b 1 ns"},
        {"ref u1/q<0> TS_TNM = ffs", PropKind::Ref, "u1/q<0>", "TS_TNM", "ffs"},
        {"ref ram3 TS_TIG =", PropKind::Ref, "ram3", "TS_TIG", ""},
        {"group empty =   ", PropKind::Group, "", "empty", ""},
        // The value is everything after the first "=": '#' and '=' included.
        {"spec X = a=b # not a comment", PropKind::Spec, "", "X", "a=b # not a comment"},
        {"group \"a b\" = c", PropKind::Group, "", "a b", "c"},
        {"group \"q\\\"x\\\\y\"=c", PropKind::Group, "", "q\"x\\y", "c"},
        {"ref \"el=1\" \"TS_TNM\" = g", PropKind::Ref, "el=1", "TS_TNM", "g"},
        {"group back\\slash = c", PropKind::Group, "", "back\\slash", "c"},
        {"group a = b\r", PropKind::Group, "", "a", "b"},
        {"group #x = b", PropKind::Group, "", "#x", "b"},
        {"group grüße = b", PropKind::Group, "", "grüße", "b"},
    };
    for (const Case& c : cases) {
        Parsed parsed = parse(c.text);
        ASSERT_EQ(parsed.status, LineStatus::Property) << c.text << ": " << parsed.error;
        EXPECT_EQ(parsed.kind, c.kind) << c.text;
        EXPECT_EQ(parsed.element, c.element) << c.text;
        EXPECT_EQ(parsed.name, c.name) << c.text;
        EXPECT_EQ(parsed.value, c.value) << c.text;
    }
}

TEST(PropFile, MalformedLinesSayWhatIsWrong) {
    struct Case {
        const char* text;
        const char* error;
    } cases[] = {
        {"grup a = b", "unknown keyword \"grup\" at the start of the line (expected group, spec or "
                       "ref)"},
        {"GROUP a = b", "unknown keyword \"GROUP\""},
        {"= b", "expected group, spec or ref at the start of the line"},
        {"\"group\" a = b", "expected group, spec or ref at the start of the line"},
        {"group", "missing name after \"group\""},
        {"spec = x", "missing name after \"spec\""},
        {"ref", "missing element after \"ref\""},
        {"ref el", "missing property name after the element \"el\""},
        {"ref el = x", "missing property name after the element \"el\""},
        {"group a b", "missing \"=\" after \"a\" (found \"b\")"},
        {"group a", "missing \"=\" after \"a\""},
        {"ref a b c = d", "missing \"=\" after \"b\" (found \"c\")"},
        {"group \"a = b", "unterminated quoted name"},
        {"group \"a\\", "unterminated quoted name"},
        {"group \"a\\n\" = b", "unknown escape \"\\n\" in a quoted name"},
        {"group \"\" = b", "empty quoted name"},
        {"group \"a\"b = c", "expected a blank or \"=\" after the quoted name \"a\""},
        {"group a\"b\" = c", "unexpected '\"' in the name \"a\""},
        {"group a = b\x01", "control character 0x01 in column 12"},
        {"group a\x7f = b", "control character 0x7F in column 8"},
        {"group a = b\rc", "control character 0x0D in column 12"},
        {"group\tabcdefghij = b\x02 and more", "control character 0x02 in column 21"},
    };
    for (const Case& c : cases) {
        Parsed parsed = parse(c.text);
        EXPECT_EQ(parsed.status, LineStatus::Malformed) << c.text;
        EXPECT_EQ(parsed.error.rfind(c.error, 0), 0u)
            << c.text << "\n  got:  " << parsed.error << "\n  want: " << c.error;
    }
}

TEST(PropFile, NulInsideTheLineIsRefused) {
    Parsed parsed = parse(std::string("group a = b\0c", 13));
    EXPECT_EQ(parsed.status, LineStatus::Malformed);
    EXPECT_EQ(parsed.error, "control character 0x00 in column 12");
}

TEST(PropFile, QuoteOnlyWhatNeedsIt) {
    EXPECT_EQ(quoteWord("plain"), "plain");
    EXPECT_EQ(quoteWord("*odd"), "*odd");
    EXPECT_EQ(quoteWord("u1/q<0>"), "u1/q<0>");
    EXPECT_EQ(quoteWord("back\\slash"), "back\\slash");
    EXPECT_EQ(quoteWord("a b"), "\"a b\"");
    EXPECT_EQ(quoteWord("a=b"), "\"a=b\"");
    EXPECT_EQ(quoteWord("say \"hi\""), "\"say \\\"hi\\\"\"");
    EXPECT_EQ(quoteWord("tab\there"), "\"tab\there\"");
    EXPECT_EQ(quoteWord(""), "\"\"");
}

TEST(PropFile, EveryWrittenLineReadsBackAsItself) {
    const std::vector<std::string> words = {
        "a",     "TS01", "a b",   "a=b",      "\"",      "\\",    "\\\"", "a\"b\\c d",
        "x\\",   "#",    "=",     " lead",    "trail ",  "grüße", "a\tb", "FFS(d*)",
        "group", "ref",  "\"q\"", "'single'", "u1/q<0>", "*",     "a:b",  "==",
    };
    for (PropKind kind : {PropKind::Group, PropKind::Spec, PropKind::Ref}) {
        for (const std::string& word : words) {
            std::string line = formatPropLine(kind, word, word, "v = w");
            Parsed parsed = parse(line);
            ASSERT_EQ(parsed.status, LineStatus::Property) << line << ": " << parsed.error;
            EXPECT_EQ(parsed.kind, kind) << line;
            EXPECT_EQ(parsed.name, word) << line;
            if (kind == PropKind::Ref) {
                EXPECT_EQ(parsed.element, word) << line;
            }
            EXPECT_EQ(parsed.value, "v = w") << line;
            EXPECT_EQ(formatPropLine(kind, parsed.element, parsed.name, parsed.value), line);
        }
    }
    // A reference value is written so that it reads back as the same name.
    for (const std::string& word : words) {
        std::string scratch;
        Parsed parsed = parse(
            formatPropLine(PropKind::Ref, "e", "TS_TNM", tsd_cli::refValueText(word, scratch)));
        EXPECT_EQ(tsd_cli::refValueName(parsed.value), word) << word << ": " << parsed.error;
    }
    EXPECT_EQ(formatPropLine(PropKind::Group, "", "g", ""), "group g =");
    EXPECT_EQ(formatPropLine(PropKind::Ref, "e 1", "TS_TIG", "global"),
              "ref \"e 1\" TS_TIG = global");
}

TEST(PropFile, ValueWords) {
    using Words = std::vector<std::string>;
    EXPECT_EQ(valueWords("FROM:a:TO:b:10:nS"), (Words{"FROM", "a", "TO", "b", "10", "nS"}));
    EXPECT_EQ(valueWords("  a  b\t:c ;"), (Words{"a", "b", "c"}));
    EXPECT_EQ(valueWords("RISING:\"*odd\" 'x y:z'"), (Words{"RISING", "*odd", "x y:z"}));
    EXPECT_EQ(valueWords("TIMEGRP:pads:OFFSET=IN"), (Words{"TIMEGRP", "pads", "OFFSET", "IN"}));
    EXPECT_EQ(valueWords(""), Words{});
    EXPECT_EQ(valueWords("\"unterminated"), Words{"unterminated"});
}
