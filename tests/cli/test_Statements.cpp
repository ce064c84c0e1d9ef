// Statement files: what each form reads as, what is refused where, what the
// writer keeps, replaces and removes, the conversions to and from property
// lines, the name hints and the telling of the two file formats apart. The
// files under statements/ and examples/ are compared with golden outputs
// (TSD_UPDATE_GOLDEN=1 rewrites them).
#include "Hints.h"
#include "Statements.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

using namespace tsd_cli;

namespace {

std::string readFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    EXPECT_TRUE(in) << path;
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

void expectGolden(const std::string& name, const std::string& actual) {
    std::string path = std::string(TSD_STATEMENT_GOLDEN_DIR) + "/" + name;
    if (std::getenv("TSD_UPDATE_GOLDEN") != nullptr) {
        std::ofstream(path, std::ios::binary) << actual;
        return;
    }
    EXPECT_EQ(actual, readFile(path)) << name;
}

std::string pos(TextPos where) {
    return std::to_string(where.line) + ":" + std::to_string(where.column);
}

std::string propLine(const PropRecord& prop) {
    return formatPropLine(prop.kind, prop.element, prop.name, prop.value);
}

std::string records(const StatementFile& file) {
    std::string text;
    for (const StatementRecord& record : file.records)
        text += (text.empty() ? "" : "\n") + propLine(record.prop);
    return text;
}

// Records with their places, errors, and the nets.
std::string describe(const StatementFile& file) {
    std::string text;
    for (const StatementRecord& record : file.records) {
        text += pos(record.where) + " " + pos(record.valueWhere) + " " + propLine(record.prop);
        text += record.qualifier.empty() ? "\n" : "   [qualifier " + record.qualifier + "]\n";
    }
    for (const StatementError& error : file.errors)
        text += "error " + pos(error.where) + " " + error.text + "\n";
    text += "nets:";
    for (const std::string& net : file.nets)
        text += " " + net;
    return text + "\n";
}

std::vector<RecordOutput> ownValues(const StatementFile& file) {
    std::vector<RecordOutput> outputs;
    for (const StatementRecord& record : file.records)
        outputs.push_back(RecordOutput::canonical(record.prop.value));
    return outputs;
}

// As the library writes values: every run of blanks outside quotes a colon.
std::vector<RecordOutput> colonValues(const StatementFile& file) {
    std::vector<RecordOutput> outputs;
    for (const StatementRecord& record : file.records) {
        std::string value;
        char quote = 0;
        for (char c : record.prop.value) {
            if (quote == 0 && c == ' ' && record.form != ValueForm::Name) {
                if (value.empty() || value.back() != ':')
                    value += ':';
                continue;
            }
            if (c == '"')
                quote = quote == 0 ? c : 0;
            value += c;
        }
        outputs.push_back(RecordOutput::canonical(value));
    }
    return outputs;
}

std::string crlf(const std::string& text) {
    std::string out;
    for (char c : text)
        out += c == '\n' ? std::string("\r\n") : std::string(1, c);
    return out;
}

// Written with `outputs`, read again and written with the same values: the
// same bytes.
std::string writeFixpoint(const std::string& text, const std::vector<RecordOutput>& outputs) {
    StatementFile file = readStatements(text);
    std::string written = writeStatements(text, file, outputs);
    StatementFile again = readStatements(written);
    std::vector<RecordOutput> kept;
    for (const RecordOutput& output : outputs)
        if (output.keep)
            kept.push_back(output);
    EXPECT_EQ(again.records.size(), kept.size());
    if (again.records.size() == kept.size()) {
        EXPECT_EQ(writeStatements(written, again, kept), written);
    }
    return written;
}

} // namespace

TEST(Statements, EveryFormReadsAsItsRecords) {
    struct Case {
        const char* text;
        const char* records;
    } cases[] = {
        {"TIMESPEC \"TS01\" = PERIOD \"clk\" 10 ns HIGH 50%;",
         "spec TS01 = PERIOD \"clk\" 10 ns HIGH 50%"},
        {"timespec ts02=FROM:a:TO:b:5:nS;", "spec ts02 = FROM:a:TO:b:5:nS"},
        {"TIMEGRP g = a b EXCEPT c;\nTIMEGRP e = ;", "group g = a b EXCEPT c\ngroup e ="},
        {"TIMEGRP \"pads\" OFFSET = IN 2 ns BEFORE clk;",
         "spec TS_GROUP_BASED_OFFSET = TIMEGRP:\"pads\":OFFSET=IN 2 ns BEFORE clk"},
        {"TIMESPEC TS20 = TIMEGRP p OFFSET = OUT 4 ns AFTER c;",
         "spec TS20 = TIMEGRP p OFFSET = OUT 4 ns AFTER c"},
        {"offset = IN 1 BEFORE c; Enable = arc; DISABLE =;",
         "spec offset = IN 1 BEFORE c\nspec Enable = arc\nspec DISABLE ="},
        // Statements span lines; comments and line ends inside a value read as one blank.
        {"TIMESPEC TS01 = FROM a # one\n  // two\n\tTO  b\r\n 1 ns;",
         "spec TS01 = FROM a TO  b 1 ns"},
        {"NET clk TNM_NET = g;", "ref clk TS_TNM = g"},
        {"net \"u_core/regs<3>\" tnm_net = \"my group\";", "ref u_core/regs<3> TS_TNM = my group"},
        {"INST a TNM = FFS \"f\"; INST b TNM = FFS(*) : r; INST c TNM = RAMS:m; INST d TNM = FFS "
         "(x*):g;",
         "ref a TS_TNM = f\nref b TS_TNM = r\nref c TS_TNM = m\nref d TS_TNM = g"},
        {"INST e TNM = FFS(dbg*);", "ref e TS_TNM = FFS(dbg*)"},
        {"PIN p TPTHRU = t | TPSYNC = s;", "ref p TS_TPTHRU = t\nref p TS_TPSYNC = s"},
        {"NET a TIG; NET b TIG = TS01,TS02 TS03;",
         "ref a TS_TIG =\nref b TS_TIG = TS01\nref b TS_TIG = TS02\nref b TS_TIG = TS03"},
        {"NET n PERIOD = 10 ns | OFFSET = IN 1 BEFORE c | MAXDELAY = 2 | MAXSKEW = 1 | FEEDBACK = "
         "1 ns NET f;",
         "ref n TS_PERIOD = 10 ns\nref n TS_OFFSET = IN 1 BEFORE c\nref n TS_MAXDELAY = 2\n"
         "ref n TS_MAXSKEW = 1\nref n TS_FEEDBACK = 1 ns NET f"},
        {"NET b TS_CLKGRP = clk;", "ref b TS_CLKGRP = clk"},
        // Other statements and attributes are kept but hand over nothing.
        {"NET a LOC = P1 | KEEP | TNM = g | IOSTANDARD = X; CONFIG TIG = x; INST \"TNM\" LOC = y;",
         "ref a TS_TNM = g"},
        {"AREA_GROUP \"TIMESPEC\" RANGE = a:b; \"NET\" a TNM = g;", ""},
        // '#' and "//" start comments outside quotes only; a BOM is no part of the text.
        {"\xEF\xBB\xBFNET \"a#b//c\" TNM = 'x;y'; # NET c TNM = d;", "ref a#b//c TS_TNM = x;y"},
        // A line that begins with NET inside a FEEDBACK value is no new statement.
        {"NET f FEEDBACK = 1 ns\nNET clkfb;", "ref f TS_FEEDBACK = 1 ns NET clkfb"},
    };
    for (const Case& c : cases) {
        StatementFile file = readStatements(c.text);
        EXPECT_EQ(records(file), c.records) << c.text;
        EXPECT_TRUE(file.errors.empty()) << c.text << ": " << describe(file);
    }
}

TEST(Statements, MalformedStatementsSayWhereAndReadingGoesOn) {
    struct Case {
        const char* text;
        const char* errors;
        std::size_t records;
    } cases[] = {
        {"TIMESPEC = x; NET a TNM = g;", "1:10 missing the TSid after TIMESPEC", 1},
        {"TIMEGRP \"\" = z;", "1:9 empty quoted name", 0},
        {"OFFSET IN 2 ns BEFORE c;", "1:8 missing \"=\" after OFFSET (found \"IN\")", 0},
        {"TIMEGRP a OFFSET IN 1;", "1:18 missing \"=\" after OFFSET after \"a\" (found \"IN\")", 0},
        {"NET;\nNET a TPTHRU = t u | TNM = g;",
         "1:4 missing the element name after NET\n2:16 the value of \"TPTHRU\" must be one name",
         1},
        {"NET a TNM = FFS:; NET b TNM = x y z; NET c TIG = ;",
         "1:17 the value of \"TNM\" ends without its group name\n"
         "1:31 the value of \"TNM\" must be a group name, after at most one qualifier such as "
         "FFS(*)\n"
         "1:49 attribute \"TIG\" without its value",
         0},
        {"NET a TIG TS01;\nNET b TIG = TS01 = TS02;",
         "1:11 missing \"=\" after \"TIG\" (found \"TS01\")\n2:18 unexpected \"=\" in the value of "
         "\"TIG\" "
         "(is a \"|\" missing between two attributes?)",
         0},
        // In a list, a name that opens a single quote closes it in its word
        // (a double quote must close on its line, as anywhere).
        {"NET a TIG = T1,'T2 T3 | TNM = g;",
         "1:16 unterminated quote: a name of the list opens a quote that its word does not "
         "close",
         3},
        // The quote ends its statement with its line; the next line reads.
        {"NET \"a TNM = g; NET b TNM = h;\nNET c TNM = i;",
         "1:5 unterminated quote: a quoted name must end on the line it begins on", 1},
        {"TIMEGRP a = b\nTIMEGRP c = d;\nNET e TNM = f",
         "1:14 missing \";\" at the end of the statement (a new statement begins on line 2)\n"
         "3:14 missing \";\" at the end of the statement",
         3},
    };
    for (const Case& c : cases) {
        StatementFile file = readStatements(c.text);
        std::string errors;
        for (const StatementError& error : file.errors)
            errors += (errors.empty() ? "" : "\n") + pos(error.where) + " " + error.text;
        EXPECT_EQ(errors, c.errors) << c.text;
        EXPECT_EQ(file.records.size(), c.records) << c.text;
    }
}

TEST(Statements, WriterKeepsReplacesAndRemoves) {
    // One letter per record: k keeps it as it is, d drops it, r replaces it
    // with "R" (a name) or "R R" (constraint text).
    struct Case {
        const char* text;
        const char* outputs;
        const char* written;
    } cases[] = {
        {"NET a TNM = g | LOC = P1;", "d", "NET a LOC = P1;"},
        {"NET a LOC = P1 | TNM = g;", "d", "NET a LOC = P1;"},
        {"NET a LOC = P1 |\n  TNM = g | TIG | KEEP;", "dd", "NET a LOC = P1 | KEEP;"},
        {"NET a TIG = T1, T2,\n  T3;", "kdd", "NET a TIG = T1;"},
        {"NET a TIG = T1, T2, T3;", "dkr", "NET a TIG = T2, R;"},
        // A name ending in "/" does not run into a comment after a dropped one.
        {"NET a TIG = /, T// c\n;", "kd", "NET a TIG = / // c\n;"},
        {"NET a TIG = / | TNM = g# c\n;", "kd", "NET a TIG = / # c\n;"},
        // A name that comes to the start of a line does not begin a statement.
        {"INST a TIG =\n  T1 INST b c;", "dkkk", "INST a TIG =\n  \"INST\" b c;"},
        {"INST a TIG =\n  T1 Inst b c;", "dkrk", "INST a TIG =\n  \"Inst\" R c;"},
        {"INST a TIG = T1 INST b c;", "dkkk", "INST a TIG = INST b c;"},
        // A quoted name of a list keeps its quotes wherever it moves.
        {"NET a TIG = T1,'T2' T3,'T,4';", "dkdk", "NET a TIG = 'T2','T,4';"},
        {"NET a TIG | TNM = \"g\";", "rk", "NET a TIG = R | TNM = \"g\";"},
        // Whole statements take their line, a trailing comment and line end.
        {"# top\n  NET a TNM = g; # a\nNET b TNM = h;\n", "dk", "# top\nNET b TNM = h;\n"},
        {"X; NET a TNM = g;  # a\nY;", "d", "X;  # a\nY;"},
        {"NET a TNM = g; NET b TNM = h;", "dk", "NET b TNM = h;"},
        {"NET a TNM = g;\rB;", "d", "\rB;"}, // a lone carriage return ends no line
        {"TIMESPEC T = FROM a\n  # own line\n  TO b 1; # t\nY;", "d", "  # own line\nY;"},
        // A file without a final line end keeps lacking one.
        {"A;\r\nNET a TNM = g;", "d", "A;"},
        // Comments inside a replaced value follow it.
        {"TIMESPEC T = FROM a # c\r\n  TO b 1;", "r", "TIMESPEC T = R R # c\r\n;"},
        {"TIMEGRP p OFFSET = IN 1 # c\n BEFORE k;", "r", "TIMEGRP p OFFSET = R R # c\n;"},
        {"DISABLE = ;", "r", "DISABLE = R R;"},
        {"NET a TNM = \"x y\" | TPTHRU = \"t\";", "rk", "NET a TNM = R | TPTHRU = \"t\";"},
    };
    for (const Case& c : cases) {
        StatementFile file = readStatements(c.text);
        ASSERT_EQ(file.records.size(), std::string(c.outputs).size()) << c.text;
        std::vector<RecordOutput> outputs;
        for (std::size_t i = 0; i < file.records.size(); ++i) {
            const StatementRecord& record = file.records[i];
            char action = c.outputs[i];
            if (record.form == ValueForm::OffsetBody && action == 'r')
                outputs.push_back(RecordOutput::canonical("TIMEGRP:p:OFFSET=R R"));
            else if (action == 'r')
                outputs.push_back(
                    RecordOutput::canonical(record.form == ValueForm::Constraint ? "R R" : "R"));
            else
                outputs.push_back(action == 'd' ? RecordOutput::drop()
                                                : RecordOutput::canonical(record.prop.value));
        }
        EXPECT_EQ(writeFixpoint(c.text, outputs), c.written) << c.text;
    }
}

TEST(Statements, CanonicalValuesThatWouldNotReadBack) {
    StatementRecord constraint;
    StatementRecord name;
    name.form = ValueForm::Name;
    std::string out;
    struct Case {
        const StatementRecord& record;
        const char* canonical;
        const char* written; // nullptr: cannot be written
    } cases[] = {
        {constraint, "FROM:a#b:TO:c//d:1:nS", "FROM:\"a#b\":TO:\"c//d\":1:nS"},
        {constraint, "FROM:FFS(x;y):TO:'p|q':1", "FROM:FFS(\"x;y\"):TO:'p|q':1"},
        {constraint, "FROM:\"a\"#:TO:b", nullptr},
        {constraint, "FROM:\"a:TO:b", nullptr},
        {name, "a b", "\"a b\""},
        {name, "x\"y", "'x\"y'"},
        {name, "x\"'y", nullptr},
        {name, "", nullptr},
    };
    for (const Case& c : cases) {
        bool ok = renderValue(c.record, c.canonical, out);
        EXPECT_EQ(ok, c.written != nullptr) << c.canonical;
        if (ok && c.written != nullptr) {
            EXPECT_EQ(out, c.written) << c.canonical;
        }
    }
}

TEST(Statements, GoldenFiles) {
    std::string mixed = readFile(std::string(TSD_STATEMENT_GOLDEN_DIR) + "/mixed.stmts");
    StatementFile file = readStatements(mixed);
    expectGolden("mixed.read.golden", describe(file));
    std::string colons = writeFixpoint(mixed, colonValues(file));
    expectGolden("mixed.colons.golden", colons);
    std::vector<RecordOutput> dropOld = ownValues(file);
    for (std::size_t i = 0; i < file.records.size(); ++i) {
        const PropRecord& prop = file.records[i].prop;
        if ((prop.element + prop.name + prop.value).find("old") != std::string::npos)
            dropOld[i] = RecordOutput::drop();
    }
    expectGolden("mixed.dropped.golden", writeFixpoint(mixed, dropOld));

    // Line ends and a missing final one survive, byte for byte.
    for (const std::string& text : {crlf(mixed), mixed.substr(0, mixed.size() - 1)}) {
        StatementFile variant = readStatements(text);
        EXPECT_EQ(writeStatements(text, variant, ownValues(variant)), text);
    }
    std::string crlfColons = crlf(colons);
    crlfColons.pop_back();
    crlfColons.pop_back();
    std::string crlfMixed = crlf(mixed);
    crlfMixed.resize(crlfMixed.size() - 2);
    EXPECT_EQ(writeFixpoint(crlfMixed, colonValues(readStatements(crlfMixed))), crlfColons);

    std::string errors = readFile(std::string(TSD_EXAMPLES_DIR) + "/board_errors.stmts");
    expectGolden("board_errors.read.golden", describe(readStatements(errors)));
}

TEST(Statements, BoardExampleReadsCleanAndIsAFixpoint) {
    std::string board = readFile(std::string(TSD_EXAMPLES_DIR) + "/board.stmts");
    StatementFile file = readStatements(board);
    EXPECT_TRUE(file.errors.empty()) << describe(file);
    EXPECT_GE(file.statements.size(), 200u);
    EXPECT_EQ(writeStatements(board, file, ownValues(file)), board);
    writeFixpoint(board, colonValues(file));
}

TEST(Statements, ConversionsRoundTrip) {
    // Property lines -> statements -> the same property lines.
    std::string demo = readFile(std::string(TSD_CLI_EXPECTED_DIR) + "/demo.fmt.golden");
    std::istringstream lines(demo);
    std::string line;
    std::string statements;
    std::string props;
    while (std::getline(lines, line)) {
        PropFields parsed;
        std::string error;
        if (parsePropLine(line, parsed, error) != LineStatus::Property)
            continue;
        std::string statement;
        ASSERT_TRUE(propToStatement(
            {parsed.kind, parsed.element.str(), parsed.name.str(), std::string(parsed.value)},
            statement, error))
            << line << ": " << error;
        statements += statement + "\n";
        props += line + "\n";
    }
    EXPECT_EQ(statementsToProps(readStatements(statements)), props);

    // Statements -> property lines -> statements: the same records.
    std::string mixed = readFile(std::string(TSD_STATEMENT_GOLDEN_DIR) + "/mixed.stmts");
    StatementFile file = readStatements(mixed);
    std::istringstream propLines(statementsToProps(file));
    std::string back;
    while (std::getline(propLines, line)) {
        PropFields parsed;
        std::string error;
        ASSERT_EQ(parsePropLine(line, parsed, error), LineStatus::Property) << line;
        std::string statement;
        ASSERT_TRUE(propToStatement(
            {parsed.kind, parsed.element.str(), parsed.name.str(), std::string(parsed.value)},
            statement, error))
            << line << ": " << error;
        back += statement + "\n";
    }
    EXPECT_EQ(records(readStatements(back)), records(file));
}

TEST(Statements, PropertiesBecomeStatements) {
    struct Case {
        PropRecord prop;
        const char* statement; // or the error
    } cases[] = {
        {{PropKind::Ref, "u/q<0>", "TS_TNM", "data ffs"}, "INST u/q<0> TNM = \"data ffs\";"},
        {{PropKind::Ref, "n", "TS_TIG", ""}, "NET n TIG;"},
        {{PropKind::Ref, "n", "TS_TIG", "\"TS 1\""}, "NET n TIG = \"TS 1\";"},
        {{PropKind::Ref, "b", "TS_CLKGRP", "clk"}, "NET b TS_CLKGRP = clk;"},
        {{PropKind::Ref, "n", "TS_FEEDBACK", "1500:pS:NET:fb"}, "NET n FEEDBACK = 1500:pS:NET:fb;"},
        {{PropKind::Ref, "a;b", "TS_TPTHRU", "t"}, "NET \"a;b\" TPTHRU = t;"},
        {{PropKind::Spec, "", "TS_GROUP_BASED_OFFSET", "TIMEGRP:p:OFFSET=IN:1:BEFORE:c"},
         "TIMEGRP p OFFSET = IN:1:BEFORE:c;"},
        {{PropKind::Spec, "", "TS_GROUP_BASED_OFFSET", "TIMEGRP p OFFSET = IN 1 BEFORE c"},
         "TIMESPEC TS_GROUP_BASED_OFFSET = TIMEGRP p OFFSET = IN 1 BEFORE c;"},
        {{PropKind::Spec, "", "disable", ""}, "disable = ;"},
        {{PropKind::Group, "", "g#1", "a:b"}, "TIMEGRP \"g#1\" = a:b;"},
        {{PropKind::Ref, "n", "TS_FOO", "x"}, "no statement hands over the property \"TS_FOO\""},
        {{PropKind::Ref, "x\"'y", "TS_TNM", "g"},
         "cannot write \"x\"'y\" so that a statement file reads it back"},
    };
    for (const Case& c : cases) {
        std::string statement;
        std::string error;
        bool ok = propToStatement(c.prop, statement, error);
        EXPECT_EQ(ok ? statement : error, c.statement) << propLine(c.prop);
    }
}

TEST(Statements, NameHints) {
    std::vector<std::string> defined = {"clk_grp", "CLK_GRP2", "data_ffs", "TS01", "TS02", "ab"};
    struct Case {
        const char* name;
        const char* hint; // empty: none
    } cases[] = {
        {"Clk_Grp", "clk_grp"},  // another case beats an edit
        {"clk_gpr", "clk_grp"},  // two neighbours swapped
        {"clk_grp3", "clk_grp"}, // one edit away
        {"dta_fs", "data_ffs"},  // two edits
        {"dat_", ""},            // two edits, but a third of four letters is one
        {"TS03", "TS01"},        // a tie goes to the first defined
        {"ac", "ab"},            // one edit is always allowed
        {"xy", ""},
        {"clk_grp", ""}, // the name itself is no hint
    };
    for (const Case& c : cases)
        EXPECT_EQ(closestName(c.name, defined).value_or(""), c.hint) << c.name;
    EXPECT_EQ(didYouMean("clk_gpr", defined), "did you mean \"clk_grp\"?");
    EXPECT_EQ(didYouMean("zzz", defined), "");
}

TEST(Statements, FormatIsToldByContent) {
    struct Case {
        const char* text;
        FileFormat format;
    } cases[] = {
        {"# c\n\ngroup a = b\nNET x;", FileFormat::Props},
        {"\xEF\xBB\xBF  ref e TS_TNM = g", FileFormat::Props},
        {"# c\n// d\nNET \"clk\" TNM_NET = g;", FileFormat::Statements},
        {"timespec TS01 = x;", FileFormat::Statements},
        {"OFFSET=IN 1 BEFORE c;", FileFormat::Statements},
        {"CONFIG X = y;\ngroup a = b", FileFormat::Statements},
        {"grouping x\nspec TS01 = x", FileFormat::Props},
        {"", FileFormat::Props},
    };
    for (const Case& c : cases)
        EXPECT_EQ(detectFormat(c.text), c.format) << c.text;
}

TEST(Statements, PositionsInsideValues) {
    // The word's first occurrence in the record's value, and where it stands
    // in the text: across lines and comments, behind quotes, before the
    // body of a group offset at the group's name.
    struct Case {
        const char* text;
        const char* word;
        const char* pos;
    } cases[] = {
        {"  TIMESPEC T = PERIOD x 10 ns HIHG;", "HIHG", "1:31"},
        {"TIMESPEC T = FROM a # c\n  TO  b 1;", "TO", "2:3"},
        {"TIMESPEC T = FROM a # c\n  TO  b 1;", "b", "2:7"},
        {"TIMEGRP g = a EXCEPT\r\n\tEXCEPT b;", "b", "2:9"},
        {"TIMEGRP p OFFSET = IN 1\n BEFORE k;", "k", "2:9"},
        {"TIMEGRP p OFFSET = IN 1\n BEFORE k;", "p", "1:9"},
        {"NET a TNM = \"my g\";", "g", "1:17"},
        {"NET a LOC = x | TIG = TS1, 'TS2';", "TS2", "1:29"},
        {"NET a TIG;", "", "1:7"},
        {"NET a MAXDELAY =\n  2 furlongs;", "furlongs", "2:5"},
    };
    for (const Case& c : cases) {
        StatementFile file = readStatements(c.text);
        ASSERT_FALSE(file.records.empty()) << c.text;
        const StatementRecord& record = file.records.back();
        std::size_t offset = record.prop.value.find(c.word);
        ASSERT_NE(offset, std::string::npos) << c.text;
        EXPECT_EQ(pos(valuePosition(c.text, record, offset)), c.pos) << c.text << " " << c.word;
    }
    // A name's messages point at the name, the others at the attribute.
    StatementFile file = readStatements("NET a TNM =\n  g | TIG | PERIOD = 1 ns;");
    ASSERT_EQ(file.records.size(), 3u);
    EXPECT_EQ(pos(recordPosition(file.records[0])), "2:3");
    EXPECT_EQ(pos(recordPosition(file.records[1])), "2:7");
    EXPECT_EQ(pos(recordPosition(file.records[2])), "2:13");
}
