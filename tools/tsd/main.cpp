// tsd: check, format, query, trim and draw timing-constraint property files.
#include "Commands.h"
#include "Session.h"

#include <CLI/CLI.hpp>

#include <exception>
#include <iostream>
#include <new>

#ifndef TSD_TOOL_VERSION
#define TSD_TOOL_VERSION "unknown"
#endif

namespace {

constexpr const char* kFileHelp = "property file (.props); - reads standard input";

} // namespace

int main(int argc, char** argv) {
    CLI::App app{"Checks, formats, queries, trims and draws timing-constraint property files.\n"
                 "Exit status: 0 without errors, 1 with errors, 2 for usage or I/O problems "
                 "and fatal errors.",
                 "tsd"};
    app.set_version_flag("--version", std::string("tsd ") + TSD_TOOL_VERSION);
    app.require_subcommand(1);
    app.fallthrough(false);

    tsd_cli::OutputOptions options;
    std::vector<std::string> files;
    std::string file;
    std::string group;
    std::vector<std::string> elements;

    CLI::App* check =
        app.add_subcommand("check", "Build a design from every file together and report every "
                                    "error at its line, then a summary");
    check->add_option("files", files, "property files; - reads standard input")->required();
    check->add_flag("--json", options.json, "write the diagnostics and summary as JSON");

    CLI::App* fmt = app.add_subcommand(
        "fmt", "Write the design back in canonical form: groups, then specs, then references");
    fmt->add_option("file", file, kFileHelp)->required();
    fmt->add_option("-o,--output", options.outFile, "write to this file instead of stdout");
    fmt->add_flag("--json", options.json, "write the properties as JSON");

    CLI::App* dump = app.add_subcommand("dump", "Print the builder's and the design's debug dump");
    dump->add_option("file", file, kFileHelp)->required();

    CLI::App* holders =
        app.add_subcommand("holders", "List the groups and specifications that use a group");
    holders->add_option("file", file, kFileHelp)->required();
    holders->add_option("group", group, "group name, clock net or TIG TSid")->required();
    holders->add_flag("--json", options.json, "write the holders as JSON");

    CLI::App* trim = app.add_subcommand(
        "trim", "Remove the references of netlist elements, trim the design and write what is "
                "left (trashed objects first, as comments)");
    trim->add_option("file", file, kFileHelp)->required();
    trim->add_option("--remove", elements, "elements whose reference records are withdrawn")
        ->required();
    trim->add_flag("--json", options.json, "write the result as JSON");

    CLI::App* graph =
        app.add_subcommand("graph", "Write the constraint structure as a Graphviz DOT graph");
    graph->add_option("file", file, kFileHelp)->required();
    graph->add_option("-o,--output", options.outFile, "write to this file instead of stdout");

    // A first word that is neither an option nor a command is a typo.
    if (argc > 1 && argv[1][0] != '-') {
        bool known = false;
        for (const CLI::App* sub : app.get_subcommands({}))
            known = known || sub->check_name(argv[1]);
        if (!known) {
            std::cerr << "tsd: error: unknown command \"" << argv[1] << "\"\n"
                      << "Run 'tsd --help' for usage.\n";
            return tsd_cli::kExitUsage;
        }
    }

    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError& e) {
        if (e.get_exit_code() == 0)
            return app.exit(e); // --help, --version
        std::cerr << "tsd: error: " << e.what() << "\n"
                  << "Run 'tsd --help' for usage.\n";
        return tsd_cli::kExitUsage;
    }

    try {
        if (check->parsed())
            return tsd_cli::runCheck(files, options);
        if (fmt->parsed())
            return tsd_cli::runFmt(file, options);
        if (dump->parsed())
            return tsd_cli::runDump(file);
        if (holders->parsed())
            return tsd_cli::runHolders(file, group, options);
        if (trim->parsed())
            return tsd_cli::runTrim(file, elements, options);
        if (graph->parsed())
            return tsd_cli::runGraph(file, options);
    } catch (const tsd_cli::IoError& e) {
        std::cerr << "tsd: error: " << e.what() << "\n";
        return tsd_cli::kExitUsage;
    } catch (const std::bad_alloc&) {
        std::cerr << "tsd: error: out of memory\n";
        return tsd_cli::kExitUsage;
    } catch (const std::exception& e) {
        // Input too large for the tool's records, say: a clear end, not an abort.
        std::cerr << "tsd: error: " << e.what() << "\n";
        return tsd_cli::kExitUsage;
    }
    return tsd_cli::kExitUsage;
}
