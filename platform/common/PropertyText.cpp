#include "PropertyText.h"

#include "Utf8.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdint>
#include <optional>

namespace TK::PropertyText {

namespace {

constexpr std::string_view blanks = " \t";

struct Escape {
    char letter;
    wchar_t character;
};

constexpr std::array<Escape, 7> escapes{
    {{'n', L'\n'}, {'r', L'\r'}, {'t', L'\t'}, {'s', L' '}, {'\\', L'\\'}, {'=', L'='}, {'#', L'#'}}};

// Reads the braces of `\u{…}` off `text`.
std::optional<wchar_t> takeCode(std::string_view& text) {
    const std::size_t close = text.find('}');
    if (text.empty() || text.front() != '{' || close == std::string_view::npos || close > 9) {
        return std::nullopt;
    }
    std::uint32_t code = 0;
    const auto [end, error] = std::from_chars(text.data() + 1, text.data() + close, code, 16);
    if (error != std::errc() || end != text.data() + close) {
        return std::nullopt;
    }
    text.remove_prefix(close + 1);
    return static_cast<wchar_t>(code);
}

// Reads what follows a backslash off `text`.
std::optional<wchar_t> takeEscape(std::string_view& text) {
    if (text.empty()) {
        return std::nullopt;
    }
    const char letter = text.front();
    text.remove_prefix(1);
    if (letter == 'u') {
        return takeCode(text);
    }
    for (const Escape& escape : escapes) {
        if (escape.letter == letter) {
            return escape.character;
        }
    }
    return std::nullopt;
}

// Appends what `text` stands for to `result`; a reason when it cannot be read.
const char* unescape(std::string_view text, std::wstring& result) {
    while (!text.empty()) {
        const std::optional<char32_t> code = encoding::takeUtf8(text);
        if (!code) {
            return "not UTF-8";
        }
        if (*code == 0) {
            return "NUL character";
        }
        if (*code != U'\\') {
            result += static_cast<wchar_t>(*code);
            continue;
        }
        const std::optional<wchar_t> character = takeEscape(text);
        if (!character) {
            return "unknown escape";
        }
        result += *character;
    }
    return nullptr;
}

// Where the equals sign between key and value stands.
std::size_t findSeparator(std::string_view text) {
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] == '\\') {
            ++i;
        } else if (text[i] == '=') {
            return i;
        }
    }
    return std::string_view::npos;
}

std::string_view trimmed(std::string_view text) {
    text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
    text.remove_suffix(text.size() - (text.find_last_not_of(blanks) + 1));
    return text;
}

// Characters that would be invisible in the file, or would mean something to an editor or to the first line's
// reader, and what UTF-8 cannot hold.
bool needsCode(char32_t code) {
    return encoding::isControl(code) || code == 0x2028 || code == 0x2029 || code == 0xFEFF ||
           !encoding::isUnicodeScalar(code);
}

void appendCode(std::string& result, char32_t code) {
    std::array<char, 8> digits{};
    const char* const end =
        std::to_chars(digits.data(), digits.data() + digits.size(), static_cast<std::uint32_t>(code), 16).ptr;
    result += "\\u{";
    result.append(static_cast<const char*>(digits.data()), end);
    result += '}';
}

// Escapes `text`; `special` characters always, a space at its ends alone.
std::string escape(const std::wstring& text, std::wstring_view special) {
    std::string result;
    result.reserve(text.size());
    for (std::size_t i = 0; i < text.size(); ++i) {
        const wchar_t character = text[i];
        const bool inside = i > 0 && i + 1 < text.size();
        if (character == L' ' ? inside : special.find(character) == std::wstring_view::npos) {
            const auto code = static_cast<char32_t>(character);
            if (needsCode(code)) {
                appendCode(result, code);
            } else {
                encoding::appendUtf8(result, code);
            }
            continue;
        }
        for (const Escape& escape : escapes) {
            if (escape.character == character) {
                result += '\\';
                result += escape.letter;
            }
        }
    }
    return result;
}

} // namespace

Line parse(std::string_view text) {
    Line line;
    const std::string_view content = trimmed(text);
    if (content.empty() || content.front() == '#') {
        return line;
    }
    const std::size_t separator = findSeparator(text);
    if (separator == std::string_view::npos) {
        line.damage = "no equals sign";
        return line;
    }
    line.isEntry = true;
    line.valueStart = std::min(text.find_first_not_of(blanks, separator + 1), text.size());
    line.damage = unescape(trimmed(text.substr(0, separator)), line.key);
    if (line.damage == nullptr) {
        line.damage = unescape(trimmed(text.substr(separator + 1)), line.value);
    }
    return line;
}

std::string escapeKey(const std::wstring& key) {
    return escape(key, L"\n\r\t\\=#");
}

std::string escapeValue(const std::wstring& value) {
    return escape(value, L"\n\r\t\\");
}

} // namespace TK::PropertyText
