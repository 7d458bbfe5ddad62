// The command's requests.
#include "Command.h"

#include <algorithm>
#include <nlohmann/json.hpp>
#include <sstream>

namespace {

using Json = nlohmann::json;

const std::string host = "--library " HOST_PROVIDER " ";
const std::string test = "--library " TEST_PROVIDER " ";
const std::string usage = "; oxahv-provider --help shows the usage";
const std::string hostClasses = "--mof " MOF_FOLDER "/CIMSuperclasses.mof --mof " MOF_FOLDER "/OXAHost.mof ";

// The path of the instance that there is one of, as a word of a command line.
std::string pathOf(const std::string& className) {
    const std::string output = run(host + "ein " + className).output;
    return '\'' + output.substr(0, output.find('\n')) + '\'';
}

std::string unquoted(const std::string& word) {
    return word.substr(1, word.size() - 2);
}

} // namespace

TEST(TheRunner, PrintsPathsAndInstances) {
    EXPECT_EQ(run(test + "--namespace root/x ein Demo").output, "root/x:Demo\n");
    const std::string path = pathOf("OXATK_ComputerSystem");
    EXPECT_EQ(
        path.rfind("'root/cimv2:OXATK_ComputerSystem.CreationClassName=\"OXATK_ComputerSystem\",Name=\"", 0),
        0U);
    const std::string instance = run(host + "gi " + path).output;
    EXPECT_EQ(instance.rfind("instance of OXATK_ComputerSystem {\n  CreationClassName = "
                             "\"OXATK_ComputerSystem\";\n  Name = \"",
                             0),
              0U);
    EXPECT_EQ(instance, run(host + "ei OXATK_ComputerSystem").output);

    const Json json = Json::parse(run(host + "--output json ei OXATK_OperatingSystem").output);
    ASSERT_EQ(json.size(), 1U);
    EXPECT_EQ(json[0]["class"], "OXATK_OperatingSystem");
    EXPECT_EQ(json[0]["namespace"], "root/cimv2");
    EXPECT_EQ('\'' + json[0]["path"].get<std::string>() + '\'', pathOf("OXATK_OperatingSystem"));
    EXPECT_EQ(json[0]["properties"]["OSType"], 36);
    EXPECT_EQ(json[0]["properties"]["Distributed"], false);
    const Json names = Json::parse(run(host + "--output json ein OXATK_ComputerSystem").output);
    EXPECT_EQ(names[0]["properties"]["CreationClassName"], "OXATK_ComputerSystem");
}

TEST(TheRunner, ShowsTracesOnRequest) {
    EXPECT_EQ(run(host + "ein OXATK_ComputerSystem", "2>&1 >/dev/null").output, "");
    const std::string traces = run(host + "--trace ein OXATK_ComputerSystem", "2>&1 >/dev/null").output;
    EXPECT_NE(traces.find("trace 3000 OXA.HostProvider ENTERING: enumerateInstanceNames() in Answer.h"),
              std::string::npos);
    EXPECT_EQ(traces.find("log "), std::string::npos) << "each message comes twice and is shown once";
}

TEST(TheRunner, FollowsAssociations) {
    const std::string system = pathOf("OXATK_ComputerSystem");
    const std::string os = pathOf("OXATK_OperatingSystem");
    const std::string association = pathOf("OXATK_RunningOS");
    const std::pair<std::string, std::string> cases[] = {
        {"an --assoc-class OXATK_RunningOS --result-role antecedent " + system, unquoted(os) + '\n'},
        {"an --assoc-class OXATK_InstalledOS " + system, ""},
        {"an --role Antecedent " + system, ""},
        {"an --result-role Dependent " + system, ""},
        {hostClasses + "an --assoc-class CIM_Dependency " + system, unquoted(os) + '\n'},
        {hostClasses + "an " + os + " --result-class CIM_System", unquoted(system) + '\n'},
        {hostClasses + "an " + os + " --result-class CIM_LogicalDevice", ""},
        {"rn --result-class OXATK_RunningOS --role dependent " + system, unquoted(association) + '\n'},
        {"rn --role Antecedent " + system, ""},
        {"ai " + os, run(host + "gi " + system).output},
        {"ri " + os, run(host + "ei OXATK_RunningOS").output},
    };
    for (const auto& [arguments, output] : cases) {
        const Outcome outcome = run(host + arguments);
        EXPECT_EQ(outcome.output, output) << arguments;
        EXPECT_EQ(outcome.status, 0);
    }
    const Json json = Json::parse(run(host + "--output json ri " + os).output);
    EXPECT_EQ(json[0]["properties"]["Dependent"], unquoted(system));
    EXPECT_TRUE(Json::parse(run(host + hostClasses + "--output json gi " + os).output)[0]
                    .at("properties")
                    .at("Description")
                    .is_null());
}

TEST(TheRunner, CallsMethodsAsTheClassDeclaresThem) {
    const File file("class Demo {\n"
                    "  uint32 Echo([In] string Text, [In] uint8 Small, real32 Real, boolean Flag,\n"
                    "    uint16 Numbers[], datetime When, Demo ref Other, [In(false), Out] string Result);\n"
                    "};\n");
    const std::string call = test + "--mof " + file.path() + " cm Demo ";
    const std::pair<const char*, const char*> good[] = {
        {"text=5", "Text = \"5\""},
        {"Text=", "Text = \"\""},
        {"'Text=a=b \"c'", R"(Text = "a=b \"c")"},
        {R"('Text="a \"b\\"')", R"(Text = "a \"b\\")"},
        {"Numbers=1 Numbers=65535", "Numbers = {1, 65535}"},
        {"When=20260102030405.000000+060", "When = \"20260102030405.000000+060\""},
        {"Other=root/x:Demo", "Other = \"root/x:Demo\""},
    };
    for (const auto& [arguments, output] : good) {
        EXPECT_EQ(run(call + "echo " + arguments).output, std::string("ReturnValue = 1;\n") + output + ";\n");
    }
    EXPECT_EQ(run(test + "cm Demo Any A=5 B=-5 C=false D=1.5 'E=\"5\"'").output,
              "ReturnValue = 5;\nA = 5;\nB = -5;\nC = FALSE;\nD = \"1.5\";\nE = \"5\";\n");
    EXPECT_EQ(Json::parse(run(call + "Echo --output json Small=7 Real=0.1 Flag=true Numbers=8 Other=Demo "
                                     "When=20260102030405.000000+060")
                              .output),
              Json::parse(R"([{"path": "root/cimv2:Demo", "method": "Echo", "returnValue": 6,
            "parameters": {"Small": 7, "Real": 0.1, "Flag": true, "Numbers": [8], "Other": "Demo",
                           "When": "20260102030405.000000+060"}}])"));
    const std::pair<const char*, const char*> bad[] = {
        {"Other", "class Demo has no method Other; it has Echo"},
        {"Echo Text", "argument 'Text' is not name=value"},
        {"Echo =x", "argument '=x' is not name=value"},
        {"Echo Txt=x",
         "method Echo has no parameter Txt; it has Text, Small, Real, Flag, Numbers, When, Other"},
        {"Echo Result=x", "parameter Result of method Echo is an output; leave it out"},
        {"Echo Text=x text=y", "argument Text stands twice; only an array takes several values"},
        {"Echo Small=256", "argument Small: value, column 1: 256 does not fit into uint8"},
        {"Echo Numbers=1 Numbers=-1", "argument Numbers: value, column 1: -1 does not fit into uint16"},
    };
    for (const auto& [arguments, line] : bad) {
        expectFailure(call + arguments, 2, line);
    }
}

TEST(TheRunner, GivesProvidersTheirContext) {
    const File file;
    const std::string call = host + hostClasses + "--context OXAHostStateFile=" + file.path() + ' ';
    const std::string setTag = call + "cm " + pathOf("OXATK_ComputerSystem") + " SetAssetTag ";
    EXPECT_EQ(run(setTag + "Tag=42").output, "ReturnValue = 0;\n");
    EXPECT_NE(run(call + "ei OXATK_AssetIDDetails").output.find("AssetTag = \"42\";"), std::string::npos);
    expectFailure(setTag, 1, "CMPI_RC_ERR_INVALID_PARAMETER: The asset tag is missing.");
}

TEST(TheRunner, ShowsProgressOnATerminalAlone) {
    const File file;
    const std::string command = RUNNER " " + test + "ein Slow >/dev/null ";
    const std::string shown = onTerminal(command + "2>" + file.path() + " & " + command + "; wait");
    EXPECT_NE(shown.find("\r4 results so far"), std::string::npos) << shown;
    EXPECT_EQ(shown.substr(shown.size() - 4), "\r\033[K") << "the line is gone at the end";
    EXPECT_EQ(std::filesystem::file_size(file.path()), 0U);
}

TEST(TheRunner, ExplainsItselfOnAScreen) {
    for (const std::string verb : {"", "ein", "ei", "gi", "an", "ai", "rn", "ri", "cm", "check"}) {
        const Outcome help = run(verb + " --help");
        EXPECT_EQ(help.status, 0);
        EXPECT_NE(help.output.find("Usage: oxahv-provider " + verb), std::string::npos);
        EXPECT_LE(std::count(help.output.begin(), help.output.end(), '\n'), verb.empty() ? 40 : 24) << verb;
        std::istringstream lines(help.output);
        for (std::string line; std::getline(lines, line);) {
            EXPECT_LE(line.size(), 100U) << line;
        }
    }
    const Outcome version = run("--version");
    EXPECT_EQ(version.output.rfind("oxahv-provider ", 0), 0U);
}

TEST(TheRunner, TellsWhatWentWrongInOneLine) {
    const std::string port = "gi 'OXATK_EthernetPort.DeviceID=\"none\"'";
    const File noLibrary("no library");
    const File brokenMof("class Demo {\n  uint32;\n};\n");
    const struct {
        int status; // 1: the provider's answer, 2: the user's mistake
        std::string arguments;
        std::string line;
    } cases[] = {
        {1, host + port, "CMPI_RC_ERR_NOT_FOUND: there is no such instance of class OXATK_EthernetPort"},
        {1, host + "ei CIM_Thing", "CMPI_RC_ERR_INVALID_CLASS: this provider does not serve class CIM_Thing"},
        {1, host + "ei '\033[mÄ\n\x7f\u009b\xff'", // a terminal gets no control characters of others
         "CMPI_RC_ERR_INVALID_CLASS: this provider does not serve class ?[mÄ????"},
        {1, host + hostClasses + "cm Else Echo", "CMPI_RC_ERR_INVALID_CLASS: class Else is not declared"},
        {1, test + "gi Demo", "CMPI_RC_ERR_FAILED: the provider returned 0 instances in place of one"},
        {1, host + "--fault returnObjectPath:1:ERR_ACCESS_DENIED ein OXATK_ComputerSystem",
         "CMPI_RC_ERR_ACCESS_DENIED: the broker did not return a path"},
        {2, host + "--fault here ein X", "fault 'here' is not SLOT:N[:CODE] with N from 1 on"},
        {2, host + "--fault nothing:1 ein X",
         "there is no slot nothing; name it by table and member, as CMPIObjectPathFT.addKey"},
        {2, host + "gi 'Demo.Key=\"'",
         "object path, column 10: the quote is not closed; write it as Class.Key=\"text\",Number=3"},
        {2, host + "--context x ein X", "context entry 'x' is not NAME=TEXT"},
        {2, host + "--context =x ein X", "context entry '=x' is not NAME=TEXT"},
        {2, "--library " NO_PROVIDER " ein X",
         "library " NO_PROVIDER " has no factory for a provider oxahvlogger, such as "
         "oxahvlogger_Create_InstanceMI; is oxahvlogger its MI name? Else give it with --provider"},
        {2, test + "--provider Other ein X",
         "provider Other: its factory answered CMPI_RC_ERR_NOT_FOUND; is Other its MI name? Else give it "
         "with --provider"},
        {2, host + "ein", "CLASS is required" + usage},
        {2, "ein X", "--library is required" + usage},
        {2, host + "--output xml ein X", "--output: xml not in {mof,json}" + usage},
        {2, host + "rn X --assoc-class Y",
         "The following arguments were not expected: Y --assoc-class" + usage},
    };
    for (const auto& c : cases) {
        expectFailure(c.arguments, c.status, c.line);
    }
    EXPECT_EQ(run(test + "ein Demo", "2>&1 >/dev/full").output,
              "oxahv-provider: cannot write to the standard output\n");
    // Lines that hold words of others.
    const std::pair<std::string, std::string> parts[] = {
        {"--library /nowhere/libX.so ein X",
         "oxahv-provider: cannot load provider library: /nowhere/libX.so: "},
        {"--library /nowhere/libX.so ein X", "; give the path of the provider's library with --library\n"},
        {"--library " + noLibrary.path() + " ein X", "; ldd shows what the library needs"},
        {test + "--mof /nowhere.mof ein Demo", "/nowhere.mof"},
        {test + "--mof " + brokenMof.path() + " ein Demo", brokenMof.path() + ":2:9: "},
    };
    for (const auto& [arguments, part] : parts) {
        const Outcome outcome = run(arguments);
        EXPECT_EQ(outcome.status, 2);
        EXPECT_NE(outcome.output.find(part), std::string::npos) << outcome.output;
        EXPECT_EQ(outcome.output.find('\n'), outcome.output.size() - 1);
    }
}

// The n-th call of the broker fails, whoever makes it, until the request gets by.
TEST(TheRunner, EndsInOneLineWhateverCallFails) {
    const std::string system = pathOf("OXATK_ComputerSystem");
    for (const std::string& request :
         {test + "cm Demo Any A=5 B=x", host + "ei OXATK_ComputerSystem", host + "ri " + system,
          host + hostClasses + "cm " + system + " SetAssetTag Tag='<'"}) {
        const std::string whole = run(request).output;
        unsigned int failures = 0;
        unsigned int wholeInARow = 0;
        for (unsigned int n = 1; wholeInARow < 30; ++n) {
            SCOPED_TRACE(request + ", call " + std::to_string(n));
            const auto [status, output] = run(request + " --fault '*:" + std::to_string(n) + '\'');
            wholeInARow = status == 0 && output == whole ? wholeInARow + 1 : 0;
            if (status != 0) {
                ++failures;
                ASSERT_TRUE(status == 1 || status == 2) << output;
                EXPECT_EQ(output.rfind("oxahv-provider: ", 0), 0U) << output;
                EXPECT_EQ(output.find('\n'), output.size() - 1) << output;
                EXPECT_EQ(output.find("basic_string"), std::string::npos) << output;
            }
        }
        EXPECT_GT(failures, 1U);
    }
}
