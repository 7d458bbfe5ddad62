// Reads object paths, and single values, from texts.

#include "text/PathText.h"

#include "Core.h"
#include "mof/MofInstances.h"
#include "text/DateTimeText.h"
#include "text/Integers.h"

#include <Utf8.h>
#include <cctype>
#include <cerrno>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <limits>

namespace oxahv {

namespace {

bool isNameCharacter(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_' ||
           static_cast<unsigned char>(c) >= 0x80;
}

class PathReader {
public:
    // `subject` is what complaints call the text.
    PathReader(Core& core, const std::string& text, const char* subject = "object path")
        : core_(core), text_(text), subject_(subject) {}

    std::unique_ptr<ObjectPath> read(const std::string& defaultNameSpace) {
        std::string host = readHost();
        const std::string nameSpace = readNameSpace(defaultNameSpace);
        auto path = std::make_unique<ObjectPath>(core_, nameSpace, readName("a class name"));
        path->hostName = std::move(host);
        declared_ = core_.classes.find(path->className);
        if (position_ < text_.size()) {
            expect('.');
            readKey(*path);
            while (position_ < text_.size()) {
                expect(',');
                readKey(*path);
            }
        }
        return path;
    }

    // The whole text is one value.
    Value readOnlyValue(CMPIType wanted) {
        if (next() != '"' && isBareText(wanted)) {
            position_ = text_.size();
            return textValue(0, text_, wanted);
        }
        Value value = readValue(wanted);
        if (position_ < text_.size()) {
            fail(position_, "expected nothing behind the value");
        }
        return value;
    }

private:
    // Whether a text without quotes is itself the value: where a text is wanted, or, when anything is, where
    // it is neither a number nor TRUE or FALSE.
    bool isBareText(CMPIType wanted) const {
        if (wanted != CMPI_null) {
            return wanted == CMPI_string || wanted == CMPI_dateTime || wanted == CMPI_ref ||
                   wanted == CMPI_instance;
        }
        const std::size_t digits = text_.find_first_of("+-") == 0 ? 1 : 0;
        const bool isNumber =
            digits < text_.size() && text_.find_first_not_of("0123456789", digits) == std::string::npos;
        return !isNumber && !sameName(text_, "true") && !sameName(text_, "false");
    }

    Value readReal(CMPIType wanted) {
        const std::size_t start = position_;
        CMPIReal64 number = 0;
        const auto [end, error] = std::from_chars(text_.data() + start, text_.data() + text_.size(), number);
        const bool fits = wanted == CMPI_real64 || std::abs(number) <= std::numeric_limits<CMPIReal32>::max();
        if (error != std::errc() || !std::isfinite(number) || !fits) {
            fail(start, "expected a " + typeName(wanted));
        }
        position_ = static_cast<std::size_t>(end - text_.data());
        CMPIValue value = {};
        if (wanted == CMPI_real32) {
            value.real32 = static_cast<CMPIReal32>(number);
        } else {
            value.real64 = number;
        }
        return Value::number(value, wanted);
    }

    [[noreturn]] void fail(std::size_t position, const std::string& what) const {
        throw BrokerError(std::string(subject_) + ", column " + std::to_string(position + 1) + ": " + what);
    }

    char next() const { return position_ < text_.size() ? text_[position_] : '\0'; }

    void expect(char c) {
        if (next() != c) {
            fail(position_, std::string("expected '") + c + '\'');
        }
        ++position_;
    }

    // The host, which may have a port, of a text that begins with two slashes; else nothing. A namespace has
    // to follow it.
    std::string readHost() {
        if (text_.compare(0, 2, "//") != 0) {
            return {};
        }
        const std::size_t end = text_.find('/', 2);
        if (end == 2 || end == std::string::npos) {
            fail(2, end == 2 ? "expected a host" : "expected a slash and a namespace after the host");
        }
        position_ = end + 1;
        return text_.substr(2, end - 2);
    }

    // What is written before a colon, when that comes before any key.
    std::string readNameSpace(const std::string& defaultNameSpace) {
        const std::size_t start = position_;
        const std::size_t end = text_.find_first_of(":.\"=", start);
        if (end == std::string::npos || text_[end] != ':') {
            if (start != 0) {
                fail(start, "expected a namespace and a colon after the host");
            }
            return defaultNameSpace;
        }
        position_ = end + 1;
        return text_.substr(start, end - start);
    }

    std::string readName(const char* what) {
        const std::size_t start = position_;
        while (isNameCharacter(next())) {
            ++position_;
        }
        if (position_ == start) {
            fail(start, std::string("expected ") + what);
        }
        return text_.substr(start, position_ - start);
    }

    void readKey(ObjectPath& path) {
        const std::size_t start = position_;
        const std::string name = readName("a key name");
        const PropertyDeclaration* const property = declared_ != nullptr ? declared_->find(name) : nullptr;
        if (declared_ != nullptr && (property == nullptr || !property->isKey)) {
            fail(start, "class " + declared_->name + " has no key " + name);
        }
        if (path.keys.find(name)) {
            fail(start, "key " + name + " stands twice");
        }
        expect('=');
        path.keys.set(name,
                      readValue(property != nullptr ? property->type : static_cast<CMPIType>(CMPI_null)));
    }

    Value readValue(CMPIType wanted) {
        const std::size_t start = position_;
        if (next() == '"') {
            return textValue(start, readQuoted(), wanted);
        }
        if (wanted == CMPI_real32 || wanted == CMPI_real64) {
            return readReal(wanted);
        }
        if (wanted == CMPI_char16) {
            Value code = readNumber(CMPI_uint16);
            code.retype(CMPI_char16);
            return code;
        }
        if (next() == '-' || next() == '+' || (next() >= '0' && next() <= '9')) {
            return readNumber(wanted);
        }
        const std::string word = readName("a value");
        const bool isTrue = sameName(word, "true");
        if (!isTrue && !sameName(word, "false")) {
            fail(start, "expected a value: a number, a text in quotes, TRUE or FALSE");
        }
        if (wanted != CMPI_null && wanted != CMPI_boolean) {
            fail(start, "expected a " + typeName(wanted));
        }
        CMPIValue value = {};
        value.boolean = isTrue ? 1 : 0;
        return Value::number(value, CMPI_boolean);
    }

    std::string readQuoted() {
        const std::size_t start = position_++;
        std::string value;
        while (next() != '"') {
            if (next() == '\\') {
                ++position_;
                encoding::appendUtf8(value, unescaped());
            } else if (position_ < text_.size()) {
                value += next();
            } else {
                fail(start, "the quote is not closed");
            }
            ++position_;
        }
        ++position_;
        return value;
    }

    // The character after a backslash, of which the last one is still to be passed.
    char32_t unescaped() {
        switch (next()) {
        case '"':
            return U'"';
        case '\\':
            return U'\\';
        case 'n':
            return U'\n';
        case 'r':
            return U'\r';
        case 't':
            return U'\t';
        case 'x':
            return hexadecimal();
        default:
            fail(position_, "expected \", \\, n, r, t or x after a backslash");
        }
    }

    // As in MOF, up to four digits are read.
    char32_t hexadecimal() {
        constexpr std::size_t most = 4;
        const std::size_t start = position_ + 1;
        std::size_t length = 0;
        while (length < most && start + length < text_.size() &&
               std::isxdigit(static_cast<unsigned char>(text_[start + length])) != 0) {
            ++length;
        }
        const auto code = length > 0 ? std::stoul(std::string(text_.substr(start, length)), nullptr, 16) : 0;
        if (code == 0 || !encoding::isUnicodeScalar(static_cast<char32_t>(code))) {
            fail(start, "expected the digits of a character");
        }
        position_ = start + length - 1;
        return static_cast<char32_t>(code);
    }

    Value textValue(std::size_t start, const std::string& text, CMPIType wanted) {
        switch (wanted) {
        case CMPI_null:
        case CMPI_string:
            return Value::text(core_, text);
        case CMPI_ref: {
            CMPIValue value = {};
            const std::unique_ptr<ObjectPath> path = PathReader(core_, text).read("");
            value.ref = path.get();
            return Value::from(core_, &value, CMPI_ref);
        }
        case CMPI_dateTime: {
            if (!isDateTimeText(text)) {
                fail(start, "expected a datetime");
            }
            DateTime dateTime(core_, text);
            CMPIValue value = {};
            value.dateTime = &dateTime;
            return Value::from(core_, &value, CMPI_dateTime);
        }
        case CMPI_instance: {
            CMPIValue value = {};
            const std::unique_ptr<Instance> instance = readInstance(core_, {"embedded instance", text}, "");
            value.inst = instance.get();
            return Value::from(core_, &value, CMPI_instance);
        }
        default:
            fail(start, "expected a " + typeName(wanted));
        }
    }

    // Without a declaration a number gets the widest type.
    Value readNumber(CMPIType wanted) {
        const std::size_t start = position_;
        const bool hasSign = next() == '-' || next() == '+';
        position_ += hasSign ? 1 : 0;
        const std::string digits = readName("digits");
        if (digits.find_first_not_of("0123456789") != std::string::npos) {
            fail(start, "expected a number");
        }
        const CMPIType type =
            wanted != CMPI_null ? wanted : static_cast<CMPIType>(hasSign ? CMPI_sint64 : CMPI_uint64);
        const IntegerType* const integer = integerType(type);
        if (integer == nullptr) {
            fail(start, "expected a " + typeName(type));
        }
        errno = 0;
        const unsigned long long magnitude = std::strtoull(digits.c_str(), nullptr, 10);
        const bool isNegative = text_[start] == '-' && magnitude != 0;
        if (errno == ERANGE || !integer->holds(magnitude, isNegative)) {
            fail(start, text_.substr(start, position_ - start) + " does not fit into " + typeName(type));
        }
        CMPIValue value = {};
        value.uint64 = isNegative ? 0 - magnitude : magnitude; // the narrower members share its low bytes
        return Value::number(value, type);
    }

    Core& core_;
    const std::string& text_;
    const char* subject_;
    std::size_t position_ = 0;
    const DeclaredClass* declared_ = nullptr;
};

} // namespace

Value readValue(Core& core, const std::string& text, CMPIType type) {
    return PathReader(core, text, "value").readOnlyValue(type);
}

std::unique_ptr<ObjectPath> readPath(Core& core, const std::string& text, const std::string& nameSpace) {
    return PathReader(core, text).read(nameSpace);
}

} // namespace oxahv
