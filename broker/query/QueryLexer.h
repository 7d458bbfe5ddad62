// The words of a query.
#pragma once

#include "EmbeddedBroker.h"
#include "objects/Object.h"

#include <string>
#include <string_view>

namespace oxahv {

// Throws Failure; the text says where, characters counted from 1, and what.
[[noreturn]] void failInQuery(CMPIrc code, std::size_t column, const std::string& message);

enum class QueryTokenKind { word, integer, real, text, symbol, end };

struct QueryToken {
    QueryTokenKind kind = QueryTokenKind::end;
    std::size_t column = 1;
    std::string_view spelling;        // as it is written
    std::string text;                 // of a text: its characters
    unsigned long long magnitude = 0; // of an integer without its sign
    double real = 0;

    bool isNegative() const { return spelling[0] == '-' && magnitude != 0; }
    bool isSymbol(std::string_view symbol) const {
        return kind == QueryTokenKind::symbol && spelling == symbol;
    }
    bool isWord(std::string_view word) const {
        return kind == QueryTokenKind::word && sameName(spelling, word);
    }
};

// Reads token after token. Keywords are words here: the grammar knows where one can be a name.
class QueryLexer {
public:
    // The text has to outlive the lexer.
    explicit QueryLexer(std::string_view text) : text_(text) {}

    // The next token; one of kind `end` for ever after the last. Throws Failure.
    QueryToken next();

private:
    char at(std::size_t position) const { return position < text_.size() ? text_[position] : '\0'; }
    bool isNumberAhead() const;
    void skipBlanks();
    std::size_t columnOf(std::size_t position);
    [[noreturn]] void fail(std::size_t position, const std::string& message);
    void readNumber(QueryToken& token);
    void readReal(QueryToken& token);
    void readText(QueryToken& token);
    char32_t readEscape();
    char32_t readHexadecimal(std::size_t digits);
    void readSymbol();

    std::string_view text_;
    std::size_t position_ = 0;
    std::size_t counted_ = 0; // characters have been counted up to here
    std::size_t column_ = 1;  // of that position
};

} // namespace oxahv
