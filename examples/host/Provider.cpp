#include "Provider.h"

#include "HostProvider.h"
#include "Keys.h"

#include <algorithm>
#include <cerrno>
#include <mutex>
#include <system_error>

using TK::Moniker;
using TK::ProviderUtilities;

const std::string category("OXA.HostProvider");
const CMPIBroker* broker = nullptr;

namespace {

std::mutex settingsMutex;

struct Settings {
    std::string hostRoot;
    // NOLINTNEXTLINE(readability-redundant-string-init): a build may leave it empty
    std::string stateFile = OXAHOST_STATE_FILE;
};

// Guarded by the mutex.
Settings& settings() {
    static Settings all;
    return all;
}

} // namespace

void setHostRoot(const std::string& root) {
    const std::lock_guard<std::mutex> lock(settingsMutex);
    settings().hostRoot = root;
}

CMPIStatus begin(const CMPIBroker* theBroker, const CMPIContext* context) noexcept {
    broker = theBroker;
    return answer([&] {
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        const CMPIData entry = CMGetContextEntry(context, "OXAHostStateFile", &status);
        const bool isText = status.rc == CMPI_RC_OK && entry.type == CMPI_string && !CMIsNullValue(entry);
        std::string file =
            isText ? ProviderUtilities::convertToString(entry.value.string) : OXAHOST_STATE_FILE;
        const std::lock_guard<std::mutex> lock(settingsMutex);
        settings().stateFile = std::move(file);
    });
}

Machine machine() {
    const std::lock_guard<std::mutex> lock(settingsMutex);
    return {broker, Host(settings().hostRoot), AssetTagFile(settings().stateFile)};
}

CMPIStatus statusOf(CMPIrc code, const char* message) noexcept {
    return {code, message != nullptr ? CMNewString(broker, message, nullptr) : nullptr};
}

Utf8Thread::Utf8Thread() {
    const locale_t copy = ::duplocale(::uselocale(nullptr));
    locale_ = copy != nullptr ? ::newlocale(LC_CTYPE_MASK, "C.UTF-8", copy) : nullptr;
    if (locale_ == nullptr) {
        const int error = errno;
        if (copy != nullptr) {
            ::freelocale(copy);
        }
        throw std::system_error(error, std::generic_category(), "locale C.UTF-8");
    }
    previous_ = ::uselocale(locale_);
}

Utf8Thread::~Utf8Thread() {
    ::uselocale(previous_);
    ::freelocale(locale_);
}

// The objects of a reply

CMPIObjectPath* newPath(const char* className, const std::string& nameSpace) {
    CMPIObjectPath* const path = ProviderUtilities::createObjectPath(broker, className, nameSpace);
    if (path == nullptr) {
        throw Refusal{CMPI_RC_ERR_FAILED, "the broker made no object path"};
    }
    return path;
}

CMPIObjectPath* pathOf(const HostClass& hostClass, Moniker keys, const std::string& nameSpace) {
    CMPIObjectPath* path = newPath(hostClass.name, nameSpace);
    ProviderUtilities::transformMonikerToObjectPath(keys, &path);
    return path;
}

void require(const CMPIStatus& status) {
    if (status.rc != CMPI_RC_OK) {
        throw Refusal{status.rc, "the broker did not do what it was asked for"};
    }
}

namespace {

// As CMPI takes them: a null pointer ends them. They belong to the path.
std::vector<const char*> keyNames(const CMPIObjectPath* path) {
    std::vector<const char*> names;
    for (CMPICount i = 0; i < CMGetKeyCount(path, nullptr); ++i) {
        CMPIString* name = nullptr;
        CMGetKeyAt(path, i, &name, nullptr);
        names.push_back(name != nullptr ? CMGetCharsPtr(name, nullptr) : nullptr);
        if (names.back() == nullptr) {
            throw Refusal{CMPI_RC_ERR_FAILED, "the broker did not tell the name of a key"};
        }
    }
    names.push_back(nullptr);
    return names;
}

} // namespace

CMPIInstance* newInstance(CMPIObjectPath* path, const char** properties) {
    CMPIInstance* const instance = ProviderUtilities::createInstance(broker, path);
    if (instance == nullptr) {
        throw Refusal{CMPI_RC_ERR_FAILED, "the broker made no instance"};
    }
    if (properties != nullptr) {
        // The client asked for some properties only: the broker then drops the others. Keys stay.
        std::vector<const char*> keys = keyNames(path);
        require(CMSetPropertyFilter(instance, properties, keys.data()));
    }
    return instance;
}

CMPIInstance* instanceOf(const HostClass& hostClass, const Moniker& keys, const std::string& nameSpace,
                         const char** properties) {
    CMPIInstance* const instance = newInstance(pathOf(hostClass, keys, nameSpace), properties);
    setKeyProperties(instance, keys);
    hostClass.fill(machine(), keys, instance);
    return instance;
}

void give(const CMPIResult* result, const CMPIObjectPath* path) {
    require(CMReturnObjectPath(result, path));
}

void give(const CMPIResult* result, const CMPIInstance* instance) {
    require(CMReturnInstance(result, instance));
}

// Names that are served

const HostClass& classOf(const CMPIObjectPath* path) {
    const HostClass* const hostClass = findHostClass(ProviderUtilities::getClassId(path));
    if (hostClass == nullptr) {
        throw Refusal{CMPI_RC_ERR_INVALID_CLASS,
                      "this provider does not serve class " + ProviderUtilities::getClassName(path)};
    }
    return *hostClass;
}

Moniker keysOf(const HostClass& hostClass, const CMPIObjectPath* path) {
    const std::vector<Moniker> names = hostClass.names(machine());
    const auto named =
        std::find_if(names.begin(), names.end(), [&](const Moniker& keys) { return isNamedBy(path, keys); });
    if (named == names.end()) {
        throw Refusal{CMPI_RC_ERR_NOT_FOUND, "no instance of that name"};
    }
    return *named;
}
