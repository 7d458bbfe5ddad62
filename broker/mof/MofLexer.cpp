#include "mof/MofLexer.h"

#include "EmbeddedBroker.h"

#include <Utf8.h>

#include <algorithm>
#include <charconv>
#include <optional>

namespace oxahv {

namespace {

bool isDigit(char c) {
    return c >= '0' && c <= '9';
}

bool isBlank(char c) {
    return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\f' || c == '\v';
}

// Names may have any character outside ASCII.
bool isNameStart(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_' ||
           static_cast<unsigned char>(c) >= 0x80;
}

bool isNamePart(char c) {
    return isNameStart(c) || isDigit(c);
}

bool isHighSurrogate(unsigned long code) {
    return code >= 0xD800 && code <= 0xDBFF;
}
bool isLowSurrogate(unsigned long code) {
    return code >= 0xDC00 && code <= 0xDFFF;
}

// The code of a text's only character, when it is one that 16 bits hold; else false.
bool decodeCharacter(std::string_view text, unsigned long long& code) {
    const auto character = text.empty() ? std::nullopt : encoding::takeUtf8(text);
    code = character.value_or(0);
    return character && text.empty() && code <= 0xFFFF;
}

constexpr std::string_view symbols = "[](){}:;,=#";
constexpr std::string_view lineEnds = "\r\n"; // each of them, and both together

} // namespace

MofSource::Place MofSource::placeOf(std::size_t offset) const {
    Place place;
    const std::string_view before = std::string_view(text).substr(0, offset);
    for (std::size_t i = 0; i < offset; ++i) {
        place.line += text[i] == '\n' || (text[i] == '\r' && text[i + 1] != '\n') ? 1 : 0;
    }
    const std::size_t lineStart =
        before.find_last_of(lineEnds) + 1; // 0 on the first line, where nothing is found
    place.column += static_cast<std::size_t>(
        std::count_if(before.begin() + static_cast<std::ptrdiff_t>(lineStart), before.end(),
                      [](char c) { return !encoding::isContinuation(c); }));
    return place;
}

void MofSource::fail(std::size_t offset, const std::string& message) const {
    const Place place = placeOf(offset);
    throw BrokerError(name + ':' + std::to_string(place.line) + ':' + std::to_string(place.column) + ": " +
                      message);
}

MofLexer::MofLexer(const MofSource& source) : source_(source), text_(source.text) {}

// A NUL behind the end: nothing that is asked of a character holds for it.
char MofLexer::at(std::size_t position) const {
    return position < text_.size() ? text_[position] : '\0';
}

void MofLexer::skipBlanks() {
    while (position_ < text_.size()) {
        if (isBlank(text_[position_])) {
            ++position_;
        } else if (text_.compare(position_, 2, "//") == 0) {
            position_ = std::min(text_.find_first_of(lineEnds, position_), text_.size());
        } else if (text_.compare(position_, 2, "/*") == 0) {
            const std::size_t end = text_.find("*/", position_ + 2);
            if (end == std::string_view::npos) {
                source_.fail(position_, "the comment is not closed");
            }
            position_ = end + 2;
        } else {
            return;
        }
    }
}

MofToken MofLexer::next() {
    skipBlanks();
    MofToken token;
    token.offset = position_;
    const char c = at(position_);
    if (position_ == text_.size()) {
        return token;
    }
    if (isNameStart(c)) {
        token.kind = MofKind::word;
        readWord();
    } else if (c == '"') {
        token.kind = MofKind::text;
        token.text = readQuoted("text");
    } else if (c == '\'') {
        readCharacter(token);
    } else if (isDigit(c) || c == '+' || c == '-' || c == '.') {
        readNumber(token);
    } else if (c == '$' && isNameStart(at(position_ + 1))) {
        token.kind = MofKind::alias;
        ++position_;
        readWord();
    } else if (c != '\0' && symbols.find(c) != std::string_view::npos) {
        token.kind = MofKind::symbol;
        ++position_;
    } else {
        source_.fail(position_, "this character cannot stand here");
    }
    token.spelling = text_.substr(token.offset, position_ - token.offset);
    return token;
}

void MofLexer::skipPragma() {
    const std::size_t lineEnd = std::min(text_.find_first_of(lineEnds, position_), text_.size());
    skipBlanks();
    if (at(position_) != '(') {
        position_ = lineEnd;
        return;
    }
    const std::size_t start = position_;
    for (MofToken token = next(); token.spelling != ")"; token = next()) {
        if (token.kind == MofKind::end) {
            source_.fail(start, "the parenthesis is not closed");
        }
    }
}

void MofLexer::readWord() {
    while (isNamePart(at(position_))) {
        ++position_;
    }
}

// Takes all that looks like a part of the number, so that a bad one is reported whole.
void MofLexer::readNumber(MofToken& token) {
    const std::size_t start = position_;
    position_ += at(start) == '+' || at(start) == '-' ? 1 : 0;
    const std::size_t digits = position_;
    const auto isExponentSign = [&](std::size_t position) {
        return (at(position) == '+' || at(position) == '-') &&
               (at(position - 1) == 'e' || at(position - 1) == 'E') &&
               text_.substr(digits, position - digits).find('.') != std::string_view::npos;
    };
    while (isNamePart(at(position_)) || at(position_) == '.' || isExponentSign(position_)) {
        ++position_;
    }
    token.spelling = text_.substr(start, position_ - start);
    const std::size_t point = text_.substr(digits, position_ - digits).find('.');
    if (point == std::string_view::npos) {
        readInteger(token);
        return;
    }
    token.kind = MofKind::real;
    const char* const end = text_.data() + position_;
    const auto result = std::from_chars(text_.data() + digits, end, token.real); // heeds no locale
    if (result.ptr != end || !isDigit(at(digits + point + 1))) {
        source_.fail(start, std::string(token.spelling) + " is no number");
    }
    if (result.ec != std::errc()) {
        source_.fail(start, std::string(token.spelling) + " does not fit into real64");
    }
    token.real = at(start) == '-' ? -token.real : token.real;
}

// Decimal; octal after a 0; hexadecimal after 0x; binary before a b.
void MofLexer::readInteger(MofToken& token) {
    token.kind = MofKind::integer;
    std::string_view digits = token.spelling;
    digits.remove_prefix(digits[0] == '+' || digits[0] == '-' ? 1 : 0);
    int base = 10;
    if (digits.size() > 2 && digits[0] == '0' && (digits[1] == 'x' || digits[1] == 'X')) {
        base = 16;
        digits.remove_prefix(2);
    } else if (digits.size() > 1 && (digits.back() == 'b' || digits.back() == 'B')) {
        base = 2;
        digits.remove_suffix(1);
    } else if (digits.size() > 1 && digits[0] == '0') {
        base = 8;
    }
    const auto result = std::from_chars(digits.data(), digits.data() + digits.size(), token.magnitude, base);
    if (result.ptr != digits.data() + digits.size() || digits.empty()) {
        source_.fail(token.offset, std::string(token.spelling) + " is no number");
    }
    if (result.ec != std::errc()) {
        source_.fail(token.offset, std::string(token.spelling) + " does not fit into 64 bits");
    }
}

void MofLexer::readCharacter(MofToken& token) {
    token.kind = MofKind::character;
    if (!decodeCharacter(readQuoted("character"), token.magnitude)) {
        source_.fail(token.offset, "expected one character of 16 bits between the quotes");
    }
}

// Between two quotes of the kind that stands here. Line breaks are part of a text.
std::string MofLexer::readQuoted(const char* what) {
    const std::size_t start = position_++;
    const char stops[] = {text_[start], '\\', '\0', '\0'};
    std::string value;
    while (true) {
        const std::size_t stop = text_.find_first_of(std::string_view(stops, 3), position_);
        if (stop == std::string_view::npos) {
            source_.fail(start, std::string("the ") + what + " is not closed");
        }
        value.append(text_, position_, stop - position_);
        position_ = stop;
        if (text_[stop] == '\0') {
            source_.fail(stop, "a NUL cannot stand in a text");
        }
        if (text_[stop] == text_[start]) {
            ++position_;
            return value;
        }
        encoding::appendUtf8(value, static_cast<char32_t>(readEscape()));
    }
}

// The character that the escape sequence at the position stands for.
unsigned long MofLexer::readEscape() {
    const std::size_t start = position_;
    const char c = at(start + 1);
    position_ += 2;
    switch (c) {
    case 'b':
        return '\b';
    case 't':
        return '\t';
    case 'n':
        return '\n';
    case 'f':
        return '\f';
    case 'r':
        return '\r';
    case '"':
    case '\'':
    case '\\':
        return static_cast<unsigned char>(c);
    case 'x':
    case 'X':
        break;
    default:
        source_.fail(start, "expected b, t, n, f, r, x, a quote or a backslash after this backslash");
    }
    unsigned long code = readHexadecimal();
    if (isHighSurrogate(code) && at(position_) == '\\' &&
        (at(position_ + 1) == 'x' || at(position_ + 1) == 'X')) {
        position_ += 2;
        const unsigned long low = readHexadecimal();
        code = isLowSurrogate(low) ? 0x10000 + ((code - 0xD800) << 10U) + (low - 0xDC00) : 0;
    }
    if (code == 0 || isHighSurrogate(code) || isLowSurrogate(code)) {
        source_.fail(start, "this escape sequence stands for no character");
    }
    return code;
}

// One to four digits; 0 when there is none.
unsigned long MofLexer::readHexadecimal() {
    unsigned long code = 0;
    const std::string_view digits = text_.substr(std::min(position_, text_.size()), 4);
    const auto result = std::from_chars(digits.data(), digits.data() + digits.size(), code, 16);
    position_ += static_cast<std::size_t>(result.ptr - digits.data());
    return code;
}

} // namespace oxahv
