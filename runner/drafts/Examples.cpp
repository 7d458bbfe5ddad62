#include "drafts/Examples.h"

#include "drafts/Code.h"
#include "drafts/Names.h"
#include "show/Text.h"

#include <algorithm>
#include <cstdint>
#include <limits>
#include <utility>

namespace oxahv::runner {

namespace {

bool isReference(const DraftProperty& property) {
    return property.declaration.type == CMPI_ref;
}

// A literal for the first value that the declaration allows by name; empty when it names none.
std::string firstOfValueMap(const DraftProperty& key) {
    const QualifierDeclaration* const map = key.declaration.qualifiers.find("ValueMap");
    if (map == nullptr || map->value.elements.empty()) {
        return {};
    }
    const auto* const text = std::get_if<std::string>(&map->value.elements[0]);
    if (text == nullptr || text->empty()) {
        return {};
    }
    const bool isText = key.declaration.type == CMPI_string;
    const char* const allowed =
        isText ? "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_- " : "0123456789";
    // A number may be written with the sign of an octal one.
    const bool isPlain = text->find_first_not_of(allowed) == std::string::npos &&
                         (isText || (text->size() < 4 && ((*text)[0] != '0' || text->size() == 1)));
    return !isPlain ? "" : isText ? textLiteral(*text) : *text;
}

std::string textFor(const DraftClass& drafted, const DraftProperty& key) {
    if (sameName(key.declaration.name, "CreationClassName")) {
        return textLiteral(drafted.name);
    }
    std::string text = "example";
    const QualifierDeclaration* const most = key.declaration.qualifiers.find("MaxLen");
    if (most != nullptr && most->value.elements.size() == 1) {
        // A number of a type that no qualifier declaration says has a sign.
        const PlainValue& size = most->value.elements[0];
        const auto* const withSign = std::get_if<long long>(&size);
        const auto* const withoutSign = std::get_if<unsigned long long>(&size);
        const bool isShort = withSign != nullptr ? *withSign >= 0 && *withSign < 7
                                                 : withoutSign != nullptr && *withoutSign < 7;
        if (isShort) {
            text.resize(withSign != nullptr ? static_cast<std::size_t>(*withSign) : *withoutSign);
        }
    }
    return textLiteral(text);
}

// What a key of the example is set to; empty where it is good as it begins.
std::string valueFor(const DraftClass& drafted, const DraftProperty& key) {
    const std::string mapped = firstOfValueMap(key);
    switch (key.declaration.type) {
    case CMPI_string:
        return mapped.empty() ? textFor(drafted, key) : mapped;
    case CMPI_char16:
        return "u'a'";
    case CMPI_boolean:
        return "true";
    case CMPI_real32:
        return "1.0F";
    case CMPI_real64:
        return "1.0";
    case CMPI_dateTime:
        return {};
    default:
        return mapped.empty() ? "1" : mapped;
    }
}

void setKeys(const DraftClass& drafted, const std::string& variable, std::vector<std::string>& statements) {
    for (const DraftProperty& key : drafted.keys) {
        const std::string value = isReference(key) ? std::string() : valueFor(drafted, key);
        if (!value.empty()) {
            statements.push_back(variable + '.' + key.variable + " = " + value + ';');
        }
    }
}

// The class of the provider's that a reference leads to: one whose example can be made by itself. Two
// references of an example lead to different objects.
const DraftClass* targetOf(const EmbeddedBroker& broker, const DraftProvider& provider,
                           const DraftProperty& reference, const std::vector<const DraftClass*>& others) {
    const auto target =
        std::find_if(provider.classes.begin(), provider.classes.end(), [&](const DraftClass& candidate) {
            return std::none_of(candidate.keys.begin(), candidate.keys.end(), isReference) &&
                   !candidate.isAssociation &&
                   std::find(others.begin(), others.end(), &candidate) == others.end() &&
                   broker.isA(candidate.name, reference.declaration.referenceClass);
        });
    return target != provider.classes.end() ? &*target : nullptr;
}

// The references that the example needs: those among its keys, and all of an association.
std::vector<const DraftProperty*> referencesOf(const DraftClass& drafted) {
    std::vector<const DraftProperty*> references;
    for (const auto* const properties : {&drafted.keys, &drafted.properties}) {
        for (const DraftProperty& property : *properties) {
            if (isReference(property) && (property.declaration.isKey || drafted.isAssociation)) {
                references.push_back(&property);
            }
        }
    }
    return references;
}

} // namespace

std::vector<std::string> exampleOf(const EmbeddedBroker& broker, const DraftProvider& provider,
                                   const DraftClass& drafted) {
    std::vector<std::string> statements;
    std::vector<const DraftClass*> targets;
    std::vector<std::string> paths;
    Scope variables({"example", "instanceOf", "operation", "pathOf", "reply"});
    std::vector<std::string> others; // assignments of references that are no keys
    for (const DraftProperty* const reference : referencesOf(drafted)) {
        const DraftClass* const target = targetOf(broker, provider, *reference, targets);
        if (target == nullptr) {
            return {};
        }
        targets.push_back(target);
        const std::string variable = variables.add(reference->variable);
        statements.push_back("classes::" + target->structName + ' ' + variable + ';');
        setKeys(*target, variable, statements);
        const std::string path = "pathOf(operation, " + variable + ')';
        if (reference->declaration.isKey) {
            paths.push_back(path);
        } else {
            others.push_back("example." + reference->variable + " = " + path + ';');
        }
    }
    const std::string head = "classes::" + drafted.structName + " example";
    statements.push_back(paths.empty() ? head + ';'
                                       : enclosed(8, {head + " = {", paths, {}, "};"}).substr(8));
    setKeys(drafted, "example", statements);
    statements.insert(statements.end(), others.begin(), others.end());
    statements.emplace_back("reply.add(instanceOf(operation, example));");
    return statements;
}

} // namespace oxahv::runner
