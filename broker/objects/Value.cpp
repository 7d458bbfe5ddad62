#include "objects/Value.h"

#include "objects/Records.h"

#include <algorithm>
#include <charconv>
#include <cstring>
#include <new>
#include <optional>

namespace oxahv {

namespace {

// The object in a value, null when there is none.
const Object* objectIn(const void* handle) {
    const Object* const object = objectOf(handle);
    if (object == nullptr && handle != nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    if (object != nullptr) {
        requireShallow(*object);
    }
    return object;
}

// The object kind that a type's handles have.
Kind kindOf(CMPIType type) {
    if ((type & CMPI_ARRAY) != 0) {
        return Kind::array;
    }
    switch (type) {
    case CMPI_instance:
        return Kind::instance;
    case CMPI_ref:
        return Kind::objectPath;
    case CMPI_args:
        return Kind::arguments;
    case CMPI_enumeration:
        return Kind::enumeration;
    case CMPI_string:
        return Kind::string;
    case CMPI_dateTime:
        return Kind::dateTime;
    default:
        return Kind::other;
    }
}

// The number that a text is, all of it; none for any other text.
std::optional<WideInteger> decimal(std::string_view text) {
    WideInteger number;
    number.isNegative = !text.empty() && text.front() == '-';
    const char* const end = text.data() + text.size();
    const auto [after, error] =
        std::from_chars(text.data() + (number.isNegative ? 1 : 0), end, number.magnitude);
    return error == std::errc() && after == end ? std::optional(number) : std::nullopt;
}

// Copies the one member that holds a plain value: the caller may have no more than that.
bool copyPlain(CMPIValue& to, const CMPIValue& from, CMPIType type) {
    switch (type) {
    case CMPI_boolean:
        to.boolean = from.boolean;
        return true;
    case CMPI_uint8:
    case CMPI_sint8:
        to.uint8 = from.uint8;
        return true;
    case CMPI_char16:
    case CMPI_uint16:
    case CMPI_sint16:
        to.uint16 = from.uint16;
        return true;
    case CMPI_uint32:
    case CMPI_sint32:
        to.uint32 = from.uint32;
        return true;
    case CMPI_real32:
        to.real32 = from.real32;
        return true;
    case CMPI_uint64:
    case CMPI_sint64:
        to.uint64 = from.uint64;
        return true;
    case CMPI_real64:
        to.real64 = from.real64;
        return true;
    default:
        return false;
    }
}

} // namespace

CMPIValue memberOf(const CMPIValue* value, CMPIType type) {
    CMPIValue result = {};
    if (value == nullptr || type == CMPI_null || copyPlain(result, *value, type)) {
        return result;
    }
    if (type == CMPI_chars) {
        result.chars = reinterpret_cast<char*>(const_cast<CMPIValue*>(value));
    } else if (type == CMPI_ptr || type == CMPI_charsptr) {
        result.dataPtr = value->dataPtr;
    } else {
        result.string = value->string; // all handles stand in the same place
    }
    return result;
}

Value::Value(const Value& other) : type_(other.type_), holds_(other.holds_), bits_(0) {
    if (holds_ == Holds::text) {
        new (&text_) SharedText(other.text_);
    } else if (holds_ == Holds::object) {
        object_ = other.object_->clone().release();
    } else {
        bits_ = other.bits_;
    }
}

Value::~Value() {
    if (holds_ == Holds::text) {
        text_.~SharedText();
    } else if (holds_ == Holds::object) {
        bury(object_);
    }
}

// Bytes may change places, whatever the values hold: each is a number or one pointer.
void Value::swap(Value& other) noexcept {
    static_assert(sizeof(SharedText) == sizeof bits_ && sizeof object_ == sizeof bits_);
    std::swap(type_, other.type_);
    std::swap(holds_, other.holds_);
    unsigned char bytes[sizeof bits_];
    std::memcpy(bytes, &bits_, sizeof bits_);
    std::memcpy(static_cast<void*>(&bits_), &other.bits_, sizeof bits_);
    std::memcpy(static_cast<void*>(&other.bits_), bytes, sizeof bits_);
}

CMPIValue Value::plain() const {
    CMPIValue value = {};
    value.uint64 = bits_;
    return value;
}

CMPIType storedType(CMPIType type) {
    const auto element = static_cast<CMPIType>(type & ~CMPI_ARRAY);
    const bool isText = element == CMPI_chars || element == CMPI_charsptr;
    return isText ? static_cast<CMPIType>(CMPI_string | (type & CMPI_ARRAY)) : type;
}

Value Value::null(CMPIType type) {
    Value result;
    result.type_ = storedType(type);
    return result;
}

Value Value::number(const CMPIValue& value, CMPIType type) {
    Value result;
    result.type_ = type;
    result.holds_ = Holds::plain;
    result.bits_ = value.uint64;
    return result;
}

Value Value::text(Core& core, std::string_view text, CMPIType type) {
    Value result;
    new (&result.text_) SharedText(core, text);
    result.type_ = type;
    result.holds_ = Holds::text;
    return result;
}

Value Value::from(Core& core, const CMPIValue* value, CMPIType type) {
    if (value == nullptr || type == CMPI_null) {
        return null(type);
    }
    if (type == CMPI_chars) {
        return text(core, reinterpret_cast<const char*>(value));
    }
    if (type == CMPI_charsptr) {
        const CMPIValuePtr& pointer = value->dataPtr;
        return pointer.ptr == nullptr
                   ? null(CMPI_string)
                   : text(core, std::string_view(static_cast<const char*>(pointer.ptr), pointer.length));
    }
    CMPIValue plain = {};
    if (copyPlain(plain, *value, type)) {
        return number(plain, type);
    }
    if (const String* const string = type == CMPI_string ? String::of(value->string) : nullptr) {
        return text(core, string->text);
    }
    const Kind kind = kindOf(type);
    if (kind == Kind::other) {
        throw Failure{CMPI_RC_ERR_INVALID_DATA_TYPE};
    }
    Value result = null(type);
    if (const Object* const object = objectIn(value->string)) { // all handles stand in the same place
        if (object->kind() != kind ||
            (kind == Kind::array && static_cast<const Array*>(object)->type() != result.type_)) {
            throw Failure{CMPI_RC_ERR_TYPE_MISMATCH};
        }
        result.object_ = object->clone().release();
        result.holds_ = Holds::object;
    }
    return result;
}

WideInteger Value::integer() const {
    const IntegerType& type = *integerType(type_);
    const unsigned int unused = 64U - type.bits;
    const unsigned long long low = bits_ << unused;
    if (!type.isSigned) {
        return {low >> unused, false};
    }
    const long long number = static_cast<long long>(low) >> unused;
    const auto magnitude = static_cast<unsigned long long>(number);
    return {number < 0 ? 0U - magnitude : magnitude, number < 0};
}

Value Value::asProperty(CMPIType declared) const {
    Value result = *this;
    result.type_ = storedType(type_);
    const IntegerType* const wanted = integerType(declared);
    if (isNull() || wanted == nullptr) {
        return result;
    }
    std::optional<WideInteger> number;
    if (type_ == CMPI_sint64 && declared == CMPI_uint64) {
        number = {bits_, false}; // the bits are those of a number that did not fit
    } else if (type_ == CMPI_sint64 || type_ == CMPI_uint64) {
        number = integer();
    } else if (result.type_ == CMPI_string) {
        number = decimal(text_.view());
    }
    if (number && wanted->holds(number->magnitude, number->isNegative)) {
        CMPIValue value = {};
        value.uint64 = number->bits();
        return Value::number(value, declared);
    }
    return result;
}

CMPIData Value::data(CMPIValueState state) const {
    CMPIData result = {type_, state, {}};
    switch (holds_) {
    case Holds::nothing:
        result.state = static_cast<CMPIValueState>(state | CMPI_nullValue);
        break;
    case Holds::plain:
        result.value = plain();
        break;
    case Holds::text:
        if (type_ == CMPI_chars) {
            result.value.chars = const_cast<char*>(text_.chars());
        } else {
            result.value.string = &text_.object();
        }
        break;
    case Holds::object:
        result.value.string = static_cast<CMPIString*>(object_->record());
        break;
    }
    return result;
}

} // namespace oxahv
