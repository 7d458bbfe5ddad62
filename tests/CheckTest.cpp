// The runner's check of a provider: on one that does everything wrong, and on one that does nothing wrong.
#include "Command.h"

#include <algorithm>
#include <csignal>
#include <map>
#include <nlohmann/json.hpp>
#include <set>
#include <sstream>

namespace {

using Json = nlohmann::json;
using Texts = std::set<std::string>;

// What each class shows: a check for each finding, with the pass that shows it first where that is not the
// first of all.
const std::map<std::string, std::string> expectedFindings = {
    {"None", ""},
    {"Crash", "crash "},
    {"CallsUp", "crash "},
    {"CrashWithChild", "crash "},
    {"CrashInFault", "crash@faults crash@faults "},
    {"NotServed", "not-served "},
    {"Failed", "failed "},
    {"UntypedKeys", "failed@untyped keys failed@untyped keys "},
    {"CharsKeys", "failed@chars keys failed@chars keys "},
    {"BareKeys", "null-key@bare instances "},
    {"KeyOrder", "failed@reversed keys failed@reversed keys absent@reversed keys keys-unread@reversed keys "},
    {"KeyCase", "failed@other case failed@other case "},
    {"Host", "failed@host failed@host "},
    {"Exception", "exception "},
    {"NotACode", "not-a-code "},
    {"Absent", "absent "},
    {"NotOne", "not-one "},
    {"OtherPath", "other-path "},
    {"NamesDiffer", "names-differ "},
    {"Duplicate", "duplicate "},
    {"OtherClass", "other-path other-path names-differ other-class "},
    {"KeyMissing", "duplicate key-missing "},
    {"NullKey", "null-key "},
    {"Type", "type "},
    {"Undeclared", "undeclared "},
    {"Encoding", "encoding "},
    {"Date", "date "},
    {"GetDiffers", "get-differs "},
    {"PropertyList", "property-list "},
    {"ListIgnored", "list-ignored list-ignored "},
    {"Associated", ""},
    {"AssociatedChars",
     "keys-unread@chars keys keys-unread@chars keys keys-unread@chars keys keys-unread@chars keys "},
    {"AssociationsDiffer", "associations-differ "},
    {"AssociationEnd", "association-end "},
    {"AssociationOneSided", "one-sided "},
    {"AssociationFilter", "filter filter filter filter "},
    {"MethodResult", "method-result method-result method-result "},
    {"ThreadsDiffer", "threads-differ@threads "},
    {"LeftOver", "left-over left-over "},
    {"LeftOverInFault", "left-over@faults left-over@faults "},
    {"NotDone", "not-done not-done not-done "},
};

std::string faultyClasses() {
    const std::string members = "{ [Key] string Name; string Text; uint32 Number; datetime When;"
                                " uint32 Call([In(false), Out] uint8 Result); ";
    std::string text = "[Abstract] class Faulty_Base " + members +
                       "};"
                       "[Abstract] class Faulty_End : Faulty_Base {};"
                       "[Association, Abstract] class Faulty_Link {"
                       " [Key] Faulty_Base REF Near; [Key] Faulty_End REF Far; };"
                       "class Faulty_Hang : Faulty_Base {}; class Faulty_HangClosed : Faulty_Base {};";
    for (const auto& [name, findings] : expectedFindings) {
        const bool hasTwoKeys = name == "UntypedKeys" || name == "KeyOrder";
        text +=
            "class Faulty_" + name + (hasTwoKeys ? members + "[Key] uint16 Index; };" : " : Faulty_Base {};");
    }
    return text;
}

class TheCheck : public testing::Test {
protected:
    const File mof_{faultyClasses()};
    const std::string library_ = "--library " FAULTY_PROVIDER " ";
    const std::string faulty_ = library_ + "--mof " + mof_.path() + ' ';
    const std::string host_ = "--library " HOST_PROVIDER " --mof " MOF_FOLDER
                              "/CIMSuperclasses.mof --mof " MOF_FOLDER "/OXAHost.mof ";
};

Json reportOf(const std::string& arguments, int status) {
    const Outcome outcome = run("--output json " + arguments, "2>/dev/null"); // a crash may print there
    EXPECT_EQ(outcome.status, status) << arguments;
    return Json::parse(outcome.output)[0];
}

} // namespace

TEST_F(TheCheck, FindsEachFault) {
    std::string arguments = faulty_ + "check --method Faulty_MethodResult.Call --method Faulty_None.Call";
    for (const auto& [name, findings] : expectedFindings) {
        arguments += " --class Faulty_" + name;
    }
    std::map<std::string, std::string> found;
    std::string crash;
    const Json report = reportOf(arguments, 1);
    for (const Json& finding : report["findings"]) {
        const std::string name = finding["class"].get<std::string>().substr(sizeof "Faulty_" - 1);
        const std::string check = finding["check"];
        const std::string pass = finding["pass"];
        found[name] += check + (pass == "exact keys" ? "" : '@' + pass) + ' ';
        const bool isWarning = check == "not-done" || check == "list-ignored";
        EXPECT_EQ(finding["severity"], isWarning ? "warning" : "error");
        EXPECT_NE(finding["request"], "") << finding;
        crash = name == "CrashInFault" ? finding["request"].get<std::string>() : crash;
    }
    for (const auto& [name, findings] : expectedFindings) {
        EXPECT_EQ(found[name], findings) << name;
    }
    EXPECT_EQ(run(faulty_ + crash, "2>/dev/null; exit $?").status, 128 + SIGKILL)
        << "the request does on the command line what it did in the check: " << crash;

    const std::string typed = "gi 'Faulty_UntypedKeys.Name=\"a\",Index=1'";
    EXPECT_EQ(run(faulty_ + typed).status, 0);
    EXPECT_EQ(run(faulty_ + "--keys untyped " + typed).status, 1);

    const Json hangs =
        reportOf(faulty_ + "check --timeout 1 --class Faulty_Hang --class Faulty_HangClosed", 1)["findings"];
    ASSERT_EQ(hangs.size(), 2U);
    EXPECT_EQ(hangs[0]["check"], "hang");
    EXPECT_EQ(hangs[1]["check"], "hang");
}

TEST_F(TheCheck, FindsNothingInTheExample) {
    const File state;
    const Json report =
        reportOf(host_ + "--context OXAHostStateFile=" + state.path() +
                     " check --threads 8 --method 'OXATK_ComputerSystem.SetAssetTag Tag=\"1 2\"'",
                 0);
    EXPECT_EQ(report["findings"], Json::array());
    EXPECT_EQ(report["passes"],
              Json({"exact keys", "untyped keys", "signed keys", "chars keys", "text keys", "bare instances",
                    "reversed keys", "other case", "host", "threads", "faults", "unloading"}));
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

TEST_F(TheCheck, FindsCrashesOutsideOfRequests) {
    const struct {
        const char* when;
        const char* text;
        bool isServed; // then what can be checked is checked
    } cases[] = {{"load", "loading the provider: killed by signal 9 (Killed)", false},
                 {"end", "the provider's cleanup: killed by signal 9 (Killed)", true}};
    for (const auto& c : cases) {
        const Json report = reportOf(
            faulty_ + "--context Crash=" + c.when + " check --class Faulty_None --class Faulty_Date", 1);
        EXPECT_EQ(report["findings"][0]["text"], c.text);
        EXPECT_EQ(report["findings"].size(), c.isServed ? 3U : 1U);
        EXPECT_EQ(report["classes"][1]["served"], c.isServed);
    }
}

TEST_F(TheCheck, SaysWhichLibraryAnUpcallLacks) {
    const File mof("class Faulty_CallsUp { [Key] string Name; string Text; uint32 Number; datetime When; };"
                   "class Other_Thing {};");
    const std::string mofOption = "--mof " + mof.path() + ' ';
    const std::string get = "gi 'Faulty_CallsUp.Name=\"a\"'";
    const std::string other = "--library " TEST_PROVIDER " --serves Other_Thing ";
    EXPECT_EQ(shell(RUNNER " " + library_ + mofOption + get + " 2>&1 | cat").output,
              "oxahv-provider: the provider crashed: aborted after it asked for class Other_Thing, which no "
              "loaded library serves; load that one too, with a further --library\n");
    EXPECT_EQ(run(library_ + other + mofOption + get).status, 0);
    EXPECT_EQ(run("--provider FaultyProvider " + other + library_ + mofOption + get).status, 2)
        << "a provider's name is of the library before it";

    const Json findings = reportOf(library_ + mofOption + "check --class Faulty_CallsUp", 1)["findings"];
    const std::string text = findings[0]["text"];
    EXPECT_NE(text.find(" after it asked for class Other_Thing"), std::string::npos) << text;
    const Json others =
        reportOf(library_ + other + mofOption + "check --class Faulty_CallsUp", 1)["findings"];
    EXPECT_TRUE(std::all_of(others.begin(), others.end(), [](const Json& finding) {
        return finding["pass"] == "faults";
    })) << others;
}

// As when the provider compares the class with a name that is written wrongly.
TEST_F(TheCheck, MindsAClassThatIsRefusedAmongItsSisters) {
    const File mof(
        "class Faulty_None { [Key] string Name; string Text; uint32 Number; datetime When; };"
        "class Faulty_NotServed { [Key] string Name; }; class Other_Class { [Key] string Name; };");
    const Json findings = reportOf(library_ + "--mof " + mof.path() + " check", 1)["findings"];
    ASSERT_EQ(findings.size(), 1U) << findings;
    EXPECT_EQ(findings[0]["check"], "not-served");
    EXPECT_EQ(findings[0]["class"], "Faulty_NotServed");
}

TEST_F(TheCheck, NamesWhatKeepsALibraryMapped) {
    const Json findings = reportOf("--library " STAYING_PROVIDER " --provider FaultyProvider --mof " +
                                       mof_.path() + " check --class Faulty_None",
                                   1)["findings"];
    ASSERT_EQ(findings.size(), 1U) << findings;
    EXPECT_EQ(findings[0]["check"], "stays-mapped");
    const std::string text = findings[0]["text"];
#ifdef __clang__
    EXPECT_NE(text.find("it is linked with -z nodelete"), std::string::npos) << text;
#else
    EXPECT_NE(text.find("unique symbols, to which other libraries bind: Shared<int>::count;"),
              std::string::npos)
        << text;
#endif
}

TEST_F(TheCheck, PrintsATableWithColoursOnATerminalAlone) {
    const std::string arguments = faulty_ + "check --class Faulty_NotDone --class Faulty_Date";
    const std::string output = run(arguments).output;
    EXPECT_EQ(output.rfind("checked     Faulty_NotDone: 2 instances\n"
                           "checked     Faulty_Date: 2 instances\n"
                           "error  date  Faulty_Date: '20261301000000.000000+000'\n"
                           "    ei Faulty_Date\n"
                           "    a text for a date or an interval is none; pass: exact keys, 117 times\n"
                           "warning  not-done  Faulty_NotDone: ein does not call returnDone\n",
                           0),
              0U)
        << output;
    EXPECT_NE(onTerminal(RUNNER " " + arguments).find("\033[31merror\033[0m  date"), std::string::npos);
    EXPECT_EQ(onTerminal("NO_COLOR=1 " RUNNER " " + arguments).find("\033[3"), std::string::npos);
}

TEST_F(TheCheck, SaysWhatKeepsItFromChecking) {
    const std::pair<std::string, const char*> cases[] = {
        {faulty_ + "check --class Nothing", "class Nothing is not declared; name its MOF file with --mof"},
        {library_ + "check",
         "no class to check: name MOF files that declare the provider's classes with --mof"},
        {faulty_ + "check --method Call", "method 'Call' is not CLASS.METHOD name=value ..."},
        {faulty_ + "check --method Faulty_None.Other",
         "method 'Faulty_None.Other': no class that --mof declares has it"},
        {faulty_ + "check --class Faulty_Type --method Faulty_None.Call",
         "method Faulty_None.Call is of no class that is checked; name the class with --class"},
        {faulty_ + "--keys chars check",
         "check puts faults, keys, instances and paths on the provider itself: leave --fault, --keys, "
         "--new-instance and --path out"},
        {"--library " HOST_PROVIDER " --mof " + mof_.path() + " check",
         "the provider serves none of the classes; its answer for Faulty_Absent is "
         "CMPI_RC_ERR_INVALID_CLASS: this provider does not serve class Faulty_Absent; name its MOF files "
         "with --mof"},
    };
    for (const auto& [arguments, line] : cases) {
        expectFailure(arguments, 2, line);
    }
}

namespace {

// What bash offers behind a command line, whose last word is the one to complete.
Texts offered(const std::string& words) {
    std::istringstream lines(shell("bash -c 'source " COMPLETION "; COMP_WORDS=(oxahv-provider " + words +
                                   " \"\"); COMP_WORDS=(\"${COMP_WORDS[@]:0:${#COMP_WORDS[@]}-1}\");"
                                   " COMP_CWORD=$((${#COMP_WORDS[@]} - 1)); _oxahv_provider;"
                                   " printf \"%s\\n\" \"${COMPREPLY[@]}\"'")
                                 .output);
    Texts all;
    for (std::string line; std::getline(lines, line);) {
        all.insert(line);
    }
    return all;
}

} // namespace

TEST(Completion, OffersWhatTheHelpShows) {
    for (const std::string verb :
         {"", "ein", "ei", "gi", "an", "ai", "rn", "ri", "cm", "ci", "mi", "di", "xq", "check"}) {
        const Texts all = offered(verb + " --");
        const std::string help = run(verb + " --help").output;
        std::istringstream lines(help.substr(0, help.find("Exit status"))); // examples follow
        std::size_t count = 0;
        for (std::string line; std::getline(lines, line);) {
            const std::size_t begin = line.find("--");
            if (line.rfind("  -", 0) == 0 && begin != std::string::npos) {
                const std::string option = line.substr(begin, line.find_first_of(" ,", begin) - begin);
                EXPECT_EQ(all.count(option), 1U) << verb << ' ' << option;
                ++count;
            }
        }
        EXPECT_GE(count, verb.empty() ? 9U : 1U);
    }
}

TEST(Completion, OffersVerbsClassesAndValues) {
    const std::pair<const char*, Texts> cases[] = {
        {"--library x.so e", {"ein", "ei"}},
        {"--mof " MOF_FOLDER "/OXAHost.mof gi OXATK_A", {"OXATK_AssetIDDetails"}},
        {"--mof " MOF_FOLDER "/OXAHost.mof check --class OXATK_R", {"OXATK_RunningOS"}},
        {"--output j", {"json"}},
        {"--keys \"\"", {"exact", "untyped", "signed", "chars", "text"}},
        {"--mof " MOF_FOLDER "/CIMS", {MOF_FOLDER "/CIMSuperclasses.mof"}},
        {"--namespace e", {""}},
    };
    for (const auto& [words, expected] : cases) {
        EXPECT_EQ(offered(words), expected) << words;
    }
}
