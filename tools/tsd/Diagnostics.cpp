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

bool startsWith(const std::string& text, const std::string& prefix) {
    return text.compare(0, prefix.size(), prefix) == 0;
}

// The text passes through the library's 16-bit strings on its way into a
// context; do the same so that the two compare equal.
std::string asLibraryText(const std::string& text) {
    return utf16ToUtf8(utf8ToUtf16(text.c_str()).c_str());
}

bool namesWord(const PropLine& prop, const std::string& word) {
    std::vector<std::string> words = valueWords(prop.value);
    return std::find(words.begin(), words.end(), word) != words.end();
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

const PropLine* findLine(const std::vector<PropLine>& props, Target target,
                         const std::string& name) {
    auto first = [&](auto&& pred) -> const PropLine* {
        for (const PropLine& prop : props)
            if (pred(prop))
                return &prop;
        return nullptr;
    };
    switch (target) {
    case Target::GroupNaming:
        return first(
            [&](const PropLine& p) { return p.kind == PropKind::Group && namesWord(p, name); });
    case Target::GroupDefining:
        return first(
            [&](const PropLine& p) { return p.kind == PropKind::Group && p.name == name; });
    case Target::SpecDefining:
        return first([&](const PropLine& p) { return p.kind == PropKind::Spec && p.name == name; });
    case Target::RegGroupUser:
        if (const PropLine* ref = first([&](const PropLine& p) {
                return isRefNamed(p, "TS_OFFSET") && namesWord(p, name);
            }))
            return ref;
        return first(
            [&](const PropLine& p) { return p.kind == PropKind::Spec && namesWord(p, name); });
    case Target::ClockUser:
        return first([&](const PropLine& p) {
            return (p.kind == PropKind::Spec || isRefNamed(p, "TS_OFFSET") ||
                    isRefNamed(p, "TS_FEEDBACK")) &&
                   namesWord(p, name);
        });
    case Target::TigReference:
        return first([&](const PropLine& p) { return isRefNamed(p, "TS_TIG") && p.value == name; });
    }
    return nullptr;
}

const PropLine* lineForQuotedName(const std::vector<PropLine>& props, const std::string& text) {
    std::smatch match;
    for (const NamePattern& pattern : namePatterns())
        if (std::regex_search(text, match, pattern.pattern))
            return findLine(props, pattern.target, match[1].str());
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
    std::vector<std::string> contexts(props.size());
    for (std::size_t i = 0; i < props.size(); ++i)
        if (props[i].kind != PropKind::Ref)
            contexts[i] = processingContext(props[i]);

    // Stored lines are processed in order, groups before specs, so the line
    // of a context never lies before the line of the previous message of
    // that kind. Identical lines share a context: a message stays on the
    // line of the previous one unless that line already got the same text.
    std::map<PropKind, int> cursor;
    std::string previousContext;
    int previousLine = -1;
    std::map<int, std::set<std::string>> textsOnLine;

    for (const RawMessage& message : messages) {
        const PropLine* prop = nullptr;
        bool isDetail = message.severity == MessageSeverity::Status && !message.text.empty() &&
                        (message.text[0] == ' ' || message.text[0] == '\t');
        if (isDetail && !diags.empty()) {
            addLibraryMessage(diags, message.severity, message.text, "", 0);
            continue;
        }
        if (!message.context.empty()) {
            int chosen = -1;
            if (message.context == previousContext && previousLine >= 0 &&
                textsOnLine[previousLine].count(message.text) == 0) {
                chosen = previousLine;
            } else {
                PropKind kind = startsWith(message.context, "Processing TIMEGRP") ? PropKind::Group
                                                                                  : PropKind::Spec;
                int after = cursor.count(kind) != 0 ? cursor[kind] : -1;
                int firstMatch = -1;
                for (int i = 0; i < static_cast<int>(props.size()); ++i) {
                    if (props[i].kind != kind || contexts[i] != message.context)
                        continue;
                    if (firstMatch < 0)
                        firstMatch = i;
                    if (i > after) {
                        chosen = i;
                        break;
                    }
                }
                if (chosen < 0)
                    chosen = previousContext == message.context ? previousLine : firstMatch;
                if (chosen >= 0)
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
            prop = lineForQuotedName(props, message.text);
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
