// The CIM classes that the provider serves: for each, the keys of its instances and their properties.
#pragma once

#include "Host.h"

#include <Moniker.h>
#include <ProviderUtilities.h>

#include <vector>

struct HostClass {
    const char* name;
    // The keys of every instance.
    std::vector<TK::Moniker> (*names)(const Host& host);
    // Sets the properties of the instance with those keys; a property that the machine does not tell stays
    // NULL.
    void (*fill)(const Host& host, const TK::Moniker& keys, CMPIInstance* instance);
};

// The class with a class id; null when the provider does not serve it.
const HostClass* findHostClass(unsigned short classId);

// The text of a key of that name, empty when there is none.
std::string keyText(TK::Moniker keys, const char* name);
