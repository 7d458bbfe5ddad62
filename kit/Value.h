/**
 * @file
 * oxahv::Value, what a key, property or output argument is set to, and oxahv::Key, a key with its name.
 *
 * A provider hardly ever names either: every function of the kit that sets something takes a Value, and what
 * is passed to it becomes one.
 *
 * @code
 * instance.set("Speed", 1000000000ULL).set("FullDuplex", true).set("InstallDate",
 * std::chrono::system_clock::now());
 * @endcode
 *
 * | C++ | CIM |
 * |---|---|
 * | `bool` | boolean |
 * | integers of 8 to 64 bits, enumerations by their underlying type | sint8 to uint64 |
 * | `char16_t` | char16 |
 * | `float`, `double` | real32, real64 |
 * | `const char*`, `std::string`, `std::string_view` (UTF-8) | string |
 * | `const wchar_t*`, `std::wstring`, `std::wstring_view` | string |
 * | `std::chrono::system_clock::time_point` of any precision; TK::DateTime | datetime, a point in time |
 * | `std::chrono::duration` | datetime, an interval |
 * | oxahv::Path, `CMPIObjectPath*` | reference |
 * | oxahv::Instance, `CMPIInstance*` | embedded instance |
 * | `std::vector`, `std::array`, a list in braces, of any of these | array |
 * | `std::optional` of any of these | the value, or NULL |
 * | `nullptr`, `std::nullopt`, a null pointer | NULL |
 * | `CMPIData`, `CMPIString*`, `CMPIDateTime*` | as it is |
 *
 * A number that the broker refuses for its type alone is offered in the other integer types (or the other
 * real type) that hold it, so that `set("Port", 80)` sets a uint16 where the class declares one.
 */
#pragma once

#include "detail/Read.h"

#include <array>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

namespace TK {
class DateTime;
}

namespace oxahv {

class Path;
class Instance;

namespace detail {
struct ValueAccess;

// Microseconds, rounded down: of an interval, or since 1970 in UTC.
using Microseconds = std::chrono::duration<std::int64_t, std::micro>;

template <class Integer>
constexpr CMPIType integerType() {
    constexpr int wide = sizeof(Integer) == 8 ? 3 : sizeof(Integer) == 4 ? 2 : sizeof(Integer) == 2 ? 1 : 0;
    // The codes of the widths are a step of 0x10 apart.
    return static_cast<CMPIType>((std::is_signed_v<Integer> ? CMPI_sint8 : CMPI_uint8) + 0x10 * wide);
}

// The CIM type of a C++ type, also where there is no value: of an empty std::optional or std::vector.
template <class T>
struct TypeOf {
    static constexpr CMPIType code = std::is_convertible_v<const T&, std::string_view> ||
                                             std::is_convertible_v<const T&, std::wstring_view>
                                         ? CMPI_string
                                         : CMPI_null;
};
template <>
struct TypeOf<bool> {
    static constexpr CMPIType code = CMPI_boolean;
};
template <>
struct TypeOf<char16_t> {
    static constexpr CMPIType code = CMPI_char16;
};
template <>
struct TypeOf<float> {
    static constexpr CMPIType code = CMPI_real32;
};
template <>
struct TypeOf<double> {
    static constexpr CMPIType code = CMPI_real64;
};
template <>
struct TypeOf<TK::DateTime> {
    static constexpr CMPIType code = CMPI_dateTime;
};
template <class Rep, class Period>
struct TypeOf<std::chrono::duration<Rep, Period>> {
    static constexpr CMPIType code = CMPI_dateTime;
};
template <class Duration>
struct TypeOf<std::chrono::time_point<std::chrono::system_clock, Duration>> {
    static constexpr CMPIType code = CMPI_dateTime;
};
template <>
struct TypeOf<Path> {
    static constexpr CMPIType code = CMPI_ref;
};
template <>
struct TypeOf<CMPIObjectPath*> {
    static constexpr CMPIType code = CMPI_ref;
};
template <>
struct TypeOf<Instance> {
    static constexpr CMPIType code = CMPI_instance;
};
template <>
struct TypeOf<CMPIInstance*> {
    static constexpr CMPIType code = CMPI_instance;
};
template <class T>
struct TypeOf<std::optional<T>> : TypeOf<T> {};

template <class T>
constexpr CMPIType typeOf() {
    if constexpr (std::is_enum_v<T>) {
        return integerType<std::underlying_type_t<T>>();
    } else if constexpr (std::is_integral_v<T> && !std::is_same_v<T, bool> && !std::is_same_v<T, char16_t>) {
        return integerType<T>();
    } else {
        return TypeOf<T>::code;
    }
}
} // namespace detail

/**
 * A value on its way to the broker; see the top of Value.h. It refers to what it was made from, and is
 * therefore good as an argument only: it cannot be copied or kept.
 */
class Value {
public:
    Value& operator=(const Value&) = delete;

    /** @name From a C++ value
     * Texts, dates, paths, instances and arrays are read when the value is set.
     */
    /** @{ */
    /** NULL. */
    Value(std::nullptr_t /*null*/) {}
    /** NULL. */
    Value(std::nullopt_t /*null*/) {}
    /**
     * A boolean, an integer of its own width and sign, a character of 16 bits, a real, or an enumerator by
     * the underlying type. `char` and `wchar_t` are characters of a text and no values of CIM.
     */
    template <class T, std::enable_if_t<std::is_arithmetic_v<T> || std::is_enum_v<T>, int> = 0>
    Value(T value) : type_(detail::typeOf<T>()) {
        static_assert(!std::is_same_v<T, char> && !std::is_same_v<T, wchar_t> &&
                          !std::is_same_v<T, char32_t> && !std::is_same_v<T, long double>,
                      "CIM has no such type");
        if constexpr (std::is_floating_point_v<T>) {
            form_ = Form::real;
            real_ = value;
        } else {
            form_ = Form::integer;
            // NOLINTNEXTLINE(bugprone-signed-char-misuse): a number of CIM, in two's complement
            integer_ = static_cast<std::uint64_t>(value);
        }
    }
    /** A text in UTF-8; null is NULL. */
    Value(const char* value) : form_(value != nullptr ? Form::chars : Form::null), type_(CMPI_string) {
        source_ = {value, 0};
    }
    /** A text in UTF-8. One with a NUL character is refused when it is set, since CMPI would cut it there. */
    Value(const std::string& value) : form_(Form::text), type_(CMPI_string) {
        source_ = {value.c_str(), value.size()};
    }
    /** A text in UTF-8, which need not end in NUL. */
    Value(std::string_view value) : form_(Form::view), type_(CMPI_string) {
        source_ = {value.data(), value.size()};
    }
    /** A wide text; null is NULL. */
    Value(const wchar_t* value) : form_(value != nullptr ? Form::wide : Form::null), type_(CMPI_string) {
        source_ = {value, value != nullptr ? std::char_traits<wchar_t>::length(value) : 0};
    }
    /** A wide text. */
    Value(const std::wstring& value) : Value(std::wstring_view(value)) {}
    /** A wide text. One that UTF-8 cannot represent is refused when it is set. */
    Value(std::wstring_view value) : form_(Form::wide), type_(CMPI_string) {
        source_ = {value.data(), value.size()};
    }
    /** A point in time, in UTC and to the microsecond. */
    template <class Duration>
    Value(const std::chrono::time_point<std::chrono::system_clock, Duration>& value)
        : form_(Form::time), type_(CMPI_dateTime) {
        micros_ = std::chrono::floor<detail::Microseconds>(value.time_since_epoch()).count();
    }
    /** An interval, to the microsecond. A negative one is refused when it is set. */
    template <class Rep, class Period>
    Value(const std::chrono::duration<Rep, Period>& value) : form_(Form::interval), type_(CMPI_dateTime) {
        micros_ = std::chrono::floor<detail::Microseconds>(value).count();
    }
    /**
     * A point in time with its offset in **minutes**, which arrives as it is. The millisecond field is taken
     * for the six digits of the fraction, as TK::Utils reads and writes it.
     */
    Value(const TK::DateTime& value) : form_(Form::dateTime), type_(CMPI_dateTime) { source_ = {&value, 0}; }
    /** A reference. */
    Value(const Path& value);
    /** A reference; null is NULL. */
    Value(const CMPIObjectPath* value) : Value(CMPI_ref, &CMPIValue::ref, value) {}
    /** An embedded instance. */
    Value(const Instance& value);
    /** An embedded instance; null is NULL. */
    Value(const CMPIInstance* value) : Value(CMPI_instance, &CMPIValue::inst, value) {}
    /** The broker's own text; null is NULL. */
    Value(const CMPIString* value) : Value(CMPI_string, &CMPIValue::string, value) {}
    /** The broker's own date/time; null is NULL. */
    Value(const CMPIDateTime* value) : Value(CMPI_dateTime, &CMPIValue::dateTime, value) {}
    /** What the broker handed out, of whatever type. */
    Value(const CMPIData& value);
    /** The value, or NULL. */
    template <class T>
    Value(const std::optional<T>& value) : Value(value ? Value(*value) : Value(Null{detail::typeOf<T>()})) {}
    /** An array. */
    template <class T, class Allocator>
    Value(const std::vector<T, Allocator>& value)
        : Value(&value, value.size(), detail::typeOf<T>(), [](const void* all, std::size_t index) {
              // A std::vector<bool> hands out what is no bool.
              return Value(
                  static_cast<const T&>((*static_cast<const std::vector<T, Allocator>*>(all))[index]));
          }) {}
    /** An array. */
    template <class T, std::size_t size>
    Value(const std::array<T, size>& value) : Value(value.data(), size, detail::typeOf<T>(), elementOf<T>) {}
    /** An array, from a list in braces: `set("Capabilities", {1U, 2U})`. */
    template <class T>
    Value(std::initializer_list<T> value)
        : Value(value.begin(), value.size(), detail::typeOf<T>(), elementOf<T>) {}
    /** @} */

private:
    friend struct detail::ValueAccess;
    enum class Form { null, integer, real, plain, chars, text, view, wide, time, interval, dateTime, array };
    using Element = Value (*)(const void* all, std::size_t index);
    struct Source {
        const void* data;
        std::size_t size;
    };
    struct Null {
        CMPIType type;
    };

    Value(const Value&) = default;
    explicit Value(Null null) : type_(null.type) {}
    template <class Object>
    Value(CMPIType type, Object* CMPIValue::*member, const Object* object)
        : form_(object != nullptr ? Form::plain : Form::null), type_(type) {
        value_.*member = const_cast<Object*>(object);
    }
    Value(const void* all, std::size_t size, CMPIType elementType, Element element)
        : form_(Form::array), type_(static_cast<CMPIType>(elementType | CMPI_ARRAY)), element_(element) {
        source_ = {all, size};
    }
    template <class T>
    static Value elementOf(const void* all, std::size_t index) {
        return Value(static_cast<const T*>(all)[index]);
    }

    Form form_ = Form::null;
    CMPIType type_ = CMPI_null;
    Element element_ = nullptr;
    /** @cond its members, which are private, would be listed */
    union {
        CMPIValue value_ = {};
        std::uint64_t integer_;
        double real_;
        std::int64_t micros_;
        Source source_;
    };
    /** @endcond */
};

inline Value::Value(const CMPIData& value) : type_(value.type) {
    detail::Integer integer = {};
    if (detail::isNull(value)) {
        type_ = value.type == CMPI_chars ? CMPI_string : value.type;
    } else if (value.type == CMPI_chars) {
        form_ = value.value.chars != nullptr ? Form::chars : Form::null;
        type_ = CMPI_string;
        source_ = {value.value.chars, 0};
    } else if (detail::readInteger(value, integer)) {
        form_ = Form::integer;
        integer_ = integer.bits;
    } else if (value.type == CMPI_boolean || value.type == CMPI_char16) {
        form_ = Form::integer;
        integer_ = value.type == CMPI_boolean ? (value.value.boolean != 0 ? 1U : 0U) : value.value.char16;
    } else if (value.type == CMPI_real32 || value.type == CMPI_real64) {
        form_ = Form::real;
        real_ = value.type == CMPI_real32 ? value.value.real32 : value.value.real64;
    } else {
        form_ = Form::plain;
        value_ = value.value;
    }
}

/** A key of an instance, with its name, as in `{"Name", "eth0"}`. Refers to what it was made from. */
struct Key {
    const char* name; ///< the key property's name
    Value value;      ///< its value; NULL is refused, since no key is NULL
};

/** The keys of an instance, as in `{{"SystemName", host}, {"Number", 3}}`. */
using Keys = std::initializer_list<Key>;

} // namespace oxahv
