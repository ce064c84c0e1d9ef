#include "Session.h"

#include "tsd/host/DumpStream.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <limits>
#include <sstream>

namespace tsd_cli {

namespace {

bool equalsNoCase(const std::string& a, const char* b) {
    std::size_t n = std::strlen(b);
    if (a.size() != n)
        return false;
    for (std::size_t i = 0; i < n; ++i)
        if (std::toupper(static_cast<unsigned char>(a[i])) !=
            std::toupper(static_cast<unsigned char>(b[i])))
            return false;
    return true;
}

bool startsWithNoCase(const std::string& text, const char* prefix) {
    std::size_t n = std::strlen(prefix);
    return text.size() >= n && equalsNoCase(text.substr(0, n), prefix);
}

// "DROP_SPEC", in any case, with an optional ':' before the end.
bool isDropSpec(std::string value) {
    auto trim = [&value] {
        while (!value.empty() && (value.back() == ' ' || value.back() == '\t'))
            value.pop_back();
    };
    trim();
    if (!value.empty() && value.back() == ':')
        value.pop_back();
    trim();
    return equalsNoCase(value, "DROP_SPEC");
}

std::string readStream(std::istream& in, const std::string& what) {
    std::string text((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    if (in.bad())
        throw IoError("cannot read " + what + ": " + std::strerror(errno));
    return text;
}

} // namespace

bool CliRef::isEqual(const Tsd_Ref* other) const {
    auto* ref = dynamic_cast<const CliRef*>(other);
    return ref != nullptr && ref->m_element == m_element;
}

void CliRef::dump(DumpStream& stream, short indent) const {
    stream << std::string(static_cast<std::size_t>(indent) * 3, ' ').c_str() << "CliRef "
           << m_element.c_str() << DumpStream::endl;
    Tsd_Ref::dump(stream, static_cast<short>(indent + 1));
}

void CliDesign::reportObjTrashed(Tsd_BaseObj* obj, TrimReason reason) {
    if (onTrashed)
        onTrashed(obj, reason);
}

InputFile readInput(const std::string& path) {
    InputFile input;
    input.path = path;
    if (path == "-") {
        input.displayName = "<stdin>";
        input.text = readStream(std::cin, "standard input");
        return input;
    }
    input.displayName = path;
    std::error_code ec;
    if (std::filesystem::is_directory(path, ec))
        throw IoError("cannot read \"" + path + "\": it is a directory");
    std::ifstream in(path, std::ios::binary);
    if (!in)
        throw IoError("cannot open \"" + path + "\": " + std::strerror(errno));
    input.text = readStream(in, "\"" + path + "\"");
    return input;
}

Session::Session() {
    m_design = std::make_unique<CliDesign>();
    m_builder = std::make_unique<CliBuilder>(m_design.get());
}

Session::~Session() = default;

void Session::load(const std::vector<std::string>& paths) {
    std::vector<InputFile> inputs;
    for (const std::string& path : paths)
        inputs.push_back(readInput(path));
    load(std::move(inputs));
}

void Session::load(std::vector<InputFile> inputs) {
    m_displayFile = inputs.size() == 1 ? inputs.front().displayName : std::string();
    for (const InputFile& input : inputs) {
        m_fileNames.push_back(input.displayName);
        // A byte-order mark is not part of the first line.
        std::size_t start = input.text.rfind("\xEF\xBB\xBF", 0) == 0 ? 3 : 0;
        int lineNo = 0;
        while (start < input.text.size()) {
            std::size_t end = input.text.find('\n', start);
            if (end == std::string::npos)
                end = input.text.size();
            ++lineNo;
            PropLine prop;
            prop.file = input.displayName;
            prop.line = lineNo;
            std::string error;
            std::string_view line(input.text.data() + start, end - start);
            switch (parsePropLine(line, prop, error)) {
            case LineStatus::Blank:
                break;
            case LineStatus::Malformed:
                m_diags.push_back({prop.file, prop.line, Severity::Error, error, {}});
                break;
            case LineStatus::Property:
                m_props.push_back(std::move(prop));
                feed(m_props.back());
                break;
            }
            start = end + 1;
        }
    }
}

void Session::feed(const PropLine& prop) {
    auto lineError = [&](std::string text) {
        m_diags.push_back({prop.file, prop.line, Severity::Error, std::move(text), {}});
    };
    switch (prop.kind) {
    case PropKind::Group:
        m_builder->addUserGroupProp(prop.name.c_str(), prop.value.c_str());
        return;
    case PropKind::Spec: {
        bool named = startsWithNoCase(prop.name, "TS") || startsWithNoCase(prop.name, "TIMEGRP");
        // Dropping a specification is left to the program that feeds the
        // builder; the base builder would end the run on it.
        if (named && isDropSpec(prop.value)) {
            lineError("DROP_SPEC is not supported in property files: leave out the definition of " +
                      inQuotes(prop.name) + " instead");
            return;
        }
        if (!m_builder->addSpecProp(prop.name.c_str(), prop.value.c_str()))
            lineError(inQuotes(prop.name) +
                      " is not a specification name: use a TSid (TS...), OFFSET, ENABLE, DISABLE "
                      "or TIMEGRP...");
        return;
    }
    case PropKind::Ref: {
        if (!Tsd_Builder::isRefProp(prop.name.c_str())) {
            lineError(inQuotes(prop.name) +
                      " is not a reference property: use TS_TNM, TS_TPTHRU, TS_TPSYNC, TS_TIG, "
                      "TS_CLKGRP, TS_OFFSET, TS_PERIOD, TS_MAXDELAY, TS_MAXSKEW or TS_FEEDBACK");
            return;
        }
        RefRecord record;
        record.prop = static_cast<std::size_t>(&prop - m_props.data());
        auto ref = std::make_unique<CliRef>(prop.element);
        m_currentProp = static_cast<int>(record.prop);
        std::size_t before = m_diags.size();
        bool owned = m_builder->addRefProp(ref.get(), prop.name.c_str(), prop.value.c_str());
        m_currentProp = -1;
        if (owned)
            record.ref = ref.release(); // the owner deletes it
        else if (m_diags.size() == before)
            lineError("no object took the reference property");
        m_refs.push_back(record);
        return;
    }
    }
}

bool Session::build() {
    m_building = true;
    Tsd_Design* result = m_builder->buildTSDesign();
    m_building = false;
    attributeBuildMessages();
    m_built = result != nullptr;
    if (!m_built && errorCount() == 0)
        m_diags.push_back({m_displayFile, 0, Severity::Error, "the design could not be built", {}});
    return m_built && errorCount() == 0;
}

void Session::attributeBuildMessages() {
    std::vector<Diagnostic> diags =
        tsd_cli::attributeBuildMessages(m_props, m_buildMessages, m_displayFile);
    m_buildMessages.clear();
    for (Diagnostic& diag : diags)
        m_diags.push_back(std::move(diag));
    // People read a file from the top: order by file, then line; what has
    // no line comes after its file's lines, what has no file comes last.
    auto key = [this](const Diagnostic& diag) {
        auto file = std::find(m_fileNames.begin(), m_fileNames.end(), diag.file);
        return std::make_pair(file - m_fileNames.begin(),
                              diag.line > 0 ? diag.line : std::numeric_limits<int>::max());
    };
    std::stable_sort(m_diags.begin(), m_diags.end(),
                     [&key](const Diagnostic& a, const Diagnostic& b) { return key(a) < key(b); });
}

int Session::errorCount() const {
    int count = 0;
    for (const Diagnostic& diag : m_diags)
        if (isFailure(diag.severity))
            ++count;
    return count;
}

int Session::warningCount() const {
    int count = m_builder->getNumWarning();
    for (const Diagnostic& diag : m_diags)
        if (diag.severity == Severity::Warning)
            ++count;
    return count;
}

int Session::countOf(PropKind kind) const {
    int count = 0;
    for (const PropLine& prop : m_props)
        if (prop.kind == kind)
            ++count;
    return count;
}

int Session::withdraw(const std::string& element) {
    int count = 0;
    for (RefRecord& record : m_refs) {
        if (record.ref != nullptr && record.ref->element() == element) {
            record.ref->trim(); // deletes the record
            record.ref = nullptr;
            ++count;
        }
    }
    return count;
}

void Session::deliver(const MessageRecord& record) {
    if (record.severity == MessageSeverity::Debug) {
        std::string text = record.text;
        if (text.empty() || text.back() != '\n')
            text += '\n';
        std::fprintf(stderr, "tsd: debug: %s", text.c_str());
        return;
    }
    if (m_building) {
        m_buildMessages.push_back({record.severity, record.text, m_builder->context()});
    } else if (m_currentProp >= 0) {
        const PropLine& prop = m_props[static_cast<std::size_t>(m_currentProp)];
        addLibraryMessage(m_diags, record.severity, record.text, prop.file, prop.line);
    } else {
        addLibraryMessage(m_diags, record.severity, record.text, m_displayFile, 0);
    }
    if (record.severity != MessageSeverity::Fatal)
        return;
    // The library ends the process when this returns: say everything now.
    if (m_building)
        attributeBuildMessages();
    if (m_fatalHandler) {
        m_fatalHandler();
    } else {
        for (const Diagnostic& diag : m_diags)
            printDiagnostic(std::cerr, diag);
    }
    std::cout.flush();
    std::cerr.flush();
}

} // namespace tsd_cli
