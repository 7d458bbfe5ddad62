#include "RunningOS.h"

#include "Keys.h"

using TK::ProviderUtilities;

namespace {

End endOf(const char* role, const char* className) {
    const HostClass* const hostClass = findHostClass(ProviderUtilities::getClassId(className));
    return {role, hostClass, hostClass->names(machine()).front()};
}

// The path that a key refers to. The getter takes any value for a path, so the type is asked for before.
CMPIObjectPath* reference(const CMPIObjectPath* path, const char* role) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIData key = CMGetKey(path, role, &status);
    CMPIObjectPath* end = nullptr;
    if (status.rc != CMPI_RC_OK || key.type != CMPI_ref ||
        !ProviderUtilities::getKeyProperty(path, role, &end) || end == nullptr) {
        throw Refusal{CMPI_RC_ERR_INVALID_PARAMETER, std::string("key ") + role + " is no reference"};
    }
    return end;
}

} // namespace

bool isRunningOs(const CMPIObjectPath* path) {
    return ProviderUtilities::getClassId(path) == ProviderUtilities::getClassId(runningOs);
}

std::vector<End> runningOsEnds() {
    return {endOf("Antecedent", operatingSystem), endOf("Dependent", computerSystem)};
}

CMPIObjectPath* runningOsPath(const std::string& nameSpace) {
    CMPIObjectPath* const path = newPath(runningOs, nameSpace);
    for (const End& end : runningOsEnds()) {
        ProviderUtilities::setKeyProperty(path, end.role, pathOf(*end.hostClass, end.keys, nameSpace));
    }
    return path;
}

CMPIInstance* runningOsInstance(const std::string& nameSpace, const char** properties) {
    CMPIInstance* const instance = newInstance(runningOsPath(nameSpace), properties);
    for (const End& end : runningOsEnds()) {
        ProviderUtilities::setProperty(instance, end.role, pathOf(*end.hostClass, end.keys, nameSpace));
    }
    return instance;
}

void requireRunningOs(const CMPIObjectPath* path) {
    for (const End& end : runningOsEnds()) {
        const CMPIObjectPath* const named = reference(path, end.role);
        if (&classOf(named) != end.hostClass || !isNamedBy(named, end.keys)) {
            throw Refusal{CMPI_RC_ERR_NOT_FOUND, "no instance of that name"};
        }
    }
}
