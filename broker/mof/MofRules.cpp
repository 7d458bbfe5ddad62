#include "mof/MofRules.h"

#include "mof/MofValues.h"

#include <algorithm>

namespace oxahv {

namespace {

// The qualifiers of DSP0004, standard and optional ones, for texts that do not bring their declarations.
struct KnownQualifier {
    std::string_view name;
    CMPIType type;
    unsigned int scopes;
};
constexpr unsigned int onClass = mofScope::classes | mofScope::association | mofScope::indication;
constexpr unsigned int onProperty = mofScope::property | mofScope::reference;
constexpr unsigned int onValue = mofScope::property | mofScope::method | mofScope::parameter;
constexpr unsigned int onFeature = onProperty | mofScope::method | mofScope::parameter;
constexpr KnownQualifier knownQualifiers[] = {
    {"Abstract", CMPI_boolean, onClass},
    {"Aggregate", CMPI_boolean, mofScope::reference},
    {"Aggregation", CMPI_boolean, mofScope::association},
    {"Alias", CMPI_string, onProperty | mofScope::method},
    {"ArrayType", CMPI_string, mofScope::property | mofScope::parameter},
    {"Association", CMPI_boolean, mofScope::association},
    {"BitMap", CMPI_stringA, onValue},
    {"BitValues", CMPI_stringA, onValue},
    {"ClassConstraint", CMPI_stringA, onClass},
    {"Composition", CMPI_boolean, mofScope::association},
    {"Correlatable", CMPI_stringA, mofScope::property},
    {"Counter", CMPI_boolean, onValue},
    {"Delete", CMPI_boolean, mofScope::association | mofScope::reference},
    {"Deprecated", CMPI_stringA, mofScope::any},
    {"Description", CMPI_string, mofScope::any},
    {"DisplayDescription", CMPI_string, mofScope::any},
    {"DisplayName", CMPI_string, mofScope::any},
    {"DN", CMPI_boolean, onValue},
    {"EmbeddedInstance", CMPI_string, onValue},
    {"EmbeddedObject", CMPI_boolean, onValue},
    {"Exception", CMPI_boolean, onClass},
    {"Expensive", CMPI_boolean, mofScope::any},
    {"Experimental", CMPI_boolean, mofScope::any},
    {"Gauge", CMPI_boolean, onValue},
    {"IfDeleted", CMPI_boolean, mofScope::association | mofScope::reference},
    {"In", CMPI_boolean, mofScope::parameter},
    {"Indication", CMPI_boolean, mofScope::classes | mofScope::indication},
    {"Invisible", CMPI_boolean, mofScope::any},
    {"IsPUnit", CMPI_boolean, onValue},
    {"Key", CMPI_boolean, onProperty},
    {"Large", CMPI_boolean, mofScope::classes | mofScope::property},
    {"MappingStrings", CMPI_stringA, mofScope::any},
    {"Max", CMPI_uint32, mofScope::reference},
    {"MaxLen", CMPI_uint32, onValue},
    {"MaxSize", CMPI_uint32, onValue},
    {"MaxValue", CMPI_sint64, onValue},
    {"MethodConstraint", CMPI_stringA, mofScope::method},
    {"Min", CMPI_uint32, mofScope::reference},
    {"MinLen", CMPI_uint32, onValue},
    {"MinSize", CMPI_uint32, onValue},
    {"MinValue", CMPI_sint64, onValue},
    {"ModelCorrespondence", CMPI_stringA, mofScope::any},
    {"NonLocal", CMPI_string, mofScope::reference},
    {"NonLocalType", CMPI_string, mofScope::reference},
    {"NullValue", CMPI_string, onValue},
    {"OctetString", CMPI_boolean, onValue},
    {"Out", CMPI_boolean, mofScope::parameter},
    {"Override", CMPI_string, onProperty | mofScope::method},
    {"Propagated", CMPI_string, mofScope::property},
    {"PropertyConstraint", CMPI_stringA, onProperty},
    {"PropertyUsage", CMPI_string, mofScope::property},
    {"Provider", CMPI_string, mofScope::any},
    {"PUnit", CMPI_string, onValue},
    {"Read", CMPI_boolean, mofScope::property},
    {"Reference", CMPI_string, mofScope::property},
    {"Required", CMPI_boolean, onFeature},
    {"Revision", CMPI_string, onClass | mofScope::schema},
    {"Schema", CMPI_string, onProperty | mofScope::method},
    {"Source", CMPI_string, onClass},
    {"SourceType", CMPI_string, onClass | mofScope::reference},
    {"Static", CMPI_boolean, mofScope::property | mofScope::method},
    {"Structure", CMPI_boolean, mofScope::classes | mofScope::indication},
    {"Syntax", CMPI_string, onFeature},
    {"SyntaxType", CMPI_string, onFeature},
    {"Terminal", CMPI_boolean, onClass},
    {"TriggerType", CMPI_string, onClass | onFeature},
    {"UMLPackagePath", CMPI_string, onClass},
    {"Units", CMPI_string, onValue},
    {"UnknownValues", CMPI_stringA, mofScope::property},
    {"UnsupportedValues", CMPI_stringA, mofScope::property},
    {"ValueMap", CMPI_stringA, onValue},
    {"Values", CMPI_stringA, onValue},
    {"Version", CMPI_string, onClass | mofScope::schema},
    {"Weak", CMPI_boolean, mofScope::reference},
    {"Write", CMPI_boolean, mofScope::property},
    {"XMLNamespaceName", CMPI_string, mofScope::any},
};

const MofQualifier* find(const std::vector<MofQualifier>& qualifiers, std::string_view name) {
    const auto found = std::find_if(qualifiers.begin(), qualifiers.end(),
                                    [&](const MofQualifier& q) { return sameName(q.name.text, name); });
    return found != qualifiers.end() ? &*found : nullptr;
}

bool sameValue(const DeclaredValue& a, const DeclaredValue& b) {
    return a.isNull == b.isNull && a.elements == b.elements;
}

std::string quoted(const std::string& name) {
    return '\'' + name + '\'';
}

bool isReference(const PropertyDeclaration& property) {
    return property.type == CMPI_ref;
}

} // namespace

MofRules::MofRules(const Declarations& declarations, const MofSource& source, const MofClass& written,
                   const Report& report)
    : declarations_(declarations), source_(source), written_(written), report_(report),
      declared_(declarations.find(written.name.text)), superclass_(declared_->superclass.get()),
      scopes_(mofScope::classes | (declared_->qualifiers.isTrue("Association") ? mofScope::association : 0U) |
              (declared_->qualifiers.isTrue("Indication") ? mofScope::indication : 0U)) {}

void MofRules::check() {
    checkQualifiers(written_.qualifiers, scopes_, declared_->qualifiers,
                    superclass_ != nullptr ? &superclass_->qualifiers : nullptr);
    for (const MofElement& property : written_.properties) {
        checkProperty(property);
    }
    for (const MofMethod& method : written_.methods) {
        checkMethod(method);
    }
    checkEnds();
}

// `own` are the qualifiers of the element itself, `inherited` those of the one that it overrides; null when
// there is none.
void MofRules::checkQualifiers(const std::vector<MofQualifier>& qualifiers, unsigned int scopes,
                               const Qualifiers& own, const Qualifiers* inherited) {
    for (const MofQualifier& qualifier : qualifiers) {
        checkKnown(qualifier, scopes);
        if (inherited != nullptr) {
            checkChange(qualifier, own, *inherited);
        }
    }
}

// What the text itself declares has been checked when it was used.
void MofRules::checkKnown(const MofQualifier& qualifier, unsigned int scopes) {
    const std::string& name = qualifier.name.text;
    if (declarations_.findQualifier(name) != nullptr) {
        return;
    }
    const auto* const known =
        std::find_if(std::begin(knownQualifiers), std::end(knownQualifiers),
                     [&](const KnownQualifier& one) { return sameName(one.name, name); });
    if (known == std::end(knownQualifiers)) {
        report_(qualifier.name.offset, "qualifier " + name + " is not declared");
    } else if ((known->scopes & scopes) == 0) {
        report_(qualifier.name.offset, "qualifier " + name + " is not for this kind of element");
    } else {
        checkValue(qualifier, known->type);
    }
}

void MofRules::checkValue(const MofQualifier& qualifier, CMPIType type) {
    if (!qualifier.value) {
        if (type != CMPI_boolean) {
            report_(qualifier.name.offset, "qualifier " + qualifier.name.text + " needs a value");
        }
        return;
    }
    try {
        mofValueOf(source_, *qualifier.value, type);
    } catch (const BrokerError&) { // whose place is within the value
        report_(qualifier.value->offset,
                "qualifier " + qualifier.name.text + " is of type " + declaredTypeName(type));
    }
}

void MofRules::checkChange(const MofQualifier& qualifier, const Qualifiers& own,
                           const Qualifiers& inherited) {
    const QualifierDeclaration* const now = own.find(qualifier.name.text);
    const QualifierDeclaration* const before = inherited.find(qualifier.name.text);
    if (now != nullptr && before != nullptr && before->reachesSubclass && !before->isOverridable &&
        !sameValue(now->value, before->value)) {
        report_(qualifier.name.offset,
                "qualifier " + before->name + " is declared as one that no subclass changes");
    }
}

void MofRules::checkProperty(const MofElement& property) {
    const bool isEnd = property.type == CMPI_ref;
    const PropertyDeclaration* const inherited =
        superclass_ != nullptr ? superclass_->find(property.name.text) : nullptr;
    checkQualifiers(property.qualifiers, mofScope::property | (isEnd ? mofScope::reference : 0U),
                    declared_->find(property.name.text)->qualifiers,
                    inherited != nullptr ? &inherited->qualifiers : nullptr);
    checkOverride(property, "property", inherited != nullptr);
    checkKey(property, inherited);
    checkElement(property);
    if (isEnd) {
        checkReference(property, inherited);
    }
}

void MofRules::checkMethod(const MofMethod& method) {
    const MethodDeclaration* const inherited =
        superclass_ != nullptr ? superclass_->findMethod(method.name.text) : nullptr;
    checkQualifiers(method.qualifiers, mofScope::method, declared_->findMethod(method.name.text)->qualifiers,
                    inherited != nullptr ? &inherited->qualifiers : nullptr);
    checkOverride(method, "method", inherited != nullptr);
    checkElement(method);
    checkParameters(method, inherited);
}

void MofRules::checkOverride(const MofElement& element, const char* kind, bool isInherited) {
    const MofQualifier* const override = find(element.qualifiers, "Override");
    const std::string what = kind + (' ' + element.name.text);
    if (override == nullptr) {
        if (isInherited) {
            report_(element.name.offset,
                    what + " is inherited, and redeclared without the qualifier Override");
        }
        return;
    }
    const bool namesOther = override->value && override->value->constants.size() == 1 &&
                            override->value->constants.front().kind == MofKind::text &&
                            !sameName(override->value->constants.front().text, element.name.text);
    if (namesOther) {
        report_(override->name.offset, what + " overrides " +
                                           quoted(override->value->constants.front().text) +
                                           ", which has another name");
    } else if (!isInherited) {
        report_(override->name.offset, what + " overrides what no superclass has");
    }
}

void MofRules::checkKey(const MofElement& property, const PropertyDeclaration* inherited) {
    const PropertyDeclaration* const own = declared_->find(property.name.text);
    const bool isNewKey = own->isKey && (inherited == nullptr || !inherited->isKey);
    const bool hasKeys =
        superclass_ != nullptr && std::any_of(superclass_->properties.begin(), superclass_->properties.end(),
                                              [](const PropertyDeclaration& one) { return one.isKey; });
    if (isNewKey && hasKeys) {
        report_(property.name.offset,
                "key " + property.name.text + " is added to those of class " + superclass_->name);
    }
}

void MofRules::checkReference(const MofElement& reference, const PropertyDeclaration* inherited) {
    if ((scopes_ & mofScope::association) == 0) {
        report_(reference.name.offset,
                "reference " + reference.name.text + " is in a class that is no association");
    }
    const auto target = declarations_.find(reference.referenceClass);
    const bool widens = inherited != nullptr && target != nullptr && !target->isA(inherited->referenceClass);
    if (widens) {
        report_(reference.name.offset, "reference " + reference.name.text + " leads to " + target->name +
                                           ", which is no " + inherited->referenceClass);
    }
}

void MofRules::checkParameters(const MofMethod& method, const MethodDeclaration* inherited) {
    for (const MofElement& parameter : method.parameters) {
        const ParameterDeclaration* const before =
            inherited != nullptr ? inherited->find(parameter.name.text) : nullptr;
        const bool isEnd = !parameter.referenceClass.empty();
        checkQualifiers(parameter.qualifiers, mofScope::parameter | (isEnd ? mofScope::reference : 0U),
                        declared_->findMethod(method.name.text)->find(parameter.name.text)->qualifiers,
                        before != nullptr ? &before->qualifiers : nullptr);
        checkElement(parameter);
    }
    const auto isSame = [](const MofElement& one, const ParameterDeclaration& other) {
        return sameName(one.name.text, other.name) && one.type == other.type;
    };
    if (inherited != nullptr &&
        !std::equal(method.parameters.begin(), method.parameters.end(), inherited->parameters.begin(),
                    inherited->parameters.end(), isSame)) {
        report_(method.name.offset,
                "method " + method.name.text + " has other parameters than the one that it overrides");
    }
}

// What holds for properties, methods and parameters.
void MofRules::checkElement(const MofElement& element) {
    for (const char* const name : {"EmbeddedInstance", "EmbeddedObject"}) {
        const MofQualifier* const embedded = find(element.qualifiers, name);
        if (embedded != nullptr && (element.type & ~CMPI_ARRAY) != CMPI_string) {
            report_(embedded->name.offset, "qualifier " + std::string(name) + " is for texts, and " +
                                               element.name.text + " is a " + declaredTypeName(element.type));
        }
    }
    if (element.arraySize != 0 && element.value && element.value->constants.size() > element.arraySize) {
        report_(element.value->offset,
                "array " + element.name.text + " has " + std::to_string(element.value->constants.size()) +
                    " elements where it is declared with " + std::to_string(element.arraySize));
    }
}

void MofRules::checkEnds() {
    const auto ends = std::count_if(declared_->properties.begin(), declared_->properties.end(), isReference);
    if ((scopes_ & mofScope::association) != 0 && ends < 2) {
        report_(written_.name.offset, "association " + declared_->name + " has " +
                                          (ends == 0 ? "no reference" : "one reference") + ", and needs two");
    }
}

} // namespace oxahv
