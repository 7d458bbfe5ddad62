// A small provider, with the function that the README shows.
#include <ProviderUtilities.h>
#include <Trace.h>
#include <cmpimacs.h>

#include <string>

static const CMPIBroker* broker;
static const std::string category("Demo.Port");

// README begins
CMPIStatus PortGetInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                           const CMPIObjectPath* path, const char**) try {
    using PU = TK::ProviderUtilities;
    TK_TRACE_ENTERING_PARAMETERS(category, " path=" << path);
    const CMPIData key = CMGetKey(path, "DeviceID", nullptr);
    std::string name;
    if (key.type == CMPI_chars && key.value.chars != nullptr) { // some servers; others: CMPI_string
        name = key.value.chars;
    } else if (key.type != CMPI_string || !PU::getKeyProperty(path, "DeviceID", name)) {
        CMReturn(CMPI_RC_ERR_INVALID_PARAMETER);
    }
    if (name != "eth0") {
        CMReturn(CMPI_RC_ERR_NOT_FOUND);
    }
    CMPIObjectPath* reply = PU::createObjectPath(broker, "OXATK_EthernetPort", PU::getNamespace(path));
    if (reply == nullptr) {
        CMReturn(CMPI_RC_ERR_FAILED);
    }
    PU::setKeyProperty(reply, "DeviceID", name);
    CMPIInstance* port = PU::createInstance(broker, reply);
    if (port == nullptr) {
        CMReturn(CMPI_RC_ERR_FAILED);
    }
    PU::setProperty(port, "DeviceID", name); // not every server takes it from the path
    PU::setProperty(port, "Speed", 1'000'000'000ULL);
    TK_TRACE_EXITING(category);
    CMReturnInstance(result, port);
    return CMReturnDone(result);
} catch (...) {
    CMReturn(CMPI_RC_ERR_FAILED);
}
// README ends

static CMPIStatus PortCleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
    CMReturn(CMPI_RC_OK);
}

static CMPIStatus PortEnumInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                        const CMPIObjectPath*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus PortEnumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                    const CMPIObjectPath*, const char**) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus PortCreateInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                     const CMPIObjectPath*, const CMPIInstance*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus PortModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                     const CMPIObjectPath*, const CMPIInstance*, const char**) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus PortDeleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                     const CMPIObjectPath*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus PortExecQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                                const char*, const char*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

CMInstanceMIStub(Port, DemoPort, broker, )
