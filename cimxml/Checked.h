// Calls of CMPI whose failure must not look like an empty answer.
#pragma once

#include "Failure.h"

#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <string>
#include <type_traits>

namespace cimxml {

// Throws CimError with the status's code and message, unless the code is CMPI_RC_OK.
void require(const CMPIStatus& status, const std::string& what);

// What a call returns that takes a status last. Throws CimError when it fails or returns a null handle.
template <class Function, class... Arguments>
auto checked(const std::string& what, const Function& function, Arguments... arguments) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const auto result = function(arguments..., &status);
    require(status, what);
    if constexpr (std::is_pointer_v<decltype(function(arguments..., &status))>) {
        if (result == nullptr) {
            throw CimError(CMPI_RC_ERR_FAILED, what + ": the broker returned nothing");
        }
    }
    return result;
}

// The text of a string. Throws CimError for a null one.
std::string textOf(const CMPIString* string);

std::string classNameOf(const CMPIObjectPath* path);
CMPIObjectPath* pathOf(const CMPIInstance* instance);

struct NamedData {
    std::string name;
    CMPIData data;
};
NamedData keyAt(const CMPIObjectPath* path, CMPICount index);
NamedData propertyAt(const CMPIInstance* instance, CMPICount index);
NamedData argumentAt(const CMPIArgs* arguments, CMPICount index);

} // namespace cimxml
