// The declared classes.
#pragma once

#include "Objects.h"

#include <map>
#include <memory>
#include <shared_mutex>

namespace oxahv {

// A declared class with all its properties, inherited ones first.
struct DeclaredClass {
    std::string name;
    std::shared_ptr<const DeclaredClass> superclass;
    std::vector<PropertyDeclaration> properties;

    const PropertyDeclaration* find(std::string_view property) const;
    bool isA(std::string_view ancestor) const;
};

class Classes {
public:
    void declare(const ClassDeclaration& declaration);
    bool any() const { return any_.load(std::memory_order_acquire); }
    // Null for a class that is not declared.
    std::shared_ptr<const DeclaredClass> find(std::string_view name) const;
    bool isA(std::string_view className, std::string_view ancestor) const;

private:
    mutable std::shared_mutex mutex_;
    std::map<std::string, std::shared_ptr<const DeclaredClass>> classes_; // by folded name
    std::atomic<bool> any_{false};
};

// The value for a property or key of a declared type, as the caller of a slot passed it. Throws
// CMPI_RC_ERR_TYPE_MISMATCH.
Value checkedValue(Core& core, const CMPIValue* value, CMPIType type, CMPIType declared);

} // namespace oxahv
