// Performs one request on a provider.
#pragma once

#include "show/Output.h"

#include <EmbeddedBroker.h>

#include <optional>
#include <string>
#include <vector>

struct Options {
    std::string library;
    std::string provider; // empty: by the library's name
    std::string nameSpace = "root/cimv2";
    Format format = Format::mof;
    bool showsTraces = false;
    oxahv::KeyMode keyMode = oxahv::KeyMode::exact;
    oxahv::NewInstances newInstances = oxahv::NewInstances::full;
    oxahv::PathDelivery pathDelivery;
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
std::string providerName(const Options& options);

// Gives the broker the classes and the context entries. Throws oxahv::BrokerError.
void prepare(oxahv::EmbeddedBroker& broker, const Options& options);

// Loads the provider. Throws oxahv::BrokerError.
void loadProvider(oxahv::EmbeddedBroker& broker, const Options& options);

// Loads the provider and performs the verb. Prints results on the standard output and errors on the standard
// error stream. Returns the exit status; throws oxahv::BrokerError for what keeps the request from being
// sent.
int run(const Options& options, const Verb& verb, const Operands& operands);
