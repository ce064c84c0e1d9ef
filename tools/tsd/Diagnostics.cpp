#include "Diagnostics.h"

#include <algorithm>
#include <map>
#include <ostream>
#include <regex>
#include <set>

namespace tsd_cli {

namespace {

Severity fromMessageSeverity(MessageSeverity severity) {
    switch (severity) {
    case MessageSeverity::Error:
        return Severity::Error;
    case MessageSeverity::Fatal:
        return Severity::Fatal;
    case MessageSeverity::InternalError:
        return Severity::InternalError;
    case MessageSeverity::Status:
    case MessageSeverity::Debug:
        break;
    }
    return Severity::Note;
}

std::string withoutFinalNewline(std::string text) {
    if (!text.empty() && text.back() == '\n')
        text.pop_back();
    return text;
}

// The text passes through the library's 16-bit strings on its way into a
// context; do the same so that the two compare equal.
std::string asLibraryText(const std::string& text) {
    return utf16ToUtf8(utf8ToUtf16(text.c_str()).c_str());
}

// Messages issued outside any stored property quote the names they are about.
// Each pattern says which line stands for the quoted name.
enum class Target {
    GroupNaming,   // first group line whose value names it
    GroupDefining, // first group line defining it
    SpecDefining,  // first spec line with that name
    RegGroupUser,  // first TS_OFFSET reference, else spec line, naming it
    ClockUser,     // first spec line or TS_OFFSET/TS_FEEDBACK reference naming it
    TigReference,  // first TS_TIG reference whose value is it
};

struct NamePattern {
    std::regex pattern;
    Target target;
};

const std::vector<NamePattern>& namePatterns() {
    static const std::vector<NamePattern> patterns = {
        {std::regex("^A group named \"(.*)\" was referenced in one or more TIMEGRP definitions"),
         Target::GroupNaming},
        {std::regex("^Circular group definition encountered from user group \"(.*)\", as"),
         Target::GroupDefining},
        {std::regex("^Group \"(.*)\" is used as the register group in one or more OFFSET"),
         Target::RegGroupUser},
        {std::regex("^The following spec\\(s\\) referenced the Tsd_ClkGroup \"(.*)\", but no "
                    "such TS_CLKGRP"),
         Target::ClockUser},
        {std::regex("^Specification \"(.*)\" is defined in terms of a specification with TSid"),
         Target::SpecDefining},
        {std::regex("^Specification \"(.*)\" is defined in terms of specification \".*\", which "
                    "is an ignored path"),
         Target::SpecDefining},
        {std::regex("^Delay expression for specification \"(.*)\" contains a division by zero"),
         Target::SpecDefining},
        {std::regex("^Specification \"(.*)\" is defined in terms of a circular TSid link"),
         Target::SpecDefining},
        {std::regex("^One or more TIG directives were specified for a specification with TSid "
                    "\"(.*)\", which does not exist"),
         Target::TigReference},
    };
    return patterns;
}

bool isRefNamed(const PropLine& prop, const char* name) {
    if (prop.kind != PropKind::Ref || prop.name.size() != std::char_traits<char>::length(name))
        return false;
    for (std::size_t i = 0; i < prop.name.size(); ++i)
        if (std::toupper(static_cast<unsigned char>(prop.name[i])) != name[i])
            return false;
    return true;
}

// The first line that defines or names each word, per kind of line, made in
// one pass so that many messages cost no more than a few.
class NameIndex {
public:
    explicit NameIndex(const std::vector<PropLine>& props) {
        for (const PropLine& prop : props) {
            if (prop.kind == PropKind::Group) {
                m_groupDefining.emplace(prop.name, &prop);
                addWords(m_groupNaming, prop);
            } else if (prop.kind == PropKind::Spec) {
                m_specDefining.emplace(prop.name, &prop);
                addWords(m_specNaming, prop);
            } else if (isRefNamed(prop, "TS_OFFSET")) {
                addWords(m_offsetRefNaming, prop);
            } else if (isRefNamed(prop, "TS_FEEDBACK")) {
                addWords(m_feedbackRefNaming, prop);
            } else if (isRefNamed(prop, "TS_TIG")) {
                m_tigRefs.emplace(prop.value, &prop);
            }
        }
    }

    const PropLine* find(Target target, const std::string& name) const {
        switch (target) {
        case Target::GroupNaming:
            return lookup(m_groupNaming, name);
        case Target::GroupDefining:
            return lookup(m_groupDefining, name);
        case Target::SpecDefining:
            return lookup(m_specDefining, name);
        case Target::RegGroupUser:
            return first(lookup(m_offsetRefNaming, name), lookup(m_specNaming, name));
        case Target::ClockUser:
            return first(first(lookup(m_specNaming, name), lookup(m_offsetRefNaming, name)),
                         lookup(m_feedbackRefNaming, name));
        case Target::TigReference:
            return lookup(m_tigRefs, name);
        }
        return nullptr;
    }

private:
    using Index = std::map<std::string, const PropLine*>;

    static void addWords(Index& index, const PropLine& prop) {
        for (std::string& word : valueWords(prop.value))
            index.emplace(std::move(word), &prop); // the first line keeps the word
    }
    static const PropLine* lookup(const Index& index, const std::string& name) {
        auto found = index.find(name);
        return found != index.end() ? found->second : nullptr;
    }
    // The earlier of two lines (lines are in input order in one vector).
    static const PropLine* first(const PropLine* a, const PropLine* b) {
        if (a == nullptr)
            return b;
        if (b == nullptr)
            return a;
        return a < b ? a : b;
    }

    Index m_groupDefining;
    Index m_groupNaming;
    Index m_specDefining;
    Index m_specNaming;
    Index m_offsetRefNaming;
    Index m_feedbackRefNaming;
    Index m_tigRefs;
};

const PropLine* lineForQuotedName(const NameIndex& index, const std::string& text) {
    std::smatch match;
    for (const NamePattern& pattern : namePatterns())
        if (std::regex_search(text, match, pattern.pattern))
            return index.find(pattern.target, match[1].str());
    return nullptr;
}

} // namespace

const char* severityName(Severity severity) {
    switch (severity) {
    case Severity::Error:
        return "error";
    case Severity::Warning:
        return "warning";
    case Severity::Note:
        return "note";
    case Severity::Fatal:
        return "fatal error";
    case Severity::InternalError:
        return "internal error";
    }
    return "?";
}

bool isFailure(Severity severity) {
    return severity == Severity::Error || severity == Severity::Fatal ||
           severity == Severity::InternalError;
}

void addLibraryMessage(std::vector<Diagnostic>& diags, MessageSeverity severity,
                       const std::string& text, const std::string& file, int line) {
    std::string body = withoutFinalNewline(text);
    bool detail =
        severity == MessageSeverity::Status && !body.empty() && (body[0] == ' ' || body[0] == '\t');
    if (detail && !diags.empty()) {
        diags.back().details.push_back(body);
        return;
    }
    Diagnostic diag;
    diag.file = file;
    diag.line = line;
    diag.severity = fromMessageSeverity(severity);
    diag.text = body;
    diags.push_back(std::move(diag));
}

std::string processingContext(const PropLine& prop) {
    const char* what = prop.kind == PropKind::Group ? "TIMEGRP" : "TIMESPEC";
    return asLibraryText(std::string("Processing ") + what + " definition \"" + prop.name + "=" +
                         prop.value + "\": ");
}

std::vector<Diagnostic> attributeBuildMessages(const std::vector<PropLine>& props,
                                               const std::vector<RawMessage>& messages,
                                               const std::string& fallbackFile) {
    std::vector<Diagnostic> diags;
    // The stored lines of each context, in input order.
    std::map<std::string, std::vector<int>> linesOf;
    for (std::size_t i = 0; i < props.size(); ++i)
        if (props[i].kind != PropKind::Ref)
            linesOf[processingContext(props[i])].push_back(static_cast<int>(i));
    NameIndex names(props);

    // Stored lines are processed in order, groups before specs, so the line
    // of a context never lies before the line of the previous message of
    // that kind. Identical lines share a context: a message stays on the
    // line of the previous one unless that line already got the same text.
    std::map<PropKind, int> cursor;
    std::string previousContext;
    int previousLine = -1;
    std::map<int, std::set<std::string>> textsOnLine;

    for (const RawMessage& message : messages) {
        bool isDetail = message.severity == MessageSeverity::Status && !message.text.empty() &&
                        (message.text[0] == ' ' || message.text[0] == '\t');
        if (isDetail && !diags.empty()) {
            addLibraryMessage(diags, message.severity, message.text, "", 0);
            continue;
        }
        const PropLine* prop = nullptr;
        if (!message.context.empty()) {
            int chosen = -1;
            if (message.context == previousContext && previousLine >= 0 &&
                textsOnLine[previousLine].count(message.text) == 0) {
                chosen = previousLine;
            } else if (auto found = linesOf.find(message.context); found != linesOf.end()) {
                const std::vector<int>& candidates = found->second;
                PropKind kind = props[static_cast<std::size_t>(candidates.front())].kind;
                int after = cursor.count(kind) != 0 ? cursor[kind] : -1;
                auto next = std::upper_bound(candidates.begin(), candidates.end(), after);
                if (next != candidates.end())
                    chosen = *next;
                else
                    chosen = previousContext == message.context ? previousLine : candidates.front();
                cursor[kind] = std::max(after, chosen);
            }
            previousContext = message.context;
            previousLine = chosen;
            if (chosen >= 0) {
                textsOnLine[chosen].insert(message.text);
                prop = &props[static_cast<std::size_t>(chosen)];
            }
        } else {
            previousContext.clear();
            previousLine = -1;
            prop = lineForQuotedName(names, message.text);
        }
        if (prop != nullptr)
            addLibraryMessage(diags, message.severity, message.text, prop->file, prop->line);
        else
            addLibraryMessage(diags, message.severity, message.text, fallbackFile, 0);
    }
    return diags;
}

void printDiagnostic(std::ostream& out, const Diagnostic& diag) {
    if (!diag.file.empty()) {
        out << diag.file << ':';
        if (diag.line > 0)
            out << diag.line << ':';
    } else {
        out << "tsd:";
    }
    out << ' ' << severityName(diag.severity) << ": ";
    // Continuation lines (an echoed definition and its caret line) move
    // right together, so the caret stays under the same character.
    std::size_t start = 0;
    bool first = true;
    for (;;) {
        std::size_t end = diag.text.find('\n', start);
        std::string line = diag.text.substr(start, end == std::string::npos ? end : end - start);
        if (!first)
            out << "   ";
        out << line << '\n';
        first = false;
        if (end == std::string::npos)
            break;
        start = end + 1;
    }
    for (const std::string& detail : diag.details)
        out << detail << '\n';
}

} // namespace tsd_cli
