// Reading keys, arguments, properties and context entries: by name, with a look at the type.
#pragma once

#include "Cmpi.h"
#include "Dates.h"

#include <Utility.h>
#include <utils.h>

#include <chrono>
#include <cmath>
#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <type_traits>
#include <vector>

namespace oxahv::detail {

// A value with the words for what it is.
struct Found {
    const CMPIBroker* broker;
    const char* kind; // such as "key"
    const char* name;
    bool isThere;
    bool mayBeText; // servers hand keys of any type over as text
    CMPIData data;

    bool isNull() const { return !isThere || detail::isNull(data); }
};

[[noreturn, gnu::cold, gnu::noinline]] inline void refuse(const Found& found, const char* complaint) {
    throw Refusal(CMPI_RC_ERR_INVALID_PARAMETER,
                  std::string(found.kind) + ' ' + found.name + ' ' + complaint);
}

inline void requireValue(const Found& found) {
    if (found.isNull()) {
        refuse(found, found.isThere ? "is NULL" : "is missing");
    }
}

// Finding

// What holds values by name.
struct Holder {
    const char* kind;
    CMPIData (*get)(const void* object, const char* name, CMPIStatus* status);
    CMPICount (*count)(const void* object, CMPIStatus* status);
    CMPIData (*getAt)(const void* object, CMPICount index, CMPIString** name, CMPIStatus* status);
};

// Some brokers compare names letter by letter; CIM ignores their case.
[[gnu::cold, gnu::noinline]] inline bool search(const Holder& holder, const void* object, Found& found) {
    Status status;
    const CMPICount count = holder.count(object, &status);
    require(status, "count what it has beside", found.name);
    for (CMPICount i = 0; i < count; ++i) {
        CMPIString* name = nullptr;
        Status statusAt;
        const CMPIData data = holder.getAt(object, i, &name, &statusAt);
        require(statusAt, "list what it has beside", found.name);
        if (sameName(requiredChars(name, "tell a name"), found.name)) {
            found.data = data;
            return true;
        }
    }
    return false;
}

inline Found find(const Holder& holder, const CMPIBroker* broker, const void* object, const char* name) {
    Status status;
    Found found = {broker, holder.kind, name, true, false, holder.get(object, name, &status)};
    if (status.failed()) {
        if (status.rc != CMPI_RC_ERR_NOT_FOUND && status.rc != CMPI_RC_ERR_NO_SUCH_PROPERTY) {
            refuse(status, "read", name);
        }
        found.isThere = search(holder, object, found);
    }
    return found;
}

// The functions of one kind of object. The CM… names may be macros.
#define OXAHV_HOLDER_(holder, kind, Handle, get, count, getAt)                                       \
    inline Holder holder() {                                                                         \
        return {kind,                                                                                \
                [](const void* object, const char* name, CMPIStatus* status) {                       \
                    return get(writable(static_cast<const Handle*>(object)), name, status);          \
                },                                                                                   \
                [](const void* object, CMPIStatus* status) {                                         \
                    return count(writable(static_cast<const Handle*>(object)), status);              \
                },                                                                                   \
                [](const void* object, CMPICount index, CMPIString** name, CMPIStatus* status) {     \
                    return getAt(writable(static_cast<const Handle*>(object)), index, name, status); \
                }};                                                                                  \
    }
OXAHV_HOLDER_(keysOfPath, "key", CMPIObjectPath, CMGetKey, CMGetKeyCount, CMGetKeyAt)
OXAHV_HOLDER_(propertiesOfInstance, "property", CMPIInstance, CMGetProperty, CMGetPropertyCount,
              CMGetPropertyAt)
OXAHV_HOLDER_(argumentsOfMethod, "argument", CMPIArgs, CMGetArg, CMGetArgCount, CMGetArgAt)
OXAHV_HOLDER_(entriesOfContext, "context entry", CMPIContext, CMGetContextEntry, CMGetContextEntryCount,
              CMGetContextEntryAt)
#undef OXAHV_HOLDER_

inline Found keyOf(const CMPIBroker* broker, const CMPIObjectPath* path, const char* name) {
    Found found = find(keysOfPath(), broker, path, name);
    found.mayBeText = true;
    return found;
}

inline Found propertyOf(const CMPIBroker* broker, const CMPIInstance* instance, const char* name) {
    return find(propertiesOfInstance(), broker, instance, name);
}

inline Found argumentOf(const CMPIBroker* broker, const CMPIArgs* arguments, const char* name) {
    return find(argumentsOfMethod(), broker, arguments, name);
}

inline Found entryOf(const CMPIBroker* broker, const CMPIContext* context, const char* name) {
    Found found = find(entriesOfContext(), broker, context, name);
    found.mayBeText = true;
    return found;
}

// A key of a path by its place; both belong to the path.
struct NamedKey {
    NamedKey(const CMPIObjectPath* path, CMPICount index) {
        Status status;
        CMPIString* string = nullptr;
        data = CMGetKeyAt(writable(path), index, &string, &status);
        require(status, "list the keys");
        name = requiredChars(string, "tell the name of a key");
    }

    const char* name;
    CMPIData data;
};

// Reading

// The characters, which belong to the broker; null when the value is no text.
inline const char* charsIn(const Found& found) {
    if (found.data.type == CMPI_chars) {
        return made(found.data.value.chars, Status(), "hand out", found.name);
    }
    return found.data.type == CMPI_string ? requiredChars(found.data.value.string, "hand out a text")
                                          : nullptr;
}

inline const char* textOf(const Found& found) {
    requireValue(found);
    const char* const chars = charsIn(found);
    if (chars == nullptr) {
        refuse(found, "is no text");
    }
    return chars;
}

inline std::wstring wideTextOf(const Found& found) {
    std::wstring wide;
    if (!TK::CUtility::AStringToWString(textOf(found), wide)) {
        refuse(found, "is no text in UTF-8");
    }
    return wide;
}

// An integer of any type: its sign and the 64 bits of its two's complement.
struct Integer {
    bool isNegative;
    std::uint64_t bits;
};

inline Integer integerOf(std::int64_t number) {
    return {number < 0, static_cast<std::uint64_t>(number)};
}

// False when the value is no integer. CMPI_char16 is none.
inline bool readInteger(const CMPIData& data, Integer& integer) {
    switch (data.type) {
    case CMPI_uint8:
        integer = {false, data.value.uint8};
        return true;
    case CMPI_uint16:
        integer = {false, data.value.uint16};
        return true;
    case CMPI_uint32:
        integer = {false, data.value.uint32};
        return true;
    case CMPI_uint64:
        integer = {false, data.value.uint64};
        return true;
    case CMPI_sint8: // NOLINTNEXTLINE(bugprone-signed-char-misuse): a number
        integer = integerOf(data.value.sint8);
        return true;
    case CMPI_sint16:
        integer = integerOf(data.value.sint16);
        return true;
    case CMPI_sint32:
        integer = integerOf(data.value.sint32);
        return true;
    case CMPI_sint64:
        integer = integerOf(data.value.sint64);
        return true;
    default:
        return false;
    }
}

enum class Decimal { number, notANumber, tooLarge }; // tooLarge: for any type of CIM

inline Decimal readDecimal(const char* chars, Integer& integer) {
    const bool isNegative = *chars == '-';
    std::uint64_t number = 0;
    bool isTooLarge = false;
    const char* digit = isNegative ? chars + 1 : chars;
    do {
        if (*digit < '0' || *digit > '9') {
            return Decimal::notANumber;
        }
        const auto value = static_cast<std::uint64_t>(*digit - '0');
        isTooLarge = isTooLarge || number > (UINT64_MAX - value) / 10;
        number = number * 10 + value;
    } while (*++digit != '\0');
    constexpr std::uint64_t lowest = std::uint64_t{1} << 63U;
    integer = {isNegative && number != 0, isNegative ? 0 - number : number};
    return isTooLarge || (isNegative && number > lowest) ? Decimal::tooLarge : Decimal::number;
}

inline Integer integerIn(const Found& found) {
    requireValue(found);
    Integer integer = {};
    if (!readInteger(found.data, integer)) {
        const char* const chars = found.mayBeText ? charsIn(found) : nullptr;
        if (chars == nullptr) {
            refuse(found, "is no integer");
        }
        const Decimal decimal = readDecimal(chars, integer);
        if (decimal != Decimal::number) {
            refuse(found, decimal == Decimal::tooLarge ? "is out of range" : "is no integer");
        }
    }
    return integer;
}

inline std::uint64_t unsignedIn(const Found& found, std::uint64_t highest) {
    const Integer integer = integerIn(found);
    if (integer.isNegative || integer.bits > highest) {
        refuse(found, "is out of range");
    }
    return integer.bits;
}

inline std::int64_t signedIn(const Found& found, std::int64_t lowest, std::int64_t highest) {
    const Integer integer = integerIn(found);
    const auto number = static_cast<std::int64_t>(integer.bits);
    if (integer.isNegative ? number < lowest : integer.bits > static_cast<std::uint64_t>(highest)) {
        refuse(found, "is out of range");
    }
    return number;
}

inline bool booleanIn(const Found& found) {
    requireValue(found);
    if (found.data.type == CMPI_boolean) {
        return found.data.value.boolean != 0;
    }
    const char* const chars = found.mayBeText ? charsIn(found) : nullptr;
    const bool isTrue = chars != nullptr && sameName(chars, "TRUE");
    if (!isTrue && (chars == nullptr || !sameName(chars, "FALSE"))) {
        refuse(found, "is no boolean");
    }
    return isTrue;
}

inline char16_t characterIn(const Found& found) {
    requireValue(found);
    if (found.data.type != CMPI_char16) {
        refuse(found, "is no character");
    }
    return found.data.value.char16;
}

inline double realIn(const Found& found, double highest) {
    requireValue(found);
    if (found.data.type != CMPI_real32 && found.data.type != CMPI_real64) {
        refuse(found, "is no real number");
    }
    const double real = found.data.type == CMPI_real32 ? found.data.value.real32 : found.data.value.real64;
    if (std::isfinite(real) && std::fabs(real) > highest) {
        refuse(found, "is out of range");
    }
    return real;
}

// The text of a date/time, which belongs to the broker.
inline const char* dateTextIn(const Found& found) {
    requireValue(found);
    if (found.data.type == CMPI_dateTime && found.data.value.dateTime != nullptr) {
        Status status;
        const CMPIString* const text = CMGetStringFormat(writable(found.data.value.dateTime), &status);
        require(status, "tell a date/time");
        return requiredChars(text, "tell a date/time");
    }
    const char* const chars = found.mayBeText ? charsIn(found) : nullptr;
    if (chars == nullptr) {
        refuse(found, "is no date/time");
    }
    return chars;
}

inline std::int64_t microsIn(const Found& found, bool isInterval) {
    Date date = {};
    if (!readDate(dateTextIn(found), date) || date.isInterval != isInterval) {
        refuse(found, isInterval ? "is no interval" : "is no point in time");
    }
    return date.micros;
}

inline TK::DateTime dateTimeIn(const Found& found) {
    const char* const text = dateTextIn(found);
    Date date = {};
    if (!readDate(text, date) || date.isInterval) {
        refuse(found, "is no point in time");
    }
    return TK::Utils::convertStringToDateTime(text);
}

inline CMPIObjectPath* referenceIn(const Found& found) {
    requireValue(found);
    if (found.data.type != CMPI_ref || found.data.value.ref == nullptr) {
        refuse(found, "is no reference");
    }
    return found.data.value.ref;
}

inline CMPIInstance* instanceIn(const Found& found) {
    requireValue(found);
    if (found.data.type != CMPI_instance || found.data.value.inst == nullptr) {
        refuse(found, "is no instance");
    }
    return found.data.value.inst;
}

// The number of an array's elements.
inline CMPICount countIn(const Found& found) {
    requireValue(found);
    if ((found.data.type & CMPI_ARRAY) == 0 || found.data.value.array == nullptr) {
        refuse(found, "is no array");
    }
    Status status;
    const CMPICount count = CMGetArrayCount(writable(found.data.value.array), &status);
    require(status, "count the elements of", found.name);
    return count;
}

inline Found elementIn(const Found& found, CMPICount index) {
    Status status;
    Found element = found;
    element.data = CMGetArrayElementAt(writable(found.data.value.array), index, &status);
    require(status, "hand out an element of", found.name);
    return element;
}

// By type

template <class T>
struct IsOptional : std::false_type {};
template <class T>
struct IsOptional<std::optional<T>> : std::true_type {};
template <class T>
struct IsVector : std::false_type {};
template <class T>
struct IsVector<std::vector<T>> : std::true_type {};
template <class T>
struct IsTimePoint : std::false_type {};
template <class Duration>
struct IsTimePoint<std::chrono::time_point<std::chrono::system_clock, Duration>> : std::true_type {};
template <class T>
struct IsDuration : std::false_type {};
template <class Rep, class Period>
struct IsDuration<std::chrono::duration<Rep, Period>> : std::true_type {};

// A precision finer than CIM's can say less of the past and the future.
template <class Duration>
Duration durationOf(const Found& found, std::int64_t micros) {
    using Micros = std::chrono::duration<std::int64_t, std::micro>;
    if constexpr (std::ratio_less_v<typename Duration::period, std::micro>) {
        if (Micros(micros) > std::chrono::duration_cast<Micros>(Duration::max()) ||
            Micros(micros) < std::chrono::duration_cast<Micros>(Duration::min())) {
            refuse(found, "is out of range");
        }
    }
    return std::chrono::duration_cast<Duration>(Micros(micros));
}

template <class T>
T numberIn(const Found& found) {
    static_assert(!std::is_same_v<T, char> && !std::is_same_v<T, wchar_t> && !std::is_same_v<T, char32_t> &&
                      !std::is_same_v<T, long double>,
                  "CIM has no such type");
    using Limits = std::numeric_limits<T>;
    if constexpr (std::is_floating_point_v<T>) {
        return static_cast<T>(realIn(found, static_cast<double>(Limits::max())));
    } else if constexpr (std::is_signed_v<T>) {
        return static_cast<T>(signedIn(found, Limits::min(), Limits::max()));
    } else {
        return static_cast<T>(unsignedIn(found, Limits::max()));
    }
}

template <class T>
T as(const Found& found) {
    if constexpr (IsOptional<T>::value) {
        return found.isNull() ? T() : T(as<typename T::value_type>(found));
    } else if constexpr (IsVector<T>::value) {
        T elements;
        const CMPICount count = countIn(found);
        for (CMPICount i = 0; i < count; ++i) {
            elements.push_back(as<typename T::value_type>(elementIn(found, i)));
        }
        return elements;
    } else if constexpr (std::is_same_v<T, bool>) {
        return booleanIn(found);
    } else if constexpr (std::is_same_v<T, char16_t>) {
        return characterIn(found);
    } else if constexpr (std::is_enum_v<T>) {
        return static_cast<T>(as<std::underlying_type_t<T>>(found));
    } else if constexpr (std::is_arithmetic_v<T>) {
        return numberIn<T>(found);
    } else if constexpr (std::is_same_v<T, std::string>) {
        return textOf(found);
    } else if constexpr (std::is_same_v<T, std::wstring>) {
        return wideTextOf(found);
    } else if constexpr (IsTimePoint<T>::value) {
        return T(durationOf<typename T::duration>(found, microsIn(found, false)));
    } else if constexpr (IsDuration<T>::value) {
        return durationOf<T>(found, microsIn(found, true));
    } else if constexpr (std::is_same_v<T, TK::DateTime>) {
        return dateTimeIn(found);
    } else if constexpr (std::is_constructible_v<T, const CMPIBroker*, const CMPIObjectPath*>) {
        return T(found.broker, referenceIn(found));
    } else {
        static_assert(std::is_constructible_v<T, const CMPIBroker*, const CMPIInstance*>,
                      "CIM has no such type");
        return T(found.broker, instanceIn(found));
    }
}

} // namespace oxahv::detail
