// The library's measured operations once more, written down as they are described and no cleverer: string
// streams for numbers, a chain of comparisons for names, a copy wherever a copy is allowed, every trace
// formatted by printf into a zeroed buffer. Neither tuned nor slowed down. It is the measure of what the
// library's own ways gain, and its results and traces are compared with the library's.
//
// Threads as in the library: nothing is shared.
#pragma once

#include "ProviderUtilities.h"
#include "utils.h"

#include <string>
#include <vector>

namespace naive {

class TK_EXPORT Moniker {
public:
    unsigned int getKeyCount() const;
    bool selectKey(unsigned int index);
    void getType(unsigned short& type) const;
    void getName(std::string& name) const;
    void getValue(std::string& value) const;
    void getValue(unsigned char& value) const;
    void getValue(unsigned short& value) const;
    void getValue(unsigned int& value) const;
    void getValue(unsigned long long& value) const;
    unsigned short addKey(std::string name, const std::string& value);
    unsigned short addKey(std::string name, unsigned char value);
    unsigned short addKey(std::string name, unsigned short value);
    unsigned short addKey(std::string name, unsigned int value);
    unsigned short addKey(std::string name, unsigned long long value);

private:
    TK_HIDDEN std::string valueOf(unsigned short type) const;
    TK_HIDDEN unsigned short append(unsigned short type, const std::string& name, const std::string& value);

    struct Component {
        unsigned int type;
        std::string name;
        std::string value;
    };
    bool keySelected = false;
    unsigned int selectedKey = 0;
    std::vector<Component> keys;
};

class TK_EXPORT ProviderUtilities {
public:
    static CMPIInstance* createInstance(const CMPIBroker* broker, CMPIObjectPath* objectPath);
    static std::string getNamespace(const CMPIObjectPath* objectPath);
    static std::string convertToString(const CMPIString* string);

    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name, unsigned char value);
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name, unsigned short value);
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name, unsigned int value);
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name, unsigned long long value);
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name, const std::string& value);
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name, const std::wstring& value);
    static bool getKeyProperty(const CMPIObjectPath* objectPath, const char* name, std::wstring& out);

    static void setProperty(CMPIInstance* instance, const char* name, bool value);
    static void setProperty(CMPIInstance* instance, const char* name, unsigned char value);
    static void setProperty(CMPIInstance* instance, const char* name, unsigned short value);
    static void setProperty(CMPIInstance* instance, const char* name, unsigned int value);
    static void setProperty(CMPIInstance* instance, const char* name, unsigned long long value);
    static void setProperty(CMPIInstance* instance, const char* name, short value);
    static void setProperty(CMPIInstance* instance, const char* name, const char* value);
    static void setProperty(CMPIInstance* instance, const char* name, std::string& value);
    static void setProperty(CMPIInstance* instance, const char* name, std::wstring& value);
    static void setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            std::string& value, bool isDate);
    static void setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            std::vector<unsigned char>& value);
    static void setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            std::vector<unsigned short>& value);
    static void setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            std::vector<std::string>& value);
    static void setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            std::vector<std::wstring>& value);

    static bool getProperty(const CMPIInstance* instance, const char* name, std::wstring& out);
    static bool getProperty(const CMPIArgs* args, const char* name, std::wstring& out);

    static bool ValidateInput(std::string text, std::string exemption);
    static bool ValidateInput(std::wstring text, std::wstring exemption);
    static bool ConvertWideCharToMultiByte(std::wstring in, std::string& out);
    static bool ConvertMultiByteToWideChar(std::string in, std::wstring& out);

    static unsigned short getKeyCount(const CMPIObjectPath* objectPath);
    static void transformObjectPathToMoniker(const CMPIObjectPath* objectPath, Moniker& moniker);
    static void transformMonikerToObjectPath(Moniker& moniker, CMPIObjectPath** passedObjectPath);

    static unsigned short getClassId(const char* name);
    static unsigned short extend_getClassId(const char* name);
    static unsigned short getClassId(const CMPIObjectPath* objectPath);
    static bool textEqual(const char* a, const char* b);

    static CMPIObjectPath* createObjectPath(const CMPIBroker* broker, const char* classname,
                                            std::string nameSpace);
};

class TK_EXPORT CUtility {
public:
    static bool WStringToAString(std::wstring in, std::string& out);
    static bool AStringToWString(std::string in, std::wstring& out);
};

class TK_EXPORT Utils {
public:
    static TK::DateTime convertStringToDateTime(std::string text);
    static std::string convertCIMDateTime(TK::DateTime value);
    static std::string stripSpaces(std::string text);
    static std::string addZero(unsigned char count);
};

// One trace point of each kind.
class TK_EXPORT Trace {
public:
    static void entering(const std::string& category);
    static void message(const std::string& category, const char* text);
    static void variable(const std::string& category, const char* name, unsigned int value);
    static void variable(const std::string& category, const char* name, const char* value);
    static void parameters(const std::string& category, const CMPIBroker* broker,
                           const CMPIInstance* instance, const char* name,
                           const std::vector<unsigned short>* value);
};

} // namespace naive
