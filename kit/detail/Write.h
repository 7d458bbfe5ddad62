// Handing values to the broker, and comparing them with those of a request.
#pragma once

#include "../Path.h"

#include <utils.h>

#include <cstring>
#include <iterator>
#include <limits>

namespace oxahv::detail {

// Where a value goes: a key, a property, an output argument or a method's result.
struct Target {
    const CMPIBroker* broker;
    const void* object;
    CMPIStatus (*put)(const void* object, const char* name, const CMPIValue* value, CMPIType type);
    const char* action; // what the broker is asked to do, such as "set property"
    const char* name;

    CMPIStatus operator()(const CMPIValue* value, CMPIType type) const {
        return put(object, name, value, type);
    }
};

[[noreturn, gnu::cold, gnu::noinline]] inline void refuse(const Target& target, const char* complaint) {
    throw Refusal(CMPI_RC_ERR_FAILED,
                  std::string("cannot ") + target.action + ' ' + target.name + ": " + complaint);
}

inline bool isIntegerType(CMPIType type) {
    return type >= CMPI_uint8 && type <= CMPI_sint64;
}

// Whether a broker's complaint is about the type alone.
inline bool isMismatch(const CMPIStatus& status) {
    return status.rc == CMPI_RC_ERR_TYPE_MISMATCH || status.rc == CMPI_RC_ERR_INVALID_DATA_TYPE;
}

// The types that a number may be meant in. Only the class says which it is, and a provider of one class has
// no cause to repeat that with every literal.
constexpr CMPIType integerTypes[] = {CMPI_uint64, CMPI_sint64, CMPI_uint32, CMPI_sint32,
                                     CMPI_uint16, CMPI_sint16, CMPI_uint8,  CMPI_sint8};
constexpr CMPIType realTypes[] = {CMPI_real64, CMPI_real32};

// Puts an integer into the member of a type; false when it does not fit.
inline bool hold(const Integer& integer, CMPIType type, CMPIValue& value) {
    const auto fits = [&](std::uint64_t highest, std::int64_t lowest) {
        return integer.isNegative ? static_cast<std::int64_t>(integer.bits) >= lowest
                                  : integer.bits <= highest;
    };
    const auto number = static_cast<std::int64_t>(integer.bits);
    switch (type) {
    case CMPI_uint8:
        value.uint8 = static_cast<CMPIUint8>(integer.bits);
        return fits(UINT8_MAX, 0);
    case CMPI_uint16:
        value.uint16 = static_cast<CMPIUint16>(integer.bits);
        return fits(UINT16_MAX, 0);
    case CMPI_uint32:
        value.uint32 = static_cast<CMPIUint32>(integer.bits);
        return fits(UINT32_MAX, 0);
    case CMPI_uint64:
        value.uint64 = integer.bits;
        return fits(UINT64_MAX, 0);
    case CMPI_sint8:
        value.sint8 = static_cast<CMPISint8>(number);
        return fits(INT8_MAX, INT8_MIN);
    case CMPI_sint16:
        value.sint16 = static_cast<CMPISint16>(number);
        return fits(INT16_MAX, INT16_MIN);
    case CMPI_sint32:
        value.sint32 = static_cast<CMPISint32>(number);
        return fits(INT32_MAX, INT32_MIN);
    case CMPI_sint64:
        value.sint64 = number;
        return fits(INT64_MAX, INT64_MIN);
    case CMPI_boolean:
        value.boolean = integer.bits != 0 ? 1 : 0;
        return true;
    default:
        value.char16 = static_cast<CMPIChar16>(integer.bits);
        return true;
    }
}

// What may look into a Value.
struct ValueAccess {
    using Form = Value::Form;

    // Hands a value over; throws what the broker answers.
    static void give(const Target& target, const Value& value);
    static void giveKey(const CMPIBroker* broker, CMPIObjectPath* path, const char* name, const Value& value);
    static void giveProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                             const Value& value);
    static void giveArgument(const CMPIBroker* broker, CMPIArgs* arguments, const char* name,
                             const Value& value);
    static void giveResult(const CMPIBroker* broker, const CMPIResult* result, const char* method,
                           const Value& value);
    // Whether the value is the one that a client sent, whatever type the server gave that; throws a Refusal
    // when the client's cannot be compared with it.
    static bool isSame(const Value& value, const Found& sent);
    // The path that the value refers to; null when it is no reference.
    static CMPIObjectPath* referenceIn(const Value& value) {
        return value.form_ == Form::plain && value.type_ == CMPI_ref ? value.value_.ref : nullptr;
    }

private:
    static Integer integerOf(const Value& value) {
        return {value.type_ >= CMPI_sint8 && value.type_ <= CMPI_sint64 && value.integer_ >> 63U != 0,
                value.integer_};
    }
    static bool isNumber(const Value& value) {
        return value.form_ == Form::real || (value.form_ == Form::integer && isIntegerType(value.type_));
    }
    static bool hold(const Value& value, CMPIType type, CMPIValue& out);
    static bool writeDate(const Value& value, DateText& text);
    static std::string narrow(const Target& target, const Value& value);
    static void resolve(const Target& target, const Value& value, CMPIType type, CMPIValue& out);
    static CMPIArray* arrayOf(const Target& target, const Value& value, CMPIType elementType);
    static bool holdsAll(const Value& array, CMPIType elementType);
    static CMPIStatus put(const Target& target, const Value& value, CMPIType type);
    static CMPIStatus putText(const Target& target, const Value& value);
    static CMPIStatus putOtherwise(const Target& target, const Value& value, const CMPIStatus& first);
};

// Puts a number into the member of a type of its kind; false when it does not fit, or is of another kind.
inline bool ValueAccess::hold(const Value& value, CMPIType type, CMPIValue& out) {
    if (value.form_ == Form::integer) {
        return type != CMPI_real32 && type != CMPI_real64 && detail::hold(integerOf(value), type, out);
    }
    if (type == CMPI_real32) {
        out.real32 = static_cast<float>(value.real_);
        return value.type_ == CMPI_real32 || static_cast<double>(out.real32) == value.real_;
    }
    out.real64 = value.real_;
    return type == CMPI_real64;
}

inline bool ValueAccess::writeDate(const Value& value, DateText& text) {
    if (value.form_ != Form::dateTime) {
        return detail::writeDate({value.form_ == Form::interval, value.micros_}, text);
    }
    // The library's formatter takes the offset for hours; so it writes the rest, and the minutes are put in
    // here.
    TK::DateTime date = *static_cast<const TK::DateTime*>(value.source_.data);
    const int offset = date.getOffset();
    date.setOffset(0);
    const std::string whole = TK::Utils::convertCIMDateTime(date);
    if (whole.size() != dateSize || offset < -999 || offset > 999) {
        return false;
    }
    std::memcpy(text, whole.c_str(), sizeof text);
    text[21] = offset < 0 ? '-' : '+';
    writeDigits(text + 22, 3, offset < 0 ? -offset : offset);
    return true;
}

// A text as UTF-8. CMPI's texts end at their first NUL.
inline std::string ValueAccess::narrow(const Target& target, const Value& value) {
    std::string text;
    if (value.form_ == Form::chars) {
        return static_cast<const char*>(value.source_.data);
    }
    if (value.form_ == Form::wide) {
        const std::wstring wide(static_cast<const wchar_t*>(value.source_.data), value.source_.size);
        if (wide.find(L'\0') != std::wstring::npos || !TK::CUtility::WStringToAString(wide, text)) {
            refuse(target, "UTF-8 cannot represent the text");
        }
        return text;
    }
    text.assign(static_cast<const char*>(value.source_.data), value.source_.size);
    if (text.find('\0') != std::string::npos) {
        refuse(target, "the text holds a NUL character");
    }
    return text;
}

// The value as CMPI's record has it, for what has to be an object of the broker.
inline void ValueAccess::resolve(const Target& target, const Value& value, CMPIType type, CMPIValue& out) {
    Status status;
    DateText date;
    switch (value.form_) {
    case Form::integer:
    case Form::real:
        if (!hold(value, type, out)) {
            refuse(target, "the number does not fit");
        }
        return;
    case Form::chars:
    case Form::text:
    case Form::view:
    case Form::wide: {
        const std::string text = narrow(target, value);
        out.string = made(CMNewString(writable(target.broker), text.c_str(), &status), status, "make a text");
        return;
    }
    case Form::time:
    case Form::interval:
    case Form::dateTime:
        if (!writeDate(value, date)) {
            refuse(target, "CIM cannot represent the date");
        }
        out.dateTime =
            made(CMNewDateTimeFromChars(writable(target.broker), date, &status), status, "make a date/time");
        return;
    case Form::array:
        out.array = arrayOf(target, value, type);
        return;
    case Form::null:
    case Form::plain:
        break;
    }
    out = value.value_;
}

inline CMPIArray* ValueAccess::arrayOf(const Target& target, const Value& value, CMPIType type) {
    const auto elementType = static_cast<CMPIType>(type & ~CMPI_ARRAY);
    const auto size = static_cast<CMPICount>(value.source_.size);
    Status status;
    CMPIArray* const array =
        made(CMNewArray(writable(target.broker), size, elementType, &status), status, "make an array");
    for (CMPICount i = 0; i < size; ++i) {
        const Value element = value.element_(value.source_.data, i);
        if (element.form_ == Form::null) {
            continue; // as a new array's elements are
        }
        CMPIValue record = {};
        resolve(target, element, elementType, record);
        require(CMSetArrayElementAt(array, i, &record, elementType), "fill an array for", target.name);
    }
    return array;
}

inline bool ValueAccess::holdsAll(const Value& array, CMPIType elementType) {
    for (std::size_t i = 0; i < array.source_.size; ++i) {
        const Value element = array.element_(array.source_.data, i);
        CMPIValue record = {};
        if (element.form_ != Form::null && !hold(element, elementType, record)) {
            return false;
        }
    }
    return true;
}

// CMPI wants a text's own pointer in the place of the value's.
inline CMPIStatus ValueAccess::putText(const Target& target, const Value& value) {
    const char* chars = static_cast<const char*>(value.source_.data);
    std::string copy;
    if (value.form_ == Form::view || value.form_ == Form::wide) {
        copy = narrow(target, value);
        chars = copy.c_str();
    } else if (value.form_ == Form::text && std::strlen(chars) != value.source_.size) {
        refuse(target, "the text holds a NUL character");
    }
    return target(reinterpret_cast<const CMPIValue*>(chars), CMPI_chars);
}

inline CMPIStatus ValueAccess::put(const Target& target, const Value& value, CMPIType type) {
    if (value.form_ == Form::null) {
        return target(nullptr, type);
    }
    CMPIValue record = {};
    resolve(target, value, type, record);
    return target(&record, type);
}

// Offers a number, an array of numbers or a NULL in the other types that hold it.
[[gnu::cold, gnu::noinline]] inline CMPIStatus ValueAccess::putOtherwise(const Target& target,
                                                                         const Value& value,
                                                                         const CMPIStatus& first) {
    if (value.form_ == Form::null) {
        return target(nullptr, CMPI_null);
    }
    const bool isArray = value.form_ == Form::array;
    const auto own = static_cast<CMPIType>(value.type_ & ~CMPI_ARRAY);
    const bool isReal = own == CMPI_real32 || own == CMPI_real64;
    if (!isReal && !isIntegerType(own)) {
        return first;
    }
    const CMPIType* const types = isReal ? realTypes : integerTypes;
    const std::size_t count = isReal ? std::size(realTypes) : std::size(integerTypes);
    for (std::size_t i = 0; i < count; ++i) {
        CMPIValue record = {};
        if (types[i] == own || !(isArray ? holdsAll(value, types[i]) : hold(value, types[i], record))) {
            continue;
        }
        const CMPIStatus status =
            put(target, value, static_cast<CMPIType>(isArray ? types[i] | CMPI_ARRAY : types[i]));
        if (!isMismatch(status)) {
            return status;
        }
    }
    return first;
}

inline void ValueAccess::give(const Target& target, const Value& value) {
    const bool isText = value.form_ == Form::chars || value.form_ == Form::text ||
                        value.form_ == Form::view || value.form_ == Form::wide;
    CMPIStatus status = isText ? putText(target, value) : put(target, value, value.type_);
    if (isMismatch(status)) {
        status = putOtherwise(target, value, status);
    }
    require(status, target.action, target.name);
}

inline void ValueAccess::giveKey(const CMPIBroker* broker, CMPIObjectPath* path, const char* name,
                                 const Value& value) {
    const Target target = {broker, path,
                           [](const void* object, const char* key, const CMPIValue* record, CMPIType type) {
                               return CMAddKey(writable(static_cast<const CMPIObjectPath*>(object)), key,
                                               writable(record), type);
                           },
                           "add key", name};
    if (value.form_ == Form::null) {
        refuse(target, "it is NULL");
    }
    give(target, value);
}

inline void ValueAccess::giveProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                      const Value& value) {
    give({broker, instance,
          [](const void* object, const char* property, const CMPIValue* record, CMPIType type) {
              return CMSetProperty(writable(static_cast<const CMPIInstance*>(object)), property,
                                   writable(record), type);
          },
          "set property", name},
         value);
}

inline void ValueAccess::giveArgument(const CMPIBroker* broker, CMPIArgs* arguments, const char* name,
                                      const Value& value) {
    give({broker, arguments,
          [](const void* object, const char* argument, const CMPIValue* record, CMPIType type) {
              return CMAddArg(writable(static_cast<const CMPIArgs*>(object)), argument, writable(record),
                              type);
          },
          "return argument", name},
         value);
}

inline void ValueAccess::giveResult(const CMPIBroker* broker, const CMPIResult* result, const char* method,
                                    const Value& value) {
    give({broker, result,
          [](const void* object, const char* /*method*/, const CMPIValue* record, CMPIType type) {
              return CMReturnData(writable(static_cast<const CMPIResult*>(object)), writable(record), type);
          },
          "return the value of", method},
         value);
}

inline bool ValueAccess::isSame(const Value& value, const Found& sent) {
    const Target target = {sent.broker, nullptr, nullptr, "compare key", sent.name};
    requireValue(sent);
    switch (value.form_) {
    case Form::integer: {
        if (value.type_ == CMPI_boolean) {
            return booleanIn(sent) == (value.integer_ != 0);
        }
        if (value.type_ == CMPI_char16) {
            return characterIn(sent) == value.integer_;
        }
        const Integer ours = integerOf(value);
        Integer theirs = {};
        // A server may hand a number over as text: one that is no number names nothing.
        const char* const chars = charsIn(sent);
        if (chars == nullptr) {
            theirs = integerIn(sent);
        } else if (readDecimal(chars, theirs) != Decimal::number) {
            return false;
        }
        return ours.isNegative == theirs.isNegative && ours.bits == theirs.bits;
    }
    case Form::real:
        return realIn(sent, std::numeric_limits<double>::max()) == value.real_;
    case Form::chars:
        return std::strcmp(static_cast<const char*>(value.source_.data), textOf(sent)) == 0;
    case Form::text:
    case Form::view:
    case Form::wide:
        return narrow(target, value) == textOf(sent);
    case Form::time:
    case Form::interval:
    case Form::dateTime: {
        DateText text;
        Date date = {};
        return writeDate(value, text) && readDate(text, date) &&
               date.micros == microsIn(sent, date.isInterval);
    }
    case Form::plain:
        if (value.type_ == CMPI_string) {
            return std::strcmp(requiredChars(value.value_.string, "hand out a text"), textOf(sent)) == 0;
        }
        if (value.type_ == CMPI_ref) {
            return Path(sent.broker, value.value_.ref).names(Path(sent.broker, detail::referenceIn(sent)));
        }
        if (value.type_ == CMPI_dateTime) {
            Found ours = sent;
            ours.data.type = CMPI_dateTime;
            ours.data.value = value.value_;
            Date date = {};
            return readDate(dateTextIn(ours), date) && date.micros == microsIn(sent, date.isInterval);
        }
        break;
    case Form::null:
    case Form::array:
        break;
    }
    refuse(target, "it is NULL or no key");
}

} // namespace oxahv::detail

namespace oxahv {

inline Path& Path::addKey(const char* name, const Value& value) {
    detail::ValueAccess::giveKey(broker_, handle_, name, value);
    return *this;
}

inline bool Path::names(const Path& other) const {
    detail::Status status;
    detail::Status otherStatus;
    const CMPICount count = CMGetKeyCount(handle_, &status);
    const CMPICount otherCount = CMGetKeyCount(other.handle_, &otherStatus);
    detail::require(status, "count the keys");
    detail::require(otherStatus, "count the keys");
    if (count != otherCount || !isClass(other.className())) {
        return false;
    }
    for (CMPICount i = 0; i < count; ++i) {
        const detail::NamedKey key(handle_, i);
        const detail::Found sent = detail::keyOf(other.broker_, other.handle_, key.name);
        if (!sent.isThere || !detail::ValueAccess::isSame(key.data, sent)) {
            return false;
        }
    }
    return true;
}

} // namespace oxahv
