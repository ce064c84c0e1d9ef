#include "Diagnostics.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <ostream>
#include <unordered_map>
#include <unordered_set>

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
// Each pattern says which record stands for the quoted name.
enum class Target {
    GroupNaming,   // first group record whose value names it
    GroupDefining, // first group record defining it
    SpecDefining,  // first spec record with that name
    RegGroupUser,  // first TS_OFFSET reference, else spec record, naming it
    ClockUser,     // first spec record or TS_OFFSET/TS_FEEDBACK reference naming it
    TigReference,  // first TS_TIG reference whose value is it
};

// A message that begins with `prefix`, then the name, then `before`, and
// when `after` is not empty, `after` later on the same line. The name is
// the longest that fits, as a greedy `prefix(.*)before` (or
// `prefix(.*)before.*after`) match of the first line would capture.
struct NamePattern {
    std::string_view prefix;
    std::string_view before;
    std::string_view after;
    Target target;
};

constexpr NamePattern kNamePatterns[] = {
    {"A group named \"", "\" was referenced in one or more TIMEGRP definitions", "",
     Target::GroupNaming},
    {"Circular group definition encountered from user group \"", "\", as", "",
     Target::GroupDefining},
    {"Group \"", "\" is used as the register group in one or more OFFSET", "",
     Target::RegGroupUser},
    {"The following spec(s) referenced the Tsd_ClkGroup \"", "\", but no such TS_CLKGRP", "",
     Target::ClockUser},
    {"Specification \"", "\" is defined in terms of a specification with TSid", "",
     Target::SpecDefining},
    {"Specification \"", "\" is defined in terms of specification \"",
     "\", which is an ignored path", Target::SpecDefining},
    {"Delay expression for specification \"", "\" contains a division by zero", "",
     Target::SpecDefining},
    {"Specification \"", "\" is defined in terms of a circular TSid link", "",
     Target::SpecDefining},
    {"One or more TIG directives were specified for a specification with TSid \"",
     "\", which does not exist", "", Target::TigReference},
};

bool quotedName(std::string_view text, const NamePattern& pattern, std::string_view& name) {
    std::string_view line = text.substr(0, text.find_first_of("\n\r"));
    const std::size_t start = pattern.prefix.size();
    if (line.substr(0, start) != pattern.prefix)
        return false;
    std::size_t limit = line.size(); // where `before` ends at the latest
    if (!pattern.after.empty()) {
        limit = line.rfind(pattern.after);
        if (limit == std::string_view::npos)
            return false;
    }
    if (limit < start + pattern.before.size())
        return false;
    std::size_t at = line.rfind(pattern.before, limit - pattern.before.size());
    if (at == std::string_view::npos || at < start)
        return false;
    name = line.substr(start, at - start);
    return true;
}

bool isRefNamed(std::string_view name, const char* wanted) {
    if (name.size() != std::char_traits<char>::length(wanted))
        return false;
    for (std::size_t i = 0; i < name.size(); ++i)
        if (std::toupper(static_cast<unsigned char>(name[i])) != wanted[i])
            return false;
    return true;
}

constexpr std::size_t kNone = static_cast<std::size_t>(-1);

// The first record that defines or names each word, per kind of record,
// made in one pass so that many messages cost no more than a few.
class NameIndex {
public:
    explicit NameIndex(const PropStore& store) {
        for (std::size_t i = 0; i < store.size(); ++i) {
            const StoredProp& record = store[i];
            std::string_view name = store.name(record);
            std::string_view value = store.value(record);
            if (record.kind == PropKind::Group) {
                m_groupDefining.emplace(name, i);
                addWords(m_groupNaming, value, i);
            } else if (record.kind == PropKind::Spec) {
                m_specDefining.emplace(name, i);
                addWords(m_specNaming, value, i);
            } else if (isRefNamed(name, "TS_OFFSET")) {
                addWords(m_offsetRefNaming, value, i);
            } else if (isRefNamed(name, "TS_FEEDBACK")) {
                addWords(m_feedbackRefNaming, value, i);
            } else if (isRefNamed(name, "TS_TIG")) {
                m_tigRefs.emplace(value, i);
            }
        }
    }

    std::size_t find(Target target, std::string_view name) const {
        switch (target) {
        case Target::GroupNaming:
            return lookup(m_groupNaming, name);
        case Target::GroupDefining:
            return lookup(m_groupDefining, name);
        case Target::SpecDefining:
            return lookup(m_specDefining, name);
        case Target::RegGroupUser:
            return std::min(lookup(m_offsetRefNaming, name), lookup(m_specNaming, name));
        case Target::ClockUser:
            return std::min({lookup(m_specNaming, name), lookup(m_offsetRefNaming, name),
                             lookup(m_feedbackRefNaming, name)});
        case Target::TigReference:
            return lookup(m_tigRefs, name);
        }
        return kNone;
    }

private:
    // Words are looked up by value; the records' texts outlive the index.
    using Index = std::unordered_map<std::string, std::size_t>;

    static void addWords(Index& index, std::string_view value, std::size_t record) {
        for (std::string& word : valueWords(value))
            index.emplace(std::move(word), record); // the first record keeps the word
    }
    // kNone, the largest index, when absent: the earlier of two is the min.
    static std::size_t lookup(const Index& index, std::string_view name) {
        auto found = index.find(std::string(name));
        return found != index.end() ? found->second : kNone;
    }

    Index m_groupDefining;
    Index m_groupNaming;
    Index m_specDefining;
    Index m_specNaming;
    Index m_offsetRefNaming;
    Index m_feedbackRefNaming;
    Index m_tigRefs;
};

const NamePattern* matchingPattern(const std::string& text, std::string_view& name) {
    for (const NamePattern& pattern : kNamePatterns)
        if (quotedName(text, pattern, name))
            return &pattern;
    return nullptr;
}

std::size_t recordForQuotedName(const PropStore& store, std::unique_ptr<NameIndex>& index,
                                const std::string& text) {
    std::string_view name;
    const NamePattern* pattern = matchingPattern(text, name);
    if (pattern == nullptr)
        return kNone;
    if (!index)
        index = std::make_unique<NameIndex>(store);
    return index->find(pattern->target, name);
}

// A spec as the clock message lists it ("OFFSET=IN 2000 pS BEFORE clk")
// and as a record holds it ("IN 2 ns BEFORE clk TIMEGRP regs") compare by
// their words: keywords that only one side spells out, and the register
// group after TIMEGRP, are left out, times are taken in picoseconds, and the
// loose form leaves out numbers and units altogether.
std::string clockKey(std::string_view text, bool loose) {
    static constexpr struct {
        const char* unit;
        double scale;
    } kUnits[] = {{"PS", 1}, {"NS", 1e3}, {"US", 1e6}, {"MS", 1e9}};
    std::vector<std::string> words = valueWords(text);
    std::string key;
    for (std::size_t i = 0; i < words.size(); ++i) {
        std::string word = words[i];
        for (char& c : word)
            c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
        if (word == "OFFSET" || word == "FEEDBACK")
            continue;
        if (word == "TIMEGRP") {
            ++i;
            continue;
        }
        char* end = nullptr;
        double number = std::strtod(word.c_str(), &end);
        bool isNumber = !word.empty() && end == word.c_str() + word.size();
        if (isNumber) {
            double scale = 0;
            if (i + 1 < words.size())
                for (const auto& unit : kUnits)
                    if (isRefNamed(words[i + 1], unit.unit))
                        scale = unit.scale;
            if (scale != 0)
                ++i;
            if (loose)
                continue;
            char buffer[32];
            std::snprintf(buffer, sizeof buffer, "%.9g%s", scale != 0 ? number * scale : number,
                          scale != 0 ? "ps" : "");
            word = buffer;
        }
        key += word;
        key += ' ';
    }
    return key;
}

// The records that may be listed under a missing clock net: spec records
// and TS_OFFSET and TS_FEEDBACK references, by each word of their values.
class ClockUsers {
public:
    explicit ClockUsers(const PropStore& store) : m_store(store), m_used(store.size(), false) {
        for (std::size_t i = 0; i < store.size(); ++i) {
            const StoredProp& record = store[i];
            std::string_view name = store.name(record);
            if (record.kind == PropKind::Spec ||
                (record.kind == PropKind::Ref &&
                 (isRefNamed(name, "TS_OFFSET") || isRefNamed(name, "TS_FEEDBACK"))))
                for (std::string& word : valueWords(store.value(record)))
                    m_byWord[std::move(word)].push_back(i);
        }
        for (auto& entry : m_byWord) // a word that stands twice in one value
            entry.second.erase(std::unique(entry.second.begin(), entry.second.end()),
                               entry.second.end());
    }

    // The record that a detail line under clock `clock` stands for: the
    // first one not yet taken whose value matches it exactly, else loosely,
    // else any that names the clock; kNone when none is left. Each record's
    // keys are made once, so a clock that many specs name costs linear time.
    std::size_t take(std::string_view clock, std::string_view detail) {
        auto found = m_byWord.find(std::string(clock));
        if (found == m_byWord.end())
            return kNone;
        Users& users = m_users[found->first];
        if (!users.made) {
            users.made = true;
            for (std::size_t record : found->second) {
                std::string_view value = m_store.value(m_store[record]);
                users.byKey[0][clockKey(value, false)].records.push_back(record);
                users.byKey[1][clockKey(value, true)].records.push_back(record);
                users.any.records.push_back(record);
            }
        }
        while (!detail.empty() && (detail.front() == ' ' || detail.front() == '\t'))
            detail.remove_prefix(1);
        for (int pass = 0; pass < 3; ++pass) {
            Queue* queue = &users.any;
            if (pass < 2) {
                auto match = users.byKey[pass].find(clockKey(detail, pass == 1));
                if (match == users.byKey[pass].end())
                    continue;
                queue = &match->second;
            }
            while (queue->next < queue->records.size()) {
                std::size_t record = queue->records[queue->next++];
                if (!m_used[record]) {
                    m_used[record] = true;
                    return record;
                }
            }
        }
        return kNone;
    }

private:
    // Records in input order, those before `next` taken already.
    struct Queue {
        std::vector<std::size_t> records;
        std::size_t next = 0;
    };
    struct Users {
        bool made = false;
        std::unordered_map<std::string, Queue> byKey[2]; // exact, loose
        Queue any;
    };

    const PropStore& m_store;
    std::unordered_map<std::string, std::vector<std::size_t>> m_byWord;
    std::unordered_map<std::string, Users> m_users;
    std::vector<bool> m_used;
};

// The group and spec records of each processing context, in input order.
using ContextLines = std::unordered_map<std::string, std::vector<std::size_t>>;

ContextLines contextLines(const PropStore& store) {
    ContextLines lines;
    for (std::size_t i = 0; i < store.size(); ++i)
        if (store[i].kind != PropKind::Ref)
            lines[processingContext(store, store[i])].push_back(i);
    return lines;
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
                       const std::string& text, const std::string& file, int line, int column) {
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
    diag.column = column;
    diag.severity = fromMessageSeverity(severity);
    diag.text = body;
    diags.push_back(std::move(diag));
}

std::string processingContext(const PropStore& store, const StoredProp& record) {
    const char* what = record.kind == PropKind::Group ? "TIMEGRP" : "TIMESPEC";
    std::string context = std::string("Processing ") + what + " definition \"";
    context += store.name(record);
    context += '=';
    context += store.value(record);
    context += "\": ";
    return asLibraryText(context);
}

std::vector<Diagnostic> attributeBuildMessages(const PropStore& store,
                                               const std::vector<RawMessage>& messages,
                                               const std::string& fallbackFile) {
    std::vector<Diagnostic> diags;
    // Made on first need: a build without messages costs nothing here.
    std::unique_ptr<ContextLines> linesOf;
    std::unique_ptr<NameIndex> names;

    // Stored records are processed in order, groups before specs, so the
    // record of a context never lies before the record of the previous
    // message of that kind. Identical records share a context: a message
    // stays on the record of the previous one unless that record already
    // got the same text.
    std::size_t cursor[3] = {kNone, kNone, kNone}; // per PropKind; kNone: none yet
    std::string previousContext;
    std::size_t previousLine = kNone;
    std::unordered_map<std::size_t, std::unordered_set<std::string>> textsOnLine;

    // After a clock message: the clock, and whether its diagnostic holds a
    // listed spec yet.
    std::unique_ptr<ClockUsers> clockUsers;
    std::string clock;
    bool clockOpen = false;
    bool clockPlaced = false;

    auto add = [&](const RawMessage& message, std::size_t record) {
        if (record != kNone) {
            const StoredProp& r = store[record];
            addLibraryMessage(diags, message.severity, message.text, store.fileName(r),
                              static_cast<int>(r.line), static_cast<int>(r.column));
        } else {
            addLibraryMessage(diags, message.severity, message.text, fallbackFile, 0);
        }
    };

    for (const RawMessage& message : messages) {
        bool isDetail = message.severity == MessageSeverity::Status && !message.text.empty() &&
                        (message.text[0] == ' ' || message.text[0] == '\t');
        if (isDetail && clockOpen) {
            // Each listed spec is reported at its own record.
            if (!clockUsers)
                clockUsers = std::make_unique<ClockUsers>(store);
            std::size_t record = clockUsers->take(clock, withoutFinalNewline(message.text));
            if (record != kNone && clockPlaced) {
                Diagnostic copy = diags.back();
                copy.details.clear();
                diags.push_back(std::move(copy));
            }
            if (record != kNone) {
                const StoredProp& r = store[record];
                Diagnostic& diag = diags.back();
                diag.file = store.fileName(r);
                diag.line = static_cast<int>(r.line);
                diag.column = static_cast<int>(r.column);
                clockPlaced = true;
            }
            addLibraryMessage(diags, message.severity, message.text, "", 0);
            continue;
        }
        if (isDetail && !diags.empty()) {
            addLibraryMessage(diags, message.severity, message.text, "", 0);
            continue;
        }
        clockOpen = false;
        std::size_t chosen = kNone;
        if (!message.context.empty()) {
            if (message.context == previousContext && previousLine != kNone &&
                textsOnLine[previousLine].count(message.text) == 0) {
                chosen = previousLine;
            } else {
                if (!linesOf)
                    linesOf = std::make_unique<ContextLines>(contextLines(store));
                auto found = linesOf->find(message.context);
                if (found != linesOf->end()) {
                    const std::vector<std::size_t>& candidates = found->second;
                    auto kind = static_cast<std::size_t>(store[candidates.front()].kind);
                    std::size_t after = cursor[kind];
                    auto next = after == kNone
                                    ? candidates.begin()
                                    : std::upper_bound(candidates.begin(), candidates.end(), after);
                    if (next != candidates.end())
                        chosen = *next;
                    else
                        chosen =
                            previousContext == message.context ? previousLine : candidates.front();
                    if (chosen != kNone && (after == kNone || chosen > after))
                        cursor[kind] = chosen;
                }
            }
            previousContext = message.context;
            previousLine = chosen;
            if (chosen != kNone)
                textsOnLine[chosen].insert(message.text);
        } else {
            previousContext.clear();
            previousLine = kNone;
            std::string_view name;
            const NamePattern* pattern = matchingPattern(message.text, name);
            if (pattern != nullptr && pattern->target == Target::ClockUser) {
                clockOpen = true;
                clockPlaced = false;
                clock = std::string(name);
            }
            chosen = recordForQuotedName(store, names, message.text);
        }
        add(message, chosen);
    }
    return diags;
}

void appendDiagnostic(std::string& out, const Diagnostic& diag) {
    if (!diag.file.empty()) {
        out += diag.file;
        out += ':';
        if (diag.line > 0) {
            out += std::to_string(diag.line);
            out += ':';
            if (diag.column > 0) {
                out += std::to_string(diag.column);
                out += ':';
            }
        }
    } else {
        out += "tsd:";
    }
    out += ' ';
    out += severityName(diag.severity);
    out += ": ";
    // Continuation lines (an echoed definition and its caret line) move
    // right together, so the caret stays under the same character.
    std::string_view text = diag.text;
    for (bool first = true;; first = false) {
        std::size_t end = text.find('\n');
        if (!first)
            out += "   ";
        out += text.substr(0, end);
        out += '\n';
        if (end == std::string_view::npos)
            break;
        text.remove_prefix(end + 1);
    }
    for (const std::string& detail : diag.details) {
        out += detail;
        out += '\n';
    }
}

void printDiagnostic(std::ostream& out, const Diagnostic& diag) {
    std::string text;
    appendDiagnostic(text, diag);
    out << text;
}

} // namespace tsd_cli
