#include "objects/Value.h"

#include "objects/Records.h"

#include <algorithm>
#include <charconv>
#include <optional>

namespace oxahv {

namespace {

// A copy of the object in a value, null when there is none.
std::unique_ptr<Object> objectIn(const void* handle) {
    if (handle == nullptr) {
        return nullptr;
    }
    const Object* const object = objectOf(handle);
    if (object == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    requireShallow(*object);
    return object->clone();
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

Value& Value::operator=(const Value& other) {
    if (this != &other) {
        object_ = other.object_ != nullptr ? other.object_->clone() : nullptr;
        type_ = other.type_;
        isNull_ = other.isNull_;
        plain_ = other.plain_;
    }
    return *this;
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
    result.isNull_ = false;
    result.plain_ = value;
    return result;
}

Value Value::text(Core& core, std::string text, CMPIType type) {
    Value result;
    result.type_ = type;
    result.isNull_ = false;
    result.object_ = std::make_unique<String>(core, std::move(text));
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
                   : text(core, std::string(static_cast<const char*>(pointer.ptr), pointer.length));
    }
    Value result;
    result.type_ = storedType(type);
    if (copyPlain(result.plain_, *value, type)) {
        result.isNull_ = false;
        return result;
    }
    const Kind kind = kindOf(type);
    if (kind == Kind::other) {
        throw Failure{CMPI_RC_ERR_INVALID_DATA_TYPE};
    }
    result.object_ = objectIn(value->string); // all handles stand in the same place
    result.isNull_ = result.object_ == nullptr;
    if (!result.isNull_ &&
        (result.object_->kind() != kind ||
         (kind == Kind::array && static_cast<Array&>(*result.object_).type() != result.type_))) {
        throw Failure{CMPI_RC_ERR_TYPE_MISMATCH};
    }
    return result;
}

WideInteger Value::integer() const {
    const IntegerType& type = *integerType(type_);
    const unsigned int unused = 64U - type.bits;
    const unsigned long long low = plain_.uint64 << unused;
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
    if (isNull_ || wanted == nullptr) {
        return result;
    }
    std::optional<WideInteger> number;
    if (type_ == CMPI_sint64 && declared == CMPI_uint64) {
        number = {plain_.uint64, false}; // the bits are those of a number that did not fit
    } else if (type_ == CMPI_sint64 || type_ == CMPI_uint64) {
        number = integer();
    } else if (result.type_ == CMPI_string) {
        number = decimal(static_cast<String&>(*object_).text);
    }
    if (number && wanted->holds(number->magnitude, number->isNegative)) {
        CMPIValue value = {};
        value.uint64 = number->bits();
        return Value::number(value, declared);
    }
    return result;
}

CMPIData Value::data(CMPIValueState state) const {
    CMPIData result = {type_, state, plain_};
    if (isNull_) {
        result.state = static_cast<CMPIValueState>(state | CMPI_nullValue);
    } else if (type_ == CMPI_chars) {
        result.value.chars = static_cast<String&>(*object_).text.data();
    } else if (object_ != nullptr) {
        result.value.string = static_cast<CMPIString*>(object_->record());
    }
    return result;
}

const NamedValue* NamedValues::find(std::string_view name) const {
    const auto found = std::find_if(values_.begin(), values_.end(),
                                    [&](const NamedValue& v) { return sameName(v.name, name); });
    return found != values_.end() ? &*found : nullptr;
}

void NamedValues::set(std::string_view name, Value value) {
    for (NamedValue& named : values_) {
        if (sameName(named.name, name)) {
            named.value = std::move(value);
            return;
        }
    }
    values_.push_back({std::string(name), std::move(value)});
}

const NamedValue& NamedValues::at(std::size_t index) const {
    if (index >= values_.size()) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return values_[index];
}

} // namespace oxahv
