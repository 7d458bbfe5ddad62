#include "Arguments.h"

#include "show/Text.h"
#include "show/Values.h"

#include <algorithm>
#include <iterator>
#include <optional>

namespace oxahv::runner {

namespace {

struct Argument {
    std::string name;
    CMPIType type; // with CMPI_ARRAY for arrays; CMPI_null: what the text looks like
    std::vector<std::string> texts;
};

// What there is, for a message about what there is not.
template <class Declaration>
std::string namesOf(const std::vector<Declaration>& declarations) {
    std::string names;
    for (const Declaration& declared : declarations) {
        names += (names.empty() ? "" : ", ") + declared.name;
    }
    return names.empty() ? "none" : names;
}

// Nothing for a class that is not declared.
std::optional<MethodDeclaration> declarationOf(const EmbeddedBroker& broker, const std::string& className,
                                               const std::string& method) {
    if (!broker.isDeclared(className)) {
        return std::nullopt;
    }
    std::optional<MethodDeclaration> declared = findMethod(broker, className, method);
    if (declared) {
        return declared;
    }
    throw BrokerError("class " + className + " has no method " + method + "; it has " +
                      namesOf(broker.methodsOf(className)));
}

// The name as it is declared, and the type.
Argument argumentOf(const std::optional<MethodDeclaration>& method, const std::string& name) {
    if (!method) {
        return {name, CMPI_null, {}};
    }
    const ParameterDeclaration* const parameter = method->find(name);
    if (parameter == nullptr) {
        std::vector<ParameterDeclaration> inputs;
        std::copy_if(method->parameters.begin(), method->parameters.end(), std::back_inserter(inputs),
                     [](const ParameterDeclaration& declared) { return declared.isIn; });
        throw BrokerError("method " + method->name + " has no parameter " + name + "; it has " +
                          namesOf(inputs));
    }
    if (!parameter->isIn) {
        throw BrokerError("parameter " + parameter->name + " of method " + method->name +
                          " is an output; leave it out");
    }
    return {parameter->name, parameter->type, {}};
}

std::vector<Argument> parsed(const std::optional<MethodDeclaration>& method,
                             const std::vector<std::string>& texts) {
    std::vector<Argument> arguments;
    for (const std::string& text : texts) {
        const std::size_t equals = text.find('=');
        if (equals == std::string::npos || equals == 0) {
            throw BrokerError("argument '" + text + "' is not name=value");
        }
        Argument argument = argumentOf(method, text.substr(0, equals));
        auto known = std::find_if(arguments.begin(), arguments.end(),
                                  [&](const Argument& other) { return sameName(other.name, argument.name); });
        if (known == arguments.end()) {
            known = arguments.insert(arguments.end(), std::move(argument));
        } else if ((known->type & CMPI_ARRAY) == 0) {
            throw BrokerError("argument " + known->name +
                              " stands twice; only an array takes several values");
        }
        known->texts.push_back(text.substr(equals + 1));
    }
    return arguments;
}

CMPIData valueOf(Request& request, const Argument& argument, const std::string& text) {
    try {
        return request.valueFromText(text, argument.type & static_cast<CMPIType>(~CMPI_ARRAY));
    } catch (const BrokerError& error) {
        throw BrokerError("argument " + argument.name + ": " + error.what());
    }
}

void require(const CMPIStatus& status) {
    if (status.rc != CMPI_RC_OK) {
        throw BrokerError("the broker took no arguments: " + codeName(status.rc));
    }
}

CMPIData arrayOf(const EmbeddedBroker& broker, Request& request, const Argument& argument) {
    const auto type = static_cast<CMPIType>(argument.type & ~CMPI_ARRAY);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIData data = {argument.type, CMPI_goodValue, {}};
    data.value.array =
        CMNewArray(broker.handle(), static_cast<CMPICount>(argument.texts.size()), type, &status);
    require(status);
    for (CMPICount i = 0; i < argument.texts.size(); ++i) {
        const CMPIData element = valueOf(request, argument, argument.texts[i]);
        require(CMSetArrayElementAt(data.value.array, i, &element.value, type));
    }
    return data;
}

} // namespace

CMPIArgs* argumentsFrom(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* path,
                        const std::string& method, const std::vector<std::string>& texts) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIArgs* const arguments = CMNewArgs(broker.handle(), &status);
    require(status);
    for (const Argument& argument :
         parsed(declarationOf(broker, textOf(CMGetClassName(path, nullptr)), method), texts)) {
        const CMPIData data = (argument.type & CMPI_ARRAY) != 0
                                  ? arrayOf(broker, request, argument)
                                  : valueOf(request, argument, argument.texts.front());
        require(CMAddArg(arguments, argument.name.c_str(), &data.value, data.type));
    }
    return arguments;
}

} // namespace oxahv::runner
