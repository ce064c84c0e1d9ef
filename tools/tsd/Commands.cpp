#include "Commands.h"

#include "Describe.h"
#include "Graph.h"
#include "Hints.h"
#include "Json.h"
#include "Pages.h"
#include "Session.h"
#include "Statements.h"

#include "tsd/host/DumpStream.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <functional>
#include <iostream>
#include <limits>
#include <sstream>
#include <tuple>
#include <unordered_map>
#include <unordered_set>

namespace tsd_cli {

namespace {

constexpr const char* kListKeys[] = {"groups", "specs", "refs"};

std::string plural(int n, const char* one, const char* many) {
    return std::to_string(n) + " " + (n == 1 ? one : many);
}

void writeDiagnostics(JsonWriter& json, const Session& session) {
    json.key("diagnostics").beginArray();
    for (const Diagnostic& diag : session.diagnostics()) {
        json.beginObject().key("file");
        if (diag.file.empty())
            json.null();
        else
            json.string(diag.file);
        json.key("line");
        if (diag.line > 0)
            json.number(diag.line);
        else
            json.null();
        if (diag.column > 0) // only where it is known: never for property files
            json.member("column", diag.column);
        json.member("severity", severityName(diag.severity))
            .member("text", diag.text)
            .key("details")
            .strings(diag.details)
            .endObject();
    }
    json.endArray();
}

void writeProp(JsonWriter& json, PropKind kind, std::string_view element, std::string_view name,
               std::string_view value) {
    json.beginObject().member("kind", propKeyword(kind));
    if (kind == PropKind::Ref)
        json.member("element", element);
    json.member("name", name).member("value", value).endObject();
}

// Writes the product of a command to standard output or to the -o file.
void emit(const OutputOptions& options, const std::string& text) {
    if (options.outFile.empty() || options.outFile == "-") {
        std::cout.write(text.data(), static_cast<std::streamsize>(text.size()));
        std::cout.flush();
        if (!std::cout)
            throw IoError("cannot write to standard output");
        return;
    }
    std::ofstream out(options.outFile, std::ios::binary | std::ios::trunc);
    if (!out)
        throw IoError("cannot write \"" + options.outFile + "\": " + std::strerror(errno));
    out.write(text.data(), static_cast<std::streamsize>(text.size()));
    out.close();
    if (!out)
        throw IoError("cannot write \"" + options.outFile + "\": " + std::strerror(errno));
}

void printDiagnostics(const Session& session) {
    std::string text;
    for (const Diagnostic& diag : session.diagnostics())
        appendDiagnostic(text, diag);
    std::cerr << text;
    std::cerr.flush();
}

// Room for the product of a command that writes the design back: pages
// that stay unused cost nothing, and the text is not copied as it grows.
// JSON takes about four times the room of property lines.
std::string outputBuffer(const Session& session, const OutputOptions& options) {
    std::size_t input = 0;
    for (std::uint32_t file = 0; file < session.store().fileCount(); ++file)
        input += session.store().fileText(file).size();
    std::string out;
    reserveLarge(out, (input + input / 2) * (options.json ? 4 : 1) + 4096);
    return out;
}

std::string_view orEmpty(const char* text) {
    return text != nullptr ? std::string_view(text) : std::string_view();
}

// --- Statement files ------------------------------------------------------

// A statement file of the run, kept so that it can be written back.
struct StatementInput {
    std::uint32_t file = 0;
    std::size_t firstRecord = 0; // the store's index of its first record
    StatementFile parsed;
};

// The files of a run in the form each is read in; the statement files are
// kept for writing.
class Inputs {
public:
    explicit Inputs(const OutputOptions& options) : m_format(options.format) {}

    // Reads the files into the session, each as the format it is.
    void load(Session& session, const std::vector<std::string>& paths) {
        std::vector<InputFile> inputs;
        for (const std::string& path : paths)
            inputs.push_back(readInput(path));
        session.load(std::move(inputs), [this](Session& s, std::uint32_t file) {
            if (!isStatements(s.store().fileText(file)))
                return false;
            read(s, file);
            return true;
        });
    }

    // Builds the design and places the messages about statement records
    // at the word they are about.
    void build(Session& session) const {
        session.build();
        if (!m_files.empty())
            placeMessages(session);
    }

    // The statement file of store file `file`, or null for a property file.
    const StatementInput* statements(std::uint32_t file) const {
        for (const StatementInput& input : m_files)
            if (input.file == file)
                return &input;
        return nullptr;
    }

private:
    bool isStatements(std::string_view text) const {
        if (!m_format.empty())
            return m_format == "statements";
        return detectFormat(text) == FileFormat::Statements;
    }

    void read(Session& session, std::uint32_t file) {
        std::string_view text = session.store().fileText(file);
        StatementInput input;
        input.file = file;
        input.firstRecord = session.store().size();
        input.parsed = readStatements(text);
        const std::string& name = session.store().fileName(file);
        for (const StatementError& error : input.parsed.errors)
            session.addDiagnostic(
                {name, error.where.line, Severity::Error, error.text, {}, error.where.column});
        for (const std::string& net : input.parsed.nets)
            session.addDesignNet(net);
        // The records of one statement share its element.
        std::size_t elementOf = static_cast<std::size_t>(-1);
        TextSpan element;
        for (const StatementRecord& from : input.parsed.records) {
            StoredProp record;
            record.kind = from.prop.kind;
            record.file = file;
            TextPos at = recordPosition(from);
            record.line = static_cast<std::uint32_t>(at.line);
            record.column = static_cast<std::uint32_t>(at.column);
            if (record.kind == PropKind::Ref) {
                if (from.statement != elementOf) {
                    element = session.store().keep(from.prop.element);
                    elementOf = from.statement;
                }
                record.element = element;
                record.inArena |= StoredProp::Element;
            }
            record.name = session.store().keep(from.prop.name);
            record.inArena |= StoredProp::Name;
            std::string_view written =
                text.substr(from.valueBegin, from.valueEnd - from.valueBegin);
            if (written == from.prop.value) {
                record.value = session.store().spanIn(file, written);
            } else {
                record.value = session.store().keep(from.prop.value);
                record.inArena |= StoredProp::Value;
            }
            session.add(record);
        }
        m_files.push_back(std::move(input));
    }

    void placeMessages(Session& session) const;

    std::string m_format;
    std::vector<StatementInput> m_files;
};

// Where in `value` a word stands on its own (not inside a longer word).
std::size_t findWord(std::string_view value, std::string_view word) {
    auto separator = [](char c) {
        return c == ' ' || c == '\t' || c == ':' || c == '=' || c == '"' || c == '(' || c == ')' ||
               c == ',';
    };
    for (std::size_t at = value.find(word); !word.empty() && at != std::string_view::npos;
         at = value.find(word, at + 1)) {
        std::size_t end = at + word.size();
        if ((at == 0 || separator(value[at - 1])) && (end == value.size() || separator(value[end])))
            return at;
    }
    return std::string_view::npos;
}

// The byte of a record's value that a message about it is about: the one
// its caret line points at, else the first quoted word of the message
// (after the context that repeats the definition) that stands in the value.
std::size_t offsetInValue(const std::string& text, const std::string& context,
                          std::string_view name, std::string_view value) {
    std::size_t caret = text.rfind('\n');
    if (caret != std::string::npos && text.find_first_not_of(' ', caret + 1) != std::string::npos &&
        text[text.find_first_not_of(' ', caret + 1)] == '^' && text.back() == '^') {
        std::size_t column = text.size() - 1 - (caret + 1);
        return column > name.size() ? column - name.size() - 1 : std::string_view::npos;
    }
    std::string_view rest = text;
    if (rest.substr(0, context.size()) == context)
        rest.remove_prefix(context.size());
    rest = rest.substr(0, rest.find('\n'));
    for (std::size_t open = rest.find('"'); open != std::string_view::npos;) {
        std::size_t close = rest.find('"', open + 1);
        if (close == std::string_view::npos)
            break;
        std::size_t at = findWord(value, rest.substr(open + 1, close - open - 1));
        if (at != std::string_view::npos)
            return at;
        open = rest.find('"', close + 1);
    }
    return std::string_view::npos;
}

void Inputs::placeMessages(Session& session) const {
    const PropStore& store = session.store();
    std::vector<Diagnostic>& diags = session.diagnostics();
    for (const StatementInput& input : m_files) {
        const std::string& name = store.fileName(input.file);
        // Records by the position a message about them carries.
        std::unordered_map<std::uint64_t, std::size_t> byPos;
        auto key = [](int line, int column) {
            return (static_cast<std::uint64_t>(line) << 32) | static_cast<std::uint32_t>(column);
        };
        for (Diagnostic& diag : diags) {
            if (diag.file != name || diag.line <= 0 || diag.column <= 0)
                continue;
            if (byPos.empty())
                for (std::size_t i = 0; i < input.parsed.records.size(); ++i) {
                    TextPos at = recordPosition(input.parsed.records[i]);
                    byPos.emplace(key(at.line, at.column), i);
                }
            auto found = byPos.find(key(diag.line, diag.column));
            if (found == byPos.end())
                continue;
            const StatementRecord& record = input.parsed.records[found->second];
            const StoredProp& stored = store[input.firstRecord + found->second];
            std::string context = record.prop.kind == PropKind::Ref
                                      ? std::string()
                                      : processingContext(store, stored);
            std::size_t offset =
                offsetInValue(diag.text, context, record.prop.name, record.prop.value);
            if (offset == std::string_view::npos || offset >= record.prop.value.size())
                continue;
            TextPos at = valuePosition(store.fileText(input.file), record, offset);
            diag.line = at.line;
            diag.column = at.column;
        }
    }
    // People read a file from the top: a message that moved to a later line
    // of its statement moves among the others; on one line, by column.
    std::unordered_map<std::string_view, std::size_t> fileOrder;
    for (std::size_t i = 0; i < session.fileNames().size(); ++i)
        fileOrder.emplace(session.fileNames()[i], i);
    auto rank = [&](const Diagnostic& diag) {
        auto file = fileOrder.find(diag.file);
        return std::make_tuple(file != fileOrder.end() ? file->second : fileOrder.size() + 1,
                               diag.line > 0 ? diag.line : std::numeric_limits<int>::max(),
                               diag.column);
    };
    std::stable_sort(diags.begin(), diags.end(),
                     [&](const Diagnostic& a, const Diagnostic& b) { return rank(a) < rank(b); });
}

// The objects that the group and spec records of a statement file made,
// found after the build (trimming hides trashed ones from the finds): user
// groups by name, endpoint specs by TSid, offsets and path controls by
// their order, which is the order of their records. Null where no object
// can be told for certain: such a record is written as it stands.
std::vector<Tsd_BaseObj*> recordObjects(Session& session, const StatementInput& input) {
    Tsd_Design& design = session.design();
    const std::vector<StatementRecord>& records = input.parsed.records;
    std::vector<Tsd_BaseObj*> objects(records.size(), nullptr);
    auto listed = [](Tsd_BaseObjList* list) {
        std::vector<Tsd_BaseObj*> out;
        Tsd_BaseObjListIter iter(list);
        while (Tsd_BaseObj* obj = iter.next())
            if (!obj->refOwner())
                out.push_back(obj);
        return out;
    };
    // The builder adds offsets and path controls in the order of their
    // records.
    std::vector<std::size_t> offsetRecords;
    std::vector<std::size_t> controlRecords;
    // A TIMESPEC whose value is a group offset makes an offset, whatever
    // spec its TSid names; a TSid met twice stands for its first record.
    auto isOffsetValue = [](const std::string& value) {
        for (const std::string& word : valueWords(value))
            if (equalsNoCase(word, "OFFSET"))
                return true;
        return false;
    };
    std::unordered_set<Tsd_BaseObj*> taken;
    for (std::size_t i = 0; i < records.size(); ++i) {
        const PropRecord& prop = records[i].prop;
        if (prop.kind == PropKind::Group) {
            objects[i] = design.findGroupByUserName(prop.name.c_str(), false);
        } else if (prop.kind == PropKind::Spec) {
            if (equalsNoCase(prop.name, "ENABLE") || equalsNoCase(prop.name, "DISABLE"))
                controlRecords.push_back(i);
            else if (isOffsetValue(prop.value))
                offsetRecords.push_back(i);
            else if (Tsd_EndpointSpec* spec =
                         design.findEndpointSpecByTSid(prop.name.c_str(), false))
                objects[i] = taken.insert(spec).second ? spec : nullptr;
            else
                offsetRecords.push_back(i);
        }
    }
    // Records that made no object (or several files) leave the counts
    // apart: then the records are written as they stand.
    auto pair = [&objects](const std::vector<std::size_t>& mine,
                           const std::vector<Tsd_BaseObj*>& all) {
        if (all.size() == mine.size())
            for (std::size_t k = 0; k < mine.size(); ++k)
                objects[mine[k]] = all[k];
    };
    pair(offsetRecords, listed(design.getOffsetSpecList()));
    pair(controlRecords, listed(design.getPathControlList()));
    return objects;
}

// One output per record of a statement file: its canonical value, or a
// drop for what is gone (a withdrawn reference, a trashed object).
std::vector<RecordOutput> statementOutputs(Session& session, const StatementInput& input,
                                           const std::vector<Tsd_BaseObj*>& objects,
                                           const std::unordered_set<Tsd_BaseObj*>& trashed) {
    Tsd_Annotator annotator(&session.design());
    const std::vector<StatementRecord>& records = input.parsed.records;
    std::vector<RecordOutput> outputs;
    outputs.reserve(records.size());
    for (std::size_t i = 0; i < records.size(); ++i) {
        const StatementRecord& record = records[i];
        if (record.prop.kind == PropKind::Ref) {
            CliRef* ref = session.refOf(input.firstRecord + i);
            const char* name = nullptr;
            const char* value = nullptr;
            if (ref == nullptr || !annotator.getRefProp(ref, name, value))
                outputs.push_back(RecordOutput::drop());
            else
                outputs.push_back(RecordOutput::canonical(std::string(orEmpty(value))));
            continue;
        }
        Tsd_BaseObj* obj = objects[i];
        if (obj != nullptr && trashed.count(obj) != 0) {
            outputs.push_back(RecordOutput::drop());
            continue;
        }
        ObjectProp prop = obj != nullptr ? objectProp(obj) : ObjectProp();
        outputs.push_back(RecordOutput::canonical(prop.ok ? prop.value : record.prop.value));
    }
    return outputs;
}

// Hands `visit` the canonical properties, as the design writes them back:
// the groups, then the specifications, then each reference record in input
// order that an active object still owns. The texts are valid during the
// call only.
template <class Visit>
void forEachCanonicalProp(Session& session, Visit visit) {
    Tsd_Annotator annotator(&session.design());
    const char* name = nullptr;
    const char* value = nullptr;
    while (annotator.getNextGroupProp(name, value))
        visit(PropKind::Group, std::string_view(), orEmpty(name), orEmpty(value));
    while (annotator.getNextSpecProp(name, value))
        visit(PropKind::Spec, std::string_view(), orEmpty(name), orEmpty(value));
    for (std::size_t i = 0; i < session.store().size(); ++i) {
        CliRef* ref = session.refOf(i);
        if (ref != nullptr && annotator.getRefProp(ref, name, value))
            visit(PropKind::Ref, ref->element(), orEmpty(name), orEmpty(value));
    }
}

// A property line of the design's; a reference value is a name.
void appendDesignLine(std::string& out, std::string& scratch, PropKind kind,
                      std::string_view element, std::string_view name, std::string_view value) {
    appendPropLine(out, kind, element, name,
                   kind == PropKind::Ref ? refValueText(value, scratch) : value);
}

void appendCanonicalText(std::string& out, Session& session) {
    std::string scratch;
    forEachCanonicalProp(session, [&](PropKind kind, std::string_view element,
                                      std::string_view name, std::string_view value) {
        appendDesignLine(out, scratch, kind, element, name, value);
    });
}

// The statement file written back with the design's canonical values.
void appendStatementText(std::string& out, Session& session, const StatementInput& input,
                         const std::vector<Tsd_BaseObj*>& objects,
                         const std::unordered_set<Tsd_BaseObj*>& trashed) {
    out += writeStatements(session.store().fileText(input.file), input.parsed,
                           statementOutputs(session, input, objects, trashed));
}

// The canonical properties as statements, one per line.
void appendCanonicalStatements(std::string& out, Session& session) {
    std::string statement;
    std::string error;
    forEachCanonicalProp(session, [&](PropKind kind, std::string_view element,
                                      std::string_view name, std::string_view value) {
        PropRecord prop{kind, std::string(element), std::string(name), std::string(value)};
        if (propToStatement(prop, statement, error)) {
            out += statement;
            out += '\n';
        } else {
            session.addDiagnostic({session.displayFile(), 0, Severity::Error, error, {}});
        }
    });
}

// The canonical properties as three JSON lists, by kind.
void writeCanonicalLists(JsonWriter& json, Session& session) {
    int open = -1; // the list being written
    auto openUpTo = [&](int kind) {
        for (; open < kind; ++open) {
            if (open >= 0)
                json.endArray();
            json.key(kListKeys[open + 1]).beginArray();
        }
    };
    forEachCanonicalProp(session, [&](PropKind kind, std::string_view element,
                                      std::string_view name, std::string_view value) {
        openUpTo(static_cast<int>(kind));
        writeProp(json, kind, element, name, value);
    });
    openUpTo(static_cast<int>(PropKind::Ref));
    json.endArray();
}

void writeEmptyLists(JsonWriter& json) {
    for (const char* key : kListKeys)
        json.key(key).beginArray().endArray();
}

// In JSON mode a fatal message still leaves a JSON document behind.
void installFatalHandler(Session& session, const OutputOptions& options) {
    if (!options.json)
        return;
    session.setFatalHandler([&session] {
        std::string out;
        JsonWriter json(out);
        json.beginObject();
        writeDiagnostics(json, session);
        json.key("fatal").boolean(true).endObject().finish();
        std::cout << out;
    });
}

using JsonMembers = std::function<void(JsonWriter&)>;

// Loads and builds one file. On errors reports them (as JSON: the members
// `product` writes for an empty product, then the diagnostics) and returns
// false.
bool loadAndBuild(Session& session, Inputs& inputs, const std::vector<std::string>& files,
                  const OutputOptions& options, const JsonMembers& product) {
    installFatalHandler(session, options);
    inputs.load(session, files);
    inputs.build(session);
    if (session.errorCount() == 0)
        return true;
    if (options.json) {
        std::string out;
        JsonWriter json(out);
        json.beginObject();
        product(json);
        writeDiagnostics(json, session);
        json.endObject().finish();
        std::cout << out;
    } else {
        printDiagnostics(session);
    }
    return false;
}

// The holders of a group as property lines: an object that exists through
// reference records stands as each of its `ref` records, in input order.
template <class Visit>
void forEachHolderProp(Session& session, Tsd_BaseObjList& holders, Visit visit) {
    Tsd_BaseObjListIter iter(&holders);
    while (Tsd_BaseObj* obj = iter.next()) {
        ObjectProp prop = objectProp(obj);
        if (obj->getRefList() != nullptr) {
            for (std::size_t record : session.recordsOwnedBy(obj))
                visit(PropKind::Ref, session.refOf(record)->element(), prop.name, prop.value);
            continue;
        }
        PropKind kind = obj->getGroup() != nullptr ? PropKind::Group : PropKind::Spec;
        visit(kind, std::string_view(), prop.name, prop.value);
    }
}

Tsd_Group* findAnyGroup(Tsd_Design& design, const std::string& name) {
    if (Tsd_Group* group = design.findGroupByUserName(name.c_str(), false))
        return group;
    if (Tsd_Group* clock = design.findClockGroupByNetName(name.c_str(), false))
        return clock;
    if (!name.empty())
        return design.findTIGByTSid(name.c_str(), false);
    return nullptr;
}

} // namespace

int runCheck(const std::vector<std::string>& files, const OutputOptions& options) {
    Session session;
    session.setAssumeNetlist(options.assumeNetlist);
    installFatalHandler(session, options);
    Inputs inputs(options);
    inputs.load(session, files);
    inputs.build(session);

    int errors = session.errorCount();
    int warnings = session.warningCount();
    int groups = session.countOf(PropKind::Group);
    int specs = session.countOf(PropKind::Spec);
    int refs = session.countOf(PropKind::Ref);
    if (options.json) {
        std::string out;
        JsonWriter json(out);
        json.beginObject().key("files").strings(session.fileNames());
        writeDiagnostics(json, session);
        json.key("summary")
            .beginObject()
            .member("errors", errors)
            .member("warnings", warnings)
            .member("groups", groups)
            .member("specs", specs)
            .member("references", refs);
        if (session.assumeNetlist())
            json.member("assumed", session.assumedCount());
        json.endObject().endObject().finish();
        emit(options, out);
    } else {
        printDiagnostics(session);
        std::string what =
            session.fileNames().size() == 1
                ? session.fileNames().front()
                : plural(static_cast<int>(session.fileNames().size()), "file", "files");
        emit(options,
             what + ": " + plural(errors, "error", "errors") + ", " +
                 plural(warnings, "warning", "warnings") + "; " +
                 plural(groups, "group", "groups") + ", " + plural(specs, "spec", "specs") + ", " +
                 plural(refs, "reference", "references") +
                 (session.assumeNetlist() ? "; " + plural(session.assumedCount(), "name", "names") +
                                                " taken from the netlist"
                                          : std::string()) +
                 "\n");
    }
    return errors == 0 ? kExitOk : kExitErrors;
}

int runFmt(const std::string& file, const OutputOptions& options) {
    Session session;
    session.setAssumeNetlist(options.assumeNetlist);
    Inputs inputs(options);
    if (!loadAndBuild(session, inputs, {file}, options, writeEmptyLists))
        return kExitErrors;
    std::string out = outputBuffer(session, options);
    if (options.json) {
        JsonWriter json(out);
        json.beginObject();
        writeCanonicalLists(json, session);
        writeDiagnostics(json, session);
        json.endObject().finish();
        emit(options, out);
        return session.errorCount() == 0 ? kExitOk : kExitErrors;
    }
    const StatementInput* statements = inputs.statements(0);
    if (statements != nullptr && options.to != "props")
        appendStatementText(out, session, *statements, recordObjects(session, *statements), {});
    else if (statements == nullptr && options.to == "statements")
        appendCanonicalStatements(out, session);
    else
        appendCanonicalText(out, session);
    // What cannot be converted is an error, and nothing is written.
    if (session.errorCount() == 0)
        emit(options, out);
    printDiagnostics(session); // whatever the write-back reported
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

int runDump(const std::string& file, const OutputOptions& options) {
    Session session;
    session.setAssumeNetlist(options.assumeNetlist);
    Inputs inputs(options);
    inputs.load(session, {file});
    inputs.build(session);
    printDiagnostics(session);
    DumpStream stream(std::cout);
    session.builder().dump(stream, 0);
    session.design().dump(stream, 0);
    std::cout.flush();
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

int runHolders(const std::string& file, const std::string& group, const OutputOptions& options) {
    Session session;
    session.setAssumeNetlist(options.assumeNetlist);
    auto emptyProduct = [&group](JsonWriter& json) {
        json.member("group", group).key("holders").beginArray().endArray();
    };
    Inputs inputs(options);
    if (!loadAndBuild(session, inputs, {file}, options, emptyProduct))
        return kExitErrors;
    Tsd_Group* found = findAnyGroup(session.design(), group);
    if (found == nullptr) {
        Diagnostic missing{session.displayFile(),
                           0,
                           Severity::Error,
                           "no group, clock group or TIG directive named " + inQuotes(group),
                           {}};
        if (std::string hint = session.groupHint(group); !hint.empty())
            missing.details.push_back("   " + hint);
        session.addDiagnostic(std::move(missing));
        if (options.json) {
            std::string out;
            JsonWriter json(out);
            json.beginObject();
            emptyProduct(json);
            writeDiagnostics(json, session);
            json.endObject().finish();
            emit(options, out);
        } else {
            printDiagnostics(session);
        }
        return kExitErrors;
    }
    Tsd_BaseObjList holders;
    session.design().getGroupHolders(found, &holders);
    std::string out;
    if (options.json) {
        JsonWriter json(out);
        json.beginObject()
            .member("group", group)
            .member("class", objectClass(found))
            .key("holders")
            .beginArray();
        forEachHolderProp(
            session, holders,
            [&json](PropKind kind, std::string_view element, std::string_view name,
                    std::string_view value) { writeProp(json, kind, element, name, value); });
        json.endArray();
        writeDiagnostics(json, session);
        json.endObject().finish();
        emit(options, out);
    } else {
        std::string scratch;
        forEachHolderProp(session, holders,
                          [&](PropKind kind, std::string_view element, std::string_view name,
                              std::string_view value) {
                              appendDesignLine(out, scratch, kind, element, name, value);
                          });
        emit(options, out);
        printDiagnostics(session);
    }
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

int runTrim(const std::string& file, const std::vector<std::string>& elements,
            const OutputOptions& options) {
    Session session;
    session.setAssumeNetlist(options.assumeNetlist);
    auto emptyProduct = [](JsonWriter& json) {
        json.key("withdrawn").beginArray().endArray();
        json.key("trashed").beginArray().endArray();
        writeEmptyLists(json);
    };
    Inputs inputs(options);
    if (!loadAndBuild(session, inputs, {file}, options, emptyProduct))
        return kExitErrors;

    // An element named twice: the first time took every record.
    std::vector<std::string> unique;
    std::unordered_set<std::string_view> seen;
    for (const std::string& element : elements)
        if (seen.insert(element).second)
            unique.push_back(element);
    std::vector<int> counts = session.withdraw(unique);
    for (std::size_t i = 0; i < unique.size(); ++i) {
        if (counts[i] == 0)
            session.addDiagnostic(
                {session.displayFile(),
                 0,
                 Severity::Warning,
                 "no reference record of element " + inQuotes(unique[i]) + " to remove",
                 {}});
    }

    // Trimming moves objects to the trash and keeps them: their class and
    // name are read when the result is written, not copied a million times.
    struct Trashed {
        Tsd_BaseObj* obj;
        Tsd_Design::TrimReason reason;
    };
    std::vector<Trashed> trashed;
    std::unordered_set<Tsd_BaseObj*> trashedObjects;
    // Which object each statement makes is told before trimming hides some.
    std::vector<Tsd_BaseObj*> objects;
    const bool statementFile = inputs.statements(0) != nullptr;
    if (statementFile)
        objects = recordObjects(session, *inputs.statements(0));
    session.design().onTrashed = [&](Tsd_BaseObj* obj, Tsd_Design::TrimReason reason) {
        trashed.push_back({obj, reason});
        if (statementFile) // only a statement file's writer asks what went
            trashedObjects.insert(obj);
    };
    session.design().trim();
    session.design().onTrashed = nullptr;

    std::string out = outputBuffer(session, options);
    if (options.json) {
        JsonWriter json(out);
        json.beginObject().key("withdrawn").beginArray();
        for (std::size_t i = 0; i < unique.size(); ++i)
            json.beginObject()
                .member("element", unique[i])
                .member("records", counts[i])
                .endObject();
        json.endArray().key("trashed").beginArray();
        for (const Trashed& entry : trashed) {
            TrimReasonText why = trimReasonText(entry.reason);
            json.beginObject()
                .member("class", objectClass(entry.obj))
                .member("name", objectName(entry.obj))
                .member("reason", why.key)
                .member("explanation", why.explanation)
                .endObject();
        }
        json.endArray();
        writeCanonicalLists(json, session);
        writeDiagnostics(json, session);
        json.endObject().finish();
        emit(options, out);
    } else {
        const StatementInput* statements = inputs.statements(0);
        // A statement file's comments end their lines as its lines do, and
        // come after its byte-order mark.
        std::string_view eol = "\n";
        std::string_view bom;
        if (statements != nullptr) {
            std::string_view text = session.store().fileText(statements->file);
            std::size_t newline = text.find('\n');
            if (newline != std::string_view::npos && newline > 0 && text[newline - 1] == '\r')
                eol = "\r\n";
            if (text.substr(0, 3) == "\xEF\xBB\xBF")
                bom = text.substr(0, 3);
            out += bom;
        }
        for (const Trashed& entry : trashed) {
            out += "# trashed ";
            out += objectClass(entry.obj);
            out += ' ';
            out += inQuotes(objectName(entry.obj));
            out += ": ";
            out += trimReasonText(entry.reason).explanation;
            out += eol;
        }
        if (statements != nullptr) {
            std::size_t start = out.size();
            appendStatementText(out, session, *statements, objects, trashedObjects);
            if (!bom.empty() && out.compare(start, bom.size(), bom) == 0)
                out.erase(start, bom.size());
        } else {
            appendCanonicalText(out, session);
        }
        emit(options, out);
        printDiagnostics(session);
    }
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

int runGraph(const std::string& file, const OutputOptions& options) {
    Session session;
    session.setAssumeNetlist(options.assumeNetlist);
    OutputOptions textOnly = options;
    textOnly.json = false;
    Inputs inputs(options);
    if (!loadAndBuild(session, inputs, {file}, textOnly, JsonMembers()))
        return kExitErrors;
    std::ostringstream dot;
    writeDot(dot, session.design());
    emit(options, dot.str());
    printDiagnostics(session);
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

} // namespace tsd_cli
