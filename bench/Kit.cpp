#include "Kit.h"

#include "ThinBroker.h"

#include <ProviderKit.h>

#include <cmpimacs.h>

#include <cstdlib>

namespace {

constexpr const char* className = "OXATK_EthernetPort";

// By the kit

class Ports : public oxahv::InstanceProvider {
    void get(const oxahv::Operation& operation, oxahv::Instances& reply) override {
        const auto name = operation.key<std::string>("DeviceID");
        reply.add(operation.instance(className, {{"DeviceID", name}})
                      .set("ElementName", name)
                      .set("Speed", 1'000'000'000ULL)
                      .set("EnabledState", static_cast<unsigned short>(2))
                      .set("FullDuplex", true));
    }
};

// By hand, as a careful provider does it: every object looked at, every exception caught, the key in both
// forms of text.

using TK::ProviderUtilities;

const std::string category("OXA.Bench");

struct Failure {
    CMPIrc code;
};

template <class Object>
Object* made(Object* object) {
    if (object == nullptr) {
        throw Failure{CMPI_RC_ERR_FAILED};
    }
    return object;
}

void require(const CMPIStatus& status) {
    if (status.rc != CMPI_RC_OK) {
        throw Failure{status.rc};
    }
}

std::string keyOf(const CMPIObjectPath* path) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIData key = CMGetKey(path, "DeviceID", &status);
    std::string name;
    if (status.rc == CMPI_RC_OK && !CMIsNullValue(key) && key.type == CMPI_chars) {
        name = key.value.chars;
    } else if (key.type != CMPI_string || !ProviderUtilities::getKeyProperty(path, "DeviceID", name)) {
        throw Failure{CMPI_RC_ERR_INVALID_PARAMETER};
    }
    return name;
}

void get(const CMPIResult* result, const CMPIObjectPath* path) {
    TK_TRACE_ENTERING_PARAMETERS(category, " path=" << path);
    const std::string name = keyOf(path);
    CMPIObjectPath* const reply = made(ProviderUtilities::createObjectPath(
        &thin::objects().broker, className, ProviderUtilities::getNamespace(path)));
    ProviderUtilities::setKeyProperty(reply, "DeviceID", name);
    CMPIInstance* const port = made(ProviderUtilities::createInstance(&thin::objects().broker, reply));
    ProviderUtilities::setProperty(port, "DeviceID", name.c_str());
    ProviderUtilities::setProperty(port, "ElementName", name.c_str());
    ProviderUtilities::setProperty(port, "Speed", 1'000'000'000ULL);
    ProviderUtilities::setProperty(port, "EnabledState", static_cast<unsigned short>(2));
    ProviderUtilities::setProperty(port, "FullDuplex", true);
    require(CMReturnInstance(result, port));
    require(CMReturnDone(result));
    TK_TRACE_EXITING_PARAMETERS(category, " path=" << path);
}

CMPIStatus getInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/, const CMPIResult* result,
                       const CMPIObjectPath* path, const char** /*properties*/) {
    try {
        get(result, path);
        return {CMPI_RC_OK, nullptr};
    } catch (const Failure& failure) {
        return {failure.code, nullptr};
    } catch (...) {
        return {CMPI_RC_ERR_FAILED, nullptr};
    }
}

void serve(CMPIInstanceMI* mi) {
    thin::Objects& objects = thin::objects();
    if (mi->ft->getInstance(mi, nullptr, &objects.result, &objects.path, nullptr).rc != CMPI_RC_OK) {
        std::abort(); // what was measured would not be a request
    }
}

} // namespace

OXAHV_PROVIDER(BenchKit, Ports);

void kit::serveByKit() {
    static CMPIInstanceMI* const mi = BenchKit_Create_InstanceMI(&thin::objects().broker, nullptr, nullptr);
    serve(mi);
}

void kit::serveByHand() {
    static CMPIInstanceMIFT table = [] {
        CMPIInstanceMIFT all = {};
        all.getInstance = getInstance;
        return all;
    }();
    static CMPIInstanceMI mi = {nullptr, &table};
    serve(&mi);
}
