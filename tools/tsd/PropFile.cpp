#include "PropFile.h"

#include <cstdio>

namespace tsd_cli {

namespace {

bool isBlank(char c) {
    return c == ' ' || c == '\t';
}

bool isControl(char c) {
    auto u = static_cast<unsigned char>(c);
    return (u < 0x20 && c != '\t') || u == 0x7f;
}

// Ends a bare word.
bool endsBareWord(char c) {
    return isBlank(c) || c == '=' || c == '"';
}

// A cursor over one line that reads the words of a property.
class LineReader {
public:
    explicit LineReader(std::string_view text) : m_text(text) {}

    void skipBlanks() {
        while (m_pos < m_text.size() && isBlank(m_text[m_pos]))
            ++m_pos;
    }
    bool atEnd() const { return m_pos >= m_text.size(); }
    char peek() const { return m_text[m_pos]; }
    void advance() { ++m_pos; }
    std::string_view rest() const { return m_text.substr(m_pos); }

    // A bare run of characters up to a blank, '=' or '"'; may be empty.
    std::string_view bareRun() {
        std::size_t start = m_pos;
        while (m_pos < m_text.size() && !endsBareWord(m_text[m_pos]))
            ++m_pos;
        return m_text.substr(start, m_pos - start);
    }

    // A name or element after blanks. False with `error` set when it is
    // malformed; `word` is empty (and no error set) when there is none.
    bool readWord(std::string& word, std::string& error) {
        word.clear();
        skipBlanks();
        if (atEnd() || peek() == '=')
            return true;
        if (peek() != '"') {
            word = std::string(bareRun());
            if (!atEnd() && peek() == '"') {
                error = "unexpected '\"' in the name " + inQuotes(word);
                return false;
            }
            return true;
        }
        advance(); // the opening quote
        for (;;) {
            if (atEnd()) {
                error = "unterminated quoted name";
                return false;
            }
            char c = peek();
            advance();
            if (c == '"')
                break;
            if (c == '\\') {
                if (atEnd()) {
                    error = "unterminated quoted name";
                    return false;
                }
                char escaped = peek();
                if (escaped != '"' && escaped != '\\') {
                    error = std::string("unknown escape \"\\") + escaped +
                            "\" in a quoted name (only \\\" and \\\\ are allowed)";
                    return false;
                }
                advance();
                word += escaped;
                continue;
            }
            word += c;
        }
        if (word.empty()) {
            error = "empty quoted name";
            return false;
        }
        if (!atEnd() && !isBlank(peek()) && peek() != '=') {
            error = "expected a blank or \"=\" after the quoted name " + inQuotes(word);
            return false;
        }
        return true;
    }

private:
    std::string_view m_text;
    std::size_t m_pos = 0;
};

std::string_view trimBlanks(std::string_view text) {
    while (!text.empty() && isBlank(text.front()))
        text.remove_prefix(1);
    while (!text.empty() && isBlank(text.back()))
        text.remove_suffix(1);
    return text;
}

} // namespace

const char* propKeyword(PropKind kind) {
    switch (kind) {
    case PropKind::Group:
        return "group";
    case PropKind::Spec:
        return "spec";
    case PropKind::Ref:
        return "ref";
    }
    return "?";
}

LineStatus parsePropLine(std::string_view text, PropLine& prop, std::string& error) {
    if (!text.empty() && text.back() == '\r')
        text.remove_suffix(1);
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (isControl(text[i])) {
            char code[8];
            std::snprintf(code, sizeof code, "0x%02X", static_cast<unsigned char>(text[i]));
            error =
                std::string("control character ") + code + " in column " + std::to_string(i + 1);
            return LineStatus::Malformed;
        }
    }

    LineReader reader(text);
    reader.skipBlanks();
    if (reader.atEnd() || reader.peek() == '#')
        return LineStatus::Blank;

    std::string_view keyword = reader.bareRun();
    if (keyword == "group") {
        prop.kind = PropKind::Group;
    } else if (keyword == "spec") {
        prop.kind = PropKind::Spec;
    } else if (keyword == "ref") {
        prop.kind = PropKind::Ref;
    } else {
        if (keyword.empty())
            error = "expected group, spec or ref at the start of the line";
        else
            error = "unknown keyword " + inQuotes(keyword) +
                    " at the start of the line (expected group, spec or ref)";
        return LineStatus::Malformed;
    }

    prop.element.clear();
    if (prop.kind == PropKind::Ref) {
        if (!reader.readWord(prop.element, error))
            return LineStatus::Malformed;
        if (prop.element.empty()) {
            error = "missing element after \"ref\"";
            return LineStatus::Malformed;
        }
    }
    if (!reader.readWord(prop.name, error))
        return LineStatus::Malformed;
    if (prop.name.empty()) {
        error = prop.kind == PropKind::Ref
                    ? "missing property name after the element " + inQuotes(prop.element)
                    : std::string("missing name after \"") + propKeyword(prop.kind) + "\"";
        return LineStatus::Malformed;
    }

    reader.skipBlanks();
    if (reader.atEnd() || reader.peek() != '=') {
        error = "missing \"=\" after " + inQuotes(prop.name);
        if (!reader.atEnd()) {
            std::string found;
            std::string ignored;
            if (reader.readWord(found, ignored) && !found.empty())
                error += " (found " + inQuotes(found) + ")";
        }
        return LineStatus::Malformed;
    }
    reader.advance();
    prop.value = std::string(trimBlanks(reader.rest()));
    return LineStatus::Property;
}

std::string inQuotes(std::string_view text) {
    return "\"" + std::string(text) + "\"";
}

std::string quoteWord(std::string_view word) {
    bool bare = !word.empty();
    for (char c : word)
        if (endsBareWord(c))
            bare = false;
    if (bare)
        return std::string(word);
    std::string quoted = "\"";
    for (char c : word) {
        if (c == '"' || c == '\\')
            quoted += '\\';
        quoted += c;
    }
    quoted += '"';
    return quoted;
}

std::string formatPropLine(PropKind kind, std::string_view element, std::string_view name,
                           std::string_view value) {
    std::string line = propKeyword(kind);
    if (kind == PropKind::Ref) {
        line += ' ';
        line += quoteWord(element);
    }
    line += ' ';
    line += quoteWord(name);
    line += " =";
    if (!value.empty()) {
        line += ' ';
        line += value;
    }
    return line;
}

std::vector<std::string> valueWords(std::string_view value) {
    std::vector<std::string> words;
    std::string word;
    bool inWord = false;
    char quote = 0;
    for (char c : value) {
        if (quote != 0) {
            if (c == quote)
                quote = 0;
            else
                word += c;
            continue;
        }
        if (c == '"' || c == '\'') {
            quote = c;
            inWord = true;
            continue;
        }
        if (isBlank(c) || c == ':' || c == '=' || c == ';') {
            if (inWord)
                words.push_back(word);
            word.clear();
            inWord = false;
            continue;
        }
        word += c;
        inWord = true;
    }
    if (inWord)
        words.push_back(word);
    return words;
}

} // namespace tsd_cli
