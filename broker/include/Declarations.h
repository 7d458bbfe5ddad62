/**
 * @file
 * Declarations of CIM classes, as a program or a MOF file makes them. They are plain values: copies are
 * independent, and one object is used by one thread at a time.
 */
#pragma once

#ifndef CMPI_PLATFORM_LINUX_GENERIC_GNU
#define CMPI_PLATFORM_LINUX_GENERIC_GNU
#endif
#include <cmpidt.h>

#include "TKExport.h"

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace oxahv {

/** How MOF is compiled. */
struct MofOptions {
    /** Whether what DSP0004 forbids is an error even where its meaning is clear; else it is a warning. */
    bool isStrict = false;
};

/** What DSP0004 forbids in a MOF text, and the broker takes all the same. */
struct MofWarning {
    std::string file;       ///< the file, or what the text is called
    std::size_t line = 0;   ///< from 1
    std::size_t column = 0; ///< from 1, in characters
    std::string text;       ///< what breaks which rule, for a person
};

/** One plain value in a declaration: an unsigned integer (a `char16` too) or one with a sign, as its type
 * says; a text, date/time or reference as text in UTF-8; the first alternative is a NULL. */
using PlainValue = std::variant<std::monostate, bool, unsigned long long, long long, double, std::string>;

/** A value in a declaration: a property's default, or a qualifier's. */
struct DeclaredValue {
    CMPIType type = CMPI_null; ///< with `CMPI_ARRAY` for arrays; `CMPI_null`: there is no value
    bool isNull = true;        ///< whether the value is NULL
    /** One of a single value, any number of an array, none where the value is NULL. */
    std::vector<PlainValue> elements;
};

/** A qualifier of a class, property, method or parameter. */
struct QualifierDeclaration {
    std::string name;          ///< as declared
    DeclaredValue value;       ///< TRUE where MOF gives none
    bool isOverridable = true; ///< flavour EnableOverride; kept only, no override is refused
    bool reachesSubclass =
        true; ///< flavour ToSubclass; without it only the declaring class has the qualifier
    bool isTranslatable = false; ///< flavour Translatable
};

/** The qualifiers of one element, in order. A constant list: copies share it. */
class TK_EXPORT Qualifiers {
public:
    /** None. */
    Qualifiers() = default;
    /** A list. @param list each name stands in it once. */
    explicit Qualifiers(std::vector<QualifierDeclaration> list);

    /** The qualifier of a name, in any case; null when there is none. Valid as long as a copy of the list. */
    const QualifierDeclaration* find(std::string_view name) const;
    /** Whether the qualifier is there and TRUE. */
    bool isTrue(std::string_view name) const;
    /** These, and behind them those of `inherited` that reach subclasses and are not set here. */
    Qualifiers over(const Qualifiers& inherited) const;
    /** All of them. */
    const std::vector<QualifierDeclaration>& list() const;

private:
    std::shared_ptr<const std::vector<QualifierDeclaration>> list_;
};

/** The declaration of a qualifier itself, which MOF begins with `Qualifier`. */
struct QualifierTypeDeclaration {
    std::string name;                ///< as declared
    CMPIType type = CMPI_null;       ///< with `CMPI_ARRAY` for arrays
    DeclaredValue defaultValue{};    ///< of type `CMPI_null` when none is declared
    std::vector<std::string> scopes; ///< what it may qualify: "class", "association", "property" and so on
    bool isOverridable = true;       ///< flavour EnableOverride
    bool reachesSubclass = true;     ///< flavour ToSubclass
    bool isTranslatable = false;     ///< flavour Translatable
};

/**
 * The type of the values of a property, parameter or method: `CMPI_instance`, as an array where the type is
 * one, where a qualifier EmbeddedInstance or EmbeddedObject says that its texts are instances; else the
 * declared type.
 * @param declared the declared type. @param qualifiers those of the same element.
 */
TK_EXPORT CMPIType valueType(CMPIType declared, const Qualifiers& qualifiers);

/** One property of a class. */
struct PropertyDeclaration {
    std::string name;             ///< as declared
    CMPIType type = CMPI_null;    ///< with `CMPI_ARRAY` for arrays; `CMPI_ref` for references
    bool isKey = false;           ///< whether it names instances
    std::string referenceClass{}; ///< of a reference: the class that it leads to; empty if none is said
    DeclaredValue defaultValue{}; ///< of type `CMPI_null` when none is declared; a new instance's properties
                                  ///< are NULL all the same
    Qualifiers qualifiers{};      ///< its own
};

/** One parameter of a method. */
struct ParameterDeclaration {
    std::string name;             ///< as declared
    CMPIType type = CMPI_null;    ///< with `CMPI_ARRAY` for arrays; `CMPI_ref` for references
    std::string referenceClass{}; ///< of a reference: the class that it leads to; empty if none is said
    bool isIn = true;             ///< a qualifier In decides, where there is one
    bool isOut = false;           ///< a qualifier Out decides, where there is one
    Qualifiers qualifiers{};      ///< its own
};

/** One method of a class. */
struct MethodDeclaration {
    std::string name;                               ///< as declared
    CMPIType returnType = CMPI_null;                ///< `CMPI_ref` for references
    std::vector<ParameterDeclaration> parameters{}; ///< in order
    std::string returnClass{};                      ///< of a reference: the class that it leads to
    Qualifiers qualifiers{};                        ///< its own

    /** The parameter of a name, in any case; null when there is none. */
    TK_EXPORT const ParameterDeclaration* find(std::string_view parameter) const;
};

/**
 * The declaration of one CIM class, built in one expression. Names compare ignoring the case of ASCII
 * letters.
 *
 * @code
 * ClassDeclaration("Demo_Port").superclass("CIM_NetworkPort").key("Name", CMPI_string).property("Speed",
 * CMPI_uint64).method("SetSpeed", CMPI_uint32, {{"Speed", CMPI_uint64}})
 * @endcode
 */
class TK_EXPORT ClassDeclaration {
public:
    /** A class without superclass, properties and methods. @param name its name; not empty. */
    explicit ClassDeclaration(std::string name);

    /** Names the superclass, which must be declared before this class is. */
    ClassDeclaration& superclass(std::string name);
    /** Makes it an association, by the qualifier Association. */
    ClassDeclaration& association();
    /** Makes it abstract, by the qualifier Abstract. */
    ClassDeclaration& abstract();
    /** Adds a qualifier to the class. */
    ClassDeclaration& qualifier(QualifierDeclaration qualifier);
    /** Gives the class these qualifiers, in place of those that it has. */
    ClassDeclaration& qualifiers(Qualifiers list);
    /** Adds a key property, with the qualifier Key. */
    ClassDeclaration& key(std::string name, CMPIType type);
    /** Adds a property that is no key. */
    ClassDeclaration& property(std::string name, CMPIType type);
    /** Adds a property with all that can be said of it; a qualifier Key that is TRUE makes it a key too. */
    ClassDeclaration& property(PropertyDeclaration property);
    /** Adds a reference to instances of a class, which need not be declared. References are keys of most
     * associations: `key(name, CMPI_ref)` adds one of those. */
    ClassDeclaration& reference(std::string name, std::string className);
    /** Adds a method. */
    ClassDeclaration& method(std::string name, CMPIType returnType,
                             std::vector<ParameterDeclaration> parameters = {});
    /** Adds a method with all that can be said of it. */
    ClassDeclaration& method(MethodDeclaration method);

    /** The class's name. */
    const std::string& name() const { return name_; }
    /** The superclass's name; empty when it has none. */
    const std::string& superclass() const { return superclass_; }
    /** Whether the class itself says that it is an association. */
    bool isAssociation() const;
    /** Whether the class is abstract. */
    bool isAbstract() const;
    /** The class's own qualifiers. */
    const Qualifiers& qualifiers() const { return qualifiers_; }
    /** The class's own properties, in the order in which they were added. */
    const std::vector<PropertyDeclaration>& properties() const { return properties_; }
    /** The class's own methods, in the order in which they were added. */
    const std::vector<MethodDeclaration>& methods() const { return methods_; }

private:
    std::string name_;
    std::string superclass_;
    Qualifiers qualifiers_;
    std::vector<PropertyDeclaration> properties_;
    std::vector<MethodDeclaration> methods_;
};

} // namespace oxahv
