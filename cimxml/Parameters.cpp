#include "Parameters.h"

#include "Failure.h"
#include "Objects.h"

#include <Names.h>

#include <algorithm>

namespace cimxml {

namespace {

using encoding::sameName;

[[noreturn]] void refuse(const std::string& name, const char* what) {
    throw CimError(CMPI_RC_ERR_INVALID_PARAMETER, "parameter " + name + ' ' + what);
}

} // namespace

Parameters::Parameters(Environment& environment, const Call& call, const std::vector<const char*>& names)
    : environment_(environment), call_(call) {
    std::vector<std::string> seen;
    for (const Element* const parameter : call.parameters) {
        const std::string name = parameter->attribute("NAME");
        const auto isThis = [&](const std::string& other) { return sameName(name, other); };
        if (std::none_of(names.begin(), names.end(), isThis)) {
            refuse(name, "is not known");
        }
        if (std::any_of(seen.begin(), seen.end(), isThis)) {
            refuse(name, "appears twice");
        }
        seen.push_back(name);
    }
}

const Element* Parameters::find(const char* name) const {
    for (const Element* const parameter : call_.parameters) {
        if (sameName(parameter->attribute("NAME"), name)) {
            return parameter->children.empty() ? nullptr : parameter;
        }
    }
    return nullptr;
}

const Element& Parameters::required(const char* name) const {
    const Element* const parameter = find(name);
    if (parameter == nullptr) {
        refuse(name, "is missing");
    }
    return *parameter;
}

bool Parameters::boolean(const char* name, bool otherwise) const {
    const std::string value = text(name);
    if (!value.empty() && !sameName(value, "true") && !sameName(value, "false")) {
        refuse(name, "is neither TRUE nor FALSE");
    }
    return value.empty() ? otherwise : sameName(value, "true");
}

std::string Parameters::text(const char* name) const {
    const Element* const parameter = find(name);
    if (parameter == nullptr) {
        return "";
    }
    const Element* const value = parameter->child("VALUE");
    if (value == nullptr) {
        refuse(name, "is no VALUE");
    }
    return value->text;
}

std::string Parameters::requiredText(const char* name) const {
    required(name);
    return text(name);
}

std::optional<std::vector<std::string>> Parameters::names(const char* name) const {
    const Element* const parameter = find(name);
    if (parameter == nullptr) {
        return std::nullopt;
    }
    const Element* const array = parameter->child("VALUE.ARRAY");
    if (array == nullptr) {
        refuse(name, "is no VALUE.ARRAY");
    }
    std::vector<std::string> result;
    for (const Element& value : array->children) {
        result.push_back(value.text);
    }
    return result;
}

std::string Parameters::className(const char* name) const {
    const Element* const parameter = find(name);
    if (parameter == nullptr) {
        return "";
    }
    const Element* const named = parameter->child("CLASSNAME");
    if (named == nullptr || named->attribute("NAME").empty()) {
        refuse(name, "is no CLASSNAME");
    }
    return named->attribute("NAME");
}

std::string Parameters::requiredClassName(const char* name) const {
    required(name);
    return className(name);
}

CMPIObjectPath* Parameters::instanceName(const char* name) const {
    const Element* const instance = required(name).child("INSTANCENAME");
    if (instance == nullptr) {
        refuse(name, "is no INSTANCENAME");
    }
    return readInstanceName(environment_, *instance, environment_.nameSpace);
}

} // namespace cimxml
