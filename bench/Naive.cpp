#include "Naive.h"

#include "ClassTable.h"
#include "HVLogger.h"

#include <array>
#include <cctype>
#include <cmpimacs.h>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <cwchar>
#include <memory>
#include <sstream>
#include <strings.h>

namespace naive {

static const std::string providerUtilities("Hovara.ProviderUtilities");
static const std::string utils("Hovara.Utils");

// The trace frame

namespace {

class Accumulator {
public:
    Accumulator& operator<<(const char* text) {
        stream_ << text;
        return *this;
    }
    std::ostream& stream() { return stream_; }
    const std::string& str(const Accumulator& /*inserted*/) { return take(); }
    const std::string& str(const std::ostream& /*inserted*/) { return take(); }

private:
    const std::string& take() {
        taken_ = stream_.str();
        stream_.str("");
        stream_.clear();
        return taken_;
    }

    std::ostringstream stream_;
    std::string taken_;
};

template <class T>
std::ostream& operator<<(Accumulator& accumulator, const T* value) {
    return accumulator.stream() << value;
}

template <class T>
std::ostream& operator<<(Accumulator& accumulator, const T& value) {
    return accumulator.stream() << value;
}

using MessageBuffer = std::array<char, 512>;

char* flowText(const char* kind, const char* function, int line) {
    static thread_local MessageBuffer messageBuffer;
    messageBuffer.fill(0);
    static_cast<void>(std::snprintf(messageBuffer.data(), messageBuffer.size(), "%s: %s() in %s [Line: %d]",
                                    kind, function, "Naive.cpp", line));
    return messageBuffer.data();
}

char* messageText(const char* text, int line) {
    static thread_local MessageBuffer messageBuffer;
    messageBuffer.fill(0);
    static_cast<void>(std::snprintf(messageBuffer.data(), messageBuffer.size(),
                                    "MESSAGE [File: %s, Line: %d]: %s", "Naive.cpp", line, text));
    return messageBuffer.data();
}

char* variableText(const char* name, unsigned int value, int line) {
    static thread_local MessageBuffer messageBuffer;
    messageBuffer.fill(0);
    static_cast<void>(std::snprintf(messageBuffer.data(), messageBuffer.size(),
                                    "VARIABLE: '%s' has Value '%d' at line %d in %s", name,
                                    static_cast<int>(value), line, "Naive.cpp"));
    return messageBuffer.data();
}

char* variableText(const char* name, const char* value, int line) {
    static thread_local MessageBuffer messageBuffer;
    messageBuffer.fill(0);
    static_cast<void>(std::snprintf(messageBuffer.data(), messageBuffer.size(),
                                    "VARIABLE: '%s' has Value '%s' at line %d in %s", name, value, line,
                                    "Naive.cpp"));
    return messageBuffer.data();
}

char* parametersText(const char* kind, const char* function, int line, const char* parameters) {
    static thread_local MessageBuffer messageBuffer;
    messageBuffer.fill(0);
    static_cast<void>(std::snprintf(messageBuffer.data(), messageBuffer.size(),
                                    "%s: %s() in %s [Line: %d],Parameters List: %s", kind, function,
                                    "Naive.cpp", line, parameters));
    return messageBuffer.data();
}

} // namespace

#define NAIVE_POINT(category, level, text)                                                              \
    HVLog::HVLogger::logLevelMessage(__func__, "Naive.cpp", __LINE__, category, level, nullptr, 0, 0,   \
                                     message.str(message << (text)));                                   \
    HVLog::HVLogger::traceLevelMessage(__func__, "Naive.cpp", __LINE__, category, level, nullptr, 0, 0, \
                                       message.str(message << (text)))
#define NAIVE_TEXT(category, level, text)   \
    do {                                    \
        Accumulator message;                \
        NAIVE_POINT(category, level, text); \
    } while (false)
#define NAIVE_ENTERING(category) NAIVE_TEXT(category, 4000, flowText("ENTERING", __func__, __LINE__))
#define NAIVE_EXITING(category) NAIVE_TEXT(category, 4000, flowText("EXITING", __func__, __LINE__))
#define NAIVE_MESSAGE(category, text) NAIVE_TEXT(category, 6000, messageText(text, __LINE__))
#define NAIVE_VARIABLE(category, name, value) NAIVE_TEXT(category, 4000, variableText(name, value, __LINE__))
#define NAIVE_PARAMETERS(category, kind, insertions)                                         \
    do {                                                                                     \
        Accumulator parameterList;                                                           \
        Accumulator message;                                                                 \
        NAIVE_POINT(category, 3000,                                                          \
                    parametersText(kind, __func__, __LINE__,                                 \
                                   parameterList.str(parameterList << insertions).c_str())); \
    } while (false)

void Trace::entering(const std::string& category) {
    NAIVE_ENTERING(category);
}

void Trace::message(const std::string& category, const char* text) {
    NAIVE_MESSAGE(category, text);
}

void Trace::variable(const std::string& category, const char* name, unsigned int value) {
    NAIVE_VARIABLE(category, name, value);
}

void Trace::variable(const std::string& category, const char* name, const char* value) {
    NAIVE_VARIABLE(category, name, value);
}

void Trace::parameters(const std::string& category, const CMPIBroker* broker, const CMPIInstance* instance,
                       const char* name, const std::vector<unsigned short>* value) {
    NAIVE_PARAMETERS(category, "ENTERING",
                     " broker=" << broker << " instance=" << instance << " name=" << name
                                << " value=" << value);
}

// Key monikers

namespace {

template <class Number>
std::string textOf(Number number) {
    std::ostringstream stream;
    stream << number;
    return stream.str();
}

template <class Number>
void read(const std::string& text, Number& number) {
    std::istringstream stream(text);
    stream >> number;
}

} // namespace

unsigned int Moniker::getKeyCount() const {
    return static_cast<unsigned int>(keys.size());
}

bool Moniker::selectKey(unsigned int index) {
    keySelected = false;
    if (index < keys.size()) {
        selectedKey = index;
        keySelected = true;
        return true;
    }
    return false;
}

void Moniker::getType(unsigned short& type) const {
    if (!keySelected) {
        throw TK::FrameworkException("Key is not selected.");
    }
    type = static_cast<unsigned short>(keys[selectedKey].type);
}

void Moniker::getName(std::string& name) const {
    if (!keySelected) {
        throw TK::FrameworkException("Key is not selected.");
    }
    name = keys[selectedKey].name;
}

std::string Moniker::valueOf(unsigned short type) const {
    if (!keySelected || keys[selectedKey].type != type) {
        throw TK::FrameworkException(
            "Either the Key is not selected or the value is not compatible with the requested data type.");
    }
    return keys[selectedKey].value;
}

void Moniker::getValue(std::string& value) const {
    value = valueOf(4);
}

void Moniker::getValue(unsigned char& value) const {
    read(valueOf(0), value);
}

void Moniker::getValue(unsigned short& value) const {
    read(valueOf(1), value);
}

void Moniker::getValue(unsigned int& value) const {
    read(valueOf(2), value);
}

void Moniker::getValue(unsigned long long& value) const {
    read(valueOf(3), value);
}

unsigned short Moniker::addKey(std::string name, const std::string& value) {
    return append(4, name, value);
}

unsigned short Moniker::addKey(std::string name, unsigned char value) {
    return append(0, name, textOf(value));
}

unsigned short Moniker::addKey(std::string name, unsigned short value) {
    return append(1, name, textOf(value));
}

unsigned short Moniker::addKey(std::string name, unsigned int value) {
    return append(2, name, textOf(value));
}

unsigned short Moniker::addKey(std::string name, unsigned long long value) {
    return append(3, name, textOf(value));
}

unsigned short Moniker::append(unsigned short type, const std::string& name, const std::string& value) {
    Component component;
    component.type = type;
    component.name = name;
    component.value = value;
    keys.push_back(component);
    keySelected = true;
    selectedKey = static_cast<unsigned short>(keys.size() - 1);
    return static_cast<unsigned short>(selectedKey);
}

// Scalars and texts

CMPIInstance* ProviderUtilities::createInstance(const CMPIBroker* broker, CMPIObjectPath* objectPath) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIInstance* const instance = CMNewInstance(broker, objectPath, &status);
    return status.rc == CMPI_RC_OK ? instance : nullptr;
}

std::string ProviderUtilities::getNamespace(const CMPIObjectPath* objectPath) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIString* const name = CMGetNameSpace(objectPath, &status);
    return status.rc == CMPI_RC_OK ? convertToString(name) : std::string();
}

std::string ProviderUtilities::convertToString(const CMPIString* string) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const char* const chars = string != nullptr ? CMGetCharsPtr(string, &status) : nullptr;
    if (chars == nullptr || status.rc != CMPI_RC_OK) {
        throw TK::FrameworkException("String Conversion Failed !!");
    }
    return chars;
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name, unsigned char value) {
    CMAddKey(objectPath, name, &value, CMPI_uint8);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name, unsigned short value) {
    CMAddKey(objectPath, name, &value, CMPI_uint16);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name, unsigned int value) {
    CMAddKey(objectPath, name, &value, CMPI_uint32);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                                       unsigned long long value) {
    CMAddKey(objectPath, name, &value, CMPI_uint64);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                                       const std::string& value) {
    CMAddKey(objectPath, name, value.c_str(), CMPI_chars);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                                       const std::wstring& value) {
    std::string converted;
    if (!ConvertWideCharToMultiByte(value, converted)) {
        NAIVE_MESSAGE(providerUtilities, "Failed to convert the data to Multi byte");
        return;
    }
    CMAddKey(objectPath, name, converted.c_str(), CMPI_chars);
}

namespace {

bool widen(const CMPIData& data, const CMPIStatus& status, std::wstring& out) {
    if (status.rc != CMPI_RC_OK || (data.state & CMPI_nullValue) != 0) {
        return false;
    }
    const std::string text = ProviderUtilities::convertToString(data.value.string);
    std::wstring converted;
    if (!ProviderUtilities::ConvertMultiByteToWideChar(text, converted)) {
        NAIVE_MESSAGE(providerUtilities, "Failed to convert the data to Multi byte");
        return false;
    }
    out = converted;
    return true;
}

} // namespace

bool ProviderUtilities::getKeyProperty(const CMPIObjectPath* objectPath, const char* name,
                                       std::wstring& out) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIData data = CMGetKey(objectPath, name, &status);
    return widen(data, status, out);
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, std::wstring& out) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIData data = CMGetProperty(instance, name, &status);
    return widen(data, status, out);
}

bool ProviderUtilities::getProperty(const CMPIArgs* args, const char* name, std::wstring& out) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIData data = CMGetArg(args, name, &status);
    return widen(data, status, out);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, bool value) {
    CMPIBoolean number = value ? 1 : 0;
    CMSetProperty(instance, name, &number, CMPI_boolean);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned char value) {
    CMSetProperty(instance, name, &value, CMPI_uint8);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned short value) {
    CMSetProperty(instance, name, &value, CMPI_uint16);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned int value) {
    CMSetProperty(instance, name, &value, CMPI_uint32);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned long long value) {
    CMSetProperty(instance, name, &value, CMPI_uint64);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, short value) {
    CMSetProperty(instance, name, &value, CMPI_sint16);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, const char* value) {
    CMSetProperty(instance, name, value, CMPI_chars);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, std::string& value) {
    CMSetProperty(instance, name, value.c_str(), CMPI_chars);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, std::wstring& value) {
    std::string converted;
    if (!ConvertWideCharToMultiByte(value, converted)) {
        NAIVE_MESSAGE(providerUtilities, "Failed to convert the data to Multi byte");
        return;
    }
    CMSetProperty(instance, name, converted.c_str(), CMPI_chars);
}

void ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                    std::string& value, bool isDate) {
    if (!isDate) {
        CMSetProperty(instance, name, value.c_str(), CMPI_chars);
        return;
    }
    NAIVE_VARIABLE(providerUtilities, "isDate", static_cast<unsigned int>(isDate));
    NAIVE_VARIABLE(providerUtilities, "Date", value.c_str());
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIValue date = {};
    date.dateTime = CMNewDateTimeFromChars(broker, value.c_str(), &status);
    if (status.rc == CMPI_RC_OK) {
        CMSetProperty(instance, name, &date, CMPI_dateTime);
    }
}

// Arrays

namespace {

template <class Number>
void setNumbers(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                const std::vector<Number>& numbers, CMPIType type) {
    if (numbers.empty()) {
        return;
    }
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIValue value = {};
    value.array = CMNewArray(broker, static_cast<CMPICount>(numbers.size()), type, &status);
    if (status.rc != CMPI_RC_OK) {
        return;
    }
    for (CMPICount i = 0; i < numbers.size() && status.rc == CMPI_RC_OK; ++i) {
        Number number = numbers.at(i);
        status = CMSetArrayElementAt(value.array, i, reinterpret_cast<CMPIValue*>(&number), type);
    }
    CMSetProperty(instance, name, &value, static_cast<CMPIType>(type | CMPI_ARRAY));
}

void setElement(const CMPIArray* array, CMPICount i, CMPIString* string, CMPIStatus& status) {
    if (status.rc == CMPI_RC_OK) {
        CMPIValue element = {};
        element.string = string;
        status = CMSetArrayElementAt(const_cast<CMPIArray*>(array), i, &element, CMPI_string);
    }
}

void setTexts(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
              const std::vector<std::string>& texts) {
    if (texts.empty()) {
        return;
    }
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIValue value = {};
    value.array = CMNewArray(broker, static_cast<CMPICount>(texts.size()), CMPI_string, &status);
    if (status.rc != CMPI_RC_OK) {
        return;
    }
    for (CMPICount i = 0; i < texts.size() && status.rc == CMPI_RC_OK; ++i) {
        setElement(value.array, i, CMNewString(broker, texts.at(i).c_str(), &status), status);
    }
    CMSetProperty(instance, name, &value, CMPI_stringA);
}

} // namespace

void ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                    std::vector<unsigned char>& value) {
    NAIVE_PARAMETERS(providerUtilities, "ENTERING",
                     " broker=" << broker << " instance=" << instance << " name=" << name
                                << " value=" << &value);
    NAIVE_VARIABLE(providerUtilities, "count", static_cast<unsigned int>(value.size()));
    setNumbers(broker, instance, name, value, CMPI_uint8);
    NAIVE_PARAMETERS(providerUtilities, "EXITING",
                     " broker=" << broker << " instance=" << instance << " name=" << name
                                << " value=" << &value);
}

void ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                    std::vector<unsigned short>& value) {
    NAIVE_PARAMETERS(providerUtilities, "ENTERING",
                     " broker=" << broker << " instance=" << instance << " name=" << name
                                << " value=" << &value);
    NAIVE_VARIABLE(providerUtilities, "count", static_cast<unsigned int>(value.size()));
    setNumbers(broker, instance, name, value, CMPI_uint16);
    NAIVE_PARAMETERS(providerUtilities, "EXITING",
                     " broker=" << broker << " instance=" << instance << " name=" << name
                                << " value=" << &value);
}

void ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                    std::vector<std::string>& value) {
    const bool isSecret = std::strcmp(name, "UserPassword") == 0;
    if (isSecret) {
        NAIVE_PARAMETERS(providerUtilities, "ENTERING",
                         " broker=" << broker << " instance=" << instance << " name=" << name);
    } else {
        NAIVE_PARAMETERS(providerUtilities, "ENTERING",
                         " broker=" << broker << " instance=" << instance << " name=" << name
                                    << " value=" << &value);
    }
    NAIVE_VARIABLE(providerUtilities, "count", static_cast<unsigned int>(value.size()));
    setTexts(broker, instance, name, value);
    if (isSecret) {
        NAIVE_PARAMETERS(providerUtilities, "EXITING",
                         " broker=" << broker << " instance=" << instance << " name=" << name);
    } else {
        NAIVE_PARAMETERS(providerUtilities, "EXITING",
                         " broker=" << broker << " instance=" << instance << " name=" << name
                                    << " value=" << &value);
    }
}

void ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                    std::vector<std::wstring>& value) {
    NAIVE_VARIABLE(providerUtilities, "count", static_cast<unsigned int>(value.size()));
    if (value.empty()) {
        return;
    }
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIValue record = {};
    record.array = CMNewArray(broker, static_cast<CMPICount>(value.size()), CMPI_string, &status);
    if (status.rc != CMPI_RC_OK) {
        return;
    }
    for (CMPICount i = 0; i < value.size() && status.rc == CMPI_RC_OK; ++i) {
        std::string strTarget;
        CUtility::WStringToAString(value.at(i), strTarget);
        CMPIString* const string = CMNewString(broker, strTarget.c_str(), &status);
        NAIVE_VARIABLE(providerUtilities, "strTarget", strTarget.c_str());
        setElement(record.array, i, string, status);
    }
    CMSetProperty(instance, name, &record, CMPI_stringA);
}

// Users' texts

bool ProviderUtilities::ValidateInput(std::string text, std::string exemption) {
    for (char& c : text) {
        c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    }
    const std::vector<std::string> denied = {"<",    "http:", "https:", "%",     "$", "\\\\",
                                             "www.", "wap.",  "ftp:",   "sftp:", ":", "\\"};
    for (const std::string& entry : denied) {
        if (!exemption.empty() && exemption == entry) {
            return true;
        }
        if (text.find(entry) != std::string::npos) {
            return false;
        }
    }
    return true;
}

bool ProviderUtilities::ValidateInput(std::wstring text, std::wstring exemption) {
    for (wchar_t& c : text) {
        if (c >= 0 && c <= 0xFF) {
            c = static_cast<wchar_t>(std::tolower(static_cast<int>(c)));
        }
    }
    const std::vector<std::wstring> denied = {L"<",    L"http:", L"https:", L"%",     L"$", L"\\\\",
                                              L"www.", L"wap.",  L"ftp:",   L"sftp:", L":", L"\\"};
    for (const std::wstring& entry : denied) {
        if (!exemption.empty() && exemption == entry) {
            return true;
        }
        if (text.find(entry) != std::wstring::npos) {
            return false;
        }
    }
    return true;
}

bool ProviderUtilities::ConvertWideCharToMultiByte(std::wstring in, std::string& out) {
    if (in.empty()) {
        out = "";
        return true;
    }
    return CUtility::WStringToAString(in, out);
}

bool ProviderUtilities::ConvertMultiByteToWideChar(std::string in, std::wstring& out) {
    if (in.empty()) {
        out = L"";
        return true;
    }
    return CUtility::AStringToWString(in, out);
}

bool CUtility::AStringToWString(std::string in, std::wstring& out) {
    NAIVE_ENTERING(providerUtilities);
    const std::size_t length = std::strlen(in.c_str());
    const std::unique_ptr<wchar_t[]> buffer(new wchar_t[length + 1]);
    const bool converted =
        std::mbstowcs(buffer.get(), in.c_str(), length + 1) != static_cast<std::size_t>(-1);
    if (converted) {
        out = buffer.get();
    }
    NAIVE_EXITING(providerUtilities);
    return converted;
}

bool CUtility::WStringToAString(std::wstring in, std::string& out) {
    NAIVE_ENTERING(providerUtilities);
    // The multibyte form is measured first, so that it fits.
    std::mbstate_t state{};
    const wchar_t* source = in.c_str();
    const std::size_t size = std::wcsrtombs(nullptr, &source, 0, &state);
    const bool converted = size != static_cast<std::size_t>(-1);
    if (converted) {
        const std::unique_ptr<char[]> buffer(new char[size + 1]);
        state = {};
        static_cast<void>(std::wcsrtombs(buffer.get(), &source, size + 1, &state));
        out = buffer.get();
    }
    NAIVE_EXITING(providerUtilities);
    return converted;
}

// Object paths and monikers

unsigned short ProviderUtilities::getKeyCount(const CMPIObjectPath* objectPath) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const auto keyCount = static_cast<unsigned short>(CMGetKeyCount(objectPath, &status));
    NAIVE_VARIABLE(providerUtilities, "keyCount", static_cast<unsigned int>(keyCount));
    unsigned short count = 0;
    for (unsigned short i = 0; i < keyCount; ++i) {
        CMPIStatus keyStatus = {CMPI_RC_OK, nullptr};
        CMPIString* name = nullptr;
        const CMPIData data = CMGetKeyAt(objectPath, i, &name, &keyStatus);
        if (keyStatus.rc == CMPI_RC_OK && (data.state & CMPI_nullValue) == 0) {
            ++count;
        }
    }
    if (status.rc != CMPI_RC_OK) {
        throw TK::FrameworkException("Could not Extract Keys from Object Path.");
    }
    NAIVE_VARIABLE(providerUtilities, "count", static_cast<unsigned int>(count));
    return count;
}

void ProviderUtilities::transformObjectPathToMoniker(const CMPIObjectPath* objectPath, Moniker& moniker) {
    NAIVE_PARAMETERS(providerUtilities, "ENTERING", " objectPath=" << objectPath << " moniker=" << &moniker);
    const unsigned short n = getKeyCount(objectPath);
    for (unsigned short i = 0; i < n; ++i) {
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        CMPIString* name = nullptr;
        const CMPIData data = CMGetKeyAt(objectPath, i, &name, &status);
        if (status.rc != CMPI_RC_OK || (data.state & CMPI_nullValue) != 0) {
            continue;
        }
        const std::string nameText = convertToString(name);
        if (data.type == CMPI_uint32) {
            moniker.addKey(nameText, data.value.uint32);
        } else if (data.type == CMPI_uint8) {
            moniker.addKey(nameText, data.value.uint8);
        } else if (data.type == CMPI_uint16) {
            moniker.addKey(nameText, data.value.uint16);
        } else if (data.type == CMPI_uint64) {
            moniker.addKey(nameText, static_cast<unsigned long long>(data.value.uint64));
        } else if (data.type == CMPI_string) {
            moniker.addKey(nameText, convertToString(data.value.string));
        } else {
            throw TK::FrameworkException("Moniker component for data type not available.");
        }
    }
    NAIVE_PARAMETERS(providerUtilities, "EXITING", " objectPath=" << objectPath << " moniker=" << &moniker);
}

namespace {

template <class Value>
void setKey(CMPIObjectPath* objectPath, const std::string& name, const Moniker& moniker) {
    Value value{};
    moniker.getValue(value);
    ProviderUtilities::setKeyProperty(objectPath, name.c_str(), value);
}

} // namespace

void ProviderUtilities::transformMonikerToObjectPath(Moniker& moniker, CMPIObjectPath** passedObjectPath) {
    NAIVE_PARAMETERS(providerUtilities, "ENTERING",
                     " moniker=" << &moniker << " passedObjectPath=" << passedObjectPath);
    CMPIObjectPath* const objectPath = *passedObjectPath;
    const unsigned int count = moniker.getKeyCount();
    for (unsigned int i = 0; i < count; ++i) {
        if (!moniker.selectKey(i)) {
            continue;
        }
        unsigned short type = 0;
        std::string name;
        moniker.getType(type);
        moniker.getName(name);
        if (type == 0) {
            setKey<unsigned char>(objectPath, name, moniker);
        } else if (type == 1) {
            setKey<unsigned short>(objectPath, name, moniker);
        } else if (type == 2) {
            setKey<unsigned int>(objectPath, name, moniker);
        } else if (type == 3) {
            setKey<unsigned long long>(objectPath, name, moniker);
        } else if (type == 4) {
            setKey<std::string>(objectPath, name, moniker);
        } else {
            throw TK::FrameworkException("Moniker Component Type Has Not Been Accounted.");
        }
    }
    NAIVE_PARAMETERS(providerUtilities, "EXITING",
                     " moniker=" << &moniker << " passedObjectPath=" << passedObjectPath);
}

// Class registry

namespace {

unsigned short compareAll(const char* name, std::size_t first, std::size_t last) {
    for (std::size_t i = first; i < last; ++i) {
        if (ProviderUtilities::textEqual(name, TK::classTable[i].name)) {
            return TK::classTable[i].id;
        }
    }
    return 255;
}

} // namespace

unsigned short ProviderUtilities::getClassId(const char* name) {
    if (name == nullptr) {
        return 0;
    }
    const unsigned short id = compareAll(name, 0, TK::classCount - TK::extensionCount);
    return id != 255 ? id : extend_getClassId(name);
}

unsigned short ProviderUtilities::extend_getClassId(const char* name) {
    if (name == nullptr) {
        return 0;
    }
    return compareAll(name, TK::classCount - TK::extensionCount, TK::classCount);
}

unsigned short ProviderUtilities::getClassId(const CMPIObjectPath* objectPath) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIString* const name = CMGetClassName(objectPath, &status);
    if (status.rc != CMPI_RC_OK) {
        return 0;
    }
    const char* const classname = CMGetCharsPtr(name, &status);
    NAIVE_VARIABLE(providerUtilities, "classname", classname);
    return getClassId(classname);
}

bool ProviderUtilities::textEqual(const char* a, const char* b) {
    return a != nullptr && b != nullptr && strcasecmp(a, b) == 0;
}

CMPIObjectPath* ProviderUtilities::createObjectPath(const CMPIBroker* broker, const char* classname,
                                                    std::string nameSpace) {
    NAIVE_PARAMETERS(providerUtilities, "ENTERING",
                     " broker=" << broker << " classname=" << classname << " nameSpace=" << nameSpace);
    NAIVE_VARIABLE(providerUtilities, "classname", classname);
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIObjectPath* objectPath = CMNewObjectPath(broker, nameSpace.c_str(), classname, &status);
    if (status.rc != CMPI_RC_OK) {
        objectPath = nullptr;
    } else {
        CMSetNameSpace(objectPath, nameSpace.c_str());
        NAIVE_VARIABLE(providerUtilities, "\"ProviderUtilities::createObjectPath\"",
                       "ProviderUtilities::createObjectPath");
    }
    NAIVE_PARAMETERS(providerUtilities, "EXITING",
                     " broker=" << broker << " classname=" << classname << " nameSpace=" << nameSpace);
    return objectPath;
}

// Dates

namespace {

long fieldOf(const std::string& text, std::size_t position, std::size_t width) {
    std::array<char, 7> buffer{};
    text.copy(buffer.data(), width, position);
    return std::strtol(buffer.data(), nullptr, 10);
}

std::string fieldText(unsigned int number, std::size_t width) {
    std::array<char, 16> buffer{};
    static_cast<void>(std::snprintf(buffer.data(), buffer.size(), "%u", number));
    const std::string digits = Utils::stripSpaces(buffer.data());
    return digits.size() < width ? Utils::addZero(static_cast<unsigned char>(width - digits.size())) + digits
                                 : digits;
}

} // namespace

TK::DateTime Utils::convertStringToDateTime(std::string text) {
    NAIVE_ENTERING(utils);
    TK::DateTime date;
    const auto year = static_cast<unsigned short>(fieldOf(text, 0, 4));
    date.setYear(year == 0 ? static_cast<unsigned short>(1970) : year);
    const auto month = static_cast<unsigned char>(fieldOf(text, 4, 2));
    date.setMonth(month == 0 ? static_cast<unsigned char>(1) : month);
    const auto day = static_cast<unsigned char>(fieldOf(text, 6, 2));
    date.setDay(day == 0 ? static_cast<unsigned char>(1) : day);
    date.setHour(static_cast<unsigned char>(fieldOf(text, 8, 2)));
    date.setMinute(static_cast<unsigned char>(fieldOf(text, 10, 2)));
    date.setSecond(static_cast<unsigned char>(fieldOf(text, 12, 2)));
    date.setMillisecond(static_cast<unsigned int>(fieldOf(text, 15, 6)));
    date.setOffset(static_cast<short>(fieldOf(text, 21, 4)));
    NAIVE_EXITING(utils);
    return date;
}

std::string Utils::convertCIMDateTime(TK::DateTime value) {
    NAIVE_ENTERING(utils);
    std::string result;
    result += fieldText(value.getYear() == 0 ? 1970U : value.getYear(), 4);
    result += fieldText(value.getMonth() == 0 ? 1U : value.getMonth(), 2);
    result += fieldText(value.getDay() == 0 ? 1U : value.getDay(), 2);
    result += fieldText(value.getHour(), 2);
    result += fieldText(value.getMinute(), 2);
    result += fieldText(value.getSecond(), 2);
    result += ".";
    result += fieldText(value.getMillisecond(), 6);
    const int minutes = value.getOffset() * 60;
    result += minutes < 0 ? "-" : "+";
    result += fieldText(static_cast<unsigned int>(std::abs(minutes)), 3);
    result = stripSpaces(result);
    NAIVE_EXITING(utils);
    return result;
}

std::string Utils::stripSpaces(std::string text) {
    const auto position = static_cast<unsigned short>(text.find('\0', 0));
    return text.substr(0, position);
}

std::string Utils::addZero(unsigned char count) {
    std::string zeros;
    for (unsigned char i = 0; i < count; ++i) {
        zeros += "0";
    }
    return zeros;
}

} // namespace naive
