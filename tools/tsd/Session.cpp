#include "Session.h"

#include "Hints.h"
#include "Pages.h"
#include "Statements.h"

#include "tsd/host/DumpStream.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <iostream>
#include <limits>
#include <unordered_map>

namespace tsd_cli {

namespace {

bool startsWithNoCase(std::string_view text, std::string_view prefix) {
    return text.size() >= prefix.size() && equalsNoCase(text.substr(0, prefix.size()), prefix);
}

// "DROP_SPEC", in any case, with an optional ':' before the end.
bool isDropSpec(std::string_view value) {
    auto trim = [&value] {
        while (!value.empty() && (value.back() == ' ' || value.back() == '\t'))
            value.remove_suffix(1);
    };
    trim();
    if (!value.empty() && value.back() == ':')
        value.remove_suffix(1);
    trim();
    return equalsNoCase(value, "DROP_SPEC");
}

// Records address the text by 32-bit offsets.
[[noreturn]] void throwTooLarge(const std::string& name) {
    throw IoError("cannot read \"" + name + "\": the input passes 4 GiB");
}

[[noreturn]] void throwReadError(const std::string& what) {
    throw IoError("cannot read " + what + ": " + std::strerror(errno));
}

// Reads to the end of `in` in large blocks, into one buffer of the
// expected size: no per-character work, no copy while it grows.
void readAll(std::FILE* in, std::string& text, std::size_t expected, const std::string& what) {
    reserveLarge(text, expected + 1);
    text.resize(expected + 1); // one more, so that the end shows without growing
    std::size_t size = 0;
    for (;;) {
        if (size == text.size())
            text.resize(std::max<std::size_t>(text.size() * 2, 1u << 16));
        std::size_t got = std::fread(&text[size], 1, text.size() - size, in);
        size += got;
        if (got == 0) {
            if (std::ferror(in) != 0)
                throwReadError(what);
            break;
        }
    }
    text.resize(size);
}

struct FileCloser {
    void operator()(std::FILE* file) const { std::fclose(file); }
};

// The live sessions by number; a slot is null once its session is gone.
std::vector<Session*>& liveSessions() {
    static std::vector<Session*> sessions;
    return sessions;
}

// Two pointers and two indexes per reference line.
static_assert(sizeof(CliRef) <= 3 * sizeof(void*), "a reference record grew");
static_assert(alignof(CliRef) <= alignof(void*), "the pool aligns to a pointer");

BlockPool& refPool() {
    static BlockPool pool(sizeof(CliRef));
    return pool;
}

} // namespace

void* CliRef::operator new(std::size_t size) {
    return size <= refPool().blockSize() ? refPool().allocate() : ::operator new(size);
}

void CliRef::operator delete(void* block, std::size_t size) {
    if (size <= refPool().blockSize())
        refPool().release(block);
    else
        ::operator delete(block);
}

CliRef::CliRef(const Session& session, std::size_t record)
    : m_session(session.m_number), m_record(static_cast<std::uint32_t>(record)) {}

CliRef::~CliRef() {
    Session& owner = session();
    if (owner.m_closing)
        return; // nobody asks any more
    CliRef*& slot = owner.m_refOf[m_record];
    if (slot == this)
        slot = nullptr;
}

Session& CliRef::session() const {
    return *liveSessions()[m_session];
}

std::string_view CliRef::element() const {
    const PropStore& store = session().store();
    return store.element(store[m_record]);
}

bool CliRef::isEqual(const Tsd_Ref* other) const {
    auto* ref = dynamic_cast<const CliRef*>(other);
    return ref != nullptr && ref->element() == element();
}

void CliRef::dump(DumpStream& stream, short indent) const {
    std::string line(static_cast<std::size_t>(indent) * 3, ' ');
    line += "CliRef ";
    line += element();
    stream << line.c_str() << DumpStream::endl;
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
        readAll(stdin, input.text, 0, "standard input");
        return input;
    }
    input.displayName = path;
    std::error_code ec;
    if (std::filesystem::is_directory(path, ec))
        throw IoError("cannot read \"" + path + "\": it is a directory");
    std::unique_ptr<std::FILE, FileCloser> in(std::fopen(path.c_str(), "rb"));
    if (!in)
        throw IoError("cannot open \"" + path + "\": " + std::strerror(errno));
    std::uintmax_t size = std::filesystem::file_size(path, ec);
    if (!ec && size > PropStore::kMaxText)
        throwTooLarge(path);
    std::size_t expected = !ec ? static_cast<std::size_t>(size) : 0;
    readAll(in.get(), input.text, expected, "\"" + path + "\"");
    return input;
}

Session::Session() {
    std::vector<Session*>& live = liveSessions();
    auto slot = std::find(live.begin(), live.end(), nullptr);
    if (slot == live.end())
        slot = live.insert(live.end(), nullptr);
    *slot = this;
    m_number = static_cast<std::uint32_t>(slot - live.begin());
    m_design = std::make_unique<CliDesign>();
    m_builder = std::make_unique<CliBuilder>(m_design.get(), &m_standIn);
}

Session::~Session() {
    // The design deletes its reference records, which find the session by
    // its number: it stays registered until they are gone.
    m_closing = true;
    m_design.reset();
    m_builder.reset();
    liveSessions()[m_number] = nullptr;
}

void Session::load(const std::vector<std::string>& paths) {
    std::vector<InputFile> inputs;
    for (const std::string& path : paths)
        inputs.push_back(readInput(path));
    load(std::move(inputs));
}

void Session::load(std::vector<InputFile> inputs) {
    load(std::move(inputs), FileReader());
}

void Session::load(std::vector<InputFile> inputs, const FileReader& reader) {
    m_displayFile = inputs.size() == 1 ? inputs.front().displayName : std::string();
    std::size_t lines = 0;
    std::size_t bytes = 0;
    for (const InputFile& input : inputs) {
        lines +=
            static_cast<std::size_t>(std::count(input.text.begin(), input.text.end(), '\n')) + 1;
        bytes += input.text.size();
    }
    // A design of property lines takes up to about eight times the room of
    // its text, one of statements up to about sixteen times.
    prepareHeap(bytes * 16);
    // An upper bound: the pages of lines without a property are never touched.
    m_store.reserve(m_store.size() + lines);
    const std::vector<StoredProp>& records = m_store.records();
    adviseLargePages(records.data(), records.capacity() * sizeof(StoredProp));
    reserveLarge(m_refOf, m_refOf.size() + lines);
    std::vector<std::uint32_t> files;
    for (InputFile& input : inputs)
        files.push_back(addFile(std::move(input)));
    for (std::uint32_t file : files)
        if (!reader || !reader(*this, file))
            readPropFile(file);
}

std::uint32_t Session::addFile(InputFile input) {
    if (input.text.size() > PropStore::kMaxText - m_textSize)
        throwTooLarge(input.displayName);
    m_textSize += input.text.size();
    m_fileNames.push_back(input.displayName);
    return m_store.addFile(std::move(input.displayName), std::move(input.text));
}

void Session::readPropFile(std::uint32_t file) {
    ++m_propFilesRead;
    std::string_view text = m_store.fileText(file);
    // A byte-order mark is not part of the first line.
    std::size_t start = text.substr(0, 3) == "\xEF\xBB\xBF" ? 3 : 0;
    std::uint32_t lineNo = 0;
    PropFields fields;
    std::string error;
    while (start < text.size()) {
        std::size_t end = text.find('\n', start);
        if (end == std::string_view::npos)
            end = text.size();
        ++lineNo;
        switch (parsePropLine(text.substr(start, end - start), fields, error)) {
        case LineStatus::Blank:
            break;
        case LineStatus::Malformed:
            m_diags.push_back({m_store.fileName(file),
                               static_cast<int>(lineNo),
                               Severity::Error,
                               std::move(error),
                               {}});
            error.clear();
            break;
        case LineStatus::Property: {
            StoredProp record;
            record.kind = fields.kind;
            record.file = file;
            record.line = lineNo;
            auto span = [&](const Word& word, StoredProp::Field field) {
                if (!word.escaped)
                    return m_store.spanIn(file, word.text);
                record.inArena |= field;
                return m_store.keep(word.str());
            };
            if (fields.kind == PropKind::Ref)
                record.element = span(fields.element, StoredProp::Element);
            record.name = span(fields.name, StoredProp::Name);
            record.value = m_store.spanIn(file, fields.value);
            // A reference value is a name: one quoted string stands for the
            // name inside.
            if (fields.kind == PropKind::Ref && !fields.value.empty() &&
                fields.value.front() == '"') {
                std::string name = refValueName(fields.value);
                if (name.size() != fields.value.size()) {
                    record.value = m_store.keep(name);
                    record.inArena |= StoredProp::Value;
                }
            }
            add(record);
            break;
        }
        }
        start = end + 1;
    }
}

void Session::add(const StoredProp& record) {
    std::size_t index = m_store.add(record);
    m_refOf.push_back(nullptr);
    feed(index);
}

void Session::lineError(const StoredProp& record, std::string text) {
    m_diags.push_back({m_store.fileName(record),
                       static_cast<int>(record.line),
                       Severity::Error,
                       std::move(text),
                       {},
                       static_cast<int>(record.column)});
}

void Session::feed(std::size_t index) {
    const StoredProp& record = m_store[index];
    std::string_view name = m_store.name(record);
    std::string_view value = m_store.value(record);
    // The builder takes zero-terminated texts.
    m_name.assign(name);
    m_value.assign(value);
    switch (record.kind) {
    case PropKind::Group:
        m_builder->addUserGroupProp(m_name.c_str(), m_value.c_str());
        return;
    case PropKind::Spec: {
        bool named = startsWithNoCase(name, "TS") || startsWithNoCase(name, "TIMEGRP");
        // Dropping a specification is left to the program that feeds the
        // builder; the base builder would end the run on it.
        if (named && isDropSpec(value)) {
            lineError(record, "DROP_SPEC is not supported in property files: leave out the "
                              "definition of " +
                                  inQuotes(name) + " instead");
            return;
        }
        if (!m_builder->addSpecProp(m_name.c_str(), m_value.c_str()))
            lineError(record, inQuotes(name) +
                                  " is not a specification name: use a TSid (TS...), OFFSET, "
                                  "ENABLE, DISABLE or TIMEGRP...");
        return;
    }
    case PropKind::Ref: {
        // Most lines repeat the name of the line before.
        if (m_lastRefProp.empty() || m_name != m_lastRefProp) {
            if (!Tsd_Builder::isRefProp(m_name.c_str())) {
                lineError(record, inQuotes(name) +
                                      " is not a reference property: use TS_TNM, TS_TPTHRU, "
                                      "TS_TPSYNC, TS_TIG, TS_CLKGRP, TS_OFFSET, TS_PERIOD, "
                                      "TS_MAXDELAY, TS_MAXSKEW or TS_FEEDBACK");
                return;
            }
            m_lastRefProp = m_name;
        }
        auto ref = std::make_unique<CliRef>(*this, index);
        m_currentRecord = static_cast<std::ptrdiff_t>(index);
        std::size_t before = m_diags.size();
        bool owned = m_builder->addRefProp(ref.get(), m_name.c_str(), m_value.c_str());
        m_currentRecord = -1;
        if (owned)
            m_refOf[index] = ref.release(); // the owner deletes it
        else if (m_diags.size() == before)
            lineError(m_store[index], "no object took the reference property");
        return;
    }
    }
}

void Session::addNote(std::string text, std::ptrdiff_t record) {
    if (record < 0 && m_building) {
        m_buildMessages.push_back({MessageSeverity::Status, std::move(text), m_builder->context()});
        return;
    }
    Diagnostic diag{m_displayFile, 0, Severity::Note, std::move(text), {}};
    if (record >= 0) {
        const StoredProp& prop = m_store[static_cast<std::size_t>(record)];
        diag.file = m_store.fileName(prop);
        diag.line = static_cast<int>(prop.line);
        diag.column = static_cast<int>(prop.column);
    }
    m_diags.push_back(std::move(diag));
}

bool Session::build() {
    m_standIn.beforeBuild();
    m_building = true;
    Tsd_Design* result = m_builder->buildTSDesign();
    m_building = false;
    m_standIn.afterBuild();
    attributeBuildMessages();
    m_standIn.explainMissingNames(m_diags);
    m_built = result != nullptr;
    if (!m_built && errorCount() == 0)
        m_diags.push_back({m_displayFile, 0, Severity::Error, "the design could not be built", {}});
    return m_built && errorCount() == 0;
}

void Session::attributeBuildMessages() {
    if (!m_buildMessages.empty()) {
        std::vector<Diagnostic> diags =
            tsd_cli::attributeBuildMessages(m_store, m_buildMessages, m_displayFile);
        m_buildMessages.clear();
        for (Diagnostic& diag : diags)
            m_diags.push_back(std::move(diag));
    }
    // People read a file from the top: order by file, then line; what has
    // no line comes after its file's lines, what has no file comes last.
    std::unordered_map<std::string_view, std::size_t> fileIndex;
    for (std::size_t i = 0; i < m_fileNames.size(); ++i)
        fileIndex.emplace(m_fileNames[i], i); // a file named twice sorts at its first place
    using Key = std::pair<std::size_t, int>;
    std::vector<std::pair<Key, std::size_t>> order;
    order.reserve(m_diags.size());
    for (std::size_t i = 0; i < m_diags.size(); ++i) {
        const Diagnostic& diag = m_diags[i];
        auto file = fileIndex.find(diag.file);
        Key key(file != fileIndex.end() ? file->second : m_fileNames.size(),
                diag.line > 0 ? diag.line : std::numeric_limits<int>::max());
        order.emplace_back(key, i);
    }
    // The index breaks ties: the sort is stable.
    std::sort(order.begin(), order.end());
    std::vector<Diagnostic> sorted;
    sorted.reserve(m_diags.size());
    for (const auto& entry : order)
        sorted.push_back(std::move(m_diags[entry.second]));
    m_diags = std::move(sorted);
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
    for (const StoredProp& record : m_store.records())
        if (record.kind == kind)
            ++count;
    return count;
}

std::vector<std::size_t> Session::recordsOwnedBy(Tsd_BaseObj* owner) const {
    std::vector<std::size_t> records;
    Tsd_RefListIter iter(owner);
    while (Tsd_Ref* ref = iter.next()) {
        auto* cli = dynamic_cast<CliRef*>(ref);
        if (cli != nullptr && cli->m_session == m_number && m_refOf[cli->record()] == cli)
            records.push_back(cli->record());
    }
    // A list may hold a record twice; each record stands once, in input order.
    std::sort(records.begin(), records.end());
    records.erase(std::unique(records.begin(), records.end()), records.end());
    return records;
}

std::vector<int> Session::withdraw(const std::vector<std::string>& elements) {
    // One pass over the records for all elements: each element's records
    // are collected, then withdrawn element by element.
    std::unordered_map<std::string_view, std::size_t> wanted;
    for (std::size_t i = 0; i < elements.size(); ++i)
        wanted.emplace(elements[i], i); // named again: the first time takes all
    std::vector<std::vector<std::size_t>> matches(elements.size());
    for (std::size_t index = 0; index < m_refOf.size(); ++index) {
        if (m_refOf[index] == nullptr)
            continue;
        auto found = wanted.find(m_store.element(m_store[index]));
        if (found != wanted.end())
            matches[found->second].push_back(index);
    }
    std::vector<int> counts(elements.size(), 0);
    for (std::size_t i = 0; i < elements.size(); ++i) {
        for (std::size_t index : matches[i]) {
            if (CliRef* ref = m_refOf[index]) {
                ref->trim(); // deletes the record, which clears its slot
                ++counts[i];
            }
        }
    }
    return counts;
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
    } else if (m_currentRecord >= 0) {
        const StoredProp& prop = m_store[static_cast<std::size_t>(m_currentRecord)];
        addLibraryMessage(m_diags, record.severity, record.text, m_store.fileName(prop),
                          static_cast<int>(prop.line), static_cast<int>(prop.column));
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
        std::string text;
        for (const Diagnostic& diag : m_diags)
            appendDiagnostic(text, diag);
        std::cerr << text;
    }
    std::cout.flush();
    std::cerr.flush();
}

} // namespace tsd_cli
