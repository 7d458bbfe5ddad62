// oxahv-provider: reads the command line and calls the verb's action.

#include "Options.h"
#include "OxahvVersion.h"
#include "Verbs.h"
#include "show/Text.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <iostream>
#include <stdexcept>
#include <string>

namespace oxahv::runner {
namespace {

constexpr int usageFailed = 2;
constexpr const char* usage = "; oxahv-provider --help shows the usage";

constexpr const char* footer =
    R"(A PATH is Class.Key="text",Number=3; a namespace and a colon may stand before it, \" and \\ stand
for a quote and a backslash. VERB --help tells more of a verb. Exit status: 0; 1 when the provider
answered with an error, or check found something; 2 for wrong usage, and for files and libraries
that cannot be used.

  oxahv-provider --library ./libDemoPort.so --output json ei Demo_Port
  oxahv-provider --library ./libDemoPort.so --mof Demo.mof cm Demo_Port.Number=3 SetSpeed Speed=1000
  oxahv-provider --library ./libDemoPort.so --mof Demo.mof check)";

// The parser takes a verb that it does not know for one word too many.
std::string complaintOf(const CLI::App& app, const CLI::ParseError& error) {
    const std::vector<std::string> words = app.remaining();
    const auto word = std::find_if(words.begin(), words.end(),
                                   [](const std::string& candidate) { return candidate.rfind('-', 0) != 0; });
    return app.get_subcommands().empty() && word != words.end() ? "there is no verb " + *word : error.what();
}

bool hasLibrary(const Options& options) {
    return !options.libraries.empty() && !options.libraries.back().file.empty();
}

int perform(const Verb& verb, const Action& action, const Options& options) {
    if (verb.needsLibrary && !hasLibrary(options)) {
        throw std::runtime_error(std::string("--library is required") + usage);
    }
    return action(options);
}

int parseAndRun(int argc, char** argv) {
    CLI::App app("Loads a CMPI provider and sends it a request, as a CIM server would.", "oxahv-provider");
    Options options;
    OptionReader reader(app, options);
    std::vector<Action> actions;
    for (const Verb& verb : verbs()) {
        CLI::App* const command = app.add_subcommand(verb.name, verb.help);
        command->fallthrough();
        command->group("Verbs");
        actions.push_back(verb.declare(*command));
    }
    app.set_version_flag("--version", "oxahv-provider " OXAHV_VERSION_STRING);
    app.get_formatter()->label("SUBCOMMAND", "VERB");
    app.require_subcommand(1);
    app.footer(footer);
    try {
        app.parse(argc, argv);
    } catch (const CLI::Success& help) { // or the version
        return app.exit(help);
    } catch (const CLI::ParseError& error) {
        throw std::runtime_error(complaintOf(app, error) + usage);
    }
    reader.finish();
    for (std::size_t i = 0; i < actions.size(); ++i) {
        if (app.got_subcommand(verbs()[i].name)) {
            return perform(verbs()[i], actions[i], options);
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
