// One run of the tool over a set of property files: reads them, hands every
// property to a builder, builds the design and keeps every message, tied to
// its line.
#pragma once

#include "Diagnostics.h"
#include "PropFile.h"

#include "tsd/Tsd.h"

#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

namespace tsd_cli {

// A file that cannot be read (or written); the tool exits with 2.
class IoError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

// The reference record of one netlist element named on a `ref` line.
class CliRef : public Tsd_Ref {
public:
    explicit CliRef(std::string element) : m_element(std::move(element)) {}
    bool isEqual(const Tsd_Ref* other) const override;
    void dump(DumpStream& stream, short indent) const override;
    const std::string& element() const { return m_element; }

private:
    std::string m_element;
};

// A design that tells the session what trimming removes.
class CliDesign : public Tsd_Design {
public:
    std::function<void(Tsd_BaseObj*, TrimReason)> onTrashed;

protected:
    void reportObjTrashed(Tsd_BaseObj* obj, TrimReason reason) override;
};

// A builder that fills the session's design, so the design outlives a failed
// build, and shows the context it processes a stored property under.
class CliBuilder : public Tsd_Builder {
public:
    explicit CliBuilder(Tsd_Design* design) : Tsd_Builder(false) { initBaseBuilder(design); }
    std::string context() const { return utf16ToUtf8(getContext()); }
};

// The record of one `ref` line.
struct RefRecord {
    std::size_t prop = 0;  // index into Session::props()
    CliRef* ref = nullptr; // while an object owns it; the object deletes it
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
    // Builds the design; true when it was built and no error was reported.
    bool build();

    const std::vector<PropLine>& props() const { return m_props; }
    std::vector<RefRecord>& refs() { return m_refs; }
    const std::vector<Diagnostic>& diagnostics() const { return m_diags; }
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

    // Withdraws every record of `element` that an object still owns; the
    // number withdrawn.
    int withdraw(const std::string& element);

    // Called when the library delivers a fatal message, after it has been
    // added to the diagnostics; the process ends with the message's code when
    // it returns. By default the diagnostics are printed to stderr.
    void setFatalHandler(std::function<void()> handler) { m_fatalHandler = std::move(handler); }

    void deliver(const MessageRecord& record) override;

private:
    void feed(const PropLine& prop);
    void attributeBuildMessages();

    ScopedMessageSink m_sinkGuard{this};
    std::vector<PropLine> m_props;
    std::vector<RefRecord> m_refs;
    std::vector<Diagnostic> m_diags;
    std::vector<RawMessage> m_buildMessages;
    std::string m_displayFile;
    std::vector<std::string> m_fileNames;
    // The line whose property is being handed over, or -1.
    int m_currentProp = -1;
    bool m_building = false;
    bool m_built = false;
    std::function<void()> m_fatalHandler;
    // Declared in this order so that the design goes first: after a failed
    // build its user groups may still point at the builder's placeholders.
    std::unique_ptr<CliBuilder> m_builder;
    std::unique_ptr<CliDesign> m_design;
};

} // namespace tsd_cli
