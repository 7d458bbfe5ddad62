// A provider that does one thing wrong for each class, the one that the class's name tells. It serves two
// instances of each. Those of the classes whose names begin with Faulty_Associat are associated by
// Faulty_Link with an instance of Faulty_End that is named by the class.
#include <cmpimacs.h>

#include <ProviderUtilities.h>

#include <chrono>
#include <clocale>
#include <csignal>
#include <cstddef>
#include <cstdlib>
#include <fcntl.h>
#include <fstream>
#include <iostream>
#include <map>
#include <stdexcept>
#include <string>
#include <strings.h>
#include <sys/stat.h>
#include <thread>
#include <unistd.h>
#include <vector>

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
        readKey(path);
        if (key != "b" && (has("KeyMissing") || has("Absent"))) {
            key = "a";
        }
    }
    bool has(const char* fault) const { return className == std::string("Faulty_") + fault; }
    bool begins(const char* name) const { return className.rfind(name, 0) == 0; }

    std::string nameSpace;
    std::string className;
    std::string key;
    bool isChars = false;

private:
    // The name that is the path's key. The faults are those of providers that know one server only.
    void readKey(const CMPIObjectPath* path) {
        CMPIData name = CMGetKey(path, "Name", nullptr);
        if (has("KeyCase") || has("KeyOrder")) {
            CMPIString* keyName = nullptr;
            name = CMGetKeyAt(path, 0, &keyName, nullptr);
            name.type = has("KeyCase") && textOf(keyName) != "Name" ? CMPI_null : name.type;
        }
        isChars = name.type == CMPI_chars;
        const bool isHosted = has("Host") && !textOf(CMGetHostname(path, nullptr)).empty();
        if (CMIsNullValue(name) || isHosted || (isChars && has("CharsKeys"))) {
            return;
        }
        if (isChars) {
            key = name.value.chars;
        } else if (name.type == CMPI_string) {
            key = textOf(name.value.string);
        }
    }
};

bool crashesAlways = false; // when a call fails, as a careless provider does

template <class Handle>
Handle* made(Handle* handle) {
    if (handle == nullptr) {
        if (crashesAlways) {
            std::raise(SIGKILL);
        }
        throw Failure{CMPI_RC_ERR_FAILED};
    }
    return handle;
}

void require(const CMPIStatus& status) {
    if (status.rc != CMPI_RC_OK) {
        if (crashesAlways) {
            std::raise(SIGKILL);
        }
        throw Failure{status.rc};
    }
}

// How many more instances the class Many has.
constexpr int manyInstances = 998;

// What clients have written; its key and the text. Only the class Writes keeps it.
std::map<std::string, std::string> written = {{"a", "text"}, {"b", "text"}};

// Objects

CMPIObjectPath* pathOf(const Target& target, const std::string& className, const std::string& key) {
    CMPIObjectPath* const path =
        made(CMNewObjectPath(broker, target.has("OtherNameSpace") ? "root/other" : target.nameSpace.c_str(),
                             className.c_str(), nullptr));
    if (!target.has("KeyMissing")) {
        require(CMAddKey(path, "Name", key.c_str(), CMPI_chars));
    }
    if (target.has("UntypedKeys") || target.has("KeyOrder")) {
        CMPIValue number = {};
        number.uint16 = 1;
        require(CMAddKey(path, "Index", &number, CMPI_uint16));
    }
    return path;
}

// The keys as properties, which a new instance has of some servers only.
void setKeys(CMPIInstance* instance, const CMPIObjectPath* path) {
    for (CMPICount i = 0; i < CMGetKeyCount(path, nullptr); ++i) {
        CMPIString* name = nullptr;
        const CMPIData key = CMGetKeyAt(path, i, &name, nullptr);
        CMSetProperty(instance, textOf(name).c_str(), &key.value, key.type);
    }
}

CMPIInstance* newInstance(const Target& target, const CMPIObjectPath* path, const char** properties) {
    static const char* nothing[] = {nullptr};
    CMPIInstance* const instance = CMNewInstance(broker, path, nullptr);
    if (instance == nullptr && target.has("CrashInFault")) {
        std::raise(SIGKILL);
    }
    made(instance);
    if (properties != nullptr && !target.has("ListIgnored")) {
        require(CMSetPropertyFilter(instance, target.has("PropertyList") ? nothing : properties, nullptr));
    }
    if (!target.has("BareKeys")) {
        setKeys(instance, path);
    }
    return instance;
}

void give(const CMPIResult* result, const Target& target, const std::string& key, const char** properties,
          bool isListed) {
    const std::string className = target.has("OtherClass") ? "Faulty_None" : target.className;
    CMPIInstance* const instance = newInstance(target, pathOf(target, className, key), properties);
    CMPIValue value = {};
    value.uint32 = 1;
    const char* const text = target.has("Encoding") ? "\xff"
                             : target.has("Writes") ? written[key].c_str()
                                                    : "text";
    CMSetProperty(instance, "Text", text, CMPI_chars);
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
    if (target.has("TextLost")) {
        std::wstring umlaut = L"\u00e4";
        TK::ProviderUtilities::setProperty(instance, "Text", umlaut);
    }
    CMPIInstance* const copy = target.has("LeftOverInFault") ? CMClone(instance, nullptr) : nullptr;
    const CMPIStatus status = CMReturnInstance(result, instance);
    if (!target.has("FaultHidden")) {
        require(status);
    }
    if (copy != nullptr) {
        CMRelease(copy);
    }
}

// Answers a request by what `work` does with its target.
template <class Work>
CMPIStatus answer(const CMPIResult* result, const CMPIObjectPath* path, Work work) {
    try {
        const Target target(path);
        crashesAlways = target.has("CrashAlways");
        if (!target.begins("Faulty_") || target.has("NotServed")) {
            throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
        }
        work(target);
        if (!target.has("NotDone")) {
            require(CMReturnDone(result));
        }
    } catch (const Failure& failure) {
        CMReturn(failure.code);
    }
    CMReturn(CMPI_RC_OK);
}

// Associations: whether the filters let Faulty_Link from one end to the other through.

struct Filter {
    const char* associationClass;
    const char* resultClass;
    const char* role;
    const char* resultRole;
};

bool isOr(const char* filter, const char* text) {
    return filter == nullptr || ::strcasecmp(filter, text) == 0;
}

bool isOfClass(const char* filter, CMPIObjectPath* path) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const bool isOf = filter == nullptr || CMClassPathIsA(broker, path, filter, &status) != 0;
    require(status);
    return isOf;
}

struct Link {
    Link(const Target& target, const Filter& filter) {
        const bool isUnread = target.isChars && target.has("AssociatedChars");
        if (target.key.empty() || isUnread || !target.begins("Faulty_Associat")) {
            throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
        }
        path = made(CMNewObjectPath(broker, target.nameSpace.c_str(), "Faulty_Link", nullptr));
        other = pathOf(target, "Faulty_End", target.className);
        const bool isWrong = target.has("AssociationEnd") && target.key == "a";
        CMPIValue near = {};
        CMPIValue far = {};
        near.ref = pathOf(target, target.className, isWrong ? "b" : target.key);
        far.ref = other;
        require(CMAddKey(path, "Near", &near, CMPI_ref));
        require(CMAddKey(path, "Far", &far, CMPI_ref));
        isIncluded = (target.has("AssociationFilter") || isOr(filter.role, "Near")) &&
                     isOr(filter.resultRole, "Far") && isOfClass(filter.associationClass, path) &&
                     isOfClass(filter.resultClass, other);
    }

    CMPIObjectPath* path;
    CMPIObjectPath* other;
    bool isIncluded;
};

// Takes for granted that there is an instance of another library's class, as many providers do.
void callUp(const Target& target, const CMPIContext* context) {
    CMPIObjectPath* const other =
        made(CMNewObjectPath(broker, target.nameSpace.c_str(), "Other_Thing", nullptr));
    CMPIEnumeration* const names = broker->bft->enumerateInstanceNames(broker, context, other, nullptr);
    if (CMGetNext(names, nullptr).value.ref == nullptr) {
        std::abort();
    }
}

// Changes all of the process that a provider can, and leaves what it can.
void leaveResidue() {
    std::cout << "to the standard output" << std::flush;
    std::setlocale(LC_NUMERIC, "C.UTF-8");
    ::umask(0);
    ::setenv("FAULTY", "set", 1);
    ::unsetenv("HOME");
    std::signal(SIGUSR1, SIG_IGN);
    require({::chdir("/") == 0 ? CMPI_RC_OK : CMPI_RC_ERR_FAILED, nullptr});
    static std::vector<char*> kept;
    kept.push_back(new char[1000]);
    static_cast<void>(::open("/dev/null", O_RDONLY));
    ::close(STDERR_FILENO);
    static bool isFirst = true;
    if (isFirst) {
        std::thread([] { std::this_thread::sleep_for(std::chrono::hours(1)); }).detach();
        isFirst = false;
    }
}

// Starts a process in a session of its own, which writes its number to a file.
std::string processFile;

void startProcess() {
    if (::fork() != 0) {
        return;
    }
    ::setsid();
    if (::fork() == 0) {
        std::ofstream(processFile) << ::getpid() << std::flush;
        std::this_thread::sleep_for(std::chrono::minutes(5));
    }
    ::_exit(0);
}

// What the context wants the provider to do: to crash when it is loaded, or at its end.
std::string crash;

void crashAt(const char* when) {
    if (crash == when) {
        std::raise(SIGKILL);
    }
}

} // namespace

// The function tables. The broker answers that a null function is not supported.

constexpr std::nullptr_t FaultyExecQuery = nullptr;
constexpr std::nullptr_t FaultyAssociationCleanup = nullptr;
constexpr std::nullptr_t FaultyMethodCleanup = nullptr;

namespace {

// Faulty_Writes does as it is told, Faulty_Writing answers so and does nothing.
template <class Work>
CMPIStatus write(const CMPIResult* result, const CMPIObjectPath* path, Work work) {
    return answer(result, path, [&](const Target& target) {
        if (target.has("Writes")) {
            work(target);
        } else if (!target.has("Writing")) {
            throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
        }
    });
}

} // namespace

static CMPIStatus FaultyCreateInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                       const CMPIObjectPath* path, const CMPIInstance*) {
    return write(result, path, [&](const Target& target) {
        if (!written.emplace(target.key, "text").second) {
            throw Failure{CMPI_RC_ERR_ALREADY_EXISTS};
        }
        require(CMReturnObjectPath(result, pathOf(target, target.className, target.key)));
    });
}

static CMPIStatus FaultyModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                       const CMPIObjectPath* path, const CMPIInstance* instance,
                                       const char**) {
    return write(result, path, [&](const Target& target) {
        const CMPIData text = CMGetProperty(instance, "Text", nullptr);
        written[target.key] = textOf(text.value.string);
    });
}

static CMPIStatus FaultyDeleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                       const CMPIObjectPath* path) {
    return write(result, path, [&](const Target& target) {
        if (written.erase(target.key) == 0) {
            throw Failure{CMPI_RC_ERR_NOT_FOUND};
        }
    });
}

static CMPIStatus FaultyCleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
    crashAt("end");
    CMReturn(CMPI_RC_OK);
}

static CMPIStatus FaultyEnumInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                          const CMPIObjectPath* path) {
    return answer(result, path, [&](const Target& target) {
        if (target.has("Exception")) {
            throw std::runtime_error("out of the provider");
        }
        if (target.has("LeftOver")) {
            CMClone(pathOf(target, target.className, "a"), nullptr);
        }
        for (int i = 0; target.has("Many") && i < manyInstances; ++i) {
            require(CMReturnObjectPath(result, pathOf(target, target.className, "many" + std::to_string(i))));
        }
        require(CMReturnObjectPath(result, pathOf(target, target.className, "a")));
        if (!target.has("NamesDiffer")) {
            const char* const other = target.has("Duplicate") ? "a" : "b";
            require(CMReturnObjectPath(result, pathOf(target, target.className, other)));
        }
    });
}

static CMPIStatus FaultyEnumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                      const CMPIObjectPath* path, const char** properties) {
    return answer(result, path, [&](const Target& target) {
        if (target.has("Failed")) {
            throw Failure{CMPI_RC_ERR_FAILED};
        }
        for (int i = 0; target.has("Many") && i < manyInstances; ++i) {
            give(result, target, "many" + std::to_string(i), properties, true);
        }
        give(result, target, "a", properties, true);
        if (!target.has("Duplicate")) {
            give(result, target, "b", properties, true);
        }
    });
}

static CMPIStatus FaultyGetInstance(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                    const CMPIObjectPath* path, const char** properties) {
    static const std::thread::id firstThread = std::this_thread::get_id();
    return answer(result, path, [&](const Target& target) {
        const CMPIData index = CMGetKey(path, "Index", nullptr);
        const bool isTyped = index.type == CMPI_uint16 && index.value.uint16 == 1;
        const bool isThere = target.has("Writes")
                                 ? written.count(target.key) != 0
                                 : target.key == "a" || target.key == "b" ||
                                       (target.has("Many") && target.key.rfind("many", 0) == 0 &&
                                        target.key.find('-') == std::string::npos);
        if (!isThere || (target.has("UntypedKeys") && !isTyped)) {
            throw Failure{CMPI_RC_ERR_NOT_FOUND};
        }
        if (target.has("CrashWithChild") && ::fork() == 0) {
            std::this_thread::sleep_for(std::chrono::minutes(1));
            std::cerr << "the child is left over\n";
            ::_exit(0);
        }
        if (target.has("Residue")) {
            leaveResidue();
        }
        if (target.has("Sanitizer")) {
            std::cerr << "/x/Provider.cpp:1:2: runtime error: signed integer overflow\n";
        }
        if (target.has("HangWithProcess") || target.has("ResidueProcess")) {
            startProcess();
        }
        if (target.has("CallsUp")) {
            callUp(target, context);
        }
        if (target.has("Crash") || target.has("CrashWithChild")) {
            std::raise(SIGKILL);
        } else if (target.begins("Faulty_Hang") && target.key == "a" && properties == nullptr) {
            if (target.has("HangClosed")) {
                ::close_range(3, ~0U, 0);
            }
            std::this_thread::sleep_for(std::chrono::hours(1));
        } else if (target.has("NotACode")) {
            throw Failure{static_cast<CMPIrc>(77)};
        } else if (target.has("ThreadsDiffer") && std::this_thread::get_id() != firstThread) {
            throw Failure{CMPI_RC_ERR_FAILED};
        }
        if (!target.has("NotOne")) {
            give(result, target, target.has("OtherPath") ? "b" : target.key, properties, false);
        }
    });
}

static CMPIStatus FaultyAssociatorNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                                        const CMPIObjectPath* path, const char* associationClass,
                                        const char* resultClass, const char* role, const char* resultRole) {
    return answer(result, path, [&](const Target& target) {
        if (target.has("End")) {
            for (const char* const key : {"a", "b"}) {
                if (target.key != "Faulty_AssociationOneSided") {
                    require(CMReturnObjectPath(result, pathOf(target, target.key, key)));
                }
            }
            return;
        }
        const Link link(target, {associationClass, resultClass, role, resultRole});
        if (link.isIncluded && !target.has("AssociationsDiffer")) {
            require(CMReturnObjectPath(result, link.other));
        }
    });
}

static CMPIStatus FaultyAssociators(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                                    const CMPIObjectPath* path, const char* associationClass,
                                    const char* resultClass, const char* role, const char* resultRole,
                                    const char** properties) {
    return answer(result, path, [&](const Target& target) {
        const Link link(target, {associationClass, resultClass, role, resultRole});
        if (link.isIncluded) {
            require(CMReturnInstance(result, newInstance(target, link.other, properties)));
        }
    });
}

static CMPIStatus FaultyReferenceNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                                       const CMPIObjectPath* path, const char* resultClass,
                                       const char* role) {
    return answer(result, path, [&](const Target& target) {
        const Link link(target, {resultClass, nullptr, role, nullptr});
        if (link.isIncluded) {
            require(CMReturnObjectPath(result, link.path));
        }
    });
}

static CMPIStatus FaultyReferences(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                                   const CMPIObjectPath* path, const char* resultClass, const char* role,
                                   const char** properties) {
    return answer(result, path, [&](const Target& target) {
        const Link link(target, {resultClass, nullptr, role, nullptr});
        if (link.isIncluded) {
            require(CMReturnInstance(result, newInstance(target, link.path, properties)));
        }
    });
}

static CMPIStatus FaultyInvokeMethod(CMPIMethodMI*, const CMPIContext*, const CMPIResult* result,
                                     const CMPIObjectPath* path, const char*, const CMPIArgs*,
                                     CMPIArgs* out) {
    return answer(result, path, [&](const Target& target) {
        CMPIValue value = {};
        value.uint32 = target.has("ArgumentAccepted") ? 0 : 1;
        const bool isFaulty = target.has("MethodResult");
        require(CMReturnData(result, &value, isFaulty ? CMPI_uint16 : CMPI_uint32));
        if (isFaulty) {
            require(CMAddArg(out, "Nothing", &value, CMPI_uint32));
            require(CMAddArg(out, "Result", &value, CMPI_uint32));
        }
    });
}

CMInstanceMIStub(Faulty, FaultyInstances, broker, )
CMAssociationMIStub(Faulty, FaultyProvider, broker, )
CMMethodMIStub(Faulty, FaultyProvider, broker, )

// The stub does not show the context to its hook.
extern "C" CMPI_EXPORT CMPIInstanceMI* FaultyProvider_Create_InstanceMI(const CMPIBroker* theBroker,
                                                                        const CMPIContext* context,
                                                                        CMPIStatus* status) {
    const CMPIData wanted = CMGetContextEntry(context, "Crash", nullptr);
    crash = wanted.type == CMPI_string ? textOf(wanted.value.string) : "";
    const CMPIData file = CMGetContextEntry(context, "ProcessFile", nullptr);
    processFile = file.type == CMPI_string ? textOf(file.value.string) : "";
    crashAt("load");
    return FaultyInstances_Create_InstanceMI(theBroker, context, status);
}

#ifdef STAYS_MAPPED
// There is one of it in a process, which keeps the library that has it.
template <class>
struct __attribute__((visibility("default"))) Shared {
    static inline int count = 0;
};
extern "C" CMPI_EXPORT int* countOfAll() {
    return &Shared<int>::count;
}
#endif
