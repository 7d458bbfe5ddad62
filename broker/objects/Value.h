// CMPI values that own their texts and objects, and lists of them by name: keys, properties, arguments.
#pragma once

#include "objects/Object.h"
#include "text/Integers.h"

#include <algorithm>
#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace oxahv {

// The member of a value that its type says, and no byte more: the caller may have no whole value. Of a
// `CMPI_chars` the pointer itself.
CMPIValue memberOf(const CMPIValue* value, CMPIType type);

// The type under which values of a type are stored: texts are CMPI_string, their arrays CMPI_stringA.
CMPIType storedType(CMPIType type);

// A CMPI value that owns its text or object.
class Value {
public:
    Value() = default;
    Value(const Value& other) { *this = other; }
    Value(Value&&) noexcept = default;
    Value& operator=(const Value& other);
    Value& operator=(Value&&) noexcept = default;
    ~Value() = default;

    // A NULL of a type.
    static Value null(CMPIType type);
    // A copy of what the caller of a slot passed: `value` may be null, and of `CMPI_chars` is the text
    // itself.
    static Value from(Core& core, const CMPIValue* value, CMPIType type);
    static Value number(const CMPIValue& value, CMPIType type);
    static Value text(Core& core, std::string text, CMPIType type = CMPI_string);

    CMPIType type() const { return type_; }
    bool isNull() const { return isNull_; }
    // What a slot hands out. Texts and objects in it stay this value's.
    CMPIData data(CMPIValueState state = CMPI_goodValue) const;
    // A text as `CMPI_chars`, or as `CMPI_string` again.
    void retype(CMPIType type) { type_ = type; }
    // The number of an integer that is not NULL.
    WideInteger integer() const;
    // A key, which may have come as the KeyMode has it, as a property of a type: a text as `CMPI_string`, an
    // integer of the widest type or in a text as the declared one where it fits.
    Value asProperty(CMPIType declared) const;

private:
    CMPIType type_ = CMPI_null;
    bool isNull_ = true;
    CMPIValue plain_ = {};
    std::unique_ptr<Object> object_;
};

struct NamedValue {
    std::string name;
    Value value;
};

// Keys, properties, arguments, context entries: values by name, in the order in which the names came.
class NamedValues {
public:
    const NamedValue* find(std::string_view name) const;
    void set(std::string_view name, Value value);
    std::size_t size() const { return values_.size(); }
    // Throws CMPI_RC_ERR_NOT_FOUND for an index out of range.
    const NamedValue& at(std::size_t index) const;
    // Removes the others. `isKept` takes a name.
    template <class Predicate>
    void keepOnly(const Predicate& isKept) {
        const auto end = std::remove_if(values_.begin(), values_.end(),
                                        [&](const NamedValue& named) { return !isKept(named.name); });
        values_.erase(end, values_.end());
    }
    auto begin() const { return values_.begin(); }
    auto end() const { return values_.end(); }
    auto begin() { return values_.begin(); }
    auto end() { return values_.end(); }

private:
    std::vector<NamedValue> values_;
};

} // namespace oxahv
