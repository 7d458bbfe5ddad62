#include "Schema.h"

#include <Names.h>

#include <algorithm>

namespace cimxml {

namespace {

using encoding::sameName;

template <class Declaration>
const Declaration* named(const std::vector<Declaration>& declarations, std::string_view name) {
    const auto found = std::find_if(declarations.begin(), declarations.end(),
                                    [&](const Declaration& d) { return sameName(d.name, name); });
    return found != declarations.end() ? &*found : nullptr;
}

// `has` takes a class.
template <class Has>
std::string originIn(const DeclaredClass& declared, const Has& has) {
    const DeclaredClass* origin = &declared;
    while (origin->superclass != nullptr && has(*origin->superclass)) {
        origin = origin->superclass.get();
    }
    return origin->name;
}

} // namespace

const oxahv::PropertyDeclaration* DeclaredClass::find(std::string_view property) const {
    return named(properties, property);
}

const oxahv::MethodDeclaration* DeclaredClass::findMethod(std::string_view method) const {
    return named(methods, method);
}

std::string DeclaredClass::originOf(std::string_view property) const {
    return originIn(*this, [&](const DeclaredClass& declared) { return declared.find(property) != nullptr; });
}

std::string DeclaredClass::originOfMethod(std::string_view method) const {
    return originIn(*this,
                    [&](const DeclaredClass& declared) { return declared.findMethod(method) != nullptr; });
}

std::shared_ptr<const DeclaredClass> Schema::find(const std::string& className) {
    const std::string key = encoding::foldedName(className);
    const auto known = found_.find(key);
    if (known != found_.end()) {
        return known->second;
    }
    std::shared_ptr<DeclaredClass> declared;
    const std::vector<std::string> names = broker_.declaredClasses();
    const auto name = std::find_if(names.begin(), names.end(), [&](const std::string& candidate) {
        return sameName(candidate, className);
    });
    if (name != names.end()) {
        declared = std::make_shared<DeclaredClass>();
        declared->name = *name;
        declared->qualifiers = broker_.qualifiersOf(className);
        declared->properties = broker_.propertiesOf(className);
        declared->methods = broker_.methodsOf(className);
        const std::string superclass = broker_.superclassOf(className);
        if (!superclass.empty()) {
            declared->superclass = find(superclass);
        }
    }
    found_.emplace(key, declared);
    return declared;
}

std::vector<std::string> Schema::subclassesOf(const std::string& ancestor, bool all) const {
    std::vector<std::string> names;
    for (const std::string& candidate : broker_.declaredClasses()) {
        const bool derives =
            all && !sameName(candidate, ancestor) && (ancestor.empty() || broker_.isA(candidate, ancestor));
        if (derives || (!all && sameName(broker_.superclassOf(candidate), ancestor))) {
            names.push_back(candidate);
        }
    }
    return names;
}

} // namespace cimxml
