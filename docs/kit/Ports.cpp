// Provider "DemoPort": serves OXATK_EthernetPort, the ports of a system, and a method of
// theirs. [begin]
#include <ProviderKit.h>

#include <map>
#include <mutex>

using oxahv::Instances;
using oxahv::Operation;
using oxahv::Path;
// [begin]

// [class]
class Ports : public oxahv::InstanceProvider,
              public oxahv::AssociationProvider,
              public oxahv::MethodProvider {
public:
    Ports() {
        serve("OXATK_EthernetPort", &Ports::ports);
        serve("OXATK_SystemPort", &Ports::portsOfSystem);
        associate("OXATK_SystemPort", &Ports::portsOfSystem);
        method("OXATK_EthernetPort.SetSpeed", &Ports::setSpeed, {"Speed", "Earlier"});
    }
    // [class]

private:
    // [instances]
    void ports(const Operation& operation, Instances& reply) {
        const std::lock_guard<std::mutex> lock(mutex_);
        for (const auto& [name, speed] : speeds_) {
            auto port = operation.instance("OXATK_EthernetPort", {{"DeviceID", name}});
            reply.add(port.set("Speed", speed).set("PortNumbers", {1, 2}));
        }
    }
    // [instances]

    // [association]
    void portsOfSystem(const Operation& operation, Instances& reply) {
        const std::lock_guard<std::mutex> lock(mutex_);
        const Path system = operation.path("OXATK_ComputerSystem", {{"Name", "machine"}});
        for (const auto& [name, speed] : speeds_) {
            const Path port = operation.path("OXATK_EthernetPort", {{"DeviceID", name}});
            reply.add(operation.instance(
                "OXATK_SystemPort", {{"GroupComponent", system}, {"PartComponent", port}}));
        }
    }
    // [association]

    // [method]
    std::uint32_t setSpeed(const Operation& operation, std::uint64_t speed,
                           std::optional<std::uint64_t>& earlier) {
        const std::lock_guard<std::mutex> lock(mutex_);
        const auto port = speeds_.find(operation.key<std::string>("DeviceID"));
        if (port == speeds_.end()) {
            throw oxahv::Refusal(CMPI_RC_ERR_NOT_FOUND, "no such port");
        }
        earlier = port->second;
        port->second = speed;
        return 0;
    }
    // [method]

    std::mutex mutex_; // a CIM server calls from several threads
    std::map<std::string, std::uint64_t> speeds_ = {{"eth0", 1'000'000'000}};
};

// [entry]
OXAHV_PROVIDER(DemoPort, Ports);
// [entry]
