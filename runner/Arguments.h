// A method's arguments and an instance's properties, from the words of a command line.
#pragma once

#include <EmbeddedBroker.h>

#include <string>
#include <vector>

namespace oxahv::runner {

// What texts of the form name=value mean: input arguments of the method. The declaration of the path's class,
// if there is one, gives their names and types; of an array, each name=value adds one element, and
// name={} alone makes an empty one. The word NULL is a NULL, a text only in quotes. Without declaration a
// value is what it looks like. Throws BrokerError, one line, for what does not fit.
CMPIArgs* argumentsFrom(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* path,
                        const std::string& method, const std::vector<std::string>& texts);

// The same as properties of an instance of the path. The path's keys are properties of it too, whatever new
// instances of the broker hold: a client sends them so.
CMPIInstance* instanceFrom(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* path,
                           const std::vector<std::string>& texts);

// The names alone, each once and in the order of the texts.
std::vector<std::string> namesOfValues(const std::vector<std::string>& texts);

} // namespace oxahv::runner
