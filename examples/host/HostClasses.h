// The CIM classes that the provider serves: for each, the keys of its instances and their properties.
#pragma once

#include "AssetTag.h"
#include "Host.h"

#include <Moniker.h>
#include <ProviderUtilities.h>

#include <vector>

// What instances are made from.
struct Machine {
    const CMPIBroker* broker;
    Host host;
    AssetTagFile assetTag;
};

struct HostClass {
    const char* name;
    // The keys of every instance.
    std::vector<TK::Moniker> (*names)(const Machine& machine);
    // Sets the properties of the instance with those keys; a property that the machine does not tell stays
    // NULL.
    void (*fill)(const Machine& machine, const TK::Moniker& keys, CMPIInstance* instance);
};

constexpr const char* computerSystem = "OXATK_ComputerSystem";
constexpr const char* operatingSystem = "OXATK_OperatingSystem";

// The class with a class id; null when the provider does not serve it. The association is not among them.
const HostClass* findHostClass(unsigned short classId);
