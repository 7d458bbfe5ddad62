#include "query/LikePattern.h"

#include "query/Query.h"
#include "query/QueryLexer.h"

#include <Utf8.h>

#include <algorithm>

namespace oxahv {

namespace {

// A byte that is no UTF-8 is a character of its own, past those of Unicode.
char32_t takeCharacter(std::string_view& text) {
    if (const auto character = encoding::takeUtf8(text)) {
        return *character;
    }
    const char32_t byte = static_cast<unsigned char>(text.front());
    text.remove_prefix(1);
    return 0x110000 + byte;
}

constexpr std::string_view beyondBasicPatterns = "[](){}?+|^$";

} // namespace

LikePattern::LikePattern(std::string_view pattern, QueryLanguage language, std::size_t column) {
    const bool isWql = language == QueryLanguage::wql;
    while (!pattern.empty()) {
        char32_t c = takeCharacter(pattern);
        const bool isPlain = c == U'\\';
        if (isPlain && pattern.empty()) {
            failInQuery(CMPI_RC_ERR_INVALID_QUERY, column, "the pattern ends with a backslash");
        }
        c = isPlain ? takeCharacter(pattern) : c;
        if (!isPlain && !isWql && c < 0x80 &&
            beyondBasicPatterns.find(static_cast<char>(c)) != std::string_view::npos) {
            failInQuery(queryFeatureNotSupported, column,
                        std::string("no basic pattern has a ") + static_cast<char>(c));
        }
        if (!isPlain && c == (isWql ? U'%' : U'*')) {
            if (!isWql && items_.empty()) {
                failInQuery(CMPI_RC_ERR_INVALID_QUERY, column, "the pattern's first * follows nothing");
            }
            if (isWql) {
                items_.push_back({true, true, 0});
            }
            items_.back().isRepeated = true;
        } else {
            const bool isAny = !isPlain && c == (isWql ? U'_' : U'.');
            items_.push_back({isAny, false, isAny ? 0 : c});
        }
    }
}

// What can be left out is passed over. A state is the position of the item that comes next.
void LikePattern::closure(std::vector<char>& states) const {
    for (std::size_t i = 0; i < items_.size(); ++i) {
        if (states[i] != 0 && items_[i].isRepeated) {
            states[i + 1] = 1;
        }
    }
}

// Keeps all places in the pattern that the text so far can lead to: no pattern takes longer than its length
// times the text's.
bool LikePattern::matches(std::string_view text) const {
    std::vector<char> states(items_.size() + 1, 0);
    states[0] = 1;
    closure(states);
    while (!text.empty()) {
        const char32_t c = takeCharacter(text);
        std::vector<char> after(states.size(), 0);
        for (std::size_t i = 0; i < items_.size(); ++i) {
            if (states[i] != 0 && (items_[i].isAny || items_[i].character == c)) {
                after[items_[i].isRepeated ? i : i + 1] = 1;
            }
        }
        closure(after);
        states.swap(after);
    }
    return states.back() != 0;
}

} // namespace oxahv
