// Fuzz target of the tool's commands on statement files: an arbitrary file
// goes through check, fmt, dump, graph and trim, as the tool runs them.
// Nothing may crash, leak, hang or end in a fatal message; what fmt and trim
// write checks cleanly and is a fixpoint of fmt, byte for byte.
#include "Commands.h"
#include "Session.h"
#include "Statements.h"

#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <sstream>
#include <string>
#include <vector>

using namespace tsd_cli;

namespace {

void require(bool condition) {
    if (!condition)
        std::abort();
}

// The commands print their diagnostics; the fuzzer has no use for them.
class Quiet {
public:
    Quiet() : m_out(std::cout.rdbuf(&m_sink)), m_err(std::cerr.rdbuf(&m_sink)) {}
    ~Quiet() {
        std::cout.rdbuf(m_out);
        std::cerr.rdbuf(m_err);
        std::cout.clear();
        std::cerr.clear();
    }
    Quiet(const Quiet&) = delete;
    Quiet& operator=(const Quiet&) = delete;

private:
    std::stringbuf m_sink;
    std::streambuf* m_out;
    std::streambuf* m_err;
};

const std::string& workDir() {
    static const std::string dir = [] {
        std::string path = "/tmp/tsd_fuzz_tool_" + std::to_string(::getpid());
        std::string command = "mkdir -p " + path;
        require(std::system(command.c_str()) == 0);
        return path;
    }();
    return dir;
}

void writeFile(const std::string& path, const std::string& text) {
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    out << text;
    require(static_cast<bool>(out));
}

std::string readFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

OutputOptions statementOptions(bool assumeNetlist, const std::string& outFile) {
    OutputOptions options;
    options.format = "statements";
    options.assumeNetlist = assumeNetlist;
    options.outFile = outFile;
    return options;
}

// What a command wrote as a statement file checks cleanly and is written
// back by fmt as it stands.
void requireFixpoint(const std::string& written, bool assumeNetlist) {
    const std::string path = workDir() + "/written.stmts";
    const std::string again = workDir() + "/again.stmts";
    writeFile(path, written);
    require(runCheck({path}, statementOptions(assumeNetlist, "/dev/null")) == kExitOk);
    require(runFmt(path, statementOptions(assumeNetlist, again)) == kExitOk);
    require(readFile(again) == written);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string text(reinterpret_cast<const char*>(data), size);
    bool assumeNetlist = size > 0 && (data[0] & 1) != 0;
    const std::string input = workDir() + "/input.stmts";
    const std::string output = workDir() + "/output.stmts";
    writeFile(input, text);
    Quiet quiet;

    int status = runCheck({input}, statementOptions(assumeNetlist, "/dev/null"));
    require(status == kExitOk || status == kExitErrors);
    runDump(input, statementOptions(assumeNetlist, ""));
    runGraph(input, statementOptions(assumeNetlist, "/dev/null"));

    std::remove(output.c_str());
    if (runFmt(input, statementOptions(assumeNetlist, output)) == kExitOk)
        requireFixpoint(readFile(output), assumeNetlist);
    else
        require(status == kExitErrors);

    // Trim the first elements the file names.
    std::vector<std::string> elements;
    for (const StatementRecord& record : readStatements(text).records)
        if (record.prop.kind == PropKind::Ref && elements.size() < 2)
            elements.push_back(record.prop.element);
    if (elements.empty())
        elements.push_back("none");
    std::remove(output.c_str());
    if (runTrim(input, elements, statementOptions(assumeNetlist, output)) == kExitOk)
        requireFixpoint(readFile(output), assumeNetlist);
    return 0;
}
