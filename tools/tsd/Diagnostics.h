// What the tool tells about the input: the library's messages and its own,
// each tied to the property line it belongs to where that can be known.
#pragma once

#include "PropFile.h"

#include "tsd/host/Messages.h"

#include <iosfwd>
#include <string>
#include <vector>

namespace tsd_cli {

enum class Severity { Error, Warning, Note, Fatal, InternalError };

const char* severityName(Severity severity);
// Errors, fatal errors and internal errors make a command fail.
bool isFailure(Severity severity);

struct Diagnostic {
    std::string file; // empty: not tied to a file
    int line = 0;     // 0: not tied to a line
    Severity severity = Severity::Error;
    std::string text;                 // without the final end-of-line
    std::vector<std::string> details; // status lines that follow, each without end-of-line
    int column = 0;                   // 0: unknown (property files: always)
};

// A library message as the sink received it, with the builder's context at
// that moment (empty outside the processing of a stored property).
struct RawMessage {
    MessageSeverity severity = MessageSeverity::Error;
    std::string text;
    std::string context;
};

// Adds a library message to `diags`: a status line that begins with a blank
// is a detail line of the previous diagnostic; anything else starts a new one.
void addLibraryMessage(std::vector<Diagnostic>& diags, MessageSeverity severity,
                       const std::string& text, const std::string& file, int line, int column = 0);

// The context under which the builder processes a stored group or spec record.
std::string processingContext(const PropStore& store, const StoredProp& record);

// Ties the messages of a build to the records of `store` (in the order they
// were handed to the builder): messages issued while a stored property was
// processed go to the record with that context; the others go to the record
// that defines or names what they quote, when it can be found. A message
// that lists the specs using a missing clock net becomes one diagnostic per
// listed spec, at its record, with that spec's detail line. Messages tied
// to no record name `fallbackFile` (which may be empty). Costs nothing
// without messages; the indexes it needs are made on first need.
std::vector<Diagnostic> attributeBuildMessages(const PropStore& store,
                                               const std::vector<RawMessage>& messages,
                                               const std::string& fallbackFile);

// "FILE:LINE: error: text", continuation lines and detail lines indented.
void appendDiagnostic(std::string& out, const Diagnostic& diag);
void printDiagnostic(std::ostream& out, const Diagnostic& diag);

} // namespace tsd_cli
