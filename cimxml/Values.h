// CIM values of every type between CMPI and CIM-XML.
#pragma once

#include "Environment.h"
#include "Xml.h"

#include <Declarations.h>

#include <string>

namespace cimxml {

// The type of a name such as "uint32"; CMPI_null for any other text.
CMPIType typeFromName(const std::string& name);

// The name of a type, or of an array's elements, in an attribute TYPE or PARAMTYPE.
std::string typeNameOf(CMPIType type);

// The type of the values that an element of a class takes: CMPI_instance, or its array, where qualifiers say
// that its texts are embedded instances.
CMPIType valueTypeOf(CMPIType declared, const oxahv::Qualifiers& qualifiers);

// The type that the attributes of a PROPERTY, PARAMVALUE or the like announce. CMPI_null where they do not.
CMPIType announcedType(const Element& element);

// A value of a type, no array, of its text. `what` is the subject of complaints. Throws CimError
// (CMPI_RC_ERR_INVALID_PARAMETER).
CMPIData valueFromText(Environment& environment, const std::string& text, CMPIType type,
                       const std::string& what);

// The value that an element holds; a NULL when it holds none. CMPI_null: a text or reference, or an array of
// them. Throws CimError.
CMPIData readValue(Environment& environment, const Element& element, CMPIType type, const std::string& what);

// Writes a VALUE, VALUE.ARRAY, VALUE.REFERENCE or VALUE.REFARRAY; nothing for a NULL.
void writeValue(XmlWriter& writer, Environment& environment, const CMPIData& data);

// Writes the VALUE or VALUE.ARRAY of a declaration; nothing for a NULL.
void writeDeclaredValue(XmlWriter& writer, const oxahv::DeclaredValue& value);

// A boolean, number, text or date/time that is not NULL, as a VALUE or KEYVALUE holds it.
std::string plainText(const CMPIData& data);

} // namespace cimxml
