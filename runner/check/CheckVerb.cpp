#include "check/Check.h"

#include <CLI/CLI.hpp>

#include <memory>

namespace oxahv::runner {

namespace {

constexpr const char* checkFooter =
    R"(Sends what clients send for each class, and compares the answers with each other and with the
class's declaration; then again as other servers do it, from several threads, and with each kind of
the broker's calls failing. Also finds what the provider leaves in its process. The page "What check
finds" explains each. A method that --method names is called often, also with wrong arguments: name
none that must not be repeated.
JSON is an array of one object {"library", "provider", "passes", "requests", "classes", "findings",
"untested"}, a finding {"check", "severity", "class", "pass", "request", "text", "count"}.
Exit status 1 when there are findings.

  oxahv-provider --library ./libDemoPort.so --mof Demo.mof check --method 'Demo_Port.Reset Mode=1')";

} // namespace

std::function<int(const Options&)> declareCheck(CLI::App& command) {
    const auto checkOptions = std::make_shared<CheckOptions>(); // lives as long as the action
    command
        .add_option("--class", checkOptions->classes,
                    "check this class; else all that --mof declares; repeatable")
        ->type_name("CLASS")
        ->allow_extra_args(false);
    command
        .add_option("--method", checkOptions->methods,
                    "call CLASS.METHOD name=value ... of the first instance; repeatable")
        ->type_name("CALL")
        ->allow_extra_args(false);
    command.add_option("--threads", checkOptions->threads, "how many threads send requests at once")
        ->check(CLI::Range(1U, 256U).description(""))
        ->type_name("N")
        ->capture_default_str();
    command.add_option("--timeout", checkOptions->timeoutSeconds, "how long a request may take")
        ->check(CLI::Range(1U, 86400U).description(""))
        ->type_name("SECONDS")
        ->capture_default_str();
    command.add_option("--repeat", checkOptions->repetitions, "how many times they do it")
        ->check(CLI::Range(1U, 1000000U).description(""))
        ->type_name("N")
        ->capture_default_str();
    command.add_flag("--writes", checkOptions->writes, "create, change and delete instances, and undo it");
    command.add_flag("--exhaustive", checkOptions->isExhaustive,
                     "ask for all instances by name, not a sample");
    command.add_flag("--strict", checkOptions->isStrict, "report what was not tested as findings");
    command.footer(checkFooter);
    return [checkOptions](const Options& options) { return runCheck(options, *checkOptions); };
}

} // namespace oxahv::runner
