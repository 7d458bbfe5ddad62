// A provider library with factories of one name, and generic ones that refuse every other name but "Generic",
// "Throws" by an exception. It returns the paths and arguments that it is given; a path of class Slow four
// times, half a second apart.
#include <cmpimacs.h>

#include <chrono>
#include <cstring>
#include <exception>
#include <thread>

namespace {

CMPIStatus enumerateInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                  const CMPIObjectPath* path) {
    const bool isSlow = std::strcmp(CMGetCharsPtr(CMGetClassName(path, nullptr), nullptr), "Slow") == 0;
    for (int i = 0; isSlow && i < 3; ++i) {
        CMReturnObjectPath(result, path);
        std::this_thread::sleep_for(std::chrono::milliseconds(500));
    }
    return CMReturnObjectPath(result, path);
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

extern "C" CMPI_EXPORT CMPIInstanceMI* TestProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                      CMPIStatus*) {
    static CMPIInstanceMIFT table = {};
    static CMPIInstanceMI mi = {nullptr, &table};
    table.enumerateInstanceNames = enumerateInstanceNames;
    table.getInstance = getInstance;
    return &mi;
}

extern "C" CMPI_EXPORT CMPIMethodMI* TestProvider_Create_MethodMI(const CMPIBroker*, const CMPIContext*,
                                                                  CMPIStatus*) {
    static CMPIMethodMIFT table = {};
    static CMPIMethodMI mi = {nullptr, &table};
    table.invokeMethod = invokeMethod;
    return &mi;
}

extern "C" CMPI_EXPORT CMPIInstanceMI* _Generic_Create_InstanceMI(const CMPIBroker* broker,
                                                                  const CMPIContext* context,
                                                                  const char* name, CMPIStatus* status) {
    if (std::strcmp(name, "ThrowsANumber") == 0) {
        throw 1;
    }
    if (std::strcmp(name, "Throws") == 0) {
        throw NoProvider();
    }
    if (std::strcmp(name, "Generic") != 0) {
        CMSetStatus(status, CMPI_RC_ERR_NOT_FOUND);
        return nullptr;
    }
    return TestProvider_Create_InstanceMI(broker, context, status);
}
