#include "show/Text.h"

#include <Utf8.h>

#include <algorithm>
#include <optional>
#include <strings.h>

namespace {

// DEL and both sets of control characters: terminals obey the second one too.
bool isControl(char32_t code) {
    return code < 0x20 || (code >= 0x7f && code < 0xa0);
}

} // namespace

std::string lowerCase(std::string text) {
    std::transform(text.begin(), text.end(), text.begin(),
                   [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; });
    return text;
}

bool sameName(const std::string& a, const std::string& b) {
    return ::strcasecmp(a.c_str(), b.c_str()) == 0;
}

bool isUtf8(std::string_view text) {
    while (!text.empty()) {
        if (!TK::takeUtf8(text)) {
            return false;
        }
    }
    return true;
}

std::string printable(std::string_view text, std::size_t most) {
    std::string result;
    for (std::size_t count = 0; !text.empty() && count < most; ++count) {
        const std::optional<char32_t> code = TK::takeUtf8(text);
        if (!code) {
            text.remove_prefix(1);
        }
        TK::appendUtf8(result, code && !isControl(*code) ? *code : U'?');
    }
    return result;
}
