// Tokenizer and value reader shared by the two constraint parsers.
//
// The text is cut once into tokens (words, quoted names, ";") that remember
// the separators (blanks, ':' and '=') in front of them; the grammars then
// walk the tokens, check each gap for the separators it may hold, and decode
// names and values. Everything lives in buffers that are reused from one
// parse to the next, so a parse allocates nothing once they have grown.
#pragma once

#include "tsd/host/LogicalConstraintParser.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace tsd_constraint {

enum class TokenType : std::uint8_t { Word, Quoted, Semicolon, End, Bad };

// Every keyword of both languages. A word is classified once; whether it is
// read as a keyword or as a name depends on where it stands.
enum Keyword : std::uint8_t {
    KW_NONE,
    KW_TIMEGRP,
    KW_TIMESPEC,
    KW_EXCEPT,
    KW_RISING,
    KW_FALLING,
    KW_TRANSHI,
    KW_TRANSLO,
    KW_PERIOD,
    KW_HIGH,
    KW_LOW,
    KW_PHASE,
    KW_INPUT_JITTER,
    KW_PRIORITY,
    KW_FROM,
    KW_THRU,
    KW_TO,
    KW_TIG,
    KW_DATAPATHONLY,
    KW_OFFSET,
    KW_IN,
    KW_OUT,
    KW_VALID,
    KW_BEFORE,
    KW_AFTER,
    KW_ENABLE,
    KW_DISABLE,
    KW_DROP_SPEC,
    KW_MAXDELAY,
    KW_MAXSKEW,
    KW_FEEDBACK,
    KW_REFERENCE_PIN,
};

struct Token {
    TokenType type = TokenType::End;
    Keyword keyword = KW_NONE; // always KW_NONE for quoted names
    std::uint8_t sepCount = 0; // ':' and '=' in the gap before the token, at most 3 counted
    char sepChar[3] = {0, 0, 0};
    // The text is not the raw span: a doubled quote inside quotes, or a
    // pattern whose quotes and blanks before "(" are dropped.
    bool cooked = false;
    std::uint8_t badCode = 0;   // the lexical error of a Bad token
    std::uint32_t gapStart = 0; // the gap before the token is [gapStart, rawStart)
    std::uint32_t rawStart = 0; // the token as written, quotes included
    std::uint32_t rawLength = 0;
    mutable std::int32_t pooled = -1; // offset of its zero-terminated copy in the pool

    // Its text as written, the quotes of a quoted name excluded.
    std::uint32_t start() const { return rawStart + (type == TokenType::Quoted ? 1 : 0); }
    std::uint32_t length() const { return type == TokenType::Quoted ? rawLength - 2 : rawLength; }
};

// What the gap in front of a token may hold.
enum class Gap {
    Lead,            // before the first token: blanks only
    Normal,          // blanks and at most one ':'; not empty between two names
    Definition,      // exactly one '=' (blanks around it)
    GroupDefinition, // '=' optionally followed by one ':' (a TIMEGRP with only excludes)
    Glue,            // may be empty; otherwise as Normal
    Trailing,        // after the ';': blanks only
    Checked,         // already checked by the caller
};

enum UnitMask : unsigned { UNIT_TIME = 1, UNIT_FREQUENCY = 2, UNIT_PERCENT = 4 };
enum class Bare { Nanoseconds, Percent };        // the meaning of a number without unit
enum class Range { Any, NonNegative, Positive }; // the values that make sense

struct QuantitySpec {
    unsigned units;
    Bare bare;
    Range range;
};

struct Quantity {
    double value = 0;   // picoseconds (a frequency as its period), or a percent
    bool isTime = true; // false when written as a frequency
    bool isPercent = false;
};

// A delay or period: a quantity or a link to another TSid.
struct Delay {
    const char* link = nullptr; // null for a quantity
    bool multiply = false;
    double valueOrFactor = 0; // picoseconds, or the factor (0 when none was written)
    bool isTime = true;
};

class Reader {
public:
    // Cuts `text` into tokens. A null text is empty. False, with the error
    // recorded, for a text too long for 32-bit columns.
    bool start(const char* text);

    const Token& tok() const { return m_tokens[m_index]; }
    const Token& peek(std::size_t ahead = 1) const {
        std::size_t i = m_index + ahead;
        return i < m_tokens.size() ? m_tokens[i] : m_tokens.back();
    }
    void advance() {
        if (m_index + 1 < m_tokens.size())
            ++m_index;
    }

    bool isName(const Token& t) const {
        return t.type == TokenType::Word || t.type == TokenType::Quoted;
    }
    // The error for an empty quoted name (""), which names nothing.
    bool checkNotEmpty(const Token& t) {
        return t.length() > 0 || fail(CONSTRAINT_ERR_EXPECTED_NAME, t);
    }
    bool at(Keyword keyword) const { return isKeyword(tok(), keyword); }
    static bool isKeyword(const Token& t, Keyword keyword) {
        return t.type == TokenType::Word && t.keyword == keyword;
    }
    // A number, a word beginning with "TS" or a quoted name: what readDelay reads.
    bool startsDelay(const Token& t) const;

    // Records the first error and returns false. The token's own lexical
    // error wins over `code` for a Bad token.
    bool fail(int code, const Token& t);
    bool failSpan(int code, std::uint32_t pos, std::uint32_t length);
    // The error for a token that cannot stand where it stands.
    bool unexpected(const Token& t);
    bool failed() const { return m_errorCode != 0; }
    int errorCode() const { return m_errorCode; }
    int errorColumn() const { return m_errorColumn; }
    const char* errorToken() const { return m_errorToken.c_str(); }

    bool checkGap(const Token& t, Gap gap) {
        // The common case, blanks and at most one ':' between two tokens,
        // without a call.
        if (gap == Gap::Normal && t.gapStart != t.rawStart &&
            (t.sepCount == 0 || (t.sepCount == 1 && t.sepChar[0] == ':')))
            return true;
        return checkGapSlow(t, gap);
    }

    // Zero-terminated copy of a token's text, valid until the next start().
    const char* text(const Token& t);

    // At the current token (after checking its gap): a name, advanced past.
    bool readName(Gap gap, const char*& out);
    // A number with optional unit, e.g. "10ns", "10 ns", "10:nS", "50%".
    bool readQuantity(Gap gap, const QuantitySpec& spec, Quantity& out);
    // A quantity or a TSid link ("TS01", "TS01*2", "TS01 / 2", "TS01:*:2").
    bool readDelay(Gap gap, const QuantitySpec& spec, Delay& out);
    // "+:2.5:nS", "- 2 ns", "-2ns", "2 ns".
    bool readPhase(Gap gap, bool& positive, double& ps);
    // A signed 32-bit integer other than LogicalConstraintParser::kNoPriority.
    bool readPriority(Gap gap, int& out);
    // The ";" (optionally after one ':') and nothing but blanks after it.
    // `gap` is Checked when the gap before the ";" was checked as another kind.
    bool readTerminator(Gap gap = Gap::Normal);

    // Column (from 1) and length of the text from a token up to the ";".
    ConstraintHandle handle(ConstraintHandle::Kind kind, const Token& first) const;

    // Lists handed to the callbacks, reused from parse to parse.
    std::vector<const char*> names;
    std::vector<std::pair<const char*, ParserEdge>> includes;
    std::vector<const char*> excludes;

private:
    bool checkGapSlow(const Token& t, Gap gap);
    // Where the i-th ':' or '=' of a token's gap stands.
    std::uint32_t separatorPos(const Token& t, int i) const;
    void tokenize();
    bool readQuantityIn(const Token& t, std::uint32_t offset, const QuantitySpec& spec,
                        bool allowSign, Quantity& out);
    bool convert(const char* number, std::uint32_t length, unsigned unit, std::uint32_t valuePos,
                 std::uint32_t valueLength, const QuantitySpec& spec, Quantity& out);
    bool readFactor(const Token& t, std::uint32_t offset, double& factor);
    const char* pooledPrefix(const Token& t, std::uint32_t length);

    const char* m_text = "";
    std::uint32_t m_length = 0;
    std::vector<Token> m_tokens;
    std::size_t m_index = 0;
    std::vector<char> m_pool;
    std::size_t m_poolUsed = 0;
    std::uint32_t m_terminatorEnd = 0; // just past the ';'

    int m_errorCode = 0;
    int m_errorColumn = 0;
    std::string m_errorToken;
};

// What the values of each kind may be.
inline constexpr QuantitySpec kDelaySpec = {UNIT_TIME | UNIT_FREQUENCY, Bare::Nanoseconds,
                                            Range::NonNegative};
inline constexpr QuantitySpec kPeriodSpec = {UNIT_TIME | UNIT_FREQUENCY, Bare::Nanoseconds,
                                             Range::Positive};
inline constexpr QuantitySpec kDurationSpec = {UNIT_TIME, Bare::Nanoseconds, Range::NonNegative};
inline constexpr QuantitySpec kSignedTimeSpec = {UNIT_TIME, Bare::Nanoseconds, Range::Any};
inline constexpr QuantitySpec kDutySpec = {UNIT_TIME | UNIT_PERCENT, Bare::Percent,
                                           Range::Positive};

// The part of an OFFSET after "OFFSET": (IN|OUT) value [VALID time]
// (BEFORE|AFTER) clock, then [TIMEGRP group] and [HIGH|LOW] in any order.
struct OffsetParts {
    bool in = true;
    double offsetPs = 0;
    bool hasValid = false;
    double validPs = 0;
    bool before = true;
    const char* clock = nullptr;
    const char* regGroup = nullptr;
    const char* highLow = nullptr;
};
// `gap` is what may stand before IN or OUT.
bool readOffsetBody(Reader& r, Gap gap, OffsetParts& out);

// The options after a period value, in any order, each at most once:
// [PHASE sign time] [HIGH|LOW duty] [INPUT_JITTER time] [PRIORITY n].
struct PeriodOptions {
    bool phasePositive = true;
    double phasePs = 0;
    bool dutyLow = false;
    double dutyTimePs = 0;
    double dutyPercent = 0;
    bool hasJitter = false;
    double jitterPs = 0;
    int priority = LogicalConstraintParser::kNoPriority;
};
// PHASE and PRIORITY only when `full` (the net PERIOD has neither).
bool readPeriodOptions(Reader& r, bool full, PeriodOptions& out);

// Whether `name`, written bare between separators, reads back as exactly
// `name`: a non-empty run of characters other than blanks, ':', '=', ';',
// quotes and control characters.
bool isBareWord(const char* name, std::size_t length);
// Appends `name` in quotes that read back as `name`: double quotes, or
// single ones when it holds a double quote but no single one, or else double
// quotes with each double quote inside doubled. (A control character reads
// back in no form: the tokenizer refuses it everywhere.)
void appendQuoted(std::string& out, const char* name, std::size_t length);
// Length of the predefined-group keyword (FFS, LATCHES, PADS, RAMS, PPS, any
// case) at the start of [p, p + length) when the word goes on with "(" or
// ends there; 0 otherwise.
std::size_t patternKeywordLength(const char* p, std::size_t length);

// Word classification, exposed for tests. With `canRead8`, the 8 bytes at
// `word` may be read whatever `length` is.
Keyword classifyWord(const char* word, std::size_t length, bool canRead8 = false);
// Length of the number at the start of [p, p + length): digits with an
// optional point and exponent, and a sign when allowed; 0 when none.
std::size_t scanNumber(const char* p, std::size_t length, bool allowSign);

// The reader for one parse. A callback that parses again on the same parser
// gets a reader of its own, so the strings handed to the outer callback stay
// intact; `parsing` tells whether a parse is under way.
class ReaderLease {
public:
    ReaderLease(Reader& own, bool& parsing) : m_parsing(parsing), m_outer(!parsing) {
        if (m_outer) {
            m_reader = &own;
        } else {
            m_nested = std::make_unique<Reader>();
            m_reader = m_nested.get();
        }
        m_parsing = true;
    }
    ~ReaderLease() {
        if (m_outer)
            m_parsing = false;
    }
    ReaderLease(const ReaderLease&) = delete;
    ReaderLease& operator=(const ReaderLease&) = delete;

    Reader& get() { return *m_reader; }

private:
    bool& m_parsing;
    bool m_outer;
    std::unique_ptr<Reader> m_nested;
    Reader* m_reader = nullptr;
};

} // namespace tsd_constraint
