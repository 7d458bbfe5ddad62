// What tells a CIM server about the example provider: its library, its classes' MOF and both forms of its
// registration say the same.
#include "EmbeddedBroker.h"

#include <fstream>
#include <gtest/gtest.h>
#include <sstream>
#include <string>

namespace {

const std::string provider = "OXAHostProvider";
const char* const nameSpace = "root/cimv2";

// The lines of a file that begin so, without comments and empty ones.
std::string linesOf(const std::string& file, const std::string& beginning = "") {
    std::ifstream stream(file);
    EXPECT_TRUE(stream) << file;
    std::string lines;
    for (std::string line; std::getline(stream, line);) {
        const bool isLeftOut = line.empty() || line.rfind('#', 0) == 0 || line.rfind("//", 0) == 0;
        lines += !isLeftOut && line.rfind(beginning, 0) == 0 ? line + '\n' : "";
    }
    return lines;
}

} // namespace

TEST(RegistrationTest, AgreesWithMofAndLibrary) {
    ASSERT_EQ("lib" + provider + ".so", LIBRARY_NAME);
    oxahv::EmbeddedBroker broker;
    broker.compileMof(MOF_FOLDER "/CIMSuperclasses.mof");
    broker.compileMof(MOF_FOLDER "/OXAHost.mof");
    broker.load(LIBRARY, provider);
    oxahv::Request request(broker);
    std::string sections;
    std::string capabilities;
    unsigned int count = 0;
    std::istringstream classes(linesOf(MOF_FOLDER "/OXAHost.mof", "class "));
    for (std::string keyword, name, colon, superclass, brace;
         classes >> keyword >> name >> colon >> superclass >> brace;) {
        const bool isAssociation = broker.isAssociation(name);
        const bool hasMethods = broker.methodsOf(name).size() > broker.methodsOf(superclass).size();
        sections += '[' + name + "]\n    provider: " + provider + "\n    location: " + provider +
                    "\n    type: instance" + (isAssociation ? " association" : "") +
                    (hasMethods ? " method" : "") + "\n    unload: never\n    namespace: " + nameSpace + '\n';
        capabilities += "instance of PG_ProviderCapabilities {\n    ProviderModuleName = \"" + provider +
                        "Module\";\n    ProviderName = \"" + provider + "\";\n    CapabilityID = \"" +
                        std::to_string(++count) + "\";\n    ClassName = \"" + name +
                        "\";\n    Namespaces = {\"" + nameSpace + "\"};\n    ProviderType = {2" +
                        (isAssociation ? ", 3" : "") + (hasMethods ? ", 5" : "") + "};\n};\n";
        EXPECT_TRUE(request.enumerateInstanceNames(request.objectPath(nameSpace, name)).ok()) << name;
    }
    EXPECT_EQ(linesOf(REGISTRATION_FOLDER "/OXAHost.reg"), sections);
    const std::string instances = linesOf(REGISTRATION_FOLDER "/OXAHostRegistration.mof");
    const std::size_t begin = instances.find("instance of PG_ProviderCapabilities");
    EXPECT_EQ(instances.substr(begin), capabilities);
    const std::string module = instances.substr(0, begin);
    for (const char* const line :
         {"{\n    Name = \"OXAHostProviderModule\";", "Location = \"OXAHostProvider\";",
          "ProviderModuleName = \"OXAHostProviderModule\";\n    Name = \"OXAHostProvider\";"}) {
        EXPECT_NE(module.find(line), std::string::npos) << line;
    }
}
