// Performs one request on a provider.
#pragma once

#include "Output.h"

#include <EmbeddedBroker.h>

#include <string>
#include <vector>

struct Options {
    std::string library;
    std::string provider; // empty: by the library's name
    std::string nameSpace = "root/cimv2";
    Format format = Format::mof;
    bool showsTraces = false;
    oxahv::KeyMode keyMode = oxahv::KeyMode::exact;
    std::vector<std::string> faults; // SLOT:N[:CODE]
};

struct Verb {
    const char* name;
    const char* operand;
    const char* help;
    // Sends the request and prints what it yields.
    oxahv::Reply (*perform)(oxahv::Request& request, const Options& options, const std::string& operand);
};

// The verbs, in the order in which the help shows them.
const std::vector<Verb>& verbs();

// Loads the provider and performs the verb. Prints results on the standard output and errors on the standard
// error stream. Returns the exit status; throws oxahv::BrokerError for what keeps the request from being
// sent.
int run(const Options& options, const Verb& verb, const std::string& operand);
