// Provider "OXAHostProvider": this machine as instances, an association and a method of OXAHost.mof, by the
// kit. What it knows of the machine comes from Host.h, what it stores from AssetTag.h.

#include "HostProvider.h"

#include "AssetTag.h"
#include "Host.h"
#include "HostTime.h"

#include <ProviderKit.h>
#include <Utility.h>

#include <ctime>
#include <system_error>

using oxahv::Instance;
using oxahv::Instances;
using oxahv::Operation;
using oxahv::Path;
using oxahv::Refusal;
using TK::ProviderUtilities;

namespace {

constexpr const char* computerSystem = "OXATK_ComputerSystem";
constexpr const char* operatingSystem = "OXATK_OperatingSystem";
constexpr const char* ethernetPort = "OXATK_EthernetPort";
constexpr const char* numericSensor = "OXATK_NumericSensor";
constexpr const char* assetIdDetails = "OXATK_AssetIDDetails";
constexpr const char* runningOs = "OXATK_RunningOS";

// The values that CIM gives numbers for.
enum class State : std::uint16_t { unknown = 0, enabled = 2, disabled = 3 };
enum class Status : std::uint16_t { unknown = 0, ok = 2, stopped = 10 };
enum class OSType : std::uint16_t { linuxSystem = 36 };
enum class LinkTechnology : std::uint16_t { ethernet = 2 };
enum class Capability : std::uint16_t { wakeOnLan = 3 };
enum class TagResult : std::uint32_t { completed = 0, invalidParameter = 5 };

std::string& hostRoot() {
    static std::string root;
    return root;
}

// What a person calls the instance, in the language of the server: its kind, and its own name.
std::string elementName(const wchar_t* kind, const std::string& name) {
    return std::string(ProviderUtilities::getNLSText(kind)) + ' ' + name;
}

// A text from outside may be no UTF-8, which CIM cannot hold; the property then stays NULL.
std::optional<std::wstring> wideText(const std::string& text) {
    std::wstring wide;
    return TK::CUtility::AStringToWString(text, wide) ? std::optional(wide) : std::nullopt;
}

// Writes the date with an offset of whole hours, as OXAHost.mof says.
void setDate(const Operation& operation, Instance& instance, const char* name, const TK::DateTime& date) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIDateTime* const value =
        CMNewDateTimeFromChars(operation.broker(), cimText(date).c_str(), &status);
    if (value == nullptr) {
        throw Refusal(CMPI_RC_ERR_FAILED, std::string("the broker made no date for ") + name);
    }
    instance.set(name, value);
}

void setStatus(Instance& instance, Status status, const std::string& words) {
    instance.set("OperationalStatus", {status}).set("StatusDescriptions", {words});
}

class HostProvider : public oxahv::InstanceProvider,
                     public oxahv::AssociationProvider,
                     public oxahv::MethodProvider {
public:
    static constexpr const char* traceCategory = "OXA.HostProvider";

    explicit HostProvider(const oxahv::Context& context)
        : host_(hostRoot()),
          assetTag_(
              context.get<std::optional<std::string>>("OXAHostStateFile").value_or(OXAHOST_STATE_FILE)) {
        serve(computerSystem, &HostProvider::computerSystems);
        serve(operatingSystem, &HostProvider::operatingSystems);
        serve(ethernetPort, &HostProvider::ethernetPorts);
        serve(numericSensor, &HostProvider::numericSensors);
        serve(assetIdDetails, &HostProvider::assetIdDetailsOfHost);
        serve(runningOs, &HostProvider::runningOsOfHost);
        associate(runningOs, &HostProvider::runningOsOfHost);
        method("OXATK_ComputerSystem.SetAssetTag", &HostProvider::setAssetTag, {"Tag"});
    }

private:
    Path systemPath(const Operation& operation) const {
        return operation.path(computerSystem,
                              {{"CreationClassName", computerSystem}, {"Name", host_.name()}});
    }

    Path osPath(const Operation& operation) const {
        return operation.path(operatingSystem, {{"CSCreationClassName", computerSystem},
                                                {"CSName", host_.name()},
                                                {"CreationClassName", operatingSystem},
                                                {"Name", host_.operatingSystemName()}});
    }

    void computerSystems(const Operation& operation, Instances& reply) {
        reply.add(operation.instance(systemPath(operation))
                      .set("ElementName", elementName(L"Computer system", host_.name()))
                      .set("NameFormat", "HostName")
                      .set("EnabledState", State::enabled));
    }

    void operatingSystems(const Operation& operation, Instances& reply) {
        Instance instance = operation.instance(osPath(operation));
        if (instance.isVisible()) {
            fill(operation, instance, host_.operatingSystem());
        }
        reply.add(instance);
    }

    void fill(const Operation& operation, Instance& instance, const OperatingSystem& system) const {
        const TK::DateTime now = localTime(std::time(nullptr));
        instance.set("ElementName", elementName(L"Operating system", host_.name()))
            .set("Caption", wideText(system.name))
            .set("OSType", OSType::linuxSystem)
            .set("Version", system.kernelVersion)
            .set("EnabledState", State::enabled)
            .set("CurrentTimeZone", now.getOffset())
            .set("Distributed", false)
            .set("NumberOfProcesses", system.processes)
            .set("TotalVisibleMemorySize", system.totalMemory)
            .set("FreePhysicalMemory", system.freeMemory)
            .set("TotalSwapSpaceSize", system.totalSwap);
        setStatus(instance, Status::ok, "running");
        if (system.bootTime) {
            setDate(operation, instance, "LastBootUpTime", localTime(*system.bootTime));
        }
        setDate(operation, instance, "LocalDateTime", now);
    }

    void ethernetPorts(const Operation& operation, Instances& reply) {
        const std::string system = host_.name();
        for (const std::string& name : host_.ethernetPortNames()) {
            Instance instance = operation.instance(ethernetPort, {{"SystemCreationClassName", computerSystem},
                                                                  {"SystemName", system},
                                                                  {"CreationClassName", ethernetPort},
                                                                  {"DeviceID", name}});
            if (instance.isVisible()) {
                fill(instance, host_.ethernetPort(name));
            }
            reply.add(instance);
        }
    }

    static void fill(Instance& instance, const EthernetPort& port) {
        const bool isUp = port.state == "up";
        // Some drivers tell no state, though the port may work.
        const bool isUnknown = port.state.empty() || port.state == "unknown";
        instance.set("Name", port.name)
            .set("ElementName", elementName(L"Ethernet port", port.name))
            .set("EnabledState", isUp        ? State::enabled
                                 : isUnknown ? State::unknown
                                             : State::disabled)
            .set("LinkTechnology", LinkTechnology::ethernet)
            .set("NetworkAddresses", {port.address})
            .set("Speed", port.speed)
            .set("FullDuplex", port.isFullDuplex)
            .set("ActiveMaximumTransmissionUnit", port.maximumTransmissionUnit);
        setStatus(instance,
                  isUp                   ? Status::ok
                  : port.state == "down" ? Status::stopped
                                         : Status::unknown,
                  port.state);
        if (port.canWakeSystem) {
            instance.set("Capabilities", {Capability::wakeOnLan});
        }
        if (port.isAddressPermanent) {
            instance.set("PermanentAddress", port.address);
        }
        if (const auto alias = wideText(port.alias); alias && !alias->empty()) {
            instance.set("OtherIdentifyingInfo", {*alias}).set("IdentifyingDescriptions", {"Alias"});
        }
    }

    // A load average each, numbered by the minutes that it is taken over.
    void numericSensors(const Operation& operation, Instances& reply) {
        const std::string system = host_.name();
        for (const LoadAverage& average : host_.loadAverages()) {
            reply.add(operation
                          .instance(numericSensor, {{"SystemCreationClassName", computerSystem},
                                                    {"SystemName", system},
                                                    {"CreationClassName", numericSensor},
                                                    {"SensorNumber", average.minutes}})
                          .set("ElementName", elementName(L"Numeric sensor", std::to_string(average.minutes)))
                          .set("Caption", "Processes that are ready to run")
                          .set("Reading", average.processes));
        }
    }

    void assetIdDetailsOfHost(const Operation& operation, Instances& reply) {
        const std::string system = host_.name();
        Instance instance =
            operation.instance(assetIdDetails, {{"InstanceID", "OXATK:AssetIDDetails:" + system}});
        if (instance.isVisible()) {
            const AssetTag tag = assetTag_.read();
            instance.set("ElementName", elementName(L"Asset identification", system))
                .set("AssetTagChanges", tag.changes);
            if (!tag.text.empty()) {
                instance.set("AssetTag", tag.text);
                setDate(operation, instance, "AssetTagDate", tag.changed);
            }
        }
        reply.add(instance);
    }

    void runningOsOfHost(const Operation& operation, Instances& reply) {
        const Path system = systemPath(operation);
        const Path os = osPath(operation);
        for (const Path& end : {system, os}) {
            if (operation.isFor(end.className())) {
                requireNamed(operation, end);
            }
        }
        reply.add(operation.instance(runningOs, {{"Antecedent", os}, {"Dependent", system}}));
    }

    // A tag that is refused changes nothing.
    TagResult setAssetTag(const Operation& operation, const std::optional<std::string>& tag) {
        requireNamed(operation, systemPath(operation));
        if (!tag) {
            throw Refusal(CMPI_RC_ERR_INVALID_PARAMETER,
                          ProviderUtilities::getNLSText(L"The asset tag is missing."));
        }
        if (!isAcceptableAssetTag(*tag)) {
            TK_TRACE_MESSAGE(
                operation.category(),
                ProviderUtilities::getNLSText(L"The asset tag holds characters that are not allowed."));
            return TagResult::invalidParameter;
        }
        try {
            assetTag_.write(*tag);
        } catch (const std::system_error& error) {
            throw Refusal(CMPI_RC_ERR_FAILED,
                          std::string(ProviderUtilities::getNLSText(L"The asset tag could not be saved.")) +
                              ' ' + error.what());
        }
        return TagResult::completed;
    }

    static void requireNamed(const Operation& operation, const Path& object) {
        if (!object.names(operation.path())) {
            throw Refusal(CMPI_RC_ERR_NOT_FOUND, "no instance of that name");
        }
    }

    const Host host_;
    const AssetTagFile assetTag_;
};

} // namespace

void setHostRoot(const std::string& root) {
    hostRoot() = root;
}

OXAHV_PROVIDER(OXAHostProvider, HostProvider);
