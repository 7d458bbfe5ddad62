#include "show/Text.h"

#include <Utf8.h>

#include <algorithm>
#include <optional>
#include <sstream>

namespace oxahv::runner {

std::string printable(std::string_view text, std::size_t most) {
    std::string result;
    for (std::size_t count = 0; !text.empty() && count < most; ++count) {
        const std::optional<char32_t> code = encoding::takeUtf8(text);
        if (!code) {
            text.remove_prefix(1);
        }
        encoding::appendUtf8(result, code && !encoding::isControl(*code) ? *code : U'?');
    }
    return result;
}

std::string escaped(std::string_view text, char kind) {
    constexpr const char* digits = "0123456789ABCDEF";
    if (std::all_of(text.begin(), text.end(), [](char c) { return c >= ' ' && c < '\x7F'; })) {
        return std::string(text); // nearly every text
    }
    std::string result;
    while (!text.empty()) {
        const auto byte = static_cast<unsigned char>(text.front());
        const std::optional<char32_t> code = encoding::takeUtf8(text);
        if (!code) {
            text.remove_prefix(1);
        }
        if (code && (!encoding::isControl(*code) || *code == U'\n')) {
            encoding::appendUtf8(result, *code);
            continue;
        }
        const char32_t hidden = code ? *code : byte; // both are below 0x100
        result += {'\\', kind, '0', '0', digits[hidden >> 4U], digits[hidden & 0xFU]};
    }
    return result;
}

std::vector<std::string> namesIn(const std::string& text) {
    std::vector<std::string> names;
    std::istringstream stream(text);
    for (std::string name; std::getline(stream, name, ',');) {
        names.push_back(name);
    }
    return names;
}

} // namespace oxahv::runner
