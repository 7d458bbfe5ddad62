// What stands in the broker's objects: texts, named values, the methods of a class.
#pragma once

#include <EmbeddedBroker.h>

#include <optional>
#include <string>
#include <vector>

namespace oxahv::runner {

// Empty for a null string, and for one whose characters the broker does not hand out: a fault can strike the
// command's own calls too.
std::string textOf(const CMPIString* string);

struct NamedValue {
    std::string name;
    CMPIData data;
};

// None of a null pointer.
std::vector<NamedValue> propertiesOf(const CMPIInstance* instance);
std::vector<NamedValue> keysOf(const CMPIObjectPath* path);
std::vector<NamedValue> argumentsOf(const CMPIArgs* arguments);

// The declaration of a class's method, by its name in any case; nothing when there is none.
std::optional<MethodDeclaration> findMethod(const EmbeddedBroker& broker, const std::string& className,
                                            const std::string& method);

} // namespace oxahv::runner
