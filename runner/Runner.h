// Performs one request on a provider.
#pragma once

#include "show/Output.h"

#include <EmbeddedBroker.h>

#include <optional>
#include <string>
#include <vector>

// One provider of a library.
struct Library {
    std::string file;
    std::string provider{};             // the MI name; empty: by the file's name
    std::vector<std::string> classes{}; // that it serves; empty: all that it answers for
};

// How the broker serves requests, where CIM servers differ.
struct Conduct {
    oxahv::KeyMode keyMode = oxahv::KeyMode::exact;
    oxahv::NewInstances newInstances = oxahv::NewInstances::full;
    oxahv::PathDelivery pathDelivery{};
};
void apply(oxahv::EmbeddedBroker& broker, const Conduct& conduct);

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
    oxahv::AssociationFilter filter;
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
    oxahv::Reply (*perform)(oxahv::EmbeddedBroker& broker, oxahv::Request& request,
                            const CMPIObjectPath* target, const Operands& operands);
};

// The verbs, in the order in which the help shows them.
const std::vector<Verb>& verbs();

// The path that the verb is about. Throws oxahv::BrokerError for a text that is none.
CMPIObjectPath* targetOf(oxahv::Request& request, const Options& options, const Verb& verb,
                         const Operands& operands);

// The MI name: the option, or what the library's file stands for.
std::string providerName(const Library& library);

// Gives the broker the classes and the context entries. Throws oxahv::BrokerError.
void prepare(oxahv::EmbeddedBroker& broker, const Options& options);

// Loads the providers. Throws oxahv::BrokerError.
void loadProviders(oxahv::EmbeddedBroker& broker, const Options& options);

// Loads the provider and performs the verb. Prints results on the standard output and errors on the standard
// error stream. Returns the exit status; throws oxahv::BrokerError for what keeps the request from being
// sent.
int run(const Options& options, const Verb& verb, const Operands& operands);
