// Provider "DemoFileSystemByHand": serves Demo_FileSystem with the bare library.
// [includes]
#include <ProviderUtilities.h>
#include <Trace.h>
#include <cmpimacs.h>

#include <mntent.h>
#include <sys/statvfs.h>

#include <memory>
#include <set>
#include <string>

using TK::ProviderUtilities;

static const CMPIBroker* broker; // the CIM server; the factory below sets it
static const std::string category("Demo.FileSystem"); // of this module's traces
// [includes]

// [machine]
// The folders that something is mounted on. A folder can be mounted on twice, but a key must be
// unique: a set.
static std::set<std::string> mountPoints() {
    const std::unique_ptr<FILE, int (*)(FILE*)> table(setmntent("/proc/self/mounts", "r"),
                                                      endmntent);
    std::set<std::string> roots;
    mntent entry;
    char line[8192];
    while (table != nullptr && getmntent_r(table.get(), &entry, line, sizeof line) != nullptr) {
        roots.insert(entry.mnt_dir);
    }
    return roots;
}
// [machine]

// [errors]
// What a client is told in place of a result.
struct Refusal {
    CMPIrc code;
};

// No exception may leave a provider function, since its caller is C. Each becomes a CMPI code
// here.
template <class Function>
static CMPIStatus answer(const Function& function) noexcept {
    try {
        function();
        CMReturn(CMPI_RC_OK);
    } catch (const Refusal& refusal) {
        CMReturn(refusal.code);
    } catch (...) {
        CMReturn(CMPI_RC_ERR_FAILED);
    }
}

// A broker answers with a null object, or an error, when it cannot do what it is asked for.
template <class Object>
static Object* made(Object* object) {
    if (object == nullptr) {
        throw Refusal{CMPI_RC_ERR_FAILED};
    }
    return object;
}

static void require(const CMPIStatus& status) {
    if (status.rc != CMPI_RC_OK) {
        throw Refusal{status.rc};
    }
}
// [errors]

// [key]
// The key of the file system that a client asks for. Servers differ in how they deliver a text:
// as CMPI_string, which the library's getters read, or as CMPI_chars.
static std::string keyOf(const CMPIObjectPath* path) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIData key = CMGetKey(path, "Root", &status);
    std::string root;
    if (status.rc == CMPI_RC_OK && !CMIsNullValue(key) && key.type == CMPI_chars &&
        key.value.chars != nullptr) {
        root = key.value.chars;
    } else if (key.type != CMPI_string ||
               !ProviderUtilities::getKeyProperty(path, "Root", root)) {
        throw Refusal{CMPI_RC_ERR_INVALID_PARAMETER};
    }
    return root;
}
// [key]

// [objects]
static CMPIObjectPath* pathOf(const std::string& root, const std::string& nameSpace) {
    CMPIObjectPath* path =
        made(ProviderUtilities::createObjectPath(broker, "Demo_FileSystem", nameSpace));
    ProviderUtilities::setKeyProperty(path, "Root", root);
    return path;
}

static CMPIInstance* instanceOf(const std::string& root, const std::string& nameSpace,
                                const char** properties) {
    CMPIInstance* instance =
        made(ProviderUtilities::createInstance(broker, pathOf(root, nameSpace)));
    if (properties != nullptr) {
        // The client asked for some properties only: the broker then drops the others. Keys
        // stay.
        const char* keys[] = {"Root", nullptr};
        require(CMSetPropertyFilter(instance, properties, keys));
    }
    ProviderUtilities::setProperty(instance, "Root", root.c_str());
    struct statvfs state;
    if (statvfs(root.c_str(), &state) == 0) { // otherwise the other properties stay NULL
        const unsigned long long block = state.f_frsize;
        ProviderUtilities::setProperty(instance, "FileSystemSize", block * state.f_blocks);
        ProviderUtilities::setProperty(instance, "AvailableSpace", block * state.f_bavail);
        ProviderUtilities::setProperty(instance, "ReadOnly", (state.f_flag & ST_RDONLY) != 0);
    }
    return instance;
}
// [objects]

// [requests]
static void enumerateInstanceNames(const CMPIResult* result, const CMPIObjectPath* classPath) {
    TK_TRACE_ENTERING(category);
    for (const std::string& root : mountPoints()) {
        const auto* path = pathOf(root, ProviderUtilities::getNamespace(classPath));
        require(CMReturnObjectPath(result, path));
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

static void enumerateInstances(const CMPIResult* result, const CMPIObjectPath* classPath,
                               const char** properties) {
    TK_TRACE_ENTERING(category);
    for (const std::string& root : mountPoints()) {
        const auto* instance =
            instanceOf(root, ProviderUtilities::getNamespace(classPath), properties);
        require(CMReturnInstance(result, instance));
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

static void getInstance(const CMPIResult* result, const CMPIObjectPath* path,
                        const char** properties) {
    TK_TRACE_ENTERING(category);
    const std::string root = keyOf(path);
    TK_TRACE_VARIABLE(category, "root", root);
    if (mountPoints().count(root) == 0) {
        throw Refusal{CMPI_RC_ERR_NOT_FOUND};
    }
    const auto* instance = instanceOf(root, ProviderUtilities::getNamespace(path), properties);
    require(CMReturnInstance(result, instance));
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}
// [requests]

// [table]
static CMPIStatus FileSystemEnumInstanceNames(CMPIInstanceMI*, const CMPIContext*,
                                              const CMPIResult* result,
                                              const CMPIObjectPath* classPath) {
    return answer([&] { enumerateInstanceNames(result, classPath); });
}

static CMPIStatus FileSystemEnumInstances(CMPIInstanceMI*, const CMPIContext*,
                                          const CMPIResult* result,
                                          const CMPIObjectPath* classPath,
                                          const char** properties) {
    return answer([&] { enumerateInstances(result, classPath, properties); });
}

static CMPIStatus FileSystemGetInstance(CMPIInstanceMI*, const CMPIContext*,
                                        const CMPIResult* result, const CMPIObjectPath* path,
                                        const char** properties) {
    return answer([&] { getInstance(result, path, properties); });
}
// [table]

// [refused]
static CMPIStatus FileSystemCleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
    CMReturn(CMPI_RC_OK);
}

static CMPIStatus FileSystemCreateInstance(CMPIInstanceMI*, const CMPIContext*,
                                           const CMPIResult*, const CMPIObjectPath*,
                                           const CMPIInstance*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus FileSystemModifyInstance(CMPIInstanceMI*, const CMPIContext*,
                                           const CMPIResult*, const CMPIObjectPath*,
                                           const CMPIInstance*, const char**) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus FileSystemDeleteInstance(CMPIInstanceMI*, const CMPIContext*,
                                           const CMPIResult*, const CMPIObjectPath*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIStatus FileSystemExecQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                      const CMPIObjectPath*, const char*, const char*) {
    CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}
// [refused]

// [factory]
// Defines DemoFileSystemByHand_Create_InstanceMI, the function that a CIM server looks for in
// the library.
CMInstanceMIStub(FileSystem, DemoFileSystemByHand, broker, )
// [factory]
