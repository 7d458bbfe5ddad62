#include "PropertyText.h"

#include "Utf8.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdint>
#include <optional>

namespace TK::PropertyText {

namespace {

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

bool isPlain(char byte) {
    return byte != '\\' && byte != '\0' && static_cast<unsigned char>(byte) < 0x80;
}

// How many bytes at the start stand for themselves: in most texts all of them.
std::size_t plainSize(std::string_view text) {
    return static_cast<std::size_t>(std::find_if_not(text.begin(), text.end(), isPlain) - text.begin());
}

// Goes through what is written, handing on runs of plain bytes, and single characters for all else. Returns
// the reason when it cannot be read.
template <class OnPlain, class OnCharacter>
const char* walk(std::string_view text, OnPlain&& onPlain, OnCharacter&& onCharacter) {
    while (!text.empty()) {
        if (const std::size_t size = plainSize(text); size != 0) {
            onPlain(text.substr(0, size));
            text.remove_prefix(size);
            continue;
        }
        const std::optional<char32_t> code = encoding::takeUtf8(text);
        if (!code) {
            return "not UTF-8";
        }
        if (*code == 0) {
            return "NUL character";
        }
        const auto character = *code == U'\\' ? takeEscape(text) : static_cast<wchar_t>(*code);
        if (!character) {
            return "unknown escape";
        }
        onCharacter(*character);
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

bool isBlank(char c) {
    return c == ' ' || c == '\t';
}

// What is between two places of a text, without the blanks at both ends.
Part trimmedPart(std::string_view text, std::size_t begin, std::size_t end) {
    while (begin < end && isBlank(text[begin])) {
        ++begin;
    }
    while (begin < end && isBlank(text[end - 1])) {
        --end;
    }
    return {begin, end - begin};
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

// Most characters: those that are written as they are in every place.
bool isAlwaysPlain(wchar_t character) {
    return character > L' ' && character < 0x7F && character != L'\\' && character != L'=' &&
           character != L'#';
}

// Escapes `text`; `special` characters always, a space at its ends alone.
std::string escape(std::wstring_view text, std::wstring_view special) {
    std::string result;
    result.reserve(text.size());
    for (std::size_t i = 0; i < text.size(); ++i) {
        const wchar_t character = text[i];
        if (isAlwaysPlain(character)) {
            result += static_cast<char>(character);
            continue;
        }
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

Line split(std::string_view text) {
    Line line;
    const std::string_view content = trimmedPart(text, 0, text.size()).of(text);
    if (content.empty() || content.front() == '#') {
        return line;
    }
    const std::size_t separator = findSeparator(text);
    if (separator == std::string_view::npos) {
        line.damage = "no equals sign";
        return line;
    }
    line.isEntry = true;
    line.key = trimmedPart(text, 0, separator);
    line.value = trimmedPart(text, separator + 1, text.size());
    return line;
}

const char* check(std::string_view written) {
    return walk(
        written, [](std::string_view) {}, [](wchar_t) {});
}

const char* read(std::string_view written, std::wstring& result) {
    return walk(
        written,
        [&](std::string_view plain) {
            const std::size_t size = result.size();
            result.resize(size + plain.size());
            std::copy(plain.begin(), plain.end(), result.begin() + static_cast<std::ptrdiff_t>(size));
        },
        [&](wchar_t character) { result += character; });
}

bool readsAs(std::string_view written, std::wstring_view text) {
    bool isSame = true;
    const auto compare = [&](const auto& part) {
        isSame = isSame && text.size() >= part.size() && std::equal(part.begin(), part.end(), text.begin());
        text.remove_prefix(isSame ? part.size() : 0);
    };
    walk(written, compare, [&](wchar_t character) { compare(std::wstring_view(&character, 1)); });
    return isSame && text.empty();
}

std::string escapeKey(std::wstring_view key) {
    return escape(key, L"\n\r\t\\=#");
}

std::string escapeValue(std::wstring_view value) {
    return escape(value, L"\n\r\t\\");
}

} // namespace TK::PropertyText
