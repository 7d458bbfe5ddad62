#include "objects/Records.h"

#include "Core.h"
#include "query/SelectExpression.h"

#include <algorithm>
#include <cstring>
#include <iterator>

namespace oxahv {

// What every record begins with. The records are types of their own, so their bytes are copied: reading them
// all through one structure would break the aliasing rule.
struct RecordHead {
    void* object;
    const void* table;
};

static RecordHead headOf(const void* handle) {
    RecordHead head{};
    std::memcpy(&head, handle, sizeof head);
    return head;
}

bool isRecord(const void* handle) {
    static const void* const tables[] = {
        &String::table,          &Array::table,        &DateTime::table,   &Arguments::table,
        &Context::table,         &Enumeration::table,  &ObjectPath::table, &Instance::table,
        &Result::table,          &PropertyList::table, &Error::table,      &SelectExpression::table,
        &SelectCondition::table, &SubCondition::table, &Predicate::table};
    return std::find(std::begin(tables), std::end(tables), headOf(handle).table) != std::end(tables);
}

Object* objectOf(const void* handle) {
    const bool isAlive = handle != nullptr && isRecord(handle) && Quarantine::of(handle) == nullptr;
    return isAlive ? static_cast<Object*>(headOf(handle).object) : nullptr;
}

Array::Array(Core& core, CMPIType type, std::size_t size)
    : RecordedObject(core), elementType(storedType(type)), elements(size, Value::null(type)) {}

std::unique_ptr<Object> Array::clone() const {
    auto copy = std::make_unique<Array>(core(), elementType, 0);
    copy->elements = elements;
    return copy;
}

std::unique_ptr<Object> Arguments::clone() const {
    auto copy = std::make_unique<Arguments>(core());
    copy->values = values;
    return copy;
}

std::unique_ptr<Object> Context::clone() const {
    auto copy = std::make_unique<Context>(core());
    copy->values = values;
    return copy;
}

std::unique_ptr<Object> Enumeration::clone() const {
    auto copy = std::make_unique<Enumeration>(core(), elementType);
    copy->elements = elements;
    copy->next = next;
    return copy;
}

std::unique_ptr<ObjectPath> ObjectPath::copy() const {
    auto copy = std::make_unique<ObjectPath>(core(), nameSpace, className);
    copy->hostName = hostName;
    copy->keys = keys;
    return copy;
}

std::unique_ptr<Object> Instance::clone() const {
    auto copy = std::make_unique<Instance>(core(), path->copy());
    copy->properties = properties;
    copy->isFiltered = isFiltered;
    copy->filter = filter;
    return copy;
}

void ObjectPath::declareKeys() {
    const auto declared = core().classes.find(className);
    const auto declaredType = [&](const NamedValue& key) {
        const PropertyDeclaration* const property = declared != nullptr ? declared->find(key.name) : nullptr;
        return property != nullptr ? property->type : CMPIType{CMPI_null};
    };
    bool isAsDeclared = true; // most are: then there is nothing to make anew
    for (const NamedValue& key : keys) {
        const CMPIType type = declaredType(key);
        isAsDeclared =
            isAsDeclared && key.value.type() != CMPI_chars && (type == CMPI_null || type == key.value.type());
    }
    if (!isAsDeclared) {
        keys.rebuild([&](NamedValues& changed, const NamedValue& key) {
            changed.set(key.name, key.value.asProperty(declaredType(key)));
        });
    }
}

const DeclaredClass* Instance::declaredClass() const {
    const DeclaredClass* declared = declared_.load(std::memory_order_relaxed);
    if (declared == nullptr) {
        declared = core().classes.find(path->className);
        declared_.store(declared, std::memory_order_relaxed);
    }
    return declared;
}

void Instance::setPath(std::unique_ptr<ObjectPath> newPath) {
    path = std::move(newPath);
    declared_.store(nullptr, std::memory_order_relaxed);
    path->declareKeys();
    if (core().newInstances.load(std::memory_order_relaxed) == NewInstances::full) {
        for (const NamedValue& key : path->keys) {
            properties.set(key.name, key.value);
        }
    }
}

bool Instance::isKey(const DeclaredClass* declared, std::string_view name) const {
    const PropertyDeclaration* const property = declared != nullptr ? declared->find(name) : nullptr;
    return property != nullptr ? property->isKey : path->keys.find(name).has_value();
}

bool Instance::passesFilter(const DeclaredClass* declared, std::string_view name) const {
    return !isFiltered || isKey(declared, name) ||
           std::any_of(filter.begin(), filter.end(),
                       [&](const std::string& wanted) { return sameName(wanted, name); });
}

void Instance::setFilter(std::vector<std::string> names) {
    filter = std::move(names);
    isFiltered = true;
    const DeclaredClass* const declared = declaredClass();
    properties.keepOnly([&](const std::string& name) { return passesFilter(declared, name); });
}

// A handler's own objects die with the result that it is called for.
template <class Class, class Handle>
void Result::add(Exposed<Class> copy, std::vector<Handle*>& kept,
                 const std::function<void(const Handle*)>* handler) {
    ++count;
    if (handler != nullptr && *handler) {
        Owner own(core());
        const Owner::Scope scope(own);
        const Hooks::Pause pause;
        (*handler)(copy.get());
        keeper.countResult();
    } else {
        kept.push_back(copy.get());
        keeper.adopt(std::unique_ptr<Object>(copy.release()));
    }
    if (receiver != nullptr && receiver->progress) {
        receiver->progress(earlier + count);
    }
}

void Result::add(const Instance& instance) {
    add(Exposed<Instance>(static_cast<Instance*>(instance.clone().release())), reply.instances,
        receiver != nullptr ? &receiver->instances : nullptr);
}

void Result::add(const ObjectPath& path) {
    Exposed<ObjectPath> copy(path.copy().release());
    copy->declareKeys();
    add(std::move(copy), reply.objectPaths, receiver != nullptr ? &receiver->paths : nullptr);
}

PropertyList::PropertyList(Core& core, std::vector<std::string> list)
    : RecordedObject(core), names(std::move(list)) {
    for (const std::string& name : names) {
        pointers.push_back(name.c_str());
    }
    pointers.push_back(nullptr);
}

std::unique_ptr<Object> Error::clone() const {
    auto copy = std::make_unique<Error>(core());
    copy->type = type;
    copy->severity = severity;
    copy->probableCause = probableCause;
    copy->sourceFormat = sourceFormat;
    copy->statusCode = statusCode;
    copy->otherType = otherType;
    copy->owningEntity = owningEntity;
    copy->messageId = messageId;
    copy->message = message;
    copy->probableCauseDescription = probableCauseDescription;
    copy->source = source;
    copy->otherSourceFormat = otherSourceFormat;
    copy->statusCodeDescription = statusCodeDescription;
    copy->recommendedActions = recommendedActions;
    copy->messageArguments = messageArguments;
    return copy;
}

namespace {

// Objects within each other, counted as long as they can be copied; `most` are left.
bool isShallow(const Object& object, std::size_t most);

bool isShallow(const Value& value, std::size_t most) {
    const auto element = static_cast<CMPIType>(value.type() & ~CMPI_ARRAY);
    const bool canNest = element == CMPI_instance || element == CMPI_ref || element == CMPI_args;
    return !canNest || value.isNull() || isShallow(*objectOf(value.data().value.inst), most);
}

bool isShallow(const NamedValues& values, std::size_t most) {
    for (const NamedValue& named : values) {
        if (!isShallow(named.value, most)) {
            return false;
        }
    }
    return true;
}

bool isShallow(const Object& object, std::size_t most) {
    if (most == 0) {
        return false;
    }
    switch (object.kind()) {
    case Kind::instance: {
        const auto& instance = static_cast<const Instance&>(object);
        return isShallow(instance.properties, most - 1) && isShallow(instance.path->keys, most - 1);
    }
    case Kind::objectPath:
        return isShallow(static_cast<const ObjectPath&>(object).keys, most - 1);
    case Kind::arguments:
        return isShallow(static_cast<const Arguments&>(object).values, most - 1);
    case Kind::array: {
        const auto& elements = static_cast<const Array&>(object).elements;
        return std::all_of(elements.begin(), elements.end(),
                           [&](const Value& element) { return isShallow(element, most - 1); });
    }
    default:
        return true;
    }
}

} // namespace

void requireShallow(const Object& object) {
    constexpr std::size_t most = 200; // an instance of each two is in an array
    if (!isShallow(object, most)) {
        failWith(CMPI_RC_ERR_INVALID_PARAMETER, "values are nested more than 200 deep");
    }
}

CMPIData keep(Core& core, Value value) {
    auto holder = std::make_unique<Array>(core, value.type(), 0);
    holder->elements.push_back(std::move(value));
    return handOut(std::move(holder))->elements.front().data();
}

} // namespace oxahv
