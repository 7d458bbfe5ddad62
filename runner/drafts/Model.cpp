#include "drafts/Model.h"

#include "drafts/Names.h"
#include "show/Text.h"

#include <algorithm>
#include <iterator>
#include <set>
#include <stdexcept>

namespace oxahv::runner {

namespace {

// CMake refuses targets of these names.
constexpr const char* targetsOfCMake[] = {
    "ALL_BUILD", "INSTALL", "PACKAGE",        "RUN_TESTS",  "ZERO_CHECK",   "all",
    "clean",     "depend",  "edit_cache",     "help",       "install",      "list_install_components",
    "package",   "test",    "package_source", "preinstall", "rebuild_cache"};

// The members of a provider's class that a method must not hide, and those of the draft itself.
const std::set<std::string> membersOfProvider = {"associate", "associations",   "create", "end",
                                                 "enumerate", "enumerateNames", "get",    "instanceOf",
                                                 "invoke",    "method",         "modify", "notWritten",
                                                 "pathOf",    "query",          "remove", "serve"};

[[noreturn]] void refuse(const std::string& reason) {
    throw std::runtime_error(reason);
}

// The first text of a qualifier; empty when it has none.
std::string textOf(const Qualifiers& qualifiers, const char* name) {
    const QualifierDeclaration* const qualifier = qualifiers.find(name);
    if (qualifier == nullptr || qualifier->value.elements.empty()) {
        return {};
    }
    const auto* const text = std::get_if<std::string>(&qualifier->value.elements[0]);
    return text != nullptr ? *text : std::string();
}

// An embedded instance is declared as a text with a qualifier.
bool isEmbedded(const Qualifiers& qualifiers) {
    return qualifiers.find("EmbeddedInstance") != nullptr || qualifiers.isTrue("EmbeddedObject");
}

const char* plainTypeOf(CMPIType type) {
    switch (type) {
    case CMPI_boolean:
        return "bool";
    case CMPI_uint8:
        return "std::uint8_t";
    case CMPI_uint16:
        return "std::uint16_t";
    case CMPI_uint32:
        return "std::uint32_t";
    case CMPI_uint64:
        return "std::uint64_t";
    case CMPI_sint8:
        return "std::int8_t";
    case CMPI_sint16:
        return "std::int16_t";
    case CMPI_sint32:
        return "std::int32_t";
    case CMPI_sint64:
        return "std::int64_t";
    case CMPI_real32:
        return "float";
    case CMPI_real64:
        return "double";
    case CMPI_char16:
        return "char16_t";
    case CMPI_dateTime:
        return "classes::Time";
    case CMPI_ref:
        return "oxahv::Path";
    case CMPI_instance:
        return "oxahv::Instance";
    default:
        return "std::string";
    }
}

std::string typeOf(CMPIType type, const Qualifiers& qualifiers) {
    const bool isArray = (type & CMPI_ARRAY) != 0;
    const auto elementType = static_cast<CMPIType>(type & ~CMPI_ARRAY);
    const std::string plain = isEmbedded(qualifiers) ? plainTypeOf(CMPI_instance) : plainTypeOf(elementType);
    return isArray ? "std::vector<" + plain + '>' : plain;
}

// Arguments that a client may leave out are optional, and so is what a method returns by them.
DraftParameter parameterOf(const ParameterDeclaration& declaration, Scope& scope) {
    DraftParameter parameter = {declaration.name, scope.add(variableName(declaration.name)),
                                typeOf(declaration.type, declaration.qualifiers),
                                !declaration.isOut ? "in"
                                : declaration.isIn ? "in, out"
                                                   : "out",
                                textOf(declaration.qualifiers, "Description")};
    const bool isLarge = (declaration.type & CMPI_ARRAY) != 0 || declaration.type == CMPI_string ||
                         declaration.type == CMPI_ref || declaration.type == CMPI_instance;
    if (declaration.isOut || !declaration.qualifiers.isTrue("Required")) {
        parameter.type = "std::optional<" + parameter.type + '>';
    }
    if (declaration.isOut) {
        parameter.type += '&';
    } else if (isLarge) {
        parameter.type = "const " + parameter.type + '&';
    }
    return parameter;
}

DraftMethod methodOf(const MethodDeclaration& declaration, const std::string& function) {
    DraftMethod method = {declaration.name,
                          function,
                          typeOf(declaration.returnType, declaration.qualifiers),
                          {},
                          textOf(declaration.qualifiers, "Description")};
    Scope parameters({"operation"});
    for (const ParameterDeclaration& parameter : declaration.parameters) {
        method.parameters.push_back(parameterOf(parameter, parameters));
    }
    return method;
}

void addProperty(DraftClass& drafted, const PropertyDeclaration& declaration, Scope& scope) {
    const bool isArray = (declaration.type & CMPI_ARRAY) != 0;
    if (declaration.isKey && (isArray || isEmbedded(declaration.qualifiers))) {
        refuse("key " + declaration.name + " of class " + drafted.name + " is " +
               (isArray ? "an array" : "an embedded object") + ", which names no instance");
    }
    DraftProperty property = {declaration, scope.add(variableName(declaration.name)),
                              typeOf(declaration.type, declaration.qualifiers),
                              textOf(declaration.qualifiers, "Description")};
    if (!declaration.isKey) {
        drafted.properties.push_back(std::move(property));
        return;
    }
    const auto place =
        declaration.type == CMPI_ref
            ? std::find_if(drafted.keys.begin(), drafted.keys.end(),
                           [](const DraftProperty& key) { return key.declaration.type != CMPI_ref; })
            : drafted.keys.end();
    drafted.keys.insert(place, std::move(property));
}

// The name as it was declared, whose case may differ.
std::string declaredName(const EmbeddedBroker& broker, const std::string& name) {
    for (const std::string& declared : broker.declaredClasses()) {
        if (sameName(declared, name)) {
            return declared;
        }
    }
    refuse("class " + name + " is not declared in the MOF files");
}

DraftClass classOf(const EmbeddedBroker& broker, const std::string& name) {
    const Qualifiers qualifiers = broker.qualifiersOf(name);
    if (broker.isAbstract(name)) {
        refuse("class " + name + " is abstract, so it has no instances of its own");
    }
    if (qualifiers.isTrue("Indication")) {
        refuse("class " + name + " is an indication, which has no instances");
    }
    if (!std::all_of(name.begin(), name.end(), [](char c) { return static_cast<unsigned char>(c) < 0x80; })) {
        refuse("class " + name + " has a name that is no identifier in C++");
    }
    DraftClass drafted = {name, {}, textOf(qualifiers, "Description"), broker.isAssociation(name), {},
                          {},   {}};
    Scope variables;
    for (const PropertyDeclaration& property : broker.propertiesOf(name)) {
        addProperty(drafted, property, variables);
    }
    if (drafted.keys.empty()) {
        refuse("class " + name + " has no keys, so its instances have no names");
    }
    return drafted;
}

// The methods of a class, but for those that it inherits from another one of the provider's: the function
// that is registered for that class is called for this one, too.
std::vector<MethodDeclaration> ownMethods(const EmbeddedBroker& broker, const DraftClass& drafted,
                                          const std::vector<DraftClass>& classes) {
    std::vector<MethodDeclaration> methods = broker.methodsOf(drafted.name);
    for (const DraftClass& other : classes) {
        if (&other == &drafted || !broker.isA(drafted.name, other.name)) {
            continue;
        }
        for (const MethodDeclaration& inherited : broker.methodsOf(other.name)) {
            methods.erase(std::remove_if(methods.begin(), methods.end(),
                                         [&](const MethodDeclaration& method) {
                                             return sameName(method.name, inherited.name);
                                         }),
                          methods.end());
        }
    }
    return methods;
}

// A method is named as in CIM where no other class has one of that name.
void addMethods(const EmbeddedBroker& broker, std::vector<DraftClass>& classes) {
    std::multiset<std::string> names;
    std::set<std::string> taken = membersOfProvider;
    for (const DraftClass& drafted : classes) {
        taken.insert("list" + drafted.structName);
        for (const MethodDeclaration& method : ownMethods(broker, drafted, classes)) {
            names.insert(variableName(method.name));
        }
    }
    Scope functions(taken);
    for (DraftClass& drafted : classes) {
        drafted.hasMethods = !broker.methodsOf(drafted.name).empty();
        for (const MethodDeclaration& method : ownMethods(broker, drafted, classes)) {
            std::string name = variableName(method.name);
            if (names.count(name) > 1 || taken.count(name) > 0) {
                name = name.substr(0, name.find('_')) + "Of" + drafted.structName;
            }
            drafted.methods.push_back(methodOf(method, functions.add(name)));
        }
    }
}

void requireProviderName(const std::string& name) {
    if (!isIdentifier(name)) {
        refuse("a provider cannot be named '" + name + "', which is no identifier in C++");
    }
    if (std::find(std::begin(targetsOfCMake), std::end(targetsOfCMake), name) != std::end(targetsOfCMake)) {
        refuse("a provider cannot be named '" + name + "', which is a target of CMake's own");
    }
}

} // namespace

DraftProvider draftProvider(const EmbeddedBroker& broker, const std::vector<std::string>& classes,
                            const std::string& provider, const std::string& nameSpace) {
    DraftProvider draft = {provider, nameSpace, {}};
    Scope structs({"Time"});
    for (const std::string& name : classes) {
        DraftClass drafted = classOf(broker, declaredName(broker, name));
        for (const DraftClass& other : draft.classes) {
            if (other.name == drafted.name) {
                refuse("class " + drafted.name + " is named twice");
            }
        }
        drafted.structName = structs.add(structName(drafted.name));
        draft.classes.push_back(std::move(drafted));
    }
    addMethods(broker, draft.classes);
    if (provider.empty()) {
        draft.name = draft.classes[0].structName;
    }
    requireProviderName(draft.name);
    return draft;
}

} // namespace oxahv::runner
