#include "check/Ranges.h"

#include <Utf8.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <optional>

namespace oxahv::runner {

namespace {

// Holds every integer of 64 bits exactly where it has 64 bits of mantissa, and comes close elsewhere.
using Number = long double;

// Nothing for a qualifier that is missing, NULL or no number.
std::optional<Number> numberOf(const Qualifiers& qualifiers, const char* name) {
    const QualifierDeclaration* const found = qualifiers.find(name);
    if (found == nullptr || found->value.elements.size() != 1) {
        return std::nullopt;
    }
    const PlainValue& value = found->value.elements.front();
    if (const auto* const natural = std::get_if<unsigned long long>(&value)) {
        return static_cast<Number>(*natural);
    }
    if (const auto* const integer = std::get_if<long long>(&value)) {
        return static_cast<Number>(*integer);
    }
    return std::nullopt;
}

std::optional<Number> numberIn(const std::string& text) {
    char* end = nullptr;
    const Number number = std::strtold(text.c_str(), &end);
    return !text.empty() && *end == '\0' ? std::optional<Number>(number) : std::nullopt;
}

// The entries of a ValueMap; none where there is no such qualifier.
std::vector<std::string> valueMap(const Qualifiers& qualifiers) {
    std::vector<std::string> entries;
    if (const QualifierDeclaration* const found = qualifiers.find("ValueMap")) {
        for (const PlainValue& value : found->value.elements) {
            const auto* const text = std::get_if<std::string>(&value);
            entries.push_back(text != nullptr ? *text : "");
        }
    }
    return entries;
}

// "3", "2..5", "..5", "6..", and ".." for all that no other entry names.
bool isEntry(const std::string& entry, const std::string& value) {
    const std::size_t dots = entry.find("..");
    const std::optional<Number> number = numberIn(value);
    if (dots == std::string::npos || !number) {
        return entry == ".." || entry == value;
    }
    const std::optional<Number> least = numberIn(entry.substr(0, dots));
    const std::optional<Number> most = numberIn(entry.substr(dots + 2));
    return (!least || *number >= *least) && (!most || *number <= *most);
}

bool isMapped(const std::vector<std::string>& map, const std::string& value) {
    return map.empty() || std::any_of(map.begin(), map.end(),
                                      [&](const std::string& entry) { return isEntry(entry, value); });
}

std::size_t lengthOf(const std::string& text) {
    return static_cast<std::size_t>(
        std::count_if(text.begin(), text.end(), [](char c) { return !encoding::isContinuation(c); }));
}

std::string wordsOf(Number number) {
    std::string text = std::to_string(number);
    return text.substr(0, text.find('.'));
}

std::string complaintAbout(const Qualifiers& qualifiers, CMPIType type, const std::string& value) {
    const bool isText = type == CMPI_string || type == CMPI_chars;
    if (isText) {
        const std::optional<Number> most = numberOf(qualifiers, "MaxLen");
        if (most && static_cast<Number>(lengthOf(value)) > *most) {
            return "has " + std::to_string(lengthOf(value)) + " characters, more than MaxLen " +
                   wordsOf(*most);
        }
    } else if (const std::optional<Number> number = numberIn(value)) {
        const std::optional<Number> least = numberOf(qualifiers, "MinValue");
        const std::optional<Number> most = numberOf(qualifiers, "MaxValue");
        if (least && *number < *least) {
            return value + " is less than MinValue " + wordsOf(*least);
        }
        if (most && *number > *most) {
            return value + " is more than MaxValue " + wordsOf(*most);
        }
    }
    return isMapped(valueMap(qualifiers), value) ? "" : '\'' + value + "' is not in the ValueMap";
}

template <class Integer>
std::pair<Number, Number> limits() {
    return {std::numeric_limits<Integer>::min(), std::numeric_limits<Integer>::max()};
}

// The least and the greatest number of an integer type; nothing for other types.
std::optional<std::pair<Number, Number>> limitsOf(CMPIType type) {
    switch (type) {
    case CMPI_uint8:
        return limits<std::uint8_t>();
    case CMPI_sint8:
        return limits<std::int8_t>();
    case CMPI_uint16:
        return limits<std::uint16_t>();
    case CMPI_sint16:
        return limits<std::int16_t>();
    case CMPI_uint32:
        return limits<std::uint32_t>();
    case CMPI_sint32:
        return limits<std::int32_t>();
    case CMPI_uint64:
        return limits<std::uint64_t>();
    case CMPI_sint64:
        return limits<std::int64_t>();
    default:
        return std::nullopt;
    }
}

std::optional<std::string> unmapped(const std::vector<std::string>& map, Number least, Number most) {
    constexpr int attempts = 1000;
    for (int i = 0; i < attempts && most - static_cast<Number>(i) >= least; ++i) {
        const std::string text = wordsOf(most - static_cast<Number>(i));
        if (!isMapped(map, text)) {
            return text;
        }
    }
    return std::nullopt;
}

} // namespace

std::string rangeComplaint(const Qualifiers& qualifiers, const PlainData& data) {
    const auto type = static_cast<CMPIType>(data.type & ~CMPI_ARRAY);
    for (const std::string& element : data.elements) {
        std::string complaint = complaintAbout(qualifiers, type, element);
        if (!complaint.empty()) {
            return complaint;
        }
    }
    return "";
}

std::vector<OutsideValue> valuesOutside(CMPIType type, const Qualifiers& qualifiers) {
    std::vector<OutsideValue> values;
    const auto add = [&](const std::string& text, const std::string& shown) {
        const std::string complaint = complaintAbout(qualifiers, type, text);
        if (!complaint.empty()) {
            values.push_back({shown, complaint});
        }
    };
    if (const auto limits = limitsOf(type)) {
        const Number least = numberOf(qualifiers, "MinValue").value_or(limits->first);
        const Number most = numberOf(qualifiers, "MaxValue").value_or(limits->second);
        if (least > limits->first) {
            add(wordsOf(least - 1), wordsOf(least - 1));
        }
        if (most < limits->second) {
            add(wordsOf(most + 1), wordsOf(most + 1));
        }
        if (const auto text = unmapped(valueMap(qualifiers), least, most)) {
            add(*text, *text);
        }
    } else if (type == CMPI_string) {
        const std::string text = "no such value";
        if (const auto most = numberOf(qualifiers, "MaxLen")) {
            const std::string longer(static_cast<std::size_t>(std::min<Number>(*most, 100000)) + 1, 'x');
            add(longer, '"' + longer + '"');
        }
        if (!valueMap(qualifiers).empty()) {
            add(text, '"' + text + '"');
        }
    }
    return values;
}

} // namespace oxahv::runner
