// What a query says of an instance, or of whatever else has values by name. Its logic has three values: what
// depends on a NULL is unknown, and so is what is made of it, unless the rest decides.

#include "Core.h"
#include "query/Query.h"
#include "text/DateTimeText.h"

#include <Utf8.h>

#include <algorithm>
#include <cmath>
#include <functional>
#include <optional>

namespace oxahv {

namespace {

// In this order AND is the lower of two, and OR the higher.
enum class Truth { no, unknown, yes };

Truth truthOf(bool isTrue) {
    return isTrue ? Truth::yes : Truth::no;
}

[[noreturn]] void failToCompare(const QueryPredicate& predicate) {
    failWith(CMPI_RC_ERR_TYPE_MISMATCH, "query, column " + std::to_string(predicate.left.column) +
                                            ": the value of property " + predicate.left.text +
                                            " has a type that does not allow this comparison");
}

// Values as they compare.

struct Real {
    double number;
    bool isNarrow; // came as a real32
};
struct Date {
    std::string_view text;
};
struct Character {
    CMPIChar16 code;
};
struct Path {
    std::string text;
};
struct Incomparable {}; // such as an array

using Comparable = std::variant<std::monostate, bool, WideInteger, Real, std::string_view, Date, Character,
                                Path, Incomparable>;

Comparable objectOf(const CMPIData& data) {
    if (data.type == CMPI_chars) {
        return data.value.chars != nullptr ? Comparable(std::string_view(data.value.chars))
                                           : std::monostate();
    }
    if (data.value.string == nullptr) { // all handles share their place
        return std::monostate();
    }
    const String* const string = data.type == CMPI_string ? String::of(data.value.string) : nullptr;
    const DateTime* const date = data.type == CMPI_dateTime ? DateTime::of(data.value.dateTime) : nullptr;
    if (string != nullptr) {
        return std::string_view(string->text);
    }
    if (date != nullptr) {
        return Date{date->text};
    }
    if (data.type == CMPI_ref && ObjectPath::of(data.value.ref) != nullptr) {
        return Path{pathText(data.value.ref)};
    }
    return Incomparable();
}

Comparable comparableOf(const CMPIData& data) {
    if ((data.state & (CMPI_nullValue | CMPI_notFound | CMPI_badValue)) != 0 || data.type == CMPI_null) {
        return std::monostate();
    }
    switch (data.type) {
    case CMPI_boolean:
        return data.value.boolean != 0;
    case CMPI_char16:
        return Character{data.value.char16};
    case CMPI_real32:
        return Real{data.value.real32, true};
    case CMPI_real64:
        return Real{data.value.real64, false};
    default:
        return integerType(data.type) != nullptr
                   ? Comparable(Value::number(memberOf(&data.value, data.type), data.type).integer())
                   : objectOf(data);
    }
}

struct LiteralReader {
    Comparable operator()(double number) const { return Real{number, false}; }
    Comparable operator()(const std::string& text) const { return std::string_view(text); }
    template <class Other>
    Comparable operator()(const Other& other) const {
        return other;
    }
};

// The order of two values: negative, zero or positive.

template <class Number>
int sign(Number a, Number b) {
    return a < b ? -1 : (b < a ? 1 : 0);
}

int orderOf(const WideInteger& a, const WideInteger& b) {
    if (a.isNegative != b.isNegative) {
        return a.isNegative ? -1 : 1;
    }
    return a.isNegative ? sign(b.magnitude, a.magnitude) : sign(a.magnitude, b.magnitude);
}

// Exact, where a conversion of either to the other's type would round.
int orderOf(const WideInteger& a, double b) {
    constexpr double beyondAll = 18446744073709551616.0; // 2 to the 64th
    if (std::abs(b) >= beyondAll) {
        return b > 0 ? -1 : 1;
    }
    const double whole = std::trunc(b);
    const WideInteger truncated = {static_cast<unsigned long long>(std::abs(whole)), whole < 0};
    const int order = orderOf(a, truncated);
    return order != 0 ? order : sign(whole, b);
}

// Compares two values of which neither is NULL. Nothing comes of what cannot be compared.
struct Comparison {
    // What has no order is equal or not.
    struct Result {
        int order;
        bool isOrdered;
    };
    using Order = std::optional<Result>;

    static Order ordered(int order) { return Result{order, true}; }
    static Order inverted(Order order) {
        return order ? Order(Result{-order->order, order->isOrdered}) : order;
    }

    Order operator()(bool a, bool b) const { return Result{a == b ? 0 : 1, false}; }
    Order operator()(const WideInteger& a, const WideInteger& b) const { return ordered(orderOf(a, b)); }
    Order operator()(const WideInteger& a, Real b) const { return ordered(orderOf(a, b.number)); }
    Order operator()(Real a, const WideInteger& b) const { return ordered(-orderOf(b, a.number)); }
    // 0.1 in a real32 is the 0.1 of a query, though not the real64 of that text.
    Order operator()(Real a, Real b) const {
        return ordered(a.isNarrow || b.isNarrow
                           ? sign(static_cast<float>(a.number), static_cast<float>(b.number))
                           : sign(a.number, b.number));
    }
    Order operator()(std::string_view a, std::string_view b) const { return ordered(a.compare(b)); }
    Order operator()(Date a, Date b) const {
        if (isIntervalText(a.text) != isIntervalText(b.text)) {
            return std::nullopt;
        }
        return ordered(sign(microsecondsOf(a.text), microsecondsOf(b.text)));
    }
    Order operator()(Date a, std::string_view b) const {
        return isDateTimeText(b) ? (*this)(a, Date{b}) : std::nullopt;
    }
    Order operator()(Character a, Character b) const { return ordered(sign(a.code, b.code)); }
    Order operator()(Character a, const WideInteger& b) const {
        return ordered(orderOf(WideInteger{a.code, false}, b));
    }
    Order operator()(Character a, std::string_view b) const {
        std::string text;
        encoding::appendUtf8(text, a.code);
        return ordered(text.compare(b));
    }
    Order operator()(const Path& a, const Path& b) const { return (*this)(a, std::string_view(b.text)); }
    Order operator()(const Path& a, std::string_view b) const { return Result{a.text == b ? 0 : 1, false}; }
    Order operator()(std::string_view a, Date b) const { return inverted((*this)(b, a)); }
    Order operator()(const WideInteger& a, Character b) const { return inverted((*this)(b, a)); }
    Order operator()(std::string_view a, Character b) const { return inverted((*this)(b, a)); }
    Order operator()(std::string_view a, const Path& b) const { return inverted((*this)(b, a)); }
    template <class One, class Other>
    Order operator()(const One& /*a*/, const Other& /*b*/) const {
        return std::nullopt;
    }
};

bool isNan(const Comparable& value) {
    const Real* const real = std::get_if<Real>(&value);
    return real != nullptr && std::isnan(real->number);
}

bool holds(CMPIPredOp operation, int order) {
    switch (operation) {
    case CMPI_PredOp_Equals:
        return order == 0;
    case CMPI_PredOp_NotEquals:
        return order != 0;
    case CMPI_PredOp_LessThan:
        return order < 0;
    case CMPI_PredOp_LessThanOrEquals:
        return order <= 0;
    case CMPI_PredOp_GreaterThan:
        return order > 0;
    default:
        return order >= 0;
    }
}

Truth compare(const QueryPredicate& predicate, const Comparable& left, const Comparable& right) {
    const auto isNull = [](const Comparable& value) { return std::holds_alternative<std::monostate>(value); };
    if (isNull(left) || isNull(right) || isNan(left) || isNan(right)) {
        return Truth::unknown;
    }
    const Comparison::Order order = std::visit(Comparison(), left, right);
    const bool isEquality =
        predicate.operation == CMPI_PredOp_Equals || predicate.operation == CMPI_PredOp_NotEquals;
    if (!order || (!order->isOrdered && !isEquality)) {
        failToCompare(predicate);
    }
    return truthOf(holds(predicate.operation, order->order));
}

Truth isA(const Classes& classes, const QueryPredicate& predicate, const CMPIData& data) {
    if (CMIsNullValue(data) || data.type == CMPI_null) {
        return Truth::unknown;
    }
    const Instance* const instance = data.type == CMPI_instance ? Instance::of(data.value.inst) : nullptr;
    const ObjectPath* const path = data.type == CMPI_ref ? ObjectPath::of(data.value.ref)
                                   : instance != nullptr ? instance->path.get()
                                                         : nullptr;
    if (path == nullptr) {
        failToCompare(predicate);
    }
    const auto& wanted = std::get<std::string>(std::get<QueryLiteral>(predicate.right));
    return truthOf(classes.isA(path->className, wanted) == (predicate.operation == CMPI_PredOp_Isa));
}

Truth isLike(const QueryPredicate& predicate, const Comparable& value) {
    if (std::holds_alternative<std::monostate>(value)) {
        return Truth::unknown;
    }
    const auto* const text = std::get_if<std::string_view>(&value);
    if (text == nullptr) {
        failToCompare(predicate);
    }
    return truthOf(predicate.pattern.matches(*text) == (predicate.operation == CMPI_PredOp_Like));
}

bool isNull(const CMPIData& data) {
    return CMIsNullValue(data) || data.type == CMPI_null || (data.state & CMPI_notFound) != 0;
}

Truth evaluate(const Classes& classes, const QueryPredicate& predicate, const QuerySource& source) {
    const CMPIData data = source.valueOf(predicate.left);
    switch (predicate.operation) {
    case CMPI_PredOp_Null:
        return truthOf(isNull(data));
    case CMPI_PredOp_Not_Null:
        return truthOf(!isNull(data));
    case CMPI_PredOp_Isa:
    case CMPI_PredOp_NotIsa:
        return isA(classes, predicate, data);
    case CMPI_PredOp_Like:
    case CMPI_PredOp_NotLike:
        return isLike(predicate, comparableOf(data));
    default:
        break;
    }
    Comparable left = comparableOf(data);
    if (const auto* const property = std::get_if<QueryProperty>(&predicate.right)) {
        std::string kept; // a source may write the next text into the place of the last
        if (auto* const text = std::get_if<std::string_view>(&left)) {
            kept = *text;
            *text = kept;
        }
        return compare(predicate, left, comparableOf(source.valueOf(*property)));
    }
    return compare(predicate, left, std::visit(LiteralReader(), std::get<QueryLiteral>(predicate.right)));
}

// All parts are looked at, so that a comparison that is wrong shows whatever the others say.
Truth evaluate(const Classes& classes, const QueryCondition& condition, const QuerySource& source) {
    if (condition.kind == QueryCondition::Kind::predicate) {
        return evaluate(classes, *condition.predicate, source);
    }
    const bool isConjunction = condition.kind == QueryCondition::Kind::conjunction;
    Truth truth = isConjunction ? Truth::yes : Truth::no;
    for (const QueryCondition& part : condition.parts) {
        const Truth other = evaluate(classes, part, source);
        truth = isConjunction ? std::min(truth, other) : std::max(truth, other);
    }
    return truth;
}

// The properties of an instance and, by way of it, of those that are embedded in it.
class InstanceSource : public QuerySource {
public:
    explicit InstanceSource(const Instance& instance) : instance_(instance) {}

    CMPIData valueOf(const QueryProperty& property) const override {
        CMPIData data = {CMPI_instance, CMPI_goodValue, {}};
        data.value.inst = const_cast<Instance*>(&instance_);
        for (const QueryProperty::Step& step : property.steps) {
            if (isNull(data)) {
                return Value().data();
            }
            const Instance* const instance =
                data.type == CMPI_instance ? Instance::of(data.value.inst) : nullptr;
            if (instance == nullptr) {
                failWith(CMPI_RC_ERR_TYPE_MISMATCH, "query, column " + std::to_string(property.column) +
                                                        ": what " + property.text +
                                                        " goes through is no embedded instance");
            }
            data = valueOf(*instance, step);
        }
        return data;
    }

private:
    static CMPIData valueOf(const Instance& instance, const QueryProperty::Step& step) {
        if (!step.scope.empty() && !instance.core().classes.isA(instance.path->className, step.scope)) {
            return Value().data();
        }
        const std::optional<NamedValue> found = instance.properties.find(step.name);
        if (found && !found->value.isNull()) {
            return found->value.data();
        }
        // Some servers make an instance without its path's keys.
        const std::optional<NamedValue> key = instance.path->keys.find(step.name);
        return key ? key->value.data() : Value().data();
    }

    const Instance& instance_;
};

} // namespace

bool Query::accepts(const Instance& instance) const {
    const Classes& classes = instance.core().classes;
    return classes.isA(instance.path->className, className_) &&
           fulfils(classes, condition_, InstanceSource(instance));
}

bool fulfils(const Classes& classes, const QueryCondition& condition, const QuerySource& source) {
    return evaluate(classes, condition, source) == Truth::yes;
}

bool fulfils(const Classes& classes, const QueryPredicate& predicate, const QuerySource& source) {
    return evaluate(classes, predicate, source) == Truth::yes;
}

} // namespace oxahv
