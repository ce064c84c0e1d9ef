// The OFFSET feature reducer.
#include "tsd/Tsd_Parsers.h"

#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_Report.h"

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

// Splits at ':', '=' and blanks; a quoted part is one token, without quotes.
std::vector<std::string> tokenize(const std::string& text) {
    std::vector<std::string> tokens;
    size_t i = 0;
    const size_t n = text.size();
    while (i < n) {
        if (isSeparator(text[i])) {
            ++i;
            continue;
        }
        std::string token;
        while (i < n && !isSeparator(text[i])) {
            char c = text[i];
            if (c == '"' || c == '\'') {
                size_t close = text.find(c, i + 1);
                if (close == std::string::npos)
                    close = n; // an unbalanced quote runs to the end
                token.append(text, i + 1, close - i - 1);
                i = close < n ? close + 1 : n;
            } else {
                token += c;
                ++i;
            }
        }
        tokens.push_back(std::move(token));
    }
    return tokens;
}

bool needsQuotes(const std::string& token) {
    // Besides blanks, tabs and colons, '=' and ';' would also split or end
    // the token when the reduced text is parsed.
    return token.empty() || token.find_first_of(" \t:=;") != std::string::npos;
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
    std::string body = text;
    bool mentionsOffset = false;
    for (size_t i = 0; i + 6 <= body.size() && !mentionsOffset; ++i)
        mentionsOffset = tsd_detail::startsWithNoCase(body.c_str() + i, "OFFSET");
    if (!mentionsOffset)
        return false;
    while (!body.empty() && (body.back() == ';' || body.back() == ' '))
        body.pop_back();

    std::vector<std::string> tokens = tokenize(body);
    size_t at = 0;
    size_t required = 4;
    if (tokens.size() >= 4 && equalsNoCase(tokens[0].c_str(), "TIMEGRP")) {
        at = 2;
        required = 6;
    }
    if (tokens.size() < required || !equalsNoCase(tokens[at].c_str(), "OFFSET"))
        return false;

    size_t valueAt = at + 2;
    size_t scan = valueAt;
    if (equalsNoCase(tokens[valueAt].c_str(), "BEFORE") ||
        equalsNoCase(tokens[valueAt].c_str(), "AFTER")) {
        m_hasValue = false;
        tokens.insert(tokens.begin() + static_cast<std::ptrdiff_t>(valueAt), "0");
        scan = valueAt + 2;
    }
    while (scan < tokens.size()) {
        const char* token = tokens[scan].c_str();
        if (equalsNoCase(token, "REFERENCE_PIN")) {
            if (scan + 1 >= tokens.size())
                break; // a trailing REFERENCE_PIN stays in the text
            m_refPin = tokens[scan + 1];
            tokens.erase(tokens.begin() + static_cast<std::ptrdiff_t>(scan),
                         tokens.begin() + static_cast<std::ptrdiff_t>(scan + 2));
        } else if (equalsNoCase(token, "RISING")) {
            m_regEdge = Tsd_UserGroup::EDGE_RISING;
            tokens.erase(tokens.begin() + static_cast<std::ptrdiff_t>(scan));
        } else if (equalsNoCase(token, "FALLING")) {
            m_regEdge = Tsd_UserGroup::EDGE_FALLING;
            tokens.erase(tokens.begin() + static_cast<std::ptrdiff_t>(scan));
        } else {
            ++scan;
        }
    }
    if (m_hasValue && m_refPin.empty() && m_regEdge == Tsd_UserGroup::EDGE_ANY)
        return false;

    for (const std::string& token : tokens) {
        if (needsQuotes(token))
            m_reduced += '"' + token + '"';
        else
            m_reduced += token;
        m_reduced += equalsNoCase(token.c_str(), "OFFSET") ? "=" : ":";
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
