// The function table for instances: from a request's object path to the reply.

#include "Provider.h"
#include "RunningOS.h"

#include <Trace.h>

using TK::ProviderUtilities;

namespace {

// The operations. Trace points stand in functions of their own, so that a trace names the operation.

void enumerateInstanceNames(const CMPIResult* result, const CMPIObjectPath* classPath) {
    TK_TRACE_ENTERING_PARAMETERS(category, " classPath=" << classPath);
    const std::string nameSpace = ProviderUtilities::getNamespace(classPath);
    if (isRunningOs(classPath)) {
        give(result, runningOsPath(nameSpace));
    } else {
        const HostClass& hostClass = classOf(classPath);
        for (const TK::Moniker& keys : hostClass.names(machine())) {
            give(result, pathOf(hostClass, keys, nameSpace));
        }
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

void enumerateInstances(const CMPIResult* result, const CMPIObjectPath* classPath, const char** properties) {
    TK_TRACE_ENTERING_PARAMETERS(category, " classPath=" << classPath);
    const std::string nameSpace = ProviderUtilities::getNamespace(classPath);
    if (isRunningOs(classPath)) {
        give(result, runningOsInstance(nameSpace, properties));
    } else {
        const HostClass& hostClass = classOf(classPath);
        for (const TK::Moniker& keys : hostClass.names(machine())) {
            give(result, instanceOf(hostClass, keys, nameSpace, properties));
        }
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

void getInstance(const CMPIResult* result, const CMPIObjectPath* path, const char** properties) {
    TK_TRACE_ENTERING_PARAMETERS(category, " path=" << path);
    const std::string nameSpace = ProviderUtilities::getNamespace(path);
    if (isRunningOs(path)) {
        requireRunningOs(path);
        give(result, runningOsInstance(nameSpace, properties));
    } else {
        const HostClass& hostClass = classOf(path);
        give(result, instanceOf(hostClass, keysOf(hostClass, path), nameSpace, properties));
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

// The functions of the table

CMPIStatus HostCleanup(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/, CMPIBoolean /*terminating*/) {
    return answer([] {});
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

// Instances of this machine are not made, changed or deleted through CIM.

CMPIStatus notSupported() {
    return answer([] {
        throw Refusal{CMPI_RC_ERR_NOT_SUPPORTED, "this provider's instances are read only"};
    });
}

CMPIStatus HostCreateInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/,
                              const CMPIResult* /*result*/, const CMPIObjectPath* /*classPath*/,
                              const CMPIInstance* /*instance*/) {
    return notSupported();
}

CMPIStatus HostModifyInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/,
                              const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/,
                              const CMPIInstance* /*instance*/, const char** /*properties*/) {
    return notSupported();
}

CMPIStatus HostDeleteInstance(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/,
                              const CMPIResult* /*result*/, const CMPIObjectPath* /*path*/) {
    return notSupported();
}

CMPIStatus HostExecQuery(CMPIInstanceMI* /*mi*/, const CMPIContext* /*context*/, const CMPIResult* /*result*/,
                         const CMPIObjectPath* /*classPath*/, const char* /*query*/,
                         const char* /*language*/) {
    return answer([] { throw Refusal{CMPI_RC_ERR_NOT_SUPPORTED, "this provider knows no query language"}; });
}

} // namespace

CMInstanceMIStub(Host, OXAHost, broker, )
