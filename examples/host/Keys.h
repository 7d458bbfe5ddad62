// Keys of a request, read by name.
#pragma once

#include <Moniker.h>

#include <limits>
#include <optional>
#include <string>

// The text of a key; nothing when there is no text of that name.
std::optional<std::string> keyText(TK::Moniker keys, const char* name);

// The number of a key, whatever unsigned width it came in; nothing when there is no number of that name, or
// one above `highest`. Many CIM servers hand a uint16 key over as a uint64, which the moniker's own getters
// read into an unsigned long long alone.
std::optional<unsigned long long> keyNumber(TK::Moniker keys, const char* name, unsigned long long highest);

// The same, with the range of a type.
template <class Number>
std::optional<Number> keyNumber(const TK::Moniker& keys, const char* name) {
    const auto number = keyNumber(keys, name, std::numeric_limits<Number>::max());
    return number ? std::optional<Number>(static_cast<Number>(*number)) : std::nullopt;
}

// Whether a request's keys are those of an instance: the same names with the same values, in any order and
// with numbers of any width.
bool isNamedBy(const TK::Moniker& request, TK::Moniker keys);
