// Declared classes as the broker looks them up: each complete with what it inherits.
#pragma once

#include "objects/NamedValues.h"

#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace oxahv {

// A declared class with all its qualifiers, properties and methods, inherited ones first.
struct DeclaredClass {
    std::string name;
    std::shared_ptr<const DeclaredClass> superclass;
    std::size_t depth = 0; // how many superclasses it has in all
    Qualifiers qualifiers;
    std::vector<PropertyDeclaration> properties;
    Names propertyNames;                                           // in the order of the properties
    std::vector<std::shared_ptr<const MethodDeclaration>> methods; // subclasses share what they inherit

    const PropertyDeclaration* find(std::string_view property) const;
    const MethodDeclaration* findMethod(std::string_view method) const;
    bool isA(std::string_view ancestor) const;
};

// What a declared qualifier type says: where it may stand, and in `implied` what it has when nothing else is
// said.
struct QualifierType {
    unsigned int scopes = 0;
    QualifierDeclaration implied;
    DeclaredValue defaultValue{}; // what elements without the qualifier have
};

// Why a declaration is refused, and which part of it is at fault.
class DeclarationError : public BrokerError {
public:
    enum class Part { name, superclass, property, method, parameter };
    DeclarationError(const std::string& message, Part part, std::size_t index = 0, std::size_t parameter = 0)
        : BrokerError(message), part_(part), index_(index), parameter_(parameter) {}
    Part part() const { return part_; }
    // The position of the property or method among the declaration's own.
    std::size_t index() const { return index_; }
    // The position of the parameter in the method.
    std::size_t parameter() const { return parameter_; }

private:
    Part part_;
    std::size_t index_;
    std::size_t parameter_;
};

// A set of declared classes and qualifier types.
class Declarations {
public:
    // Throws DeclarationError, and changes nothing then.
    void declare(const ClassDeclaration& declaration);
    // A type that is there already is replaced.
    void declare(QualifierType type);
    // Null for what is not declared.
    std::shared_ptr<const DeclaredClass> find(std::string_view name) const;
    const QualifierType* findQualifier(std::string_view name) const;
    std::vector<std::string> classNames() const;
    std::vector<QualifierType> qualifierTypes() const;
    bool anyClass() const { return !classes_.empty(); }

private:
    std::map<std::string, std::shared_ptr<const DeclaredClass>, encoding::NameLess> classes_;
    std::map<std::string, QualifierType, encoding::NameLess> qualifiers_;
};

// A type as a declaration writes it, "uint8[]" for an array.
std::string declaredTypeName(CMPIType type);

} // namespace oxahv
