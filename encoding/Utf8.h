// UTF-8, the encoding of files, catalogues, MOF and terminals, whatever the process's locale is.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace encoding {

// What editors of other systems put in front of a text in UTF-8.
constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";

constexpr bool isUnicodeScalar(char32_t code) {
    return code < 0xD800 || (code > 0xDFFF && code <= 0x10FFFF);
}

// DEL and both sets of control characters: terminals obey the second set too.
constexpr bool isControl(char32_t code) {
    return code < 0x20 || (code >= 0x7F && code < 0xA0);
}

// The second and the further bytes of a character.
constexpr bool isContinuation(char byte) {
    return (static_cast<unsigned char>(byte) & 0xC0U) == 0x80U;
}

// `code` is a Unicode scalar value.
inline void appendUtf8(std::string& bytes, char32_t code) {
    const auto append = [&](char32_t byte) { bytes += static_cast<char>(static_cast<unsigned char>(byte)); };
    if (code < 0x80) {
        append(code);
        return;
    }
    if (code < 0x800) {
        append(0xC0 | code >> 6);
    } else {
        if (code < 0x10000) {
            append(0xE0 | code >> 12);
        } else {
            append(0xF0 | code >> 18);
            append(0x80 | (code >> 12 & 0x3F));
        }
        append(0x80 | (code >> 6 & 0x3F));
    }
    append(0x80 | (code & 0x3F));
}

// Takes the first character off `bytes`, which must not be empty. Returns nothing, and leaves `bytes` alone,
// when they do not begin with well-formed UTF-8: overlong forms and surrogates are refused.
inline std::optional<char32_t> takeUtf8(std::string_view& bytes) {
    const auto byteAt = [&](std::size_t i) { return static_cast<unsigned char>(bytes[i]); };
    const unsigned char lead = byteAt(0);
    std::size_t length = 1;
    char32_t code = lead;
    char32_t smallest = 0;
    if (lead >= 0x80) {
        if (lead >= 0xC0 && lead < 0xE0) {
            length = 2;
            smallest = 0x80;
        } else if (lead >= 0xE0 && lead < 0xF0) {
            length = 3;
            smallest = 0x800;
        } else if (lead >= 0xF0 && lead < 0xF8) {
            length = 4;
            smallest = 0x10000;
        } else {
            return std::nullopt;
        }
        code = lead & (0x7FU >> length);
    }
    if (bytes.size() < length) {
        return std::nullopt;
    }
    for (std::size_t i = 1; i < length; ++i) {
        if (!isContinuation(bytes[i])) {
            return std::nullopt;
        }
        code = code << 6 | (byteAt(i) & 0x3FU);
    }
    if (code < smallest || !isUnicodeScalar(code)) {
        return std::nullopt;
    }
    bytes.remove_prefix(length);
    return code;
}

inline bool isUtf8(std::string_view text) {
    while (!text.empty()) {
        if (!takeUtf8(text)) {
            return false;
        }
    }
    return true;
}

} // namespace encoding
