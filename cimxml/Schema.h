// The declared classes as the answers to one request need them: looked up once, with where each element comes
// from. For one thread.
#pragma once

#include <EmbeddedBroker.h>

#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace cimxml {

struct DeclaredClass {
    std::string name;
    std::shared_ptr<const DeclaredClass> superclass; // null for a class without one
    oxahv::Qualifiers qualifiers;
    std::vector<oxahv::PropertyDeclaration> properties; // inherited ones first
    std::vector<oxahv::MethodDeclaration> methods;

    const oxahv::PropertyDeclaration* find(std::string_view property) const;
    const oxahv::MethodDeclaration* findMethod(std::string_view method) const;
    // The name of the class that first declares the property or method.
    std::string originOf(std::string_view property) const;
    std::string originOfMethod(std::string_view method) const;
};

class Schema {
public:
    explicit Schema(const oxahv::EmbeddedBroker& broker) : broker_(broker) {}

    // Null for a class that is not declared.
    std::shared_ptr<const DeclaredClass> find(const std::string& className);
    // The names of the declared classes that derive from one, at first hand only or all; of those without a
    // superclass for an empty name.
    std::vector<std::string> subclassesOf(const std::string& ancestor, bool all) const;

private:
    const oxahv::EmbeddedBroker& broker_;
    std::map<std::string, std::shared_ptr<const DeclaredClass>> found_; // by folded name
};

} // namespace cimxml
