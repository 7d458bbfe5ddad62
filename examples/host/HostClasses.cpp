#include "HostClasses.h"

#include "HostTime.h"
#include "Keys.h"

#include <Utility.h>

#include <ctime>

using TK::Moniker;
using TK::ProviderUtilities;

namespace {

// Values of EnabledState and OperationalStatus.
constexpr unsigned short unknownState = 0;
constexpr unsigned short enabled = 2;
constexpr unsigned short disabled = 3;
constexpr unsigned short statusUnknown = 0;
constexpr unsigned short statusOk = 2;
constexpr unsigned short statusStopped = 10;

template <class T>
void setIfKnown(CMPIInstance* instance, const char* name, const std::optional<T>& value) {
    if (value) {
        ProviderUtilities::setProperty(instance, name, *value);
    }
}

void setDate(const Machine& machine, CMPIInstance* instance, const char* name, const TK::DateTime& date) {
    std::string text = cimText(date);
    ProviderUtilities::setProperty(machine.broker, instance, name, text, true);
}

// What a person calls the instance, in the language of the server: its kind, and its own name.
void setElementName(CMPIInstance* instance, const wchar_t* kind, const std::string& name) {
    std::string text = std::string(ProviderUtilities::getNLSText(kind)) + ' ' + name;
    ProviderUtilities::setProperty(instance, "ElementName", text);
}

void setStatus(const Machine& machine, CMPIInstance* instance, unsigned short status,
               const std::string& words) {
    std::vector<unsigned short> codes = {status};
    std::vector<std::string> descriptions = {words};
    ProviderUtilities::setProperty(machine.broker, instance, "OperationalStatus", codes);
    ProviderUtilities::setProperty(machine.broker, instance, "StatusDescriptions", descriptions);
}

// OXATK_ComputerSystem

std::vector<Moniker> computerSystemNames(const Machine& machine) {
    Moniker keys;
    keys.addKey("CreationClassName", computerSystem);
    keys.addKey("Name", machine.host.name());
    return {keys};
}

void fillComputerSystem(const Machine& machine, const Moniker& /*keys*/, CMPIInstance* instance) {
    setElementName(instance, L"Computer system", machine.host.name());
    ProviderUtilities::setProperty(instance, "NameFormat", "HostName");
    ProviderUtilities::setProperty(instance, "EnabledState", enabled);
}

// OXATK_OperatingSystem

std::vector<Moniker> operatingSystemNames(const Machine& machine) {
    Moniker keys;
    keys.addKey("CSCreationClassName", computerSystem);
    keys.addKey("CSName", machine.host.name());
    keys.addKey("CreationClassName", operatingSystem);
    keys.addKey("Name", machine.host.operatingSystemName());
    return {keys};
}

void fillOperatingSystem(const Machine& machine, const Moniker& /*keys*/, CMPIInstance* instance) {
    constexpr unsigned short linuxSystem = 36;
    const OperatingSystem system = machine.host.operatingSystem();
    const TK::DateTime now = localTime(std::time(nullptr));
    setElementName(instance, L"Operating system", machine.host.name());
    std::wstring caption;
    if (ProviderUtilities::ConvertMultiByteToWideChar(system.name, caption)) {
        ProviderUtilities::setProperty(instance, "Caption", caption);
    }
    ProviderUtilities::setProperty(instance, "OSType", linuxSystem);
    ProviderUtilities::setProperty(instance, "Version", system.kernelVersion.c_str());
    ProviderUtilities::setProperty(instance, "EnabledState", enabled);
    setStatus(machine, instance, statusOk, "running");
    if (system.bootTime) {
        setDate(machine, instance, "LastBootUpTime", localTime(*system.bootTime));
    }
    setDate(machine, instance, "LocalDateTime", now);
    ProviderUtilities::setProperty(instance, "CurrentTimeZone", now.getOffset());
    ProviderUtilities::setProperty(instance, "Distributed", false);
    setIfKnown(instance, "NumberOfProcesses", system.processes);
    setIfKnown(instance, "TotalVisibleMemorySize", system.totalMemory);
    setIfKnown(instance, "FreePhysicalMemory", system.freeMemory);
    setIfKnown(instance, "TotalSwapSpaceSize", system.totalSwap);
}

// OXATK_EthernetPort

constexpr const char* ethernetPort = "OXATK_EthernetPort";

std::vector<Moniker> ethernetPortNames(const Machine& machine) {
    const std::string system = machine.host.name();
    std::vector<Moniker> names;
    for (const std::string& port : machine.host.ethernetPortNames()) {
        Moniker keys;
        keys.addKey("SystemCreationClassName", computerSystem);
        keys.addKey("SystemName", system);
        keys.addKey("CreationClassName", ethernetPort);
        keys.addKey("DeviceID", port);
        names.push_back(keys);
    }
    return names;
}

// The administrator's name for the port may hold any character, so it goes the way of wide texts.
void setAlias(const Machine& machine, const std::string& alias, CMPIInstance* instance) {
    std::vector<std::wstring> texts;
    if (!alias.empty() && TK::CUtility::AStringArrToWStringArr({alias}, texts)) {
        std::vector<std::string> kinds = {"Alias"};
        ProviderUtilities::setProperty(machine.broker, instance, "OtherIdentifyingInfo", texts);
        ProviderUtilities::setProperty(machine.broker, instance, "IdentifyingDescriptions", kinds);
    }
}

void fillEthernetPort(const Machine& machine, const Moniker& keys, CMPIInstance* instance) {
    constexpr unsigned short ethernet = 2;
    constexpr unsigned short wakeOnLan = 3;
    EthernetPort port = machine.host.ethernetPort(ownKey<std::string>(keys, "DeviceID"));
    const bool isUp = port.state == "up";
    // Some drivers tell no state, though the port may work.
    const bool isUnknown = port.state.empty() || port.state == "unknown";
    std::vector<std::string> addresses = {port.address};
    std::vector<unsigned short> capabilities;
    if (port.canWakeSystem) {
        capabilities.push_back(wakeOnLan);
    }
    ProviderUtilities::setProperty(instance, "Name", port.name);
    setElementName(instance, L"Ethernet port", port.name);
    ProviderUtilities::setProperty(instance, "EnabledState",
                                   isUp        ? enabled
                                   : isUnknown ? unknownState
                                               : disabled);
    setStatus(machine, instance,
              isUp                   ? statusOk
              : port.state == "down" ? statusStopped
                                     : statusUnknown,
              port.state);
    ProviderUtilities::setProperty(instance, "LinkTechnology", ethernet);
    ProviderUtilities::setProperty(machine.broker, instance, "NetworkAddresses", addresses);
    if (port.isAddressPermanent) {
        ProviderUtilities::setProperty(instance, "PermanentAddress", port.address);
    }
    ProviderUtilities::setProperty(machine.broker, instance, "Capabilities", capabilities);
    setAlias(machine, port.alias, instance);
    setIfKnown(instance, "Speed", port.speed);
    setIfKnown(instance, "FullDuplex", port.isFullDuplex);
    setIfKnown(instance, "ActiveMaximumTransmissionUnit", port.maximumTransmissionUnit);
}

// OXATK_NumericSensor: a load average each, numbered by the minutes that it is taken over.

constexpr const char* numericSensor = "OXATK_NumericSensor";
constexpr const char* sensorNumber = "SensorNumber";

std::vector<Moniker> numericSensorNames(const Machine& machine) {
    const std::string system = machine.host.name();
    std::vector<Moniker> names;
    for (const LoadAverage& average : machine.host.loadAverages()) {
        Moniker keys;
        keys.addKey("SystemCreationClassName", computerSystem);
        keys.addKey("SystemName", system);
        keys.addKey("CreationClassName", numericSensor);
        keys.addKey(sensorNumber, average.minutes);
        names.push_back(keys);
    }
    return names;
}

void fillNumericSensor(const Machine& machine, const Moniker& keys, CMPIInstance* instance) {
    const auto number = ownKey<unsigned short>(keys, sensorNumber);
    for (const LoadAverage& average : machine.host.loadAverages()) {
        if (average.minutes == number) {
            setElementName(instance, L"Numeric sensor", std::to_string(average.minutes));
            ProviderUtilities::setProperty(instance, "Caption", "Processes that are ready to run");
            ProviderUtilities::setProperty(instance, "Reading", average.processes);
        }
    }
}

// OXATK_AssetIDDetails

constexpr const char* assetIdDetails = "OXATK_AssetIDDetails";

std::vector<Moniker> assetIdDetailsNames(const Machine& machine) {
    Moniker keys;
    keys.addKey("InstanceID", "OXATK:AssetIDDetails:" + machine.host.name());
    return {keys};
}

void fillAssetIdDetails(const Machine& machine, const Moniker& /*keys*/, CMPIInstance* instance) {
    AssetTag tag = machine.assetTag.read();
    setElementName(instance, L"Asset identification", machine.host.name());
    ProviderUtilities::setProperty(instance, "AssetTagChanges", tag.changes);
    if (!tag.text.empty()) {
        ProviderUtilities::setProperty(instance, "AssetTag", tag.text);
        setDate(machine, instance, "AssetTagDate", tag.changed);
    }
}

constexpr HostClass hostClasses[] = {
    {computerSystem, computerSystemNames, fillComputerSystem},
    {operatingSystem, operatingSystemNames, fillOperatingSystem},
    {ethernetPort, ethernetPortNames, fillEthernetPort},
    {numericSensor, numericSensorNames, fillNumericSensor},
    {assetIdDetails, assetIdDetailsNames, fillAssetIdDetails},
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
