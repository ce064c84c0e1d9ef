#include "host/ConstraintLexer.h"

#include <charconv>
#include <climits>
#include <cmath>
#include <cstring>
#include <system_error>

namespace tsd_constraint {

namespace {

// Texts at or above this size are refused: columns must fit an int.
constexpr std::size_t kMaxTextLength = std::size_t(1) << 30;

// Every byte's class, looked up once per character by the tokenizer.
enum CharClass : std::uint8_t { C_WORD, C_BLANK, C_SEPARATOR, C_SEMICOLON, C_QUOTE, C_CONTROL };

struct CharClasses {
    CharClass of[256];
    constexpr CharClasses() : of() {
        for (int c = 0; c < 256; ++c)
            of[c] = (c < 0x20 || c == 0x7f) ? C_CONTROL : C_WORD;
        for (char c : {' ', '\t', '\r', '\n', '\v', '\f'})
            of[static_cast<unsigned char>(c)] = C_BLANK;
        of[static_cast<unsigned char>(':')] = C_SEPARATOR;
        of[static_cast<unsigned char>('=')] = C_SEPARATOR;
        of[static_cast<unsigned char>(';')] = C_SEMICOLON;
        of[static_cast<unsigned char>('"')] = C_QUOTE;
        of[static_cast<unsigned char>('\'')] = C_QUOTE;
    }
};
constexpr CharClasses kClasses;

inline CharClass classOf(char c) {
    return kClasses.of[static_cast<unsigned char>(c)];
}
inline bool isBlank(char c) {
    return classOf(c) == C_BLANK;
}
inline bool isControl(char c) {
    return classOf(c) == C_CONTROL;
}
inline bool isQuote(char c) {
    return classOf(c) == C_QUOTE;
}
inline bool isWordChar(char c) {
    return classOf(c) == C_WORD;
}
bool isDigit(char c) {
    return c >= '0' && c <= '9';
}
bool isAlpha(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}
char upper(char c) {
    return (c >= 'a' && c <= 'z') ? static_cast<char>(c - 'a' + 'A') : c;
}

// Compares a word with an upper-case pattern without regard to case.
bool equalsUpper(const char* word, std::size_t length, const char* pattern) {
    for (std::size_t i = 0; i < length; ++i)
        if (pattern[i] == '\0' || upper(word[i]) != pattern[i])
            return false;
    return pattern[length] == '\0';
}

struct KeywordEntry {
    const char* text;
    Keyword keyword;
};

constexpr KeywordEntry kKeywords[] = {
    {"TIMEGRP", KW_TIMEGRP},
    {"TIMESPEC", KW_TIMESPEC},
    {"EXCEPT", KW_EXCEPT},
    {"RISING", KW_RISING},
    {"FALLING", KW_FALLING},
    {"TRANSHI", KW_TRANSHI},
    {"TRANSLO", KW_TRANSLO},
    {"PERIOD", KW_PERIOD},
    {"HIGH", KW_HIGH},
    {"LOW", KW_LOW},
    {"PHASE", KW_PHASE},
    {"INPUT_JITTER", KW_INPUT_JITTER},
    {"PRIORITY", KW_PRIORITY},
    {"FROM", KW_FROM},
    {"THRU", KW_THRU},
    {"TO", KW_TO},
    {"TIG", KW_TIG},
    {"DATAPATHONLY", KW_DATAPATHONLY},
    {"OFFSET", KW_OFFSET},
    {"IN", KW_IN},
    {"OUT", KW_OUT},
    {"VALID", KW_VALID},
    {"BEFORE", KW_BEFORE},
    {"AFTER", KW_AFTER},
    {"ENABLE", KW_ENABLE},
    {"DISABLE", KW_DISABLE},
    {"DROP_SPEC", KW_DROP_SPEC},
    {"MAXDELAY", KW_MAXDELAY},
    {"MAXSKEW", KW_MAXSKEW},
    {"FEEDBACK", KW_FEEDBACK},
    {"REFERENCE_PIN", KW_REFERENCE_PIN},
};

constexpr std::size_t kMaxKeywordLength = 13; // REFERENCE_PIN

// Units as written, and what one of them is worth.
enum Unit { U_NONE, U_PS, U_NS, U_US, U_MS, U_GHZ, U_MHZ, U_KHZ, U_PERCENT };

struct UnitEntry {
    const char* text;
    Unit unit;
    unsigned mask;
    double factor; // picoseconds in one unit; for a frequency f, factor / f picoseconds
};

constexpr UnitEntry kUnits[] = {
    {"PS", U_PS, UNIT_TIME, 1.0},        {"NS", U_NS, UNIT_TIME, 1e3},
    {"US", U_US, UNIT_TIME, 1e6},        {"MS", U_MS, UNIT_TIME, 1e9},
    {"GHZ", U_GHZ, UNIT_FREQUENCY, 1e3}, {"MHZ", U_MHZ, UNIT_FREQUENCY, 1e6},
    {"KHZ", U_KHZ, UNIT_FREQUENCY, 1e9}, {"%", U_PERCENT, UNIT_PERCENT, 1.0},
};
static_assert(kUnits[U_NS - U_PS].unit == U_NS && kUnits[U_PERCENT - U_PS].unit == U_PERCENT,
              "kUnits is in the order of Unit");

const UnitEntry* findUnit(const char* word, std::size_t length) {
    // "%", a letter and "S", or a letter and "HZ", in any case.
    auto unit = [](Unit u) { return &kUnits[u - U_PS]; };
    switch (length) {
    case 1:
        return word[0] == '%' ? unit(U_PERCENT) : nullptr;
    case 2:
        if (upper(word[1]) != 'S')
            return nullptr;
        switch (upper(word[0])) {
        case 'P':
            return unit(U_PS);
        case 'N':
            return unit(U_NS);
        case 'U':
            return unit(U_US);
        case 'M':
            return unit(U_MS);
        default:
            return nullptr;
        }
    case 3:
        if (upper(word[1]) != 'H' || upper(word[2]) != 'Z')
            return nullptr;
        switch (upper(word[0])) {
        case 'G':
            return unit(U_GHZ);
        case 'M':
            return unit(U_MHZ);
        case 'K':
            return unit(U_KHZ);
        default:
            return nullptr;
        }
    default:
        return nullptr;
    }
}

// The number in [first, last), as scanNumber found it (a "+" is skipped by
// the caller). Whole numbers of up to 15 digits are exact doubles and are
// read directly; all others go through from_chars.
bool readDouble(const char* first, const char* last, double& d) {
    const char* p = first;
    const bool negative = p < last && *p == '-';
    p += negative ? 1 : 0;
    if (last - p <= 15) {
        std::uint64_t whole = 0;
        const char* q = p;
        while (q < last && *q >= '0' && *q <= '9')
            whole = whole * 10 + static_cast<std::uint64_t>(*q++ - '0');
        if (q == last && q > p) {
            d = negative ? -static_cast<double>(whole) : static_cast<double>(whole);
            return true;
        }
    }
    return std::from_chars(first, last, d).ec == std::errc();
}

// kUnits lists the units in the order of Unit, from U_PS on.
const UnitEntry* unitOf(Unit unit) {
    return &kUnits[unit - U_PS];
}

// Up to the first 8 bytes of a word, each with bit 0x20 cleared: for the
// letters and "_" that keywords are made of this is the upper case, and no
// other byte that a word may hold becomes one of them.
constexpr std::uint64_t kClearCase = 0xDFDFDFDFDFDFDFDFull;

constexpr std::uint64_t packUpper(const char* word, std::size_t length) {
    std::uint64_t packed = 0;
    const std::size_t n = length < 8 ? length : 8;
    for (std::size_t i = 0; i < n; ++i)
        packed |= std::uint64_t(static_cast<unsigned char>(word[i])) << (8 * i);
    return packed & kClearCase;
}

// The same where the 8 bytes at `word` may be read whatever the length: one
// load instead of a loop.
std::uint64_t packUpperAt(const char* word, std::size_t length) {
#if defined(__BYTE_ORDER__) && __BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__
    std::uint64_t packed;
    std::memcpy(&packed, word, 8);
    if (length < 8)
        packed &= (std::uint64_t(1) << (8 * length)) - 1;
    return packed & kClearCase;
#else
    return packUpper(word, length);
#endif
}

// The keywords in an open-addressed table keyed by their packed first 8
// bytes and their length, so that a word costs one hash and a probe or two.
struct KeywordTable {
    static constexpr std::size_t kSlots = 64; // twice the keywords, a power of 2
    struct Slot {
        std::uint64_t packed = 0;
        std::size_t length = 0; // 0: empty
        const KeywordEntry* keyword = nullptr;
    };
    Slot slots[kSlots];
    // For each length, the first letters of its keywords (bit 0 for "A"):
    // most names are refused by this alone.
    std::uint32_t firstLetters[kMaxKeywordLength + 1] = {};

    static constexpr std::size_t slotOf(std::uint64_t packed, std::size_t length) {
        return static_cast<std::size_t>(((packed ^ length) * 0x9E3779B97F4A7C15ull) >> 58);
    }
    constexpr KeywordTable() {
        for (const KeywordEntry& entry : kKeywords) {
            std::size_t n = 0;
            while (entry.text[n] != 0)
                ++n;
            const std::uint64_t packed = packUpper(entry.text, n);
            std::size_t i = slotOf(packed, n);
            while (slots[i].length != 0)
                i = (i + 1) % kSlots;
            slots[i] = {packed, n, &entry};
            firstLetters[n] |= 1u << (entry.text[0] - 'A');
        }
    }
};
constexpr KeywordTable kKeywordTable;

// Whether a word may be a keyword at all, by its length and first letter:
// most names and every number are refused by this alone.
inline bool mayBeKeyword(const char* word, std::size_t length) {
    if (length < 2 || length > kMaxKeywordLength || !isAlpha(word[0]))
        return false;
    return (kKeywordTable.firstLetters[length] & (1u << (upper(word[0]) - 'A'))) != 0;
}

Keyword lookupKeyword(const char* word, std::size_t length, bool canRead8) {
    const std::uint64_t packed = canRead8 ? packUpperAt(word, length) : packUpper(word, length);
    for (std::size_t i = KeywordTable::slotOf(packed, length);;
         i = (i + 1) % KeywordTable::kSlots) {
        const KeywordTable::Slot& slot = kKeywordTable.slots[i];
        if (slot.length == 0)
            return KW_NONE;
        if (slot.packed == packed && slot.length == length &&
            (length <= 8 || equalsUpper(word, length, slot.keyword->text)))
            return slot.keyword->keyword;
    }
}

} // namespace

Keyword classifyWord(const char* word, std::size_t length, bool canRead8) {
    return mayBeKeyword(word, length) ? lookupKeyword(word, length, canRead8) : KW_NONE;
}

std::size_t scanNumber(const char* p, std::size_t length, bool allowSign) {
    std::size_t i = 0;
    if (allowSign && i < length && (p[i] == '+' || p[i] == '-'))
        ++i;
    std::size_t digits = 0;
    while (i < length && isDigit(p[i])) {
        ++i;
        ++digits;
    }
    if (i < length && p[i] == '.') {
        ++i;
        while (i < length && isDigit(p[i])) {
            ++i;
            ++digits;
        }
    }
    if (digits == 0)
        return 0;
    // An exponent only counts with digits: "2e" is 2 followed by a bad unit.
    if (i < length && (p[i] == 'e' || p[i] == 'E')) {
        std::size_t j = i + 1;
        if (j < length && (p[j] == '+' || p[j] == '-'))
            ++j;
        std::size_t expDigits = 0;
        while (j < length && isDigit(p[j])) {
            ++j;
            ++expDigits;
        }
        if (expDigits > 0)
            i = j;
    }
    return i;
}

bool isBareWord(const char* name, std::size_t length) {
    if (length == 0)
        return false;
    for (std::size_t i = 0; i < length; ++i)
        if (!isWordChar(name[i]))
            return false;
    return true;
}

void appendQuoted(std::string& out, const char* name, std::size_t length) {
    const bool hasDouble = std::memchr(name, '"', length) != nullptr;
    const bool hasSingle = std::memchr(name, '\'', length) != nullptr;
    const char quote = hasDouble && !hasSingle ? '\'' : '"';
    out += quote;
    for (std::size_t i = 0; i < length; ++i) {
        if (name[i] == quote)
            out += quote;
        out += name[i];
    }
    out += quote;
}

std::size_t patternKeywordLength(const char* p, std::size_t length) {
    struct Pattern {
        const char* text;
        std::size_t length;
    };
    static constexpr Pattern kPatterns[] = {
        {"FFS", 3}, {"LATCHES", 7}, {"PADS", 4}, {"RAMS", 4}, {"PPS", 3}};
    if (length < 3)
        return 0;
    const char first = upper(p[0]);
    if (first != 'F' && first != 'L' && first != 'P' && first != 'R')
        return 0;
    for (const Pattern& keyword : kPatterns) {
        const std::size_t k = keyword.length;
        if (keyword.text[0] == first && k <= length && (k == length || p[k] == '(') &&
            equalsUpper(p, k, keyword.text))
            return k;
    }
    return 0;
}

// ---------------------------------------------------------------------------
// Tokens

bool Reader::start(const char* text) {
    m_errorCode = 0;
    m_errorColumn = 0;
    m_errorToken.clear();
    m_tokens.clear();
    m_index = 0;
    m_poolUsed = 0;
    names.clear();
    includes.clear();
    excludes.clear();

    m_text = text != nullptr ? text : "";
    std::size_t length = std::strlen(m_text);
    if (length >= kMaxTextLength) {
        m_length = 0;
        m_text = "";
        Token end;
        m_tokens.push_back(end);
        m_errorCode = CONSTRAINT_ERR_TOO_LONG;
        m_errorColumn = 1;
        return false;
    }
    m_length = static_cast<std::uint32_t>(length);
    tokenize();
    // Each token is copied at most once, whole or in part, with its zero.
    std::size_t need = m_length + m_tokens.size() + 1;
    if (m_pool.size() < need)
        m_pool.resize(need);
    return true;
}

namespace {

// Where the quoted part that opens at `open` ends. Inside it, a doubled
// quote stands for one quote character.
struct QuoteScan {
    std::uint32_t close = 0; // the closing quote
    bool escaped = false;    // a doubled quote was met
    int badCode = 0;         // unbalanced, or a control character at badPos
    std::uint32_t badPos = 0;
};

QuoteScan scanQuote(const char* s, std::uint32_t n, std::uint32_t open) {
    QuoteScan scan;
    const char quote = s[open];
    std::uint32_t i = open + 1;
    while (i < n) {
        const char c = s[i];
        if (c == quote) {
            if (i + 1 < n && s[i + 1] == quote) {
                scan.escaped = true;
                i += 2;
                continue;
            }
            scan.close = i;
            return scan;
        }
        if (isControl(c)) {
            scan.badCode = CONSTRAINT_ERR_INVALID_CHARACTER;
            scan.badPos = i;
            return scan;
        }
        ++i;
    }
    scan.badCode = CONSTRAINT_ERR_UNBALANCED_QUOTE;
    scan.badPos = open;
    return scan;
}

} // namespace

void Reader::tokenize() {
    const char* s = m_text;
    const std::uint32_t n = m_length;
    std::uint32_t pos = 0;
    for (;;) {
        // Each token is built in place, its gap first: blanks, ':' and '=',
        // of which the first three separators are counted. The text ends in
        // its zero, a control character, which stops the scans below without
        // a test of the length.
        Token& t = m_tokens.emplace_back();
        t.gapStart = pos;
        CharClass k;
        for (;; ++pos) {
            k = classOf(s[pos]);
            if (k == C_SEPARATOR) {
                if (t.sepCount < 3) {
                    t.sepChar[t.sepCount] = s[pos];
                    ++t.sepCount;
                }
            } else if (k != C_BLANK) {
                break;
            }
        }
        auto finish = [&t](TokenType type, std::uint32_t at, std::uint32_t length) {
            t.type = type;
            t.rawStart = at;
            t.rawLength = length;
        };
        if (pos >= n) {
            finish(TokenType::End, n, 0);
            return;
        }
        // A lexical error ends the token list: nothing after it is read.
        auto bad = [&](const QuoteScan& q) {
            finish(TokenType::Bad, q.badPos,
                   q.badCode == CONSTRAINT_ERR_UNBALANCED_QUOTE ? n - q.badPos : 1);
            t.badCode = static_cast<std::uint8_t>(q.badCode);
            Token& end = m_tokens.emplace_back(); // `t` is not used after this
            end.gapStart = end.rawStart = n;
        };
        switch (k) {
        case C_SEMICOLON:
            finish(TokenType::Semicolon, pos, 1);
            ++pos;
            continue;
        case C_QUOTE: {
            const QuoteScan q = scanQuote(s, n, pos);
            if (q.badCode != 0) {
                bad(q);
                return;
            }
            finish(TokenType::Quoted, pos, q.close - pos + 1);
            t.cooked = q.escaped;
            pos = q.close + 1;
            continue;
        }
        case C_CONTROL: {
            QuoteScan q;
            q.badCode = CONSTRAINT_ERR_INVALID_CHARACTER;
            q.badPos = pos;
            bad(q);
            return;
        }
        default:
            break;
        }
        const std::uint32_t begin = pos;
        while (isWordChar(s[pos]))
            ++pos;
        // Only a word that stops at a blank or a quote can be a pattern that
        // goes on: KEYWORD (...) or KEYWORD("...").
        bool cooked = false;
        const CharClass stop = classOf(s[pos]);
        const std::size_t keyword =
            stop == C_BLANK || stop == C_QUOTE ? patternKeywordLength(s + begin, pos - begin) : 0;
        if (keyword != 0) {
            // Blanks may stand before the "(", and quoted parts inside the
            // parentheses belong to the word.
            std::uint32_t p = begin + static_cast<std::uint32_t>(keyword);
            if (p == pos) {
                std::uint32_t j = pos;
                while (j < n && isBlank(s[j]))
                    ++j;
                cooked = j > pos && j < n && s[j] == '(';
                p = cooked ? j : 0;
            }
            if (p != 0) {
                int depth = 0;
                for (; p < n; ++p) {
                    const char d = s[p];
                    if (d == '(') {
                        ++depth;
                    } else if (d == ')') {
                        depth -= depth > 0 ? 1 : 0;
                    } else if (isQuote(d) && depth > 0) {
                        const QuoteScan q = scanQuote(s, n, p);
                        if (q.badCode != 0) {
                            bad(q);
                            return;
                        }
                        cooked = true;
                        p = q.close;
                    } else if (!isWordChar(d)) {
                        break;
                    }
                }
                pos = p;
            }
        }
        finish(TokenType::Word, begin, pos - begin);
        t.cooked = cooked;
        if (mayBeKeyword(s + begin, pos - begin))
            t.keyword = lookupKeyword(s + begin, pos - begin, begin + 8 <= n);
    }
}

const char* Reader::text(const Token& t) {
    if (!t.cooked)
        return pooledPrefix(t, t.length());
    if (t.pooled >= 0)
        return &m_pool[static_cast<std::size_t>(t.pooled)];
    // The decoded text is never longer than the raw one, for which start()
    // made room. Outside quotes only the blanks before a pattern's "(" are
    // dropped; inside them a doubled quote is one quote.
    char* out = &m_pool[m_poolUsed];
    std::size_t length = 0;
    char quote = 0;
    const char* s = m_text + t.rawStart;
    for (std::uint32_t i = 0; i < t.rawLength; ++i) {
        const char c = s[i];
        if (quote != 0) {
            if (c != quote)
                out[length++] = c;
            else if (i + 1 < t.rawLength && s[i + 1] == quote)
                out[length++] = s[i++];
            else
                quote = 0;
        } else if (isQuote(c)) {
            quote = c;
        } else if (!isBlank(c)) {
            out[length++] = c;
        }
    }
    out[length] = '\0';
    t.pooled = static_cast<std::int32_t>(m_poolUsed);
    m_poolUsed += length + 1;
    return out;
}

const char* Reader::pooledPrefix(const Token& t, std::uint32_t length) {
    if (t.pooled >= 0)
        return &m_pool[static_cast<std::size_t>(t.pooled)];
    if (m_poolUsed + length + 1 > m_pool.size())
        return ""; // unreachable: start() sized the pool for every token
    char* out = &m_pool[m_poolUsed];
    std::memcpy(out, m_text + t.start(), length);
    out[length] = '\0';
    t.pooled = static_cast<std::int32_t>(m_poolUsed);
    m_poolUsed += length + 1;
    return out;
}

// ---------------------------------------------------------------------------
// Errors and gaps

bool Reader::fail(int code, const Token& t) {
    if (t.type == TokenType::Bad)
        code = t.badCode;
    return failSpan(code, t.rawStart, t.rawLength);
}

bool Reader::failSpan(int code, std::uint32_t pos, std::uint32_t length) {
    if (m_errorCode != 0)
        return false;
    m_errorCode = code;
    m_errorColumn = static_cast<int>(pos) + 1;
    m_errorToken.assign(m_text + pos, length);
    return false;
}

bool Reader::unexpected(const Token& t) {
    switch (t.type) {
    case TokenType::Word: {
        // A word that could be a misspelt keyword is "unknown"; a known
        // keyword, a number or a symbol out of place is "unexpected".
        const char c = m_text[t.start()];
        const bool wordLike = isAlpha(c) || c == '_';
        return fail(t.keyword == KW_NONE && wordLike ? CONSTRAINT_ERR_UNKNOWN_KEYWORD
                                                     : CONSTRAINT_ERR_UNEXPECTED_TOKEN,
                    t);
    }
    case TokenType::End:
        return fail(CONSTRAINT_ERR_MISSING_SEMICOLON, t);
    default:
        return fail(CONSTRAINT_ERR_UNEXPECTED_TOKEN, t);
    }
}

std::uint32_t Reader::separatorPos(const Token& t, int i) const {
    for (std::uint32_t pos = t.gapStart; pos < t.rawStart; ++pos)
        if (classOf(m_text[pos]) == C_SEPARATOR && i-- == 0)
            return pos;
    return t.gapStart; // unreachable: the gap holds sepCount separators
}

bool Reader::checkGapSlow(const Token& t, Gap gap) {
    const int stray = CONSTRAINT_ERR_STRAY_SEPARATOR;
    switch (gap) {
    case Gap::Checked:
        return true;
    case Gap::Lead:
        if (t.sepCount > 0)
            return failSpan(stray, separatorPos(t, 0), 1);
        return true;
    case Gap::Trailing:
        if (t.sepCount > 0)
            return failSpan(CONSTRAINT_ERR_TRAILING_TEXT, separatorPos(t, 0), 1);
        return true;
    case Gap::Normal:
    case Gap::Glue:
        for (std::uint8_t i = 0; i < t.sepCount; ++i)
            if (t.sepChar[i] == '=' || i >= 1)
                return failSpan(stray, separatorPos(t, i), 1);
        if (gap == Gap::Normal && t.gapStart == t.rawStart &&
            (t.type == TokenType::Word || t.type == TokenType::Quoted))
            return fail(CONSTRAINT_ERR_MISSING_SEPARATOR, t);
        return true;
    case Gap::Definition:
    case Gap::GroupDefinition: {
        if (t.sepCount == 0)
            return fail(CONSTRAINT_ERR_EXPECTED_EQUALS, t);
        if (t.sepChar[0] != '=') {
            for (std::uint8_t i = 1; i < t.sepCount; ++i)
                if (t.sepChar[i] == '=')
                    return failSpan(stray, separatorPos(t, 0), 1);
            return fail(CONSTRAINT_ERR_EXPECTED_EQUALS, t);
        }
        std::uint8_t allowed = gap == Gap::GroupDefinition ? 2 : 1;
        for (std::uint8_t i = 1; i < t.sepCount; ++i)
            if (i >= allowed || t.sepChar[i] != ':')
                return failSpan(stray, separatorPos(t, i), 1);
        return true;
    }
    }
    return true;
}

// ---------------------------------------------------------------------------
// Names and values

bool Reader::readName(Gap gap, const char*& out) {
    const Token& t = tok();
    if (!checkGap(t, gap))
        return false;
    if (!isName(t))
        return fail(CONSTRAINT_ERR_EXPECTED_NAME, t);
    if (!checkNotEmpty(t))
        return false;
    out = text(t);
    advance();
    return true;
}

bool Reader::readQuantity(Gap gap, const QuantitySpec& spec, Quantity& out) {
    const Token& t = tok();
    if (!checkGap(t, gap))
        return false;
    if (t.type != TokenType::Word)
        return fail(CONSTRAINT_ERR_EXPECTED_VALUE, t);
    return readQuantityIn(t, 0, spec, true, out);
}

bool Reader::readQuantityIn(const Token& t, std::uint32_t offset, const QuantitySpec& spec,
                            bool allowSign, Quantity& out) {
    const std::uint32_t pos = t.start() + offset;
    const std::uint32_t length = t.length() - offset;
    const char* word = m_text + pos;
    const std::size_t numberLength = scanNumber(word, length, allowSign);
    if (numberLength == 0)
        return failSpan(CONSTRAINT_ERR_EXPECTED_VALUE, pos, length);

    const UnitEntry* unit = nullptr;
    if (numberLength < length) {
        // Unit written against the number: "10ns", "50%".
        const char* rest = word + numberLength;
        const auto restPos = static_cast<std::uint32_t>(pos + numberLength);
        const auto restLength = static_cast<std::uint32_t>(length - numberLength);
        if (!isAlpha(rest[0]) && rest[0] != '%')
            return failSpan(CONSTRAINT_ERR_BAD_NUMBER, pos, length);
        unit = findUnit(rest, restLength);
        if (unit == nullptr || (unit->mask & spec.units) == 0)
            return failSpan(CONSTRAINT_ERR_BAD_UNIT, restPos, restLength);
        advance();
    } else {
        advance();
        // A unit word may follow after blanks or one ':'; anything else is
        // left for the caller.
        const Token& u = tok();
        if (u.type == TokenType::Word) {
            const UnitEntry* next = findUnit(m_text + u.start(), u.length());
            if (next != nullptr) {
                if (!checkGap(u, Gap::Normal))
                    return false;
                if ((next->mask & spec.units) == 0)
                    return fail(CONSTRAINT_ERR_BAD_UNIT, u);
                unit = next;
                advance();
            }
        }
    }
    return convert(word, static_cast<std::uint32_t>(numberLength), unit ? unit->unit : U_NONE, pos,
                   length, spec, out);
}

bool Reader::convert(const char* number, std::uint32_t length, unsigned unitCode,
                     std::uint32_t valuePos, std::uint32_t valueLength, const QuantitySpec& spec,
                     Quantity& out) {
    const int range = CONSTRAINT_ERR_OUT_OF_RANGE;
    const char* first = number;
    if (*first == '+')
        ++first;
    double d = 0;
    if (!readDouble(first, number + length, d))
        return failSpan(range, valuePos, valueLength);

    auto unit = static_cast<Unit>(unitCode);
    if (unit == U_NONE)
        unit = spec.bare == Bare::Percent ? U_PERCENT : U_NS;
    const UnitEntry* entry = unitOf(unit);
    double v = d;
    out.isTime = true;
    out.isPercent = false;
    if (entry->mask == UNIT_FREQUENCY) {
        if (!(d > 0))
            return failSpan(range, valuePos, valueLength);
        v = entry->factor / d;
        out.isTime = false;
    } else if (entry->mask == UNIT_PERCENT) {
        out.isPercent = true;
        if (!(d > 0 && d <= 100))
            return failSpan(range, valuePos, valueLength);
    } else {
        v = d * entry->factor;
    }
    if (!std::isfinite(v))
        return failSpan(range, valuePos, valueLength);
    if ((spec.range == Range::Positive && !(v > 0)) || (spec.range == Range::NonNegative && v < 0))
        return failSpan(range, valuePos, valueLength);
    if (v == 0)
        v = 0.0; // no negative zero
    out.value = v;
    return true;
}

bool Reader::readFactor(const Token& t, std::uint32_t offset, double& factor) {
    const std::uint32_t pos = t.start() + offset;
    const std::uint32_t length = t.length() - offset;
    const char* word = m_text + pos;
    const std::size_t numberLength = scanNumber(word, length, true);
    if (numberLength == 0)
        return failSpan(CONSTRAINT_ERR_EXPECTED_VALUE, pos, length);
    if (numberLength < length) {
        const char* rest = word + numberLength;
        if (isAlpha(rest[0]) || rest[0] == '%')
            return failSpan(CONSTRAINT_ERR_BAD_UNIT, static_cast<std::uint32_t>(pos + numberLength),
                            static_cast<std::uint32_t>(length - numberLength));
        return failSpan(CONSTRAINT_ERR_BAD_NUMBER, pos, length);
    }
    const char* first = *word == '+' ? word + 1 : word;
    double d = 0;
    // A factor of 0 cannot be told from "no factor", and a negative one
    // makes no sense for a delay.
    if (!readDouble(first, word + numberLength, d) || !std::isfinite(d) || !(d > 0))
        return failSpan(CONSTRAINT_ERR_OUT_OF_RANGE, pos, length);
    factor = d;
    advance();
    return true;
}

bool Reader::readDelay(Gap gap, const QuantitySpec& spec, Delay& out) {
    out = Delay();
    const Token& t = tok();
    if (!checkGap(t, gap))
        return false;
    if (t.type == TokenType::Word && scanNumber(m_text + t.start(), t.length(), true) > 0) {
        Quantity q;
        if (!readQuantityIn(t, 0, spec, true, q))
            return false;
        out.valueOrFactor = q.value;
        out.isTime = q.isTime;
        return true;
    }

    // A link: a quoted TSid, or a word that begins with "TS".
    std::uint32_t nameLength = 0;
    if (t.type == TokenType::Quoted) {
        if (!checkNotEmpty(t))
            return false;
        out.link = text(t);
        nameLength = t.length();
    } else if (t.type == TokenType::Word && t.length() >= 2 && upper(m_text[t.start()]) == 'T' &&
               upper(m_text[t.start() + 1]) == 'S') {
        const char* word = m_text + t.start();
        while (nameLength < t.length() && word[nameLength] != '*' && word[nameLength] != '/')
            ++nameLength;
        out.link = pooledPrefix(t, nameLength);
    } else {
        return fail(CONSTRAINT_ERR_EXPECTED_VALUE, t);
    }

    // The operator: in the same word ("TS01*2", "TS01/"), or starting the next.
    const Token* op = &t;
    std::uint32_t opOffset = nameLength;
    if (t.type == TokenType::Quoted || nameLength == t.length()) {
        advance();
        const Token& next = tok();
        if (next.type != TokenType::Word ||
            (m_text[next.start()] != '*' && m_text[next.start()] != '/'))
            return true; // a link without factor
        if (!checkGap(next, Gap::Glue))
            return false;
        op = &next;
        opOffset = 0;
    }
    out.multiply = m_text[op->start() + opOffset] == '*';
    if (opOffset + 1 < op->length())
        return readFactor(*op, opOffset + 1, out.valueOrFactor);
    advance();
    const Token& f = tok();
    if (!checkGap(f, Gap::Normal))
        return false;
    if (f.type != TokenType::Word)
        return fail(CONSTRAINT_ERR_EXPECTED_VALUE, f);
    return readFactor(f, 0, out.valueOrFactor);
}

bool Reader::readPhase(Gap gap, bool& positive, double& ps) {
    static const QuantitySpec kPhase = {UNIT_TIME, Bare::Nanoseconds, Range::NonNegative};
    const Token& t = tok();
    if (!checkGap(t, gap))
        return false;
    if (t.type != TokenType::Word)
        return fail(CONSTRAINT_ERR_EXPECTED_VALUE, t);
    positive = true;
    Quantity q;
    const char sign = m_text[t.start()];
    if (sign == '+' || sign == '-') {
        positive = sign == '+';
        if (t.length() > 1) {
            if (!readQuantityIn(t, 1, kPhase, false, q))
                return false;
        } else {
            advance();
            const Token& n = tok();
            if (!checkGap(n, Gap::Normal))
                return false;
            if (n.type != TokenType::Word)
                return fail(CONSTRAINT_ERR_EXPECTED_VALUE, n);
            if (!readQuantityIn(n, 0, kPhase, false, q))
                return false;
        }
    } else if (!readQuantityIn(t, 0, kPhase, false, q)) {
        return false;
    }
    ps = q.value;
    return true;
}

bool Reader::readPriority(Gap gap, int& out) {
    const Token& t = tok();
    if (!checkGap(t, gap))
        return false;
    if (t.type != TokenType::Word)
        return fail(CONSTRAINT_ERR_EXPECTED_VALUE, t);
    const char* word = m_text + t.start();
    std::uint32_t i = (word[0] == '+' || word[0] == '-') ? 1 : 0;
    if (i == t.length())
        return fail(CONSTRAINT_ERR_EXPECTED_VALUE, t);
    for (std::uint32_t j = i; j < t.length(); ++j)
        if (!isDigit(word[j]))
            return fail(CONSTRAINT_ERR_BAD_NUMBER, t);
    long long value = 0;
    const char* first = word[0] == '+' ? word + 1 : word;
    std::from_chars_result r = std::from_chars(first, word + t.length(), value);
    if (r.ec != std::errc() || value < INT_MIN || value >= LogicalConstraintParser::kNoPriority)
        return fail(CONSTRAINT_ERR_OUT_OF_RANGE, t);
    out = static_cast<int>(value);
    advance();
    return true;
}

bool Reader::readTerminator(Gap gap) {
    const Token& t = tok();
    if (!checkGap(t, gap))
        return false;
    if (t.type != TokenType::Semicolon)
        return unexpected(t);
    m_terminatorEnd = t.rawStart + 1;
    advance();
    const Token& after = tok();
    if (!checkGap(after, Gap::Trailing))
        return false;
    if (after.type != TokenType::End)
        return fail(CONSTRAINT_ERR_TRAILING_TEXT, after);
    return true;
}

bool Reader::startsDelay(const Token& t) const {
    if (t.type == TokenType::Quoted)
        return true;
    if (t.type != TokenType::Word)
        return false;
    const char* word = m_text + t.start();
    return scanNumber(word, t.length(), true) > 0 ||
           (t.length() >= 2 && upper(word[0]) == 'T' && upper(word[1]) == 'S');
}

ConstraintHandle Reader::handle(ConstraintHandle::Kind kind, const Token& first) const {
    return ConstraintHandle(kind, static_cast<int>(first.rawStart) + 1,
                            static_cast<int>(m_terminatorEnd - first.rawStart));
}

// ---------------------------------------------------------------------------
// Pieces both grammars share

bool readOffsetBody(Reader& r, Gap gap, OffsetParts& out) {
    const Token& direction = r.tok();
    if (!r.checkGap(direction, gap))
        return false;
    if (Reader::isKeyword(direction, KW_IN))
        out.in = true;
    else if (Reader::isKeyword(direction, KW_OUT))
        out.in = false;
    else
        return r.unexpected(direction);
    r.advance();

    Quantity q;
    if (!r.readQuantity(Gap::Normal, kSignedTimeSpec, q))
        return false;
    out.offsetPs = q.value;

    if (r.at(KW_VALID)) {
        if (!r.checkGap(r.tok(), Gap::Normal))
            return false;
        r.advance();
        if (!r.readQuantity(Gap::Normal, kDurationSpec, q))
            return false;
        out.hasValid = true;
        out.validPs = q.value;
    }

    const Token& when = r.tok();
    if (!r.checkGap(when, Gap::Normal))
        return false;
    if (Reader::isKeyword(when, KW_BEFORE))
        out.before = true;
    else if (Reader::isKeyword(when, KW_AFTER))
        out.before = false;
    else
        return r.unexpected(when);
    r.advance();
    if (!r.readName(Gap::Normal, out.clock))
        return false;

    for (;;) {
        const Token& t = r.tok();
        if (Reader::isKeyword(t, KW_TIMEGRP)) {
            if (!r.checkGap(t, Gap::Normal))
                return false;
            if (out.regGroup != nullptr)
                return r.fail(CONSTRAINT_ERR_DUPLICATE, t);
            r.advance();
            if (!r.readName(Gap::Normal, out.regGroup))
                return false;
        } else if (Reader::isKeyword(t, KW_HIGH) || Reader::isKeyword(t, KW_LOW)) {
            if (!r.checkGap(t, Gap::Normal))
                return false;
            if (out.highLow != nullptr)
                return r.fail(CONSTRAINT_ERR_DUPLICATE, t);
            out.highLow = r.text(t);
            r.advance();
        } else {
            return true;
        }
    }
}

bool readPeriodOptions(Reader& r, bool full, PeriodOptions& out) {
    bool phase = false, duty = false, jitter = false, priority = false;
    for (;;) {
        const Token& t = r.tok();
        if (t.type != TokenType::Word)
            return true;
        bool* seen = nullptr;
        switch (t.keyword) {
        case KW_PHASE:
            seen = full ? &phase : nullptr;
            break;
        case KW_HIGH:
        case KW_LOW:
            seen = &duty;
            break;
        case KW_INPUT_JITTER:
            seen = &jitter;
            break;
        case KW_PRIORITY:
            seen = full ? &priority : nullptr;
            break;
        default:
            break;
        }
        if (seen == nullptr)
            return true; // not an option here: the caller reports it
        if (!r.checkGap(t, Gap::Normal))
            return false;
        if (*seen)
            return r.fail(CONSTRAINT_ERR_DUPLICATE, t);
        *seen = true;
        const Keyword keyword = t.keyword;
        r.advance();
        Quantity q;
        switch (keyword) {
        case KW_PHASE:
            if (!r.readPhase(Gap::Normal, out.phasePositive, out.phasePs))
                return false;
            break;
        case KW_HIGH:
        case KW_LOW:
            if (!r.readQuantity(Gap::Normal, kDutySpec, q))
                return false;
            out.dutyLow = keyword == KW_LOW;
            (q.isPercent ? out.dutyPercent : out.dutyTimePs) = q.value;
            break;
        case KW_INPUT_JITTER:
            if (!r.readQuantity(Gap::Normal, kDurationSpec, q))
                return false;
            out.hasJitter = true;
            out.jitterPs = q.value;
            break;
        default:
            if (!r.readPriority(Gap::Normal, out.priority))
                return false;
            break;
        }
    }
}

} // namespace tsd_constraint

const char* constraintErrorText(int code) {
    switch (code) {
    case CONSTRAINT_ERR_EMPTY:
        return "no constraint in the text";
    case CONSTRAINT_ERR_UNKNOWN_KEYWORD:
        return "unknown keyword";
    case CONSTRAINT_ERR_UNEXPECTED_TOKEN:
        return "unexpected token";
    case CONSTRAINT_ERR_EXPECTED_NAME:
        return "name expected";
    case CONSTRAINT_ERR_EXPECTED_EQUALS:
        return "'=' expected";
    case CONSTRAINT_ERR_EXPECTED_VALUE:
        return "value expected";
    case CONSTRAINT_ERR_BAD_NUMBER:
        return "malformed number";
    case CONSTRAINT_ERR_BAD_UNIT:
        return "bad unit";
    case CONSTRAINT_ERR_OUT_OF_RANGE:
        return "number out of range";
    case CONSTRAINT_ERR_DUPLICATE:
        return "option given twice";
    case CONSTRAINT_ERR_UNBALANCED_QUOTE:
        return "unbalanced quote";
    case CONSTRAINT_ERR_INVALID_CHARACTER:
        return "invalid character";
    case CONSTRAINT_ERR_STRAY_SEPARATOR:
        return "stray separator";
    case CONSTRAINT_ERR_MISSING_SEPARATOR:
        return "missing separator";
    case CONSTRAINT_ERR_MISSING_SEMICOLON:
        return "missing ';'";
    case CONSTRAINT_ERR_TRAILING_TEXT:
        return "text after ';'";
    case CONSTRAINT_ERR_TOO_LONG:
        return "text too long";
    default:
        return "error";
    }
}
