// The command's requests: what it prints, and with which exit status.
#include "Command.h"

#include <algorithm>
#include <nlohmann/json.hpp>
#include <sstream>
#include <sys/stat.h>

namespace {

using Json = nlohmann::json;

const std::string host = "--library " HOST_PROVIDER " ";
const std::string test = "--library " TEST_PROVIDER " ";
const std::string usage = "; oxahv-provider --help shows the usage";
const std::string hostClasses = "--mof " MOF_FOLDER "/CIMSuperclasses.mof --mof " MOF_FOLDER "/OXAHost.mof ";

// The path of a class's only instance.
std::string pathOf(const std::string& className) {
    const std::string output = run(host + "ein " + className).output;
    return output.substr(0, output.find('\n'));
}

// As a word of a command line.
std::string quoted(const std::string& text) {
    return '\'' + text + '\'';
}

Json jsonOf(const std::string& arguments) {
    return Json::parse(run("--output json " + arguments).output)[0];
}

// Runs a command and compares its exit status and output, in which a star stands for any text within a line.
void expectRun(const std::string& arguments, int status, const std::string& output) {
    Outcome outcome = run(arguments);
    EXPECT_EQ(outcome.status, status) << arguments;
    const std::size_t star = output.find('*');
    const std::size_t end = output.size() - star - 1; // what follows the star
    if (star != std::string::npos && outcome.output.size() >= star + end) {
        std::string any = outcome.output.substr(star, outcome.output.size() - end - star);
        EXPECT_EQ(any.find('\n'), std::string::npos) << any;
        outcome.output.replace(star, any.size(), "*");
    }
    EXPECT_EQ(outcome.output, output) << arguments;
}

} // namespace

TEST(RunnerTest, PrintsPathsAndInstances) {
    expectRun(test + "--namespace root/x ein Demo", 0, "root/x:Demo\n");
    expectRun(host + "ein OXATK_ComputerSystem", 0,
              "root/cimv2:OXATK_ComputerSystem.CreationClassName=\"OXATK_ComputerSystem\",Name=\"*\"\n");
    const std::string instance = run(host + "gi " + quoted(pathOf("OXATK_ComputerSystem"))).output;
    EXPECT_EQ(instance.rfind("instance of OXATK_ComputerSystem {\n  CreationClassName = "
                             "\"OXATK_ComputerSystem\";\n  Name = \"",
                             0),
              0U);
    expectRun(host + "ei OXATK_ComputerSystem", 0, instance);

    const Json json = jsonOf(host + "ei OXATK_OperatingSystem");
    EXPECT_EQ(json["class"], "OXATK_OperatingSystem");
    EXPECT_EQ(json["namespace"], "root/cimv2");
    EXPECT_EQ(json["path"], pathOf("OXATK_OperatingSystem"));
    EXPECT_EQ(json["properties"]["OSType"], 36);
    EXPECT_EQ(json["properties"]["Distributed"], false);
    EXPECT_EQ(jsonOf(host + "ein OXATK_ComputerSystem")["properties"]["CreationClassName"],
              "OXATK_ComputerSystem");
}

TEST(RunnerTest, WatchesIndications) {
    expectRun(test + "watch Demo --count 2", 0,
              "instance of Demo {\n  Number = 1;\n};\ninstance of Demo {\n  Number = 2;\n};\n");
    EXPECT_EQ(jsonOf(test +
                     "watch --query 'SELECT * FROM Demo WHERE Number > 1' --count 1")["properties"]["Number"],
              2);
    expectRun(test + "watch Refused", 1,
              "oxahv-provider: CMPI_RC_ERR_ACCESS_DENIED: provider TestProvider refuses the filter: "
              "CMPI_RC_ERR_ACCESS_DENIED\n");
    expectRun(test + "watch", 2, "oxahv-provider: watch takes either a CLASS or --query\n");
}

TEST(RunnerTest, ShowsTraces) {
    EXPECT_EQ(run(host + "ein OXATK_ComputerSystem", "2>&1 >/dev/null").output, "");
    const std::string traces = run(host + "--trace ein OXATK_ComputerSystem", "2>&1 >/dev/null").output;
    EXPECT_NE(traces.find("trace 3000 OXA.HostProvider ENTERING: enumerateInstanceNames() in Answer.h"),
              std::string::npos);
    EXPECT_EQ(traces.find("log "), std::string::npos) << "each message comes twice and is shown once";
}

TEST(RunnerTest, FollowsAssociations) {
    const std::string system = pathOf("OXATK_ComputerSystem");
    const std::string os = pathOf("OXATK_OperatingSystem");
    const std::string ofSystem = ' ' + quoted(system);
    const std::string ofOs = ' ' + quoted(os);
    const std::pair<std::string, std::string> rows[] = {
        {"an --assoc-class OXATK_RunningOS --result-role antecedent" + ofSystem, os + '\n'},
        {"an --assoc-class OXATK_InstalledOS" + ofSystem, ""},
        {"an --role Antecedent" + ofSystem, ""},
        {"an --result-role Dependent" + ofSystem, ""},
        {hostClasses + "an --assoc-class CIM_Dependency" + ofSystem, os + '\n'},
        {hostClasses + "an --result-class CIM_System" + ofOs, system + '\n'},
        {hostClasses + "an --result-class CIM_LogicalDevice" + ofOs, ""},
        {"rn --result-class OXATK_RunningOS --role dependent" + ofSystem, pathOf("OXATK_RunningOS") + '\n'},
        {"rn --role Antecedent" + ofSystem, ""},
        {"ai" + ofOs, run(host + "gi" + ofSystem).output},
        {"ri" + ofOs, run(host + "ei OXATK_RunningOS").output},
    };
    for (const auto& [arguments, output] : rows) {
        expectRun(host + arguments, 0, output);
    }
    EXPECT_EQ(jsonOf(host + "ri" + ofOs)["properties"]["Dependent"], system);
    EXPECT_TRUE(jsonOf(host + hostClasses + "gi" + ofOs)["properties"].at("Description").is_null());
}

TEST(RunnerTest, CallsMethodsWithDeclaredParameters) {
    const File file("class Demo {\n"
                    "  uint32 Echo([In] string Text, [In] uint8 Small, real32 Real, boolean Flag,\n"
                    "    uint16 Numbers[], datetime When, Demo ref Other, [In(false), Out] string Result);\n"
                    "};\n");
    const std::string call = test + "--mof " + file.path() + " cm Demo ";
    const std::string when = "When=20260102030405.000000+060";
    const std::pair<std::string, const char*> good[] = {
        {"text=5", "Text = \"5\""},
        {"Text=", "Text = \"\""},
        {"'Text=a=b \"c'", R"(Text = "a=b \"c")"},
        {R"('Text="a \"b\\"')", R"(Text = "a \"b\\")"},
        {"Numbers=1 Numbers=65535", "Numbers = {1, 65535}"},
        {when, "When = \"20260102030405.000000+060\""},
        {"Other=root/x:Demo", "Other = \"root/x:Demo\""},
    };
    for (const auto& [arguments, output] : good) {
        expectRun(call + "echo " + arguments, 0, std::string("ReturnValue = 1;\n") + output + ";\n");
    }
    expectRun(test + "cm Demo Any A=5 B=-5 C=false D=1.5 'E=\"5\"'", 0,
              "ReturnValue = 5;\nA = 5;\nB = -5;\nC = FALSE;\nD = \"1.5\";\nE = \"5\";\n");
    EXPECT_EQ(jsonOf(call + "Echo Small=7 Real=0.1 Flag=true Numbers=8 Other=Demo " + when),
              Json::parse(R"({"path": "root/cimv2:Demo", "method": "Echo", "returnValue": 6,
            "parameters": {"Small": 7, "Real": 0.1, "Flag": true, "Numbers": [8], "Other": "Demo",
                           "When": "20260102030405.000000+060"}})"));
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

TEST(RunnerTest, WritesInstancesAndSendsQueries) {
    const File file("class Demo { [Key] string Text; uint8 Small; uint8 Many[]; };\n");
    const std::string declared = test + "--mof " + file.path() + ' ';
    const std::string path = "'Demo.Text=\"a\"'";
    const struct {
        std::string arguments;
        int status;
        const char* output;
    } cases[] = {
        {"ci " + path, 0, "root/cimv2:Demo.Text=\"a\"\n"},
        {"--new-instance bare ci " + path, 0, "root/cimv2:Demo.Text=\"a\"\n"},
        {"ci Demo Text=b Small=5", 0, "root/cimv2:Demo.Text=\"b\"\n"},
        {"--output json mi " + path, 0, "[]\n"},
        {"mi " + path + " small=5 Many=1 Many=2", 1,
         "oxahv-provider: CMPI_RC_ERR_FAILED: small=5;Many=-1;\n"},
        {"di " + path, 0, ""},
        {"di Demo", 1, "oxahv-provider: CMPI_RC_ERR_NOT_FOUND\n"},
        {"ci Demo Other=1", 2,
         "oxahv-provider: class Demo has no property Other; it has Text, Small, Many\n"},
        {"mi Demo Small=256", 2,
         "oxahv-provider: property Small: value, column 1: 256 does not fit into uint8\n"},
        {"mi Demo =1", 2, "oxahv-provider: property '=1' is not name=value\n"},
    };
    for (const auto& c : cases) {
        expectRun(declared + c.arguments, c.status, c.output);
    }
    expectRun(test + "xq Demo 'SELECT * FROM Demo'", 0,
              "instance of Demo {\n  Query = \"SELECT * FROM Demo\";\n  Language = \"WQL\";\n};\n");
    EXPECT_NE(run(test + "xq --language CIM:CQL Demo x").output.find("\"CIM:CQL\""), std::string::npos);
}

// A terminal obeys them: a provider's text could give it another title, or more.
TEST(RunnerTest, PrintsControlCharactersAsEscapes) {
    const std::string call = test + "cm Demo Any $'A=\\e]0;\\u009b\\x7f\\n\xff'";
    EXPECT_EQ(shell("bash -c \"" RUNNER " " + call + "\"").output,
              "ReturnValue = 1;\nA = \"\\x001B]0;\\x009B\\x007F\\n\\x00FF\";\n");
    const std::string json = shell("bash -c \"" RUNNER " --output json " + call + "\"").output;
    EXPECT_NE(json.find(R"(\u001b]0;\u009B\u007F\n)"), std::string::npos) << json;
    const std::string path = R"(root/cimv2:Demo.Text="\x001B]0;")"; // what is printed can be read
    expectRun(test + "ci " + quoted(path), 0, path + '\n');
}

TEST(RunnerTest, PassesContextToTheProvider) {
    const File file;
    const std::string call = host + hostClasses + "--context OXAHostStateFile=" + file.path() + ' ';
    const std::string setTag = call + "cm " + quoted(pathOf("OXATK_ComputerSystem")) + " SetAssetTag ";
    expectRun(setTag + "Tag=42", 0, "ReturnValue = 0;\n");
    EXPECT_NE(run(call + "ei OXATK_AssetIDDetails").output.find("AssetTag = \"42\";"), std::string::npos);
    expectFailure(setTag, 1, "CMPI_RC_ERR_INVALID_PARAMETER: The asset tag is missing.");
}

TEST(RunnerTest, ShowsProgressOnATerminal) {
    const File file;
    const std::string command = RUNNER " " + test + "ein Slow >/dev/null ";
    const std::string shown = onTerminal(command + "2>" + file.path() + " & " + command + "; wait");
    EXPECT_NE(shown.find("\r4 results so far"), std::string::npos) << shown;
    EXPECT_EQ(shown.substr(shown.size() - 4), "\r\033[K") << "the line is gone at the end";
    EXPECT_EQ(std::filesystem::file_size(file.path()), 0U);
}

TEST(RunnerTest, HelpFitsOnAScreen) {
    for (const std::string verb :
         {"", "ein", "ei", "gi", "an", "ai", "rn", "ri", "cm", "ci", "mi", "di", "xq", "check"}) {
        const Outcome help = run(verb + " --help");
        EXPECT_EQ(help.status, 0);
        EXPECT_NE(help.output.find("Usage: oxahv-provider " + verb), std::string::npos);
        EXPECT_LE(std::count(help.output.begin(), help.output.end(), '\n'), verb.empty() ? 48 : 24) << verb;
        std::istringstream lines(help.output);
        for (std::string line; std::getline(lines, line);) {
            EXPECT_LE(line.size(), 100U) << line;
        }
    }
    expectRun("--version", 0, "oxahv-provider *\n");
}

TEST(RunnerTest, ReportsErrorsInOneLine) {
    const std::string port = "gi 'OXATK_EthernetPort.DeviceID=\"none\"'";
    const File noLibrary("no library");
    const File brokenMof("class Demo {\n  uint32;\n};\n");
    const File placeOfPipe;
    const std::string pipe = placeOfPipe.path();
    std::filesystem::remove(pipe);
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
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
        {2, host + "--output xml ein X", "--output: xml not in {mof,json,junit}" + usage},
        {2, host + "rn X --assoc-class Y",
         "The following arguments were not expected: Y --assoc-class" + usage},
        // Lines with words of the system or of a parser.
        {2, "--library /nowhere/libX.so ein X",
         "cannot load provider library: /nowhere/libX.so: *; give the path of the provider's library with "
         "--library"},
        {2, "--library " + noLibrary.path() + " ein X",
         "*; ldd shows what the library needs and what it lacks"},
        {2, test + "--mof /nowhere.mof ein Demo", "cannot read /nowhere.mof: *"},
        {2, "--library " + pipe + " ein X",
         "cannot load provider library: " + pipe + ": it is no regular file*"},
        {2, test + "eii Demo", "there is no verb eii" + usage},
        {2, test + "--mof " + brokenMof.path() + " ein Demo", brokenMof.path() + ":2:9: *"},
    };
    for (const auto& c : cases) {
        expectRun(c.arguments, c.status, "oxahv-provider: " + c.line + '\n');
    }
    EXPECT_EQ(run(test + "ein Demo", "2>&1 >/dev/full").output,
              "oxahv-provider: cannot write to the standard output\n");
}

// A client may send them, and a finding of the check may be such a request.
TEST(RunnerTest, NamesWhatTheMofDoesNotDeclare) {
    const std::string declared = host + hostClasses;
    EXPECT_EQ(run(declared + "ei OXATK_OperatingSystem --properties Nmae,OSType", "2>&1 >/dev/null").output,
              "oxahv-provider: class OXATK_OperatingSystem has no property Nmae\n");
    EXPECT_EQ(
        run(declared + "an " + quoted(pathOf("OXATK_ComputerSystem")) + " --assoc-class OXATK_Runing").output,
        "oxahv-provider: class OXATK_Runing is not declared\n");
}

// Lets the n-th call of the broker fail, until the request succeeds.
TEST(RunnerTest, ReportsAnyFailureInOneLine) {
    const std::string system = quoted(pathOf("OXATK_ComputerSystem"));
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
                const std::size_t error = output.rfind("oxahv-provider: "); // follows the results so far
                ASSERT_TRUE(error == 0 || (error < output.size() && output[error - 1] == '\n')) << output;
                EXPECT_EQ(output.find('\n', error), output.size() - 1) << output;
                EXPECT_EQ(output.find("basic_string"), std::string::npos) << output;
            }
        }
        EXPECT_GT(failures, 1U);
    }
}
