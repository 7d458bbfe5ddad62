// Declares classes: checks each against its superclass, and gives it what it inherits.

#include "classes/DeclaredClass.h"

#include "classes/NamedDeclaration.h"

namespace oxahv {

const PropertyDeclaration* DeclaredClass::find(std::string_view property) const {
    const std::size_t index = propertyNames.find(property);
    return index != Names::none ? &properties[index] : nullptr;
}

const MethodDeclaration* DeclaredClass::findMethod(std::string_view method) const {
    const auto found = std::find_if(methods.begin(), methods.end(),
                                    [&](const auto& m) { return sameName(m->name, method); });
    return found != methods.end() ? found->get() : nullptr;
}

bool DeclaredClass::isA(std::string_view ancestor) const {
    const DeclaredClass* declared = this;
    while (declared != nullptr && !sameName(declared->name, ancestor)) {
        declared = declared->superclass.get();
    }
    return declared != nullptr;
}

namespace {

using Part = DeclarationError::Part;

// What is declared of a name in the superclass and now again.
void requireSameType(const std::string& what, CMPIType inherited, CMPIType type, Part part,
                     std::size_t index) {
    if (inherited != type) {
        throw DeclarationError(what + " is declared as " + declaredTypeName(inherited) + " already", part,
                               index);
    }
}

// Whether the declaration at the index is the first of its name.
template <class Declaration>
bool isFirstOfName(const std::vector<Declaration>& declarations, std::size_t index) {
    return named(declarations, declarations[index].name) == &declarations[index];
}

// Adds a class's own property to the inherited ones; a redeclaration may make it a key. `own` has the names
// of the declaration's properties so far.
void addProperty(DeclaredClass& declared, const ClassDeclaration& declaration, std::size_t index,
                 Names& own) {
    PropertyDeclaration property = declaration.properties()[index];
    const std::string what = "class " + declared.name + ": property " + property.name;
    if (own.find(property.name) != Names::none) {
        throw DeclarationError(what + " stands twice", Part::property, index);
    }
    own.add(property.name);
    property.isKey = property.isKey || property.qualifiers.isTrue("Key");
    const std::size_t inheritedIndex = declared.propertyNames.find(property.name);
    if (inheritedIndex == Names::none) {
        declared.propertyNames.add(property.name);
        declared.properties.push_back(std::move(property));
        return;
    }
    PropertyDeclaration& inherited = declared.properties[inheritedIndex];
    requireSameType(what, inherited.type, property.type, Part::property, index);
    property.isKey = property.isKey || inherited.isKey;
    if (property.defaultValue.type == CMPI_null) {
        property.defaultValue = inherited.defaultValue;
    }
    property.qualifiers = property.qualifiers.over(inherited.qualifiers);
    inherited = std::move(property);
}

// The qualifiers of a method and its parameters over those of the method that it overrides.
void inheritQualifiers(MethodDeclaration& method, const MethodDeclaration& inherited) {
    method.qualifiers = method.qualifiers.over(inherited.qualifiers);
    for (ParameterDeclaration& parameter : method.parameters) {
        if (const ParameterDeclaration* const overridden = inherited.find(parameter.name)) {
            parameter.qualifiers = parameter.qualifiers.over(overridden->qualifiers);
        }
    }
}

void setDirections(MethodDeclaration& method) {
    for (ParameterDeclaration& parameter : method.parameters) {
        if (parameter.qualifiers.find("In") != nullptr) {
            parameter.isIn = parameter.qualifiers.isTrue("In");
        }
        if (parameter.qualifiers.find("Out") != nullptr) {
            parameter.isOut = parameter.qualifiers.isTrue("Out");
        }
    }
}

void addMethod(DeclaredClass& declared, const ClassDeclaration& declaration, std::size_t index) {
    MethodDeclaration method = declaration.methods()[index];
    const std::string what = "class " + declared.name + ": method " + method.name;
    if (!isFirstOfName(declaration.methods(), index)) {
        throw DeclarationError(what + " stands twice", Part::method, index);
    }
    for (std::size_t i = 0; i < method.parameters.size(); ++i) {
        if (!isFirstOfName(method.parameters, i)) {
            throw DeclarationError(what + ": parameter " + method.parameters[i].name + " stands twice",
                                   Part::parameter, index, i);
        }
    }
    const auto inherited = std::find_if(declared.methods.begin(), declared.methods.end(),
                                        [&](const auto& m) { return sameName(m->name, method.name); });
    if (inherited == declared.methods.end()) {
        setDirections(method);
        declared.methods.push_back(std::make_shared<const MethodDeclaration>(std::move(method)));
        return;
    }
    requireSameType(what, (*inherited)->returnType, method.returnType, Part::method, index);
    inheritQualifiers(method, **inherited);
    setDirections(method);
    *inherited = std::make_shared<const MethodDeclaration>(std::move(method));
}

bool allReachSubclass(const Qualifiers& qualifiers) {
    const std::vector<QualifierDeclaration>& list = qualifiers.list();
    return std::all_of(list.begin(), list.end(),
                       [](const QualifierDeclaration& q) { return q.reachesSubclass; });
}

// An inherited method, shared where no qualifier stays behind.
std::shared_ptr<const MethodDeclaration> inheritedMethod(
    const std::shared_ptr<const MethodDeclaration>& method) {
    if (allReachSubclass(method->qualifiers) &&
        std::all_of(method->parameters.begin(), method->parameters.end(),
                    [](const ParameterDeclaration& p) { return allReachSubclass(p.qualifiers); })) {
        return method;
    }
    MethodDeclaration copy = *method;
    copy.qualifiers = Qualifiers().over(copy.qualifiers);
    for (ParameterDeclaration& parameter : copy.parameters) {
        parameter.qualifiers = Qualifiers().over(parameter.qualifiers);
    }
    return std::make_shared<const MethodDeclaration>(std::move(copy));
}

// Superclasses hold each other, so that the end of the last class is the end of all, one within the other. No
// schema comes near.
constexpr std::size_t mostSuperclasses = 1000;

void inherit(DeclaredClass& declared) {
    const DeclaredClass& superclass = *declared.superclass;
    declared.depth = superclass.depth + 1;
    if (declared.depth > mostSuperclasses) {
        throw DeclarationError("class " + declared.name + " has more than " +
                                   std::to_string(mostSuperclasses) + " superclasses",
                               Part::superclass);
    }
    declared.qualifiers = declared.qualifiers.over(superclass.qualifiers);
    declared.properties = superclass.properties;
    for (PropertyDeclaration& property : declared.properties) {
        property.qualifiers = Qualifiers().over(property.qualifiers);
        declared.propertyNames.add(property.name);
    }
    for (const auto& method : superclass.methods) {
        declared.methods.push_back(inheritedMethod(method));
    }
}

} // namespace

std::string declaredTypeName(CMPIType type) {
    return typeName(type) + ((type & CMPI_ARRAY) != 0 ? "[]" : "");
}

void Declarations::declare(const ClassDeclaration& declaration) {
    if (declaration.name().empty()) {
        throw DeclarationError("a class needs a name", Part::name);
    }
    if (classes_.count(declaration.name()) != 0) {
        throw DeclarationError("class " + declaration.name() + " is declared already", Part::name);
    }
    auto declared = std::make_shared<DeclaredClass>();
    declared->name = declaration.name();
    declared->qualifiers = declaration.qualifiers();
    if (!declaration.superclass().empty()) {
        declared->superclass = find(declaration.superclass());
        if (declared->superclass == nullptr) {
            throw DeclarationError("class " + declaration.name() + ": superclass " +
                                       declaration.superclass() + " is not declared",
                                   Part::superclass);
        }
        inherit(*declared);
    }
    Names ownProperties;
    for (std::size_t i = 0; i < declaration.properties().size(); ++i) {
        addProperty(*declared, declaration, i, ownProperties);
    }
    for (std::size_t i = 0; i < declaration.methods().size(); ++i) {
        addMethod(*declared, declaration, i);
    }
    classes_.emplace(declaration.name(), std::move(declared));
}

void Declarations::declare(QualifierType type) {
    qualifiers_.insert_or_assign(type.implied.name, std::move(type));
}

std::shared_ptr<const DeclaredClass> Declarations::find(std::string_view name) const {
    const auto found = classes_.find(name);
    return found != classes_.end() ? found->second : nullptr;
}

const QualifierType* Declarations::findQualifier(std::string_view name) const {
    const auto found = qualifiers_.find(name);
    return found != qualifiers_.end() ? &found->second : nullptr;
}

std::vector<std::string> Declarations::classNames() const {
    std::vector<std::string> names;
    for (const auto& [name, declared] : classes_) {
        names.push_back(name);
    }
    return names;
}

std::vector<QualifierType> Declarations::qualifierTypes() const {
    std::vector<QualifierType> types;
    for (const auto& [folded, type] : qualifiers_) {
        types.push_back(type);
    }
    return types;
}

} // namespace oxahv
