#include "HostClasses.h"

using TK::Moniker;
using TK::ProviderUtilities;

namespace {

constexpr unsigned short enabled = 2;
constexpr unsigned short disabled = 3;

template <class T>
void setIfKnown(CMPIInstance* instance, const char* name, const std::optional<T>& value) {
    if (value) {
        ProviderUtilities::setProperty(instance, name, *value);
    }
}

// OXATK_ComputerSystem

constexpr const char* computerSystem = "OXATK_ComputerSystem";

std::vector<Moniker> computerSystemNames(const Host& host) {
    Moniker keys;
    keys.addKey("CreationClassName", computerSystem);
    keys.addKey("Name", host.name());
    return {keys};
}

void fillComputerSystem(const Host& host, const Moniker& /*keys*/, CMPIInstance* instance) {
    std::string name = host.name();
    ProviderUtilities::setProperty(instance, "ElementName", name);
    ProviderUtilities::setProperty(instance, "NameFormat", "HostName");
    ProviderUtilities::setProperty(instance, "EnabledState", enabled);
}

// OXATK_OperatingSystem

constexpr const char* operatingSystem = "OXATK_OperatingSystem";

std::vector<Moniker> operatingSystemNames(const Host& host) {
    Moniker keys;
    keys.addKey("CSCreationClassName", computerSystem);
    keys.addKey("CSName", host.name());
    keys.addKey("CreationClassName", operatingSystem);
    keys.addKey("Name", host.operatingSystem().name);
    return {keys};
}

void fillOperatingSystem(const Host& host, const Moniker& /*keys*/, CMPIInstance* instance) {
    constexpr unsigned short linuxSystem = 36;
    OperatingSystem system = host.operatingSystem();
    ProviderUtilities::setProperty(instance, "ElementName", system.name);
    ProviderUtilities::setProperty(instance, "OSType", linuxSystem);
    ProviderUtilities::setProperty(instance, "Version", system.kernelVersion);
    ProviderUtilities::setProperty(instance, "EnabledState", enabled);
    ProviderUtilities::setProperty(instance, "Distributed", false);
    setIfKnown(instance, "NumberOfProcesses", system.processes);
    setIfKnown(instance, "TotalVisibleMemorySize", system.totalMemory);
    setIfKnown(instance, "FreePhysicalMemory", system.freeMemory);
    setIfKnown(instance, "TotalSwapSpaceSize", system.totalSwap);
}

// OXATK_EthernetPort

constexpr const char* ethernetPort = "OXATK_EthernetPort";

std::vector<Moniker> ethernetPortNames(const Host& host) {
    const std::string system = host.name();
    std::vector<Moniker> names;
    for (const EthernetPort& port : host.ethernetPorts()) {
        Moniker keys;
        keys.addKey("SystemCreationClassName", computerSystem);
        keys.addKey("SystemName", system);
        keys.addKey("CreationClassName", ethernetPort);
        keys.addKey("DeviceID", port.name);
        names.push_back(keys);
    }
    return names;
}

void fillEthernetPort(const Host& host, const Moniker& keys, CMPIInstance* instance) {
    constexpr unsigned short ethernet = 2;
    const std::string name = keyText(keys, "DeviceID");
    for (EthernetPort& port : host.ethernetPorts()) {
        if (port.name == name) {
            ProviderUtilities::setProperty(instance, "Name", port.name);
            ProviderUtilities::setProperty(instance, "ElementName", port.name);
            ProviderUtilities::setProperty(instance, "EnabledState", port.isUp ? enabled : disabled);
            ProviderUtilities::setProperty(instance, "LinkTechnology", ethernet);
            ProviderUtilities::setProperty(instance, "PermanentAddress", port.address);
            setIfKnown(instance, "Speed", port.speed);
            setIfKnown(instance, "FullDuplex", port.isFullDuplex);
            setIfKnown(instance, "ActiveMaximumTransmissionUnit", port.maximumTransmissionUnit);
        }
    }
}

const HostClass hostClasses[] = {
    {computerSystem, computerSystemNames, fillComputerSystem},
    {operatingSystem, operatingSystemNames, fillOperatingSystem},
    {ethernetPort, ethernetPortNames, fillEthernetPort},
};

} // namespace

const HostClass* findHostClass(unsigned short classId) {
    for (const HostClass& hostClass : hostClasses) {
        if (ProviderUtilities::getClassId(hostClass.name) == classId) {
            return &hostClass;
        }
    }
    return nullptr;
}

std::string keyText(Moniker keys, const char* name) {
    std::string value;
    for (unsigned int i = 0; keys.selectKey(i); ++i) {
        std::string keyName;
        unsigned short type = 0;
        keys.getName(keyName);
        keys.getType(type);
        if (type == Moniker::COMPONENT_STRING && ProviderUtilities::textEqual(keyName.c_str(), name)) {
            keys.getValue(value);
        }
    }
    return value;
}
