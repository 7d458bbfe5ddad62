// The text of one line of a property file, without its end.
#pragma once

#include <string>
#include <string_view>

namespace TK::PropertyText {

struct Line {
    const char* damage = nullptr; // why the line cannot be read
    bool isEntry = false;         // else it is a comment or empty
    std::wstring key;
    std::wstring value;
    std::size_t valueStart = 0; // in the line
};

Line parse(std::string_view text);

std::string escapeKey(const std::wstring& key);
std::string escapeValue(const std::wstring& value);

} // namespace TK::PropertyText
