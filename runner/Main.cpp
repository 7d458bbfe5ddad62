// oxahv-provider: the command line.

#include "OxahvVersion.h"
#include "Runner.h"
#include "check/Check.h"
#include "show/Text.h"

#include <CLI/CLI.hpp>

#include <iostream>
#include <map>
#include <sstream>
#include <stdexcept>
#include <string>

namespace oxahv::runner {
namespace {

constexpr int usageFailed = 2;

constexpr const char* footer =
    R"(A PATH is Class.Key="text",Number=3; a namespace and a colon may stand before it, \" and \\ stand
for a quote and a backslash. VERB --help tells more of a verb. Exit status: 0; 1 when the provider
answered with an error, or check found something; 2 for wrong usage, and for files and libraries
that cannot be used.

  oxahv-provider --library ./libDemoPort.so --output json ei Demo_Port
  oxahv-provider --library ./libDemoPort.so gi 'Demo_Port.Name="eth0"'
  oxahv-provider --library ./libDemoPort.so --mof Demo.mof cm Demo_Port.Number=3 SetSpeed Speed=1000
  oxahv-provider --library ./libDemoPort.so --fault CMPIObjectPathFT.addKey:2 ein Demo_Port
  oxahv-provider --library ./libDemoPort.so --mof Demo.mof check)";

constexpr const char* resultFooter =
    R"(Results go to the standard output, and only when the whole request succeeded. With --output json
they are an array of objects {"class", "namespace", "path", "properties"}.)";

constexpr const char* checkFooter =
    R"(Does with each class what clients do: names, instances, each by its name, one that does not exist,
property lists, associations from both ends with every filter, methods; and compares all with the
class's declaration. Then again as other servers do it (every mode of --keys, bare new instances,
changed paths), from several threads at once, and with the broker's calls failing in turn: of each
slot the first 100 of a request, and the last. In the end the library has to be unloaded. A method
that --method names is called many times so, and does its work each time: name none that must not
be repeated. The provider runs in child processes: a crash or a hang is a finding. JSON is an array
of one object {"library", "provider", "passes", "requests", "classes", "findings"}; a finding is
{"check", "severity", "class", "pass", "request", "text", "count"}. Exit status 1 when there are
findings.

  oxahv-provider --library ./libDemoPort.so --mof Demo.mof check --class Demo_Port
  oxahv-provider --library ./libDemoPort.so --mof Demo.mof check --method 'Demo_Port.Reset Mode=1')";

constexpr const char* methodFooter =
    R"(With --mof, the class's declaration tells which parameters there are and of what type. Of an
array, each name=value adds an element. Without declaration a value is a number, TRUE or FALSE where
it looks like one, and a text otherwise. A text may stand in double quotes, and has to where it
looks like a number. With --output json the result is an array of one object {"path", "method",
"returnValue", "parameters"}.)";

// The options that are words on the command line and something else behind it.
struct Words {
    std::string format = "mof";
    std::string keyMode = "exact";
    std::string newInstances = "full";
    std::vector<std::string> pathChanges;

    void putInto(Options& options) const {
        options.format = format == "json" ? Format::json : Format::mof;
        options.hasConduct = keyMode != "exact" || newInstances != "full" || !pathChanges.empty();
        Conduct& conduct = options.conduct;
        conduct.keyMode = keyModes.at(keyMode);
        conduct.newInstances = newInstances == "bare" ? NewInstances::bare : NewInstances::full;
        for (const std::string& change : pathChanges) {
            conduct.pathDelivery.reversesKeys = conduct.pathDelivery.reversesKeys || change == "reversed";
            conduct.pathDelivery.changesCase = conduct.pathDelivery.changesCase || change == "case";
            if (change == "host") {
                conduct.pathDelivery.hostName = "host.example.com";
            }
        }
    }

    static inline const std::map<std::string, KeyMode> keyModes = {
        {"exact", KeyMode::exact}, {"untyped", KeyMode::untyped}, {"signed", KeyMode::signedIntegers},
        {"chars", KeyMode::chars}, {"text", KeyMode::text},
    };
};

// Names with commas between them; none in an empty text.
std::vector<std::string> namesIn(const std::string& text) {
    std::vector<std::string> names;
    std::istringstream stream(text);
    for (std::string name; std::getline(stream, name, ',');) {
        names.push_back(name);
    }
    return names;
}

// Each --provider and --serves is of the --library before it, or of the first one where none is.
class LibraryOptions {
public:
    explicit LibraryOptions(std::vector<Library>& libraries) : libraries_(libraries) {}

    void addTo(CLI::App& app) {
        add(app, "--library", "a provider's library; repeatable", "FILE", [this](const std::string& file) {
            if (isAhead_) {
                libraries_.back().file = file;
                isAhead_ = false;
            } else {
                libraries_.push_back({file});
            }
        })->required();
        add(app, "--provider", "the MI name in it; else the file's stem without 'lib'", "NAME",
            [this](const std::string& name) { current().provider = name; });
        add(app, "--serves", "the classes that it serves; else all that it answers for", "CLASS,...",
            [this](const std::string& text) { current().classes = namesIn(text); });
    }

private:
    static CLI::Option* add(CLI::App& app, const char* name, const char* help, const char* type,
                            const std::function<void(const std::string&)>& take) {
        return app.add_option_function<std::string>(name, take, help)
            ->type_name(type)
            ->multi_option_policy(CLI::MultiOptionPolicy::TakeLast)
            ->trigger_on_parse();
    }
    Library& current() {
        if (libraries_.empty()) {
            libraries_.emplace_back();
            isAhead_ = true;
        }
        return libraries_.back();
    }

    std::vector<Library>& libraries_;
    bool isAhead_ = false; // the last one's file is still to come
};

void addOptions(CLI::App& app, Options& options, Words& words) {
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
    app.add_option("--keys", words.keyMode, "how keys reach it: exact, untyped, signed, chars or text")
        ->check(CLI::IsMember({"exact", "untyped", "signed", "chars", "text"}).description(""))
        ->type_name("MODE");
    app.add_option("--new-instance", words.newInstances,
                   "its path's keys are properties (full) or not (bare)")
        ->check(CLI::IsMember({"full", "bare"}).description(""))
        ->type_name("MODE");
    app.add_option("--path", words.pathChanges, "change paths: keys reversed, other case, a host; repeatable")
        ->check(CLI::IsMember({"reversed", "case", "host"}).description(""))
        ->type_name("CHANGE")
        ->allow_extra_args(false);
    app.add_option("--context", options.contextEntries, "an entry of the provider's context; repeatable")
        ->type_name("NAME=TEXT")
        ->allow_extra_args(false);
    app.add_option("--fault", options.faults,
                   "fail the N-th call of a slot, with ERR_FAILED or CODE; repeatable")
        ->type_name("SLOT:N[:CODE]")
        ->allow_extra_args(false);
}

void addFilters(CLI::App& command, Takes takes, AssociationFilter& filter) {
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

void addPropertyList(CLI::App& command, Operands& operands) {
    command
        .add_option_function<std::string>(
            "--properties", [&](const std::string& text) { operands.properties = namesIn(text); },
            "only these properties, beside the keys")
        ->type_name("NAME,...");
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
    if (verb.yields == Yields::instances || verb.yields == Yields::oneInstance) {
        addPropertyList(*command, operands);
    }
    if (verb.takes != Takes::method) {
        command->footer(resultFooter);
    }
    command->fallthrough();
    command->group("Verbs");
}

void addCheck(CLI::App& app, CheckOptions& options) {
    CLI::App* const command = app.add_subcommand("check", "find out what the provider does wrong");
    command
        ->add_option("--class", options.classes, "check this class; else all that --mof declares; repeatable")
        ->type_name("CLASS")
        ->allow_extra_args(false);
    command
        ->add_option("--method", options.methods,
                     "call CLASS.METHOD name=value ... of the first instance; repeatable")
        ->type_name("CALL")
        ->allow_extra_args(false);
    command->add_option("--threads", options.threads, "how many threads send requests at once")
        ->check(CLI::Range(1U, 256U).description(""))
        ->type_name("N")
        ->capture_default_str();
    command->add_option("--timeout", options.timeoutSeconds, "how long a request may take")
        ->check(CLI::Range(1U, 86400U).description(""))
        ->type_name("SECONDS")
        ->capture_default_str();
    command->footer(checkFooter);
    command->fallthrough();
    command->group("Verbs");
}

int parseAndRun(int argc, char** argv) {
    CLI::App app("Loads a CMPI provider and sends it a request, as a CIM server would.", "oxahv-provider");
    Options options;
    Words words;
    Operands operands;
    LibraryOptions libraries(options.libraries);
    libraries.addTo(app);
    addOptions(app, options, words);
    for (const Verb& verb : verbs()) {
        addVerb(app, verb, operands);
    }
    CheckOptions checkOptions;
    addCheck(app, checkOptions);
    app.set_version_flag("--version", "oxahv-provider " OXAHV_VERSION_STRING);
    app.get_formatter()->label("SUBCOMMAND", "VERB");
    app.require_subcommand(1);
    app.footer(footer);
    try {
        app.parse(argc, argv);
    } catch (const CLI::Success& help) { // or the version
        return app.exit(help);
    } catch (const CLI::ParseError& error) {
        throw std::runtime_error(std::string(error.what()) + "; oxahv-provider --help shows the usage");
    }
    words.putInto(options);
    if (app.got_subcommand("check")) {
        return runCheck(options, checkOptions);
    }
    for (const Verb& verb : verbs()) {
        if (app.got_subcommand(verb.name)) {
            return run(options, verb, operands);
        }
    }
    return usageFailed;
}

} // namespace
} // namespace oxahv::runner

int main(int argc, char** argv) {
    try {
        const int status = oxahv::runner::parseAndRun(argc, argv);
        if (!std::cout.flush()) {
            throw std::runtime_error("cannot write to the standard output");
        }
        return status;
    } catch (const std::exception& exception) {
        std::cerr << "oxahv-provider: " << oxahv::runner::printable(exception.what()) << '\n';
        return oxahv::runner::usageFailed;
    }
}
