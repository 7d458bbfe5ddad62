// The names of CIM: classes, properties, keys and namespaces are the same in any case of their ASCII letters.
// The C library's functions fold what the locale folds, so that two names would be one in one process and two
// in the next; these know no locale.
#pragma once

#include <algorithm>
#include <string>
#include <string_view>

namespace encoding {

constexpr char foldedLetter(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

inline std::string foldedName(std::string_view name) {
    std::string result(name);
    std::transform(result.begin(), result.end(), result.begin(), foldedLetter);
    return result;
}

inline bool sameName(std::string_view a, std::string_view b) {
    return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) {
               return foldedLetter(x) == foldedLetter(y);
           });
}

// Orders names, as the comparison of a container.
struct NameLess {
    using is_transparent = void; // no text is made of what is looked up

    bool operator()(std::string_view a, std::string_view b) const {
        return std::lexicographical_compare(a.begin(), a.end(), b.begin(), b.end(), [](char x, char y) {
            return static_cast<unsigned char>(foldedLetter(x)) < static_cast<unsigned char>(foldedLetter(y));
        });
    }
};

} // namespace encoding
