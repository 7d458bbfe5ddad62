// The CMPI calls of this library, each in one place.
//
// The CMPI headers of CIM servers differ: handles, tables and parameters with and without const, convenience
// names as macros or as inline functions. Everything here is therefore called through the CM… names with
// handles stripped of const, which each of them takes, and hands out types that are the same everywhere.
//
// A status is made CMPI_RC_OK with a null message before it goes to the broker: a broker need not touch it on
// success.
#pragma once

#include "ProviderUtilities.h"

// Some servers' headers use it without a definition, as ProviderUtilities.h explains.
#pragma push_macro("__cdecl")
#undef __cdecl
#define __cdecl // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
#include <cmpimacs.h>
#pragma pop_macro("__cdecl")

namespace TK::cmpi {

template <class Handle>
Handle* writable(const Handle* handle) {
    return const_cast<Handle*>(handle);
}

inline CMPIStatus* fresh(CMPIStatus& status) {
    status.rc = CMPI_RC_OK;
    status.msg = nullptr;
    return &status;
}

inline bool failed(const CMPIStatus& status) {
    return status.rc != CMPI_RC_OK;
}

// Of a value's state this bit alone says whether there is a value; brokers set others beside it.
inline bool isNull(const CMPIData& data) {
    return (data.state & CMPI_nullValue) != 0;
}

// On the broker.

inline CMPIInstance* newInstance(const CMPIBroker* broker, const CMPIObjectPath* path, CMPIStatus& status) {
    return CMNewInstance(writable(broker), writable(path), fresh(status));
}

inline CMPIObjectPath* newObjectPath(const CMPIBroker* broker, const char* nameSpace, const char* className,
                                     CMPIStatus& status) {
    return CMNewObjectPath(writable(broker), nameSpace, className, fresh(status));
}

inline bool classPathIsA(const CMPIBroker* broker, const CMPIObjectPath* path, const char* className,
                         CMPIStatus& status) {
    return CMClassPathIsA(writable(broker), writable(path), className, fresh(status)) != 0;
}

inline CMPIString* newString(const CMPIBroker* broker, const char* chars, CMPIStatus& status) {
    return CMNewString(writable(broker), chars, fresh(status));
}

inline CMPIArray* newArray(const CMPIBroker* broker, CMPICount size, CMPIType type, CMPIStatus& status) {
    return CMNewArray(writable(broker), size, type, fresh(status));
}

inline CMPIDateTime* newDateTime(const CMPIBroker* broker, const char* text, CMPIStatus& status) {
    return CMNewDateTimeFromChars(writable(broker), text, fresh(status));
}

// On object paths.

inline CMPIStatus add(CMPIObjectPath* path, const char* key, CMPIValue* value, CMPIType type) {
    return CMAddKey(path, key, value, type);
}

inline CMPIData get(const CMPIObjectPath* path, const char* key, CMPIStatus& status) {
    return CMGetKey(writable(path), key, fresh(status));
}

inline CMPIData getKeyAt(const CMPIObjectPath* path, CMPICount index, CMPIString*& name, CMPIStatus& status) {
    return CMGetKeyAt(writable(path), index, &name, fresh(status));
}

inline CMPICount getKeyCount(const CMPIObjectPath* path, CMPIStatus& status) {
    return CMGetKeyCount(writable(path), fresh(status));
}

inline const CMPIString* getClassName(const CMPIObjectPath* path, CMPIStatus& status) {
    return CMGetClassName(writable(path), fresh(status));
}

inline const CMPIString* getNameSpace(const CMPIObjectPath* path, CMPIStatus& status) {
    return CMGetNameSpace(writable(path), fresh(status));
}

inline CMPIStatus setNameSpace(CMPIObjectPath* path, const char* nameSpace) {
    return CMSetNameSpace(path, nameSpace);
}

// On instances and method arguments.

inline CMPIStatus add(CMPIInstance* instance, const char* property, CMPIValue* value, CMPIType type) {
    return CMSetProperty(instance, property, value, type);
}

inline CMPIData get(const CMPIInstance* instance, const char* property, CMPIStatus& status) {
    return CMGetProperty(writable(instance), property, fresh(status));
}

inline CMPIData get(const CMPIArgs* args, const char* argument, CMPIStatus& status) {
    return CMGetArg(writable(args), argument, fresh(status));
}

// On strings.

// The characters, which belong to the string; null for a null string, which no broker should hand out, and
// when the broker yields none.
inline const char* getChars(const CMPIString* string, CMPIStatus& status) {
    fresh(status);
    return string != nullptr ? CMGetCharsPtr(writable(string), &status) : nullptr;
}

// The same, null also when the broker reports an error.
inline const char* readChars(const CMPIString* string) {
    CMPIStatus status;
    const char* const chars = getChars(string, status);
    return failed(status) ? nullptr : chars;
}

// On date/times.

// The CIM date/time text; null for a null date/time, which no broker should hand out.
inline const CMPIString* getText(const CMPIDateTime* dateTime, CMPIStatus& status) {
    fresh(status);
    return dateTime != nullptr ? CMGetStringFormat(writable(dateTime), &status) : nullptr;
}

// On arrays.

// 0 for a null array, which no broker should hand out.
inline CMPICount getCount(const CMPIArray* array, CMPIStatus& status) {
    fresh(status);
    return array != nullptr ? CMGetArrayCount(writable(array), &status) : 0;
}

inline CMPIData getElementAt(const CMPIArray* array, CMPICount index, CMPIStatus& status) {
    return CMGetArrayElementAt(writable(array), index, fresh(status));
}

inline CMPIStatus setElementAt(CMPIArray* array, CMPICount index, CMPIValue* value, CMPIType type) {
    return CMSetArrayElementAt(array, index, value, type);
}

} // namespace TK::cmpi
