// One run of the tool over a set of input files: keeps their text, hands
// every property record to a builder, builds the design and keeps every
// message, tied to its line.
//
// Reading property files:
//   session.load(paths);             // or load(inputs) for texts in memory
//   session.build();
//
// A reader of another input format feeds the same records:
//   std::uint32_t file = session.addFile(std::move(input));
//   std::string_view text = session.store().fileText(file);
//   StoredProp record;               // kind, file, line, column and spans:
//   record.name = session.store().spanIn(file, nameInText);   // text as is
//   record.value = session.store().keep(madeValue);            // or a copy
//   record.inArena |= StoredProp::Value;
//   session.add(record);             // messages of the hand-over go to its line
//   ...
//   session.build();
// Records are handed to the builder in the order they are added.
#pragma once

#include "Diagnostics.h"
#include "Netlist.h"
#include "PropFile.h"

#include "tsd/Tsd.h"

#include <cstdint>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace tsd_cli {

class Session;

// A file that cannot be read (or written); the tool exits with 2.
class IoError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

// The reference record of the netlist element that a `ref` record names. It
// points back at its record instead of copying the element; when the library
// deletes it, the session forgets it.
class CliRef : public Tsd_Ref {
public:
    CliRef(const Session& session, std::size_t record);
    ~CliRef() override;
    CliRef(const CliRef&) = delete;
    CliRef& operator=(const CliRef&) = delete;
    // A design holds one per reference line and deletes them all at the
    // end: they come from a pool.
    static void* operator new(std::size_t size);
    static void operator delete(void* block, std::size_t size);

    bool isEqual(const Tsd_Ref* other) const override;
    void dump(DumpStream& stream, short indent) const override;
    std::string_view element() const;
    std::size_t record() const { return m_record; }

private:
    friend class Session;

    Session& session() const;

    // A design holds one of these per reference line: the session by its
    // number and the record by its index keep it as small as the library's
    // own part.
    std::uint32_t m_session;
    std::uint32_t m_record;
};

// A design that tells the session what trimming removes.
class CliDesign : public Tsd_Design {
public:
    std::function<void(Tsd_BaseObj*, TrimReason)> onTrashed;

protected:
    void reportObjTrashed(Tsd_BaseObj* obj, TrimReason reason) override;
};

// A builder that fills the session's design, so the design outlives a failed
// build, shows the context it processes a stored property under, and asks
// the session's stand-in for the netlist before its own lookups.
class CliBuilder : public Tsd_Builder {
public:
    CliBuilder(Tsd_Design* design, NetlistStandIn* standIn)
        : Tsd_Builder(false), m_standIn(standIn) {
        initBaseBuilder(design);
    }
    std::string context() const { return utf16ToUtf8(getContext()); }

protected:
    Tsd_TermGroup* getTermGroupForSpec(const char* name) override;
    Tsd_PredefGroup* getPredefGroupForGroup(const char* name) override;
    Tsd_ThruGroup* getThruGroupForSpec(const char* name) override;
    Tsd_ClkGroup* getClkGroupForSpec(const char* netName) override;
    Tsd_TermGroup* getTermGroupForNetOffset(const char* name) override;

private:
    NetlistStandIn* m_standIn;
};

// "-" names standard input.
struct InputFile {
    std::string path;
    std::string displayName;
    std::string text;
};

// Reads a file, or standard input for "-"; throws IoError.
InputFile readInput(const std::string& path);

class Session : public MessageSink {
public:
    Session();
    ~Session() override;
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;

    // Reads every file first (an IoError leaves nothing processed), then
    // hands their lines to the builder in order.
    void load(const std::vector<std::string>& paths);
    void load(std::vector<InputFile> inputs);
    // The same, with a reader of other formats: it is asked first for each
    // file (once every file is kept) and returns false to leave the file to
    // the property-file reader.
    using FileReader = std::function<bool(Session&, std::uint32_t file)>;
    void load(std::vector<InputFile> inputs, const FileReader& reader);

    // Keeps the text of a file read in another format; its index in the
    // store. Throws IoError when the files together pass PropStore::kMaxText.
    std::uint32_t addFile(InputFile input);
    // Stores a record and hands it to the builder.
    void add(const StoredProp& record);
    PropStore& store() { return m_store; }
    const PropStore& store() const { return m_store; }

    // A net that the input names as a net of the design (a NET statement):
    // an OFFSET or FEEDBACK that uses it as its clock gets its clock group
    // from the session, as a toolchain program gets it from its netlist.
    // Call before build().
    void addDesignNet(std::string_view net) { m_standIn.addDesignNet(net); }
    // Group names, clock nets and TSids that the input uses but never
    // defines are taken as defined by the netlist (a note each) instead of
    // being errors. Call before build().
    void setAssumeNetlist(bool assume) { m_standIn.setAssume(assume); }
    bool assumeNetlist() const { return m_standIn.assume(); }
    // How many names were taken as defined by the netlist.
    int assumedCount() const { return m_standIn.assumedCount(); }
    // `did you mean "NAME"?` for the group or clock net closest to `name`,
    // or empty.
    std::string groupHint(std::string_view name) {
        return m_standIn.hint({NameKind::Group, NameKind::ClockNet}, name);
    }

    // Builds the design; true when it was built and no error was reported.
    bool build();

    // The reference record that an object owns for record `index`, or null
    // (not a `ref` record, refused, or withdrawn).
    CliRef* refOf(std::size_t index) const { return m_refOf[index]; }
    // The records whose reference records `owner` holds, in input order.
    std::vector<std::size_t> recordsOwnedBy(Tsd_BaseObj* owner) const;

    const std::vector<Diagnostic>& diagnostics() const { return m_diags; }
    // For a reader that places messages more exactly than by their record.
    std::vector<Diagnostic>& diagnostics() { return m_diags; }
    int errorCount() const;
    int warningCount() const;
    int countOf(PropKind kind) const;
    // The one file read, or empty with several.
    const std::string& displayFile() const { return m_displayFile; }
    const std::vector<std::string>& fileNames() const { return m_fileNames; }

    CliDesign& design() { return *m_design; }
    CliBuilder& builder() { return *m_builder; }
    bool built() const { return m_built; }

    void addDiagnostic(Diagnostic diag) { m_diags.push_back(std::move(diag)); }

    // Withdraws every record of each element that an object still owns,
    // element by element, each in input order; the number withdrawn per
    // element (0 for an element named again).
    std::vector<int> withdraw(const std::vector<std::string>& elements);

    // Called when the library delivers a fatal message, after it has been
    // added to the diagnostics; the process ends with the message's code when
    // it returns. By default the diagnostics are printed to stderr.
    void setFatalHandler(std::function<void()> handler) { m_fatalHandler = std::move(handler); }

    void deliver(const MessageRecord& record) override;

private:
    friend class CliRef;
    friend class NetlistStandIn;

    // A note at `record`'s line, or, with -1 during the build, at the line
    // of the property the builder processes.
    void addNote(std::string text, std::ptrdiff_t record);

    void readPropFile(std::uint32_t file);
    void feed(std::size_t index);
    void lineError(const StoredProp& record, std::string text);
    void attributeBuildMessages();

    ScopedMessageSink m_sinkGuard{this};
    std::uint32_t m_number = 0; // among the live sessions
    PropStore m_store;
    // Parallel to the records; cleared by a CliRef that dies.
    std::vector<CliRef*> m_refOf;
    std::size_t m_textSize = 0;
    // Property files carry the netlist's reference records; files of other
    // forms may come without them.
    std::uint32_t m_propFilesRead = 0;
    std::vector<Diagnostic> m_diags;
    std::vector<RawMessage> m_buildMessages;
    std::string m_displayFile;
    std::vector<std::string> m_fileNames;
    // The record being handed over, or -1.
    std::ptrdiff_t m_currentRecord = -1;
    // Reused for the zero-terminated name and value of each hand-over.
    std::string m_name;
    std::string m_value;
    std::string m_lastRefProp; // the last name taken as a reference property
    NetlistStandIn m_standIn{*this};
    bool m_building = false;
    bool m_built = false;
    bool m_closing = false; // the design is being destroyed with the session
    std::function<void()> m_fatalHandler;
    // Declared in this order so that the design goes first: after a failed
    // build its user groups may still point at the builder's placeholders.
    // Both go before the records, which their reference records point into.
    std::unique_ptr<CliBuilder> m_builder;
    std::unique_ptr<CliDesign> m_design;
};

} // namespace tsd_cli
