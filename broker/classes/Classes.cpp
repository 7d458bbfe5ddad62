#include "classes/Classes.h"

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
        values.push_back(Value::null(property.type));
    }
    return {declared.propertyNames, std::move(values)};
}

Value checkedValue(Core& core, const CMPIValue* value, CMPIType type, CMPIType declared) {
    if (value == nullptr || type == CMPI_null) {
        return Value::null(declared);
    }
    Value result = Value::from(core, value, type);
    if (result.type() != storedType(declared)) {
        throw Failure{CMPI_RC_ERR_TYPE_MISMATCH};
    }
    return result;
}

} // namespace oxahv
