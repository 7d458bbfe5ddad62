// The function tables of object paths and instances.

#include "tables/Slots.h"

#include <optional>

namespace oxahv {

namespace {

// Object paths

CMPIString* getNameSpace(const ObjectPath& path) {
    return newText(path.core(), path.nameSpace);
}
CMPIString* getHostname(const ObjectPath& path) {
    return newText(path.core(), path.hostName);
}
CMPIString* getClassName(const ObjectPath& path) {
    return newText(path.core(), path.className);
}

void setNameSpace(ObjectPath& path, const char* nameSpace) {
    path.nameSpace = required(nameSpace);
}
void setHostname(ObjectPath& path, const char* hostName) {
    path.hostName = required(hostName);
}
void setClassName(ObjectPath& path, const char* className) {
    path.className = required(className);
}

// The value of a key or a property, checked against the class's declaration where there is one.
Value declaredValue(Core& core, const DeclaredClass* declared, const char* name, const CMPIValue* value,
                    CMPIType type) {
    if (declared == nullptr) {
        return Value::from(core, value, type);
    }
    const PropertyDeclaration* const property = declared->find(name);
    if (property == nullptr) {
        throw Failure{CMPI_RC_ERR_NO_SUCH_PROPERTY};
    }
    return checkedValue(core, value, type, valueTypeOf(*property));
}

void addKey(ObjectPath& path, const char* name, const CMPIValue* value, CMPIType type) {
    const auto declared = path.core().classes.find(path.className);
    const PropertyDeclaration* const property =
        declared != nullptr ? declared->find(required(name)) : nullptr;
    if (property != nullptr && !property->isKey) {
        throw Failure{CMPI_RC_ERR_NO_SUCH_PROPERTY};
    }
    path.keys.set(required(name), declaredValue(path.core(), declared, name, value, type));
}

CMPIData getKey(const ObjectPath& path, const char* name) {
    const std::optional<NamedValue> key = path.keys.find(required(name));
    if (!key) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return lent(path, key->value.data(CMPI_keyValue));
}

CMPIData getKeyAt(const ObjectPath& path, CMPICount index, CMPIString** name) {
    const NamedValue key = path.keys.at(index);
    if (name != nullptr) {
        *name = newText(path.core(), key.name);
    }
    return lent(path, key.value.data(CMPI_keyValue));
}

CMPICount getKeyCount(const ObjectPath& path) {
    return static_cast<CMPICount>(path.keys.size());
}

const ObjectPath& pathOf(const CMPIObjectPath* handle) {
    const ObjectPath* const path = ObjectPath::of(handle);
    if (path == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    return *path;
}

void setNameSpaceFrom(ObjectPath& path, const CMPIObjectPath* source) {
    path.nameSpace = pathOf(source).nameSpace;
}

void setHostAndNameSpaceFrom(ObjectPath& path, const CMPIObjectPath* source) {
    path.hostName = pathOf(source).hostName;
    path.nameSpace = pathOf(source).nameSpace;
}

// Qualifiers, as far as classes are declared

const DeclaredClass* declaredClassOf(const ObjectPath& path) {
    if (!path.core().classes.any()) {
        throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
    }
    const DeclaredClass* const declared = path.core().classes.find(path.className);
    if (declared == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_CLASS};
    }
    return declared;
}

CMPIData qualifierOf(const ObjectPath& path, const Qualifiers& qualifiers, const char* name) {
    const QualifierDeclaration* const qualifier = qualifiers.find(required(name));
    if (qualifier == nullptr) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return dataOf(path.core(), qualifier->value);
}

const MethodDeclaration& methodOf(const DeclaredClass& declared, const char* name) {
    const MethodDeclaration* const method = declared.findMethod(required(name));
    if (method == nullptr) {
        throw Failure{CMPI_RC_ERR_METHOD_NOT_FOUND};
    }
    return *method;
}

CMPIData getClassQualifier(const ObjectPath& path, const char* qualifier) {
    return qualifierOf(path, declaredClassOf(path)->qualifiers, qualifier);
}

CMPIData getPropertyQualifier(const ObjectPath& path, const char* name, const char* qualifier) {
    const auto declared = declaredClassOf(path);
    const PropertyDeclaration* const property = declared->find(required(name));
    if (property == nullptr) {
        throw Failure{CMPI_RC_ERR_NO_SUCH_PROPERTY};
    }
    return qualifierOf(path, property->qualifiers, qualifier);
}

CMPIData getMethodQualifier(const ObjectPath& path, const char* method, const char* qualifier) {
    const auto declared = declaredClassOf(path);
    return qualifierOf(path, methodOf(*declared, method).qualifiers, qualifier);
}

CMPIData getParameterQualifier(const ObjectPath& path, const char* method, const char* name,
                               const char* qualifier) {
    const auto declared = declaredClassOf(path);
    const ParameterDeclaration* const parameter = methodOf(*declared, method).find(required(name));
    if (parameter == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_PARAMETER};
    }
    return qualifierOf(path, parameter->qualifiers, qualifier);
}

CMPIString* toString(const ObjectPath& path) {
    return newText(path.core(), pathText(&path));
}

// Instances

CMPIData getProperty(const Instance& instance, const char* name) {
    const std::optional<NamedValue> property = instance.properties.find(required(name));
    if (!property) {
        throw Failure{CMPI_RC_ERR_NO_SUCH_PROPERTY};
    }
    return lent(instance, property->value.data());
}

CMPIData getPropertyAt(const Instance& instance, CMPICount index, CMPIString** name) {
    if (index >= instance.properties.size()) {
        throw Failure{CMPI_RC_ERR_NO_SUCH_PROPERTY};
    }
    const NamedValue property = instance.properties.at(index);
    if (name != nullptr) {
        *name = newText(instance.core(), property.name);
    }
    return lent(instance, property.value.data());
}

CMPICount getPropertyCount(const Instance& instance) {
    return static_cast<CMPICount>(instance.properties.size());
}

void setProperty(Instance& instance, const char* name, const CMPIValue* value, CMPIType type) {
    const DeclaredClass* const declared = instance.declaredClass();
    Value checked = declaredValue(instance.core(), declared, required(name), value, type);
    if (instance.passesFilter(declared, name)) {
        instance.properties.set(name, std::move(checked));
    }
}

void setPropertyWithOrigin(Instance& instance, const char* name, const CMPIValue* value, CMPIType type,
                           const char* /*origin*/) {
    setProperty(instance, name, value, type);
}

// The path that the instance was made for, with what has been set of its keys since.
CMPIObjectPath* getObjectPath(const Instance& instance) {
    const DeclaredClass* const declared = instance.declaredClass();
    std::unique_ptr<ObjectPath> path = instance.path->copy();
    for (const NamedValue& property : instance.properties) {
        if (!property.value.isNull() && instance.isKey(declared, property.name)) {
            path->keys.set(property.name, property.value);
        }
    }
    return handOut(std::move(path));
}

// The path's keys become properties, as they do in a new instance.
void setObjectPath(Instance& instance, const CMPIObjectPath* handle) {
    instance.setPath(pathOf(handle).copy());
}

void appendNames(std::vector<std::string>& names, const char** list) {
    for (; list != nullptr && *list != nullptr; ++list) {
        names.emplace_back(*list);
    }
}

// From here on only keys and the properties of the list can be set; what is there of others goes. `keys`
// names keys that neither the class nor the path tells.
void setPropertyFilter(Instance& instance, const char** properties, const char** keys) {
    std::vector<std::string> filter;
    appendNames(filter, properties);
    appendNames(filter, keys);
    if (properties != nullptr) {
        instance.setFilter(std::move(filter));
    } else {
        instance.isFiltered = false;
    }
}

} // namespace

const CMPIObjectPathFT ObjectPath::table = {
    CMPICurrentVersion,
    SLOT(CMPIObjectPathFT, release, releaseObject<ObjectPath>),
    SLOT(CMPIObjectPathFT, clone, cloneObject<ObjectPath>),
    SLOT(CMPIObjectPathFT, setNameSpace, setNameSpace),
    SLOT(CMPIObjectPathFT, getNameSpace, getNameSpace),
    SLOT(CMPIObjectPathFT, setHostname, setHostname),
    SLOT(CMPIObjectPathFT, getHostname, getHostname),
    SLOT(CMPIObjectPathFT, setClassName, setClassName),
    SLOT(CMPIObjectPathFT, getClassName, getClassName),
    SLOT(CMPIObjectPathFT, addKey, addKey),
    SLOT(CMPIObjectPathFT, getKey, getKey),
    SLOT(CMPIObjectPathFT, getKeyAt, getKeyAt),
    SLOT(CMPIObjectPathFT, getKeyCount, getKeyCount),
    SLOT(CMPIObjectPathFT, setNameSpaceFromObjectPath, setNameSpaceFrom),
    SLOT(CMPIObjectPathFT, setHostAndNameSpaceFromObjectPath, setHostAndNameSpaceFrom),
    SLOT(CMPIObjectPathFT, getClassQualifier, getClassQualifier),
    SLOT(CMPIObjectPathFT, getPropertyQualifier, getPropertyQualifier),
    SLOT(CMPIObjectPathFT, getMethodQualifier, getMethodQualifier),
    SLOT(CMPIObjectPathFT, getParameterQualifier, getParameterQualifier),
    SLOT(CMPIObjectPathFT, toString, toString),
};

const CMPIInstanceFT Instance::table = {
    CMPICurrentVersion,
    SLOT(CMPIInstanceFT, release, releaseObject<Instance>),
    SLOT(CMPIInstanceFT, clone, cloneObject<Instance>),
    SLOT(CMPIInstanceFT, getProperty, getProperty),
    SLOT(CMPIInstanceFT, getPropertyAt, getPropertyAt),
    SLOT(CMPIInstanceFT, getPropertyCount, getPropertyCount),
    SLOT(CMPIInstanceFT, setProperty, setProperty),
    SLOT(CMPIInstanceFT, getObjectPath, getObjectPath),
    SLOT(CMPIInstanceFT, setPropertyFilter, setPropertyFilter),
    SLOT(CMPIInstanceFT, setObjectPath, setObjectPath),
    SLOT(CMPIInstanceFT, setPropertyWithOrigin, setPropertyWithOrigin),
};

} // namespace oxahv
