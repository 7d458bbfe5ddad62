// The least that an operation can cost: the bare CMPI calls of each accessor and a plain list of keys. The
// functions are in a shared library of their own, so that calling them costs what calling the library does.
#pragma once

#include "ProviderUtilities.h"

#include <string>
#include <vector>

namespace floors {

// The bare CMPI call with the value in its record; a C text is handed over as it is.
template <class Value>
void setProperty(CMPIInstance* instance, const char* name, Value value);
template <class Value>
void setKeyProperty(CMPIObjectPath* path, const char* name, Value value);

// The bare CMPI call on an instance, arguments or an object path, and the two tests without which its data
// may not be used. A text takes one more call and an assignment.
template <class Object, class Out>
bool get(const Object* object, const char* name, Out& out);
TK_EXPORT bool getDate(const CMPIInstance* instance, const char* name, std::string& out);

// The bare calls for an array, and what each element costs at least: a push, or a call that sets it.
template <class Element>
bool getArray(const CMPIInstance* instance, const char* name, std::vector<Element>& out);
template <class Element>
void setArray(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
              const std::vector<Element>& elements);

// Appends the record that Moniker::addKey appends; to_chars writes its digits.
using Keys = std::vector<TK::Moniker::KeyComponent>;
template <class Number>
void push(Keys& keys, std::string name, Number number);

// Reads with from_chars the text that Moniker::addKey makes of a number; that of a byte is the byte itself.
template <class Number>
void read(const std::string& text, Number& number);

} // namespace floors
