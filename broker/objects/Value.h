// CMPI values that own their texts and objects.
#pragma once

#include "objects/Object.h"
#include "objects/SharedText.h"
#include "text/Integers.h"

#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <variant>

namespace oxahv {

// The member of a value that its type says, and no byte more: the caller may have no whole value. Of a
// `CMPI_chars` the pointer itself.
CMPIValue memberOf(const CMPIValue* value, CMPIType type);

// The type under which values of a type are stored: texts are CMPI_string, their arrays CMPI_stringA.
CMPIType storedType(CMPIType type);

// A CMPI value that owns its text or object. Small, since a reply holds as many as its instances have
// properties: a text is shared with the copies, any other object is the value's own.
class Value {
public:
    Value() : bits_(0) {}
    Value(const Value& other);
    Value(Value&& other) noexcept : Value() { swap(other); }
    Value& operator=(Value other) noexcept {
        swap(other);
        return *this;
    }
    ~Value();

    // A NULL of a type.
    static Value null(CMPIType type);
    // A copy of what the caller of a slot passed: `value` may be null, and of `CMPI_chars` is the text
    // itself.
    static Value from(Core& core, const CMPIValue* value, CMPIType type);
    static Value number(const CMPIValue& value, CMPIType type);
    static Value text(Core& core, std::string_view text, CMPIType type = CMPI_string);

    CMPIType type() const { return type_; }
    bool isNull() const { return holds_ == Holds::nothing; }
    // Whether it holds an object that its user can change.
    bool holdsObject() const { return holds_ == Holds::object; }
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
    enum class Holds : unsigned char { nothing, plain, text, object };

    void swap(Value& other) noexcept;
    CMPIValue plain() const;

    CMPIType type_ = CMPI_null;
    Holds holds_ = Holds::nothing;
    union {
        unsigned long long bits_; // of a number: every plain member lies in them
        SharedText text_;
        Object* object_;
    };
};

} // namespace oxahv
