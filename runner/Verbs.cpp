#include "Verbs.h"

#include "Operations.h"
#include "Runner.h"
#include "check/Check.h"
#include "serve/Serve.h"
#include "show/Text.h"

#include <CLI/CLI.hpp>

#include <memory>

namespace oxahv::runner {

namespace {

constexpr const char* resultFooter =
    R"(Results go to the standard output, and only when the whole request succeeded. With --output json
they are an array of objects {"class", "namespace", "path", "properties"}.)";

constexpr const char* methodFooter =
    R"(With --mof, the class's declaration tells which parameters there are and of what type. Of an
array, each name=value adds an element. Without declaration a value is a number, TRUE or FALSE where
it looks like one, and a text otherwise. A text may stand in double quotes, and has to where it
looks like a number. With --output json the result is an array of one object {"path", "method",
"returnValue", "parameters"}.)";

constexpr const char* valuesFooter =
    R"(With --mof, the class's declaration tells the properties' types. Of an array, each name=value
adds an element. Without declaration a value is a number, TRUE or FALSE where it looks like one, and
a text otherwise. A text may stand in double quotes, and has to where it looks like a number.)";

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

// Filters, and the words that follow the target.
void addTaken(CLI::App& command, Takes takes, Operands& operands) {
    switch (takes) {
    case Takes::nothing:
        break;
    case Takes::filter:
    case Takes::referenceFilter:
        addFilters(command, takes, operands.filter);
        break;
    case Takes::method:
        command.add_option("METHOD", operands.method, "the method's name")->required()->type_name("");
        command
            .add_option("name=value", operands.values, "an input argument; NULL is a NULL, {} an empty array")
            ->type_name("");
        break;
    case Takes::values:
        command.add_option("name=value", operands.values, "a property")->type_name("");
        break;
    case Takes::query:
        command.add_option("QUERY", operands.query, "such as 'SELECT * FROM Class'")
            ->required()
            ->type_name("");
        command.add_option("--language", operands.language, "the query's language")
            ->type_name("NAME")
            ->capture_default_str();
        break;
    }
}

const char* footerOf(const Operation& operation) {
    return operation.takes == Takes::method      ? methodFooter
           : operation.takes == Takes::values    ? valuesFooter
           : operation.yields != Yields::nothing ? resultFooter
                                                 : "";
}

void addOperands(CLI::App& command, const Operation& operation, Operands& operands) {
    const bool isOfClass = operation.target == Target::ofClass;
    command
        .add_option(isOfClass ? "CLASS" : "PATH", operands.target,
                    isOfClass ? "a class's name" : "an instance's path, such as Class.Key=\"text\",Number=3")
        ->required()
        ->type_name("");
    addTaken(command, operation.takes, operands);
    const bool yieldsInstances =
        operation.yields == Yields::instances || operation.yields == Yields::oneInstance;
    if (yieldsInstances && operation.takes != Takes::query) { // a query names its properties itself
        addPropertyList(command, operands);
    }
    command.footer(footerOf(operation));
}

Verb verbOf(const Operation& operation) {
    return {operation.name, operation.help, true, [&operation](CLI::App& command) -> Action {
                const auto operands = std::make_shared<Operands>(); // lives as long as the action
                addOperands(command, operation, *operands);
                return [&operation, operands](const Options& options) {
                    return run(options, operation, *operands);
                };
            }};
}

} // namespace

const std::vector<Verb>& verbs() {
    static const std::vector<Verb> all = [] {
        std::vector<Verb> rows;
        for (const Operation& operation : operations()) {
            rows.push_back(verbOf(operation));
        }
        rows.push_back({"check", "find out what the provider does wrong", true, declareCheck});
#ifdef OXAHV_HAS_SERVE
        rows.push_back({"serve", "answer CIM clients over HTTP until Ctrl-C", true, declareServe});
#endif
        return rows;
    }();
    return all;
}

} // namespace oxahv::runner
