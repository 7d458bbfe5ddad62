#include "DateTime.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <limits>
#include <stdexcept>
#include <string_view>
#include <system_error>

namespace TK {

namespace {

// Reads a text from left to right. Once a step has failed, the later ones do nothing.
class Reader {
public:
    explicit Reader(std::string_view text) : rest_(text) {}

    // Digits, at least `width` of them, whose number is at most `maximum`.
    unsigned int number(std::size_t width, unsigned int maximum) {
        unsigned int value = 0;
        const char* const begin = rest_.data();
        const auto [end, error] = std::from_chars(begin, begin + rest_.size(), value);
        const auto digits = static_cast<std::size_t>(end - begin);
        good_ = good_ && error == std::errc() && digits >= width && value <= maximum;
        rest_.remove_prefix(digits);
        return value;
    }

    template <class Field>
    Field field(std::size_t width) {
        return static_cast<Field>(number(width, std::numeric_limits<Field>::max()));
    }

    bool skipIf(char expected) {
        if (rest_.empty() || rest_.front() != expected) {
            return false;
        }
        rest_.remove_prefix(1);
        return true;
    }

    void skip(char expected) { good_ = skipIf(expected) && good_; }

    bool readAll() const { return good_ && rest_.empty(); }

private:
    std::string_view rest_;
    bool good_ = true;
};

// Writes into a buffer that the longest date fits into: "65535-255-255 255:255:255.4294967295-32768".
class Writer {
public:
    void number(unsigned int value, std::ptrdiff_t width) {
        std::array<char, 10> digits{};
        const char* const end = std::to_chars(digits.data(), digits.data() + digits.size(), value).ptr;
        end_ = std::fill_n(end_, std::max<std::ptrdiff_t>(0, width - (end - digits.data())), '0');
        end_ = std::copy<const char*>(digits.data(), end, end_);
    }

    void character(char character) { *end_++ = character; }

    std::string text() const { return {buffer_.data(), static_cast<std::size_t>(end_ - buffer_.data())}; }

private:
    std::array<char, 48> buffer_{};
    char* end_ = buffer_.data();
};

} // namespace

DateTime::DateTime() = default;

DateTime::DateTime(const std::string& text, unsigned int format) {
    if (format != 3) {
        throw std::invalid_argument("unknown date format code " + std::to_string(format));
    }
    Reader reader(text);
    year_ = reader.field<unsigned short>(4);
    reader.skip('-');
    month_ = reader.field<unsigned char>(2);
    reader.skip('-');
    day_ = reader.field<unsigned char>(2);
    reader.skip(' ');
    hour_ = reader.field<unsigned char>(2);
    reader.skip(':');
    minute_ = reader.field<unsigned char>(2);
    reader.skip(':');
    second_ = reader.field<unsigned char>(2);
    if (reader.skipIf('.')) {
        millisecond_ = reader.field<unsigned int>(3);
    }
    constexpr int maximum = std::numeric_limits<short>::max();
    if (reader.skipIf('+')) {
        offset_ = static_cast<short>(reader.number(3, maximum));
    } else if (reader.skipIf('-')) {
        offset_ = static_cast<short>(-static_cast<int>(reader.number(3, maximum + 1)));
    }
    if (!reader.readAll()) {
        throw std::invalid_argument("not a date: '" + text + "'");
    }
}

DateTime::operator std::string() const {
    Writer writer;
    writer.number(year_, 4);
    writer.character('-');
    writer.number(month_, 2);
    writer.character('-');
    writer.number(day_, 2);
    writer.character(' ');
    writer.number(hour_, 2);
    writer.character(':');
    writer.number(minute_, 2);
    writer.character(':');
    writer.number(second_, 2);
    if (millisecond_ != 0) {
        writer.character('.');
        writer.number(millisecond_, 3);
    }
    if (offset_ != 0) {
        const int offset = offset_;
        writer.character(offset < 0 ? '-' : '+');
        writer.number(static_cast<unsigned int>(offset < 0 ? -offset : offset), 3);
    }
    return writer.text();
}

unsigned short DateTime::getYear() const {
    return year_;
}

unsigned char DateTime::getMonth() const {
    return month_;
}

unsigned char DateTime::getDay() const {
    return day_;
}

unsigned char DateTime::getHour() const {
    return hour_;
}

unsigned char DateTime::getMinute() const {
    return minute_;
}

unsigned char DateTime::getSecond() const {
    return second_;
}

unsigned int DateTime::getMillisecond() const {
    return millisecond_;
}

short DateTime::getOffset() const {
    return offset_;
}

void DateTime::setYear(unsigned short year) {
    year_ = year;
}

void DateTime::setMonth(unsigned char month) {
    month_ = month;
}

void DateTime::setDay(unsigned char day) {
    day_ = day;
}

void DateTime::setHour(unsigned char hour) {
    hour_ = hour;
}

void DateTime::setMinute(unsigned char minute) {
    minute_ = minute;
}

void DateTime::setSecond(unsigned char second) {
    second_ = second;
}

void DateTime::setMillisecond(unsigned int millisecond) {
    millisecond_ = millisecond;
}

void DateTime::setOffset(short offset) {
    offset_ = offset;
}

bool operator==(const DateTime& left, const DateTime& right) {
    return left.getYear() == right.getYear() && left.getMonth() == right.getMonth() &&
           left.getDay() == right.getDay() && left.getHour() == right.getHour() &&
           left.getMinute() == right.getMinute() && left.getSecond() == right.getSecond() &&
           left.getMillisecond() == right.getMillisecond() && left.getOffset() == right.getOffset();
}

bool operator!=(const DateTime& left, const DateTime& right) {
    return !(left == right);
}

} // namespace TK
