// A provider library with factories of one name, and generic ones that refuse every other name but "Generic",
// "Throws" by an exception. It returns the paths and arguments that it is given; of class Slow a path takes
// half a second.
#include <cmpimacs.h>

#include <chrono>
#include <cstring>
#include <exception>
#include <thread>

namespace {

const CMPIBroker* broker = nullptr;

CMPIStatus enumerateInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                  const CMPIObjectPath* path) {
    CMPIStatus status = CMReturnObjectPath(result, path);
    const CMPIString* const name = CMGetClassName(path, nullptr);
    const char* const chars = name != nullptr ? CMGetCharsPtr(name, nullptr) : nullptr;
    if (chars != nullptr && std::strcmp(chars, "Slow") == 0) {
        for (int i = 0; i < 3; ++i) {
            std::this_thread::sleep_for(std::chrono::milliseconds(500));
            status = CMReturnObjectPath(result, path);
        }
    }
    CMReturnDone(result);
    return status;
}

CMPIStatus enumerateInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                              const char**) {
    return {CMPI_RC_ERR_ACCESS_DENIED, CMNewString(broker, "not for you", nullptr)};
}

CMPIStatus getInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                       const char**) {
    CMReturn(CMPI_RC_OK);
}

CMPIStatus invokeMethod(CMPIMethodMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                        const char*, const CMPIArgs* in, CMPIArgs* out) {
    CMPIValue count = {};
    count.uint32 = CMGetArgCount(in, nullptr);
    for (CMPICount i = 0; i < count.uint32; ++i) {
        CMPIString* name = nullptr;
        const CMPIData argument = CMGetArgAt(in, i, &name, nullptr);
        if (name == nullptr) {
            CMReturn(CMPI_RC_ERR_FAILED);
        }
        CMAddArg(out, CMGetCharsPtr(name, nullptr), &argument.value, argument.type);
    }
    return CMReturnData(result, &count, CMPI_uint32);
}

// Lives in this library alone, with all that a handler needs of it.
class NoProvider : public std::exception {
public:
    const char* what() const noexcept override { return "no provider"; }
};

} // namespace

extern "C" CMPI_EXPORT CMPIInstanceMI* TestProvider_Create_InstanceMI(const CMPIBroker* theBroker,
                                                                      const CMPIContext*, CMPIStatus*) {
    static CMPIInstanceMIFT table = {};
    static CMPIInstanceMI mi = {nullptr, &table};
    table.enumerateInstanceNames = enumerateInstanceNames;
    table.enumerateInstances = enumerateInstances;
    table.getInstance = getInstance;
    broker = theBroker;
    return &mi;
}

extern "C" CMPI_EXPORT CMPIMethodMI* TestProvider_Create_MethodMI(const CMPIBroker*, const CMPIContext*,
                                                                  CMPIStatus*) {
    static CMPIMethodMIFT table = {};
    static CMPIMethodMI mi = {nullptr, &table};
    table.invokeMethod = invokeMethod;
    return &mi;
}

extern "C" CMPI_EXPORT CMPIInstanceMI* _Generic_Create_InstanceMI(const CMPIBroker* theBroker,
                                                                  const CMPIContext* context,
                                                                  const char* name, CMPIStatus* status) {
    if (std::strcmp(name, "Throws") == 0) {
        throw NoProvider();
    }
    if (std::strcmp(name, "Generic") != 0) {
        CMSetStatus(status, CMPI_RC_ERR_NOT_FOUND);
        return nullptr;
    }
    return TestProvider_Create_InstanceMI(theBroker, context, status);
}
