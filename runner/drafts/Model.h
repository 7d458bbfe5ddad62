// What a draft is of: classes of CIM with their names and types in C++.
#pragma once

#include <EmbeddedBroker.h>

#include <string>
#include <vector>

namespace oxahv::runner {

struct DraftProperty {
    PropertyDeclaration declaration;
    std::string variable;
    std::string type; // of its value, without std::optional
    std::string description;
};

struct DraftParameter {
    std::string name;
    std::string variable;
    std::string type;      // with std::optional, const and &
    std::string direction; // "in", "out" or "in, out"
    std::string description;
};

struct DraftMethod {
    std::string name;
    std::string function;
    std::string returnType;
    std::vector<DraftParameter> parameters;
    std::string description;
};

struct DraftClass {
    std::string name;
    std::string structName;
    std::string description;
    bool isAssociation = false;
    std::vector<DraftProperty> keys{}; // references first
    std::vector<DraftProperty> properties{};
    bool hasMethods = false;
    std::vector<DraftMethod> methods{}; // but for those of another class of the provider's
};

struct DraftProvider {
    std::string name; // the MI name
    std::string nameSpace;
    std::vector<DraftClass> classes;
};

// The provider of some classes that the broker has the declarations of. An empty `provider` is named after
// the first class. Throws std::runtime_error with the reason for what there can be no provider of.
DraftProvider draftProvider(const EmbeddedBroker& broker, const std::vector<std::string>& classes,
                            const std::string& provider, const std::string& nameSpace);

} // namespace oxahv::runner
