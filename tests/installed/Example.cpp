// Hosts the provider of Port.cpp in the embedded broker and sends it requests.
#include <EmbeddedBroker.h>
#include <cmpimacs.h>

#include <iostream>
#include <string>

extern "C" CMPIInstanceMI* DemoPort_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

int main() {
    oxahv::EmbeddedBroker server;
    server.host("DemoPort", {DemoPort_Create_InstanceMI});
    server.setNewInstances(oxahv::NewInstances::bare);
    server.setPathDelivery({true, true, "host.example"});
    std::string shown;
    for (const auto keys : {oxahv::KeyMode::exact, oxahv::KeyMode::chars}) {
        server.setKeyMode(keys);
        oxahv::Request request(server);
        const auto get = [&](const char* path) {
            return request.getInstance(request.objectPathFromText(path, "root/cimv2"));
        };
        const oxahv::Reply reply = get("OXATK_EthernetPort.DeviceID=\"eth0\"");
        if (reply.instances.size() != 1 ||
            get("OXATK_EthernetPort.DeviceID=\"eth1\"").code != CMPI_RC_ERR_NOT_FOUND ||
            get("OXATK_EthernetPort.DeviceID=1").code != CMPI_RC_ERR_INVALID_PARAMETER ||
            oxahv::valueText(CMGetProperty(reply.instances[0], "DeviceID", nullptr)) != "\"eth0\"") {
            return 1;
        }
        shown = oxahv::pathText(CMGetObjectPath(reply.instances[0], nullptr)) +
                " Speed=" + oxahv::valueText(CMGetProperty(reply.instances[0], "Speed", nullptr));
    }
    std::cout << shown << '\n';
    return 0;
}
