// The patterns of LIKE.
#pragma once

#include <cstddef>
#include <string_view>
#include <vector>

namespace oxahv {

enum class QueryLanguage { wql, cql };

// A compiled pattern. It matches whole texts in UTF-8, character by character; letters match in their own
// case alone.
class LikePattern {
public:
    LikePattern() = default;
    // WQL: `%` is any number of characters, `_` is one. CQL: `.` is any character, and `*` repeats what it
    // follows, as a regular expression has it; an expression beyond that throws Failure with
    // queryFeatureNotSupported. In both a backslash takes the next character's meaning away. `column` is the
    // pattern's place in its query.
    LikePattern(std::string_view pattern, QueryLanguage language, std::size_t column);

    bool matches(std::string_view text) const;

private:
    struct Item {
        bool isAny = false;
        bool isRepeated = false; // none, one or more of it
        char32_t character = 0;
    };
    void closure(std::vector<char>& states) const;

    std::vector<Item> items_;
};

} // namespace oxahv
