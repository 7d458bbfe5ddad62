#include "ThinBroker.h"

#include <array>
#include <type_traits>

namespace thin {

namespace {

constexpr CMPIStatus ok = {CMPI_RC_OK, nullptr};

// What a handle stands for lies behind its hdl.
template <class Content, class Handle>
const Content& contentOf(const Handle* handle) {
    return *static_cast<const Content*>(handle->hdl);
}

struct Key {
    CMPIString name;
    CMPIData data;
};

struct PathContent {
    CMPICount count;
    CMPIData byName;
};

// Strings

// Newer CMPI headers make the characters const.
using Chars = std::invoke_result_t<decltype(CMPIStringFT::getCharPtr), const CMPIString*, CMPIStatus*>;

Chars getCharPtr(const CMPIString* string, CMPIStatus* /*status*/) {
    return static_cast<Chars>(string->hdl);
}

CMPIStringFT makeStringTable() {
    CMPIStringFT table = {};
    table.getCharPtr = getCharPtr;
    return table;
}
CMPIStringFT stringTable = makeStringTable();

CMPIString stringOf(const char* chars) {
    return {const_cast<char*>(chars), &stringTable};
}

CMPIData textData(CMPIString* string) {
    CMPIData data = {CMPI_string, CMPI_goodValue, {}};
    data.value.string = string;
    return data;
}

CMPIData numberData(CMPIType type, CMPIUint64 number) {
    CMPIData data = {type, CMPI_goodValue, {}};
    data.value.uint64 = number;
    return data;
}

CMPIString nameSpace = stringOf("root/cimv2");
CMPIString className = stringOf("OXATK_EthernetPort");
CMPIString deviceId = stringOf("eth0");

// Object paths

CMPIData numberSeven = numberData(CMPI_uint16, 7);

std::array<Key, keyKinds> keys = {{{stringOf("DeviceID"), textData(&deviceId)},
                                   {stringOf("Slot"), numberData(CMPI_uint8, 65)},
                                   {stringOf("Port"), numberData(CMPI_uint16, 5989)},
                                   {stringOf("InterfaceIndex"), numberData(CMPI_uint32, 90210)},
                                   {stringOf("PermanentAddress"), numberData(CMPI_uint64, 92301387612431)}}};

CMPIStatus addKey(const CMPIObjectPath* /*path*/, const char* /*key*/, const CMPIValue* /*value*/,
                  CMPIType /*type*/) {
    return ok;
}

CMPIData getKey(const CMPIObjectPath* path, const char* /*key*/, CMPIStatus* /*status*/) {
    return contentOf<PathContent>(path).byName;
}

CMPIData getKeyAt(const CMPIObjectPath* /*path*/, CMPICount index, CMPIString** name,
                  CMPIStatus* /*status*/) {
    Key& key = keys[index % keyKinds];
    *name = &key.name;
    return key.data;
}

CMPICount getKeyCount(const CMPIObjectPath* path, CMPIStatus* /*status*/) {
    return contentOf<PathContent>(path).count;
}

CMPIString* getNameSpace(const CMPIObjectPath* /*path*/, CMPIStatus* /*status*/) {
    return &nameSpace;
}

CMPIStatus setNameSpace(const CMPIObjectPath* /*path*/, const char* /*nameSpace*/) {
    return ok;
}

CMPIString* getClassName(const CMPIObjectPath* /*path*/, CMPIStatus* /*status*/) {
    return &className;
}

CMPIObjectPathFT makePathTable() {
    CMPIObjectPathFT table = {};
    table.setNameSpace = setNameSpace;
    table.getNameSpace = getNameSpace;
    table.getClassName = getClassName;
    table.addKey = addKey;
    table.getKey = getKey;
    table.getKeyAt = getKeyAt;
    table.getKeyCount = getKeyCount;
    return table;
}
CMPIObjectPathFT pathTable = makePathTable();

// Instances and arguments

CMPIData getProperty(const CMPIInstance* instance, const char* /*name*/, CMPIStatus* /*status*/) {
    return contentOf<CMPIData>(instance);
}

CMPIStatus setProperty(const CMPIInstance* /*instance*/, const char* /*name*/, const CMPIValue* /*value*/,
                       CMPIType /*type*/) {
    return ok;
}

CMPIInstanceFT makeInstanceTable() {
    CMPIInstanceFT table = {};
    table.getProperty = getProperty;
    table.setProperty = setProperty;
    return table;
}
CMPIInstanceFT instanceTable = makeInstanceTable();

CMPIData getArg(const CMPIArgs* args, const char* /*name*/, CMPIStatus* /*status*/) {
    return contentOf<CMPIData>(args);
}

CMPIArgsFT makeArgsTable() {
    CMPIArgsFT table = {};
    table.getArg = getArg;
    return table;
}
CMPIArgsFT argsTable = makeArgsTable();

// Arrays and dates

CMPIStatus setElementAt(const CMPIArray* /*array*/, CMPICount /*index*/, const CMPIValue* /*value*/,
                        CMPIType /*type*/) {
    return ok;
}

CMPICount getSize(const CMPIArray* /*array*/, CMPIStatus* /*status*/) {
    return arraySize;
}

CMPIData getElementAt(const CMPIArray* array, CMPICount /*index*/, CMPIStatus* /*status*/) {
    return contentOf<CMPIData>(array);
}

CMPIArrayFT makeArrayTable() {
    CMPIArrayFT table = {};
    table.getSize = getSize;
    table.getElementAt = getElementAt;
    table.setElementAt = setElementAt;
    return table;
}
CMPIArrayFT arrayTable = makeArrayTable();

CMPIString dateText = stringOf("20260329013007.000250+120");

CMPIString* getStringFormat(const CMPIDateTime* /*dateTime*/, CMPIStatus* /*status*/) {
    return &dateText;
}

CMPIDateTimeFT makeDateTimeTable() {
    CMPIDateTimeFT table = {};
    table.getStringFormat = getStringFormat;
    return table;
}
CMPIDateTimeFT dateTimeTable = makeDateTimeTable();

// Results

CMPIStatus returnInstance(const CMPIResult* /*result*/, const CMPIInstance* /*instance*/) {
    return ok;
}

CMPIStatus returnDone(const CMPIResult* /*result*/) {
    return ok;
}

CMPIResultFT makeResultTable() {
    CMPIResultFT table = {};
    table.returnInstance = returnInstance;
    table.returnDone = returnDone;
    return table;
}
CMPIResultFT resultTable = makeResultTable();

// The broker

CMPIInstance* newInstance(const CMPIBroker* /*broker*/, const CMPIObjectPath* /*path*/,
                          CMPIStatus* /*status*/) {
    return &objects().instance;
}

CMPIObjectPath* newObjectPath(const CMPIBroker* /*broker*/, const char* /*nameSpace*/, const char* /*name*/,
                              CMPIStatus* /*status*/) {
    return &objects().path;
}

CMPIString* newString(const CMPIBroker* /*broker*/, const char* /*chars*/, CMPIStatus* /*status*/) {
    return &objects().text;
}

CMPIArray* newArray(const CMPIBroker* /*broker*/, CMPICount /*size*/, CMPIType /*type*/,
                    CMPIStatus* /*status*/) {
    return &objects().array;
}

CMPIDateTime* newDateTimeFromChars(const CMPIBroker* /*broker*/, const char* /*text*/,
                                   CMPIStatus* /*status*/) {
    return &objects().dateTime;
}

CMPIBrokerEncFT makeBrokerTable() {
    CMPIBrokerEncFT table = {};
    table.newInstance = newInstance;
    table.newObjectPath = newObjectPath;
    table.newString = newString;
    table.newArray = newArray;
    table.newDateTimeFromChars = newDateTimeFromChars;
    return table;
}
CMPIBrokerEncFT brokerTable = makeBrokerTable();

PathContent fiveKeys = {keyKinds, textData(&deviceId)};
PathContent manyKeys = {65535, textData(&deviceId)};
CMPIData text = textData(&deviceId);

CMPIArray numbersArray = {&numberSeven, &arrayTable};
CMPIArray textsArray = {&text, &arrayTable};

CMPIData arrayData(CMPIType elementType, CMPIArray* array) {
    CMPIData data = {static_cast<CMPIType>(elementType | CMPI_ARRAY), CMPI_goodValue, {}};
    data.value.array = array;
    return data;
}
CMPIData numbers = arrayData(CMPI_uint16, &numbersArray);
CMPIData texts = arrayData(CMPI_string, &textsArray);

CMPIDateTime someDate = {nullptr, &dateTimeTable};

CMPIData dateData(CMPIDateTime* dateTime) {
    CMPIData data = {CMPI_dateTime, CMPI_goodValue, {}};
    data.value.dateTime = dateTime;
    return data;
}
CMPIData date = dateData(&someDate);

} // namespace

Objects& objects() {
    static Objects all = {{nullptr, nullptr, &brokerTable, nullptr, nullptr},
                          {&fiveKeys, &pathTable},
                          {&manyKeys, &pathTable},
                          {&numberSeven, &instanceTable},
                          {&text, &instanceTable},
                          {&date, &instanceTable},
                          {&numbers, &instanceTable},
                          {&texts, &instanceTable},
                          {&numberSeven, &argsTable},
                          {&text, &argsTable},
                          className,
                          {nullptr, &arrayTable},
                          {nullptr, &dateTimeTable},
                          {nullptr, &resultTable}};
    return all;
}

} // namespace thin
