// Parser of the logical constraint language: one TIMEGRP, TIMESPEC, OFFSET,
// ENABLE or DISABLE definition per call.
//
// parse() reads the whole definition first and only then calls exactly one
// callback with the decoded parts (names as written, times in picoseconds),
// so a text with an error anywhere never reaches a callback. A subclass
// overrides the callbacks it needs; the defaults accept and do nothing.
// docs/constraint-language.md describes the accepted language.
#pragma once

#include <memory>
#include <utility>
#include <vector>

// Codes passed as the first argument of cb_error, shared by both parsers.
enum ConstraintErrorCode {
    CONSTRAINT_ERR_EMPTY = 1,         // the text holds no constraint at all
    CONSTRAINT_ERR_UNKNOWN_KEYWORD,   // a word that is no keyword where a keyword must stand
    CONSTRAINT_ERR_UNEXPECTED_TOKEN,  // a keyword, name or ";" that cannot stand here
    CONSTRAINT_ERR_EXPECTED_NAME,     // a name is missing
    CONSTRAINT_ERR_EXPECTED_EQUALS,   // the "=" after the defined name or keyword is missing
    CONSTRAINT_ERR_EXPECTED_VALUE,    // a number, time or TSid is missing
    CONSTRAINT_ERR_BAD_NUMBER,        // a malformed number
    CONSTRAINT_ERR_BAD_UNIT,          // a unit that is unknown or not allowed here
    CONSTRAINT_ERR_OUT_OF_RANGE,      // a number that is not finite or makes no sense here
    CONSTRAINT_ERR_DUPLICATE,         // an option given twice
    CONSTRAINT_ERR_UNBALANCED_QUOTE,  // a quoted name without its closing quote
    CONSTRAINT_ERR_INVALID_CHARACTER, // a control character
    CONSTRAINT_ERR_STRAY_SEPARATOR,   // a ':' or '=' where none may stand
    CONSTRAINT_ERR_MISSING_SEPARATOR, // two tokens written together
    CONSTRAINT_ERR_MISSING_SEMICOLON, // the text ends before its ";"
    CONSTRAINT_ERR_TRAILING_TEXT,     // anything but blanks after the ";"
    CONSTRAINT_ERR_TOO_LONG,          // a text of a gigabyte or more
};

// A short English description of a code ("unknown keyword"); "error" for
// codes outside the enumeration.
const char* constraintErrorText(int code);

enum ParserEdge : int {
    PARSER_EDGE_RISING = 0,
    PARSER_EDGE_FALLING = 1,
    PARSER_EDGE_TRANSHI = 2,
    PARSER_EDGE_TRANSLO = 3,
    PARSER_EDGE_NONE = 4
};

// Identifies the constraint being reported: its kind and where it stands in
// the text handed to parse(). Valid only during the callback.
class ConstraintHandle {
public:
    enum Kind { KIND_TIMEGRP, KIND_TIMESPEC, KIND_OFFSET, KIND_ENABLE, KIND_DISABLE };

    ConstraintHandle() = default;
    ConstraintHandle(Kind kind, int column, int length)
        : m_kind(kind), m_column(column), m_length(length) {}

    // KIND_OFFSET also for an OFFSET of a pad group (TIMEGRP pads OFFSET=...).
    Kind kind() const { return m_kind; }
    // 1-based column of the constraint's first character.
    int column() const { return m_column; }
    // Characters from that column up to and including the ";".
    int length() const { return m_length; }

private:
    Kind m_kind = KIND_TIMESPEC;
    int m_column = 0;
    int m_length = 0;
};

namespace tsd_constraint {
class Reader;
}

class LogicalConstraintParser {
public:
    static constexpr int kNoPriority = 2147483647;

    LogicalConstraintParser();
    virtual ~LogicalConstraintParser();
    LogicalConstraintParser(const LogicalConstraintParser&) = delete;
    LogicalConstraintParser& operator=(const LogicalConstraintParser&) = delete;

    // Parses one definition ending in ";". Returns true on FAILURE: a syntax
    // error (reported through cb_error first) or a callback that answered
    // false (cb_error is not called then). A null text is an empty text.
    bool parse(const char* text);

    // The callbacks, in this order. Pointers are valid only during the call.
    // cb_error: code from ConstraintErrorCode; column (from 1) of the first
    // character of the offending token in the text handed to parse(), or the
    // column just past the text when the text ends too early (token ""); the
    // token as written (a quoted name with its quotes).
    virtual bool cb_error(int code, int column, const char* token);
    // delayName is null for "DISABLE= ;".
    virtual bool cb_enable(bool enable, const char* delayName, const ConstraintHandle* handle);
    virtual bool cb_offset(bool in, double offsetPs, const double* validPs, bool before,
                           const char* clock, const char* highLow, const ConstraintHandle* handle);
    virtual bool cb_toffset(const char* padGroup, bool in, double offsetPs, const double* validPs,
                            bool before, const char* clock, const char* highLow,
                            const ConstraintHandle* handle);
    virtual bool cb_roffset(bool in, double offsetPs, const double* validPs, bool before,
                            const char* clock, const char* regGroup, const char* highLow,
                            const ConstraintHandle* handle);
    virtual bool cb_troffset(const char* padGroup, bool in, double offsetPs, const double* validPs,
                             bool before, const char* clock, const char* regGroup,
                             const char* highLow, const ConstraintHandle* handle);
    virtual bool cb_tspec_maxdelay(const char* tsid, bool hasFrom, bool hasTo,
                                   const std::vector<const char*>& groups, const char* linkTsid,
                                   bool multiply, double valueOrFactor, bool isTime, int priority,
                                   bool dataPathOnly, const ConstraintHandle* handle);
    virtual bool cb_tspec_period(const char* tsid, const char* group, const char* linkTsid,
                                 bool multiply, double valueOrFactor, bool isTime,
                                 bool phasePositive, double phasePs, bool dutyLow,
                                 double dutyTimePs, double dutyPercent, const double* inputJitterPs,
                                 int priority, const ConstraintHandle* handle);
    virtual bool cb_tspec_tig(const char* tsid, bool hasFrom, bool hasTo,
                              const std::vector<const char*>& groups, int priority,
                              const ConstraintHandle* handle);
    virtual bool cb_tspec_drop_spec(const char* tsid, const ConstraintHandle* handle);
    virtual bool cb_timegrp(const char* name,
                            const std::vector<std::pair<const char*, ParserEdge>>& includes,
                            const std::vector<const char*>& excludes,
                            const ConstraintHandle* handle);

private:
    // Buffers reused from one parse to the next.
    std::unique_ptr<tsd_constraint::Reader> m_reader;
    bool m_parsing = false;
};
