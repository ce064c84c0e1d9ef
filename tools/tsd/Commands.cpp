#include "Commands.h"

#include "Describe.h"
#include "Graph.h"
#include "Json.h"
#include "Pages.h"
#include "Session.h"

#include "tsd/host/DumpStream.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <functional>
#include <iostream>
#include <sstream>
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
bool loadAndBuild(Session& session, const std::vector<std::string>& files,
                  const OutputOptions& options, const JsonMembers& product) {
    installFatalHandler(session, options);
    session.load(files);
    session.build();
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
    session.load(files);
    session.build();

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
    if (!loadAndBuild(session, {file}, options, writeEmptyLists))
        return kExitErrors;
    std::string out = outputBuffer(session, options);
    if (options.json) {
        JsonWriter json(out);
        json.beginObject();
        writeCanonicalLists(json, session);
        writeDiagnostics(json, session);
        json.endObject().finish();
        emit(options, out);
    } else {
        appendCanonicalText(out, session);
        emit(options, out);
        printDiagnostics(session); // whatever the write-back reported
    }
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

int runDump(const std::string& file, const OutputOptions& options) {
    Session session;
    session.setAssumeNetlist(options.assumeNetlist);
    session.load({file});
    session.build();
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
    if (!loadAndBuild(session, {file}, options, emptyProduct))
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
    if (!loadAndBuild(session, {file}, options, emptyProduct))
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

    struct Trashed {
        const char* cls;
        std::string name;
        TrimReasonText why;
    };
    std::vector<Trashed> trashed;
    session.design().onTrashed = [&trashed](Tsd_BaseObj* obj, Tsd_Design::TrimReason reason) {
        trashed.push_back({objectClass(obj), objectName(obj), trimReasonText(reason)});
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
        for (const Trashed& entry : trashed)
            json.beginObject()
                .member("class", entry.cls)
                .member("name", entry.name)
                .member("reason", entry.why.key)
                .member("explanation", entry.why.explanation)
                .endObject();
        json.endArray();
        writeCanonicalLists(json, session);
        writeDiagnostics(json, session);
        json.endObject().finish();
        emit(options, out);
    } else {
        for (const Trashed& entry : trashed) {
            out += "# trashed ";
            out += entry.cls;
            out += ' ';
            out += inQuotes(entry.name);
            out += ": ";
            out += entry.why.explanation;
            out += '\n';
        }
        appendCanonicalText(out, session);
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
    if (!loadAndBuild(session, {file}, textOnly, JsonMembers()))
        return kExitErrors;
    std::ostringstream dot;
    writeDot(dot, session.design());
    emit(options, dot.str());
    printDiagnostics(session);
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

} // namespace tsd_cli
