// Hosts the provider of Port.cpp in the embedded broker and sends it requests.
#include <EmbeddedBroker.h>
#include <cmpimacs.h>

#include <iostream>

extern "C" CMPIInstanceMI* DemoPort_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

int main() {
    oxahv::EmbeddedBroker server;
    server.host("DemoPort", {DemoPort_Create_InstanceMI});
    oxahv::Request request(server);
    const oxahv::Reply reply =
        request.getInstance(request.objectPathFromText("OXATK_EthernetPort.DeviceID=\"eth0\"", "root/cimv2"));
    const oxahv::Reply missing =
        request.getInstance(request.objectPathFromText("OXATK_EthernetPort.DeviceID=\"eth1\"", "root/cimv2"));
    if (reply.instances.size() != 1 || missing.code != CMPI_RC_ERR_NOT_FOUND) {
        return 1;
    }
    std::cout << oxahv::pathText(CMGetObjectPath(reply.instances[0], nullptr))
              << " Speed=" << oxahv::valueText(CMGetProperty(reply.instances[0], "Speed", nullptr)) << '\n';
    return 0;
}
