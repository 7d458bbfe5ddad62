// The qualifiers of a declared element, and their values as CMPI hands them out.

#include "classes/Classes.h"
#include "objects/Records.h"

#include <algorithm>

namespace oxahv {

namespace {

const std::vector<QualifierDeclaration> noQualifiers;

struct PlainReader {
    CMPIValue value = {};
    void operator()(std::monostate /*none*/) {}
    void operator()(bool plain) { value.boolean = plain ? 1 : 0; }
    void operator()(unsigned long long plain) {
        value.uint64 = plain;
    } // narrower members share its low bytes
    void operator()(long long plain) { value.sint64 = plain; }
    void operator()(double plain) { value.real64 = plain; }
    void operator()(const std::string& /*text*/) {}
};

Value elementOf(Core& core, const PlainValue& plain, CMPIType type) {
    if (std::holds_alternative<std::monostate>(plain)) {
        return Value::null(type);
    }
    if (const auto* const text = std::get_if<std::string>(&plain)) {
        if (type == CMPI_dateTime) {
            DateTime dateTime(core, *text);
            CMPIValue value = {};
            value.dateTime = &dateTime;
            return Value::from(core, &value, type);
        }
        return Value::text(core, *text);
    }
    PlainReader reader;
    std::visit(reader, plain);
    if (type == CMPI_real32) {
        reader.value.real32 = static_cast<CMPIReal32>(reader.value.real64);
    }
    return Value::number(reader.value, type);
}

} // namespace

CMPIData dataOf(Core& core, const DeclaredValue& declared) {
    const auto element = static_cast<CMPIType>(declared.type & ~CMPI_ARRAY);
    CMPIData data = {declared.type, CMPI_goodValue, {}};
    if (declared.isNull) {
        data.state = CMPI_nullValue;
    } else if ((declared.type & CMPI_ARRAY) != 0) {
        auto array = std::make_unique<Array>(core, element, 0);
        for (const PlainValue& plain : declared.elements) {
            array->elements.push_back(elementOf(core, plain, element));
        }
        data.value.array = handOut(std::move(array));
    } else if (const auto* const text = std::get_if<std::string>(&declared.elements.front())) {
        if (element == CMPI_dateTime) {
            data.value.dateTime = handOut(std::make_unique<DateTime>(core, *text));
        } else {
            data.value.string = handOut(std::make_unique<String>(core, *text));
        }
    } else {
        data = elementOf(core, declared.elements.front(), element).data();
    }
    return data;
}

CMPIType valueType(CMPIType declared, const Qualifiers& qualifiers) {
    const auto element = static_cast<CMPIType>(declared & ~CMPI_ARRAY);
    const bool isEmbedded = element == CMPI_string && (qualifiers.find("EmbeddedInstance") != nullptr ||
                                                       qualifiers.isTrue("EmbeddedObject"));
    return isEmbedded ? static_cast<CMPIType>(CMPI_instance | (declared & CMPI_ARRAY)) : declared;
}

Qualifiers::Qualifiers(std::vector<QualifierDeclaration> list)
    : list_(list.empty() ? nullptr
                         : std::make_shared<const std::vector<QualifierDeclaration>>(std::move(list))) {}

const QualifierDeclaration* Qualifiers::find(std::string_view name) const {
    const auto found = std::find_if(list().begin(), list().end(),
                                    [&](const QualifierDeclaration& q) { return sameName(q.name, name); });
    return found != list().end() ? &*found : nullptr;
}

bool Qualifiers::isTrue(std::string_view name) const {
    const QualifierDeclaration* const found = find(name);
    return found != nullptr && !found->value.elements.empty() &&
           found->value.elements.front() == PlainValue(true);
}

Qualifiers Qualifiers::over(const Qualifiers& inherited) const {
    const std::vector<QualifierDeclaration>& others = inherited.list();
    const auto reaches = [](const QualifierDeclaration& q) { return q.reachesSubclass; };
    if (list_ == nullptr && std::all_of(others.begin(), others.end(), reaches)) {
        return inherited; // most elements are inherited as they are, and share their qualifiers
    }
    std::vector<QualifierDeclaration> all = list();
    for (const QualifierDeclaration& other : others) {
        if (reaches(other) && find(other.name) == nullptr) {
            all.push_back(other);
        }
    }
    return Qualifiers(std::move(all));
}

const std::vector<QualifierDeclaration>& Qualifiers::list() const {
    return list_ != nullptr ? *list_ : noQualifiers;
}

} // namespace oxahv
