// Some of the library's operations once more, the obvious way, for tests and fuzzers to compare with.
#pragma once

#include "DateTime.h"

#include <array>
#include <cstdio>
#include <cstdlib>
#include <cwchar>
#include <optional>
#include <string>

namespace obvious {

// Users' texts

inline const std::array<std::string, 12> entries = {"<",    "http:", "https:", "%",     "$", "\\\\",
                                                    "www.", "wap.",  "ftp:",   "sftp:", ":", "\\"};

template <class Char>
std::basic_string<Char> widened(const std::string& text) {
    return {text.begin(), text.end()};
}

template <class Char>
bool isAcceptable(std::basic_string<Char> text, const std::basic_string<Char>& exemption) {
    for (Char& character : text) {
        character = character >= 'A' && character <= 'Z' ? static_cast<Char>(character + 32) : character;
    }
    for (const std::string& entry : entries) {
        if (exemption == widened<Char>(entry)) {
            return true;
        }
        if (text.find(widened<Char>(entry)) != std::basic_string<Char>::npos) {
            return false;
        }
    }
    return true;
}

// Wide and narrow texts: what the C library makes of one in one piece, with room for it all.

inline std::optional<std::string> converted(const std::wstring& text) {
    std::string bytes((text.size() + 1) * 16, '\0');
    std::mbstate_t state{};
    const wchar_t* from = text.c_str();
    const std::size_t size = std::wcsrtombs(bytes.data(), &from, bytes.size(), &state);
    return size != std::string::npos ? std::make_optional(bytes.substr(0, size)) : std::nullopt;
}

inline std::optional<std::wstring> converted(const std::string& text) {
    std::wstring characters(text.size() + 1, L'\0');
    std::mbstate_t state{};
    const char* from = text.c_str();
    const std::size_t size = std::mbsrtowcs(characters.data(), &from, characters.size(), &state);
    return size != std::string::npos ? std::make_optional(characters.substr(0, size)) : std::nullopt;
}

// Dates

inline TK::DateTime date(unsigned short year, unsigned char month, unsigned char day, unsigned char hour,
                         unsigned char minute, unsigned char second, unsigned int millisecond, short offset) {
    TK::DateTime result;
    result.setYear(year);
    result.setMonth(month);
    result.setDay(day);
    result.setHour(hour);
    result.setMinute(minute);
    result.setSecond(second);
    result.setMillisecond(millisecond);
    result.setOffset(offset);
    return result;
}

// What a CIM date/time text of 21 characters and more stands for.
inline TK::DateTime parsed(const std::string& text) {
    const auto field = [&text](std::size_t position, std::size_t width) {
        return std::strtol(text.substr(position, width).c_str(), nullptr, 10);
    };
    const auto year = static_cast<unsigned short>(field(0, 4));
    const auto month = static_cast<unsigned char>(field(4, 2));
    const auto day = static_cast<unsigned char>(field(6, 2));
    return date(year != 0 ? year : 1970, month != 0 ? month : 1, day != 0 ? day : 1,
                static_cast<unsigned char>(field(8, 2)), static_cast<unsigned char>(field(10, 2)),
                static_cast<unsigned char>(field(12, 2)), static_cast<unsigned int>(field(15, 6)),
                static_cast<short>(field(21, 4)));
}

inline std::string formatted(const TK::DateTime& value) {
    const int minutes = value.getOffset() * 60;
    char text[64];
    std::snprintf(text, sizeof text, "%04d%02d%02d%02d%02d%02d.%06u%c%03d",
                  value.getYear() != 0 ? value.getYear() : 1970, value.getMonth() != 0 ? value.getMonth() : 1,
                  value.getDay() != 0 ? value.getDay() : 1, value.getHour(), value.getMinute(),
                  value.getSecond(), value.getMillisecond(), minutes < 0 ? '-' : '+', std::abs(minutes));
    return text;
}

} // namespace obvious
