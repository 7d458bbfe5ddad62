// The parameters of one operation, by name and as what the operation takes them for.
#pragma once

#include "Environment.h"
#include "Message.h"

#include <initializer_list>
#include <optional>
#include <string>
#include <vector>

namespace cimxml {

// All members that read throw CimError (CMPI_RC_ERR_INVALID_PARAMETER) for a value of another kind.
class Parameters {
public:
    // Throws CimError for a parameter that is not among these names, and for one that appears twice.
    Parameters(Environment& environment, const Call& call, const std::vector<const char*>& names);

    Environment& environment() const { return environment_; }

    // The element of a parameter; null where it is missing or a NULL.
    const Element* find(const char* name) const;
    // A parameter that may not be missing.
    const Element& required(const char* name) const;

    bool boolean(const char* name, bool otherwise) const;
    // A VALUE; empty where it is missing.
    std::string text(const char* name) const;
    std::string requiredText(const char* name) const;
    // A VALUE.ARRAY of names; nothing where it is missing.
    std::optional<std::vector<std::string>> names(const char* name) const;
    // A CLASSNAME; empty where it is missing.
    std::string className(const char* name) const;
    std::string requiredClassName(const char* name) const;
    // The path of an INSTANCENAME, which may not be missing.
    CMPIObjectPath* instanceName(const char* name) const;

private:
    Environment& environment_;
    const Call& call_;
};

} // namespace cimxml
