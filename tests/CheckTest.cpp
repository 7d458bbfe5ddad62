// The runner's check of a provider, as a shell would start it: on one that does everything wrong, and on one
// that does nothing wrong.
#include <algorithm>
#include <array>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <map>
#include <nlohmann/json.hpp>
#include <pty.h>
#include <set>
#include <sstream>
#include <string>
#include <sys/wait.h>
#include <unistd.h>

namespace {

using Json = nlohmann::json;
using Texts = std::set<std::string>;

struct Outcome {
    int status;
    std::string output;
};

std::string readAll(int descriptor) {
    std::string all;
    std::array<char, 4096> block{};
    for (ssize_t size = 0; (size = ::read(descriptor, block.data(), block.size())) > 0;) {
        all.append(block.data(), static_cast<std::size_t>(size));
    }
    return all;
}

Outcome run(const std::string& command) {
    FILE* const pipe = popen(command.c_str(), "r");
    std::string output = readAll(fileno(pipe));
    const int status = pclose(pipe);
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, output};
}

std::string onTerminal(const std::string& command) {
    int terminal = -1;
    const pid_t child = ::forkpty(&terminal, nullptr, nullptr, nullptr);
    if (child == 0) {
        ::execl("/bin/sh", "sh", "-c", command.c_str(), nullptr);
        ::_exit(127);
    }
    std::string shown = readAll(terminal);
    ::waitpid(child, nullptr, 0);
    ::close(terminal);
    return shown;
}

const std::string faulty = RUNNER " --library " FAULTY_PROVIDER " --mof " FAULTY_MOF " ";
const std::string host = RUNNER " --library " HOST_PROVIDER " --mof " MOF_FOLDER
                                "/CIMSuperclasses.mof --mof " MOF_FOLDER "/OXAHost.mof ";

// What each class shows: the check, and the pass that shows it first.
const std::map<std::string, Texts> expectedFindings = {
    {"None", {}},
    {"Crash", {"crash, exact keys"}},
    {"CrashInFault", {"crash, faults"}},
    {"Hang", {"hang, exact keys"}},
    {"NotServed", {"not-served, exact keys"}},
    {"Failed", {"failed, exact keys"}},
    {"UntypedKeys", {"failed, untyped keys"}},
    {"Exception", {"exception, exact keys"}},
    {"NotACode", {"not-a-code, exact keys"}},
    {"Absent", {"absent, exact keys"}},
    {"NotOne", {"not-one, exact keys"}},
    {"OtherPath", {"other-path, exact keys"}},
    {"NamesDiffer", {"names-differ, exact keys"}},
    {"Duplicate", {"duplicate, exact keys"}},
    {"OtherClass", {"other-class, exact keys", "other-path, exact keys", "names-differ, exact keys"}},
    {"KeyMissing", {"key-missing, exact keys", "duplicate, exact keys"}},
    {"NullKey", {"null-key, exact keys"}},
    {"Type", {"type, exact keys"}},
    {"Undeclared", {"undeclared, exact keys"}},
    {"Encoding", {"encoding, exact keys"}},
    {"Date", {"date, exact keys"}},
    {"GetDiffers", {"get-differs, exact keys"}},
    {"PropertyList", {"property-list, exact keys"}},
    {"ListIgnored", {"list-ignored, exact keys"}},
    {"AssociationsDiffer", {"associations-differ, exact keys"}},
    {"AssociationEnd", {"association-end, exact keys"}},
    {"OneSided", {"one-sided, exact keys"}},
    {"Filter", {"filter, exact keys"}},
    {"MethodResult", {"method-result, exact keys"}},
    {"ThreadsDiffer", {"threads-differ, threads"}},
    {"LeftOver", {"left-over, exact keys"}},
    {"LeftOverInFault", {"left-over, faults"}},
    {"NotDone", {"not-done, exact keys"}},
};

} // namespace

TEST(TheCheck, FindsEachFault) {
    std::string command = faulty + "--output json check --timeout 5 --method Faulty_MethodResult.Call "
                                   "--method Faulty_None.Call";
    for (const auto& [name, findings] : expectedFindings) {
        command += " --class Faulty_" + name;
    }
    const Outcome outcome = run(command);
    EXPECT_EQ(outcome.status, 1);
    const Json report = Json::parse(outcome.output)[0];
    std::map<std::string, Texts> found;
    std::string crash;
    for (const Json& finding : report["findings"]) {
        const std::string name = finding["class"].get<std::string>().substr(sizeof "Faulty_" - 1);
        const std::string check = finding["check"];
        found[name].insert(check + ", " + finding["pass"].get<std::string>());
        const bool isWarning = check == "not-done" || check == "list-ignored";
        EXPECT_EQ(finding["severity"], isWarning ? "warning" : "error");
        EXPECT_FALSE(finding["request"].get<std::string>().empty()) << finding;
        if (name == "CrashInFault") {
            crash = finding["request"];
        }
    }
    for (const auto& [name, findings] : expectedFindings) {
        EXPECT_EQ(found[name], findings) << "Faulty_" << name;
    }
    EXPECT_EQ(run(faulty + crash + " 2>/dev/null; exit $?").status, 128 + SIGKILL)
        << "the request does on the command line what it did in the check: " << crash;
}

TEST(TheCheck, FindsNothingInTheExample) {
    const std::string state = testing::TempDir() + "oxahv-check-" + std::to_string(::getpid());
    std::ofstream(state) << "";
    const Outcome outcome =
        run(host + "--context OXAHostStateFile=" + state +
            " --output json check --threads 8 --method 'OXATK_ComputerSystem.SetAssetTag Tag=\"1 2\"'");
    std::filesystem::remove(state);
    EXPECT_EQ(outcome.status, 0);
    const Json report = Json::parse(outcome.output)[0];
    EXPECT_EQ(report["findings"], Json::array());
    EXPECT_EQ(report["passes"], Json({"exact keys", "untyped keys", "threads", "faults"}));
    Texts served;
    for (const Json& checked : report["classes"]) {
        if (checked["served"]) {
            served.insert(checked["class"]);
        } else {
            EXPECT_EQ(checked["answer"].get<std::string>().rfind("CMPI_RC_ERR_INVALID_CLASS: ", 0), 0U);
        }
    }
    EXPECT_EQ(served, Texts({"OXATK_AssetIDDetails", "OXATK_ComputerSystem", "OXATK_EthernetPort",
                             "OXATK_NumericSensor", "OXATK_OperatingSystem", "OXATK_RunningOS"}));
}

TEST(TheCheck, FindsCrashesOutsideOfRequests) {
    const struct {
        const char* when;
        const char* text;
        bool isServed;
    } cases[] = {{"load", "loading the provider: killed by signal 9 (Killed)", false},
                 {"end", "the provider's cleanup: killed by signal 9 (Killed)", true}};
    for (const auto& c : cases) {
        const Outcome outcome = run(faulty + "--output json --context Crash=" + c.when +
                                    " check --class Faulty_None --class Faulty_Date");
        EXPECT_EQ(outcome.status, 1);
        const Json report = Json::parse(outcome.output)[0];
        EXPECT_EQ(report["findings"][0]["text"], c.text);
        EXPECT_EQ(report["findings"].size(), c.isServed ? 3U : 1U) << "what can be checked is checked";
        EXPECT_EQ(report["classes"][1]["served"], c.isServed);
    }
}

TEST(TheCheck, PrintsATableWithColoursOnATerminalAlone) {
    const std::string command = faulty + "check --class Faulty_NotDone --class Faulty_Date";
    const Outcome outcome = run(command);
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(
        outcome.output.rfind("checked     Faulty_NotDone: 2 instances\n"
                             "checked     Faulty_Date: 2 instances\n"
                             "error  date  Faulty_Date: '20261301000000.000000+000'\n"
                             "    ei Faulty_Date\n"
                             "    a text for a date or an interval is none; pass: exact keys, 26 times\n"
                             "warning  not-done  Faulty_NotDone: ein does not call returnDone\n",
                             0),
        0U)
        << outcome.output;
    EXPECT_NE(onTerminal(command).find("\033[31merror\033[0m  date"), std::string::npos);
    EXPECT_EQ(onTerminal("NO_COLOR=1 " + command).find("\033[3"), std::string::npos);
}

TEST(TheCheck, SaysWhatKeepsItFromChecking) {
    const struct {
        std::string arguments;
        const char* line;
    } cases[] = {
        {faulty + "check --class Nothing", "class Nothing is not declared; name its MOF file with --mof"},
        {RUNNER " --library " FAULTY_PROVIDER " check",
         "no class to check: name MOF files that declare the provider's classes with --mof"},
        {faulty + "check --method Call", "method 'Call' is not CLASS.METHOD name=value ..."},
        {faulty + "check --method Faulty_None.Other",
         "method 'Faulty_None.Other': no class that --mof declares has it"},
        {faulty + "check --class Faulty_Type --method Faulty_None.Call",
         "method Faulty_None.Call is of no class that is checked; name the class with --class"},
        {faulty + "--keys chars check",
         "check puts faults and key modes on the provider itself: leave --fault and --keys out"},
        {RUNNER " --library " HOST_PROVIDER " --mof " FAULTY_MOF " check",
         "the provider serves none of the classes; its answer for Faulty_Absent is "
         "CMPI_RC_ERR_INVALID_CLASS: this provider does not serve class Faulty_Absent; name its MOF files "
         "with --mof"},
    };
    for (const auto& c : cases) {
        const Outcome outcome = run(c.arguments + " 2>&1");
        EXPECT_EQ(outcome.status, 2) << c.arguments;
        EXPECT_EQ(outcome.output, std::string("oxahv-provider: ") + c.line + '\n');
    }
}

namespace {

// What bash offers behind a command line, whose last word is the one to complete.
Texts offered(const std::string& words) {
    const Outcome outcome = run("bash -c 'source " COMPLETION "; COMP_WORDS=(oxahv-provider " + words +
                                " \"\"); COMP_WORDS=(\"${COMP_WORDS[@]:0:${#COMP_WORDS[@]}-1}\");"
                                " COMP_CWORD=$((${#COMP_WORDS[@]} - 1)); _oxahv_provider;"
                                " printf \"%s\\n\" \"${COMPREPLY[@]}\"'");
    Texts all;
    std::istringstream stream(outcome.output);
    for (std::string line; std::getline(stream, line);) {
        all.insert(line);
    }
    return all;
}

} // namespace

TEST(Completion, OffersWhatTheHelpShows) {
    for (const std::string verb : {"", "ein", "ei", "gi", "an", "ai", "rn", "ri", "cm", "check"}) {
        std::string help = run(RUNNER " " + verb + " --help").output;
        help.resize(std::min(help.size(), help.find("Exit status"))); // examples follow
        Texts shown;
        std::istringstream stream(help);
        for (std::string line; std::getline(stream, line);) {
            const std::size_t begin = line.find("--");
            if (line.rfind("  -", 0) == 0 && begin != std::string::npos) {
                shown.insert(line.substr(begin, line.find_first_of(" ,", begin) - begin));
            }
        }
        EXPECT_GE(shown.size(), verb.empty() ? 9U : 1U);
        const Texts all = offered(verb + " --");
        for (const std::string& name : shown) {
            EXPECT_EQ(all.count(name), 1U) << verb << ' ' << name;
        }
    }
}

TEST(Completion, OffersVerbsClassesAndValues) {
    const struct {
        const char* words;
        Texts expected;
    } cases[] = {
        {"--library x.so e", {"ein", "ei"}},
        {"--mof " FAULTY_MOF " gi Faulty_Not",
         {"Faulty_NotServed", "Faulty_NotACode", "Faulty_NotOne", "Faulty_NotDone"}},
        {"--mof " MOF_FOLDER "/OXAHost.mof check --class OXATK_R", {"OXATK_RunningOS"}},
        {"--output j", {"json"}},
        {"--keys \"\"", {"exact", "untyped", "chars"}},
        {"--mof " MOF_FOLDER "/CIMS", {MOF_FOLDER "/CIMSuperclasses.mof"}},
        {"--namespace e", {""}},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(offered(c.words), c.expected) << c.words;
    }
    const Outcome version = run(RUNNER " --version");
    EXPECT_EQ(version.status, 0);
    EXPECT_EQ(version.output.rfind("oxahv-provider ", 0), 0U);
    EXPECT_EQ(std::count(version.output.begin(), version.output.end(), '.'), 2);
}
