#include "Keys.h"

#include <ProviderUtilities.h>

using TK::Moniker;

namespace {

constexpr unsigned short noType = std::numeric_limits<unsigned short>::max();

// Selects the first key of a name and tells its type.
unsigned short select(Moniker& keys, const char* name) {
    for (unsigned int i = 0; keys.selectKey(i); ++i) {
        std::string keyName;
        keys.getName(keyName);
        if (TK::ProviderUtilities::textEqual(keyName.c_str(), name)) {
            unsigned short type = noType;
            keys.getType(type);
            return type;
        }
    }
    return noType;
}

// The selected number, of the width that it was added with.
template <class Number>
std::optional<unsigned long long> selected(const Moniker& keys) {
    Number first = 0;
    Number second = 1;
    keys.getValue(first);
    keys.getValue(second);
    // An 8-bit number that is the code of a blank cannot be read back and leaves both as they were.
    return first == second ? std::optional<unsigned long long>(first) : std::nullopt;
}

} // namespace

std::optional<std::string> keyText(Moniker keys, const char* name) {
    if (select(keys, name) != Moniker::COMPONENT_STRING) {
        return std::nullopt;
    }
    std::string value;
    keys.getValue(value);
    return value;
}

std::optional<unsigned long long> keyNumber(Moniker keys, const char* name, unsigned long long highest) {
    std::optional<unsigned long long> number;
    switch (select(keys, name)) {
    case Moniker::COMPONENT_UINT8:
        number = selected<unsigned char>(keys);
        break;
    case Moniker::COMPONENT_UINT16:
        number = selected<unsigned short>(keys);
        break;
    case Moniker::COMPONENT_UINT32:
        number = selected<unsigned int>(keys);
        break;
    case Moniker::COMPONENT_UINT64:
        number = selected<unsigned long long>(keys);
        break;
    default:
        break;
    }
    return number && *number <= highest ? number : std::nullopt;
}

bool isNamedBy(const Moniker& request, Moniker keys) {
    bool isNamed = request.getKeyCount() == keys.getKeyCount();
    for (unsigned int i = 0; isNamed && keys.selectKey(i); ++i) {
        std::string name;
        keys.getName(name);
        const auto text = keyText(keys, name.c_str());
        const auto number = keyNumber<unsigned long long>(keys, name.c_str());
        isNamed = (text || number) && keyText(request, name.c_str()) == text &&
                  keyNumber<unsigned long long>(request, name.c_str()) == number;
    }
    return isNamed;
}
