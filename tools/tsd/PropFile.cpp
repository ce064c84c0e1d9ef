#include "PropFile.h"

#include <cstdint>
#include <cstdio>
#include <cstring>
#include <stdexcept>

namespace tsd_cli {

namespace {

// What each byte is to a property line, looked up rather than compared.
enum : std::uint8_t { kBlank = 1, kEndsBare = 2, kControl = 4 };

struct CharClasses {
    std::uint8_t of[256] = {};
    constexpr CharClasses() {
        for (int c = 0; c < 256; ++c) {
            if (c == ' ' || c == '\t')
                of[c] |= kBlank | kEndsBare;
            if (c == '=' || c == '"')
                of[c] |= kEndsBare;
            if ((c < 0x20 && c != '\t') || c == 0x7f)
                of[c] |= kControl;
        }
    }
};
constexpr CharClasses kClasses;

bool is(char c, std::uint8_t what) {
    return (kClasses.of[static_cast<unsigned char>(c)] & what) != 0;
}

bool isBlank(char c) {
    return is(c, kBlank);
}

// Ends a bare word.
bool endsBareWord(char c) {
    return is(c, kEndsBare);
}

// Where the first control character (a tab is none) stands, or npos. Eight
// bytes at a time, since almost every line has none: a word with no byte
// below 0x20 and none equal to 0x7F is passed over whole.
std::size_t firstControl(std::string_view text) {
    constexpr std::uint64_t kOnes = 0x0101010101010101u;
    constexpr std::uint64_t kHighs = 0x8080808080808080u;
    std::size_t i = 0;
    for (; i + 8 <= text.size(); i += 8) {
        std::uint64_t word;
        std::memcpy(&word, text.data() + i, 8);
        std::uint64_t below = (word - kOnes * 0x20) & ~word & kHighs;
        std::uint64_t del = word ^ (kOnes * 0x7F);
        std::uint64_t isDel = (del - kOnes) & ~del & kHighs;
        if ((below | isDel) == 0)
            continue;
        for (std::size_t j = i; j < i + 8; ++j)
            if (is(text[j], kControl))
                return j;
    }
    for (; i < text.size(); ++i)
        if (is(text[i], kControl))
            return i;
    return std::string_view::npos;
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
    bool readWord(Word& word, std::string& error) {
        word = Word();
        skipBlanks();
        if (atEnd() || peek() == '=')
            return true;
        if (peek() != '"') {
            word.text = bareRun();
            if (!atEnd() && peek() == '"') {
                error = "unexpected '\"' in the name " + inQuotes(word.text);
                return false;
            }
            return true;
        }
        advance(); // the opening quote
        std::size_t start = m_pos;
        for (;;) {
            if (atEnd()) {
                error = "unterminated quoted name";
                return false;
            }
            char c = peek();
            if (c == '"')
                break;
            advance();
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
                word.escaped = true;
            }
        }
        word.text = m_text.substr(start, m_pos - start);
        advance(); // the closing quote
        if (word.text.empty()) {
            error = "empty quoted name";
            return false;
        }
        if (!atEnd() && !isBlank(peek()) && peek() != '=') {
            error = "expected a blank or \"=\" after the quoted name " + inQuotes(word.str());
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

std::string Word::str() const {
    if (!escaped)
        return std::string(text);
    std::string word;
    word.reserve(text.size());
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] == '\\' && i + 1 < text.size())
            ++i;
        word += text[i];
    }
    return word;
}

LineStatus parsePropLine(std::string_view text, PropFields& prop, std::string& error) {
    if (!text.empty() && text.back() == '\r')
        text.remove_suffix(1);
    if (std::size_t i = firstControl(text); i != std::string_view::npos) {
        char code[8];
        std::snprintf(code, sizeof code, "0x%02X", static_cast<unsigned char>(text[i]));
        error = std::string("control character ") + code + " in column " + std::to_string(i + 1);
        return LineStatus::Malformed;
    }

    LineReader reader(text);
    reader.skipBlanks();
    if (reader.atEnd() || reader.peek() == '#')
        return LineStatus::Blank;

    std::string_view keyword = reader.bareRun();
    if (keyword == "ref") {
        prop.kind = PropKind::Ref;
    } else if (keyword == "group") {
        prop.kind = PropKind::Group;
    } else if (keyword == "spec") {
        prop.kind = PropKind::Spec;
    } else {
        if (keyword.empty())
            error = "expected group, spec or ref at the start of the line";
        else
            error = "unknown keyword " + inQuotes(keyword) +
                    " at the start of the line (expected group, spec or ref)";
        return LineStatus::Malformed;
    }

    prop.element = Word();
    if (prop.kind == PropKind::Ref) {
        if (!reader.readWord(prop.element, error))
            return LineStatus::Malformed;
        if (prop.element.text.empty()) {
            error = "missing element after \"ref\"";
            return LineStatus::Malformed;
        }
    }
    if (!reader.readWord(prop.name, error))
        return LineStatus::Malformed;
    if (prop.name.text.empty()) {
        error = prop.kind == PropKind::Ref
                    ? "missing property name after the element " + inQuotes(prop.element.str())
                    : std::string("missing name after \"") + propKeyword(prop.kind) + "\"";
        return LineStatus::Malformed;
    }

    reader.skipBlanks();
    if (reader.atEnd() || reader.peek() != '=') {
        error = "missing \"=\" after " + inQuotes(prop.name.str());
        if (!reader.atEnd()) {
            Word found;
            std::string ignored;
            if (reader.readWord(found, ignored) && !found.text.empty())
                error += " (found " + inQuotes(found.str()) + ")";
        }
        return LineStatus::Malformed;
    }
    reader.advance();
    prop.value = trimBlanks(reader.rest());
    return LineStatus::Property;
}

std::uint32_t PropStore::addFile(std::string displayName, std::string text) {
    m_files.push_back({std::move(displayName), std::move(text)});
    return static_cast<std::uint32_t>(m_files.size() - 1);
}

TextSpan PropStore::spanIn(std::uint32_t file, std::string_view part) const {
    std::string_view text = fileText(file);
    return {static_cast<std::uint32_t>(part.data() - text.data()),
            static_cast<std::uint32_t>(part.size())};
}

TextSpan PropStore::keep(std::string_view text) {
    if (text.size() > kMaxText - m_arena.size())
        throw std::length_error("more than 4 GiB of property text");
    TextSpan span{static_cast<std::uint32_t>(m_arena.size()),
                  static_cast<std::uint32_t>(text.size())};
    m_arena.append(text);
    return span;
}

std::size_t PropStore::add(const StoredProp& record) {
    m_records.push_back(record);
    return m_records.size() - 1;
}

std::size_t PropStore::add(PropKind kind, std::uint32_t file, std::uint32_t line,
                           std::string_view element, std::string_view name,
                           std::string_view value) {
    StoredProp record;
    record.kind = kind;
    record.file = file;
    record.line = line;
    record.element = keep(element);
    record.name = keep(name);
    record.value = keep(value);
    record.inArena = StoredProp::Element | StoredProp::Name | StoredProp::Value;
    return add(record);
}

std::string inQuotes(std::string_view text) {
    std::string quoted;
    quoted.reserve(text.size() + 2);
    quoted += '"';
    quoted += text;
    quoted += '"';
    return quoted;
}

void appendQuotedWord(std::string& out, std::string_view word) {
    bool bare = !word.empty();
    for (char c : word)
        if (endsBareWord(c))
            bare = false;
    if (bare) {
        out += word;
        return;
    }
    out += '"';
    for (char c : word) {
        if (c == '"' || c == '\\')
            out += '\\';
        out += c;
    }
    out += '"';
}

std::string_view refValueText(std::string_view value, std::string& scratch) {
    if (value.empty() ||
        (value.front() != '"' && !isBlank(value.front()) && !isBlank(value.back())))
        return value;
    scratch.clear();
    appendQuotedWord(scratch, value);
    return scratch;
}

std::string quoteWord(std::string_view word) {
    std::string quoted;
    appendQuotedWord(quoted, word);
    return quoted;
}

void appendPropLine(std::string& out, PropKind kind, std::string_view element,
                    std::string_view name, std::string_view value) {
    out += propKeyword(kind);
    if (kind == PropKind::Ref) {
        out += ' ';
        appendQuotedWord(out, element);
    }
    out += ' ';
    appendQuotedWord(out, name);
    out += " =";
    if (!value.empty()) {
        out += ' ';
        out += value;
    }
    out += '\n';
}

std::string formatPropLine(PropKind kind, std::string_view element, std::string_view name,
                           std::string_view value) {
    std::string line;
    appendPropLine(line, kind, element, name, value);
    line.pop_back();
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
