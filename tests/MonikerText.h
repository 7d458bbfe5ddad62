// What a moniker holds, in one text, for tests and fuzzers to compare.
#pragma once

#include "Moniker.h"

#include <string>

template <class Value>
Value valueOf(const TK::Moniker& moniker) {
    Value value{};
    moniker.getValue(value);
    return value;
}

inline std::string valueTextOf(const TK::Moniker& moniker, unsigned short type) {
    switch (type) {
    case TK::Moniker::COMPONENT_UINT8:
        return std::to_string(valueOf<unsigned char>(moniker));
    case TK::Moniker::COMPONENT_UINT16:
        return std::to_string(valueOf<unsigned short>(moniker));
    case TK::Moniker::COMPONENT_UINT32:
        return std::to_string(valueOf<unsigned int>(moniker));
    case TK::Moniker::COMPONENT_UINT64:
        return std::to_string(valueOf<unsigned long long>(moniker));
    default:
        return valueOf<std::string>(moniker);
    }
}

// The selected key as "name:type=value"; the exception's message when there is none.
inline std::string selectedKey(const TK::Moniker& moniker) {
    try {
        unsigned short type = 99;
        std::string name;
        moniker.getType(type);
        moniker.getName(name);
        return name + ':' + std::to_string(type) + '=' + valueTextOf(moniker, type);
    } catch (const TK::FrameworkException& exception) {
        return exception.what();
    }
}

// All keys, a blank behind each.
inline std::string keysOf(TK::Moniker moniker) {
    std::string text;
    for (unsigned int i = 0; moniker.selectKey(i); ++i) {
        text += selectedKey(moniker) + ' ';
    }
    return text;
}

// The same, and the selected key.
inline std::string textOf(const TK::Moniker& moniker) {
    return keysOf(moniker) + " > " + selectedKey(moniker);
}
