// How instances, object paths and methods' results are printed.
#pragma once

#include <EmbeddedBroker.h>

#include <ostream>
#include <string>
#include <vector>

namespace oxahv::runner {

enum class Format { mof, json, junit }; // junit of a check alone

// As MOF-like text, or as one JSON array of objects.
void printInstances(std::ostream& out, Format format, const std::vector<CMPIInstance*>& instances);

// As one path a line, or as one JSON array of objects whose properties are the keys.
void printPaths(std::ostream& out, Format format, const std::vector<CMPIObjectPath*>& paths);

// As MOF-like lines, the return value first, or as a JSON array of one object.
void printMethodResult(std::ostream& out, Format format, const CMPIObjectPath* path,
                       const std::string& method, const Reply& reply);

} // namespace oxahv::runner
