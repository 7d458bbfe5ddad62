// The text of one line of a property file, without its end.
#pragma once

#include <string>
#include <string_view>

namespace TK::PropertyText {

// Of the text of a line.
struct Part {
    std::size_t start = 0;
    std::size_t size = 0;

    std::string_view of(std::string_view text) const { return text.substr(start, size); }
};

struct Line {
    const char* damage = nullptr; // why the line cannot be read
    bool isEntry = false;         // else it is a comment, empty or damaged
    Part key;                     // as written, without the blanks at its ends
    Part value;                   // likewise
};

// Finds the parts of a line, and reads neither escapes nor characters.
Line split(std::string_view text);

// These take a key or a value as it is written. They return null, or the reason why it cannot be read.

const char* check(std::string_view written);
// Appends what is written to `result`.
const char* read(std::string_view written, std::wstring& result);

// Whether something readable is written that reads as `text`.
bool readsAs(std::string_view written, std::wstring_view text);

std::string escapeKey(std::wstring_view key);
std::string escapeValue(std::wstring_view value);

} // namespace TK::PropertyText
