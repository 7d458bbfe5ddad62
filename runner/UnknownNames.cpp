#include "UnknownNames.h"

#include "show/Text.h"

#include <algorithm>

namespace oxahv::runner {

std::vector<std::string> unknownNames(const EmbeddedBroker& broker, const std::string& className,
                                      const Operands& operands) {
    std::vector<std::string> sentences;
    if (!broker.hasDeclarations()) {
        return sentences;
    }
    for (const std::string& name : {operands.filter.associationClass, operands.filter.resultClass}) {
        if (!name.empty() && !broker.isDeclared(name)) {
            sentences.push_back("class " + name + " is not declared");
        }
    }
    const std::vector<PropertyDeclaration> declared = broker.propertiesOf(className);
    const bool isListOfClass =
        operands.filter.associationClass.empty() && operands.filter.resultClass.empty();
    for (const std::string& name : operands.properties.value_or(std::vector<std::string>())) {
        const bool isKnown =
            std::any_of(declared.begin(), declared.end(),
                        [&](const PropertyDeclaration& property) { return sameName(property.name, name); });
        if (isListOfClass && broker.isDeclared(className) && !isKnown) {
            sentences.push_back("class " + className + " has no property " + name);
        }
    }
    return sentences;
}

} // namespace oxahv::runner
