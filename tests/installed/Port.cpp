// README begins
#include <ProviderKit.h>

#include <map>

// Serves OXATK_EthernetPort.
class Ports : public oxahv::InstanceProvider {
    void enumerate(const oxahv::Operation& operation, oxahv::Instances& reply) override {
        for (const auto& [name, speed] : speeds_) {
            reply.add(operation.instance("OXATK_EthernetPort", {{"DeviceID", name}})
                          .set("Speed", speed)
                          .set("Capabilities", {2, 3})
                          .set("InstallDate", std::chrono::system_clock::now()));
        }
    }

    std::map<std::string, std::optional<std::uint64_t>> speeds_ = {{"eth0", 1'000'000'000}, {"eth2", {}}};
};

OXAHV_PROVIDER(DemoPort, Ports); // what a CIM server loads from libDemoPort.so
// README ends
