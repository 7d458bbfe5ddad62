// What tells a CIM server about the example provider: its library, its classes' MOF and both forms of its
// registration say the same.
#include "EmbeddedBroker.h"

#include <dlfcn.h>
#include <fstream>
#include <gtest/gtest.h>
#include <iterator>
#include <map>
#include <regex>
#include <set>
#include <sstream>
#include <string>
#include <vector>

using Types = std::set<std::string>;

namespace {

const char* const provider = "OXAHostProvider";
const char* const nameSpace = "root/cimv2";

std::string contentOf(const std::string& file) {
    std::ifstream stream(file);
    EXPECT_TRUE(stream) << file;
    std::ostringstream content;
    content << stream.rdbuf();
    return content.str();
}

// What a pattern's groups match, for each match.
std::vector<std::smatch> matches(const std::string& text, const std::string& pattern) {
    const std::regex expression(pattern);
    return {std::sregex_iterator(text.begin(), text.end(), expression), std::sregex_iterator()};
}

std::set<std::string> words(const std::string& text) {
    std::istringstream stream(text);
    return {std::istream_iterator<std::string>(stream), std::istream_iterator<std::string>()};
}

// The classes and their types in the INI form; each section has to be whole.
std::map<std::string, Types> registeredInSections(const std::string& text) {
    std::map<std::string, Types> classes;
    for (const std::smatch& section : matches(text, R"(\[(\w+)\]\n((?:[ \t]+.*\n)*))")) {
        std::map<std::string, std::string> lines;
        const std::string body = section[2];
        for (const std::smatch& line : matches(body, R"(\s*(\w+): (.*)\n)")) {
            EXPECT_TRUE(lines.emplace(line[1], line[2]).second) << line[0];
        }
        EXPECT_EQ(lines["provider"], provider) << section[0];
        EXPECT_EQ("lib" + lines["location"] + ".so", LIBRARY_NAME) << section[0];
        EXPECT_EQ(lines["namespace"], nameSpace) << section[0];
        EXPECT_EQ(lines.count("unload"), 1U) << section[0];
        EXPECT_TRUE(classes.emplace(section[1], words(lines["type"])).second) << section[1];
    }
    return classes;
}

// The same in the form of instances.
std::map<std::string, Types> registeredInInstances(const std::string& text) {
    const std::map<std::string, std::string> types = {
        {"2", "instance"}, {"3", "association"}, {"5", "method"}};
    std::map<std::string, Types> classes;
    std::map<std::string, std::string> module;
    std::set<std::string> ids;
    for (const std::smatch& instance : matches(text, R"(instance of (\w+) \{\n((?:    .*\n)*)\};)")) {
        std::map<std::string, std::string> values;
        const std::string body = instance[2];
        for (const std::smatch& line : matches(body, R"re( (\w+) = \{?"?([^"}\n]*)"?\}?;\n)re")) {
            values[line[1]] = line[2];
        }
        if (instance[1] == "PG_ProviderModule") {
            module = values;
            EXPECT_EQ("lib" + values["Location"] + ".so", LIBRARY_NAME);
        } else if (instance[1] == "PG_Provider") {
            EXPECT_EQ(values["ProviderModuleName"], module["Name"]);
            EXPECT_EQ(values["Name"], provider);
        } else if (instance[1] == "PG_ProviderCapabilities") {
            EXPECT_EQ(values["ProviderModuleName"], module["Name"]) << instance[0];
            EXPECT_EQ(values["ProviderName"], provider) << instance[0];
            EXPECT_EQ(values["Namespaces"], nameSpace) << instance[0];
            EXPECT_TRUE(ids.insert(values["CapabilityID"]).second) << instance[0];
            Types& known = classes[values["ClassName"]];
            const std::string numbers = values["ProviderType"];
            for (const std::smatch& number : matches(numbers, "\\d+")) {
                known.insert(types.at(number[0]));
            }
        } else {
            ADD_FAILURE() << instance[1];
        }
    }
    return classes;
}

std::map<std::string, Types> declared(const oxahv::EmbeddedBroker& broker, const std::string& mof) {
    std::map<std::string, Types> classes;
    for (const std::smatch& match : matches(mof, R"((?:^|\n)class (\w+))")) {
        const std::string name = match[1];
        const std::string own = mof.substr(static_cast<std::size_t>(match.position(1)));
        Types& types = classes[name] = {"instance"};
        if (broker.isAssociation(name)) {
            types.insert("association");
        }
        // Those that it declares itself: the provider implements no inherited one.
        if (std::regex_search(own.substr(0, own.find("\n};")), std::regex(R"(\n    uint32 \w+\()"))) {
            types.insert("method");
        }
    }
    return classes;
}

TEST(TheRegistration, AgreesWithTheMofAndTheLibrary) {
    oxahv::EmbeddedBroker broker;
    broker.compileMof(MOF_FOLDER "/CIMSuperclasses.mof");
    broker.compileMof(MOF_FOLDER "/OXAHost.mof");
    const auto classes = declared(broker, contentOf(MOF_FOLDER "/OXAHost.mof"));
    EXPECT_EQ(registeredInSections(contentOf(REGISTRATION_FOLDER "/OXAHost.reg")), classes);
    EXPECT_EQ(registeredInInstances(contentOf(REGISTRATION_FOLDER "/OXAHostRegistration.mof")), classes);

    broker.load(LIBRARY, provider);
    void* const library = ::dlopen(LIBRARY, RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(library, nullptr) << ::dlerror();
    const std::map<std::string, std::string> factories = {{"instance", "_Create_InstanceMI"},
                                                          {"association", "_Create_AssociationMI"},
                                                          {"method", "_Create_MethodMI"}};
    Types used;
    for (const auto& [name, types] : classes) {
        used.insert(types.begin(), types.end());
        oxahv::Request request(broker);
        EXPECT_TRUE(request.enumerateInstanceNames(request.objectPath(nameSpace, name)).ok()) << name;
    }
    for (const auto& [type, ending] : factories) {
        EXPECT_EQ(::dlsym(library, (provider + ending).c_str()) != nullptr, used.count(type) == 1) << type;
    }
    ::dlclose(library);
    oxahv::Request request(broker);
    const CMPIObjectPath* const unregistered = request.objectPath(nameSpace, "CIM_ComputerSystem");
    EXPECT_EQ(request.enumerateInstanceNames(unregistered).code, CMPI_RC_ERR_INVALID_CLASS);
}

} // namespace
