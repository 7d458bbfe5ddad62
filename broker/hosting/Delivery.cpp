#include "hosting/Delivery.h"

#include "objects/Records.h"
#include "text/Integers.h"

#include <algorithm>

namespace oxahv {

namespace {

Value changedInteger(Core& core, const Value& value, KeyMode mode) {
    const WideInteger number = value.integer();
    if (mode == KeyMode::text) {
        return Value::text(core, (number.isNegative ? "-" : "") + std::to_string(number.magnitude));
    }
    CMPIValue wide = {};
    wide.uint64 = number.bits();
    const bool isSigned = mode == KeyMode::signedIntegers || integerType(value.type())->isSigned;
    return Value::number(wide, isSigned ? CMPI_sint64 : CMPI_uint64);
}

void changeKey(Core& core, Value& value, KeyMode mode) {
    if (mode == KeyMode::chars) {
        if (value.type() == CMPI_string) {
            value.retype(CMPI_chars);
        }
    } else if (mode != KeyMode::exact && integerType(value.type()) != nullptr) {
        value = changedInteger(core, value, mode);
    }
}

std::string otherCase(std::string name) {
    for (char& c : name) {
        const bool isLetter = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
        c = isLetter ? static_cast<char>(c ^ ('a' ^ 'A')) : c;
    }
    return name;
}

// Changes a path as a server or a client does, and the paths among its keys.
void change(ObjectPath& path, KeyMode mode, const PathDelivery& delivery) {
    if (!delivery.hostName.empty()) {
        path.hostName = delivery.hostName;
    }
    if (delivery.reversesKeys) {
        path.keys.reverse();
    }
    path.keys.rebuild([&](NamedValues& changed, const NamedValue& key) {
        Value value = key.value;
        if (!value.isNull() && value.type() == CMPI_ref) {
            change(*ObjectPath::of(value.data().value.ref), mode, delivery);
        } else if (!value.isNull()) {
            changeKey(path.core(), value, mode);
        }
        changed.set(delivery.changesCase ? otherCase(key.name) : key.name, std::move(value));
    });
}

} // namespace

void Delivery::setPathDelivery(PathDelivery pathDelivery) {
    const std::unique_lock<ShardedMutex> lock(mutex_);
    std::swap(pathDelivery_, pathDelivery);
}

PathDelivery Delivery::pathDelivery() const {
    const std::shared_lock<ShardedMutex> lock(mutex_);
    return pathDelivery_;
}

CMPIObjectPath* Delivery::deliver(const CMPIObjectPath* handle) const {
    const ObjectPath* const path = ObjectPath::of(handle);
    if (path == nullptr) {
        return nullptr;
    }
    std::unique_ptr<ObjectPath> copy = path->copy();
    change(*copy, keyMode_.load(std::memory_order_relaxed), pathDelivery());
    return handOut(std::move(copy));
}

} // namespace oxahv
