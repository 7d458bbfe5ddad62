// How instances and object paths are printed.
#pragma once

#include <EmbeddedBroker.h>

#include <ostream>
#include <vector>

enum class Format { mof, json };

// As MOF-like text, or as one JSON array of objects.
void printInstances(std::ostream& out, Format format, const std::vector<CMPIInstance*>& instances);

// As one path a line, or as one JSON array of objects whose properties are the keys.
void printPaths(std::ostream& out, Format format, const std::vector<CMPIObjectPath*>& paths);
