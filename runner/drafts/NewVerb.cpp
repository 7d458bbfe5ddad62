#include "drafts/Draft.h"

#include <CLI/CLI.hpp>

#include <memory>

namespace oxahv::runner {

namespace {

constexpr const char* newFooter =
    R"(Writes a project into the folder DIR and prints the names of its files: a provider of the classes,
written with the kit, that serves an example of each; structs for the classes, with their keys and
properties; a function for each method, which answers CMPI_RC_ERR_NOT_SUPPORTED; the MOF files, as
copies or, where they include others, by including them; a registration in both forms; tests in the
embedded broker, and one that runs check. What has to be written is marked TODO. A file that exists
is never overwritten: then, and where there can be no provider of a class, nothing is written. The
library is libNAME.so, the registration is for --namespace.

  oxahv-provider new --mof Demo.mof --class Demo_Port --class Demo_SystemPort ports
  cmake -S ports -B ports/build && cmake --build ports/build && ctest --test-dir ports/build)";

} // namespace

std::function<int(const Options&)> declareNew(CLI::App& command) {
    const auto draftOptions = std::make_shared<DraftOptions>(); // lives as long as the action
    command.add_option("--class", draftOptions->classes, "draft a provider of this class; repeatable")
        ->required()
        ->type_name("CLASS")
        ->allow_extra_args(false);
    command
        .add_option("--name", draftOptions->provider,
                    "the MI name; else the first class's name, such as DemoPort")
        ->type_name("NAME");
    command.add_option("DIR", draftOptions->folder, "the project's folder")->required()->type_name("");
    command.footer(newFooter);
    return [draftOptions](const Options& options) { return runNew(options, *draftOptions); };
}

} // namespace oxahv::runner
