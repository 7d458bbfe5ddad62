// The steps that the typed setters and getters of keys, properties and arguments share.
//
// Knows which CMPI type belongs to which C++ type, and calls the broker through CmpiCalls.h. Nothing here
// traces.
#pragma once

#include "CmpiCalls.h"

#include <string>

namespace TK {

// The CMPI type of a C++ type: its type code and the member of a value that holds it.
template <class T>
struct CmpiType;

template <CMPIType typeCode, class Member, Member CMPIValue::*valueMember>
struct CmpiTypeOf {
    static constexpr CMPIType code = typeCode;
    static constexpr Member CMPIValue::*member = valueMember;
};

template <>
struct CmpiType<bool> : CmpiTypeOf<CMPI_boolean, CMPIBoolean, &CMPIValue::boolean> {};
template <>
struct CmpiType<unsigned char> : CmpiTypeOf<CMPI_uint8, CMPIUint8, &CMPIValue::uint8> {};
template <>
struct CmpiType<unsigned short> : CmpiTypeOf<CMPI_uint16, CMPIUint16, &CMPIValue::uint16> {};
template <>
struct CmpiType<unsigned int> : CmpiTypeOf<CMPI_uint32, CMPIUint32, &CMPIValue::uint32> {};
template <>
struct CmpiType<unsigned long long> : CmpiTypeOf<CMPI_uint64, CMPIUint64, &CMPIValue::uint64> {};
template <>
struct CmpiType<short> : CmpiTypeOf<CMPI_sint16, CMPISint16, &CMPIValue::sint16> {};
template <>
struct CmpiType<float> : CmpiTypeOf<CMPI_real32, CMPIReal32, &CMPIValue::real32> {};
template <>
struct CmpiType<double> : CmpiTypeOf<CMPI_real64, CMPIReal64, &CMPIValue::real64> {};
template <>
struct CmpiType<CMPIString*> : CmpiTypeOf<CMPI_string, CMPIString*, &CMPIValue::string> {};
template <>
struct CmpiType<CMPIObjectPath*> : CmpiTypeOf<CMPI_ref, CMPIObjectPath*, &CMPIValue::ref> {};

// The setters' steps, for a key of an object path or a property of an instance. The setters have no way to
// report the broker's status, so it is ignored.
template <class Object, class T>
void set(Object* object, const char* name, T value) {
    CMPIValue record = {};
    record.*CmpiType<T>::member = value;
    cmpi::add(object, name, &record, CmpiType<T>::code);
}

// For CMPI_chars the standard passes the text itself in place of a pointer to a value.
template <class Object>
void set(Object* object, const char* name, const char* text) {
    cmpi::add(object, name, reinterpret_cast<CMPIValue*>(const_cast<char*>(text)), CMPI_chars);
}

// The steps that all getters share: false when the broker reports an error or the value is NULL.
template <class Object>
bool read(const Object* object, const char* name, CMPIData& data) {
    CMPIStatus status;
    data = cmpi::get(object, name, status);
    if (cmpi::failed(status)) { // joined with the other test, GCC makes two jumps of a success
        return false;
    }
    return !cmpi::isNull(data);
}

// A getter. It reads the member asked for whatever type the data reports, since brokers report keys of other
// integer types than the class declares.
template <class Object, class T>
bool get(const Object* object, const char* name, T& out) {
    CMPIData data;
    if (!read(object, name, data)) {
        return false;
    }
    out = static_cast<T>(data.value.*CmpiType<T>::member);
    return true;
}

// The characters of a text value; null when they cannot be read. They belong to the broker.
template <class Object>
const char* readText(const Object* object, const char* name) {
    CMPIData data;
    return read(object, name, data) ? cmpi::readChars(data.value.string) : nullptr;
}

// A getter of a text.
template <class Object>
bool getText(const Object* object, const char* name, std::string& out) {
    const char* const chars = readText(object, name);
    if (chars == nullptr) {
        return false;
    }
    out = chars;
    return true;
}

// What came of reading a wide text.
enum class Reading { absent, inconvertible, done };

// The steps of a wide getter but for its trace, which names the operation. Writes `out` only when done.
template <class Object>
Reading readWideText(const Object* object, const char* name, std::wstring& out) {
    const char* const chars = readText(object, name);
    if (chars == nullptr) {
        return Reading::absent;
    }
    return ProviderUtilities::ConvertMultiByteToWideChar(chars, out) ? Reading::done : Reading::inconvertible;
}

// The characters of a broker's string, empty when they cannot be read.
inline std::string charsOrNothing(const CMPIString* string, const CMPIStatus& status) {
    const char* const chars = cmpi::failed(status) ? nullptr : cmpi::readChars(string);
    return chars != nullptr ? chars : "";
}

} // namespace TK
