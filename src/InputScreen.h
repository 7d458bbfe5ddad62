// The screen that user-supplied text has to pass: which fragments it refuses, and a search for all of them
// that reads a text once and folds next to none of it. Knows nothing of CMPI.
#pragma once

#include <algorithm>
#include <array>
#include <cctype>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace TK {

// What a user's text must not hold. The order matters only for exemptions.
constexpr std::array<std::string_view, 12> denied = {"<",    "http:", "https:", "%",     "$", "\\\\",
                                                     "www.", "wap.",  "ftp:",   "sftp:", ":", "\\"};
constexpr std::array<std::wstring_view, 12> wideDenied = {
    L"<", L"http:", L"https:", L"%", L"$", L"\\\\", L"www.", L"wap.", L"ftp:", L"sftp:", L":", L"\\"};

inline char lowerCase(char c) {
    return static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
}

// A wide character's code. Where wchar_t is signed, values that are not characters can be negative.
inline std::int32_t codeOf(wchar_t c) {
    // NOLINTNEXTLINE(bugprone-signed-char-misuse,cert-str34-c): wchar_t is no char
    return static_cast<std::int32_t>(c);
}

// Folds the wide characters that tolower accepts and leaves the others alone.
inline wchar_t lowerCase(wchar_t c) {
    const std::int32_t code = codeOf(c);
    return code >= 0 && code <= 0xFF ? static_cast<wchar_t>(std::tolower(code)) : c;
}

// The list has two words, "www." and "wap.": a point after one of two letters ends each.
constexpr std::size_t wordLength = 4;

// Whether three characters, folded, are the letters of a word.
template <class Fold>
bool areLetters(const char* characters, Fold fold) {
    const char second = fold(characters[1]);
    const char third = fold(characters[2]);
    return fold(characters[0]) == 'w' && ((second == 'w' && third == 'w') || (second == 'a' && third == 'p'));
}

// No locale folds another character to one of these letters, so this cheap test comes before tolower.
constexpr char foldedLetter(char c) {
    return static_cast<char>(c | 0x20);
}

// Whether one of the words ends at a position from `first` on.
inline bool endsWord(std::string_view text, std::size_t first) {
    for (std::size_t point = text.find('.', first); point != std::string_view::npos;
         point = text.find('.', point + 1)) {
        if (point < wordLength - 1) {
            continue;
        }
        const char* const letters = text.data() + point - (wordLength - 1);
        if (areLetters(letters, foldedLetter) && areLetters(letters, [](char c) { return lowerCase(c); })) {
            return true;
        }
    }
    return false;
}

// Whether a word may end in a block that is not a text's first. It has no branch, so that compilers look at
// many characters at once: prose has many points, but few of them after these letters.
constexpr std::size_t blockSize = 4096;
inline bool mayEndWord(const char* block) {
    char found = 0;
    for (std::size_t i = 0; i < blockSize; ++i) {
        const char before = foldedLetter(block[i - 1]);
        found = static_cast<char>(found | ((block[i] == '.') & ((before == 'w') | (before == 'p'))));
    }
    return found != 0;
}

// Whether a text holds any of the entries. Every entry but the two words is or contains one of five symbols,
// so those stand for all of them; symbols have no case, so the text is not folded.
inline bool holdsDenied(std::string_view text) {
    constexpr std::string_view symbols = "<%$\\:";
    const auto holds = [text](char symbol) { return text.find(symbol) != std::string_view::npos; };
    if (std::any_of(symbols.begin(), symbols.end(), holds)) {
        return true;
    }
    std::size_t position = 1;
    for (; position + blockSize <= text.size(); position += blockSize) {
        if (mayEndWord(text.data() + position) && endsWord(text.substr(0, position + blockSize), position)) {
            return true;
        }
    }
    return endsWord(text, position);
}

// Makes a byte of each wide character, and NUL, which no entry holds, of those above U+00FF. Testing each for
// a negative value would cost a second comparison, so one test after the loop finds them all.
inline void makeNarrow(std::wstring_view text, char* narrow) {
    std::int32_t all = 0;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const std::int32_t code = codeOf(text[i]);
        all |= code;
        narrow[i] = static_cast<char>(code <= 0xFF ? code : 0);
    }
    if (all < 0) {
        std::transform(text.begin(), text.end(), narrow, [](wchar_t c) {
            const std::int32_t code = codeOf(c);
            return static_cast<char>(code >= 0 && code <= 0xFF ? code : 0);
        });
    }
}

// The same for wide text, block by block. Each block starts with the end of the one before it, because a word
// may begin there.
inline bool holdsDenied(std::wstring_view text) {
    std::array<char, wordLength - 1 + blockSize> block; // NOLINT(*-member-init): written before it is read
    std::size_t kept = 0;
    while (!text.empty()) {
        const std::size_t size = std::min(text.size(), blockSize);
        makeNarrow(text.substr(0, size), block.data() + kept);
        const std::string_view narrow(block.data(), kept + size);
        if (holdsDenied(narrow)) {
            return true;
        }
        kept = std::min(narrow.size(), wordLength - 1);
        std::copy_n(narrow.end() - kept, kept, block.begin());
        text.remove_prefix(size);
    }
    return false;
}

template <class Char, std::size_t size>
bool isAcceptable(std::basic_string<Char>& text, const std::basic_string<Char>& exemption,
                  const std::array<std::basic_string_view<Char>, size>& entries) {
    const auto end = std::find(entries.begin(), entries.end(), exemption);
    if (end == entries.end()) {
        return !holdsDenied(std::basic_string_view<Char>(text));
    }
    std::transform(text.begin(), text.end(), text.begin(), [](Char c) { return lowerCase(c); });
    return std::none_of(entries.begin(), end, [&text](std::basic_string_view<Char> entry) {
        return text.find(entry) != std::string_view::npos;
    });
}

} // namespace TK
