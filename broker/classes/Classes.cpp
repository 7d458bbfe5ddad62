#include "Core.h"

#include <algorithm>

#include <shared_mutex>

namespace oxahv {

void Classes::declare(const ClassDeclaration& declaration) {
    const std::lock_guard<std::mutex> changing(changing_);
    const std::unique_lock<ShardedMutex> lock(mutex_);
    declarations_.declare(declaration);
    any_.store(true, std::memory_order_release);
}

void Classes::change(const std::function<void(Declarations&)>& change) {
    const std::lock_guard<std::mutex> changing(changing_);
    Declarations changed = declarations_;
    change(changed);
    const std::unique_lock<ShardedMutex> lock(mutex_);
    std::swap(declarations_, changed);
    any_.store(declarations_.anyClass(), std::memory_order_release);
}

const DeclaredClass* Classes::find(std::string_view name) const {
    if (!any()) {
        return nullptr;
    }
    const std::shared_lock<ShardedMutex> lock(mutex_);
    return declarations_.find(name).get();
}

std::vector<std::string> Classes::names() const {
    const std::shared_lock<ShardedMutex> lock(mutex_);
    return declarations_.classNames();
}

std::vector<QualifierType> Classes::qualifierTypes() const {
    const std::shared_lock<ShardedMutex> lock(mutex_);
    return declarations_.qualifierTypes();
}

bool Classes::isA(std::string_view className, std::string_view ancestor) const {
    const DeclaredClass* const declared = find(className);
    return declared != nullptr ? declared->isA(ancestor) : sameName(className, ancestor);
}

NamedValues nullValues(const DeclaredClass& declared) {
    std::vector<Value> values;
    values.reserve(declared.properties.size());
    for (const PropertyDeclaration& property : declared.properties) {
        values.push_back(Value::null(valueType(property.type, property.qualifiers)));
    }
    return {declared.propertyNames, std::move(values)};
}

static bool isInstanceOf(const Classes& classes, const CMPIData& data, std::string_view className) {
    const Instance* const instance = CMIsNullValue(data) ? nullptr : Instance::of(data.value.inst);
    return instance == nullptr || classes.isA(instance->path->className, className);
}

bool hasType(const Classes& classes, const Value& value, const ValueType& type) {
    if (value.type() != storedType(type.type)) {
        return false;
    }
    if (type.embeddedClass.empty() || value.isNull()) {
        return true;
    }
    if (value.type() == CMPI_instance) {
        return isInstanceOf(classes, value.data(), type.embeddedClass);
    }
    const std::vector<Value>& elements = Array::of(value.data().value.array)->elements;
    return std::all_of(elements.begin(), elements.end(), [&](const Value& element) {
        return isInstanceOf(classes, element.data(), type.embeddedClass);
    });
}

Value checkedValue(Core& core, const CMPIValue* value, CMPIType type, const ValueType& declared) {
    if (value == nullptr || type == CMPI_null) {
        return Value::null(declared.type);
    }
    Value result = Value::from(core, value, type);
    if (!hasType(core.classes, result, declared)) {
        throw Failure{CMPI_RC_ERR_TYPE_MISMATCH};
    }
    return result;
}

} // namespace oxahv
