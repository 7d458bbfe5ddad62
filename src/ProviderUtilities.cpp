// The operations of TK::ProviderUtilities, in the order of their header, and every trace point of theirs:
// traces name this file. Steps that do not trace are in Accessors.h, Arrays.h, InputScreen.h and
// ClassIndex.h.
#include "ProviderUtilities.h"

#include "Accessors.h"
#include "Arrays.h"
#include "ClassIndex.h"
#include "CmpiCalls.h"
#include "InputScreen.h"
#include "Locale.h"
#include "ResourceString.h"
#include "StringConversion.h"
#include "Trace.h"
#include "Utility.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstring>
#include <fstream>
#include <iostream>
#include <strings.h>
#include <utility>

namespace TK {

static const std::string loggerProviderUtilities("Hovara.ProviderUtilities");

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
    const Reading reading = readWideText(args, name, out);
    if (reading == Reading::inconvertible) {
        TK_TRACE_MESSAGE(loggerProviderUtilities, conversionFailed);
    }
    return reading == Reading::done;
}

bool ProviderUtilities::getProperty(const CMPIInstance* instance, const char* name, std::wstring& out) {
    const Reading reading = readWideText(instance, name, out);
    if (reading == Reading::inconvertible) {
        TK_TRACE_MESSAGE(loggerProviderUtilities, conversionFailed);
    }
    return reading == Reading::done;
}

bool ProviderUtilities::getKeyProperty(const CMPIObjectPath* objectPath, const char* name,
                                       std::wstring& out) {
    const Reading reading = readWideText(objectPath, name, out);
    if (reading == Reading::inconvertible) {
        TK_TRACE_MESSAGE(loggerProviderUtilities, conversionFailed);
    }
    return reading == Reading::done;
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
    // The address of a vector of passwords is not traced.
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

// Also yields the number of positions to walk, which counts NULL keys too. The broker is asked once for both.
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
