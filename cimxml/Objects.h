// Object paths and instances between CMPI and CIM-XML.
#pragma once

#include "Environment.h"
#include "Xml.h"

#include <string>
#include <vector>

namespace cimxml {

// What of an instance is shown.
struct Shown {
    bool localOnly = false; // only what its class itself declares
    bool includesQualifiers = false;
    bool includesClassOrigin = false;
    const std::vector<std::string>* properties = nullptr; // the property list; null: all
    std::string declaredBy{}; // only properties that this class has too; empty: all
};

// The path of an INSTANCENAME in a namespace. Keys get the types that the class declares. Throws CimError.
CMPIObjectPath* readInstanceName(Environment& environment, const Element& instanceName,
                                 const std::string& nameSpace);

// The path in a VALUE.REFERENCE, IPARAMVALUE or METHODCALL: an instance's or a class's, in one of the six
// forms that CIM-XML has. Throws CimError.
CMPIObjectPath* readReference(Environment& environment, const Element& holder);
// The same for the element of the form itself.
CMPIObjectPath* readObjectPath(Environment& environment, const Element& form);

// An INSTANCE. Without a path it gets that of its class with the keys that are among its properties.
// `noSuchProperty` is the code for a property that its class does not have. Throws CimError.
CMPIInstance* readInstance(Environment& environment, const Element& instance, const CMPIObjectPath* path,
                           CMPIrc noSuchProperty);

// A path as INSTANCENAME; as INSTANCEPATH, with host and namespace; and as a VALUE.REFERENCE holds it.
void writeInstanceName(XmlWriter& writer, Environment& environment, const CMPIObjectPath* path);
void writeInstancePath(XmlWriter& writer, Environment& environment, const CMPIObjectPath* path);
void writeReference(XmlWriter& writer, Environment& environment, const CMPIObjectPath* path);

void writeInstance(XmlWriter& writer, Environment& environment, const CMPIInstance* instance,
                   const Shown& shown);

} // namespace cimxml
