#include "check/Check.h"

#include <CLI/CLI.hpp>

#include <memory>

namespace oxahv::runner {

namespace {

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
    command.footer(checkFooter);
    return [checkOptions](const Options& options) { return runCheck(options, *checkOptions); };
}

} // namespace oxahv::runner
