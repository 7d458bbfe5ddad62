// The names of CMPI's return codes.

#include "Text.h"
#include "objects/Object.h"

#include <string_view>

namespace oxahv {

namespace {

struct CodeEntry {
    CMPIrc code;
    std::string_view name;
};

constexpr std::string_view prefix = "CMPI_RC_";

constexpr CodeEntry codes[] = {
    {CMPI_RC_OK, "OK"},
    {CMPI_RC_ERR_FAILED, "ERR_FAILED"},
    {CMPI_RC_ERR_ACCESS_DENIED, "ERR_ACCESS_DENIED"},
    {CMPI_RC_ERR_INVALID_NAMESPACE, "ERR_INVALID_NAMESPACE"},
    {CMPI_RC_ERR_INVALID_PARAMETER, "ERR_INVALID_PARAMETER"},
    {CMPI_RC_ERR_INVALID_CLASS, "ERR_INVALID_CLASS"},
    {CMPI_RC_ERR_NOT_FOUND, "ERR_NOT_FOUND"},
    {CMPI_RC_ERR_NOT_SUPPORTED, "ERR_NOT_SUPPORTED"},
    {CMPI_RC_ERR_CLASS_HAS_CHILDREN, "ERR_CLASS_HAS_CHILDREN"},
    {CMPI_RC_ERR_CLASS_HAS_INSTANCES, "ERR_CLASS_HAS_INSTANCES"},
    {CMPI_RC_ERR_INVALID_SUPERCLASS, "ERR_INVALID_SUPERCLASS"},
    {CMPI_RC_ERR_ALREADY_EXISTS, "ERR_ALREADY_EXISTS"},
    {CMPI_RC_ERR_NO_SUCH_PROPERTY, "ERR_NO_SUCH_PROPERTY"},
    {CMPI_RC_ERR_TYPE_MISMATCH, "ERR_TYPE_MISMATCH"},
    {CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, "ERR_QUERY_LANGUAGE_NOT_SUPPORTED"},
    {CMPI_RC_ERR_INVALID_QUERY, "ERR_INVALID_QUERY"},
    {CMPI_RC_ERR_METHOD_NOT_AVAILABLE, "ERR_METHOD_NOT_AVAILABLE"},
    {CMPI_RC_ERR_METHOD_NOT_FOUND, "ERR_METHOD_NOT_FOUND"},
    {static_cast<CMPIrc>(29), "ERR_QUERY_FEATURE_NOT_SUPPORTED"}, // not named by every version's headers
    {CMPI_RC_DO_NOT_UNLOAD, "DO_NOT_UNLOAD"},
    {CMPI_RC_NEVER_UNLOAD, "NEVER_UNLOAD"},
    {CMPI_RC_ERR_INVALID_HANDLE, "ERR_INVALID_HANDLE"},
    {CMPI_RC_ERR_INVALID_DATA_TYPE, "ERR_INVALID_DATA_TYPE"},
    {CMPI_RC_ERROR_SYSTEM, "ERROR_SYSTEM"},
    {CMPI_RC_ERROR, "ERROR"},
};

} // namespace

std::string codeName(CMPIrc code) {
    for (const CodeEntry& entry : codes) {
        if (entry.code == code) {
            return std::string(prefix) + std::string(entry.name);
        }
    }
    return std::string(prefix) + std::to_string(static_cast<int>(code));
}

CMPIrc codeFromName(const std::string& name) {
    const std::string_view wanted =
        sameName(name.substr(0, prefix.size()), prefix) ? std::string_view(name).substr(prefix.size()) : name;
    for (const CodeEntry& entry : codes) {
        if (sameName(entry.name, wanted)) {
            return entry.code;
        }
    }
    const bool isNumber = !wanted.empty() && wanted.size() < 4 &&
                          wanted.find_first_not_of("0123456789") == std::string_view::npos;
    const int number = isNumber ? std::stoi(std::string(wanted)) : -1;
    if (number < 0 || number > CMPI_RC_ERROR) {
        throw BrokerError("there is no CMPI return code " + name);
    }
    return static_cast<CMPIrc>(number);
}

} // namespace oxahv
