#include "Keys.h"

#include <cmpimacs.h>

#include <charconv>
#include <stdexcept>
#include <type_traits>

using TK::Moniker;
using TK::ProviderUtilities;

namespace {

// The keys of a request

// Not CMGetKey: whether that takes a name in another case depends on the server.
std::optional<CMPIData> findKey(const CMPIObjectPath* path, const char* name) {
    const CMPICount count = CMGetKeyCount(path, nullptr);
    for (CMPICount i = 0; i < count; ++i) {
        CMPIString* keyName = nullptr;
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        const CMPIData key = CMGetKeyAt(path, i, &keyName, &status);
        if (status.rc != CMPI_RC_OK || keyName == nullptr) {
            throw std::runtime_error("the broker did not tell a key");
        }
        if (ProviderUtilities::textEqual(ProviderUtilities::convertToString(keyName).c_str(), name)) {
            return CMIsNullValue(key) ? std::nullopt : std::optional<CMPIData>(key);
        }
    }
    return std::nullopt;
}

std::optional<std::string> textOf(const CMPIData& key) {
    if (key.type == CMPI_string) {
        return ProviderUtilities::convertToString(key.value.string);
    }
    return key.type == CMPI_chars && key.value.chars != nullptr ? std::optional<std::string>(key.value.chars)
                                                                : std::nullopt;
}

std::optional<unsigned long long> numberIn(const std::string& text) {
    const char* const end = text.data() + text.size();
    unsigned long long number = 0;
    const auto [rest, error] = std::from_chars(text.data(), end, number);
    return error == std::errc() && rest == end ? std::optional<unsigned long long>(number) : std::nullopt;
}

std::optional<unsigned long long> notNegative(long long number) {
    return number >= 0 ? std::optional<unsigned long long>(number) : std::nullopt;
}

std::optional<unsigned long long> numberOf(const CMPIData& key) {
    switch (key.type) {
    case CMPI_uint8:
        return key.value.uint8;
    case CMPI_uint16:
        return key.value.uint16;
    case CMPI_uint32:
        return key.value.uint32;
    case CMPI_uint64:
        return key.value.uint64;
    case CMPI_sint8:
        return notNegative(key.value.sint8); // NOLINT(bugprone-signed-char-misuse,cert-str34-c): a number
    case CMPI_sint16:
        return notNegative(key.value.sint16);
    case CMPI_sint32:
        return notNegative(key.value.sint32);
    case CMPI_sint64:
        return notNegative(key.value.sint64);
    default:
        const auto text = textOf(key);
        return text ? numberIn(*text) : std::nullopt;
    }
}

// The keys of the provider's own instances

template <class Value>
Value selected(const Moniker& keys) {
    Value value{};
    keys.getValue(value);
    if constexpr (std::is_same_v<Value, unsigned char>) {
        // An 8-bit number that is the code of a white-space character cannot be read back.
        unsigned char other = 1;
        keys.getValue(other);
        if (other != value) {
            throw std::runtime_error("a moniker cannot tell this 8-bit key");
        }
    }
    return value;
}

// Calls a function with the name and the value of each key.
template <class Function>
void forEachKey(Moniker keys, const Function& function) {
    for (unsigned int i = 0; keys.selectKey(i); ++i) {
        std::string name;
        keys.getName(name);
        unsigned short type = 0;
        keys.getType(type);
        const auto call = [&](auto value) { function(name.c_str(), value); };
        switch (type) {
        case Moniker::COMPONENT_UINT8:
            call(selected<unsigned char>(keys));
            break;
        case Moniker::COMPONENT_UINT16:
            call(selected<unsigned short>(keys));
            break;
        case Moniker::COMPONENT_UINT32:
            call(selected<unsigned int>(keys));
            break;
        case Moniker::COMPONENT_UINT64:
            call(selected<unsigned long long>(keys));
            break;
        default:
            call(selected<std::string>(keys));
            break;
        }
    }
}

} // namespace

std::optional<std::string> keyText(const CMPIObjectPath* path, const char* name) {
    const auto key = findKey(path, name);
    return key ? textOf(*key) : std::nullopt;
}

std::optional<unsigned long long> keyNumber(const CMPIObjectPath* path, const char* name,
                                            unsigned long long highest) {
    const auto key = findKey(path, name);
    const auto number = key ? numberOf(*key) : std::nullopt;
    return number && *number <= highest ? number : std::nullopt;
}

bool isNamedBy(const CMPIObjectPath* path, const Moniker& keys) {
    bool isNamed = CMGetKeyCount(path, nullptr) == keys.getKeyCount();
    forEachKey(keys, [&](const char* name, const auto& value) {
        using Value = std::decay_t<decltype(value)>;
        if constexpr (std::is_same_v<Value, std::string>) {
            isNamed = isNamed && keyText(path, name) == value;
        } else {
            isNamed = isNamed && keyNumber<Value>(path, name) == value;
        }
    });
    return isNamed;
}

void setKeyProperties(CMPIInstance* instance, const Moniker& keys) {
    forEachKey(keys,
               [&](const char* name, auto& value) { ProviderUtilities::setProperty(instance, name, value); });
}
