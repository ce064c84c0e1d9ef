// The commands of the tool. Each returns the process's exit status: 0
// without errors, 1 with errors. Unreadable or unwritable files throw IoError
// (status 2).
#pragma once

#include <string>
#include <vector>

namespace tsd_cli {

enum ExitStatus { kExitOk = 0, kExitErrors = 1, kExitUsage = 2 };

struct OutputOptions {
    bool json = false;
    std::string outFile;        // empty or "-": standard output
    bool assumeNetlist = false; // names used but never defined come from the netlist
    std::string format;         // "props", "statements", or empty: told by content
    std::string to;             // fmt: "props", "statements", or empty: as read
};

int runCheck(const std::vector<std::string>& files, const OutputOptions& options);
int runFmt(const std::string& file, const OutputOptions& options);
int runDump(const std::string& file, const OutputOptions& options);
int runHolders(const std::string& file, const std::string& group, const OutputOptions& options);
int runTrim(const std::string& file, const std::vector<std::string>& elements,
            const OutputOptions& options);
int runGraph(const std::string& file, const OutputOptions& options);

} // namespace tsd_cli
