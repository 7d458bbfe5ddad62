#include "Objects.h"

#include "ClassElements.h"
#include "Failure.h"
#include "Message.h"
#include "Values.h"

#include <Names.h>

#include <algorithm>

namespace cimxml {

namespace {

using encoding::sameName;

[[noreturn]] void refuse(const std::string& text) {
    throw CimError(CMPI_RC_ERR_INVALID_PARAMETER, text);
}

const Element& required(const Element& parent, const char* name) {
    const Element* const child = parent.child(name);
    if (child == nullptr) {
        refuse(parent.name + " without " + name);
    }
    return *child;
}

// Reading

CMPIObjectPath* newPath(Environment& environment, const std::string& nameSpace,
                        const std::string& className) {
    if (className.empty()) {
        refuse("a path without a class");
    }
    return checked(className, CMNewObjectPath, environment.broker.handle(), nameSpace.c_str(),
                   className.c_str());
}

// The type of a key of which no class says it.
CMPIType keyTypeOf(const Element& keyValue) {
    const CMPIType type = typeFromName(keyValue.attribute("TYPE"));
    if (type != CMPI_null) {
        return type;
    }
    const std::string kind = keyValue.attribute("VALUETYPE");
    if (kind == "boolean") {
        return CMPI_boolean;
    }
    if (kind == "numeric") {
        return keyValue.text.find('-') != std::string::npos ? CMPI_sint64 : CMPI_uint64;
    }
    return CMPI_string;
}

// `value` is a KEYVALUE or a VALUE.REFERENCE.
void addKey(Environment& environment, CMPIObjectPath* path, const DeclaredClass* declared,
            const std::string& className, const std::string& name, const Element& value) {
    const oxahv::PropertyDeclaration* const key = declared != nullptr ? declared->find(name) : nullptr;
    if (declared != nullptr && (key == nullptr || !key->isKey)) {
        refuse("class " + className + " has no key " + name);
    }
    const std::string what = "key " + name;
    CMPIData data = {CMPI_ref, CMPI_goodValue, {}};
    if (value.name == "VALUE.REFERENCE") {
        data.value.ref = readReference(environment, value);
    } else {
        data = valueFromText(environment, value.text, key != nullptr ? key->type : keyTypeOf(value), what);
    }
    require(CMAddKey(path, name.c_str(), &data.value, data.type), what);
}

// The only key of a class, of which a name may bring the value alone.
std::string onlyKeyOf(const DeclaredClass* declared) {
    std::string name;
    for (const oxahv::PropertyDeclaration& property :
         declared != nullptr ? declared->properties : std::vector<oxahv::PropertyDeclaration>()) {
        if (property.isKey) {
            if (!name.empty()) {
                return "";
            }
            name = property.name;
        }
    }
    return name;
}

// One property of an instance that a client sent.
void readProperty(Environment& environment, CMPIInstance* instance, const DeclaredClass* declared,
                  const Element& property, CMPIrc noSuchProperty) {
    const std::string name = property.attribute("NAME");
    const std::string what = "property " + name;
    const CMPIType announced = announcedType(property);
    CMPIType type = announced != CMPI_null ? announced : static_cast<CMPIType>(CMPI_string);
    if (declared != nullptr) {
        const oxahv::PropertyDeclaration* const declaration = declared->find(name);
        if (declaration == nullptr) {
            throw CimError(noSuchProperty, "class " + declared->name + " has no " + what);
        }
        type = valueTypeOf(declaration->type, declaration->qualifiers);
        if (announced != CMPI_null && announced != type && announced != declaration->type) {
            throw CimError(CMPI_RC_ERR_TYPE_MISMATCH, what + " is declared as " + typeNameOf(type));
        }
    }
    const CMPIData data = readValue(environment, property, type, what);
    require(CMSetProperty(instance, name.c_str(), CMIsNullValue(data) ? nullptr : &data.value, type), what);
}

// The path of a new instance: its class with the keys among its properties.
CMPIObjectPath* newPathOf(Environment& environment, const Element& instance, const DeclaredClass* declared) {
    const std::string className = instance.attribute("CLASSNAME");
    CMPIObjectPath* const path = newPath(environment, environment.nameSpace, className);
    if (declared == nullptr) { // nobody knows which of its properties are keys
        return path;
    }
    for (const Element& property : instance.children) {
        const oxahv::PropertyDeclaration* const key = declared->find(property.attribute("NAME"));
        if (key == nullptr || !key->isKey) {
            continue;
        }
        const CMPIData data = readValue(environment, property, key->type, "property " + key->name);
        if (!CMIsNullValue(data)) {
            require(CMAddKey(path, key->name.c_str(), &data.value, data.type), "property " + key->name);
        }
    }
    return path;
}

// Writing

std::string hostOf(const CMPIObjectPath* path) {
    return textOf(checked("host", CMGetHostname, path));
}

std::string nameSpaceOf(const CMPIObjectPath* path) {
    return textOf(checked("namespace", CMGetNameSpace, path));
}

void writeNameSpace(XmlWriter& writer, const std::string& nameSpace) {
    writer.element("LOCALNAMESPACEPATH", {}, [&] {
        for (std::size_t begin = 0; begin < nameSpace.size();) {
            const std::size_t end = std::min(nameSpace.find('/', begin), nameSpace.size());
            if (end > begin) {
                writer.element("NAMESPACE", {{"NAME", nameSpace.substr(begin, end - begin)}});
            }
            begin = end + 1;
        }
    });
}

const char* valueTypeOfKey(CMPIType type) {
    if (type == CMPI_boolean) {
        return "boolean";
    }
    const bool isText =
        type == CMPI_string || type == CMPI_chars || type == CMPI_dateTime || type == CMPI_char16;
    return isText ? "string" : "numeric";
}

void writeKey(XmlWriter& writer, Environment& environment, const std::string& name, const CMPIData& key) {
    if (CMIsNullValue(key)) {
        return;
    }
    writer.element("KEYBINDING", {{"NAME", name}}, [&] {
        if (key.type == CMPI_ref) {
            writeValue(writer, environment, key);
        } else {
            writer.element("KEYVALUE",
                           {{"VALUETYPE", valueTypeOfKey(key.type)}, {"TYPE", typeNameOf(key.type)}},
                           [&] { writer.text(plainText(key)); });
        }
    });
}

// Whether a property is among those to be shown.
bool isShown(const Shown& shown, Environment& environment, const DeclaredClass* declared,
             const std::string& name) {
    if (shown.properties != nullptr &&
        std::none_of(shown.properties->begin(), shown.properties->end(),
                     [&](const std::string& wanted) { return sameName(wanted, name); })) {
        return false;
    }
    const oxahv::PropertyDeclaration* const property = declared != nullptr ? declared->find(name) : nullptr;
    if (property == nullptr) {
        return true;
    }
    if (shown.localOnly && !isLocal(*declared, *property)) {
        return false;
    }
    const auto limit = shown.declaredBy.empty() ? nullptr : environment.schema.find(shown.declaredBy);
    return limit == nullptr || limit->find(name) != nullptr;
}

void writeProperty(XmlWriter& writer, Environment& environment, const DeclaredClass* declared,
                   const NamedData& named, const Shown& shown) {
    const auto& [name, data] = named;
    const oxahv::PropertyDeclaration* const property = declared != nullptr ? declared->find(name) : nullptr;
    PropertyTag tag;
    tag.name = named.name;
    tag.type = data.type;
    if (property != nullptr) {
        tag.referenceClass = property->referenceClass;
        tag.embedded = embeddingOf(property->qualifiers);
    }
    if ((data.type & ~CMPI_ARRAY) == CMPI_instance && tag.embedded.empty()) {
        tag.embedded = "instance";
    }
    if (data.type == CMPI_ref && tag.referenceClass.empty() && !CMIsNullValue(data) &&
        data.value.ref != nullptr) {
        tag.referenceClass = classNameOf(data.value.ref);
    }
    if (property != nullptr && shown.includesClassOrigin) {
        tag.origin = declared->originOf(name);
    }
    tag.write(writer, [&] {
        if (property != nullptr && shown.includesQualifiers) {
            writeQualifiers(writer, property->qualifiers);
        }
        writeValue(writer, environment, named.data);
    });
}

} // namespace

CMPIObjectPath* readInstanceName(Environment& environment, const Element& instanceName,
                                 const std::string& nameSpace) {
    const std::string className = instanceName.attribute("CLASSNAME");
    CMPIObjectPath* const path = newPath(environment, nameSpace, className);
    const auto declared = environment.schema.find(className);
    for (const Element& child : instanceName.children) {
        if (child.name == "KEYBINDING") {
            const Element* value = child.child("KEYVALUE");
            value = value != nullptr ? value : &required(child, "VALUE.REFERENCE");
            addKey(environment, path, declared.get(), className, child.attribute("NAME"), *value);
        } else if (child.name == "KEYVALUE" || child.name == "VALUE.REFERENCE") {
            addKey(environment, path, declared.get(), className, onlyKeyOf(declared.get()), child);
        }
    }
    return path;
}

CMPIObjectPath* readObjectPath(Environment& environment, const Element& form) {
    const Element* name = form.name == "INSTANCENAME" || form.name == "CLASSNAME" ? &form : nullptr;
    std::string nameSpace = environment.nameSpace;
    std::string host;
    if (name == nullptr) {
        const Element* parent = &form;
        if (const Element* const whole = form.child("NAMESPACEPATH")) {
            parent = whole;
            const Element* const hostElement = whole->child("HOST");
            host = hostElement != nullptr ? hostElement->text : "";
        }
        nameSpace = nameSpaceOf(&required(*parent, "LOCALNAMESPACEPATH"));
        name = form.child("INSTANCENAME");
        name = name != nullptr ? name : &required(form, "CLASSNAME");
    }
    CMPIObjectPath* const path = name->name == "INSTANCENAME"
                                     ? readInstanceName(environment, *name, nameSpace)
                                     : newPath(environment, nameSpace, name->attribute("NAME"));
    if (!host.empty()) {
        require(CMSetHostname(path, host.c_str()), "host " + host);
    }
    return path;
}

CMPIObjectPath* readReference(Environment& environment, const Element& holder) {
    for (const char* const form :
         {"INSTANCENAME", "LOCALINSTANCEPATH", "INSTANCEPATH", "CLASSNAME", "LOCALCLASSPATH", "CLASSPATH"}) {
        if (const Element* const found = holder.child(form)) {
            return readObjectPath(environment, *found);
        }
    }
    refuse(holder.name + " without a path");
}

CMPIInstance* readInstance(Environment& environment, const Element& instance, const CMPIObjectPath* path,
                           CMPIrc noSuchProperty) {
    const std::string className = instance.attribute("CLASSNAME");
    const auto declared = environment.schema.find(className);
    if (path == nullptr) {
        path = newPathOf(environment, instance, declared.get());
    } else if (!sameName(classNameOf(path), className)) {
        refuse("an instance of class " + className + " has the path of another class");
    }
    CMPIInstance* const result =
        checked("class " + className, CMNewInstance, environment.broker.handle(), path);
    for (const Element& child : instance.children) {
        if (child.name.compare(0, 8, "PROPERTY") == 0) {
            readProperty(environment, result, declared.get(), child, noSuchProperty);
        }
    }
    return result;
}

void writeInstanceName(XmlWriter& writer, Environment& environment, const CMPIObjectPath* path) {
    writer.element("INSTANCENAME", {{"CLASSNAME", classNameOf(path)}}, [&] {
        const CMPICount count = checked("keys", CMGetKeyCount, path);
        for (CMPICount i = 0; i < count; ++i) {
            const NamedData key = keyAt(path, i);
            writeKey(writer, environment, key.name, key.data);
        }
    });
}

void writeInstancePath(XmlWriter& writer, Environment& environment, const CMPIObjectPath* path) {
    const std::string host = hostOf(path);
    const std::string nameSpace = nameSpaceOf(path);
    writer.element("INSTANCEPATH", {}, [&] {
        writer.element("NAMESPACEPATH", {}, [&] {
            writer.element("HOST", {}, [&] { writer.text(host.empty() ? environment.hostName : host); });
            writeNameSpace(writer, nameSpace.empty() ? environment.nameSpace : nameSpace);
        });
        writeInstanceName(writer, environment, path);
    });
}

void writeReference(XmlWriter& writer, Environment& environment, const CMPIObjectPath* path) {
    const std::string nameSpace = nameSpaceOf(path);
    const bool isClass = checked("keys", CMGetKeyCount, path) == 0;
    const auto writeName = [&] {
        if (isClass) {
            writer.element("CLASSNAME", {{"NAME", classNameOf(path)}});
        } else {
            writeInstanceName(writer, environment, path);
        }
    };
    if (!isClass && !hostOf(path).empty()) {
        writeInstancePath(writer, environment, path);
    } else if (nameSpace.empty()) {
        writeName();
    } else {
        writer.element(isClass ? "LOCALCLASSPATH" : "LOCALINSTANCEPATH", {}, [&] {
            writeNameSpace(writer, nameSpace);
            writeName();
        });
    }
}

void writeInstance(XmlWriter& writer, Environment& environment, const CMPIInstance* instance,
                   const Shown& shown) {
    const std::string className = classNameOf(pathOf(instance));
    const auto declared = environment.schema.find(className);
    writer.element("INSTANCE", {{"CLASSNAME", className}}, [&] {
        if (declared != nullptr && shown.includesQualifiers) {
            writeQualifiers(writer, declared->qualifiers);
        }
        const CMPICount count = checked("properties", CMGetPropertyCount, instance);
        for (CMPICount i = 0; i < count; ++i) {
            const NamedData property = propertyAt(instance, i);
            if (isShown(shown, environment, declared.get(), property.name)) {
                writeProperty(writer, environment, declared.get(), property, shown);
            }
        }
    });
}

} // namespace cimxml
