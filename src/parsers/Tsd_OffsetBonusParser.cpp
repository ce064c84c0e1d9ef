// The OFFSET feature reducer.
#include "tsd/Tsd_Parsers.h"

#include "host/ConstraintLexer.h"
#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_Report.h"

#include <cctype>
#include <cstdlib>
#include <cstring>

using tsd_detail::equalsNoCase;

namespace {

// Read once, when the library is loaded.
const bool g_reducerDisabled = std::getenv("QOR_TSD_NO_SPECIAL_PARSER") != nullptr;
const bool g_reducerDebug = std::getenv("QOR_TSD_DEBUG_SPECIAL_PARSER") != nullptr;

bool isSeparator(char c) {
    return c == ':' || c == '=' || c == ' ';
}

bool isSpace(char c) {
    return std::isspace(static_cast<unsigned char>(c)) != 0;
}

struct Token {
    std::string text;
    bool quoted = false; // a quoted part made it: never a keyword
};

// Moves token `from` to the next kept place.
void keep(std::vector<Token>& tokens, size_t& kept, size_t from) {
    if (kept != from)
        tokens[kept] = std::move(tokens[from]);
    ++kept;
}

bool isKeyword(const Token& token, const char* keyword) {
    return !token.quoted && equalsNoCase(token.text.c_str(), keyword);
}

// Splits at ':', '=' and blanks; a quoted part belongs to its token without
// its quotes (a doubled quote inside stands for one). A predefined-group
// keyword followed by blanks and "(" goes on as one pattern without the
// blanks, as the parsers read it.
std::vector<Token> tokenize(const std::string& text) {
    std::vector<Token> tokens;
    size_t i = 0;
    const size_t n = text.size();
    while (i < n) {
        if (isSeparator(text[i])) {
            ++i;
            continue;
        }
        Token token;
        std::string& t = token.text;
        while (i < n) {
            char c = text[i];
            if (isSpace(c) && !t.empty() &&
                tsd_constraint::patternKeywordLength(t.data(), t.size()) == t.size()) {
                size_t j = i;
                while (j < n && isSpace(text[j]))
                    ++j;
                if (j < n && text[j] == '(') {
                    i = j;
                    continue;
                }
            }
            if (isSeparator(c))
                break;
            if (c == '"' || c == '\'') {
                // An unbalanced quote runs to the end.
                token.quoted = true;
                size_t k = i + 1;
                while (k < n && (text[k] != c || (k + 1 < n && text[k + 1] == c))) {
                    if (text[k] == c)
                        ++k;
                    t += text[k];
                    ++k;
                }
                i = k < n ? k + 1 : n;
            } else {
                t += c;
                ++i;
            }
        }
        tokens.push_back(std::move(token));
    }
    return tokens;
}

} // namespace

bool Tsd_OffsetBonusParser::isDisabled() {
    return g_reducerDisabled;
}

bool Tsd_OffsetBonusParser::isDebugEnabled() {
    return g_reducerDebug;
}

void Tsd_OffsetBonusParser::reset() {
    m_reduced.clear();
    m_refPin.clear();
    m_regEdge = Tsd_UserGroup::EDGE_ANY;
    m_hasValue = true;
}

bool Tsd_OffsetBonusParser::reduceOffset(const char* text) {
    reset();
    if (text == nullptr)
        return false;
    // Most texts never mention the keyword: they are not copied. Only an
    // 'o' can begin it, a cheap test before the full one.
    bool mentionsOffset = false;
    for (const char* p = text; *p != 0 && !mentionsOffset; ++p)
        mentionsOffset = (*p | 0x20) == 'o' && tsd_detail::startsWithNoCase(p, "OFFSET", 6);
    if (!mentionsOffset)
        return false;
    std::string body = text;
    while (!body.empty() && (body.back() == ';' || body.back() == ' '))
        body.pop_back();

    std::vector<Token> tokens = tokenize(body);
    size_t at = 0;
    size_t required = 4;
    if (tokens.size() >= 4 && isKeyword(tokens[0], "TIMEGRP")) {
        at = 2;
        required = 6;
    }
    if (tokens.size() < required || !isKeyword(tokens[at], "OFFSET"))
        return false;

    size_t valueAt = at + 2;
    size_t scan = valueAt;
    if (isKeyword(tokens[valueAt], "BEFORE") || isKeyword(tokens[valueAt], "AFTER")) {
        m_hasValue = false;
        tokens.insert(tokens.begin() + static_cast<std::ptrdiff_t>(valueAt), Token{"0", false});
        scan = valueAt + 2;
    }
    // The tokens that stay are moved up over the removed ones in one pass.
    size_t kept = scan;
    for (; scan < tokens.size(); ++scan) {
        const Token& token = tokens[scan];
        if (isKeyword(token, "REFERENCE_PIN")) {
            if (scan + 1 >= tokens.size())
                break; // a trailing REFERENCE_PIN stays in the text
            m_refPin = tokens[++scan].text;
        } else if (isKeyword(token, "RISING")) {
            m_regEdge = Tsd_UserGroup::EDGE_RISING;
        } else if (isKeyword(token, "FALLING")) {
            m_regEdge = Tsd_UserGroup::EDGE_FALLING;
        } else {
            keep(tokens, kept, scan);
        }
    }
    for (; scan < tokens.size(); ++scan)
        keep(tokens, kept, scan);
    tokens.resize(kept);
    if (m_hasValue && m_refPin.empty() && m_regEdge == Tsd_UserGroup::EDGE_ANY)
        return false;

    for (const Token& token : tokens) {
        // Quoted so that the parser reads it back as this one token, and
        // never as a keyword if it was quoted here.
        const std::string& t = token.text;
        if (tsd_constraint::isBareWord(t.data(), t.size()) &&
            !(token.quoted &&
              tsd_constraint::classifyWord(t.data(), t.size()) != tsd_constraint::KW_NONE))
            m_reduced += t;
        else
            tsd_constraint::appendQuoted(m_reduced, t.data(), t.size());
        m_reduced += isKeyword(token, "OFFSET") ? "=" : ":";
    }
    m_reduced += " ;";

    if (g_reducerDebug) {
        Message msg = TSD_MSG();
        msg.status("Detected special features in OFFSET:\n");
        msg.status("  original : %s\n", text);
        msg.status("  reduced  : %s\n", m_reduced.c_str());
        msg.status("  has value: %s\n", m_hasValue ? "true" : "false");
        msg.status("  ref pin  : %s\n", m_refPin.c_str());
        msg.status("  reg edge : %s\n", m_regEdge == Tsd_UserGroup::EDGE_RISING    ? "RISING"
                                        : m_regEdge == Tsd_UserGroup::EDGE_FALLING ? "FALLING"
                                                                                   : "-");
    }
    return true;
}
