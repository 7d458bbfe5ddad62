// OXATK_RunningOS, the association between the operating system and the computer system that it runs on. Its
// keys are references, which a moniker cannot hold, so it stands apart from the other classes.
#pragma once

#include "Provider.h"

#include <vector>

// One of the two sides.
struct End {
    const char* role; // the reference's name
    const HostClass* hostClass;
    TK::Moniker keys; // of the instance on this side
};

constexpr const char* runningOs = "OXATK_RunningOS";

bool isRunningOs(const CMPIObjectPath* path);

// First the Antecedent, then the Dependent.
std::vector<End> runningOsEnds();

// The association's one instance, and its path.
CMPIObjectPath* runningOsPath(const std::string& nameSpace);
CMPIInstance* runningOsInstance(const std::string& nameSpace, const char** properties);

// Throws a Refusal when a path of the association names another instance.
void requireRunningOs(const CMPIObjectPath* path);
