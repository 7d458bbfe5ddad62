// What cannot be undercut: the bare CMPI calls of each accessor, in plain functions of a shared library of
// their own, and a plain list of keys.
#pragma once

#include "ProviderUtilities.h"

#include <string>
#include <vector>

namespace floors {

// The bare CMPI call with the value in its record.
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, bool value);
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, unsigned char value);
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, unsigned short value);
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, unsigned int value);
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, unsigned long long value);
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, short value);
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, float value);
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, double value);
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, CMPIString* value);
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, CMPIObjectPath* value);
TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, const char* value);
TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned char value);
TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned short value);
TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned int value);
TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned long long value);
TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, CMPIString* value);
TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, CMPIObjectPath* value);
TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, const char* value);

// The bare CMPI call, and the two tests without which its data may not be used.
TK_EXPORT bool getProperty(const CMPIInstance* instance, const char* name, unsigned short& out);
TK_EXPORT bool getProperty(const CMPIInstance* instance, const char* name, unsigned int& out);
TK_EXPORT bool getProperty(const CMPIInstance* instance, const char* name, bool& out);
TK_EXPORT bool getProperty(const CMPIInstance* instance, const char* name, CMPIString** out);
TK_EXPORT bool getProperty(const CMPIArgs* args, const char* name, unsigned short& out);
TK_EXPORT bool getProperty(const CMPIArgs* args, const char* name, unsigned int& out);
TK_EXPORT bool getProperty(const CMPIArgs* args, const char* name, bool& out);
TK_EXPORT bool getKeyProperty(const CMPIObjectPath* path, const char* name, CMPIString** out);
TK_EXPORT bool getKeyProperty(const CMPIObjectPath* path, const char* name, CMPIObjectPath** out);

// The bare calls and one assignment.
TK_EXPORT bool getProperty(const CMPIInstance* instance, const char* name, std::string& out);
TK_EXPORT bool getProperty(const CMPIArgs* args, const char* name, std::string& out);
TK_EXPORT bool getKeyProperty(const CMPIObjectPath* path, const char* name, std::string& out);
TK_EXPORT bool getDate(const CMPIInstance* instance, const char* name, std::string& out);

// The bare calls and a push of each element.
TK_EXPORT bool getArray(const CMPIInstance* instance, const char* name, std::vector<unsigned short>& out);
TK_EXPORT bool getArray(const CMPIInstance* instance, const char* name, std::vector<std::string>& out);

// Appends the record that Moniker::addKey appends, its digits written by to_chars.
using Keys = std::vector<TK::Moniker::KeyComponent>;
TK_EXPORT void push(Keys& keys, std::string name, unsigned char value);
TK_EXPORT void push(Keys& keys, std::string name, unsigned short value);
TK_EXPORT void push(Keys& keys, std::string name, unsigned int value);
TK_EXPORT void push(Keys& keys, std::string name, unsigned long long value);

// Reads the text that Moniker::addKey makes of a number by from_chars; that of a byte is the byte itself.
TK_EXPORT void read(const std::string& text, unsigned char& value);
TK_EXPORT void read(const std::string& text, unsigned short& value);
TK_EXPORT void read(const std::string& text, unsigned int& value);
TK_EXPORT void read(const std::string& text, unsigned long long& value);

} // namespace floors
