#include "Arguments.h"

#include "show/Text.h"
#include "show/Values.h"

#include <algorithm>
#include <iterator>
#include <optional>

namespace oxahv::runner {

namespace {

// What is given values by name, for messages.
constexpr const char* argumentWord = "argument";
constexpr const char* propertyWord = "property";

struct Argument {
    const char* word;
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
        return {argumentWord, name, CMPI_null, {}};
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
    return {argumentWord, parameter->name, valueType(parameter->type, parameter->qualifiers), {}};
}

// The same of a property.
Argument propertyOf(const EmbeddedBroker& broker, const std::string& className, const std::string& name) {
    if (!broker.isDeclared(className)) {
        return {propertyWord, name, CMPI_null, {}};
    }
    const std::vector<PropertyDeclaration> declared = broker.propertiesOf(className);
    const auto found =
        std::find_if(declared.begin(), declared.end(),
                     [&](const PropertyDeclaration& property) { return sameName(property.name, name); });
    if (found == declared.end()) {
        throw BrokerError("class " + className + " has no property " + name + "; it has " +
                          namesOf(declared));
    }
    return {propertyWord, found->name, valueType(found->type, found->qualifiers), {}};
}

// Where the name of name=value ends.
std::size_t equalsIn(const char* word, const std::string& text) {
    const std::size_t equals = text.find('=');
    if (equals == std::string::npos || equals == 0) {
        throw BrokerError(std::string(word) + " '" + text + "' is not name=value");
    }
    return equals;
}

// `declared` finds the argument of a name.
template <class Declared>
std::vector<Argument> parsed(const char* word, const std::vector<std::string>& texts,
                             const Declared& declared) {
    std::vector<Argument> arguments;
    for (const std::string& text : texts) {
        const std::size_t equals = equalsIn(word, text);
        Argument argument = declared(text.substr(0, equals));
        auto known = std::find_if(arguments.begin(), arguments.end(),
                                  [&](const Argument& other) { return sameName(other.name, argument.name); });
        if (known == arguments.end()) {
            known = arguments.insert(arguments.end(), std::move(argument));
        } else if ((known->type & CMPI_ARRAY) == 0) {
            throw BrokerError(known->word + (' ' + known->name) +
                              " stands twice; only an array takes several values");
        }
        known->texts.push_back(text.substr(equals + 1));
    }
    return arguments;
}

// A text that is the word needs quotes.
bool isNullWord(const std::string& text) {
    return text == "NULL";
}

CMPIData nullOf(CMPIType type) {
    return {type, CMPI_nullValue, {}};
}

// What the broker's setters take.
const CMPIValue* valueIn(const CMPIData& data) {
    return CMIsNullValue(data) ? nullptr : &data.value;
}

CMPIData valueOf(Request& request, const Argument& argument, const std::string& text) {
    if (isNullWord(text)) {
        return nullOf(argument.type & static_cast<CMPIType>(~CMPI_ARRAY));
    }
    try {
        return request.valueFromText(text, argument.type & static_cast<CMPIType>(~CMPI_ARRAY));
    } catch (const BrokerError& error) {
        throw BrokerError(argument.word + (' ' + argument.name) + ": " + error.what());
    }
}

void require(const CMPIStatus& status) {
    if (status.rc != CMPI_RC_OK) {
        throw BrokerError("the broker took no values: " + codeName(status.rc));
    }
}

CMPIData arrayOf(const EmbeddedBroker& broker, Request& request, const Argument& argument) {
    const bool isOne = argument.texts.size() == 1;
    if (isOne && isNullWord(argument.texts.front())) {
        return nullOf(argument.type);
    }
    const CMPICount size =
        isOne && argument.texts.front() == "{}" ? 0 : static_cast<CMPICount>(argument.texts.size());
    const auto type = static_cast<CMPIType>(argument.type & ~CMPI_ARRAY);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIData data = {argument.type, CMPI_goodValue, {}};
    data.value.array = CMNewArray(broker.handle(), size, type, &status);
    require(status);
    for (CMPICount i = 0; i < size; ++i) {
        const CMPIData element = valueOf(request, argument, argument.texts[i]);
        require(CMSetArrayElementAt(data.value.array, i, valueIn(element), type));
    }
    return data;
}

CMPIData dataOf(const EmbeddedBroker& broker, Request& request, const Argument& argument) {
    return (argument.type & CMPI_ARRAY) != 0 ? arrayOf(broker, request, argument)
                                             : valueOf(request, argument, argument.texts.front());
}

} // namespace

CMPIArgs* argumentsFrom(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* path,
                        const std::string& method, const std::vector<std::string>& texts) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIArgs* const arguments = CMNewArgs(broker.handle(), &status);
    require(status);
    const auto declaration = declarationOf(broker, textOf(CMGetClassName(path, nullptr)), method);
    const auto declared = [&](const std::string& name) { return argumentOf(declaration, name); };
    for (const Argument& argument : parsed(argumentWord, texts, declared)) {
        const CMPIData data = dataOf(broker, request, argument);
        require(CMAddArg(arguments, argument.name.c_str(), valueIn(data), data.type));
    }
    return arguments;
}

CMPIInstance* instanceFrom(EmbeddedBroker& broker, Request& request, const CMPIObjectPath* path,
                           const std::vector<std::string>& texts) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIInstance* const instance = CMNewInstance(broker.handle(), path, &status);
    require(status);
    for (const NamedValue& key : keysOf(path)) {
        require(CMSetProperty(instance, key.name.c_str(), &key.data.value, key.data.type));
    }
    const std::string className = textOf(CMGetClassName(path, nullptr));
    const auto declared = [&](const std::string& name) { return propertyOf(broker, className, name); };
    for (const Argument& property : parsed(propertyWord, texts, declared)) {
        const CMPIData data = dataOf(broker, request, property);
        require(CMSetProperty(instance, property.name.c_str(), valueIn(data), data.type));
    }
    return instance;
}

std::vector<std::string> namesOfValues(const std::vector<std::string>& texts) {
    std::vector<std::string> names;
    for (const std::string& text : texts) {
        std::string name = text.substr(0, equalsIn(propertyWord, text));
        const bool isNew = std::none_of(names.begin(), names.end(),
                                        [&](const std::string& other) { return sameName(other, name); });
        if (isNew) {
            names.push_back(std::move(name));
        }
    }
    return names;
}

} // namespace oxahv::runner
