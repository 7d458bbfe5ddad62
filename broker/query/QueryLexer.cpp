#include "query/QueryLexer.h"

#include "query/Query.h"

#include <Utf8.h>

#include <charconv>

namespace oxahv {

namespace {

bool isDigit(char c) {
    return c >= '0' && c <= '9';
}

// Names may have any character outside ASCII, as in MOF.
bool isNameStart(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_' ||
           static_cast<unsigned char>(c) >= 0x80;
}

constexpr std::string_view blanks = " \t\r\n\f\v";
constexpr std::string_view longSymbols[] = {"<>", "<=", ">=", "!=", "::"};
constexpr std::string_view symbols = "()*,.=<>";
constexpr std::string_view beyondBasicQueries = "+-/[]#|";

} // namespace

void failInQuery(CMPIrc code, std::size_t column, const std::string& message) {
    failWith(code, "query, column " + std::to_string(column) + ": " + message);
}

// Counts on from the last place that was asked for, so that a long query is counted once.
std::size_t QueryLexer::columnOf(std::size_t position) {
    for (; counted_ < position; ++counted_) {
        column_ += encoding::isContinuation(at(counted_)) ? 0 : 1;
    }
    return column_;
}

void QueryLexer::fail(std::size_t position, const std::string& message) {
    failInQuery(CMPI_RC_ERR_INVALID_QUERY, columnOf(position), message);
}

void QueryLexer::skipBlanks() {
    position_ = std::min(text_.find_first_not_of(blanks, position_), text_.size());
}

bool QueryLexer::isNumberAhead() const {
    const std::size_t digits = position_ + (at(position_) == '+' || at(position_) == '-' ? 1 : 0);
    return isDigit(at(digits)) || (at(digits) == '.' && isDigit(at(digits + 1)));
}

QueryToken QueryLexer::next() {
    skipBlanks();
    QueryToken token;
    token.column = columnOf(position_);
    if (position_ == text_.size()) {
        return token;
    }
    const std::size_t start = position_;
    const char c = at(position_);
    if (isNameStart(c)) {
        token.kind = QueryTokenKind::word;
        while (isNameStart(at(position_)) || isDigit(at(position_))) {
            ++position_;
        }
    } else if (isNumberAhead()) {
        readNumber(token);
    } else if (c == '"' || c == '\'') {
        readText(token);
    } else {
        token.kind = QueryTokenKind::symbol;
        readSymbol();
    }
    token.spelling = text_.substr(start, position_ - start);
    return token;
}

void QueryLexer::readSymbol() {
    for (const std::string_view symbol : longSymbols) {
        if (text_.substr(position_, symbol.size()) == symbol) {
            position_ += symbol.size();
            return;
        }
    }
    const char c = at(position_);
    if (c != '\0' && beyondBasicQueries.find(c) != std::string_view::npos) {
        failInQuery(queryFeatureNotSupported, columnOf(position_),
                    std::string("no basic query has the operator ") + c);
    }
    if (c == '\0' || symbols.find(c) == std::string_view::npos) {
        fail(position_, "no query has this character");
    }
    ++position_;
}

// Takes all that looks like a part of the number, so that a bad one is reported whole.
void QueryLexer::readNumber(QueryToken& token) {
    const std::size_t start = position_;
    position_ += isDigit(at(start)) || at(start) == '.' ? 0 : 1;
    const std::size_t digits = position_;
    const bool isHexadecimal = at(digits) == '0' && (at(digits + 1) == 'x' || at(digits + 1) == 'X');
    bool isReal = false;
    for (;; ++position_) {
        const char c = at(position_);
        const char before = at(position_ - 1);
        const bool isExponentSign = (c == '+' || c == '-') && position_ > digits && !isHexadecimal &&
                                    (before == 'e' || before == 'E');
        if (!isNameStart(c) && !isDigit(c) && c != '.' && !isExponentSign) {
            break;
        }
        isReal = isReal || c == '.' || (!isHexadecimal && (c == 'e' || c == 'E'));
    }
    token.spelling = text_.substr(start, position_ - start);
    if (isReal) {
        readReal(token);
        return;
    }
    token.kind = QueryTokenKind::integer;
    const std::size_t first = digits + (isHexadecimal ? 2 : 0);
    const char* const end = text_.data() + position_;
    const auto [after, error] =
        std::from_chars(text_.data() + first, end, token.magnitude, isHexadecimal ? 16 : 10);
    if (after != end) {
        fail(start, std::string(token.spelling) + " is no number");
    }
    if (error != std::errc() || (token.spelling[0] == '-' && token.magnitude > 1ULL << 63U)) {
        fail(start, std::string(token.spelling) + " does not fit into 64 bits");
    }
}

void QueryLexer::readReal(QueryToken& token) {
    token.kind = QueryTokenKind::real;
    std::string_view digits = token.spelling;
    const bool isNegative = digits[0] == '-';
    digits.remove_prefix(isNegative || digits[0] == '+' ? 1 : 0);
    const char* const end = digits.data() + digits.size();
    const auto [after, error] = std::from_chars(digits.data(), end, token.real); // heeds no locale
    const auto start = static_cast<std::size_t>(token.spelling.data() - text_.data());
    if (after != end) {
        fail(start, std::string(token.spelling) + " is no number");
    }
    if (error != std::errc()) {
        fail(start, std::string(token.spelling) + " does not fit into a real64");
    }
    token.real = isNegative ? -token.real : token.real;
}

// Between two quotes of one kind. A quote is written twice, as SQL has it, or with a backslash.
void QueryLexer::readText(QueryToken& token) {
    token.kind = QueryTokenKind::text;
    const std::size_t start = position_++;
    const char quote = text_[start];
    while (true) {
        const char c = at(position_);
        if (position_ >= text_.size()) {
            fail(start, "the quote is not closed");
        }
        if (c == '\\') {
            encoding::appendUtf8(token.text, readEscape());
        } else if (c != quote) {
            token.text += c;
            ++position_;
        } else if (at(position_ + 1) == quote) {
            token.text += quote;
            position_ += 2;
        } else {
            ++position_;
            return;
        }
    }
}

// The character of the escape sequence at the position.
char32_t QueryLexer::readEscape() {
    const std::size_t start = position_;
    const char c = at(start + 1);
    position_ += 2;
    switch (c) {
    case 'b':
        return U'\b';
    case 't':
        return U'\t';
    case 'n':
        return U'\n';
    case 'f':
        return U'\f';
    case 'r':
        return U'\r';
    case '"':
    case '\'':
    case '\\':
        return static_cast<unsigned char>(c);
    case 'u':
    case 'U':
        break;
    default:
        fail(start, "expected b, t, n, f, r, u, U, a quote or a backslash after this backslash");
    }
    const char32_t code = readHexadecimal(c == 'u' ? 4 : 8);
    if (code == 0 || !encoding::isUnicodeScalar(code)) {
        fail(start, "this escape sequence is not a character's");
    }
    return code;
}

// 0 when there are not as many digits.
char32_t QueryLexer::readHexadecimal(std::size_t digits) {
    std::uint32_t code = 0;
    const std::string_view text = text_.substr(std::min(position_, text_.size()), digits);
    const auto result = std::from_chars(text.data(), text.data() + text.size(), code, 16);
    position_ += text.size();
    return text.size() == digits && result.ptr == text.data() + digits ? code : 0;
}

} // namespace oxahv
