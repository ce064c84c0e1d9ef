// Constraint statement files: the reader, the writer and the conversions
// to and from property lines.
//
//   NET "clk" TNM_NET = clk_grp | LOC = P12;     # any number of attributes
//   TIMESPEC "TS01" = PERIOD "clk_grp" 10 ns HIGH 50%;
//   TIMEGRP "pads" OFFSET = IN 2 ns BEFORE clk;  // comments of both kinds
//
// The reader turns the text of one file into statements and, for the timing
// statements and attributes, into the property records a builder takes. Every
// statement it does not interpret is only located, so the writer can copy it
// byte for byte. Nothing here knows about files, builders or messages beyond
// the reader's own errors: the caller hands records to its builder and maps
// errors to FILE:LINE:COLUMN.
//
// Where text belongs: a statement runs from its first word to its ';'. The
// blanks and comments between statements belong to no statement; the writer
// copies them, except that a statement it drops takes with it its line's
// indentation, a comment that follows it on its last line and that line's
// end, when nothing else stands on those lines.
#pragma once

#include "PropFile.h"

#include <cstddef>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace tsd_cli {

// 1-based; the column counts bytes (a tab is one).
struct TextPos {
    int line = 0;
    int column = 0;
};

// A property as a builder takes it.
struct PropRecord {
    PropKind kind = PropKind::Group;
    std::string element; // refs only
    std::string name;
    std::string value;
    bool operator==(const PropRecord& other) const {
        return kind == other.kind && element == other.element && name == other.name &&
               value == other.value;
    }
    bool operator!=(const PropRecord& other) const { return !(*this == other); }
};

// How the writer puts a canonical value into a record's value span.
enum class ValueForm {
    Constraint, // constraint text, written as the library writes it
    Name,       // one name, quoted where it would not read back as one word
    OffsetBody, // TIMEGRP g OFFSET = <body>: only the body is written
    Implied,    // a bare TIG: the global directive needs no value
};

struct StatementRecord {
    PropRecord prop;
    std::size_t statement = 0;  // index into StatementFile::statements
    std::string attribute;      // keyword or attribute as written: TIMESPEC, TNM_NET, PERIOD...
    std::string qualifier;      // of a TNM value, as written ("FFS(*) :"); empty if none
    TextPos where;              // the attribute, or the name a TIMESPEC or TIMEGRP defines
    TextPos valueWhere;         // the value's first byte, or where the value would stand
    std::size_t valueBegin = 0; // the bytes of the value that a canonical value replaces
    std::size_t valueEnd = 0;
    ValueForm form = ValueForm::Constraint;
};

enum class StatementKind {
    Timespec,    // TIMESPEC name = value
    Timegrp,     // TIMEGRP name = value
    GroupOffset, // TIMEGRP name OFFSET = value
    Offset,      // OFFSET = value
    PathControl, // ENABLE = value, DISABLE = value
    Net,         // NET / INST / PIN element attr | attr ...
    Inst,
    Pin,
    Other, // anything else: kept as written
};

// One attribute of an element statement, between '|' separators; its
// records are the timing properties it hands over (none for the others).
struct StatementItem {
    std::size_t begin = 0; // first byte of its first word (of the '|' after it when empty)
    std::size_t end = 0;   // just past its last word
    std::size_t firstRecord = 0;
    std::size_t recordCount = 0;
};

struct Statement {
    StatementKind kind = StatementKind::Other;
    std::size_t begin = 0;     // first byte of its first word
    std::size_t end = 0;       // just past its ';' (past its last word when the ';' is missing)
    std::size_t lineBegin = 0; // start of the line it begins on
    bool firstOnLine = true;   // only blanks stand before it on that line
    TextPos where;
    std::string element;    // NET, INST and PIN statements
    bool malformed = false; // an error was reported for it
    std::size_t firstRecord = 0;
    std::size_t recordCount = 0;
    std::vector<StatementItem> items; // NET, INST and PIN statements
};

struct StatementError {
    TextPos where;
    std::string text;
};

struct StatementFile {
    std::vector<Statement> statements;
    std::vector<StatementRecord> records; // in the order they stand in the text
    std::vector<StatementError> errors;   // in the order they stand in the text
    // The element names of NET statements, as written (wildcards unexpanded).
    std::set<std::string> nets;
};

// Where a message about a record points: the name of a name value (TNM,
// TPTHRU, a TSid of a TIG list, ...), else the attribute, keyword or the
// name a TIMESPEC or TIMEGRP defines.
TextPos recordPosition(const StatementRecord& record);

// Where byte `offset` of `record.prop.value` stands in `text` (the text the
// record was read from): inside a constraint value across its lines and
// comments, inside a name behind its quote; before the value, the record's
// position.
TextPos valuePosition(std::string_view text, const StatementRecord& record, std::size_t offset);

// Reads the whole text; never throws on bad input. A statement with an
// unterminated quote or a malformed head (a TIMESPEC without "=") gives an
// error and no records; a statement without its ';' gives an error but keeps
// its records; a bad attribute gives an error and no record, the statement's
// other attributes still count. Reading goes on with the next statement.
StatementFile readStatements(std::string_view text);

// What becomes of one record when a file is written back.
struct RecordOutput {
    bool keep = true;
    std::string value; // the canonical value, when kept

    static RecordOutput canonical(std::string value) { return {true, std::move(value)}; }
    static RecordOutput drop() { return {false, {}}; }
};

// Writes `text` (as read into `file`) back with one output per record of
// `file.records`; throws std::invalid_argument when the counts differ.
// A kept record whose canonical value equals its value keeps its bytes;
// another gets the canonical value in its value span (comments that stood
// inside the span move behind it). A value that could not be written so that
// it reads back (a name holding both kinds of quote, a line break) keeps
// its bytes. Dropped records take their attribute (and a '|' or ',' next to
// it) with them; a statement left with nothing is dropped whole, but a
// comment on a line of its own inside what is removed stays.
std::string writeStatements(std::string_view text, const StatementFile& file,
                            const std::vector<RecordOutput>& outputs);

// How a canonical value is written into a record's value span: constraint
// text with every word that holds '#', "//", ';' or '|' put in quotes, a
// name quoted where needed. False when it cannot be written.
bool renderValue(const StatementRecord& record, std::string_view canonical, std::string& out);

// A name as a statement writes it: bare when it reads back as one word, else
// in double quotes, else in single quotes; false when neither works.
bool statementName(std::string_view name, std::string& out);

// The records as a property file, one formatPropLine line each.
std::string statementsToProps(const StatementFile& file);

// One statement (with its ';', without line end) that reads back as `prop`.
// A reference record becomes an INST statement for TS_TNM and a NET
// statement for every other property. False with `error` set when there is
// no statement for it.
bool propToStatement(const PropRecord& prop, std::string& statement, std::string& error);

// A name that a property file's reference value stands for: the text inside
// the quotes when the value is one quoted string (with \" and \\), else the
// value itself.
std::string refValueName(std::string_view value);

enum class FileFormat { Props, Statements };

// A property file's first content line begins with group, spec or ref; a
// statement file's with a statement keyword, or it holds a ';'. Lines that
// tell neither (comments, blanks, unknown words) are skipped; a file that
// never tells is taken as a property file.
FileFormat detectFormat(std::string_view text);

} // namespace tsd_cli
