#include "Commands.h"

#include "Describe.h"
#include "Graph.h"
#include "Session.h"

#include "tsd/host/DumpStream.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <iostream>
#include <sstream>

namespace tsd_cli {

namespace {

// Keys keep the order they are written in.
using json = nlohmann::ordered_json;

// A property as the design writes it back.
struct OutProp {
    PropKind kind = PropKind::Group;
    std::string element;
    std::string name;
    std::string value;
};

std::string plural(int n, const char* one, const char* many) {
    return std::to_string(n) + " " + (n == 1 ? one : many);
}

json nullableString(const std::string& text) {
    return text.empty() ? json(nullptr) : json(text);
}

json diagnosticsJson(const Session& session) {
    json list = json::array();
    for (const Diagnostic& diag : session.diagnostics()) {
        list.push_back({{"file", nullableString(diag.file)},
                        {"line", diag.line > 0 ? json(diag.line) : json(nullptr)},
                        {"severity", severityName(diag.severity)},
                        {"text", diag.text},
                        {"details", diag.details}});
    }
    return list;
}

json propJson(const OutProp& prop) {
    json out = {{"kind", propKeyword(prop.kind)}};
    if (prop.kind == PropKind::Ref)
        out["element"] = prop.element;
    out["name"] = prop.name;
    out["value"] = prop.value;
    return out;
}

std::string propText(const OutProp& prop) {
    return formatPropLine(prop.kind, prop.element, prop.name, prop.value);
}

// Invalid UTF-8 in a name must not stop the output: it is replaced.
std::string dumpJson(const json& doc) {
    return doc.dump(2, ' ', false, json::error_handler_t::replace) + "\n";
}

// Writes the product of a command to standard output or to the -o file.
void emit(const OutputOptions& options, const std::string& text) {
    if (options.outFile.empty() || options.outFile == "-") {
        std::cout << text;
        std::cout.flush();
        if (!std::cout)
            throw IoError("cannot write to standard output");
        return;
    }
    std::ofstream out(options.outFile, std::ios::binary | std::ios::trunc);
    if (!out)
        throw IoError("cannot write \"" + options.outFile + "\": " + std::strerror(errno));
    out << text;
    out.close();
    if (!out)
        throw IoError("cannot write \"" + options.outFile + "\": " + std::strerror(errno));
}

void printDiagnostics(const Session& session) {
    for (const Diagnostic& diag : session.diagnostics())
        printDiagnostic(std::cerr, diag);
    std::cerr.flush();
}

// The groups, then the specifications, then each reference line in input
// order whose record an active object still owns.
std::vector<OutProp> canonicalProps(Session& session) {
    std::vector<OutProp> props;
    Tsd_Annotator annotator(&session.design());
    const char* name = nullptr;
    const char* value = nullptr;
    auto text = [](const char* s) { return std::string(s != nullptr ? s : ""); };
    while (annotator.getNextGroupProp(name, value))
        props.push_back({PropKind::Group, "", text(name), text(value)});
    while (annotator.getNextSpecProp(name, value))
        props.push_back({PropKind::Spec, "", text(name), text(value)});
    for (const RefRecord& record : session.refs()) {
        if (record.ref != nullptr && annotator.getRefProp(record.ref, name, value))
            props.push_back({PropKind::Ref, record.ref->element(), text(name), text(value)});
    }
    return props;
}

json propsJson(const std::vector<OutProp>& props) {
    json list = json::array();
    for (const OutProp& prop : props)
        list.push_back(propJson(prop));
    return list;
}

std::string propsText(const std::vector<OutProp>& props) {
    std::string text;
    for (const OutProp& prop : props)
        text += propText(prop) + "\n";
    return text;
}

// In JSON mode a fatal message still leaves a JSON document behind.
void installFatalHandler(Session& session, const OutputOptions& options) {
    if (!options.json)
        return;
    session.setFatalHandler([&session] {
        json doc = {{"diagnostics", diagnosticsJson(session)}, {"fatal", true}};
        std::cout << dumpJson(doc);
    });
}

// Loads and builds one file. On errors reports them (as JSON with `empty`
// for the product) and returns false.
bool loadAndBuild(Session& session, const std::vector<std::string>& files,
                  const OutputOptions& options, json empty) {
    installFatalHandler(session, options);
    session.load(files);
    session.build();
    if (session.errorCount() == 0)
        return true;
    if (options.json) {
        empty["diagnostics"] = diagnosticsJson(session);
        std::cout << dumpJson(empty);
    } else {
        printDiagnostics(session);
    }
    return false;
}

// The holders of a group as property lines: an object that exists through
// reference records stands as each of its `ref` lines.
std::vector<OutProp> holderProps(Session& session, Tsd_BaseObjList& holders) {
    std::vector<OutProp> props;
    Tsd_BaseObjListIter iter(&holders);
    while (Tsd_BaseObj* obj = iter.next()) {
        ObjectProp prop = objectProp(obj);
        if (obj->getRefList() != nullptr) {
            for (const RefRecord& record : session.refs())
                if (record.ref != nullptr && record.ref->getOwner() == obj)
                    props.push_back({PropKind::Ref, record.ref->element(), prop.name, prop.value});
            continue;
        }
        PropKind kind = obj->getGroup() != nullptr ? PropKind::Group : PropKind::Spec;
        props.push_back({kind, "", prop.name, prop.value});
    }
    return props;
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
    installFatalHandler(session, options);
    session.load(files);
    session.build();

    int errors = session.errorCount();
    int warnings = session.warningCount();
    int groups = session.countOf(PropKind::Group);
    int specs = session.countOf(PropKind::Spec);
    int refs = session.countOf(PropKind::Ref);
    if (options.json) {
        json doc = {{"files", session.fileNames()},
                    {"diagnostics", diagnosticsJson(session)},
                    {"summary",
                     {{"errors", errors},
                      {"warnings", warnings},
                      {"groups", groups},
                      {"specs", specs},
                      {"references", refs}}}};
        emit(options, dumpJson(doc));
    } else {
        printDiagnostics(session);
        std::string what =
            session.fileNames().size() == 1
                ? session.fileNames().front()
                : plural(static_cast<int>(session.fileNames().size()), "file", "files");
        emit(options, what + ": " + plural(errors, "error", "errors") + ", " +
                          plural(warnings, "warning", "warnings") + "; " +
                          plural(groups, "group", "groups") + ", " +
                          plural(specs, "spec", "specs") + ", " +
                          plural(refs, "reference", "references") + "\n");
    }
    return errors == 0 ? kExitOk : kExitErrors;
}

namespace {

// The canonical properties as three JSON lists, by kind.
struct PropLists {
    json groups = json::array();
    json specs = json::array();
    json refs = json::array();
};

PropLists propLists(const std::vector<OutProp>& props) {
    PropLists lists;
    for (const OutProp& prop : props) {
        json& list = prop.kind == PropKind::Group  ? lists.groups
                     : prop.kind == PropKind::Spec ? lists.specs
                                                   : lists.refs;
        list.push_back(propJson(prop));
    }
    return lists;
}

} // namespace

int runFmt(const std::string& file, const OutputOptions& options) {
    Session session;
    if (!loadAndBuild(
            session, {file}, options,
            {{"groups", json::array()}, {"specs", json::array()}, {"refs", json::array()}}))
        return kExitErrors;
    std::vector<OutProp> props = canonicalProps(session);
    if (options.json) {
        PropLists lists = propLists(props);
        emit(options, dumpJson({{"groups", lists.groups},
                                {"specs", lists.specs},
                                {"refs", lists.refs},
                                {"diagnostics", diagnosticsJson(session)}}));
    } else {
        emit(options, propsText(props));
        printDiagnostics(session); // whatever the write-back reported
    }
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

int runDump(const std::string& file) {
    Session session;
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
    if (!loadAndBuild(session, {file}, options, {{"group", group}, {"holders", json::array()}}))
        return kExitErrors;
    Tsd_Group* found = findAnyGroup(session.design(), group);
    if (found == nullptr) {
        session.addDiagnostic({session.displayFile(),
                               0,
                               Severity::Error,
                               "no group, clock group or TIG directive named " + inQuotes(group),
                               {}});
        if (options.json)
            emit(options, dumpJson({{"group", group},
                                    {"holders", json::array()},
                                    {"diagnostics", diagnosticsJson(session)}}));
        else
            printDiagnostics(session);
        return kExitErrors;
    }
    Tsd_BaseObjList holders;
    session.design().getGroupHolders(found, &holders);
    std::vector<OutProp> props = holderProps(session, holders);
    if (options.json) {
        emit(options, dumpJson({{"group", group},
                                {"class", objectClass(found)},
                                {"holders", propsJson(props)},
                                {"diagnostics", diagnosticsJson(session)}}));
    } else {
        emit(options, propsText(props));
        printDiagnostics(session);
    }
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

int runTrim(const std::string& file, const std::vector<std::string>& elements,
            const OutputOptions& options) {
    Session session;
    json empty = {{"withdrawn", json::array()},
                  {"trashed", json::array()},
                  {"groups", json::array()},
                  {"specs", json::array()},
                  {"refs", json::array()}};
    if (!loadAndBuild(session, {file}, options, empty))
        return kExitErrors;

    json withdrawn = json::array();
    std::vector<std::string> seen;
    for (const std::string& element : elements) {
        if (std::find(seen.begin(), seen.end(), element) != seen.end())
            continue; // named twice: the first time took every record
        seen.push_back(element);
        int count = session.withdraw(element);
        withdrawn.push_back({{"element", element}, {"records", count}});
        if (count == 0)
            session.addDiagnostic(
                {session.displayFile(),
                 0,
                 Severity::Warning,
                 "no reference record of element " + inQuotes(element) + " to remove",
                 {}});
    }

    json trashed = json::array();
    std::string trashedText;
    session.design().onTrashed = [&](Tsd_BaseObj* obj, Tsd_Design::TrimReason reason) {
        TrimReasonText why = trimReasonText(reason);
        std::string cls = objectClass(obj);
        std::string name = objectName(obj);
        trashed.push_back({{"class", cls},
                           {"name", name},
                           {"reason", why.key},
                           {"explanation", why.explanation}});
        trashedText += "# trashed " + cls + " " + inQuotes(name) + ": " + why.explanation + "\n";
    };
    session.design().trim();
    session.design().onTrashed = nullptr;

    std::vector<OutProp> props = canonicalProps(session);
    if (options.json) {
        PropLists lists = propLists(props);
        emit(options, dumpJson({{"withdrawn", withdrawn},
                                {"trashed", trashed},
                                {"groups", lists.groups},
                                {"specs", lists.specs},
                                {"refs", lists.refs},
                                {"diagnostics", diagnosticsJson(session)}}));
    } else {
        emit(options, trashedText + propsText(props));
        printDiagnostics(session);
    }
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

int runGraph(const std::string& file, const OutputOptions& options) {
    Session session;
    OutputOptions textOnly = options;
    textOnly.json = false;
    if (!loadAndBuild(session, {file}, textOnly, {}))
        return kExitErrors;
    std::ostringstream dot;
    writeDot(dot, session.design());
    emit(options, dot.str());
    printDiagnostics(session);
    return session.errorCount() == 0 ? kExitOk : kExitErrors;
}

} // namespace tsd_cli
