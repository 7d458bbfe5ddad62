#include "ProviderUtilities.h"

#include "ClassIndex.h"
#include "ClassTable.h"
#include "CmpiCalls.h"
#include "Locale.h"
#include "ResourceString.h"
#include "StringConversion.h"
#include "Trace.h"
#include "Utility.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <fstream>
#include <iostream>
#include <string_view>
#include <strings.h>
#include <utility>

namespace TK {

static const std::string loggerProviderUtilities("Hovara.ProviderUtilities");

namespace {

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

// The setters' steps, for a key of an object path or a property of an instance. The status is the broker's
// affair.
template <class Object, class T>
void set(Object* object, const char* name, T value) {
    CMPIValue record = {};
    record.*CmpiType<T>::member = value;
    cmpi::add(object, name, &record, CmpiType<T>::code);
}

// CMPI wants a text's own pointer in the place of the value's.
template <class Object>
void set(Object* object, const char* name, const char* text) {
    cmpi::add(object, name, reinterpret_cast<CMPIValue*>(const_cast<char*>(text)), CMPI_chars);
}

// The steps that all getters share: false when the broker reports an error or the value is NULL.
template <class Object>
bool read(const Object* object, const char* name, CMPIData& data) {
    CMPIStatus status;
    data = cmpi::get(object, name, status);
    if (cmpi::failed(status)) { // in one expression with the other test, success takes two jumps
        return false;
    }
    return !cmpi::isNull(data);
}

// A getter. The data's type is not compared: the member asked for is read whatever it is.
template <class Object, class T>
bool get(const Object* object, const char* name, T& out) {
    CMPIData data;
    if (!read(object, name, data)) {
        return false;
    }
    out = static_cast<T>(data.value.*CmpiType<T>::member);
    return true;
}

// The characters of a text value, null when there are none to read.
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

// The characters of a broker's string, empty when they cannot be read.
std::string charsOrNothing(const CMPIString* string, const CMPIStatus& status) {
    const char* const chars = cmpi::failed(status) ? nullptr : cmpi::readChars(string);
    return chars != nullptr ? chars : "";
}

} // namespace

// Instances and the texts of an object path

CMPIInstance* ProviderUtilities::createInstance(const CMPIBroker* broker, CMPIObjectPath* objectPath) {
    CMPIStatus status;
    CMPIInstance* const instance = cmpi::newInstance(broker, objectPath, status);
    return cmpi::failed(status) ? nullptr : instance;
}

std::string ProviderUtilities::getClassName(const CMPIObjectPath* objectPath) {
    CMPIStatus status;
    const CMPIString* const name = cmpi::getClassName(objectPath, status);
    return charsOrNothing(name, status);
}

std::string ProviderUtilities::getNamespace(const CMPIObjectPath* objectPath) {
    CMPIStatus status;
    const CMPIString* const name = cmpi::getNameSpace(objectPath, status);
    return charsOrNothing(name, status);
}

std::string ProviderUtilities::convertToString(const CMPIString* str) {
    const char* const chars = cmpi::readChars(str);
    if (chars == nullptr) {
        throw FrameworkException("String Conversion Failed !!");
    }
    return chars;
}

// Keys of an object path

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name, unsigned char value) {
    set(objectPath, name, value);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name, unsigned short value) {
    set(objectPath, name, value);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name, unsigned int value) {
    set(objectPath, name, value);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                                       unsigned long long value) {
    set(objectPath, name, value);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name, const char* value) {
    set(objectPath, name, value);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name, CMPIString* value) {
    set(objectPath, name, value);
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                                       const std::string& value) {
    set(objectPath, name, value.c_str());
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name, CMPIObjectPath* value) {
    set(objectPath, name, value);
}

// Properties of an instance

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, CMPIObjectPath* value) {
    set(instance, name, value);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned char value) {
    set(instance, name, value);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned short value) {
    set(instance, name, value);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned int value) {
    set(instance, name, value);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, unsigned long long value) {
    set(instance, name, value);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, short value) {
    set(instance, name, value);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, float value) {
    set(instance, name, value);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, double value) {
    set(instance, name, value);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, const char* value) {
    set(instance, name, value);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, CMPIString* value) {
    set(instance, name, value);
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, std::string& value) {
    set(instance, name, value.c_str());
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, bool value) {
    set(instance, name, value);
}

// Reading a key, a property or a method's argument

bool ProviderUtilities::getKeyProperty(const CMPIObjectPath* objectPath, const char* name, CMPIString** out) {
    return get(objectPath, name, *out);
}

bool ProviderUtilities::getKeyProperty(const CMPIObjectPath* objectPath, const char* name,
                                       CMPIObjectPath** out) {
    return get(objectPath, name, *out);
}

bool ProviderUtilities::getKeyProperty(const CMPIObjectPath* objectPath, const char* name, std::string& out) {
    return getText(objectPath, name, out);
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, unsigned short& out) {
    return get(instance, name, out);
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, unsigned int& out) {
    return get(instance, name, out);
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, bool& out) {
    return get(instance, name, out);
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, CMPIString** out) {
    return get(instance, name, *out);
}

bool ProviderUtilities::getProperty(const CMPIArgs* args, const char* name, unsigned short& out) {
    return get(args, name, out);
}

bool ProviderUtilities::getProperty(const CMPIArgs* args, const char* name, unsigned int& out) {
    return get(args, name, out);
}

bool ProviderUtilities::getProperty(const CMPIArgs* args, const char* name, bool& out) {
    return get(args, name, out);
}

// Text properties, keys and arguments

void ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                    std::string& value, bool isDate) {
    if (!isDate) {
        set(instance, name, value.c_str());
        return;
    }
    TK_TRACE_VARIABLE(loggerProviderUtilities, "isDate", isDate);
    TK_TRACE_VARIABLE(loggerProviderUtilities, "Date", value);
    CMPIStatus status;
    CMPIValue date = {};
    date.dateTime = cmpi::newDateTime(broker, value.c_str(), status);
    if (!cmpi::failed(status) && date.dateTime != nullptr) {
        cmpi::add(instance, name, &date, CMPI_dateTime);
    }
}

bool ProviderUtilities::getProperty(const CMPIArgs* args, const char* name, std::string& out) {
    CMPIData data;
    if (!read(args, name, data)) {
        return false;
    }
    // The characters alone decide here: some brokers report a status with a text that can be read.
    CMPIStatus status;
    const char* const chars = cmpi::getChars(data.value.string, status);
    if (chars == nullptr) {
        return false;
    }
    out = chars;
    return true;
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, std::string& out,
                                    bool isDate) {
    if (!isDate) {
        return getText(instance, name, out);
    }
    CMPIData data;
    if (!read(instance, name, data)) {
        return false;
    }
    CMPIStatus status;
    const char* const chars = cmpi::readChars(cmpi::getText(data.value.dateTime, status));
    if (chars == nullptr) {
        return false;
    }
    out = chars;
    return true;
}

// Wide texts

static const char* const conversionFailed = "Failed to convert the data to Multi byte";

bool ProviderUtilities::getProperty(const CMPIArgs* args, const char* name, std::wstring& out) {
    const char* const chars = readText(args, name);
    if (chars == nullptr) {
        return false;
    }
    std::wstring converted;
    if (!ConvertMultiByteToWideChar(chars, converted)) {
        TK_TRACE_MESSAGE(loggerProviderUtilities, conversionFailed);
        return false;
    }
    out.swap(converted);
    return true;
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, std::wstring& out) {
    const char* const chars = readText(instance, name);
    if (chars == nullptr) {
        return false;
    }
    std::wstring converted;
    if (!ConvertMultiByteToWideChar(chars, converted)) {
        TK_TRACE_MESSAGE(loggerProviderUtilities, conversionFailed);
        return false;
    }
    out.swap(converted);
    return true;
}

bool ProviderUtilities::getKeyProperty(const CMPIObjectPath* objectPath, const char* name,
                                       std::wstring& out) {
    const char* const chars = readText(objectPath, name);
    if (chars == nullptr) {
        return false;
    }
    std::wstring converted;
    if (!ConvertMultiByteToWideChar(chars, converted)) {
        TK_TRACE_MESSAGE(loggerProviderUtilities, conversionFailed);
        return false;
    }
    out.swap(converted);
    return true;
}

void ProviderUtilities::setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                                       const std::wstring& value) {
    std::string converted;
    if (!ConvertWideCharToMultiByte(value, converted)) {
        TK_TRACE_MESSAGE(loggerProviderUtilities, conversionFailed);
        return;
    }
    set(objectPath, name, converted.c_str());
}

void ProviderUtilities::setProperty(CMPIInstance* instance, const char* name, std::wstring& value) {
    std::string converted;
    if (!ConvertWideCharToMultiByte(value, converted)) {
        TK_TRACE_MESSAGE(loggerProviderUtilities, conversionFailed);
        return;
    }
    set(instance, name, converted.c_str());
}

// Array properties

namespace {

// An array on its way into a property: filled element by element, until the broker refuses one.
class ArrayFilling {
public:
    // An empty array is not made at all.
    ArrayFilling(const CMPIBroker* broker, std::size_t size, CMPIType elementType)
        : broker_(broker), size_(static_cast<CMPICount>(size)), elementType_(elementType) {
        if (size_ != 0) {
            CMPIStatus status;
            CMPIArray* const array = cmpi::newArray(broker, size_, elementType, status);
            array_ = cmpi::failed(status) ? nullptr : array;
        }
    }

    // Whether there is an element to put next, and where.
    bool wantsMore() const { return array_ != nullptr && next_ < size_ && !refused_; }
    CMPICount next() const { return next_; }

    template <class Number>
    void put(Number number) {
        CMPIValue value = {};
        value.*CmpiType<Number>::member = number;
        putValue(value);
    }

    // A string that the broker does not make ends the filling like an element that it does not take.
    CMPIString* newString(const std::string& text) {
        CMPIStatus status;
        CMPIString* const string = cmpi::newString(broker_, text.c_str(), status);
        return cmpi::failed(status) ? nullptr : string;
    }
    void put(CMPIString* string) {
        refused_ = string == nullptr;
        if (!refused_) {
            CMPIValue value = {};
            value.string = string;
            putValue(value);
        }
    }
    void put(const std::string& text) { put(newString(text)); }

    // Sets the property, also when the filling ended early; not when there is no array.
    void finish(CMPIInstance* instance, const char* name) {
        if (array_ != nullptr) {
            CMPIValue value = {};
            value.array = array_;
            cmpi::add(instance, name, &value, static_cast<CMPIType>(elementType_ | CMPI_ARRAY));
        }
    }

private:
    void putValue(CMPIValue& value) {
        refused_ = cmpi::failed(cmpi::setElementAt(array_, next_++, &value, elementType_));
    }

    const CMPIBroker* broker_;
    CMPICount size_;
    CMPIType elementType_;
    CMPIArray* array_ = nullptr;
    CMPICount next_ = 0;
    bool refused_ = false;
};

template <class Element>
void setArray(const CMPIBroker* broker, CMPIInstance* instance, const char* name, CMPIType elementType,
              const std::vector<Element>& elements) {
    ArrayFilling filling(broker, elements.size(), elementType);
    while (filling.wantsMore()) {
        filling.put(elements[filling.next()]);
    }
    filling.finish(instance, name);
}

// Reads an array property's elements one by one; `append` gets each that the broker could read. The data
// alone says whether there is an array: the status is the broker's affair.
template <class Append>
bool getArray(const CMPIInstance* instance, const char* name, const Append& append) {
    CMPIStatus status;
    const CMPIData data = cmpi::get(instance, name, status);
    if (cmpi::isNull(data) || (data.type & CMPI_ARRAY) == 0) {
        return false;
    }
    const CMPICount count = cmpi::getCount(data.value.array, status);
    for (CMPICount i = 0; i < count; ++i) {
        const CMPIData element = cmpi::getElementAt(data.value.array, i, status);
        if (!cmpi::failed(status)) {
            append(element.value);
        }
    }
    return true;
}

} // namespace

void ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                    std::vector<unsigned char>& value) {
    TK_TRACE_ENTERING_PARAMETERS(loggerProviderUtilities, " broker=" << broker << " instance=" << instance
                                                                     << " name=" << name
                                                                     << " value=" << &value);
    TK_TRACE_VARIABLE(loggerProviderUtilities, "count", value.size());
    setArray(broker, instance, name, CMPI_uint8, value);
    TK_TRACE_EXITING_PARAMETERS(loggerProviderUtilities, " broker=" << broker << " instance=" << instance
                                                                    << " name=" << name
                                                                    << " value=" << &value);
}

void ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                    std::vector<unsigned short>& value) {
    TK_TRACE_ENTERING_PARAMETERS(loggerProviderUtilities, " broker=" << broker << " instance=" << instance
                                                                     << " name=" << name
                                                                     << " value=" << &value);
    TK_TRACE_VARIABLE(loggerProviderUtilities, "count", value.size());
    setArray(broker, instance, name, CMPI_uint16, value);
    TK_TRACE_EXITING_PARAMETERS(loggerProviderUtilities, " broker=" << broker << " instance=" << instance
                                                                    << " name=" << name
                                                                    << " value=" << &value);
}

void ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                    std::vector<std::string>& value) {
    // Not even where a password lies is anybody's business.
    const bool isSecret = name != nullptr && std::strcmp(name, "UserPassword") == 0;
    if (isSecret) {
        TK_TRACE_ENTERING_PARAMETERS(loggerProviderUtilities,
                                     " broker=" << broker << " instance=" << instance << " name=" << name);
    } else {
        TK_TRACE_ENTERING_PARAMETERS(loggerProviderUtilities, " broker=" << broker << " instance=" << instance
                                                                         << " name=" << name
                                                                         << " value=" << &value);
    }
    TK_TRACE_VARIABLE(loggerProviderUtilities, "count", value.size());
    setArray(broker, instance, name, CMPI_string, value);
    if (isSecret) {
        TK_TRACE_EXITING_PARAMETERS(loggerProviderUtilities,
                                    " broker=" << broker << " instance=" << instance << " name=" << name);
    } else {
        TK_TRACE_EXITING_PARAMETERS(loggerProviderUtilities, " broker=" << broker << " instance=" << instance
                                                                        << " name=" << name
                                                                        << " value=" << &value);
    }
}

void ProviderUtilities::setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                                    std::vector<std::wstring>& value) {
    TK_TRACE_VARIABLE(loggerProviderUtilities, "count", value.size());
    ArrayFilling filling(broker, value.size(), CMPI_string);
    while (filling.wantsMore()) {
        std::string strTarget;
        CUtility::WStringToAString(value[filling.next()], strTarget); // failed: the empty text
        CMPIString* const string = filling.newString(strTarget);
        TK_TRACE_VARIABLE(loggerProviderUtilities, "strTarget", strTarget);
        filling.put(string);
    }
    filling.finish(instance, name);
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name,
                                    std::vector<unsigned short>& out) {
    return getArray(instance, name, [&out](const CMPIValue& value) { out.push_back(value.uint16); });
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name,
                                    std::vector<std::string>& out) {
    return getArray(instance, name, [&out](const CMPIValue& value) {
        const char* const chars = cmpi::readChars(value.string);
        if (chars != nullptr) {
            out.emplace_back(chars);
        }
    });
}

// Users' texts

namespace {

// What a user's text must not hold. The order matters to exemptions alone.
constexpr std::array<std::string_view, 12> denied = {"<",    "http:", "https:", "%",     "$", "\\\\",
                                                     "www.", "wap.",  "ftp:",   "sftp:", ":", "\\"};
constexpr std::array<std::wstring_view, 12> wideDenied = {
    L"<", L"http:", L"https:", L"%", L"$", L"\\\\", L"www.", L"wap.", L"ftp:", L"sftp:", L":", L"\\"};

char lowerCase(char c) {
    return static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
}

// A wide character's code; negative for some of those that are no characters.
std::int32_t codeOf(wchar_t c) {
    // NOLINTNEXTLINE(bugprone-signed-char-misuse,cert-str34-c): wchar_t is no char
    return static_cast<std::int32_t>(c);
}

// Of wide characters, those that tolower may be asked about.
wchar_t lowerCase(wchar_t c) {
    const std::int32_t code = codeOf(c);
    return code >= 0 && code <= 0xFF ? static_cast<wchar_t>(std::tolower(code)) : c;
}

// A word of the list ends with a point, behind one of two letters.
constexpr std::size_t wordLength = 4;

// Whether three characters, folded, are the letters of a word.
template <class Fold>
bool areLetters(const char* characters, Fold fold) {
    const char second = fold(characters[1]);
    const char third = fold(characters[2]);
    return fold(characters[0]) == 'w' && ((second == 'w' && third == 'w') || (second == 'a' && third == 'p'));
}

// No locale folds another character to one of these letters, so that few have to be asked of the locale.
constexpr char foldedLetter(char c) {
    return static_cast<char>(c | 0x20);
}

// Whether a word ends in a text at a position from `first` on.
bool endsWord(std::string_view text, std::size_t first) {
    for (std::size_t point = text.find('.', first); point != std::string_view::npos;
         point = text.find('.', point + 1)) {
        if (point < wordLength - 1) {
            continue;
        }
        const char* const letters = text.data() + point - (wordLength - 1);
        if (areLetters(letters, foldedLetter) && areLetters(letters, [](char c) { return lowerCase(c); })) {
            return true;
        }
    }
    return false;
}

// Whether a word may end in a block of a text, which is not the text's beginning. There is no branch in it,
// so that compilers look at many characters at once: texts of many sentences have many points, but few behind
// these letters.
constexpr std::size_t blockSize = 4096;
bool mayEndWord(const char* block) {
    char found = 0;
    for (std::size_t i = 0; i < blockSize; ++i) {
        const char before = foldedLetter(block[i - 1]);
        found = static_cast<char>(found | ((block[i] == '.') & ((before == 'w') | (before == 'p'))));
    }
    return found != 0;
}

// Whether a text holds any of the entries, found without folding it and without looking for all of them:
// every entry but the two words is one of five symbols or holds one. Only letters have a case, so that
// symbols can be looked for in the text as it is.
bool holdsDenied(std::string_view text) {
    constexpr std::string_view symbols = "<%$\\:";
    const auto holds = [text](char symbol) { return text.find(symbol) != std::string_view::npos; };
    if (std::any_of(symbols.begin(), symbols.end(), holds)) {
        return true;
    }
    std::size_t position = 1;
    for (; position + blockSize <= text.size(); position += blockSize) {
        if (mayEndWord(text.data() + position) && endsWord(text.substr(0, position + blockSize), position)) {
            return true;
        }
    }
    return endsWord(text, position);
}

// A byte for each wide character: NUL, which no entry holds, for those above U+00FF. Negative ones, which are
// no characters, would need a second comparison for each; they are looked for all together.
void makeNarrow(std::wstring_view text, char* narrow) {
    std::int32_t all = 0;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const std::int32_t code = codeOf(text[i]);
        all |= code;
        narrow[i] = static_cast<char>(code <= 0xFF ? code : 0);
    }
    if (all < 0) {
        std::transform(text.begin(), text.end(), narrow, [](wchar_t c) {
            const std::int32_t code = codeOf(c);
            return static_cast<char>(code >= 0 && code <= 0xFF ? code : 0);
        });
    }
}

// The same for wide text, block by block. Each begins with the end of the one before, where a word may have
// begun.
bool holdsDenied(std::wstring_view text) {
    std::array<char, wordLength - 1 + blockSize> block{};
    std::size_t kept = 0;
    while (!text.empty()) {
        const std::size_t size = std::min(text.size(), blockSize);
        makeNarrow(text.substr(0, size), block.data() + kept);
        const std::string_view narrow(block.data(), kept + size);
        if (holdsDenied(narrow)) {
            return true;
        }
        kept = std::min(narrow.size(), wordLength - 1);
        std::copy_n(narrow.end() - kept, kept, block.begin());
        text.remove_prefix(size);
    }
    return false;
}

template <class Char, std::size_t size>
bool isAcceptable(std::basic_string<Char>& text, const std::basic_string<Char>& exemption,
                  const std::array<std::basic_string_view<Char>, size>& entries) {
    const auto end = std::find(entries.begin(), entries.end(), exemption);
    if (end == entries.end()) {
        return !holdsDenied(std::basic_string_view<Char>(text));
    }
    std::transform(text.begin(), text.end(), text.begin(), [](Char c) { return lowerCase(c); });
    return std::none_of(entries.begin(), end, [&text](std::basic_string_view<Char> entry) {
        return text.find(entry) != std::string_view::npos;
    });
}

} // namespace

bool ProviderUtilities::ValidateInput(std::string text, std::string exemption) {
    return isAcceptable(text, exemption, denied);
}

bool ProviderUtilities::ValidateInput(std::wstring text, std::wstring exemption) {
    return isAcceptable(text, exemption, wideDenied);
}

bool ProviderUtilities::ConvertWideCharToMultiByte(std::wstring in, std::string& out) {
    if (in.empty()) {
        out.clear();
        return true;
    }
    return CUtility::WStringToAString(std::move(in), out);
}

bool ProviderUtilities::ConvertMultiByteToWideChar(std::string in, std::wstring& out) {
    if (in.empty()) {
        out.clear();
        return true;
    }
    return CUtility::AStringToWString(std::move(in), out);
}

// The host

bool ProviderUtilities::isKVM() {
    const std::ifstream device("/dev/kvm");
    if (!device) {
        std::cout << "File cannot be found.";
        return false;
    }
    const std::ifstream server("/opt/oxa/vex/bin/cimserver");
    return !server;
}

const char* ProviderUtilities::getNLSText(std::wstring key) {
    constexpr unsigned long providersTexts = 2;
    const std::string language = Locale::getLanguageId();
    const std::wstring library = Locale::getResourceLibrary(providersTexts, language);
    const std::wstring text = ResourceString(library, key);
    // A few results stay valid, so that several can stand in one expression.
    static thread_local std::array<std::string, 8> results;
    static thread_local std::size_t latest = 0;
    std::string result = make_string(text);
    latest = (latest + 1) % results.size();
    results[latest].swap(result);
    return results[latest].c_str();
}

// Object paths and monikers

namespace {

// Whether the key at a position has a value to read; its data and its name.
bool readKeyAt(const CMPIObjectPath* objectPath, unsigned short position, CMPIString*& name, CMPIData& data) {
    CMPIStatus status;
    data = cmpi::getKeyAt(objectPath, position, name, status);
    return !cmpi::failed(status) && !cmpi::isNull(data);
}

void addKey(Moniker& moniker, std::string&& name, const CMPIData& data) {
    switch (data.type) {
    case CMPI_uint8:
        moniker.addKey(std::move(name), data.value.uint8);
        break;
    case CMPI_uint16:
        moniker.addKey(std::move(name), data.value.uint16);
        break;
    case CMPI_uint32:
        moniker.addKey(std::move(name), data.value.uint32);
        break;
    case CMPI_uint64:
        moniker.addKey(std::move(name), data.value.uint64);
        break;
    case CMPI_string:
        moniker.addKey(std::move(name), ProviderUtilities::convertToString(data.value.string));
        break;
    default:
        throw FrameworkException("Moniker component for data type not available.");
    }
}

template <class T>
void setKey(CMPIObjectPath* objectPath, const std::string& name, const Moniker& moniker) {
    T value{};
    moniker.getValue(value);
    ProviderUtilities::setKeyProperty(objectPath, name.c_str(), value);
}

// Adds the moniker's selected component to an object path.
void setSelectedKey(CMPIObjectPath* objectPath, const Moniker& moniker) {
    unsigned short type = 0;
    moniker.getType(type);
    std::string name;
    moniker.getName(name);
    switch (type) {
    case Moniker::COMPONENT_UINT8:
        setKey<unsigned char>(objectPath, name, moniker);
        break;
    case Moniker::COMPONENT_UINT16:
        setKey<unsigned short>(objectPath, name, moniker);
        break;
    case Moniker::COMPONENT_UINT32:
        setKey<unsigned int>(objectPath, name, moniker);
        break;
    case Moniker::COMPONENT_UINT64:
        setKey<unsigned long long>(objectPath, name, moniker);
        break;
    case Moniker::COMPONENT_STRING:
        setKey<std::string>(objectPath, name, moniker);
        break;
    default:
        throw FrameworkException("Moniker Component Type Has Not Been Accounted.");
    }
}

} // namespace

unsigned short ProviderUtilities::getKeyCount(const CMPIObjectPath* objectPath) {
    unsigned short keyCount = 0;
    return getKeyCount(objectPath, keyCount);
}

// The operation's work, which also tells how many positions there are to walk: a NULL key counts as none, yet
// takes a position. The broker is asked once for both.
unsigned short ProviderUtilities::getKeyCount(const CMPIObjectPath* objectPath, unsigned short& keyCount) {
    CMPIStatus status;
    keyCount = static_cast<unsigned short>(cmpi::getKeyCount(objectPath, status));
    TK_TRACE_VARIABLE(loggerProviderUtilities, "keyCount", keyCount);
    unsigned short count = 0;
    for (unsigned short position = 0; position < keyCount; ++position) {
        CMPIString* name = nullptr;
        CMPIData data;
        if (readKeyAt(objectPath, position, name, data)) {
            ++count;
        }
    }
    if (cmpi::failed(status)) {
        throw FrameworkException("Could not Extract Keys from Object Path.");
    }
    TK_TRACE_VARIABLE(loggerProviderUtilities, "count", count);
    return count;
}

void ProviderUtilities::transformObjectPathToMoniker(const CMPIObjectPath* objectPath, Moniker& moniker) {
    TK_TRACE_ENTERING_PARAMETERS(loggerProviderUtilities,
                                 " objectPath=" << objectPath << " moniker=" << &moniker);
    unsigned short keyCount = 0;
    if (getKeyCount(objectPath, keyCount) != 0) {
        for (unsigned short position = 0; position < keyCount; ++position) {
            CMPIString* name = nullptr;
            CMPIData data;
            if (readKeyAt(objectPath, position, name, data)) {
                addKey(moniker, convertToString(name), data);
            }
        }
    }
    TK_TRACE_EXITING_PARAMETERS(loggerProviderUtilities,
                                " objectPath=" << objectPath << " moniker=" << &moniker);
}

void ProviderUtilities::transformMonikerToObjectPath(Moniker& moniker, CMPIObjectPath** passedObjectPath) {
    TK_TRACE_ENTERING_PARAMETERS(loggerProviderUtilities,
                                 " moniker=" << &moniker << " passedObjectPath=" << passedObjectPath);
    CMPIObjectPath* const objectPath = *passedObjectPath;
    const unsigned int count = moniker.getKeyCount();
    for (unsigned int position = 0; position < count; ++position) {
        if (moniker.selectKey(position)) {
            setSelectedKey(objectPath, moniker);
        }
    }
    TK_TRACE_EXITING_PARAMETERS(loggerProviderUtilities,
                                " moniker=" << &moniker << " passedObjectPath=" << passedObjectPath);
}

// Class registry

namespace {

constexpr unsigned short noClassId = 0;
constexpr unsigned short unknownClassId = 255;

constexpr std::size_t mainCount = classCount - extensionCount;
static_assert(classTable[mainCount - 1].id < 180 && classTable[mainCount].id == 180,
              "the extension begins at 180");

// The row with that name, by comparing all of them; classCount when there is none.
std::size_t searchRow(const char* name) {
    std::size_t row = 0;
    while (row < classCount && strcasecmp(name, classTable[row].name) != 0) {
        ++row;
    }
    return row;
}

bool isAscii(const char* name, std::size_t length) {
    unsigned char bits = 0;
    for (std::size_t i = 0; i < length; ++i) {
        bits |= static_cast<unsigned char>(name[i]);
    }
    return bits < 0x80;
}

// The row with that name, as searchRow finds it. The index folds ASCII alone, while strcasecmp folds as the
// locale says: in a Turkish one a byte above 0x7F stands for an i. So the row of the index is confirmed by
// strcasecmp, and a name with such bytes that is not confirmed is searched for.
std::size_t findRow(const char* name) {
    const std::size_t length = std::strlen(name);
    if (length < shortestClassName || length > longestClassName) {
        return classCount;
    }
    const std::size_t row = classIndex.rowOf(name, length);
    if (row != classCount && strcasecmp(name, classTable[row].name) == 0) {
        return row;
    }
    return isAscii(name, length) ? classCount : searchRow(name);
}

} // namespace

unsigned short ProviderUtilities::getClassId(const char* name) {
    if (name == nullptr) {
        return noClassId;
    }
    const std::size_t row = findRow(name);
    return row < classCount ? classTable[row].id : unknownClassId;
}

unsigned short ProviderUtilities::extend_getClassId(const char* name) {
    if (name == nullptr) {
        return noClassId;
    }
    const std::size_t row = findRow(name);
    return row < classCount && row >= mainCount ? classTable[row].id : unknownClassId;
}

unsigned short ProviderUtilities::getClassId(const CMPIObjectPath* objectPath) {
    if (objectPath == nullptr) {
        return noClassId;
    }
    CMPIStatus status;
    const CMPIString* const name = cmpi::getClassName(objectPath, status);
    if (cmpi::failed(status)) {
        return noClassId;
    }
    const char* const classname = cmpi::getChars(name, status);
    TK_TRACE_VARIABLE(loggerProviderUtilities, "classname", classname);
    return getClassId(classname);
}

bool ProviderUtilities::areClassesRelated(const CMPIBroker* broker, const std::string& nameSpace,
                                          std::vector<std::string>& candidates, const char* ancestor) {
    return std::any_of(candidates.begin(), candidates.end(), [&](const std::string& candidate) {
        return areClassesRelated(broker, nameSpace, ancestor, candidate.c_str());
    });
}

bool ProviderUtilities::areClassesRelated(const CMPIBroker* broker, const std::string& nameSpace,
                                          const char* ancestor, const char* candidate) {
    const CMPIObjectPath* const path = createObjectPath(broker, candidate, nameSpace);
    if (path == nullptr) {
        return false;
    }
    CMPIStatus status;
    const bool isA = cmpi::classPathIsA(broker, path, ancestor, status);
    return isA && !cmpi::failed(status);
}

bool ProviderUtilities::textEqual(const char* a, const char* b) {
    return a != nullptr && b != nullptr && strcasecmp(a, b) == 0;
}

// Object path creation

CMPIObjectPath* ProviderUtilities::createObjectPath(const CMPIBroker* broker, const char* classname,
                                                    std::string nameSpace) {
    TK_TRACE_ENTERING_PARAMETERS(loggerProviderUtilities, " broker=" << broker << " classname=" << classname
                                                                     << " nameSpace=" << nameSpace);
    TK_TRACE_VARIABLE(loggerProviderUtilities, "classname", classname);
    CMPIStatus status;
    CMPIObjectPath* objectPath = cmpi::newObjectPath(broker, nameSpace.c_str(), classname, status);
    if (cmpi::failed(status)) {
        objectPath = nullptr;
    }
    if (objectPath != nullptr) {
        // Some brokers take the namespace of a new path from elsewhere.
        cmpi::setNameSpace(objectPath, nameSpace.c_str());
        TK_TRACE_VARIABLE(loggerProviderUtilities, "\"ProviderUtilities::createObjectPath\"",
                          "ProviderUtilities::createObjectPath");
    }
    TK_TRACE_EXITING_PARAMETERS(loggerProviderUtilities, " broker=" << broker << " classname=" << classname
                                                                    << " nameSpace=" << nameSpace);
    return objectPath;
}

} // namespace TK
