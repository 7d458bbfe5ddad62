// Performs one request on a provider.
#pragma once

#include "show/Output.h"

#include <EmbeddedBroker.h>

#include <optional>
#include <string>
#include <vector>

namespace oxahv::runner {

// One provider of a library.
struct Library {
    std::string file;
    std::string provider{};             // the MI name; empty: by the file's name
    std::vector<std::string> classes{}; // that it serves; empty: all that it answers for
};

// How the broker serves requests, where CIM servers differ.
struct Conduct {
    KeyMode keyMode = KeyMode::exact;
    NewInstances newInstances = NewInstances::full;
    PathDelivery pathDelivery{};
};
void apply(EmbeddedBroker& broker, const Conduct& conduct);

struct Options {
    std::vector<Library> libraries; // the first is the one that a check is about
    std::string nameSpace = "root/cimv2";
    Format format = Format::mof;
    bool showsTraces = false;
    Conduct conduct;
    bool hasConduct = false; // whether the user has asked for any
    std::vector<std::string> mofFiles;
    std::vector<std::string> contextEntries; // NAME=TEXT
    std::vector<std::string> faults;         // SLOT:N[:CODE]
};

// What stands behind the verb. A verb leaves what it does not take as it is.
struct Operands {
    std::string target; // a class or a path
    AssociationFilter filter;
    std::optional<std::vector<std::string>> properties; // the property list
    std::string method;
    std::vector<std::string> arguments; // name=value
};

// What a verb is about: a class's name or an object path.
enum class Target { ofClass, ofInstance };
// What it takes beside that.
enum class Takes { nothing, filter, referenceFilter, method };
enum class Yields { paths, instances, oneInstance, methodResult };

struct Verb {
    const char* name;
    Target target;
    Takes takes;
    Yields yields;
    const char* help;
    // Sends the request.
    Reply (*perform)(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* target,
                     const Operands& operands);
};

// The verbs, in the order in which the help shows them.
const std::vector<Verb>& verbs();

// The path that the verb is about. Throws BrokerError for a text that is none.
CMPIObjectPath* targetOf(Request& request, const Options& options, const Verb& verb,
                         const Operands& operands);

// The MI name: the option, or what the library's file stands for.
std::string providerName(const Library& library);

// Gives the broker the classes and the context entries. Throws BrokerError.
void prepare(EmbeddedBroker& broker, const Options& options);

// Loads the providers. Throws BrokerError.
void loadProviders(EmbeddedBroker& broker, const Options& options);

// Loads the provider and performs the verb. Prints results on the standard output and errors on the standard
// error stream. Returns the exit status; throws BrokerError for what keeps the request from being
// sent.
int run(const Options& options, const Verb& verb, const Operands& operands);

} // namespace oxahv::runner
