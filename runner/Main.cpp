// oxahv-provider: the command line.

#include "Runner.h"

#include <CLI/CLI.hpp>

#include <iostream>
#include <string>

namespace {

constexpr int usageFailed = 2;

constexpr const char* footer =
    R"(Results go to the standard output, and only when the whole request succeeded. A PATH is
Class.Key="text",Number=3; a namespace and a colon may stand before it; \" and \\ stand for a quote and a backslash.
JSON is an array of objects: {"class", "namespace", "path", "properties"}; of a method's call one of
{"path", "method", "returnValue", "parameters"}. Exit status: 0; 1 when the provider answered with an error, its
CMPI code on the standard error stream; 2 for wrong usage, and for files and libraries that cannot be used.
VERB --help tells more of a verb.

  oxahv-provider --library ./libDemoPort.so --output json ei Demo_Port
  oxahv-provider --library ./libDemoPort.so gi 'Demo_Port.Name="eth0"'
  oxahv-provider --library ./libDemoPort.so --mof Demo.mof cm 'Demo_Port.Name="eth0"' SetSpeed Speed=1000
  oxahv-provider --library ./libDemoPort.so --fault CMPIObjectPathFT.addKey:2:ERR_FAILED ein Demo_Port)";

constexpr const char* methodFooter =
    R"(With --mof, the class's declaration tells which parameters there are and of what type. Of an array, each
name=value adds an element. Without declaration a value is a number, TRUE or FALSE where it looks like one, and a text
otherwise. A text may stand in double quotes, and has to where it looks like a number.)";

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
    app.add_option("--mof", options.mofFiles, "declare the classes of a MOF file; repeatable")
        ->type_name("FILE")
        ->allow_extra_args(false);
    app.add_option("--namespace", options.nameSpace, "the namespace of the request")
        ->type_name("NS")
        ->capture_default_str();
    app.add_option("--output", words.format, "how results are printed: mof or json")
        ->check(CLI::IsMember({"mof", "json"}).description(""))
        ->type_name("FORM");
    app.add_flag("--trace", options.showsTraces, "show the provider's traces on the standard error stream");
    app.add_option("--keys", words.keyMode, "how keys reach it: exact, untyped (widest type) or chars")
        ->check(CLI::IsMember({"exact", "untyped", "chars"}).description(""))
        ->type_name("MODE");
    app.add_option("--context", options.contextEntries, "an entry of the provider's context; repeatable")
        ->type_name("NAME=TEXT")
        ->allow_extra_args(false);
    app.add_option("--fault", options.faults,
                   "fail the N-th call of a broker's slot, with ERR_FAILED or CODE; repeatable")
        ->type_name("SLOT:N[:CODE]")
        ->allow_extra_args(false);
}

void addFilters(CLI::App& command, Takes takes, oxahv::AssociationFilter& filter) {
    const bool isWhole = takes == Takes::filter;
    if (isWhole) {
        command.add_option("--assoc-class", filter.associationClass, "only by associations of this class")
            ->type_name("CLASS");
    }
    command
        .add_option("--result-class", filter.resultClass,
                    isWhole ? "only instances of this class" : "only associations of this class")
        ->type_name("CLASS");
    command.add_option("--role", filter.role, "only where PATH is the value of this reference")
        ->type_name("NAME");
    if (isWhole) {
        command.add_option("--result-role", filter.resultRole, "only what is the value of this reference")
            ->type_name("NAME");
    }
}

void addVerb(CLI::App& app, const Verb& verb, Operands& operands) {
    const bool isOfClass = verb.target == Target::ofClass;
    CLI::App* const command = app.add_subcommand(verb.name, verb.help);
    command
        ->add_option(isOfClass ? "CLASS" : "PATH", operands.target,
                     isOfClass ? "a class's name" : "an instance's path, such as Class.Key=\"text\",Number=3")
        ->required()
        ->type_name("");
    if (verb.takes == Takes::filter || verb.takes == Takes::referenceFilter) {
        addFilters(*command, verb.takes, operands.filter);
    } else if (verb.takes == Takes::method) {
        command->add_option("METHOD", operands.method, "the method's name")->required()->type_name("");
        command->add_option("name=value", operands.arguments, "an input argument")->type_name("");
        command->footer(methodFooter);
    }
    command->fallthrough();
    command->group("Verbs");
}

int parseAndRun(CLI::App& app, int argc, char** argv) {
    Options options;
    Words words;
    Operands operands;
    addOptions(app, options, words);
    for (const Verb& verb : verbs()) {
        addVerb(app, verb, operands);
    }
    app.get_formatter()->label("SUBCOMMAND", "VERB");
    app.require_subcommand(1);
    app.footer(footer);
    app.parse(argc, argv);
    words.putInto(options);
    for (const Verb& verb : verbs()) {
        if (app.got_subcommand(verb.name)) {
            return run(options, verb, operands);
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
