// The function table for associations: from one side of OXATK_RunningOS to the other.

#include "RunningOS.h"

#include <Trace.h>

#include <algorithm>
#include <optional>

using TK::ProviderUtilities;

namespace {

// The filters of a request; null or empty is none.
struct Filter {
    const char* associationClass;
    const char* resultClass;
    const char* role;
    const char* resultRole;
};

bool isGiven(const char* filter) {
    return filter != nullptr && *filter != '\0';
}

bool passesClass(const char* filter, const char* className, const std::string& nameSpace) {
    return !isGiven(filter) || ProviderUtilities::areClassesRelated(broker, nameSpace, filter, className);
}

bool passesRole(const char* filter, const char* role) {
    return !isGiven(filter) || ProviderUtilities::textEqual(filter, role);
}

// The side opposite the one that a path names, if the filters let it through. Throws a Refusal when the path
// is of a class of either side but names no instance of it.
std::optional<End> opposite(const CMPIObjectPath* path, const Filter& filter) {
    const std::vector<End> ends = runningOsEnds();
    const HostClass* const named = findHostClass(ProviderUtilities::getClassId(path));
    const auto source =
        std::find_if(ends.begin(), ends.end(), [&](const End& end) { return end.hostClass == named; });
    if (source == ends.end()) {
        return std::nullopt;
    }
    keysOf(*named, path);
    const End& target = source == ends.begin() ? ends.back() : ends.front();
    const std::string nameSpace = ProviderUtilities::getNamespace(path);
    const bool passes = passesRole(filter.role, source->role) && passesRole(filter.resultRole, target.role) &&
                        passesClass(filter.associationClass, runningOs, nameSpace) &&
                        passesClass(filter.resultClass, target.hostClass->name, nameSpace);
    return passes ? std::optional<End>(target) : std::nullopt;
}

// The operations

void associators(const CMPIResult* result, const CMPIObjectPath* path, const Filter& filter,
                 const char** properties) {
    TK_TRACE_ENTERING_PARAMETERS(category, " path=" << path);
    if (const auto end = opposite(path, filter)) {
        give(result,
             instanceOf(*end->hostClass, end->keys, ProviderUtilities::getNamespace(path), properties));
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

void associatorNames(const CMPIResult* result, const CMPIObjectPath* path, const Filter& filter) {
    TK_TRACE_ENTERING_PARAMETERS(category, " path=" << path);
    if (const auto end = opposite(path, filter)) {
        give(result, pathOf(*end->hostClass, end->keys, ProviderUtilities::getNamespace(path)));
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

void references(const CMPIResult* result, const CMPIObjectPath* path, const Filter& filter,
                const char** properties) {
    TK_TRACE_ENTERING_PARAMETERS(category, " path=" << path);
    if (opposite(path, filter)) {
        give(result, runningOsInstance(ProviderUtilities::getNamespace(path), properties));
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

void referenceNames(const CMPIResult* result, const CMPIObjectPath* path, const Filter& filter) {
    TK_TRACE_ENTERING_PARAMETERS(category, " path=" << path);
    if (opposite(path, filter)) {
        give(result, runningOsPath(ProviderUtilities::getNamespace(path)));
    }
    require(CMReturnDone(result));
    TK_TRACE_EXITING(category);
}

// The functions of the table. Of a request for references, the result class is the association's.

CMPIStatus HostAssociationCleanup(CMPIAssociationMI* /*mi*/, const CMPIContext* /*context*/,
                                  CMPIBoolean /*terminating*/) {
    return answer([] {});
}

CMPIStatus HostAssociators(CMPIAssociationMI* /*mi*/, const CMPIContext* /*context*/,
                           const CMPIResult* result, const CMPIObjectPath* path, const char* associationClass,
                           const char* resultClass, const char* role, const char* resultRole,
                           const char** properties) {
    return answer([&] {
        associators(result, path, {associationClass, resultClass, role, resultRole}, properties);
    });
}

CMPIStatus HostAssociatorNames(CMPIAssociationMI* /*mi*/, const CMPIContext* /*context*/,
                               const CMPIResult* result, const CMPIObjectPath* path,
                               const char* associationClass, const char* resultClass, const char* role,
                               const char* resultRole) {
    return answer([&] { associatorNames(result, path, {associationClass, resultClass, role, resultRole}); });
}

CMPIStatus HostReferences(CMPIAssociationMI* /*mi*/, const CMPIContext* /*context*/, const CMPIResult* result,
                          const CMPIObjectPath* path, const char* resultClass, const char* role,
                          const char** properties) {
    return answer([&] { references(result, path, {resultClass, nullptr, role, nullptr}, properties); });
}

CMPIStatus HostReferenceNames(CMPIAssociationMI* /*mi*/, const CMPIContext* /*context*/,
                              const CMPIResult* result, const CMPIObjectPath* path, const char* resultClass,
                              const char* role) {
    return answer([&] { referenceNames(result, path, {resultClass, nullptr, role, nullptr}); });
}

} // namespace

CMAssociationMIStub(Host, OXAHost, broker, )
