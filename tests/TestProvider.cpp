// A provider library with factories of one name, and generic ones that refuse every other name but "Generic",
// "Throws" by an exception. It returns the paths, arguments and queries that it is given; a path of class
// Slow four times, half a second apart. What a client would write is named by what it answers.
#include <cmpimacs.h>

#include <chrono>
#include <cstdio>
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

const CMPIBroker* theBroker;

// The new instance's path has the property Text as its key.
CMPIStatus createInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                          const CMPIObjectPath* path, const CMPIInstance* instance) {
    CMPIObjectPath* const made = CMNewObjectPath(
        theBroker, "root/cimv2", CMGetCharsPtr(CMGetClassName(path, nullptr), nullptr), nullptr);
    const CMPIData text = CMGetProperty(instance, "Text", nullptr);
    if (text.type != CMPI_string) {
        CMReturn(CMPI_RC_ERR_INVALID_PARAMETER);
    }
    CMAddKey(made, "Text", &text.value, CMPI_string);
    return CMReturnObjectPath(result, made);
}

// The message is what the request would change. No std::string, whose symbols would keep the library mapped.
CMPIStatus modifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                          const CMPIInstance* instance, const char** properties) {
    char text[256] = "";
    for (; properties != nullptr && *properties != nullptr; ++properties) {
        const CMPIData data = CMGetProperty(instance, *properties, nullptr);
        const std::size_t size = std::strlen(text);
        std::snprintf(text + size, sizeof text - size, "%s=%d;", *properties,
                      data.type == CMPI_uint8 ? data.value.uint8 : -1);
    }
    if (text[0] == '\0') {
        CMReturn(CMPI_RC_OK);
    }
    CMReturnWithChars(theBroker, CMPI_RC_ERR_FAILED, text);
}

CMPIStatus deleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                          const CMPIObjectPath* path) {
    CMReturn(CMGetKeyCount(path, nullptr) == 1 ? CMPI_RC_OK : CMPI_RC_ERR_NOT_FOUND);
}

// One instance, whose properties are the query and its language.
CMPIStatus execQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                     const CMPIObjectPath* path, const char* query, const char* language) {
    CMPIInstance* const instance = CMNewInstance(theBroker, path, nullptr);
    CMSetProperty(instance, "Query", query, CMPI_chars);
    CMSetProperty(instance, "Language", language, CMPI_chars);
    return CMReturnInstance(result, instance);
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
        CMAddArg(out, CMGetCharsPtr(name, nullptr), CMIsNullValue(argument) ? nullptr : &argument.value,
                 argument.type);
    }
    return CMReturnData(result, &count, CMPI_uint32);
}

// Lives in this library alone, with all that a handler needs of it.
class NoProvider : public std::exception {
public:
    const char* what() const noexcept override { return "no provider"; }
};

} // namespace

extern "C" CMPI_EXPORT CMPIInstanceMI* TestProvider_Create_InstanceMI(const CMPIBroker* broker,
                                                                      const CMPIContext*, CMPIStatus*) {
    theBroker = broker;
    static CMPIInstanceMIFT table = {};
    static CMPIInstanceMI mi = {nullptr, &table};
    table.enumerateInstanceNames = enumerateInstanceNames;
    table.getInstance = getInstance;
    table.createInstance = createInstance;
    table.modifyInstance = modifyInstance;
    table.deleteInstance = deleteInstance;
    table.execQuery = execQuery;
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
