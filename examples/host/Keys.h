// Keys: those of a request, read from its object path by name, and those of the provider's own instances.
// CIM servers and clients differ in the types, the order and the case of names that a request's keys come in.
#pragma once

#include <Moniker.h>
#include <ProviderUtilities.h>

#include <limits>
#include <optional>
#include <string>

// The text of a request's key, from `CMPI_string` or `CMPI_chars`; nothing when there is no text of that
// name. The names of keys are the same in any case. Throws std::runtime_error when the broker fails.
std::optional<std::string> keyText(const CMPIObjectPath* path, const char* name);

// The number of a request's key that its class declares as unsigned, from an integer of any type or from
// decimal text; nothing when there is no number of that name from 0 to `highest`. It is not read from a
// moniker, which holds neither signed integers nor `CMPI_chars`. Throws as keyText does.
std::optional<unsigned long long> keyNumber(const CMPIObjectPath* path, const char* name,
                                            unsigned long long highest);

// The same, with the range of a type.
template <class Number>
std::optional<Number> keyNumber(const CMPIObjectPath* path, const char* name) {
    const auto number = keyNumber(path, name, std::numeric_limits<Number>::max());
    return number ? std::optional<Number>(static_cast<Number>(*number)) : std::nullopt;
}

// Whether a path has the keys of an instance and no others.
bool isNamedBy(const CMPIObjectPath* path, const TK::Moniker& keys);

// Sets the keys as properties. Some servers make an instance without them.
void setKeyProperties(CMPIInstance* instance, const TK::Moniker& keys);

// A key of the provider's own instance; empty or 0 when there is none of that name. Throws
// TK::FrameworkException when the key was added with another type.
template <class Value>
Value ownKey(TK::Moniker keys, const char* name) {
    Value value{};
    std::string keyName;
    for (unsigned int i = 0; keys.selectKey(i); ++i) {
        keys.getName(keyName);
        if (keyName == name) {
            keys.getValue(value);
        }
    }
    return value;
}
