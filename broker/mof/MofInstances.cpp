#include "mof/MofInstances.h"

#include "Core.h"
#include "mof/MofValues.h"
#include "text/PathText.h"

namespace oxahv {

namespace {

Value embedded(Core& core, const Instance& instance) {
    CMPIValue value = {};
    value.inst = const_cast<Instance*>(&instance);
    return Value::from(core, &value, CMPI_instance);
}

// Makes values for the properties of one instance.
class ValueMaker {
public:
    ValueMaker(Core& core, const MofSource& source, const std::string& nameSpace)
        : core_(core), source_(source), nameSpace_(nameSpace) {}

    Value make(const MofValue& written, const PropertyDeclaration& property) const {
        const ValueType type = valueTypeOf(property);
        Value value = make(written, type.type);
        if (!value.isNull() && !hasType(core_.classes, value, type)) {
            source_.fail(written.offset, "expected an instance of " + std::string(type.embeddedClass));
        }
        return value;
    }

    Value make(const MofValue& written, CMPIType type) const {
        const auto element = static_cast<CMPIType>(type & ~CMPI_ARRAY);
        if (element == CMPI_instance) {
            return makeEmbedded(written, type);
        }
        return make(mofValueOf(source_, written, type));
    }

    // Of a value whose declaration is checked.
    Value make(const DeclaredValue& declared) const {
        if (declared.isNull) {
            return Value::null(declared.type);
        }
        if (declared.type == CMPI_ref) {
            const auto& path = std::get<std::string>(declared.elements.front());
            return readValue(core_, path, CMPI_ref);
        }
        Owner own(core_); // of what the value is copied from
        const Owner::Scope scope(own);
        const CMPIData data = dataOf(core_, declared);
        return Value::from(core_, &data.value, data.type);
    }

private:
    static bool isNullWord(const MofToken& constant) {
        return constant.kind == MofKind::word && sameName(constant.spelling, "null");
    }

    Value makeEmbedded(const MofValue& written, CMPIType type) const {
        if (!written.isArray && isNullWord(written.constants.front())) {
            return Value::null(type);
        }
        if (written.isArray != ((type & CMPI_ARRAY) != 0)) {
            source_.fail(written.offset,
                         written.isArray ? "expected one instance" : "expected an array in braces");
        }
        Array array(core_, CMPI_instance, 0);
        auto instance = written.instances.begin();
        for (const MofToken& constant : written.constants) {
            if (isNullWord(constant)) {
                array.elements.push_back(Value::null(CMPI_instance));
            } else if (constant.kind == MofKind::text) {
                array.elements.push_back(embedded(core_, *readText(constant)));
            } else if (constant.kind == MofKind::word && sameName(constant.spelling, "instance")) {
                array.elements.push_back(
                    embedded(core_, *instanceOf(core_, source_, *instance++, nameSpace_)));
            } else {
                source_.fail(constant.offset, "expected an instance");
            }
        }
        if (!written.isArray) {
            return std::move(array.elements.front());
        }
        CMPIValue value = {};
        value.array = &array;
        return Value::from(core_, &value, CMPI_instanceA);
    }

    // An error in the text is one of the place where it begins.
    std::unique_ptr<Instance> readText(const MofToken& constant) const {
        try {
            return readInstance(core_, {"its text", constant.text}, nameSpace_);
        } catch (const BrokerError& error) {
            source_.fail(constant.offset, error.what());
        }
    }

    Core& core_;
    const MofSource& source_;
    const std::string& nameSpace_;
};

// The path of the properties that are keys.
std::unique_ptr<ObjectPath> pathOf(const Instance& instance, const DeclaredClass* declared) {
    std::unique_ptr<ObjectPath> path = instance.path->copy();
    for (const NamedValue& property : instance.properties) {
        if (!property.value.isNull() && instance.isKey(declared, property.name)) {
            path->keys.set(property.name, property.value);
        }
    }
    return path;
}

} // namespace

std::unique_ptr<Instance> instanceOf(Core& core, const MofSource& source, const MofInstance& written,
                                     const std::string& nameSpace) {
    const std::string& className = written.className.text;
    const auto declared = core.classes.find(className);
    if (declared == nullptr && core.classes.any()) {
        source.fail(written.className.offset, "class " + className + " is not declared");
    }
    const ValueMaker maker(core, source, nameSpace);
    auto instance =
        std::make_unique<Instance>(core, std::make_unique<ObjectPath>(core, nameSpace, className));
    if (declared != nullptr) {
        for (const PropertyDeclaration& property : declared->properties) {
            const CMPIType type = valueType(property.type, property.qualifiers);
            const bool hasDefault = property.defaultValue.type != CMPI_null && type == property.type;
            instance->properties.set(property.name,
                                     hasDefault ? maker.make(property.defaultValue) : Value::null(type));
        }
    }
    for (const MofAssignment& assignment : written.properties) {
        const std::string& name = assignment.name.text;
        const PropertyDeclaration* const property = declared != nullptr ? declared->find(name) : nullptr;
        if (declared != nullptr && property == nullptr) {
            source.fail(assignment.name.offset, "class " + className + " has no property " + name);
        }
        instance->properties.set(name, property != nullptr
                                           ? maker.make(assignment.value, *property)
                                           : maker.make(assignment.value, mofTypeOf(assignment.value)));
    }
    instance->path = pathOf(*instance, declared != nullptr ? &*declared : nullptr);
    return instance;
}

std::unique_ptr<Instance> readInstance(Core& core, const MofSource& source, const std::string& nameSpace) {
    return instanceOf(core, source, MofParser(source).readOnlyInstance(), nameSpace);
}

} // namespace oxahv
