#include "show/Values.h"

#include "show/Text.h"

namespace oxahv::runner {

namespace {

// `count` and `at` are the slots that tell the values of an instance, an object path or arguments.
template <class Object, class Count, class At>
std::vector<NamedValue> valuesOf(const Object* object, Count count, At at) {
    std::vector<NamedValue> values;
    const CMPICount size = object != nullptr ? count(object, nullptr) : 0;
    for (CMPICount i = 0; i < size; ++i) {
        CMPIString* name = nullptr;
        const CMPIData data = at(object, i, &name, nullptr);
        values.push_back({textOf(name), data});
    }
    return values;
}

} // namespace

std::string textOf(const CMPIString* string) {
    const char* const chars = string != nullptr ? CMGetCharsPtr(string, nullptr) : nullptr;
    return chars != nullptr ? chars : "";
}

std::vector<NamedValue> propertiesOf(const CMPIInstance* instance) {
    return valuesOf(instance, CMGetPropertyCount, CMGetPropertyAt);
}

std::vector<NamedValue> keysOf(const CMPIObjectPath* path) {
    return valuesOf(path, CMGetKeyCount, CMGetKeyAt);
}

std::vector<NamedValue> argumentsOf(const CMPIArgs* arguments) {
    return valuesOf(arguments, CMGetArgCount, CMGetArgAt);
}

std::optional<MethodDeclaration> findMethod(const EmbeddedBroker& broker, const std::string& className,
                                            const std::string& method) {
    for (const MethodDeclaration& declared : broker.methodsOf(className)) {
        if (sameName(declared.name, method)) {
            return declared;
        }
    }
    return std::nullopt;
}

} // namespace oxahv::runner
