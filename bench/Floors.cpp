#include "Floors.h"

#include <array>
#include <charconv>
#include <cmpimacs.h>
#include <cstddef>
#include <type_traits>
#include <utility>

namespace floors {

namespace {

// The member of a value that holds a type, and CMPI's code of it.
template <class Member>
struct Slot {
    Member CMPIValue::*member;
    CMPIType type;
};

template <class Value>
constexpr auto slotOf() {
    if constexpr (std::is_same_v<Value, bool>) {
        return Slot<CMPIBoolean>{&CMPIValue::boolean, CMPI_boolean};
    } else if constexpr (std::is_same_v<Value, unsigned char>) {
        return Slot<CMPIUint8>{&CMPIValue::uint8, CMPI_uint8};
    } else if constexpr (std::is_same_v<Value, unsigned short>) {
        return Slot<CMPIUint16>{&CMPIValue::uint16, CMPI_uint16};
    } else if constexpr (std::is_same_v<Value, unsigned int>) {
        return Slot<CMPIUint32>{&CMPIValue::uint32, CMPI_uint32};
    } else if constexpr (std::is_same_v<Value, unsigned long long>) {
        return Slot<CMPIUint64>{&CMPIValue::uint64, CMPI_uint64};
    } else if constexpr (std::is_same_v<Value, short>) {
        return Slot<CMPISint16>{&CMPIValue::sint16, CMPI_sint16};
    } else if constexpr (std::is_same_v<Value, float>) {
        return Slot<CMPIReal32>{&CMPIValue::real32, CMPI_real32};
    } else if constexpr (std::is_same_v<Value, double>) {
        return Slot<CMPIReal64>{&CMPIValue::real64, CMPI_real64};
    } else if constexpr (std::is_same_v<Value, CMPIObjectPath*>) {
        return Slot<CMPIObjectPath*>{&CMPIValue::ref, CMPI_ref};
    } else if constexpr (std::is_same_v<Value, CMPIDateTime*>) {
        return Slot<CMPIDateTime*>{&CMPIValue::dateTime, CMPI_dateTime};
    } else if constexpr (std::is_same_v<Value, CMPIArray*>) {
        return Slot<CMPIArray*>{&CMPIValue::array, CMPI_ARRAY};
    } else {
        static_assert(std::is_same_v<Value, CMPIString*>);
        return Slot<CMPIString*>{&CMPIValue::string, CMPI_string};
    }
}

void call(CMPIInstance* instance, const char* name, CMPIValue* value, CMPIType type) {
    CMSetProperty(instance, name, value, type);
}

void call(CMPIObjectPath* path, const char* name, CMPIValue* value, CMPIType type) {
    CMAddKey(path, name, value, type);
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

template <class Object, class Value>
void set(Object* object, const char* name, Value value) {
    if constexpr (std::is_same_v<Value, const char*>) {
        call(object, name, reinterpret_cast<CMPIValue*>(const_cast<char*>(value)), CMPI_chars);
    } else {
        constexpr auto slot = slotOf<Value>();
        CMPIValue record = {};
        record.*slot.member = static_cast<std::decay_t<decltype(record.*slot.member)>>(value);
        call(object, name, &record, slot.type);
    }
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

} // namespace

template <class Value>
void setProperty(CMPIInstance* instance, const char* name, Value value) {
    set(instance, name, value);
}

template <class Value>
void setKeyProperty(CMPIObjectPath* path, const char* name, Value value) {
    set(path, name, value);
}

template <class Object, class Out>
bool get(const Object* object, const char* name, Out& out) {
    if constexpr (std::is_same_v<Out, std::string>) {
        CMPIString* string = nullptr;
        return get(object, name, string) && assign(string, out);
    } else {
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        const CMPIData data = call(object, name, status);
        if (status.rc != CMPI_RC_OK || (data.state & CMPI_nullValue) != 0) {
            return false;
        }
        out = static_cast<Out>(data.value.*slotOf<Out>().member);
        return true;
    }
}

bool getDate(const CMPIInstance* instance, const char* name, std::string& out) {
    CMPIDateTime* dateTime = nullptr;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    return get(instance, name, dateTime) && assign(CMGetStringFormat(dateTime, &status), out);
}

template <class Element>
bool getArray(const CMPIInstance* instance, const char* name, std::vector<Element>& out) {
    CMPIArray* array = nullptr;
    if (!get(instance, name, array)) {
        return false;
    }
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPICount count = CMGetArrayCount(array, &status);
    for (CMPICount i = 0; i < count; ++i) {
        const CMPIData element = CMGetArrayElementAt(array, i, &status);
        if (status.rc != CMPI_RC_OK) {
            continue;
        }
        if constexpr (std::is_same_v<Element, std::string>) {
            const char* const chars = charsOf(element.value.string);
            if (chars != nullptr) {
                out.emplace_back(chars);
            }
        } else {
            out.push_back(element.value.*slotOf<Element>().member);
        }
    }
    return true;
}

template <class Element>
void setArray(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
              const std::vector<Element>& elements) {
    constexpr bool areTexts = std::is_same_v<Element, std::string>;
    constexpr auto slot = slotOf<std::conditional_t<areTexts, CMPIString*, Element>>();
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIValue value = {};
    CMPIArray* const array = CMNewArray(broker, static_cast<CMPICount>(elements.size()), slot.type, &status);
    for (CMPICount i = 0; i < elements.size(); ++i) {
        if constexpr (areTexts) {
            value.string = CMNewString(broker, elements[i].c_str(), &status);
        } else {
            value.*slot.member = elements[i];
        }
        CMSetArrayElementAt(array, i, &value, slot.type);
    }
    value.array = array;
    CMSetProperty(instance, name, &value, static_cast<CMPIType>(slot.type | CMPI_ARRAY));
}

template <class Number>
void push(Keys& keys, std::string name, Number number) {
    if constexpr (std::is_same_v<Number, unsigned char>) {
        keys.push_back(
            {TK::Moniker::COMPONENT_UINT8, std::move(name), std::string(1, static_cast<char>(number))});
    } else {
        constexpr auto type = sizeof(Number) == 2   ? TK::Moniker::COMPONENT_UINT16
                              : sizeof(Number) == 4 ? TK::Moniker::COMPONENT_UINT32
                                                    : TK::Moniker::COMPONENT_UINT64;
        std::array<char, 20> digits{};
        char* const end = std::to_chars(digits.data(), digits.data() + digits.size(), number).ptr;
        keys.push_back({type, std::move(name), std::string(digits.data(), end)});
    }
}

template <class Number>
void read(const std::string& text, Number& number) {
    if constexpr (std::is_same_v<Number, unsigned char>) {
        number = static_cast<unsigned char>(text[0]);
    } else {
        std::from_chars(text.data(), text.data() + text.size(), number);
    }
}

// What the rows call.
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, bool value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, unsigned char value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, unsigned short value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, unsigned int value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, unsigned long long value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, short value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, float value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, double value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, CMPIString* value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, CMPIObjectPath* value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, CMPIDateTime* value);
template TK_EXPORT void setProperty(CMPIInstance* instance, const char* name, const char* value);
template TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned char value);
template TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned short value);
template TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned int value);
template TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, unsigned long long value);
template TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, CMPIString* value);
template TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, CMPIObjectPath* value);
template TK_EXPORT void setKeyProperty(CMPIObjectPath* path, const char* name, const char* value);
template TK_EXPORT bool get(const CMPIInstance* instance, const char* name, unsigned short& out);
template TK_EXPORT bool get(const CMPIInstance* instance, const char* name, unsigned int& out);
template TK_EXPORT bool get(const CMPIInstance* instance, const char* name, bool& out);
template TK_EXPORT bool get(const CMPIInstance* instance, const char* name, CMPIString*& out);
template TK_EXPORT bool get(const CMPIInstance* instance, const char* name, std::string& out);
template TK_EXPORT bool get(const CMPIArgs* args, const char* name, unsigned short& out);
template TK_EXPORT bool get(const CMPIArgs* args, const char* name, unsigned int& out);
template TK_EXPORT bool get(const CMPIArgs* args, const char* name, bool& out);
template TK_EXPORT bool get(const CMPIArgs* args, const char* name, std::string& out);
template TK_EXPORT bool get(const CMPIObjectPath* path, const char* name, CMPIString*& out);
template TK_EXPORT bool get(const CMPIObjectPath* path, const char* name, CMPIObjectPath*& out);
template TK_EXPORT bool get(const CMPIObjectPath* path, const char* name, std::string& out);
template TK_EXPORT bool getArray(const CMPIInstance* instance, const char* name,
                                 std::vector<unsigned short>& out);
template TK_EXPORT bool getArray(const CMPIInstance* instance, const char* name,
                                 std::vector<std::string>& out);
template TK_EXPORT void setArray(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                 const std::vector<unsigned char>& elements);
template TK_EXPORT void setArray(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                 const std::vector<unsigned short>& elements);
template TK_EXPORT void setArray(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                 const std::vector<std::string>& elements);
template TK_EXPORT void push(Keys& keys, std::string name, unsigned char number);
template TK_EXPORT void push(Keys& keys, std::string name, unsigned short number);
template TK_EXPORT void push(Keys& keys, std::string name, unsigned int number);
template TK_EXPORT void push(Keys& keys, std::string name, unsigned long long number);
template TK_EXPORT void read(const std::string& text, unsigned char& number);
template TK_EXPORT void read(const std::string& text, unsigned short& number);
template TK_EXPORT void read(const std::string& text, unsigned int& number);
template TK_EXPORT void read(const std::string& text, unsigned long long& number);

} // namespace floors
