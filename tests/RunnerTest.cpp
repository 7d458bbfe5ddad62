// The command, as a shell would start it.
#include <array>
#include <cstdio>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>
#include <string>
#include <sys/wait.h>

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
        traces.find("trace 3000 OXA.HostProvider ENTERING: enumerateInstanceNames() in HostProvider.cpp"),
        std::string::npos);
    EXPECT_NE(traces.find("trace 4000 Hovara.ProviderUtilities VARIABLE: 'classname' has Value "),
              std::string::npos);
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
    expectFailure(host + "--fault nothing:1 ein X", 2, "there is no slot nothing");
    expectFailure(host + "gi 'Demo.Key=\"'", 2, "object path, column 10: the quote is not closed");
    expectFailure("--library " NO_PROVIDER " ein X", 2,
                  "library " NO_PROVIDER " has no factory for a provider oxahvlogger, such as "
                  "oxahvlogger_Create_InstanceMI");
    expectFailure(test + "--provider Other ein X", 2,
                  "provider Other: its factory answered CMPI_RC_ERR_NOT_FOUND");
    expectFailure(host + "ein", 2, "CLASS is required");
    expectFailure("ein X", 2, "--library is required");
    expectFailure(host + "--output xml ein X", 2, "--output: xml not in {mof,json}");
    const Outcome missing = run("--library /nowhere/libX.so ein X");
    EXPECT_EQ(missing.status, 2);
    EXPECT_EQ(missing.output.rfind("oxahv-provider: cannot load provider library: /nowhere/libX.so: ", 0),
              0U);
    EXPECT_EQ(run("--help").status, 0);
}
