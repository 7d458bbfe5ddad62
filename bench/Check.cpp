// Compares the library with the naive build on what the benchmark measures: results, traces and calls of the
// broker have to be the same. A difference makes the numbers of that row worthless.
#include "HVLogger.h"
#include "Rows.h"
#include "ThinBroker.h"

#include <clocale>
#include <cstdlib>
#include <iostream>
#include <regex>

namespace {

// Everything that the row under comparison did, line by line.
std::string record;

// A text without what differs between two places in the source: file and line.
std::string withoutPlace(const std::string& text) {
    static const std::regex place(R"((Naive|Rows|Moniker|ProviderUtilities|Utility|utils)\.cpp)");
    static const std::regex line(R"((Line: |at line )\d+)");
    return std::regex_replace(std::regex_replace(text, place, "FILE"), line, "$1N");
}

void recordTrace(const char* kind, const char* function, const std::string& category, int level,
                 const std::string& text) {
    record += std::string(kind) + ' ' + function + ' ' + category + ' ' + std::to_string(level) + ' ' +
              withoutPlace(text) + '\n';
}

// A value as the broker sees it: texts by their characters, the rest by its bytes.
std::string valueText(const CMPIValue* value, CMPIType type) {
    switch (type) {
    case CMPI_chars:
        return reinterpret_cast<const char*>(value);
    case CMPI_boolean:
    case CMPI_uint8:
        return std::to_string(value->uint8);
    case CMPI_uint16:
    case CMPI_sint16:
        return std::to_string(value->uint16);
    case CMPI_uint32:
        return std::to_string(value->uint32);
    default:
        return std::to_string(value->uint64);
    }
}

void recordCall(const char* call, const char* name, const CMPIValue* value, CMPIType type) {
    record +=
        std::string(call) + ' ' + name + ' ' + std::to_string(type) + ' ' + valueText(value, type) + '\n';
}

constexpr CMPIStatus ok = {CMPI_RC_OK, nullptr};

CMPIStatus addKey(const CMPIObjectPath* /*path*/, const char* key, const CMPIValue* value, CMPIType type) {
    recordCall("addKey", key, value, type);
    return ok;
}

CMPIStatus setNameSpace(const CMPIObjectPath* /*path*/, const char* nameSpace) {
    record += std::string("setNameSpace ") + nameSpace + '\n';
    return ok;
}

CMPIStatus setProperty(const CMPIInstance* /*instance*/, const char* name, const CMPIValue* value,
                       CMPIType type) {
    recordCall("setProperty", name, value, type);
    return ok;
}

CMPIStatus setElementAt(const CMPIArray* /*array*/, CMPICount index, const CMPIValue* value, CMPIType type) {
    recordCall("setElementAt", std::to_string(index).c_str(), value, type);
    return ok;
}

CMPIObjectPath* newObjectPath(const CMPIBroker* /*broker*/, const char* nameSpace, const char* name,
                              CMPIStatus* /*status*/) {
    record += std::string("newObjectPath ") + nameSpace + ' ' + name + '\n';
    return &thin::objects().path;
}

CMPIString* newString(const CMPIBroker* /*broker*/, const char* chars, CMPIStatus* /*status*/) {
    record += std::string("newString ") + chars + '\n';
    return &thin::objects().text;
}

CMPIDateTime* newDateTimeFromChars(const CMPIBroker* /*broker*/, const char* text, CMPIStatus* /*status*/) {
    record += std::string("newDateTime ") + text + '\n';
    return &thin::objects().dateTime;
}

// Puts recording functions into the thin broker's tables.
void recordCalls() {
    thin::Objects& objects = thin::objects();
    static CMPIBrokerEncFT broker = *objects.broker.eft;
    broker.newObjectPath = newObjectPath;
    broker.newString = newString;
    broker.newDateTimeFromChars = newDateTimeFromChars;
    objects.broker.eft = &broker;
    static CMPIObjectPathFT path = *objects.path.ft;
    path.addKey = addKey;
    path.setNameSpace = setNameSpace;
    objects.path.ft = &path;
    static CMPIInstanceFT instance = *objects.instance.ft;
    instance.setProperty = setProperty;
    objects.instance.ft = &instance;
    static CMPIArrayFT array = *objects.array.ft;
    array.setElementAt = setElementAt;
    objects.array.ft = &array;
}

// What one build of a row does and results in. The addresses of the builds' own objects are left out.
std::string recordOf(const std::function<std::string()>& run) {
    static const std::regex own("( moniker=| passedObjectPath=| value=)0x[0-9a-f]+");
    record.clear();
    const std::string result = run();
    return std::regex_replace(record, own, "$1ADDRESS") + "result " + result;
}

} // namespace

void HVLog::HVLogger::logLevelMessage(const char* function, const char* /*file*/, int /*line*/,
                                      const std::string& category, int level, char* /*reserved*/,
                                      int /*reserved1*/, int /*reserved2*/, const std::string& text) {
    recordTrace("log", function, category, level, text);
}

void HVLog::HVLogger::traceLevelMessage(const char* function, const char* /*file*/, int /*line*/,
                                        const std::string& category, int level, char* /*reserved*/,
                                        int /*reserved1*/, int /*reserved2*/, const std::string& text) {
    recordTrace("trace", function, category, level, text);
}

namespace {

// Compares every row that has a twin; returns whether all are the same.
bool compareAll() {
    int differences = 0;
    int compared = 0;
    for (const rows::Row& row : rows::all(0)) {
        if (!row.result) {
            continue;
        }
        row.result(); // what is made once traces once
        row.naiveResult();
        ++compared;
        const std::string library = recordOf(row.result);
        const std::string naive = recordOf(row.naiveResult);
        if (library != naive) {
            ++differences;
            std::cerr << row.name << ": the library\n" << library << "\nthe naive build\n" << naive << '\n';
        }
    }
    std::cout << compared << " rows compared, " << differences << " differ\n";
    return differences == 0 && compared != 0;
}

} // namespace

int main() {
    try {
        if (std::setlocale(LC_CTYPE, "C.UTF-8") == nullptr) {
            std::cerr << "there is no locale C.UTF-8\n";
            return EXIT_FAILURE;
        }
        recordCalls();
        return compareAll() ? EXIT_SUCCESS : EXIT_FAILURE;
    } catch (const std::exception& exception) {
        std::cerr << exception.what() << '\n';
        return EXIT_FAILURE;
    }
}
