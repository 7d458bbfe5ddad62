// A provider that does one thing wrong for each class, the one that the class's name tells. It serves two
// instances of each, and associations by Faulty_Link from those of some classes to the one of Faulty_End.
#include <cmpimacs.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <csignal>
#include <iterator>
#include <stdexcept>
#include <string>
#include <strings.h>
#include <thread>

static const CMPIBroker* broker;

namespace {

struct Failure {
    CMPIrc code;
};

std::string textOf(const CMPIString* string) {
    const char* const chars = string != nullptr ? CMGetCharsPtr(string, nullptr) : nullptr;
    return chars != nullptr ? chars : "";
}

// What a request is about.
struct Target {
    explicit Target(const CMPIObjectPath* path)
        : nameSpace(textOf(CMGetNameSpace(path, nullptr))), className(textOf(CMGetClassName(path, nullptr))) {
        const CMPIData name = CMGetKey(path, "Name", nullptr);
        key = name.type == CMPI_string && !CMIsNullValue(name) ? textOf(name.value.string) : "";
    }
    bool has(const char* fault) const { return className == std::string("Faulty_") + fault; }

    std::string nameSpace;
    std::string className;
    std::string key;
};

template <class Handle>
Handle* made(Handle* handle) {
    if (handle == nullptr) {
        throw Failure{CMPI_RC_ERR_FAILED};
    }
    return handle;
}

void require(const CMPIStatus& status) {
    if (status.rc != CMPI_RC_OK) {
        throw Failure{status.rc};
    }
}

CMPIObjectPath* pathOf(const Target& target, const std::string& className, const char* key) {
    CMPIObjectPath* const path =
        made(CMNewObjectPath(broker, target.nameSpace.c_str(), className.c_str(), nullptr));
    if (target.has("UntypedKeys")) {
        CMPIValue number = {};
        number.uint16 = static_cast<CMPIUint16>(key[0] - 'a');
        require(CMAddKey(path, "Number", &number, CMPI_uint16));
    } else if (!target.has("KeyMissing")) {
        require(CMAddKey(path, "Name", key, CMPI_chars));
    }
    return path;
}

// The properties that are wrong.
void fill(const Target& target, CMPIInstance* instance, bool isListed) {
    CMPIValue value = {};
    value.uint32 = 1;
    CMSetProperty(instance, "Text", target.has("Encoding") ? "\xff" : "text", CMPI_chars);
    CMSetProperty(instance, target.has("Undeclared") ? "Nothing" : "Number", &value,
                  target.has("Type") ? CMPI_uint8 : CMPI_uint32);
    value.dateTime = CMNewDateTimeFromChars(
        broker, target.has("Date") ? "20261301000000.000000+000" : "20261101000000.000000+000", nullptr);
    if (value.dateTime != nullptr && !(target.has("GetDiffers") && isListed)) {
        CMSetProperty(instance, "When", &value, CMPI_dateTime);
    }
    if (target.has("NullKey")) {
        CMSetProperty(instance, "Name", nullptr, CMPI_string);
    }
}

CMPIInstance* instanceOf(const Target& target, const char* key, const char** properties, bool isListed) {
    const std::string className = target.has("OtherClass") ? "Faulty_None" : target.className;
    CMPIInstance* const instance = CMNewInstance(broker, pathOf(target, className, key), nullptr);
    if (instance == nullptr && target.has("CrashInFault")) {
        std::raise(SIGKILL);
    }
    made(instance);
    if (target.has("UntypedKeys")) {
        return instance;
    }
    static const char* nothing[] = {nullptr};
    if (properties != nullptr && !target.has("ListIgnored")) {
        require(CMSetPropertyFilter(instance, target.has("PropertyList") ? nothing : properties, nullptr));
    }
    fill(target, instance, isListed);
    return instance;
}

void give(const Target& target, const CMPIResult* result, CMPIInstance* instance) {
    CMPIInstance* const copy = target.has("LeftOverInFault") ? CMClone(instance, nullptr) : nullptr;
    require(CMReturnInstance(result, instance));
    if (copy != nullptr) {
        CMRelease(copy);
    }
}

void done(const Target& target, const CMPIResult* result) {
    if (!target.has("NotDone")) {
        require(CMReturnDone(result));
    }
}

void refuse(const Target& target) {
    const bool isServed = target.className.rfind("Faulty_", 0) == 0 && !target.has("NotServed");
    if (!isServed) {
        throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
    }
}

void enumerateNames(const CMPIResult* result, const Target& target) {
    refuse(target);
    if (target.has("Exception")) {
        throw std::runtime_error("out of the provider");
    }
    if (target.has("LeftOver")) {
        CMClone(pathOf(target, target.className, "a"), nullptr);
    }
    require(CMReturnObjectPath(result, pathOf(target, target.className, "a")));
    if (!target.has("NamesDiffer")) {
        require(CMReturnObjectPath(result,
                                   pathOf(target, target.className, target.has("Duplicate") ? "a" : "b")));
    }
    done(target, result);
}

void enumerate(const CMPIResult* result, const Target& target, const char** properties) {
    refuse(target);
    if (target.has("Failed")) {
        throw Failure{CMPI_RC_ERR_FAILED};
    }
    give(target, result, instanceOf(target, "a", properties, true));
    if (!target.has("Duplicate")) {
        give(target, result, instanceOf(target, "b", properties, true));
    }
    done(target, result);
}

// The key of the instance that a path names; of one that does not exist, empty.
const char* keyOf(const Target& target, const CMPIObjectPath* path) {
    if (target.has("UntypedKeys")) {
        const CMPIData key = CMGetKey(path, "Number", nullptr);
        return key.type != CMPI_uint16 ? "" : key.value.uint16 == 0 ? "a" : key.value.uint16 == 1 ? "b" : "";
    }
    if (target.has("KeyMissing") || target.has("Absent")) {
        return target.key == "b" ? "b" : "a";
    }
    return target.key == "a" ? "a" : target.key == "b" ? "b" : "";
}

void get(const CMPIResult* result, const CMPIObjectPath* path, const Target& target,
         const char** properties) {
    static std::atomic<int> inside{0};
    const char* key = keyOf(target, path);
    if (*key == '\0') {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    if (target.has("Crash")) {
        std::raise(SIGKILL);
    } else if (target.has("Hang") && *key == 'a' && properties == nullptr) {
        std::this_thread::sleep_for(std::chrono::hours(1));
    } else if (target.has("NotACode")) {
        throw Failure{static_cast<CMPIrc>(77)};
    } else if (target.has("ThreadsDiffer")) {
        const int others = inside++;
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
        --inside;
        if (others > 0) {
            throw Failure{CMPI_RC_ERR_FAILED};
        }
    }
    if (!target.has("NotOne")) {
        give(target, result, instanceOf(target, target.has("OtherPath") ? "b" : key, properties, false));
    }
    done(target, result);
}

// Associations: whether the filters let Faulty_Link from one end to the other through.

struct Filter {
    const char* associationClass;
    const char* resultClass;
    const char* role;
    const char* resultRole;
};

bool isOr(const char* filter, const char* text) {
    return filter == nullptr || *filter == '\0' || ::strcasecmp(filter, text) == 0;
}

bool isOfClass(const char* filter, CMPIObjectPath* path) {
    return filter == nullptr || *filter == '\0' || CMClassPathIsA(broker, path, filter, nullptr) != 0;
}

constexpr const char* linked[] = {"Faulty_None", "Faulty_Filter", "Faulty_AssociationsDiffer",
                                  "Faulty_AssociationEnd", "Faulty_OneSided"};

struct Link {
    Link(const Target& target, const CMPIObjectPath* source) {
        const char* const key = keyOf(target, source);
        if (*key == '\0' ||
            std::find(std::begin(linked), std::end(linked), target.className) == std::end(linked)) {
            throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
        }
        other = made(CMNewObjectPath(broker, target.nameSpace.c_str(), "Faulty_End", nullptr));
        require(CMAddKey(other, "Name", "e", CMPI_chars));
        CMPIValue near = {};
        CMPIValue far = {};
        near.ref = pathOf(target, target.className, target.has("AssociationEnd") && *key == 'a' ? "b" : key);
        far.ref = other;
        path = made(CMNewObjectPath(broker, target.nameSpace.c_str(), "Faulty_Link", nullptr));
        require(CMAddKey(path, "Near", &near, CMPI_ref));
        require(CMAddKey(path, "Far", &far, CMPI_ref));
    }

    CMPIObjectPath* path;
    CMPIObjectPath* other;
};

bool isIncluded(const Target& target, const Link& link, const Filter& filter) {
    return (target.has("Filter") || isOr(filter.role, "Near")) && isOr(filter.resultRole, "Far") &&
           isOfClass(filter.associationClass, link.path) && isOfClass(filter.resultClass, link.other);
}

CMPIInstance* instanceOf(CMPIObjectPath* path, const char** properties) {
    CMPIInstance* const instance = made(CMNewInstance(broker, path, nullptr));
    if (properties != nullptr) {
        require(CMSetPropertyFilter(instance, properties, nullptr));
    }
    return instance;
}

void associatorsOfEnd(const CMPIResult* result, const Target& target) {
    for (const char* const className : linked) {
        for (const char* const key : {"a", "b"}) {
            if (className != std::string("Faulty_OneSided")) {
                require(CMReturnObjectPath(result, pathOf(target, className, key)));
            }
        }
    }
    done(target, result);
}

// What the context wants the provider to do: to crash when it is loaded, or at its end.
bool crashesAtEnd = false;

void obey(const CMPIContext* context) {
    const CMPIData wanted = CMGetContextEntry(context, "Crash", nullptr);
    const std::string when = wanted.type == CMPI_string ? textOf(wanted.value.string) : "";
    if (when == "load") {
        std::raise(SIGKILL);
    }
    crashesAtEnd = when == "end";
}

template <class Work>
CMPIStatus answer(const CMPIObjectPath* path, Work work) {
    try {
        work(Target(path));
    } catch (const Failure& failure) {
        CMReturn(failure.code);
    }
    CMReturn(CMPI_RC_OK);
}

} // namespace

// The function tables

static CMPIStatus FaultyCleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
    if (crashesAtEnd) {
        std::raise(SIGKILL);
    }
    CMReturn(CMPI_RC_OK);
}

static CMPIStatus FaultyEnumInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                          const CMPIObjectPath* path) {
    return answer(path, [&](const Target& target) { enumerateNames(result, target); });
}

static CMPIStatus FaultyEnumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                      const CMPIObjectPath* path, const char** properties) {
    return answer(path, [&](const Target& target) { enumerate(result, target, properties); });
}

static CMPIStatus FaultyGetInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                    const CMPIObjectPath* path, const char** properties) {
    return answer(path, [&](const Target& target) { get(result, path, target, properties); });
}

static CMPIStatus FaultyCreateInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                       const CMPIObjectPath*, const CMPIInstance*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus FaultyModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                       const CMPIObjectPath*, const CMPIInstance*, const char**) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus FaultyDeleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                       const CMPIObjectPath*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus FaultyExecQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                  const CMPIObjectPath*, const char*, const char*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus FaultyAssociationCleanup(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) {
    CMReturn(CMPI_RC_OK);
}

static CMPIStatus FaultyAssociatorNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                                        const CMPIObjectPath* path, const char* associationClass,
                                        const char* resultClass, const char* role, const char* resultRole) {
    return answer(path, [&](const Target& target) {
        if (target.has("End")) {
            associatorsOfEnd(result, target);
            return;
        }
        const Link link(target, path);
        if (!target.has("AssociationsDiffer") &&
            isIncluded(target, link, {associationClass, resultClass, role, resultRole})) {
            require(CMReturnObjectPath(result, link.other));
        }
        done(target, result);
    });
}

static CMPIStatus FaultyAssociators(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                                    const CMPIObjectPath* path, const char* associationClass,
                                    const char* resultClass, const char* role, const char* resultRole,
                                    const char** properties) {
    return answer(path, [&](const Target& target) {
        const Link link(target, path);
        if (isIncluded(target, link, {associationClass, resultClass, role, resultRole})) {
            require(CMReturnInstance(result, instanceOf(link.other, properties)));
        }
        done(target, result);
    });
}

static CMPIStatus FaultyReferenceNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                                       const CMPIObjectPath* path, const char* resultClass,
                                       const char* role) {
    return answer(path, [&](const Target& target) {
        const Link link(target, path);
        if (isIncluded(target, link, {resultClass, nullptr, role, nullptr})) {
            require(CMReturnObjectPath(result, link.path));
        }
        done(target, result);
    });
}

static CMPIStatus FaultyReferences(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                                   const CMPIObjectPath* path, const char* resultClass, const char* role,
                                   const char** properties) {
    return answer(path, [&](const Target& target) {
        const Link link(target, path);
        if (isIncluded(target, link, {resultClass, nullptr, role, nullptr})) {
            require(CMReturnInstance(result, instanceOf(link.path, properties)));
        }
        done(target, result);
    });
}

static CMPIStatus FaultyMethodCleanup(CMPIMethodMI*, const CMPIContext*, CMPIBoolean) {
    CMReturn(CMPI_RC_OK);
}

static CMPIStatus FaultyInvokeMethod(CMPIMethodMI*, const CMPIContext*, const CMPIResult* result,
                                     const CMPIObjectPath* path, const char*, const CMPIArgs*,
                                     CMPIArgs* out) {
    return answer(path, [&](const Target& target) {
        CMPIValue value = {};
        value.uint32 = 1;
        const bool isFaulty = target.has("MethodResult");
        require(CMReturnData(result, &value, isFaulty ? CMPI_uint16 : CMPI_uint32));
        if (isFaulty) {
            require(CMAddArg(out, "Nothing", &value, CMPI_uint32));
        }
        done(target, result);
    });
}

CMInstanceMIStub(Faulty, FaultyInstances, broker, )
CMAssociationMIStub(Faulty, FaultyProvider, broker, )
CMMethodMIStub(Faulty, FaultyProvider, broker, )

// The stub does not show the context to its hook.
extern "C" CMPI_EXPORT CMPIInstanceMI* FaultyProvider_Create_InstanceMI(const CMPIBroker* theBroker,
                                                                        const CMPIContext* context,
                                                                        CMPIStatus* status) {
    obey(context);
    return FaultyInstances_Create_InstanceMI(theBroker, context, status);
}
