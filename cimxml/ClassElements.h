// Declared classes and qualifiers as CIM-XML, and what instances share with them.
#pragma once

#include "Objects.h"
#include "Schema.h"
#include "Xml.h"

#include <string>

namespace cimxml {

// A PROPERTY, PROPERTY.ARRAY or PROPERTY.REFERENCE of a class or an instance.
struct PropertyTag {
    std::string name;
    CMPIType type = CMPI_null;
    std::string referenceClass{}; // these four are left out where they are empty or false
    std::string embedded{};
    std::string origin{};
    bool isPropagated = false;

    template <class Content>
    void write(XmlWriter& writer, const Content& content) const {
        writer.element(elementName(), attributes(), content);
    }

private:
    const char* elementName() const;
    std::vector<Attribute> attributes() const;
};

// The value of the attribute EmbeddedObject: "instance", "object", or empty for texts that are no instances.
std::string embeddingOf(const oxahv::Qualifiers& qualifiers);

// Whether the class itself declares the property or overrides it.
bool isLocal(const DeclaredClass& declared, const oxahv::PropertyDeclaration& property);

void writeQualifiers(XmlWriter& writer, const oxahv::Qualifiers& qualifiers);
void writeClass(XmlWriter& writer, const DeclaredClass& declared, const Shown& shown);
void writeQualifierType(XmlWriter& writer, const oxahv::QualifierTypeDeclaration& type);

} // namespace cimxml
