#include "Classes.h"

#include <algorithm>

namespace oxahv {

ClassDeclaration::ClassDeclaration(std::string name) : name_(std::move(name)) {}

ClassDeclaration& ClassDeclaration::superclass(std::string name) {
    superclass_ = std::move(name);
    return *this;
}

ClassDeclaration& ClassDeclaration::key(std::string name, CMPIType type) {
    properties_.push_back({std::move(name), type, true});
    return *this;
}

ClassDeclaration& ClassDeclaration::property(std::string name, CMPIType type) {
    properties_.push_back({std::move(name), type, false});
    return *this;
}

const PropertyDeclaration* DeclaredClass::find(std::string_view property) const {
    const auto found = std::find_if(properties.begin(), properties.end(),
                                    [&](const PropertyDeclaration& p) { return sameName(p.name, property); });
    return found != properties.end() ? &*found : nullptr;
}

bool DeclaredClass::isA(std::string_view ancestor) const {
    return sameName(name, ancestor) || (superclass != nullptr && superclass->isA(ancestor));
}

namespace {

// Adds a class's own property to the inherited ones; a redeclaration may make it a key.
void addProperty(DeclaredClass& declared, const PropertyDeclaration& property) {
    for (PropertyDeclaration& inherited : declared.properties) {
        if (sameName(inherited.name, property.name)) {
            if (inherited.type != property.type) {
                throw BrokerError("class " + declared.name + ": property " + property.name +
                                  " is declared as " + typeName(inherited.type) + " already");
            }
            inherited.isKey = inherited.isKey || property.isKey;
            return;
        }
    }
    declared.properties.push_back(property);
}

} // namespace

void Classes::declare(const ClassDeclaration& declaration) {
    const std::unique_lock<std::shared_mutex> lock(mutex_);
    if (declaration.name().empty()) {
        throw BrokerError("a class needs a name");
    }
    const std::string key = foldedName(declaration.name());
    if (classes_.count(key) != 0) {
        throw BrokerError("class " + declaration.name() + " is declared already");
    }
    auto declared = std::make_shared<DeclaredClass>();
    declared->name = declaration.name();
    if (!declaration.superclass().empty()) {
        const auto superclass = classes_.find(foldedName(declaration.superclass()));
        if (superclass == classes_.end()) {
            throw BrokerError("class " + declaration.name() + ": superclass " + declaration.superclass() +
                              " is not declared");
        }
        declared->superclass = superclass->second;
        declared->properties = superclass->second->properties;
    }
    for (const PropertyDeclaration& property : declaration.properties()) {
        addProperty(*declared, property);
    }
    classes_.emplace(key, std::move(declared));
    any_.store(true, std::memory_order_release);
}

std::shared_ptr<const DeclaredClass> Classes::find(std::string_view name) const {
    if (!any()) {
        return nullptr;
    }
    const std::shared_lock<std::shared_mutex> lock(mutex_);
    const auto found = classes_.find(foldedName(name));
    return found != classes_.end() ? found->second : nullptr;
}

bool Classes::isA(std::string_view className, std::string_view ancestor) const {
    const std::shared_ptr<const DeclaredClass> declared = find(className);
    return declared != nullptr ? declared->isA(ancestor) : sameName(className, ancestor);
}

Value checkedValue(Core& core, const CMPIValue* value, CMPIType type, CMPIType declared) {
    if (value == nullptr || type == CMPI_null) {
        return Value::null(declared);
    }
    Value result = Value::from(core, value, type);
    if (result.type() != storedType(declared)) {
        throw Failure{CMPI_RC_ERR_TYPE_MISMATCH};
    }
    return result;
}

} // namespace oxahv
