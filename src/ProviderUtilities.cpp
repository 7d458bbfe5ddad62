#include "ProviderUtilities.h"

#include "ClassTable.h"
#include "CmpiCalls.h"
#include "Trace.h"

#include <algorithm>
#include <cstddef>
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
    return !cmpi::failed(status) && !cmpi::isNull(data);
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
    CMPIData data;
    if (!read(objectPath, name, data)) {
        return false;
    }
    const char* const chars = cmpi::readChars(data.value.string);
    if (chars == nullptr) {
        return false;
    }
    out = chars;
    return true;
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

// The id of the row with that name, from row `first` up to `last`; the unknown id when there is none.
unsigned short findClass(const char* name, std::size_t first, std::size_t last) {
    for (std::size_t row = first; row < last; ++row) {
        if (ProviderUtilities::textEqual(name, classTable[row].name)) {
            return classTable[row].id;
        }
    }
    return unknownClassId;
}

} // namespace

unsigned short ProviderUtilities::getClassId(const char* name) {
    if (name == nullptr) {
        return noClassId;
    }
    const unsigned short id = findClass(name, 0, mainCount);
    return id != unknownClassId ? id : extend_getClassId(name);
}

unsigned short ProviderUtilities::extend_getClassId(const char* name) {
    return name != nullptr ? findClass(name, mainCount, classCount) : noClassId;
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
