// oxahv-provider: the command line.

#include "Runner.h"

#include <CLI/CLI.hpp>

#include <iostream>
#include <string>

namespace {

constexpr int usageFailed = 2;

constexpr const char* footer =
    R"(Results go to the standard output, and only when the whole request succeeded.

A PATH is Class.Key="text",Number=3; a namespace and a colon may stand before it. In the text of a key, \" and \\ stand
for a quote and a backslash.

Exit status: 0; 1 when the provider answered with an error, whose CMPI code is on the standard error stream; 2 for wrong
usage, and for files and libraries that cannot be used.

Examples:
  oxahv-provider --library ./libDemoPort.so ein Demo_Port
  oxahv-provider --library ./libDemoPort.so --output json ei Demo_Port
  oxahv-provider --library ./libDemoPort.so gi 'Demo_Port.Name="eth0"'
  oxahv-provider --library ./libDemoPort.so --fault CMPIObjectPathFT.addKey:2:ERR_FAILED ein Demo_Port)";

// The options that are words on the command line and something else behind it.
struct Words {
    std::string format = "mof";
    std::string keyMode = "exact";

    void putInto(Options& options) const {
        options.format = format == "json" ? Format::json : Format::mof;
        options.keyMode = keyMode == "untyped" ? oxahv::KeyMode::untyped
                          : keyMode == "chars" ? oxahv::KeyMode::chars
                                               : oxahv::KeyMode::exact;
    }
};

void addOptions(CLI::App& app, Options& options, Words& words) {
    app.add_option("--library", options.library, "the provider's library")->required()->type_name("FILE");
    app.add_option("--provider", options.provider, "the MI name; else the file's stem without 'lib'")
        ->type_name("NAME");
    app.add_option("--namespace", options.nameSpace, "the namespace of the request")
        ->type_name("NS")
        ->capture_default_str();
    app.add_option("--output", words.format, "how results are printed: mof or json")
        ->check(CLI::IsMember({"mof", "json"}).description(""))
        ->type_name("FORM");
    app.add_flag("--trace", options.showsTraces,
                 "show the traces of the provider on the standard error stream");
    app.add_option("--keys", words.keyMode,
                   "how keys reach the provider: exact, untyped (widest type) or chars")
        ->check(CLI::IsMember({"exact", "untyped", "chars"}).description(""))
        ->type_name("MODE");
    app.add_option(
           "--fault", options.faults,
           "make the N-th call of a broker's slot fail, by default with CMPI_RC_ERR_FAILED; repeatable")
        ->type_name("SLOT:N[:CODE]")
        ->allow_extra_args(false);
}

int parseAndRun(CLI::App& app, int argc, char** argv) {
    Options options;
    Words words;
    addOptions(app, options, words);
    std::string operand;
    for (const Verb& verb : verbs()) {
        CLI::App* const command = app.add_subcommand(verb.name, verb.help);
        command->add_option(verb.operand, operand)->required();
        command->fallthrough();
    }
    app.require_subcommand(1);
    app.footer(footer);
    app.parse(argc, argv);
    words.putInto(options);
    for (const Verb& verb : verbs()) {
        if (app.got_subcommand(verb.name)) {
            return run(options, verb, operand);
        }
    }
    return usageFailed;
}

} // namespace

int main(int argc, char** argv) {
    CLI::App app("Loads a CMPI provider and sends it a request, as a CIM server would.", "oxahv-provider");
    try {
        return parseAndRun(app, argc, argv);
    } catch (const CLI::CallForHelp& help) {
        return app.exit(help);
    } catch (const std::exception& exception) {
        std::cerr << "oxahv-provider: " << exception.what() << '\n';
        return usageFailed;
    }
}
