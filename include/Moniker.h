/**
 * @file
 * TK::Moniker, a typed list of keys that names one managed object without any CMPI type, and the library's
 * exception.
 *
 * A provider fills a moniker from a request's object path
 * (TK::ProviderUtilities::transformObjectPathToMoniker) or key by key, and reads it through a cursor, the
 * selected key:
 *
 * @code
 * for (unsigned int i = 0; moniker.selectKey(i); ++i) {
 *     std::string name;
 *     moniker.getName(name);
 *     unsigned short type = 0;
 *     moniker.getType(type);
 *     if (type == TK::Moniker::COMPONENT_STRING) {
 *         std::string value;
 *         moniker.getValue(value);
 *     }
 * }
 * @endcode
 *
 * **Threads.** One moniker is used by one thread at a time: the selection is part of it. Different monikers
 * share nothing.
 *
 * **Encoding and ownership.** Names and texts are bytes that the moniker copies and never examines;
 * everything that it hands out is a copy that belongs to the caller.
 *
 * **Failures.** What copies or adds may throw `std::bad_alloc`.
 */
#pragma once

#include "TKExport.h"

#include <cstdint>
#include <exception>
#include <string>
#include <vector>

namespace TK {

/** The library's one exception: a fixed English message. Thrown by value; nothing in the library catches it.
 *
 * Copying allocates, so it may throw `std::bad_alloc`. One object is used by one thread at a time. */
class TK_EXPORT FrameworkException : public std::exception {
public:
    /** An exception with a message.
     * @param text the message, NUL-terminated; copied. A null pointer counts as the empty text. */
    explicit FrameworkException(const char* text);
    FrameworkException(const FrameworkException& other);            ///< Copies the message.
    FrameworkException& operator=(const FrameworkException& other); ///< Copies the message.
    ~FrameworkException() noexcept override;

    /** The message; it belongs to the exception and is valid while that lives. */
    const char* what() const noexcept override;

private:
    std::string message;
};

/** An ordered list of typed keys, and the selection of one of them.
 *
 * Keys are only ever appended. Nothing makes names unique: two keys of one name are two components. The
 * getters read the selected component, change nothing, and write their output only when they succeed. */
class TK_EXPORT Moniker {
public:
    /** The type of a component, as getType reports it. Callers may compare with the numbers; they never
     * change. */
    enum ComponentType : std::uint32_t {
        COMPONENT_UINT8 = 0,  ///< `unsigned char`
        COMPONENT_UINT16 = 1, ///< `unsigned short`
        COMPONENT_UINT32 = 2, ///< `unsigned int`
        COMPONENT_UINT64 = 3, ///< `unsigned long long`
        COMPONENT_STRING = 4  ///< `std::string`
    };

    /** One key. */
    struct KeyComponent {
        ComponentType type; ///< the type that the key was added with
        std::string name;   ///< the name as it was given; may be empty
        /** Decimal digits; of a `COMPONENT_UINT8` the one byte itself, NUL included; of a `COMPONENT_STRING`
         * the text. */
        std::string value;
    };

    Moniker(); ///< An empty moniker with nothing selected.
    /** A copy with the same components and the same selection, independent from then on. */
    Moniker(const Moniker& other);
    /** Copies components and selection; when memory runs out, this moniker is as it was. */
    Moniker& operator=(const Moniker& other);
    ~Moniker();

    unsigned int getKeyCount() const; ///< The number of components. Never throws.

    /** Selects a component.
     * @param index its position, from 0.
     * @return true when it exists; otherwise false, and nothing is selected any more. Never throws. */
    bool selectKey(unsigned int index);

    /** The selected component's type.
     * @param[out] type one of the ComponentType numbers.
     * @throws FrameworkException "Key is not selected." when nothing is selected. */
    void getType(unsigned short& type) const;

    /** The selected component's name.
     * @param[out] name replaced by the name.
     * @throws FrameworkException "Key is not selected." when nothing is selected. */
    void getName(std::string& name) const;

    /** @name The selected component's value
     * The type has to be the one that the key was added with: nothing is widened. A `COMPONENT_UINT8` that
     * holds white space (9 to 13 and 32 in the classic locale) reads as nothing: the call leaves `value` as
     * it was, so set it before. So does one that throws.
     * @throws FrameworkException "Either the Key is not selected or the value is not compatible with the
     * requested data type." when nothing is selected or the selected component has another type.
     * @{ */
    void getValue(std::string& value) const;        ///< Of a `COMPONENT_STRING`.
    void getValue(unsigned char& value) const;      ///< Of a `COMPONENT_UINT8`.
    void getValue(unsigned short& value) const;     ///< Of a `COMPONENT_UINT16`.
    void getValue(unsigned int& value) const;       ///< Of a `COMPONENT_UINT32`.
    void getValue(unsigned long long& value) const; ///< Of a `COMPONENT_UINT64`.
    ///@}

    /** @name Adding a key
     * Appends a component and selects it. When memory runs out, the moniker is as it was. Numbers are kept as
     * text in the form of the global C++ locale. Names and texts are copied and not examined.
     * @return the new component's position, modulo 65,536; the selection is set to that number too.
     * @{ */
    unsigned short addKey(std::string name, const std::string& value); ///< As a `COMPONENT_STRING`.
    unsigned short addKey(std::string name, unsigned char value);      ///< As a `COMPONENT_UINT8`.
    unsigned short addKey(std::string name, unsigned short value);     ///< As a `COMPONENT_UINT16`.
    unsigned short addKey(std::string name, unsigned int value);       ///< As a `COMPONENT_UINT32`.
    unsigned short addKey(std::string name, unsigned long long value); ///< As a `COMPONENT_UINT64`.
    ///@}

private:
    TK_HIDDEN const KeyComponent& selected(const char* complaint) const;
    TK_HIDDEN const KeyComponent& selected(ComponentType type) const;
    TK_HIDDEN unsigned short append(ComponentType type, std::string&& name, std::string&& value);

    bool keySelected = false;
    std::uint32_t selectedKey = 0; // below keys.size() while keySelected is true
    std::vector<KeyComponent> keys;
};

} // namespace TK
