// The words of a MOF text.
#pragma once

#include <string>
#include <string_view>

namespace oxahv {

// A MOF text without byte order mark, and what errors call it.
struct MofSource {
    std::string name;
    std::string text;

    // Where an offset is.
    struct Place {
        std::size_t line = 1;
        std::size_t column = 1;
    };
    Place placeOf(std::size_t offset) const;
    // Throws BrokerError, `name:line:column: message` of the place.
    [[noreturn]] void fail(std::size_t offset, const std::string& message) const;
};

enum class MofKind { word, integer, real, character, text, alias, symbol, end };

struct MofToken {
    MofKind kind = MofKind::end;
    std::size_t offset = 0;
    std::string_view spelling;        // as it stands in the source
    std::string text;                 // of a text: what it says, in UTF-8
    unsigned long long magnitude = 0; // of an integer without its sign; of a character its code
    double real = 0;

    bool isNegative() const { return spelling[0] == '-' && magnitude != 0; }
};

// Reads token after token. Keywords are plain words here: where one may stand as a name, the grammar tells.
class MofLexer {
public:
    // Keeps the reference.
    explicit MofLexer(const MofSource& source);

    // The next token; behind the last one, and ever after, one of kind `end`. Throws BrokerError.
    MofToken next();
    // Passes over the rest of a pragma whose name was read last: up to its closing parenthesis, or to the
    // line's end when it has none.
    void skipPragma();

private:
    char at(std::size_t position) const;
    void skipBlanks();
    void readWord();
    void readNumber(MofToken& token);
    void readInteger(MofToken& token);
    void readCharacter(MofToken& token);
    std::string readQuoted(const char* what);
    unsigned long readEscape();
    unsigned long readHexadecimal();

    const MofSource& source_;
    std::string_view text_;
    std::size_t position_ = 0;
};

} // namespace oxahv
