#include "ClassElements.h"

#include "Values.h"

#include <Names.h>

#include <algorithm>

namespace cimxml {

namespace {

using encoding::sameName;

std::string truth(bool is) {
    return is ? "true" : "false";
}

bool isArray(CMPIType type) {
    return (type & CMPI_ARRAY) != 0;
}

bool isReference(CMPIType type) {
    return (type & ~CMPI_ARRAY) == CMPI_ref;
}

bool isOverride(const oxahv::Qualifiers& qualifiers) {
    return qualifiers.find("Override") != nullptr;
}

void writeQualifier(XmlWriter& writer, const oxahv::QualifierDeclaration& qualifier) {
    writer.element("QUALIFIER",
                   {{"NAME", qualifier.name},
                    {"TYPE", typeNameOf(qualifier.value.type)},
                    {"OVERRIDABLE", truth(qualifier.isOverridable)},
                    {"TOSUBCLASS", truth(qualifier.reachesSubclass)},
                    {"TRANSLATABLE", truth(qualifier.isTranslatable)}},
                   [&] { writeDeclaredValue(writer, qualifier.value); });
}

// A class's qualifiers without those that it has from its superclass unchanged.
oxahv::Qualifiers localQualifiers(const DeclaredClass& declared) {
    std::vector<oxahv::QualifierDeclaration> local;
    for (const oxahv::QualifierDeclaration& qualifier : declared.qualifiers.list()) {
        const oxahv::QualifierDeclaration* const inherited =
            declared.superclass != nullptr ? declared.superclass->qualifiers.find(qualifier.name) : nullptr;
        if (inherited == nullptr || !inherited->reachesSubclass ||
            inherited->value.elements != qualifier.value.elements) {
            local.push_back(qualifier);
        }
    }
    return oxahv::Qualifiers(std::move(local));
}

void writeParameter(XmlWriter& writer, const oxahv::ParameterDeclaration& parameter,
                    bool includesQualifiers) {
    std::vector<Attribute> attributes = {{"NAME", parameter.name}};
    if (isReference(parameter.type)) {
        attributes.emplace_back("REFERENCECLASS", parameter.referenceClass);
    } else {
        attributes.emplace_back("TYPE", typeNameOf(parameter.type));
    }
    const char* const plain = isArray(parameter.type) ? "PARAMETER.ARRAY" : "PARAMETER";
    const char* const reference = isArray(parameter.type) ? "PARAMETER.REFARRAY" : "PARAMETER.REFERENCE";
    writer.element(isReference(parameter.type) ? reference : plain, attributes, [&] {
        if (includesQualifiers) {
            writeQualifiers(writer, parameter.qualifiers);
        }
    });
}

void writeMethod(XmlWriter& writer, const DeclaredClass& declared, const oxahv::MethodDeclaration& method,
                 const Shown& shown) {
    const std::string origin = declared.originOfMethod(method.name);
    const bool isLocalMethod = sameName(origin, declared.name) || isOverride(method.qualifiers);
    if (shown.localOnly && !isLocalMethod) {
        return;
    }
    std::vector<Attribute> attributes = {{"NAME", method.name}, {"TYPE", typeNameOf(method.returnType)}};
    if (shown.includesClassOrigin) {
        attributes.emplace_back("CLASSORIGIN", origin);
    }
    attributes.emplace_back("PROPAGATED", truth(!isLocalMethod));
    writer.element("METHOD", attributes, [&] {
        if (shown.includesQualifiers) {
            writeQualifiers(writer, method.qualifiers);
        }
        for (const oxahv::ParameterDeclaration& parameter : method.parameters) {
            writeParameter(writer, parameter, shown.includesQualifiers);
        }
    });
}

void writeProperty(XmlWriter& writer, const DeclaredClass& declared,
                   const oxahv::PropertyDeclaration& property, const Shown& shown) {
    PropertyTag tag;
    tag.name = property.name;
    tag.type = property.type;
    tag.referenceClass = property.referenceClass;
    tag.embedded = embeddingOf(property.qualifiers);
    tag.origin = shown.includesClassOrigin ? declared.originOf(property.name) : "";
    tag.isPropagated = !isLocal(declared, property);
    tag.write(writer, [&] {
        if (shown.includesQualifiers) {
            writeQualifiers(writer, property.qualifiers);
        }
        writeDeclaredValue(writer, property.defaultValue);
    });
}

bool isListed(const Shown& shown, const std::string& name) {
    return shown.properties == nullptr ||
           std::any_of(shown.properties->begin(), shown.properties->end(),
                       [&](const std::string& wanted) { return sameName(wanted, name); });
}

} // namespace

const char* PropertyTag::elementName() const {
    if (isArray(type)) {
        return "PROPERTY.ARRAY";
    }
    return isReference(type) ? "PROPERTY.REFERENCE" : "PROPERTY";
}

std::vector<Attribute> PropertyTag::attributes() const {
    std::vector<Attribute> result = {{"NAME", name}};
    if (type == CMPI_ref) {
        if (!referenceClass.empty()) {
            result.emplace_back("REFERENCECLASS", referenceClass);
        }
    } else {
        result.emplace_back("TYPE", typeNameOf(type));
    }
    if (!origin.empty()) {
        result.emplace_back("CLASSORIGIN", origin);
    }
    if (isPropagated) {
        result.emplace_back("PROPAGATED", "true");
    }
    if (!embedded.empty()) {
        result.emplace_back("EmbeddedObject", embedded);
    }
    return result;
}

std::string embeddingOf(const oxahv::Qualifiers& qualifiers) {
    if (qualifiers.isTrue("EmbeddedObject")) {
        return "object";
    }
    return qualifiers.find("EmbeddedInstance") != nullptr ? "instance" : "";
}

bool isLocal(const DeclaredClass& declared, const oxahv::PropertyDeclaration& property) {
    return isOverride(property.qualifiers) || sameName(declared.originOf(property.name), declared.name);
}

void writeQualifiers(XmlWriter& writer, const oxahv::Qualifiers& qualifiers) {
    for (const oxahv::QualifierDeclaration& qualifier : qualifiers.list()) {
        writeQualifier(writer, qualifier);
    }
}

void writeClass(XmlWriter& writer, const DeclaredClass& declared, const Shown& shown) {
    std::vector<Attribute> attributes = {{"NAME", declared.name}};
    if (declared.superclass != nullptr) {
        attributes.emplace_back("SUPERCLASS", declared.superclass->name);
    }
    writer.element("CLASS", attributes, [&] {
        if (shown.includesQualifiers) {
            writeQualifiers(writer, shown.localOnly ? localQualifiers(declared) : declared.qualifiers);
        }
        for (const oxahv::PropertyDeclaration& property : declared.properties) {
            if (isListed(shown, property.name) && (!shown.localOnly || isLocal(declared, property))) {
                writeProperty(writer, declared, property, shown);
            }
        }
        for (const oxahv::MethodDeclaration& method : declared.methods) {
            writeMethod(writer, declared, method, shown);
        }
    });
}

void writeQualifierType(XmlWriter& writer, const oxahv::QualifierTypeDeclaration& type) {
    const std::vector<Attribute> attributes = {{"NAME", type.name},
                                               {"TYPE", typeNameOf(type.type)},
                                               {"ISARRAY", truth(isArray(type.type))},
                                               {"OVERRIDABLE", truth(type.isOverridable)},
                                               {"TOSUBCLASS", truth(type.reachesSubclass)},
                                               {"TRANSLATABLE", truth(type.isTranslatable)}};
    writer.element("QUALIFIER.DECLARATION", attributes, [&] {
        std::vector<Attribute> scopes;
        for (const auto& [scope, attribute] :
             {std::pair("class", "CLASS"), std::pair("association", "ASSOCIATION"),
              std::pair("reference", "REFERENCE"), std::pair("property", "PROPERTY"),
              std::pair("method", "METHOD"), std::pair("parameter", "PARAMETER"),
              std::pair("indication", "INDICATION")}) {
            const bool isIn = std::any_of(type.scopes.begin(), type.scopes.end(),
                                          [name = scope](const std::string& declared) {
                                              return declared == name || declared == "any";
                                          });
            if (isIn) {
                scopes.emplace_back(attribute, "true");
            }
        }
        writer.element("SCOPE", scopes);
        writeDeclaredValue(writer, type.defaultValue);
    });
}

} // namespace cimxml
