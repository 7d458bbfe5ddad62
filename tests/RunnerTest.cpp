// The command, as a shell would start it.
#include <algorithm>
#include <array>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>
#include <pty.h>
#include <sstream>
#include <string>
#include <sys/wait.h>
#include <unistd.h>

namespace {

struct Outcome {
    int status;
    std::string output;
};

// Runs the command with standard output and standard error together, or one of them dropped by `redirection`.
Outcome run(const std::string& arguments, const std::string& redirection = "2>&1") {
    FILE* const pipe = popen((RUNNER " " + arguments + ' ' + redirection).c_str(), "r");
    Outcome outcome = {-1, ""};
    std::array<char, 4096> block{};
    for (std::size_t size = 0; (size = std::fread(block.data(), 1, block.size(), pipe)) > 0;) {
        outcome.output.append(block.data(), size);
    }
    const int status = pclose(pipe);
    outcome.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    return outcome;
}

const std::string host = "--library " HOST_PROVIDER " ";
const std::string test = "--library " TEST_PROVIDER " ";
const std::string usage = "; oxahv-provider --help shows the usage";
const std::string hostClasses = "--mof " MOF_FOLDER "/CIMSuperclasses.mof --mof " MOF_FOLDER "/OXAHost.mof ";

// A file that is gone at the end.
class File {
public:
    explicit File(const std::string& content = "")
        : path_(testing::TempDir() + "oxahv-runner-" + std::to_string(::getpid())) {
        std::ofstream(path_) << content;
    }
    ~File() { std::filesystem::remove(path_); }
    File(const File&) = delete;
    File& operator=(const File&) = delete;
    const std::string& path() const { return path_; }

private:
    std::string path_;
};

std::string lineOf(const std::string& arguments) {
    const std::string output = run(host + arguments).output;
    return output.substr(0, output.find('\n'));
}

std::size_t widthOf(const std::string& text) {
    std::size_t width = 0;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);) {
        width = std::max(width, line.size());
    }
    return width;
}

std::string quoted(const std::string& word) {
    return '\'' + word + '\'';
}

void expectFailure(const std::string& arguments, int status, const std::string& line) {
    const Outcome outcome = run(arguments);
    EXPECT_EQ(outcome.status, status) << arguments;
    EXPECT_EQ(outcome.output, "oxahv-provider: " + line + '\n') << arguments;
}

} // namespace

TEST(TheRunner, PrintsPathsAndInstances) {
    EXPECT_EQ(run(test + "ein Demo").output, "root/cimv2:Demo\n");
    EXPECT_EQ(run(test + "--namespace root/x ein Demo").output, "root/x:Demo\n");
    const Outcome names = run(host + "ein OXATK_ComputerSystem");
    EXPECT_EQ(names.status, 0);
    const std::string path = names.output.substr(0, names.output.find('\n'));
    EXPECT_EQ(
        path.rfind("root/cimv2:OXATK_ComputerSystem.CreationClassName=\"OXATK_ComputerSystem\",Name=\"", 0),
        0U);
    const Outcome instance = run(host + "gi '" + path + '\'');
    EXPECT_EQ(instance.status, 0);
    EXPECT_EQ(instance.output.rfind("instance of OXATK_ComputerSystem {\n  CreationClassName = "
                                    "\"OXATK_ComputerSystem\";\n  Name = \"",
                                    0),
              0U);
    EXPECT_EQ(instance.output, run(host + "ei OXATK_ComputerSystem").output);
}

TEST(TheRunner, PrintsJson) {
    const auto json = nlohmann::json::parse(run(host + "--output json ei OXATK_OperatingSystem").output);
    ASSERT_EQ(json.size(), 1U);
    EXPECT_EQ(json[0]["class"], "OXATK_OperatingSystem");
    EXPECT_EQ(json[0]["namespace"], "root/cimv2");
    EXPECT_EQ(json[0]["properties"]["OSType"], 36);
    EXPECT_EQ(json[0]["properties"]["Distributed"], false);
    EXPECT_TRUE(json[0]["properties"]["TotalVisibleMemorySize"].is_number_unsigned());
    const std::string path = json[0]["path"];
    EXPECT_EQ(nlohmann::json::parse(run(host + "--output json gi '" + path + '\'').output)[0]["path"], path);
    const auto names = nlohmann::json::parse(run(host + "--output json ein OXATK_ComputerSystem").output);
    EXPECT_EQ(names[0]["properties"]["CreationClassName"], "OXATK_ComputerSystem");
}

TEST(TheRunner, ShowsTracesOnRequest) {
    EXPECT_EQ(run(host + "ein OXATK_ComputerSystem", "2>&1 >/dev/null").output, "");
    const std::string traces = run(host + "--trace ein OXATK_ComputerSystem", "2>&1 >/dev/null").output;
    EXPECT_NE(
        traces.find("trace 3000 OXA.HostProvider ENTERING: enumerateInstanceNames() in InstanceProvider.cpp"),
        std::string::npos);
    EXPECT_NE(traces.find("trace 4000 Hovara.ProviderUtilities VARIABLE: 'classname' has Value "),
              std::string::npos);
}

TEST(TheRunner, FollowsAssociations) {
    const std::string system = lineOf("ein OXATK_ComputerSystem");
    const std::string os = lineOf("ein OXATK_OperatingSystem");
    const std::string association = lineOf("ein OXATK_RunningOS");
    const struct {
        std::string arguments;
        std::string output;
    } cases[] = {
        {"an " + quoted(system), os + '\n'},
        {"an --assoc-class OXATK_RunningOS --result-role antecedent " + quoted(system), os + '\n'},
        {"an --role Antecedent " + quoted(system), ""},
        {hostClasses + "an " + quoted(os) + " --result-class CIM_System", system + '\n'},
        {hostClasses + "an " + quoted(os) + " --result-class CIM_LogicalDevice", ""},
        {"rn " + quoted(system), association + '\n'},
        {"rn --result-class OXATK_RunningOS --role dependent " + quoted(system), association + '\n'},
        {"rn --role Antecedent " + quoted(system), ""},
        {"ai " + quoted(os), run(host + "gi " + quoted(system)).output},
        {"ri " + quoted(os), run(host + "ei OXATK_RunningOS").output},
    };
    for (const auto& c : cases) {
        const Outcome outcome = run(host + c.arguments);
        EXPECT_EQ(outcome.output, c.output) << c.arguments;
        EXPECT_EQ(outcome.status, 0);
    }
    const auto json = nlohmann::json::parse(run(host + "--output json ri " + quoted(os)).output);
    EXPECT_EQ(json[0]["properties"]["Dependent"], system);
    EXPECT_EQ(run(host + hostClasses + "gi " + quoted(association)).status, 0);
}

TEST(TheRunner, CallsMethodsAsTheClassDeclaresThem) {
    const File file("class Demo {\n"
                    "  uint32 Echo([In] string Text, [In] uint8 Small, sint32 Signed, real32 Real,\n"
                    "    boolean Flag, uint16 Numbers[], string Texts[], datetime When, Demo ref Other,\n"
                    "    [In(false), Out] string Result);\n"
                    "};\n");
    const std::string call = test + "--mof " + file.path() + " cm Demo ";
    const struct {
        const char* argument;
        const char* output;
    } cases[] = {
        {"text=5", "Text = \"5\""},
        {"Text=", "Text = \"\""},
        {"'Text=a=b \"c'", R"(Text = "a=b \"c")"},
        {R"('Text="a \"b\\"')", R"(Text = "a \"b\\")"},
        {"Small=255", "Small = 255"},
        {"Signed=-2147483648", "Signed = -2147483648"},
        {"Real=-1.5e3", "Real = -1500.0"},
        {"Flag=true", "Flag = TRUE"},
        {"Numbers=1 Numbers=65535", "Numbers = {1, 65535}"},
        {"Texts=x 'Texts=y z'", R"(Texts = {"x", "y z"})"},
        {"When=20260102030405.000000+060", "When = \"20260102030405.000000+060\""},
        {"Other=root/x:Demo", "Other = \"root/x:Demo\""},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(run(call + "echo " + c.argument).output,
                  std::string("ReturnValue = 1;\n") + c.output + ";\n");
    }
    EXPECT_EQ(run(test + "cm Demo Any A=5 B=-5 C=false D=1.5 'E=\"5\"'").output,
              "ReturnValue = 5;\nA = 5;\nB = -5;\nC = FALSE;\nD = \"1.5\";\nE = \"5\";\n");
    EXPECT_EQ(nlohmann::json::parse(run(call + "Echo --output json Small=7 Texts=x").output),
              nlohmann::json::parse(R"([{"path": "root/cimv2:Demo", "method": "Echo", "returnValue": 2,
                                         "parameters": {"Small": 7, "Texts": ["x"]}}])"));

    expectFailure(call + "Other", 2, "class Demo has no method Other; it has Echo");
    expectFailure(call + "Echo Text", 2, "argument 'Text' is not name=value");
    expectFailure(call + "Echo =x", 2, "argument '=x' is not name=value");
    expectFailure(call + "Echo Txt=x", 2,
                  "method Echo has no parameter Txt; it has Text, Small, Signed, Real, Flag, Numbers, Texts, "
                  "When, Other");
    expectFailure(call + "Echo Result=x", 2, "parameter Result of method Echo is an output; leave it out");
    expectFailure(call + "Echo Text=x text=y", 2,
                  "argument Text stands twice; only an array takes several values");
    expectFailure(call + "Echo Small=256", 2, "argument Small: value, column 1: 256 does not fit into uint8");
    expectFailure(
        call + "Echo Small=x", 2,
        "argument Small: value, column 1: expected a value: a number, a text in quotes, TRUE or FALSE");
    expectFailure(call + "Echo Small=1x", 2, "argument Small: value, column 1: expected a number");
    expectFailure(call + "Echo Numbers=1 Numbers=-1", 2,
                  "argument Numbers: value, column 1: -1 does not fit into uint16");
    expectFailure(call + "Echo Real=1e39", 2, "argument Real: value, column 1: expected a real32");
    expectFailure(call + "Echo Real=1.5x", 2,
                  "argument Real: value, column 4: expected nothing behind the value");
    expectFailure(call + "Echo When=now", 2, "argument When: value, column 1: expected a datetime");
    expectFailure(call + "Echo Flag=1", 2, "argument Flag: value, column 1: expected a boolean");
    expectFailure(test + "--mof " + file.path() + " cm Else Echo", 1,
                  "CMPI_RC_ERR_INVALID_CLASS: class Else is not declared");
    const Outcome missing = run(test + "--mof /nowhere.mof ein Demo");
    EXPECT_EQ(missing.status, 2);
    EXPECT_NE(missing.output.find("/nowhere.mof"), std::string::npos);
    const File broken("class Demo {\n  uint32;\n};\n");
    const Outcome error = run(test + "--mof " + broken.path() + " ein Demo");
    EXPECT_EQ(error.status, 2);
    EXPECT_EQ(error.output.rfind("oxahv-provider: " + broken.path() + ":2:9: ", 0), 0U) << error.output;
    EXPECT_EQ(error.output.find('\n'), error.output.size() - 1);
}

TEST(TheRunner, GivesProvidersTheirContext) {
    const File file;
    const std::string call = host + hostClasses + "--context OXAHostStateFile=" + file.path() + ' ';
    const std::string system = quoted(lineOf("ein OXATK_ComputerSystem"));
    EXPECT_EQ(run(call + "cm " + system + " SetAssetTag Tag=42").output, "ReturnValue = 0;\n");
    EXPECT_EQ(run(call + "cm " + system + " SetAssetTag Tag=a:b").output, "ReturnValue = 5;\n");
    EXPECT_NE(run(call + "ei OXATK_AssetIDDetails").output.find("AssetTag = \"42\";"), std::string::npos);
    expectFailure(call + "cm " + system + " SetAssetTag", 1,
                  "CMPI_RC_ERR_INVALID_PARAMETER: The asset tag is missing.");
    expectFailure(host + "--context x ein OXATK_ComputerSystem", 2, "context entry 'x' is not NAME=TEXT");
}

TEST(TheRunner, ShowsProgressOnATerminalAlone) {
    EXPECT_EQ(run(test + "ein Slow", "2>&1 >/dev/null").output, "");
    int terminal = -1;
    const pid_t child = ::forkpty(&terminal, nullptr, nullptr, nullptr);
    if (child == 0) {
        ::execl("/bin/sh", "sh", "-c", (RUNNER " " + test + "ein Slow >/dev/null").c_str(), nullptr);
        ::_exit(127);
    }
    std::string shown;
    std::array<char, 4096> block{};
    for (ssize_t size = 0; (size = ::read(terminal, block.data(), block.size())) > 0;) {
        shown.append(block.data(), static_cast<std::size_t>(size));
    }
    ::waitpid(child, nullptr, 0);
    ::close(terminal);
    EXPECT_NE(shown.find("\r4 results so far"), std::string::npos) << shown;
    EXPECT_EQ(shown.substr(shown.size() - 4), "\r\033[K") << "the line is gone at the end";
}

TEST(TheRunner, ExplainsItselfOnAScreen) {
    const std::string help = run("--help").output;
    EXPECT_LE(std::count(help.begin(), help.end(), '\n'), 40);
    EXPECT_LE(widthOf(help), 100U);
    for (const char* const verb : {"ein", "ei", "gi", "an", "ai", "rn", "ri", "cm", "check"}) {
        EXPECT_NE(help.find(std::string("\n  ") + verb + "  "), std::string::npos) << verb;
        const Outcome own = run(std::string(verb) + " --help");
        EXPECT_EQ(own.status, 0);
        EXPECT_LE(std::count(own.output.begin(), own.output.end(), '\n'), 24) << verb;
        EXPECT_LE(widthOf(own.output), 100U) << verb;
        EXPECT_NE(own.output.find(std::string("Usage: oxahv-provider ") + verb), std::string::npos);
    }
    expectFailure(host + "rn X --assoc-class Y", 2,
                  "The following arguments were not expected: Y --assoc-class" + usage);
}

TEST(TheRunner, TellsWhatWentWrongInOneLine) {
    expectFailure(host + "gi 'OXATK_EthernetPort.DeviceID=\"none\"'", 1,
                  "CMPI_RC_ERR_NOT_FOUND: no instance of that name");
    expectFailure(host + "ei CIM_Thing", 1,
                  "CMPI_RC_ERR_INVALID_CLASS: this provider does not serve class CIM_Thing");
    expectFailure(test + "ei Demo", 1, "CMPI_RC_ERR_ACCESS_DENIED: not for you");
    expectFailure(test + "gi Demo", 1,
                  "CMPI_RC_ERR_FAILED: the provider returned 0 instances in place of one");
    expectFailure(host + "--keys chars gi 'OXATK_EthernetPort.DeviceID=\"none\"'", 1,
                  "CMPI_RC_ERR_INVALID_PARAMETER: Moniker component for data type not available.");
    expectFailure(host + "--fault CMPIBrokerEncFT.newObjectPath:2 ein OXATK_ComputerSystem", 1,
                  "CMPI_RC_ERR_FAILED: the broker made no object path");
    expectFailure(host + "--fault returnObjectPath:1:ERR_ACCESS_DENIED ein OXATK_ComputerSystem", 1,
                  "CMPI_RC_ERR_ACCESS_DENIED: the broker did not take the result");

    expectFailure(host + "--fault here ein X", 2, "fault 'here' is not SLOT:N[:CODE] with N from 1 on");
    expectFailure(host + "--fault nothing:1 ein X", 2,
                  "there is no slot nothing; name it by table and member, as CMPIObjectPathFT.addKey");
    expectFailure(host + "gi 'Demo.Key=\"'", 2,
                  "object path, column 10: the quote is not closed; write it as Class.Key=\"text\",Number=3");
    expectFailure("--library " NO_PROVIDER " ein X", 2,
                  "library " NO_PROVIDER " has no factory for a provider oxahvlogger, such as "
                  "oxahvlogger_Create_InstanceMI; is oxahvlogger its MI name? Else give it with --provider");
    expectFailure(test + "--provider Other ein X", 2,
                  "provider Other: its factory answered CMPI_RC_ERR_NOT_FOUND; is Other its MI name? Else "
                  "give it with --provider");
    expectFailure(host + "ein", 2, "CLASS is required" + usage);
    expectFailure("ein X", 2, "--library is required" + usage);
    expectFailure(host + "--output xml ein X", 2, "--output: xml not in {mof,json}" + usage);
    const Outcome missing = run("--library /nowhere/libX.so ein X");
    EXPECT_EQ(missing.status, 2);
    EXPECT_EQ(missing.output.rfind("oxahv-provider: cannot load provider library: /nowhere/libX.so: ", 0),
              0U);
    EXPECT_NE(missing.output.find("; give the path of the provider's library with --library\n"),
              std::string::npos);
    const File file("no library");
    EXPECT_NE(run("--library " + file.path() + " ein X").output.find("; ldd shows what the library needs"),
              std::string::npos);
    EXPECT_EQ(run("--help").status, 0);
}

// The n-th call of the broker fails, whoever makes it, until the request gets by.
TEST(TheRunner, EndsInOneLineWhateverCallFails) {
    const std::string system = quoted(lineOf("ein OXATK_ComputerSystem"));
    for (const std::string& request :
         {test + "ein Demo", test + "cm Demo Any A=5 B=x", host + "ei OXATK_ComputerSystem",
          host + "ri " + system, host + hostClasses + "cm " + system + " SetAssetTag Tag='<'"}) {
        const Outcome whole = run(request);
        unsigned int failures = 0;
        unsigned int wholeInARow = 0;
        for (unsigned int n = 1; wholeInARow < 30; ++n) {
            SCOPED_TRACE(request + ", call " + std::to_string(n));
            const Outcome outcome = run(request + " --fault '*:" + std::to_string(n) + '\'');
            ASSERT_TRUE(outcome.status == 0 || outcome.status == 1 || outcome.status == 2) << outcome.output;
            if (outcome.status == 0) {
                wholeInARow = outcome.output == whole.output ? wholeInARow + 1 : 0;
            } else {
                wholeInARow = 0;
                ++failures;
                EXPECT_EQ(outcome.output.rfind("oxahv-provider: ", 0), 0U) << outcome.output;
                EXPECT_EQ(std::count(outcome.output.begin(), outcome.output.end(), '\n'), 1)
                    << outcome.output;
                EXPECT_EQ(outcome.output.find("basic_string"), std::string::npos) << outcome.output;
            }
        }
        EXPECT_GT(failures, 1U);
    }
}
