#include "drafts/Sources.h"

#include "drafts/Code.h"
#include "drafts/Examples.h"
#include "drafts/Template.h"

#include <algorithm>

namespace oxahv::runner {

namespace {

// Pieces

constexpr std::size_t memberIndent = 4;
constexpr std::size_t statementIndent = 8;

constexpr const char* timeAlias =
    R"(// A point in time. What holds an interval is a std::chrono::microseconds instead.
using Time = std::chrono::system_clock::time_point;
)";

constexpr const char* notWritten = R"(// What a method answers until it is written.
oxahv::Refusal notWritten(const std::string& method) {
    return oxahv::Refusal(CMPI_RC_ERR_NOT_SUPPORTED, method + " is not written yet");
}
)";

bool isNumber(const std::string& type) {
    return type.compare(0, 8, "std::int") == 0 || type.compare(0, 9, "std::uint") == 0 || type == "float" ||
           type == "double";
}

// A key of a plain type has a value from the beginning. A struct with references cannot be made without them,
// and then the compiler wants to know what the other members begin with.
std::string memberOf(const DraftProperty& property, bool hasReferences) {
    const std::string description = comment(memberIndent, property.description);
    const bool isKey = property.declaration.isKey;
    std::string text = isKey ? property.type : "std::optional<" + property.type + '>';
    text += ' ' + property.variable;
    if (isKey && property.type == "bool") {
        text += " = false";
    } else if (isKey && (isNumber(property.type) || property.type == "char16_t")) {
        text += " = 0";
    } else if (hasReferences && (!isKey || property.declaration.type != CMPI_ref)) {
        text += "{}";
    }
    return description + std::string(memberIndent, ' ') + text + ";\n";
}

std::string structOf(const DraftClass& drafted) {
    std::string text = comment(0, drafted.description) + "struct " + drafted.structName + " {\n";
    const bool hasReferences = drafted.keys[0].declaration.type == CMPI_ref;
    for (const DraftProperty& key : drafted.keys) {
        text += memberOf(key, hasReferences);
    }
    text += drafted.properties.empty() ? "" : "\n";
    for (const DraftProperty& property : drafted.properties) {
        text += memberOf(property, hasReferences);
    }
    return text + "};\n";
}

// A call with the name and the variable of each property.
std::string settings(const char* call, const std::vector<DraftProperty>& properties) {
    std::string text;
    for (const DraftProperty& property : properties) {
        text +=
            enclosed(
                memberIndent,
                {call, {textLiteral(property.declaration.name), "object." + property.variable}, {}, ");"}) +
            '\n';
    }
    return text;
}

std::string function(const char* result, const char* name, const DraftClass& drafted) {
    return enclosed(0, {std::string("inline ") + result + ' ' + name + '(',
                        {"const oxahv::Operation& operation", "const " + drafted.structName + "& object"},
                        {},
                        ") {"}) +
           '\n';
}

std::string pathFunction(const DraftClass& drafted) {
    return function("oxahv::Path", "pathOf", drafted) + "    auto path = operation.path(" +
           textLiteral(drafted.name) + ");\n" + settings("path.addKey(", drafted.keys) +
           "    return path;\n}\n";
}

std::string instanceFunction(const DraftClass& drafted) {
    const std::string head = function("oxahv::Instance", "instanceOf", drafted);
    if (drafted.properties.empty()) {
        return head + "    return operation.instance(pathOf(operation, object));\n}\n";
    }
    return head + "    auto instance = operation.instance(pathOf(operation, object));\n" +
           settings("instance.set(", drafted.properties) + "    return instance;\n}\n";
}

// The provider

const char* classHead(const DraftProvider& provider) {
    const auto any = [&](auto isSo) {
        return std::any_of(provider.classes.begin(), provider.classes.end(), isSo);
    };
    const bool hasAssociations = any([](const DraftClass& c) { return c.isAssociation; });
    const bool hasMethods = any([](const DraftClass& c) { return !c.methods.empty(); });
    if (hasAssociations && hasMethods) {
        return R"(class Provider : public oxahv::InstanceProvider,
                 public oxahv::AssociationProvider,
                 public oxahv::MethodProvider {)";
    }
    if (hasAssociations) {
        return "class Provider : public oxahv::InstanceProvider, public oxahv::AssociationProvider {";
    }
    return hasMethods ? "class Provider : public oxahv::InstanceProvider, public oxahv::MethodProvider {"
                      : "class Provider : public oxahv::InstanceProvider {";
}

// Such as `serve("Demo_Port", &Provider::listDemoPort);`.
std::string registration(const char* call, const std::string& name, const std::string& function,
                         std::vector<Listed> list = {}) {
    return enclosed(statementIndent,
                    {call, {textLiteral(name), "&Provider::" + function}, std::move(list), ");"})
        .substr(statementIndent);
}

std::string methodRegistration(const DraftClass& drafted, const DraftMethod& method) {
    std::vector<Listed> names;
    for (const DraftParameter& parameter : method.parameters) {
        names.push_back({textLiteral(parameter.name), parameter.direction});
    }
    return registration("method(", drafted.name + '.' + method.name, method.function, names);
}

std::string constructor(const DraftProvider& provider) {
    std::vector<std::string> statements;
    for (const DraftClass& drafted : provider.classes) {
        statements.push_back(registration("serve(", drafted.name, "list" + drafted.structName));
    }
    for (const DraftClass& drafted : provider.classes) {
        if (drafted.isAssociation) {
            statements.push_back(registration("associate(", drafted.name, "list" + drafted.structName));
        }
    }
    for (const DraftClass& drafted : provider.classes) {
        for (const DraftMethod& method : drafted.methods) {
            statements.push_back(methodRegistration(drafted, method));
        }
    }
    std::string text = memberFunction(memberIndent, {"Provider(", {}, {}, ") {"}, statements);
    text.pop_back();
    return text;
}

std::string listFunction(const EmbeddedBroker& broker, const DraftProvider& provider,
                         const DraftClass& drafted) {
    std::vector<std::string> statements = exampleOf(broker, provider, drafted);
    const bool hasExample = !statements.empty();
    if (hasExample) {
        statements.insert(statements.begin(), "// TODO: This is an example. Add each that there is.");
    } else {
        statements = {"// TODO: Add each that there is, by reply.add(instanceOf(operation, …))."};
    }
    return memberFunction(memberIndent,
                          {"void list" + drafted.structName + '(',
                           {hasExample ? "const Operation& operation" : "const Operation& /*operation*/",
                            hasExample ? "Instances& reply" : "Instances& /*reply*/"},
                           {},
                           ") {"},
                          statements);
}

std::string methodFunction(const DraftClass& drafted, const DraftMethod& method) {
    std::string text = comment(memberIndent, method.description);
    std::vector<std::string> parameters = {"const Operation& /*operation*/"};
    for (const DraftParameter& parameter : method.parameters) {
        parameters.push_back(parameter.type + " /*" + parameter.variable + "*/");
        const std::string description =
            comment(memberIndent, parameter.variable + ": " + parameter.description);
        text += parameter.description.empty() ? "" : description;
    }
    const std::string name = textLiteral(drafted.name + '.' + method.name);
    return text +
           memberFunction(
               memberIndent, {method.returnType + ' ' + method.function + '(', parameters, {}, ") {"},
               {enclosed(statementIndent, {"throw notWritten(", {name}, {}, ");"}).substr(statementIndent)});
}

} // namespace

std::string classesHeader(const DraftProvider& provider) {
    std::string classes;
    for (const DraftClass& drafted : provider.classes) {
        classes += structOf(drafted) + '\n' + pathFunction(drafted) + '\n' + instanceFunction(drafted) + '\n';
    }
    classes.pop_back();
    const bool hasTimes = classes.find("classes::Time") != std::string::npos;
    return filled(templateText("Classes.h"),
                  {{"PROVIDER", provider.name}, {"TIME", hasTimes ? timeAlias : ""}, {"CLASSES", classes}});
}

std::string providerSource(const EmbeddedBroker& broker, const DraftProvider& provider) {
    std::string functions;
    bool hasMethods = false;
    for (const DraftClass& drafted : provider.classes) {
        functions += listFunction(broker, provider, drafted) + '\n';
    }
    for (const DraftClass& drafted : provider.classes) {
        for (const DraftMethod& method : drafted.methods) {
            functions += methodFunction(drafted, method) + '\n';
            hasMethods = true;
        }
    }
    functions.resize(functions.size() - 2);
    return filled(templateText("Provider.cpp"), {{"PROVIDER", provider.name},
                                                 {"NOT_WRITTEN", hasMethods ? notWritten : ""},
                                                 {"CLASS_HEAD", classHead(provider)},
                                                 {"CONSTRUCTOR", constructor(provider)},
                                                 {"FUNCTIONS", functions}});
}

} // namespace oxahv::runner
