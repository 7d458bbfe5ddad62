// Converts between wide and narrow text by the C library, and without it where the result is known.
#include "StringConversion.h"

#include <algorithm>
#include <array>
#include <climits>
#include <cwchar>
#include <langinfo.h>
#include <string_view>
#include <type_traits>

namespace TK {

namespace {

constexpr auto failed = static_cast<std::size_t>(-1);
constexpr auto incomplete = static_cast<std::size_t>(-2);

// What an invalid byte from 0x80 on becomes: the byte added to this.
constexpr wchar_t escapedByte = 0xDC00;

bool isEscapedByte(wchar_t character) {
    return character >= escapedByte + 0x80 && character <= escapedByte + 0xFF;
}

wchar_t escape(unsigned char byte) {
    return static_cast<wchar_t>(byte < 0x80 ? byte : escapedByte + byte);
}

template <class Character>
constexpr auto codeOf(Character character) {
    // Which of char and wchar_t have a sign is up to the machine.
    return static_cast<std::make_unsigned_t<Character>>(character);
}

// The characters that ISO 646 has in every country, without control characters. In every encoding that a
// locale can have they are the bytes of ASCII, while no other character is among them: one that combines
// with a letter, a byte that changes the state.
constexpr std::array<bool, 0x80> invariantCharacters = [] {
    std::array<bool, 0x80> result{};
    for (std::size_t code = 0x20; code < 0x7F; ++code) {
        result[code] = true;
    }
    for (const char national : std::string_view("#$@[\\]^`{|}~")) {
        result[codeOf(national)] = false;
    }
    return result;
}();

// Whether the locale has no say in a text. Keys and numbers are such texts, and asking the locale would take
// longer than converting them.
template <class Text>
bool isInvariant(const Text& text) {
    return std::all_of(text.begin(), text.end(), [](auto character) {
        return codeOf(character) < 0x80 && invariantCharacters[codeOf(character)];
    });
}

// Whether ASCII characters are their own bytes, with no state to them: then they need no conversion.
bool asciiIsPlain() {
    const std::string_view codeset = ::nl_langinfo(CODESET);
    return codeset == "UTF-8" || codeset == "ANSI_X3.4-1968" || codeset.substr(0, 9) == "ISO-8859-";
}

constexpr auto isAscii = [](auto character) { return codeOf(character) < 0x80; };

// The part of a text, most often all of it, that needs no conversion.
template <class Text>
std::size_t plainSize(const Text& text, bool plain) {
    const auto end = plain ? std::find_if_not(text.begin(), text.end(), isAscii) : text.begin();
    return static_cast<std::size_t>(end - text.begin());
}

} // namespace

// Both directions convert the terminating NUL too: it brings a stateful encoding back to its initial state
// and brings out a character that an encoding holds back to see what follows.

std::string make_string(const std::wstring& text) {
    if (isInvariant(text)) {
        return {text.begin(), text.end()};
    }
    const bool plain = asciiIsPlain();
    const std::size_t start = plainSize(text, plain);
    std::string result(text.data(), text.data() + start);
    if (start == text.size()) {
        return result;
    }
    result.reserve(text.size() + 1);
    std::array<char, MB_LEN_MAX> bytes{};
    std::mbstate_t state{};
    for (std::size_t i = start; i <= text.size(); ++i) {
        if (plain && isAscii(text[i])) {
            result += static_cast<char>(text[i]);
            continue;
        }
        const std::mbstate_t before = state;
        std::size_t count = std::wcrtomb(bytes.data(), text[i], &state);
        if (count == failed) {
            state = before;
            count = std::wcrtomb(bytes.data(), L'?', &state);
            // A bare byte takes the question mark's place, behind a character that was held back.
            if (isEscapedByte(text[i])) {
                bytes[count - 1] = static_cast<char>(text[i] - escapedByte);
            }
        }
        result.append(bytes.data(), count);
    }
    result.pop_back();
    return result;
}

std::string make_string(const char* text) {
    return text == nullptr ? std::string() : std::string(text);
}

std::wstring make_wstring(const std::string& text) {
    if (isInvariant(text)) {
        return {text.begin(), text.end()};
    }
    const bool plain = asciiIsPlain();
    const std::size_t start = plainSize(text, plain);
    std::wstring result(text.data(), text.data() + start);
    if (start == text.size()) {
        return result;
    }
    result.reserve(text.size() + 1);
    const char* const end = text.data() + text.size() + 1;
    std::mbstate_t state{};
    for (const char* position = text.data() + start; position != end;) {
        if (plain && isAscii(*position)) {
            result += static_cast<wchar_t>(*position++);
            continue;
        }
        const std::mbstate_t before = state;
        wchar_t character = 0;
        const std::size_t count =
            std::mbrtowc(&character, position, static_cast<std::size_t>(end - position), &state);
        if (count == failed || count == incomplete) {
            state = before;
            result += escape(static_cast<unsigned char>(*position++));
        } else if (count == 0 && character == L'\0') {
            // The bytes that bring the encoding back to its initial state may stand before the NUL.
            result += L'\0';
            position += std::char_traits<char>::length(position) + 1;
        } else {
            // No byte is used when the character is the second that one byte sequence stands for.
            result += character;
            position += count;
        }
    }
    result.pop_back();
    return result;
}

std::ostream& operator<<(std::ostream& stream, const std::string& text) {
    return std::operator<<(stream, text);
}

} // namespace TK
