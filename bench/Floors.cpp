#include "Floors.h"

#include <array>
#include <charconv>
#include <cmpimacs.h>
#include <cstddef>
#include <utility>

namespace floors {

namespace {

template <class Member>
void set(CMPIInstance* instance, const char* name, Member CMPIValue::*member, Member value, CMPIType type) {
    CMPIValue record = {};
    record.*member = value;
    CMSetProperty(instance, name, &record, type);
}

template <class Member>
void set(CMPIObjectPath* path, const char* name, Member CMPIValue::*member, Member value, CMPIType type) {
    CMPIValue record = {};
    record.*member = value;
    CMAddKey(path, name, &record, type);
}

CMPIData call(const CMPIInstance* instance, const char* name, CMPIStatus& status) {
    return CMGetProperty(const_cast<CMPIInstance*>(instance), name, &status);
}

CMPIData call(const CMPIArgs* args, const char* name, CMPIStatus& status) {
    return CMGetArg(const_cast<CMPIArgs*>(args), name, &status);
}

CMPIData call(const CMPIObjectPath* path, const char* name, CMPIStatus& status) {
    return CMGetKey(const_cast<CMPIObjectPath*>(path), name, &status);
}

template <class Object, class Member, class Out>
bool get(const Object* object, const char* name, Member CMPIValue::*member, Out& out) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIData data = call(object, name, status);
    if (status.rc != CMPI_RC_OK || (data.state & CMPI_nullValue) != 0) {
        return false;
    }
    out = static_cast<Out>(data.value.*member);
    return true;
}

const char* charsOf(CMPIString* string) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const char* const chars = CMGetCharsPtr(string, &status);
    return status.rc == CMPI_RC_OK ? chars : nullptr;
}

bool assign(CMPIString* string, std::string& out) {
    const char* const chars = charsOf(string);
    if (chars == nullptr) {
        return false;
    }
    out = chars;
    return true;
}

template <class Object>
bool getText(const Object* object, const char* name, std::string& out) {
    CMPIString* string = nullptr;
    return get(object, name, &CMPIValue::string, string) && assign(string, out);
}

template <class Push>
bool pushElements(const CMPIInstance* instance, const char* name, const Push& push) {
    CMPIArray* array = nullptr;
    if (!get(instance, name, &CMPIValue::array, array)) {
        return false;
    }
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPICount count = CMGetArrayCount(array, &status);
    for (CMPICount i = 0; i < count; ++i) {
        const CMPIData element = CMGetArrayElementAt(array, i, &status);
        if (status.rc == CMPI_RC_OK) {
            push(element.value);
        }
    }
    return true;
}

template <class Number>
void pushNumber(Keys& keys, TK::Moniker::ComponentType type, std::string&& name, Number number) {
    std::array<char, 20> digits{};
    const auto* const end = std::to_chars(digits.data(), digits.data() + digits.size(), number).ptr;
    keys.push_back(
        {type, std::move(name), std::string(digits.data(), static_cast<std::size_t>(end - digits.data()))});
}

} // namespace

void setProperty(CMPIInstance* instance, const char* name, bool value) {
    set(instance, name, &CMPIValue::boolean, static_cast<CMPIBoolean>(value), CMPI_boolean);
}

void setProperty(CMPIInstance* instance, const char* name, unsigned char value) {
    set(instance, name, &CMPIValue::uint8, value, CMPI_uint8);
}

void setProperty(CMPIInstance* instance, const char* name, unsigned short value) {
    set(instance, name, &CMPIValue::uint16, value, CMPI_uint16);
}

void setProperty(CMPIInstance* instance, const char* name, unsigned int value) {
    set(instance, name, &CMPIValue::uint32, static_cast<CMPIUint32>(value), CMPI_uint32);
}

void setProperty(CMPIInstance* instance, const char* name, unsigned long long value) {
    set(instance, name, &CMPIValue::uint64, static_cast<CMPIUint64>(value), CMPI_uint64);
}

void setProperty(CMPIInstance* instance, const char* name, short value) {
    set(instance, name, &CMPIValue::sint16, value, CMPI_sint16);
}

void setProperty(CMPIInstance* instance, const char* name, float value) {
    set(instance, name, &CMPIValue::real32, value, CMPI_real32);
}

void setProperty(CMPIInstance* instance, const char* name, double value) {
    set(instance, name, &CMPIValue::real64, value, CMPI_real64);
}

void setProperty(CMPIInstance* instance, const char* name, CMPIString* value) {
    set(instance, name, &CMPIValue::string, value, CMPI_string);
}

void setProperty(CMPIInstance* instance, const char* name, CMPIObjectPath* value) {
    set(instance, name, &CMPIValue::ref, value, CMPI_ref);
}

void setProperty(CMPIInstance* instance, const char* name, const char* value) {
    CMSetProperty(instance, name, reinterpret_cast<CMPIValue*>(const_cast<char*>(value)), CMPI_chars);
}

void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned char value) {
    set(path, name, &CMPIValue::uint8, value, CMPI_uint8);
}

void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned short value) {
    set(path, name, &CMPIValue::uint16, value, CMPI_uint16);
}

void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned int value) {
    set(path, name, &CMPIValue::uint32, static_cast<CMPIUint32>(value), CMPI_uint32);
}

void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned long long value) {
    set(path, name, &CMPIValue::uint64, static_cast<CMPIUint64>(value), CMPI_uint64);
}

void setKeyProperty(CMPIObjectPath* path, const char* name, CMPIString* value) {
    set(path, name, &CMPIValue::string, value, CMPI_string);
}

void setKeyProperty(CMPIObjectPath* path, const char* name, CMPIObjectPath* value) {
    set(path, name, &CMPIValue::ref, value, CMPI_ref);
}

void setKeyProperty(CMPIObjectPath* path, const char* name, const char* value) {
    CMAddKey(path, name, reinterpret_cast<CMPIValue*>(const_cast<char*>(value)), CMPI_chars);
}

bool getProperty(const CMPIInstance* instance, const char* name, unsigned short& out) {
    return get(instance, name, &CMPIValue::uint16, out);
}

bool getProperty(const CMPIInstance* instance, const char* name, unsigned int& out) {
    return get(instance, name, &CMPIValue::uint32, out);
}

bool getProperty(const CMPIInstance* instance, const char* name, bool& out) {
    return get(instance, name, &CMPIValue::boolean, out);
}

bool getProperty(const CMPIInstance* instance, const char* name, CMPIString** out) {
    return get(instance, name, &CMPIValue::string, *out);
}

bool getProperty(const CMPIArgs* args, const char* name, unsigned short& out) {
    return get(args, name, &CMPIValue::uint16, out);
}

bool getProperty(const CMPIArgs* args, const char* name, unsigned int& out) {
    return get(args, name, &CMPIValue::uint32, out);
}

bool getProperty(const CMPIArgs* args, const char* name, bool& out) {
    return get(args, name, &CMPIValue::boolean, out);
}

bool getKeyProperty(const CMPIObjectPath* path, const char* name, CMPIString** out) {
    return get(path, name, &CMPIValue::string, *out);
}

bool getKeyProperty(const CMPIObjectPath* path, const char* name, CMPIObjectPath** out) {
    return get(path, name, &CMPIValue::ref, *out);
}

bool getProperty(const CMPIInstance* instance, const char* name, std::string& out) {
    return getText(instance, name, out);
}

bool getProperty(const CMPIArgs* args, const char* name, std::string& out) {
    return getText(args, name, out);
}

bool getKeyProperty(const CMPIObjectPath* path, const char* name, std::string& out) {
    return getText(path, name, out);
}

bool getDate(const CMPIInstance* instance, const char* name, std::string& out) {
    CMPIDateTime* dateTime = nullptr;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    return get(instance, name, &CMPIValue::dateTime, dateTime) &&
           assign(CMGetStringFormat(dateTime, &status), out);
}

bool getArray(const CMPIInstance* instance, const char* name, std::vector<unsigned short>& out) {
    return pushElements(instance, name, [&out](const CMPIValue& value) { out.push_back(value.uint16); });
}

bool getArray(const CMPIInstance* instance, const char* name, std::vector<std::string>& out) {
    return pushElements(instance, name, [&out](const CMPIValue& value) {
        const char* const chars = charsOf(value.string);
        if (chars != nullptr) {
            out.emplace_back(chars);
        }
    });
}

void push(Keys& keys, std::string name, unsigned char value) {
    keys.push_back({TK::Moniker::COMPONENT_UINT8, std::move(name), std::string(1, static_cast<char>(value))});
}

void push(Keys& keys, std::string name, unsigned short value) {
    pushNumber(keys, TK::Moniker::COMPONENT_UINT16, std::move(name), value);
}

void push(Keys& keys, std::string name, unsigned int value) {
    pushNumber(keys, TK::Moniker::COMPONENT_UINT32, std::move(name), value);
}

void push(Keys& keys, std::string name, unsigned long long value) {
    pushNumber(keys, TK::Moniker::COMPONENT_UINT64, std::move(name), value);
}

void read(const std::string& text, unsigned char& value) {
    value = static_cast<unsigned char>(text[0]);
}

void read(const std::string& text, unsigned short& value) {
    std::from_chars(text.data(), text.data() + text.size(), value);
}

void read(const std::string& text, unsigned int& value) {
    std::from_chars(text.data(), text.data() + text.size(), value);
}

void read(const std::string& text, unsigned long long& value) {
    std::from_chars(text.data(), text.data() + text.size(), value);
}

} // namespace floors
