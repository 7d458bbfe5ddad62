#include "RoadProvider.h"

#include <TKExport.h>
#include <Trace.h>
#include <Utility.h>
#include <cmpimacs.h>
#include <utils.h>

using TK::ProviderUtilities;

namespace {

const std::string category("Test.Road");
const CMPIBroker* broker;

CMPIInstance* roadFor(const CMPIObjectPath* path) {
    TK::Moniker keys;
    ProviderUtilities::transformObjectPathToMoniker(path, keys);
    std::string name;
    ProviderUtilities::getKeyProperty(path, "Name", name);
    CMPIObjectPath* reply = ProviderUtilities::createObjectPath(broker, "Road", "root/x");
    ProviderUtilities::transformMonikerToObjectPath(keys, &reply);
    CMPIInstance* const instance = ProviderUtilities::createInstance(broker, reply);
    std::wstring wide;
    ProviderUtilities::ConvertMultiByteToWideChar(name, wide);
    std::vector<unsigned short> numbers = {ProviderUtilities::getClassId("OXATK_EthernetPort"),
                                           ProviderUtilities::getClassId(path)};
    std::vector<std::string> texts = {name, "second"};
    std::string date = TK::Utils::convertCIMDateTime(TK::DateTime());
    ProviderUtilities::setProperty(instance, "Wide", wide);
    ProviderUtilities::setProperty(instance, "Speed", 1'000'000'000ULL);
    ProviderUtilities::setProperty(broker, instance, "Numbers", numbers);
    ProviderUtilities::setProperty(broker, instance, "Texts", texts);
    ProviderUtilities::setProperty(broker, instance, "When", date, true);
    ProviderUtilities::setProperty(instance, "IsPlain", ProviderUtilities::ValidateInput(name, ""));
    return instance;
}

CMPIStatus RoadCleanup(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/, CMPIBoolean /*terminating*/) {
    CMReturn(CMPI_RC_OK);
}

CMPIStatus RoadGetInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/, const CMPIResult* result,
                           const CMPIObjectPath* path, const char** /*properties*/) try {
    TK_TRACE_ENTERING_PARAMETERS(category, " path=" << path);
    CMPIInstance* const instance = roadFor(path);
    TK_TRACE_EXITING(category);
    return CMReturnInstance(result, instance);
} catch (const std::exception&) {
    CMReturn(CMPI_RC_ERR_FAILED);
}

} // namespace

TK_EXPORT CMPIInstanceMI* Road_Create_InstanceMI(const CMPIBroker* theBroker, const CMPIContext* /*context*/,
                                                 CMPIStatus* /*status*/) {
    static CMPIInstanceMIFT table = {};
    table.miName = "Road";
    table.cleanup = RoadCleanup;
    table.getInstance = RoadGetInstance;
    static CMPIInstanceMI mi = {nullptr, &table};
    broker = theBroker;
    return &mi;
}
