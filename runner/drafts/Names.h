// From names of CIM to names of C++.
#pragma once

#include <set>
#include <string>
#include <string_view>

namespace oxahv::runner {

// Whether the text is an identifier that a program may give to something: of ASCII letters, digits and
// underscores, no keyword, and no macro that compilers and headers of C define in small letters.
bool isIdentifier(std::string_view text);

// "DemoPort" for "Demo_Port". Its capital makes it no keyword; the headers that a provider includes define no
// such macro.
std::string structName(std::string_view name);
// "deviceID" for "DeviceID", "osType" for "OSType", "class_" for "Class".
std::string variableName(std::string_view name);

// The names of one scope. CIM names that differ may become one in C++.
class Scope {
public:
    // Names that are taken already.
    explicit Scope(std::set<std::string> taken = {}) : taken_(std::move(taken)) {}
    // The name, with underscores after it when it is taken.
    std::string add(std::string name);

private:
    std::set<std::string> taken_;
};

} // namespace oxahv::runner
