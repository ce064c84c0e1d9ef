#include "Statements.h"

#include "Hints.h"

#include <algorithm>
#include <cctype>
#include <stdexcept>

namespace tsd_cli {

namespace {

// --- Characters -------------------------------------------------------------

// A carriage return that does not end a line is a blank like the others.
bool isBlank(char c) {
    return c == ' ' || c == '\t' || c == '\r' || c == '\v' || c == '\f';
}

// Ends a bare word of a statement.
bool isSeparator(char c) {
    return isBlank(c) || c == '\n' || c == '=' || c == ';' || c == '|' || c == ':';
}

bool commentAt(std::string_view text, std::size_t pos, std::size_t limit) {
    return text[pos] == '#' || (text[pos] == '/' && pos + 1 < limit && text[pos + 1] == '/');
}

// The line end that stands before the line beginning at `lineBegin`.
std::string_view lineEndBefore(std::string_view text, std::size_t lineBegin) {
    if (lineBegin == 0)
        return {};
    std::size_t length = lineBegin >= 2 && text[lineBegin - 2] == '\r' ? 2 : 1;
    return text.substr(lineBegin - length, length);
}

constexpr std::string_view kGroupOffsetName = "TS_GROUP_BASED_OFFSET";

// --- Messages ---------------------------------------------------------------

namespace msg {

std::string unterminatedQuote() {
    return "unterminated quote: a quoted name must end on the line it begins on";
}

std::string unclosedInList() {
    return "unterminated quote: a name of the list opens a quote that its word does not close";
}

std::string missingSemicolon(int nextLine) {
    std::string text = "missing \";\" at the end of the statement";
    if (nextLine > 0)
        text += " (a new statement begins on line " + std::to_string(nextLine) + ")";
    return text;
}

std::string missingWord(std::string_view what, std::string_view keyword) {
    return "missing " + std::string(what) + " after " + std::string(keyword);
}

std::string missingEquals(std::string_view after, std::string_view found) {
    std::string text = "missing \"=\" after " + std::string(after);
    if (!found.empty())
        text += " (found " + inQuotes(found) + ")";
    return text;
}

std::string emptyName() {
    return "empty quoted name";
}

std::string noValue(std::string_view attribute) {
    return "attribute " + inQuotes(attribute) + " without its value";
}

std::string unexpectedInValue(std::string_view found, std::string_view attribute) {
    std::string text = "unexpected " + inQuotes(found) + " in the value of " + inQuotes(attribute);
    if (found == "=")
        text += " (is a \"|\" missing between two attributes?)";
    return text;
}

std::string notOneName(std::string_view attribute) {
    return "the value of " + inQuotes(attribute) + " must be one name";
}

std::string badQualifier(std::string_view attribute) {
    return "the value of " + inQuotes(attribute) +
           " must be a group name, after at most one qualifier such as FFS(*)";
}

std::string noGroupName(std::string_view attribute) {
    return "the value of " + inQuotes(attribute) + " ends without its group name";
}

std::string noStatementFor(std::string_view property) {
    return "no statement hands over the property " + inQuotes(property);
}

std::string cannotWrite(std::string_view what) {
    return "cannot write " + inQuotes(what) + " so that a statement file reads it back";
}

} // namespace msg

// --- Lexer ------------------------------------------------------------------

enum class Tok { Word, Equals, Semicolon, Bar, Colon, End };

struct Token {
    Tok kind = Tok::End;
    std::size_t begin = 0;
    std::size_t end = 0;
    std::size_t lineBegin = 0;
    TextPos pos;
    bool lineStart = false;    // only blanks stand before it on its line
    bool quoted = false;       // one quoted string and nothing else
    bool unterminated = false; // a quote in it runs to the end of the line
};

struct Comment {
    std::size_t begin = 0;
    std::size_t end = 0;    // before its line end
    std::size_t eolEnd = 0; // past its line end
    std::size_t lineBegin = 0;
    bool ownLine = false;
};

// Words, '=', ';', '|' and ':' of statement text; blanks, line ends and
// comments are skipped (and collected on request). A double quote opens a
// quoted run anywhere, a single quote only at the start of a word; a quoted
// run ends on its line.
class Lexer {
public:
    Lexer(std::string_view text, std::size_t pos, std::size_t limit, bool lineHasText)
        : m_text(text), m_pos(pos), m_limit(limit), m_lineBegin(pos), m_lineHasText(lineHasText) {}

    void collectComments(std::vector<Comment>* comments) { m_comments = comments; }

    Token next() {
        skipTrivia();
        Token token;
        token.begin = m_pos;
        token.lineBegin = m_lineBegin;
        token.pos = {m_line, static_cast<int>(m_pos - m_lineBegin + 1)};
        if (m_pos >= m_limit) {
            token.end = m_pos;
            return token;
        }
        token.lineStart = !m_lineHasText;
        m_lineHasText = true;
        switch (m_text[m_pos]) {
        case '=':
            token.kind = Tok::Equals;
            break;
        case ';':
            token.kind = Tok::Semicolon;
            break;
        case '|':
            token.kind = Tok::Bar;
            break;
        case ':':
            token.kind = Tok::Colon;
            break;
        default:
            token.kind = Tok::Word;
            word(token);
            token.end = m_pos;
            return token;
        }
        token.end = ++m_pos;
        return token;
    }

private:
    // The '\n' ending the line at `pos`, or the limit.
    std::size_t lineEndFrom(std::size_t pos) const {
        while (pos < m_limit && m_text[pos] != '\n')
            ++pos;
        return pos;
    }

    void skipTrivia() {
        while (m_pos < m_limit) {
            char c = m_text[m_pos];
            if (c == '\n') {
                ++m_pos;
                ++m_line;
                m_lineBegin = m_pos;
                m_lineHasText = false;
            } else if (isBlank(c)) {
                ++m_pos;
            } else if (commentAt(m_text, m_pos, m_limit)) {
                std::size_t newline = lineEndFrom(m_pos);
                if (m_comments != nullptr) {
                    Comment comment;
                    comment.begin = m_pos;
                    comment.end = newline;
                    if (newline < m_limit && m_text[newline - 1] == '\r')
                        --comment.end;
                    comment.eolEnd = newline < m_limit ? newline + 1 : newline;
                    comment.lineBegin = m_lineBegin;
                    comment.ownLine = !m_lineHasText;
                    m_comments->push_back(comment);
                }
                m_pos = newline;
            } else {
                return;
            }
        }
    }

    void word(Token& token) {
        std::size_t start = m_pos;
        std::size_t firstClose = std::string_view::npos; // of a quote that opens the word
        while (m_pos < m_limit) {
            char c = m_text[m_pos];
            if (isSeparator(c) || commentAt(m_text, m_pos, m_limit))
                break;
            if (c == '"' || (c == '\'' && m_pos == start)) {
                std::size_t close = m_pos + 1;
                while (close < m_limit && m_text[close] != c && m_text[close] != '\n')
                    ++close;
                if (close >= m_limit || m_text[close] != c) {
                    token.unterminated = true;
                    m_pos = close;
                    if (m_pos < m_limit && m_text[m_pos - 1] == '\r')
                        --m_pos;
                    return;
                }
                if (m_pos == start)
                    firstClose = close;
                m_pos = close + 1;
                continue;
            }
            ++m_pos;
        }
        token.quoted = firstClose != std::string_view::npos && firstClose + 1 == m_pos;
    }

    std::string_view m_text;
    std::size_t m_pos;
    std::size_t m_limit;
    std::size_t m_lineBegin;
    bool m_lineHasText;
    int m_line = 1;
    std::vector<Comment>* m_comments = nullptr;
};

std::string_view rawText(std::string_view text, const Token& token) {
    return text.substr(token.begin, token.end - token.begin);
}

// One quoted string and nothing else: the text inside; else the word.
std::string wordName(std::string_view text, const Token& token) {
    std::string_view raw = rawText(text, token);
    if (token.quoted && raw.size() >= 2 && raw.front() == raw.back())
        return std::string(raw.substr(1, raw.size() - 2));
    return std::string(raw);
}

bool isKeyword(std::string_view text, const Token& token, std::string_view keyword) {
    return token.kind == Tok::Word && !token.quoted && equalsNoCase(rawText(text, token), keyword);
}

TextPos endPos(const Token& token) {
    return {token.pos.line, token.pos.column + static_cast<int>(token.end - token.begin)};
}

// --- Values -----------------------------------------------------------------

// Puts every word of constraint text that holds '#', "//", ';' or '|'
// outside quotes into quotes, so a statement reads it back as one word.
// A predefined-group pattern KEYWORD(...) gets its pattern quoted instead.
bool quoteCommentWords(std::string_view value, std::string& out) {
    out.clear();
    std::size_t i = 0;
    while (i < value.size()) {
        char c = value[i];
        if (isBlank(c) || c == ':' || c == '=') {
            out += c;
            ++i;
            continue;
        }
        std::size_t start = i;
        bool needsQuotes = false;
        bool hasDoubleQuote = false;
        while (i < value.size() && !isBlank(value[i]) && value[i] != ':' && value[i] != '=') {
            char w = value[i];
            if (w == '"' || (w == '\'' && i == start)) {
                std::size_t close = value.find(w, i + 1);
                if (close == std::string_view::npos)
                    return false;
                hasDoubleQuote = hasDoubleQuote || w == '"';
                i = close + 1;
                continue;
            }
            if (w == '#' || w == ';' || w == '|' ||
                (w == '/' && i + 1 < value.size() && value[i + 1] == '/'))
                needsQuotes = true;
            ++i;
        }
        std::string_view word = value.substr(start, i - start);
        if (!needsQuotes) {
            out += word;
            continue;
        }
        if (hasDoubleQuote)
            return false;
        std::size_t open = word.find('(');
        if (open != std::string_view::npos && open > 0 && word.back() == ')') {
            out += word.substr(0, open + 1);
            out += '"';
            out += word.substr(open + 1, word.size() - open - 2);
            out += "\")";
        } else {
            out += '"';
            out += word;
            out += '"';
        }
    }
    return true;
}

// Text that stands in a value span reads back as words, '=' and ':' only.
bool readsBackInPlace(std::string_view text) {
    if (text.find('\n') != std::string_view::npos)
        return false;
    std::vector<Comment> comments;
    Lexer lexer(text, 0, text.size(), true);
    lexer.collectComments(&comments);
    for (Token token = lexer.next(); token.kind != Tok::End; token = lexer.next())
        if (token.unterminated || token.kind == Tok::Semicolon || token.kind == Tok::Bar)
            return false;
    return comments.empty();
}

bool renderConstraint(std::string_view value, std::string& out) {
    return quoteCommentWords(value, out) && readsBackInPlace(out);
}

// "TIMEGRP <name> OFFSET = <body>" with blanks or colons: the name as written
// and the body.
bool splitGroupOffset(std::string_view value, std::string_view& name, std::string_view& body) {
    std::size_t i = 0;
    auto skipSeparators = [&] {
        std::size_t start = i;
        while (i < value.size() && (isBlank(value[i]) || value[i] == ':'))
            ++i;
        return i > start;
    };
    auto keyword = [&](std::string_view word) {
        if (!equalsNoCase(value.substr(i, word.size()), word))
            return false;
        i += word.size();
        return true;
    };
    skipSeparators();
    if (!keyword("TIMEGRP") || !skipSeparators() || i >= value.size())
        return false;
    std::size_t start = i;
    if (value[i] == '"' || value[i] == '\'') {
        std::size_t close = value.find(value[i], i + 1);
        if (close == std::string_view::npos)
            return false;
        i = close + 1;
    } else {
        while (i < value.size() && !isBlank(value[i]) && value[i] != ':' && value[i] != '=')
            ++i;
    }
    name = value.substr(start, i - start);
    if (!skipSeparators() || !keyword("OFFSET"))
        return false;
    skipSeparators();
    if (i >= value.size() || value[i] != '=')
        return false;
    ++i;
    while (i < value.size() && isBlank(value[i]))
        ++i;
    body = value.substr(i);
    return true;
}

std::string composeGroupOffset(std::string_view name, std::string_view body) {
    return "TIMEGRP:" + std::string(name) + ":OFFSET=" + std::string(body);
}

// --- Reader -----------------------------------------------------------------

enum class AttrKind { GroupName, Name, TigList, Constraint };

struct TimingAttribute {
    std::string_view attribute;
    std::string_view property;
    AttrKind kind;
    std::string_view statement; // the statement a property file's record becomes
};

// The timing attributes of NET, INST and PIN statements. TS_CLKGRP has no
// attribute of its own in statement files; it is read under its property
// name so that every reference record has a statement form.
constexpr TimingAttribute kTimingAttributes[] = {
    {"TNM", "TS_TNM", AttrKind::GroupName, "INST"},
    {"TNM_NET", "TS_TNM", AttrKind::GroupName, ""},
    {"TPTHRU", "TS_TPTHRU", AttrKind::Name, "NET"},
    {"TPSYNC", "TS_TPSYNC", AttrKind::Name, "NET"},
    {"TIG", "TS_TIG", AttrKind::TigList, "NET"},
    {"TS_CLKGRP", "TS_CLKGRP", AttrKind::Name, "NET"},
    {"PERIOD", "TS_PERIOD", AttrKind::Constraint, "NET"},
    {"OFFSET", "TS_OFFSET", AttrKind::Constraint, "NET"},
    {"MAXDELAY", "TS_MAXDELAY", AttrKind::Constraint, "NET"},
    {"MAXSKEW", "TS_MAXSKEW", AttrKind::Constraint, "NET"},
    {"FEEDBACK", "TS_FEEDBACK", AttrKind::Constraint, "NET"},
};

const TimingAttribute* findAttribute(std::string_view attribute) {
    for (const TimingAttribute& entry : kTimingAttributes)
        if (equalsNoCase(entry.attribute, attribute))
            return &entry;
    return nullptr;
}

// The attribute a property file's reference record is written with.
const TimingAttribute* attributeForProperty(std::string_view property) {
    for (const TimingAttribute& entry : kTimingAttributes)
        if (!entry.statement.empty() && equalsNoCase(entry.property, property))
            return &entry;
    return nullptr;
}

using Tokens = std::vector<Token>;

class Reader {
public:
    explicit Reader(std::string_view text) : m_text(text) {}

    StatementFile run() {
        // About one statement and one record per ';' saves moving both as
        // they grow; ';' in comments must not make that a lot of memory.
        std::size_t guess = std::min<std::size_t>(
            static_cast<std::size_t>(std::count(m_text.begin(), m_text.end(), ';')),
            m_text.size() / 32);
        m_file.statements.reserve(guess);
        m_file.records.reserve(guess);
        std::size_t start = m_text.rfind("\xEF\xBB\xBF", 0) == 0 ? 3 : 0;
        Lexer lexer(m_text, start, m_text.size(), false);
        Tokens tokens;
        for (;;) {
            tokens.clear();
            Token token = lexer.next();
            if (token.kind == Tok::End)
                break;
            // A quote left open ends its statement with its line: the ';'
            // it swallowed most likely stands there.
            while (token.kind != Tok::End) {
                tokens.push_back(token);
                if (token.kind == Tok::Semicolon || token.unterminated)
                    break;
                token = lexer.next();
            }
            splitAndRead(tokens);
        }
        return std::move(m_file);
    }

private:
    // A statement keyword at the start of a line, inside what reads as one
    // statement, begins the next one when the words after it fit: the ';'
    // before it is missing. (A line may well begin with NET inside a
    // FEEDBACK value, but then a ';' or '|' follows the net's name.)
    bool beginsStatement(const Tokens& tokens, std::size_t i) const {
        const Token& token = tokens[i];
        if (!token.lineStart || token.kind != Tok::Word || token.quoted || i + 2 >= tokens.size())
            return false;
        const Token& first = tokens[i + 1];
        const Token& second = tokens[i + 2];
        if (isKeyword(m_text, token, "NET") || isKeyword(m_text, token, "INST") ||
            isKeyword(m_text, token, "PIN"))
            return first.kind == Tok::Word && second.kind == Tok::Word;
        if (isKeyword(m_text, token, "TIMESPEC") || isKeyword(m_text, token, "TIMEGRP"))
            return first.kind == Tok::Word && second.kind == Tok::Equals;
        return false;
    }

    void splitAndRead(const Tokens& tokens) {
        std::size_t start = 0;
        while (start < tokens.size()) {
            std::size_t stop = start + 1;
            while (stop < tokens.size() && !beginsStatement(tokens, stop))
                ++stop;
            read(tokens, start, stop, stop < tokens.size() ? tokens[stop].pos.line : 0);
            start = stop;
        }
    }

    void error(TextPos where, std::string text) {
        m_file.errors.push_back({where, std::move(text)});
        m_file.statements.back().malformed = true;
    }

    // Where a missing word would stand: at token `i`, or past the last one.
    TextPos posAt(std::size_t i, std::size_t end) const {
        return i < end ? (*m_tokens)[i].pos : endPos((*m_tokens)[end - 1]);
    }

    std::string_view foundAt(std::size_t i, std::size_t end) const {
        return i < end ? rawText(m_text, (*m_tokens)[i]) : std::string_view();
    }

    std::size_t skipColons(std::size_t i, std::size_t end) const {
        while (i < end && (*m_tokens)[i].kind == Tok::Colon)
            ++i;
        return i;
    }

    // The value of tokens [a, b), with every run of blanks that holds a line
    // end or a comment read as one blank.
    std::string valueText(std::size_t a, std::size_t b) const {
        std::string value;
        for (std::size_t i = a; i < b; ++i) {
            const Token& token = (*m_tokens)[i];
            if (i > a) {
                std::string_view gap =
                    m_text.substr((*m_tokens)[i - 1].end, token.begin - (*m_tokens)[i - 1].end);
                bool plain = std::all_of(gap.begin(), gap.end(),
                                         [](char c) { return c == ' ' || c == '\t'; });
                value += plain ? std::string(gap) : std::string(" ");
            }
            value += rawText(m_text, token);
        }
        return value;
    }

    StatementRecord& addRecord(PropKind kind, std::string name, const Token& at) {
        Statement& statement = m_file.statements.back();
        StatementRecord record;
        record.prop.kind = kind;
        record.prop.element = kind == PropKind::Ref ? statement.element : std::string();
        record.prop.name = std::move(name);
        record.statement = m_file.statements.size() - 1;
        record.where = at.pos;
        m_file.records.push_back(std::move(record));
        ++statement.recordCount;
        return m_file.records.back();
    }

    // The value of a record: tokens [a, b), or an empty value just past
    // token `after` when there are none.
    void setValue(StatementRecord& record, std::size_t a, std::size_t b, std::size_t after) {
        const Tokens& tokens = *m_tokens;
        if (a < b) {
            record.prop.value = valueText(a, b);
            record.valueBegin = tokens[a].begin;
            record.valueEnd = tokens[b - 1].end;
            record.valueWhere = tokens[a].pos;
        } else if (tokens[after].kind == Tok::Equals && a < tokens.size() &&
                   (tokens[a].kind == Tok::Semicolon || tokens[a].kind == Tok::Bar)) {
            // "DISABLE = ;" gets its value where it reads "DISABLE = x;".
            record.valueBegin = record.valueEnd = tokens[a].begin;
            record.valueWhere = tokens[a].pos;
        } else {
            record.valueBegin = record.valueEnd = tokens[after].end;
            record.valueWhere = endPos(tokens[after]);
        }
    }

    // A name token [i] of a statement's head; false (with an error) if it
    // is missing or empty.
    bool headName(std::size_t i, std::size_t end, std::string_view what, std::string_view keyword,
                  std::string& name) {
        if (i >= end || (*m_tokens)[i].kind != Tok::Word) {
            error(posAt(i, end), msg::missingWord(what, keyword));
            return false;
        }
        name = wordName(m_text, (*m_tokens)[i]);
        if (name.empty()) {
            error((*m_tokens)[i].pos, msg::emptyName());
            return false;
        }
        return true;
    }

    void read(const Tokens& tokens, std::size_t a, std::size_t b, int nextLine) {
        m_tokens = &tokens;
        bool terminated = tokens[b - 1].kind == Tok::Semicolon;
        std::size_t end = terminated ? b - 1 : b;
        Statement statement;
        statement.begin = tokens[a].begin;
        statement.end = tokens[b - 1].end;
        statement.lineBegin = tokens[a].lineBegin;
        statement.firstOnLine = tokens[a].lineStart;
        statement.where = tokens[a].pos;
        statement.firstRecord = m_file.records.size();
        m_file.statements.push_back(std::move(statement));

        // An open quote ends the tokens of its statement.
        if (tokens[b - 1].unterminated) {
            error(tokens[b - 1].pos, msg::unterminatedQuote());
            return;
        }
        if (end > a)
            readBody(a, end);
        if (!terminated)
            error(endPos(tokens[b - 1]), msg::missingSemicolon(nextLine));
    }

    void readBody(std::size_t a, std::size_t end) {
        const Tokens& tokens = *m_tokens;
        const Token& head = tokens[a];
        Statement& statement = m_file.statements.back();
        std::string keyword(rawText(m_text, head));
        if (isKeyword(m_text, head, "TIMESPEC")) {
            statement.kind = StatementKind::Timespec;
            readDefinition(a, end, PropKind::Spec, "TIMESPEC", "the TSid");
        } else if (isKeyword(m_text, head, "TIMEGRP")) {
            statement.kind = StatementKind::Timegrp;
            readDefinition(a, end, PropKind::Group, "TIMEGRP", "the group name");
        } else if (isKeyword(m_text, head, "OFFSET") || isKeyword(m_text, head, "ENABLE") ||
                   isKeyword(m_text, head, "DISABLE")) {
            statement.kind = isKeyword(m_text, head, "OFFSET") ? StatementKind::Offset
                                                               : StatementKind::PathControl;
            std::size_t i = skipColons(a + 1, end);
            if (i >= end || tokens[i].kind != Tok::Equals) {
                error(posAt(i, end), msg::missingEquals(keyword, foundAt(i, end)));
                return;
            }
            StatementRecord& record = addRecord(PropKind::Spec, keyword, head);
            record.attribute = keyword;
            setValue(record, i + 1, end, i);
        } else if (isKeyword(m_text, head, "NET") || isKeyword(m_text, head, "INST") ||
                   isKeyword(m_text, head, "PIN")) {
            statement.kind = isKeyword(m_text, head, "NET")    ? StatementKind::Net
                             : isKeyword(m_text, head, "INST") ? StatementKind::Inst
                                                               : StatementKind::Pin;
            readElement(a, end, keyword);
        }
    }

    // TIMESPEC name = value, TIMEGRP name = value, TIMEGRP name OFFSET = value.
    void readDefinition(std::size_t a, std::size_t end, PropKind kind, std::string_view keyword,
                        std::string_view what) {
        const Tokens& tokens = *m_tokens;
        std::size_t nameAt = skipColons(a + 1, end);
        std::string name;
        if (!headName(nameAt, end, what, keyword, name))
            return;
        std::size_t i = skipColons(nameAt + 1, end);
        bool groupOffset =
            kind == PropKind::Group && i < end && isKeyword(m_text, tokens[i], "OFFSET");
        if (groupOffset)
            i = skipColons(i + 1, end);
        if (i >= end || tokens[i].kind != Tok::Equals) {
            std::string after = (groupOffset ? "OFFSET after " : "") + inQuotes(name);
            error(posAt(i, end), msg::missingEquals(after, foundAt(i, end)));
            return;
        }
        if (!groupOffset) {
            StatementRecord& record = addRecord(kind, name, tokens[nameAt]);
            record.attribute = std::string(rawText(m_text, tokens[a]));
            setValue(record, i + 1, end, i);
            return;
        }
        m_file.statements.back().kind = StatementKind::GroupOffset;
        StatementRecord& record =
            addRecord(PropKind::Spec, std::string(kGroupOffsetName), tokens[nameAt]);
        record.attribute = std::string(rawText(m_text, tokens[a]));
        record.form = ValueForm::OffsetBody;
        setValue(record, i + 1, end, i);
        record.prop.value = composeGroupOffset(rawText(m_text, tokens[nameAt]), record.prop.value);
    }

    void readElement(std::size_t a, std::size_t end, std::string_view keyword) {
        const Tokens& tokens = *m_tokens;
        Statement& statement = m_file.statements.back();
        if (!headName(a + 1, end, "the element name", keyword, statement.element))
            return;
        if (statement.kind == StatementKind::Net)
            m_file.nets.insert(statement.element);
        std::size_t i = a + 2;
        while (i < end) {
            std::size_t stop = i;
            while (stop < end && tokens[stop].kind != Tok::Bar)
                ++stop;
            readItem(i, stop);
            if (stop < end && stop + 1 == end) // a '|' right before the ';'
                readItem(end, end);
            i = stop + 1;
        }
    }

    // One attribute, tokens [a, b); an empty one stands at token a (a '|'
    // or the end of the statement).
    void readItem(std::size_t a, std::size_t b) {
        const Tokens& tokens = *m_tokens;
        StatementItem item;
        item.firstRecord = m_file.records.size();
        if (a < b) {
            item.begin = tokens[a].begin;
            item.end = tokens[b - 1].end;
        } else {
            item.begin = item.end = a < tokens.size() ? tokens[a].begin : tokens.back().end;
        }
        std::size_t before = m_file.statements.back().recordCount;
        if (a < b && tokens[a].kind == Tok::Word && !tokens[a].quoted)
            if (const TimingAttribute* attribute = findAttribute(rawText(m_text, tokens[a])))
                readTiming(*attribute, a, b);
        item.recordCount = m_file.statements.back().recordCount - before;
        m_file.statements.back().items.push_back(item);
    }

    void readTiming(const TimingAttribute& timing, std::size_t a, std::size_t b) {
        const Tokens& tokens = *m_tokens;
        std::string attribute(rawText(m_text, tokens[a]));
        bool hasEquals = a + 1 < b && tokens[a + 1].kind == Tok::Equals;
        std::size_t valueAt = hasEquals ? a + 2 : a + 1;
        if (timing.kind == AttrKind::TigList && a + 1 == b) {
            StatementRecord& record =
                addRecord(PropKind::Ref, std::string(timing.property), tokens[a]);
            record.attribute = attribute;
            record.form = ValueForm::Implied;
            setValue(record, b, b, a);
            return;
        }
        if (!hasEquals) {
            if (a + 1 == b)
                error(endPos(tokens[a]), msg::noValue(attribute));
            else
                error(tokens[a + 1].pos,
                      msg::missingEquals(inQuotes(attribute), foundAt(a + 1, b)));
            return;
        }
        if (valueAt == b) {
            error(endPos(tokens[a + 1]), msg::noValue(attribute));
            return;
        }
        if (timing.kind == AttrKind::Constraint) {
            StatementRecord& record =
                addRecord(PropKind::Ref, std::string(timing.property), tokens[a]);
            record.attribute = attribute;
            setValue(record, valueAt, b, a + 1);
            return;
        }
        for (std::size_t i = valueAt; i < b; ++i) {
            bool allowed = tokens[i].kind == Tok::Word ||
                           (tokens[i].kind == Tok::Colon && timing.kind == AttrKind::GroupName);
            if (!allowed) {
                error(tokens[i].pos, msg::unexpectedInValue(rawText(m_text, tokens[i]), attribute));
                return;
            }
        }
        if (timing.kind == AttrKind::TigList) {
            readTigList(timing, attribute, a, valueAt, b);
            return;
        }
        if (timing.kind == AttrKind::Name && b - valueAt > 1) {
            error(tokens[valueAt].pos, msg::notOneName(attribute));
            return;
        }
        // A TNM value may begin with a qualifier that selects netlist
        // elements (FFS, FFS(*), FFS (*), each with or without a ':' after
        // it); the group is the last name.
        const Token& group = tokens[b - 1];
        if (group.kind != Tok::Word) {
            error(endPos(group), msg::noGroupName(attribute));
            return;
        }
        std::size_t q = valueAt;
        if (q + 1 < b && tokens[q].kind == Tok::Word)
            ++q;
        if (q + 1 < b && q > valueAt && tokens[q].kind == Tok::Word &&
            m_text[tokens[q].begin] == '(')
            ++q;
        if (q + 1 < b && q > valueAt && tokens[q].kind == Tok::Colon)
            ++q;
        if (q + 1 != b) {
            error(tokens[valueAt].pos, msg::badQualifier(attribute));
            return;
        }
        std::string name = wordName(m_text, group);
        if (name.empty()) {
            error(group.pos, msg::emptyName());
            return;
        }
        StatementRecord& record = addRecord(PropKind::Ref, std::string(timing.property), tokens[a]);
        record.attribute = attribute;
        record.form = ValueForm::Name;
        setValue(record, b - 1, b, a + 1);
        record.prop.value = name;
        if (valueAt < b - 1) {
            std::string_view qualifier =
                m_text.substr(tokens[valueAt].begin, group.begin - tokens[valueAt].begin);
            while (!qualifier.empty() && isBlank(qualifier.back()))
                qualifier.remove_suffix(1);
            record.qualifier = std::string(qualifier);
        }
    }

    // TIG = TS01, TS02: one record per TSid; commas and blanks separate them.
    void readTigList(const TimingAttribute& timing, const std::string& attribute, std::size_t a,
                     std::size_t valueAt, std::size_t b) {
        const Tokens& tokens = *m_tokens;
        std::size_t before = m_file.statements.back().recordCount;
        for (std::size_t t = valueAt; t < b; ++t) {
            const Token& token = tokens[t];
            std::size_t i = token.begin;
            while (i < token.end) {
                std::size_t start = i;
                bool open = false;
                while (i < token.end && m_text[i] != ',') {
                    char c = m_text[i];
                    if (c == '"' || (c == '\'' && i == start)) {
                        std::size_t close = m_text.find(c, i + 1);
                        open = close >= token.end;
                        i = open ? token.end : close + 1;
                    } else {
                        ++i;
                    }
                }
                // A name of the list that opens a single quote closes it
                // within its word, as a name at the start of a word must:
                // else dropping the names before it would change how it
                // reads.
                if (open)
                    error(itemPos(token, start), msg::unclosedInList());
                else if (i > start)
                    addTig(timing, attribute, tokens[a], token, start, i);
                ++i; // the comma
            }
        }
        if (m_file.statements.back().recordCount == before)
            error(tokens[valueAt].pos, msg::noValue(attribute));
    }

    // Where byte `at` of a token stands: tokens do not span lines.
    static TextPos itemPos(const Token& token, std::size_t at) {
        return {token.pos.line, token.pos.column + static_cast<int>(at - token.begin)};
    }

    void addTig(const TimingAttribute& timing, const std::string& attribute, const Token& at,
                const Token& token, std::size_t begin, std::size_t end) {
        std::string_view text = m_text.substr(begin, end - begin);
        bool quoted = text.size() >= 2 && (text.front() == '"' || text.front() == '\'') &&
                      text.find(text.front(), 1) == text.size() - 1;
        StatementRecord& record = addRecord(PropKind::Ref, std::string(timing.property), at);
        record.attribute = attribute;
        record.form = ValueForm::Name;
        record.prop.value = std::string(quoted ? text.substr(1, text.size() - 2) : text);
        record.valueBegin = begin;
        record.valueEnd = end;
        record.valueWhere = itemPos(token, begin);
        if (record.prop.value.empty())
            error(record.valueWhere, msg::emptyName());
    }

    std::string_view m_text;
    StatementFile m_file;
    const Tokens* m_tokens = nullptr;
};

// --- Writer -----------------------------------------------------------------

bool isStatementKeyword(std::string_view word) {
    for (std::string_view keyword :
         {"TIMESPEC", "TIMEGRP", "OFFSET", "ENABLE", "DISABLE", "NET", "INST", "PIN"})
        if (equalsNoCase(word, keyword))
            return true;
    return false;
}

struct Edit {
    std::size_t begin = 0;
    std::size_t end = 0;
    std::string with;
    bool removal = false;    // keeps the comments that stand on lines of their own, then `with`
    bool lineHasText = true; // something stands before `begin` on its line
};

class Writer {
public:
    Writer(std::string_view text, const StatementFile& file,
           const std::vector<RecordOutput>& outputs)
        : m_text(text), m_file(file), m_outputs(outputs) {}

    std::string run() {
        for (const Statement& statement : m_file.statements)
            if (statement.recordCount > 0)
                writeStatement(statement);
        std::stable_sort(m_edits.begin(), m_edits.end(), [](const Edit& x, const Edit& y) {
            return x.begin != y.begin ? x.begin < y.begin : x.end < y.end;
        });
        std::string out;
        out.reserve(m_text.size());
        std::size_t cursor = 0;
        for (Edit& edit : m_edits) {
            // Two statements dropped from one line both take the blanks
            // between them.
            if (edit.end < cursor)
                continue;
            edit.begin = std::max(edit.begin, cursor);
            out.append(m_text.substr(cursor, edit.begin - cursor));
            if (edit.removal)
                appendKeptComments(out, edit);
            out += edit.with;
            cursor = edit.end;
        }
        out.append(m_text.substr(cursor));
        // A file that ended without a line end still does when its last
        // line was dropped.
        if (!m_text.empty() && m_text.back() != '\n' && !out.empty() && out.back() == '\n') {
            out.pop_back();
            if (!out.empty() && out.back() == '\r')
                out.pop_back();
        }
        return out;
    }

private:
    bool kept(std::size_t record) const { return m_outputs[record].keep; }

    void writeStatement(const Statement& statement) {
        std::size_t first = statement.firstRecord;
        std::size_t last = first + statement.recordCount;
        const std::vector<bool> toLineStart = namesToLineStart(statement);
        bool anyKept = false;
        for (std::size_t r = first; r < last; ++r) {
            if (kept(r)) {
                anyKept = true;
                replaceValue(m_file.records[r], m_outputs[r].value, toLineStart[r - first]);
            }
        }
        bool othersStand =
            std::any_of(statement.items.begin(), statement.items.end(),
                        [](const StatementItem& item) { return item.recordCount == 0; });
        if (!anyKept && !othersStand) {
            dropStatement(statement);
            return;
        }
        std::vector<std::pair<std::size_t, std::size_t>> spans;
        std::vector<bool> dropped;
        for (const StatementItem& item : statement.items) {
            spans.emplace_back(item.begin, item.end);
            std::size_t itemLast = item.firstRecord + item.recordCount;
            bool itemKept = item.recordCount == 0;
            for (std::size_t r = item.firstRecord; r < itemLast; ++r)
                itemKept = itemKept || kept(r);
            dropped.push_back(!itemKept);
            if (itemKept && item.recordCount > 1) {
                std::vector<std::pair<std::size_t, std::size_t>> names;
                std::vector<bool> namesDropped;
                for (std::size_t r = item.firstRecord; r < itemLast; ++r) {
                    names.emplace_back(m_file.records[r].valueBegin, m_file.records[r].valueEnd);
                    namesDropped.push_back(!kept(r));
                }
                removeFromList(names, namesDropped);
            }
        }
        removeFromList(spans, dropped);
    }

    // Per record of the statement: a name of a list that the names dropped
    // before it bring to the start of a line, where a statement keyword
    // would begin a new statement.
    std::vector<bool> namesToLineStart(const Statement& statement) const {
        std::vector<bool> marks(statement.recordCount, false);
        for (const StatementItem& item : statement.items) {
            std::size_t firstKept = item.firstRecord;
            const std::size_t end = item.firstRecord + item.recordCount;
            while (firstKept < end && !kept(firstKept))
                ++firstKept;
            if (firstKept == item.firstRecord || firstKept == end)
                continue;
            std::size_t at = m_file.records[item.firstRecord].valueBegin;
            while (at > 0 && (m_text[at - 1] == ' ' || m_text[at - 1] == '\t'))
                --at;
            if (at == 0 || m_text[at - 1] == '\n')
                marks[firstKept - statement.firstRecord] = true;
        }
        return marks;
    }

    // Removes each run of dropped entries with the separator on one side:
    // the one after a leading run, else the one before, so that what follows
    // keeps its place on its line.
    void removeFromList(const std::vector<std::pair<std::size_t, std::size_t>>& spans,
                        const std::vector<bool>& dropped) {
        std::size_t i = 0;
        while (i < spans.size()) {
            if (!dropped[i]) {
                ++i;
                continue;
            }
            std::size_t j = i;
            while (j + 1 < spans.size() && dropped[j + 1])
                ++j;
            if (i == 0) {
                addRemoval(spans[i].first, spans[j + 1].first, true);
            } else {
                const std::size_t end = spans[j].second;
                addRemoval(spans[i - 1].second, end, true);
                // A comment right after the run keeps a blank before it: a
                // name ending in "/" would run into a "//" and be lost.
                if (end < m_text.size() && commentAt(m_text, end, m_text.size()))
                    m_edits.back().with = " ";
            }
            i = j + 1;
        }
    }

    void addRemoval(std::size_t begin, std::size_t end, bool lineHasText) {
        Edit edit;
        edit.begin = begin;
        edit.end = end;
        edit.removal = true;
        edit.lineHasText = lineHasText;
        m_edits.push_back(std::move(edit));
    }

    void dropStatement(const Statement& statement) {
        std::size_t n = m_text.size();
        std::size_t begin = statement.begin;
        std::size_t end = statement.end;
        std::size_t k = end;
        while (k < n && (m_text[k] == ' ' || m_text[k] == '\t'))
            ++k;
        std::size_t afterBlanks = k;
        auto crlfAt = [&](std::size_t i) {
            return m_text[i] == '\r' && i + 1 < n && m_text[i + 1] == '\n';
        };
        if (k < n && commentAt(m_text, k, n))
            while (k < n && m_text[k] != '\n' && !crlfAt(k))
                ++k;
        bool lineEnds = k >= n || m_text[k] == '\n' || crlfAt(k);
        if (statement.firstOnLine && lineEnds) {
            begin = statement.lineBegin;
            end = k < n ? k + (m_text[k] == '\r' ? 2 : 1) : n;
            addRemoval(begin, end, false);
            return;
        }
        if (lineEnds) {
            while (begin > statement.lineBegin &&
                   (m_text[begin - 1] == ' ' || m_text[begin - 1] == '\t'))
                --begin;
        } else {
            end = afterBlanks;
        }
        addRemoval(begin, end, true);
    }

    std::vector<Comment> commentsIn(std::size_t begin, std::size_t end, bool lineHasText) const {
        std::vector<Comment> comments;
        Lexer lexer(m_text, begin, end, lineHasText);
        lexer.collectComments(&comments);
        while (lexer.next().kind != Tok::End) {
        }
        return comments;
    }

    void appendKeptComments(std::string& out, const Edit& edit) const {
        for (const Comment& comment : commentsIn(edit.begin, edit.end, edit.lineHasText)) {
            if (!comment.ownLine)
                continue;
            if (!out.empty() && out.back() != '\n')
                out += lineEndBefore(m_text, comment.lineBegin);
            out.append(m_text.substr(comment.lineBegin,
                                     std::min(comment.eolEnd, edit.end) - comment.lineBegin));
        }
    }

    // `lineStart`: the value comes to the start of a line, where a bare
    // statement keyword is written in quotes.
    void replaceValue(const StatementRecord& record, std::string_view canonical, bool lineStart) {
        // Constraint text is read without blanks around it; names are exact.
        while (record.form != ValueForm::Name && !canonical.empty() &&
               (canonical.front() == ' ' || canonical.front() == '\t'))
            canonical.remove_prefix(1);
        while (record.form != ValueForm::Name && !canonical.empty() &&
               (canonical.back() == ' ' || canonical.back() == '\t'))
            canonical.remove_suffix(1);
        const std::string_view raw =
            m_text.substr(record.valueBegin, record.valueEnd - record.valueBegin);
        const bool keywordToLineStart = lineStart && isStatementKeyword(raw);
        if (canonical == record.prop.value && !keywordToLineStart)
            return;
        Edit edit;
        if (!renderValue(record, canonical, edit.with))
            return;
        if (lineStart && isStatementKeyword(edit.with))
            edit.with = '"' + edit.with + '"';
        edit.begin = record.valueBegin;
        edit.end = record.valueEnd;
        // Comments inside the old value follow the new one, each on its line.
        std::vector<Comment> comments = commentsIn(edit.begin, edit.end, true);
        for (std::size_t c = 0; c < comments.size(); ++c) {
            const Comment& comment = comments[c];
            if (c == 0 && !comment.ownLine)
                edit.with += ' ';
            else
                edit.with += lineEndBefore(m_text, comment.lineBegin);
            std::size_t from = comment.ownLine ? comment.lineBegin : comment.begin;
            edit.with.append(m_text.substr(from, comment.end - from));
            if (c + 1 == comments.size())
                edit.with.append(m_text.substr(comment.end, comment.eolEnd - comment.end));
        }
        m_edits.push_back(std::move(edit));
    }

    std::string_view m_text;
    const StatementFile& m_file;
    const std::vector<RecordOutput>& m_outputs;
    std::vector<Edit> m_edits;
};

} // namespace

StatementFile readStatements(std::string_view text) {
    return Reader(text).run();
}

std::string writeStatements(std::string_view text, const StatementFile& file,
                            const std::vector<RecordOutput>& outputs) {
    if (outputs.size() != file.records.size())
        throw std::invalid_argument("writeStatements: " + std::to_string(outputs.size()) +
                                    " outputs for " + std::to_string(file.records.size()) +
                                    " records");
    return Writer(text, file, outputs).run();
}

TextPos recordPosition(const StatementRecord& record) {
    return record.form == ValueForm::Name && record.valueWhere.line > 0 ? record.valueWhere
                                                                        : record.where;
}

TextPos valuePosition(std::string_view text, const StatementRecord& record, std::size_t offset) {
    const TextPos start = record.valueWhere;
    if (record.form == ValueForm::Implied || start.line == 0)
        return recordPosition(record);
    if (record.form == ValueForm::Name) {
        bool quoted = record.valueBegin < record.valueEnd &&
                      (text[record.valueBegin] == '"' || text[record.valueBegin] == '\'');
        offset = std::min(offset, record.prop.value.size());
        return {start.line, start.column + static_cast<int>(offset) + (quoted ? 1 : 0)};
    }
    // The value reads its tokens with every gap that holds a line end or a
    // comment as one blank: walk them the same way.
    struct Piece {
        std::size_t at; // offset in the value
        TextPos pos;
    };
    std::vector<Piece> pieces;
    std::size_t length = 0;
    Lexer lexer(text, record.valueBegin, record.valueEnd, true);
    std::size_t previousEnd = std::string_view::npos;
    for (Token token = lexer.next(); token.kind != Tok::End; token = lexer.next()) {
        if (previousEnd != std::string_view::npos) {
            std::string_view gap = text.substr(previousEnd, token.begin - previousEnd);
            bool plain = gap.find_first_not_of(" \t") == std::string_view::npos;
            length += plain ? gap.size() : 1;
        }
        TextPos pos = token.pos;
        if (pos.line == 1)
            pos.column += start.column - 1; // the lexer counts from the value's first byte
        pos.line += start.line - 1;
        pieces.push_back({length, pos});
        length += token.end - token.begin;
        previousEnd = token.end;
    }
    if (record.form == ValueForm::OffsetBody) {
        std::size_t prefix = record.prop.value.size() - std::min(length, record.prop.value.size());
        if (offset < prefix)
            return record.where;
        offset -= prefix;
    }
    if (pieces.empty())
        return start;
    auto piece = std::upper_bound(pieces.begin(), pieces.end(), offset,
                                  [](std::size_t at, const Piece& p) { return at < p.at; });
    if (piece != pieces.begin())
        --piece;
    TextPos pos = piece->pos;
    pos.column += static_cast<int>(offset - piece->at);
    return pos;
}

bool statementName(std::string_view name, std::string& out) {
    if (name.empty() || name.find('\n') != std::string_view::npos)
        return false;
    bool bare = name.front() != '\'';
    for (std::size_t i = 0; i < name.size() && bare; ++i) {
        char c = name[i];
        bare = !isSeparator(c) && c != '"' && c != ',' && !commentAt(name, i, name.size());
    }
    if (bare) {
        out = std::string(name);
        return true;
    }
    for (char quote : {'"', '\''}) {
        if (name.find(quote) == std::string_view::npos) {
            out = quote + std::string(name) + quote;
            return true;
        }
    }
    return false;
}

bool renderValue(const StatementRecord& record, std::string_view canonical, std::string& out) {
    switch (record.form) {
    case ValueForm::Constraint:
        return renderConstraint(canonical, out);
    case ValueForm::Name:
        return statementName(canonical, out);
    case ValueForm::OffsetBody: {
        std::string_view name;
        std::string_view body;
        return splitGroupOffset(canonical, name, body) && renderConstraint(body, out);
    }
    case ValueForm::Implied:
        if (canonical.empty() || equalsNoCase(canonical, "global")) {
            out.clear();
            return true;
        }
        if (!statementName(canonical, out))
            return false;
        out = " = " + out;
        return true;
    }
    return false;
}

std::string statementsToProps(const StatementFile& file) {
    std::string text;
    for (const StatementRecord& record : file.records) {
        const PropRecord& prop = record.prop;
        // A property line trims its value, and takes one quoted string as
        // the name inside: such names go there quoted.
        const std::string& value = prop.value;
        bool quote =
            record.form == ValueForm::Name && !value.empty() &&
            (isBlank(value.front()) || isBlank(value.back()) || refValueName(value) != value);
        text +=
            formatPropLine(prop.kind, prop.element, prop.name, quote ? quoteWord(value) : value);
        text += '\n';
    }
    return text;
}

std::string refValueName(std::string_view value) {
    if (value.size() < 2 || value.front() != '"' || value.back() != '"')
        return std::string(value);
    std::string name;
    for (std::size_t i = 1; i + 1 < value.size(); ++i) {
        char c = value[i];
        if (c == '"')
            return std::string(value);
        if (c == '\\') {
            if (i + 2 >= value.size() || (value[i + 1] != '"' && value[i + 1] != '\\'))
                return std::string(value);
            c = value[++i];
        }
        name += c;
    }
    return name;
}

bool propToStatement(const PropRecord& prop, std::string& statement, std::string& error) {
    std::string name;
    std::string value;
    PropRecord expected = prop;
    auto fail = [&error](std::string_view what) {
        error = msg::cannotWrite(what);
        return false;
    };
    auto constraint = [&](std::string_view text) {
        if (!renderConstraint(text, value))
            return false;
        expected.value = value;
        return true;
    };
    switch (prop.kind) {
    case PropKind::Group:
        if (!statementName(prop.name, name) || !constraint(prop.value))
            return fail(prop.name);
        statement = "TIMEGRP " + name + " = " + value + ";";
        break;
    case PropKind::Spec: {
        std::string_view padGroup;
        std::string_view body;
        if (equalsNoCase(prop.name, "OFFSET") || equalsNoCase(prop.name, "ENABLE") ||
            equalsNoCase(prop.name, "DISABLE")) {
            if (!constraint(prop.value))
                return fail(prop.value);
            statement = prop.name + " = " + value + ";";
        } else if (prop.name == kGroupOffsetName && splitGroupOffset(prop.value, padGroup, body) &&
                   composeGroupOffset(padGroup, body) == prop.value &&
                   renderConstraint(body, value)) {
            expected.value = composeGroupOffset(padGroup, value);
            statement = "TIMEGRP " + std::string(padGroup) + " OFFSET = " + value + ";";
        } else {
            if (!statementName(prop.name, name) || !constraint(prop.value))
                return fail(prop.name);
            statement = "TIMESPEC " + name + " = " + value + ";";
        }
        break;
    }
    case PropKind::Ref: {
        const TimingAttribute* timing = attributeForProperty(prop.name);
        if (timing == nullptr) {
            error = msg::noStatementFor(prop.name);
            return false;
        }
        if (!statementName(prop.element, name))
            return fail(prop.element);
        statement =
            std::string(timing->statement) + " " + name + " " + std::string(timing->attribute);
        if (timing->kind == AttrKind::Constraint) {
            if (!constraint(prop.value))
                return fail(prop.value);
            statement += " = " + value;
        } else {
            expected.value = refValueName(prop.value);
            if (!expected.value.empty() || timing->kind != AttrKind::TigList) {
                if (!statementName(expected.value, value))
                    return fail(expected.value);
                statement += " = " + value;
            }
        }
        statement += ";";
        expected.name = timing->property;
        break;
    }
    }
    // What cannot be read back is refused rather than written wrong.
    StatementFile check = readStatements(statement);
    if (!check.errors.empty() || check.records.size() != 1 || check.records[0].prop != expected)
        return fail(prop.kind == PropKind::Ref ? prop.element : prop.name);
    return true;
}

FileFormat detectFormat(std::string_view text) {
    std::size_t pos = text.rfind("\xEF\xBB\xBF", 0) == 0 ? 3 : 0;
    while (pos < text.size()) {
        std::size_t newline = text.find('\n', pos);
        if (newline == std::string_view::npos)
            newline = text.size();
        std::string_view line = text.substr(pos, newline - pos);
        pos = newline + 1;
        std::size_t start = 0;
        while (start < line.size() && isBlank(line[start]))
            ++start;
        if (start == line.size() || commentAt(line, start, line.size()))
            continue;
        std::size_t stop = start;
        while (stop < line.size() && !isSeparator(line[stop]) && line[stop] != '"')
            ++stop;
        std::string_view word = line.substr(start, stop - start);
        bool separated = stop == line.size() || isBlank(line[stop]) || line[stop] == '"';
        if (separated && (word == "group" || word == "spec" || word == "ref"))
            return FileFormat::Props;
        if (isStatementKeyword(word) || line.find(';') != std::string_view::npos)
            return FileFormat::Statements;
    }
    return FileFormat::Props;
}

} // namespace tsd_cli
