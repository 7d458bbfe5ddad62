// A provider of instances for this machine: the CMPI side, from a request's object path to the reply.

#include "HostProvider.h"

#include "HostClasses.h"

#include <Trace.h>
#include <cmpimacs.h>

#include <algorithm>
#include <exception>
#include <vector>

using TK::Moniker;
using TK::ProviderUtilities;

namespace {

const std::string category("OXA.HostProvider");
const CMPIBroker* broker = nullptr;

std::string& hostRoot() {
    static std::string root;
    return root;
}

// A request that cannot be served, with the code for the client.
struct Refusal {
    CMPIrc code;
    std::string message;
};

CMPIStatus statusOf(CMPIrc code, const char* message) {
    return {code, message != nullptr ? CMNewString(broker, message, nullptr) : nullptr};
}

// Runs a provider function. No exception may reach the CIM server, so each becomes a status here.
template <class Function>
CMPIStatus answer(const Function& function) {
    try {
        function();
        return statusOf(CMPI_RC_OK, nullptr);
    } catch (const Refusal& refusal) {
        return statusOf(refusal.code, refusal.message.c_str());
    } catch (const TK::FrameworkException& exception) {
        return statusOf(CMPI_RC_ERR_INVALID_PARAMETER, exception.what());
    } catch (const std::exception& exception) {
        return statusOf(CMPI_RC_ERR_FAILED, exception.what());
    } catch (...) {
        return statusOf(CMPI_RC_ERR_FAILED, "unknown exception");
    }
}

const HostClass& classOf(const CMPIObjectPath* path) {
    const HostClass* const hostClass = findHostClass(ProviderUtilities::getClassId(path));
    if (hostClass == nullptr) {
        throw Refusal{CMPI_RC_ERR_INVALID_CLASS,
                      "this provider does not serve class " + ProviderUtilities::getClassName(path)};
    }
    return *hostClass;
}

CMPIObjectPath* pathOf(const HostClass& hostClass, Moniker keys, const std::string& nameSpace) {
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(broker, hostClass.name, nameSpace);
    if (path == nullptr) {
        throw Refusal{CMPI_RC_ERR_FAILED, "the broker made no object path"};
    }
    ProviderUtilities::transformMonikerToObjectPath(keys, &path);
    return path;
}

CMPIInstance* instanceOf(const HostClass& hostClass, const Moniker& keys, const std::string& nameSpace,
                         const char** properties) {
    CMPIInstance* const instance =
        ProviderUtilities::createInstance(broker, pathOf(hostClass, keys, nameSpace));
    if (instance == nullptr) {
        throw Refusal{CMPI_RC_ERR_FAILED, "the broker made no instance"};
    }
    if (properties != nullptr) {
        CMSetPropertyFilter(instance, properties, nullptr);
    }
    hostClass.fill(Host(hostRoot()), keys, instance);
    return instance;
}

// What a broker refuses to take cannot be told to the client in any other way.
void require(const CMPIStatus& status) {
    if (status.rc != CMPI_RC_OK) {
        throw Refusal{status.rc, "the broker did not take the result"};
    }
}

// Whether every key of an instance stands in a request with the same value.
bool isNamedBy(const Moniker& request, Moniker keys) {
    bool isNamed = request.getKeyCount() == keys.getKeyCount();
    for (unsigned int i = 0; isNamed && keys.selectKey(i); ++i) {
        std::string name;
        std::string value;
        keys.getName(name);
        keys.getValue(value);
        isNamed = keyText(request, name.c_str()) == value;
    }
    return isNamed;
}

// The operations. Trace points stand in functions of their own, so that a trace names the operation.

void enumerateInstanceNames(const CMPIResult* result, const CMPIObjectPath* classPath) {
    TK_TRACE_ENTERING_PARAMETERS(category, " classPath=" << classPath);
    const HostClass& hostClass = classOf(classPath);
    const std::string nameSpace = ProviderUtilities::getNamespace(classPath);
    for (const Moniker& keys : hostClass.names(Host(hostRoot()))) {
        require(CMReturnObjectPath(result, pathOf(hostClass, keys, nameSpace)));
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

void enumerateInstances(const CMPIResult* result, const CMPIObjectPath* classPath, const char** properties) {
    TK_TRACE_ENTERING_PARAMETERS(category, " classPath=" << classPath);
    const HostClass& hostClass = classOf(classPath);
    const std::string nameSpace = ProviderUtilities::getNamespace(classPath);
    for (const Moniker& keys : hostClass.names(Host(hostRoot()))) {
        require(CMReturnInstance(result, instanceOf(hostClass, keys, nameSpace, properties)));
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

void getInstance(const CMPIResult* result, const CMPIObjectPath* path, const char** properties) {
    TK_TRACE_ENTERING_PARAMETERS(category, " path=" << path);
    const HostClass& hostClass = classOf(path);
    Moniker request;
    ProviderUtilities::transformObjectPathToMoniker(path, request);
    const std::vector<Moniker> names = hostClass.names(Host(hostRoot()));
    const auto named = std::find_if(names.begin(), names.end(),
                                    [&](const Moniker& keys) { return isNamedBy(request, keys); });
    if (named == names.end()) {
        throw Refusal{CMPI_RC_ERR_NOT_FOUND, "no instance of that name"};
    }
    require(CMReturnInstance(
        result, instanceOf(hostClass, *named, ProviderUtilities::getNamespace(path), properties)));
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

// The functions of the MI

CMPIStatus HostCleanup(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/, CMPIBoolean /*terminating*/) {
    return statusOf(CMPI_RC_OK, nullptr);
}

CMPIStatus HostEnumInstanceNames(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/,
                                 const CMPIResult* result, const CMPIObjectPath* classPath) {
    return answer([&] { enumerateInstanceNames(result, classPath); });
}

CMPIStatus HostEnumInstances(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/, const CMPIResult* result,
                             const CMPIObjectPath* classPath, const char** properties) {
    return answer([&] { enumerateInstances(result, classPath, properties); });
}

CMPIStatus HostGetInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/, const CMPIResult* result,
                           const CMPIObjectPath* path, const char** properties) {
    return answer([&] { getInstance(result, path, properties); });
}

// This machine is not changed through CIM.

CMPIStatus HostCreateInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/,
                              const CMPIResult* /*result*/, const CMPIObjectPath* /*classPath*/,
                              const CMPIInstance* /*instance*/) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED, nullptr);
}

CMPIStatus HostModifyInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/,
                              const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                              const CMPIInstance* /*instance*/, const char** /*properties*/) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED, nullptr);
}

CMPIStatus HostDeleteInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/,
                              const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED, nullptr);
}

CMPIStatus HostExecQuery(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/, const CMPIResult* /*result*/,
                         const CMPIObjectPath* /*classPath*/, const char* /*query*/,
                         const char* /*language*/) {
    return statusOf(CMPI_RC_ERR_NOT_SUPPORTED, nullptr);
}

} // namespace

void setHostRoot(const std::string& root) {
    hostRoot() = root;
}

CMInstanceMIStub(Host, OXAHostProvider, broker, )
