#include "mof/MofValues.h"

#include "classes/Classes.h"
#include "objects/Records.h"
#include "text/DateTimeText.h"
#include "text/Integers.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace oxahv {

namespace {

bool isNullWord(const MofToken& constant) {
    return constant.kind == MofKind::word && sameName(constant.spelling, "null");
}

// One constant as a value of a type.
class ConstantReader {
public:
    ConstantReader(const MofSource& source, const MofToken& constant, CMPIType type)
        : source_(source), constant_(constant), type_(type) {}

    PlainValue read() const {
        if (isNullWord(constant_)) {
            return {};
        }
        switch (type_) {
        case CMPI_boolean:
            require(constant_.kind == MofKind::word);
            return sameName(constant_.spelling, "true");
        case CMPI_string:
            require(constant_.kind == MofKind::text);
            return constant_.text;
        case CMPI_dateTime:
            require(constant_.kind == MofKind::text && isDateTimeText(constant_.text));
            return constant_.text;
        case CMPI_char16:
            return readCharacter();
        case CMPI_ref:
            return readReference();
        case CMPI_real32:
        case CMPI_real64:
            return readReal();
        default:
            return readInteger();
        }
    }

private:
    void require(bool fits) const {
        if (!fits) {
            source_.fail(constant_.offset, "expected a value of type " + typeName(type_));
        }
    }

    [[noreturn]] void failFitting() const {
        source_.fail(constant_.offset,
                     std::string(constant_.spelling) + " does not fit into " + typeName(type_));
    }

    // Its code may stand as a number too.
    PlainValue readCharacter() const {
        require(constant_.kind == MofKind::character || constant_.kind == MofKind::integer);
        const bool isNumber = constant_.kind == MofKind::integer;
        if (constant_.magnitude > std::numeric_limits<CMPIChar16>::max() ||
            (isNumber && constant_.isNegative())) {
            failFitting();
        }
        return constant_.magnitude;
    }

    // An alias names an instance, and instances are passed over.
    PlainValue readReference() const {
        require(constant_.kind == MofKind::text || constant_.kind == MofKind::alias);
        return constant_.kind == MofKind::text ? PlainValue(constant_.text) : PlainValue();
    }

    PlainValue readReal() const {
        require(constant_.kind == MofKind::real || constant_.kind == MofKind::integer);
        double value = constant_.real;
        if (constant_.kind == MofKind::integer) {
            value = static_cast<double>(constant_.magnitude);
            value = constant_.isNegative() ? -value : value;
        }
        if (type_ == CMPI_real32 &&
            std::fabs(value) > static_cast<double>(std::numeric_limits<float>::max())) {
            failFitting();
        }
        return value;
    }

    PlainValue readInteger() const {
        require(constant_.kind == MofKind::integer);
        const IntegerType* const integer = integerType(type_);
        if (integer == nullptr || !integer->holds(constant_.magnitude, constant_.isNegative())) {
            failFitting();
        }
        if (!integer->isSigned) {
            return constant_.magnitude;
        }
        const unsigned long long bits =
            constant_.isNegative() ? 0 - constant_.magnitude : constant_.magnitude;
        return static_cast<long long>(bits);
    }

    const MofSource& source_;
    const MofToken& constant_;
    CMPIType type_;
};

} // namespace

DeclaredValue mofValueOf(const MofSource& source, const MofValue& value, CMPIType type) {
    DeclaredValue result{type, false, {}};
    const bool isArray = (type & CMPI_ARRAY) != 0;
    if (!value.isArray && isNullWord(value.constants.front())) {
        result.isNull = true;
        return result;
    }
    if (value.isArray != isArray) {
        source.fail(value.offset,
                    isArray ? "expected an array in braces" : "expected a value of type " + typeName(type));
    }
    for (const MofToken& constant : value.constants) {
        const ConstantReader reader(source, constant, static_cast<CMPIType>(type & ~CMPI_ARRAY));
        result.elements.push_back(reader.read());
    }
    result.isNull = !isArray && std::holds_alternative<std::monostate>(result.elements.front());
    if (result.isNull) {
        result.elements.clear();
    }
    return result;
}

CMPIType mofTypeOf(const MofValue& value) {
    unsigned int type = CMPI_string;
    const auto found = std::find_if_not(value.constants.begin(), value.constants.end(), isNullWord);
    if (found != value.constants.end()) {
        const MofToken& first = *found;
        const auto needsUnsigned = [](const MofToken& constant) {
            return constant.kind == MofKind::integer && !constant.isNegative() &&
                   constant.magnitude >
                       static_cast<unsigned long long>(std::numeric_limits<long long>::max());
        };
        if (first.kind == MofKind::integer) {
            const bool isWide = std::any_of(value.constants.begin(), value.constants.end(), needsUnsigned);
            type = isWide ? CMPI_uint64 : CMPI_sint64;
        } else if (first.kind == MofKind::real) {
            type = CMPI_real64;
        } else if (first.kind == MofKind::character) {
            type = CMPI_char16;
        } else if (first.kind == MofKind::word) {
            type = sameName(first.spelling, "instance") ? CMPI_instance : CMPI_boolean;
        }
    }
    return static_cast<CMPIType>(type | (value.isArray ? CMPI_ARRAY : 0U));
}

} // namespace oxahv
