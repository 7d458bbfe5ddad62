// The CIM operations that the command can send, as one table that both its verbs and its check use.
#pragma once

#include <EmbeddedBroker.h>

#include <optional>
#include <string>
#include <vector>

namespace oxahv::runner {

// What follows an operation's name. An operation ignores what it does not take.
struct Operands {
    std::string target; // a class or a path
    AssociationFilter filter;
    std::optional<std::vector<std::string>> properties; // the property list
    std::string method;
    std::vector<std::string> values; // name=value: a method's arguments, an instance's properties
    std::string query;
    std::string language = "WQL"; // of the query
};

// What a verb is about: a class's name or an object path.
enum class Target { ofClass, ofInstance };
// What it takes beside that.
enum class Takes { nothing, filter, referenceFilter, method, values, query };
enum class Yields { nothing, paths, onePath, instances, oneInstance, methodResult };

struct Operation {
    const char* name;
    Target target;
    Takes takes;
    Yields yields;
    const char* help; // its operands and what it does
    // Sends the request.
    Reply (*perform)(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* target,
                     const Operands& operands);
};

// In the order in which the help shows them.
const std::vector<Operation>& operations();

} // namespace oxahv::runner
