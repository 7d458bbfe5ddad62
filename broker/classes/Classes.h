// The broker's declarations, which requests read while others declare; and values as the declarations want
// them.
#pragma once

#include "classes/DeclaredClass.h"
#include "objects/NamedValues.h"
#include "objects/Shards.h"

#include <atomic>
#include <functional>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace oxahv {

// The broker's declarations.
class Classes {
public:
    void declare(const ClassDeclaration& declaration);
    // Applies a change of many declarations as a whole or, when it throws, not at all.
    void change(const std::function<void(Declarations&)>& change);
    bool any() const { return any_.load(std::memory_order_acquire); }
    // Null for a class that is not declared. Valid as long as the broker: what is declared stays.
    const DeclaredClass* find(std::string_view name) const;
    std::vector<std::string> names() const;
    std::vector<QualifierType> qualifierTypes() const;
    bool isA(std::string_view className, std::string_view ancestor) const;

private:
    std::mutex changing_; // held by who changes the declarations, while others read on
    mutable ShardedMutex mutex_;
    Declarations declarations_;
    std::atomic<bool> any_{false};
};

// A NULL of its type for each property of a class.
NamedValues nullValues(const DeclaredClass& declared);

// What a slot hands out for a declared value; texts and arrays are the current owner's.
CMPIData dataOf(Core& core, const DeclaredValue& declared);

// What the values of a declared element are.
struct ValueType {
    CMPIType type;
    std::string_view embeddedClass; // of instances, and part of the declaration; empty: of any class
};
template <class Declaration>
ValueType valueTypeOf(const Declaration& declaration) {
    const QualifierDeclaration* const embedded = declaration.qualifiers.find("EmbeddedInstance");
    const bool namesClass = embedded != nullptr && !embedded->value.elements.empty();
    const auto* const name =
        namesClass ? std::get_if<std::string>(&embedded->value.elements.front()) : nullptr;
    return {valueType(declaration.type, declaration.qualifiers),
            name != nullptr ? std::string_view(*name) : std::string_view()};
}

// Whether a value that is not NULL is one of a type.
bool hasType(const Classes& classes, const Value& value, const ValueType& type);

// The value for a property or key of a declared type, as the caller of a slot passed it. Throws
// CMPI_RC_ERR_TYPE_MISMATCH.
Value checkedValue(Core& core, const CMPIValue* value, CMPIType type, const ValueType& declared);

} // namespace oxahv
