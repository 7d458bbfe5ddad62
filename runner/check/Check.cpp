#include "check/Check.h"

#include "check/CrashLine.h"
#include "check/Passes.h"
#include "check/Report.h"
#include "check/Untested.h"
#include "show/ProgressLine.h"
#include "show/Text.h"
#include "show/Values.h"

#include <Names.h>
#include <algorithm>
#include <chrono>
#include <iostream>
#include <limits>
#include <map>
#include <set>
#include <unistd.h>

namespace oxahv::runner {

namespace {

// How many instances of a class are asked for by name in a pass.
std::size_t sampleSize(bool isExhaustive) {
    return isExhaustive ? std::numeric_limits<std::size_t>::max() : 100;
}

// The kind of fault that a line of a sanitizer's report names, without numbers that differ from time to time;
// empty for all other lines.
std::string sanitizerReport(const std::string& line) {
    const std::size_t undefined = line.find("runtime error: ");
    if (undefined != std::string::npos) {
        return "UndefinedBehaviorSanitizer: " +
               line.substr(undefined + std::string("runtime error: ").size());
    }
    for (const char* const begin : {"ERROR: AddressSanitizer: ", "ERROR: LeakSanitizer: ",
                                    "WARNING: ThreadSanitizer: ", "WARNING: MemorySanitizer: "}) {
        const std::size_t found = line.find(begin);
        if (found != std::string::npos) {
            const std::string text = line.substr(line.find(' ', found) + 1);
            return text.substr(0, std::min(text.find(" on "), text.find(" (pid=")));
        }
    }
    return "";
}

class CheckRun {
public:
    CheckRun(const Options& options, const CheckOptions& checkOptions)
        : options_(options), checkOptions_(checkOptions) {
        prepare(broker_, options_);
        report_.library = options_.libraries.front().file;
        report_.provider = providerName(options_.libraries.front());
    }

    CheckReport run();

private:
    std::vector<std::string> classNames() const;
    MethodCall methodCall(const std::string& text) const;
    void runClass(std::size_t position, std::size_t count);
    using Work = std::function<void(const CheckTask& task, ChildOutput& output)>;
    void runPasses(CheckTask& task, CheckedClass& checked);
    void runUntilFinished(CheckTask& task, CheckedClass& checked, const Work& work);
    bool runOnce(CheckTask& task, CheckedClass& checked, const Work& work);
    void receive(const Message& message, CheckTask& task, CheckedClass& checked);
    void receiveError(const std::string& line, const CheckTask& task);
    void finishReport();
    void showProgress(const std::string& request);
    std::vector<std::string> servedClasses() const;
    void reportRefusals();
    void unload(const std::vector<std::string>& classes);
    void reportEnd(const ChildResult& result, CheckTask& task);

    const Options& options_;
    const CheckOptions& checkOptions_;
    EmbeddedBroker broker_; // has the classes; only children load the provider
    std::vector<MethodCall> methods_;
    CheckReport report_;
    bool canLoad_ = true;
    bool hasHung_ = false;
    ProgressLine progress_;
    std::string class_;                           // for the progress
    std::string place_;                           // the same with the pass
    std::size_t left_ = 0;                        // of the pass's queries, when they are counted
    std::map<std::size_t, Message> atWork_;       // what the child has begun and not ended
    std::string lastRequest_;                     // that the child has begun
    std::map<std::string, unsigned int> crashes_; // of groups of queries with a failing call
    std::string unserved_;             // the class of the child's last upcall that found no provider
    std::vector<std::string> untried_; // what children could not try
    std::set<std::string> skipped_;    // all that has ended or blocked the provider
};

std::vector<std::string> CheckRun::classNames() const {
    std::vector<std::string> names;
    for (const std::string& name : checkOptions_.classes) {
        if (!broker_.isDeclared(name)) {
            throw BrokerError("class " + name + " is not declared; name its MOF file with --mof");
        }
        names.push_back(name);
    }
    if (!names.empty()) {
        return names;
    }
    for (const std::string& name : broker_.declaredClasses()) {
        if (!broker_.isAbstract(name)) {
            names.push_back(name);
        }
    }
    if (names.empty()) {
        throw BrokerError("no class to check: name MOF files that declare the provider's classes with --mof");
    }
    return names;
}

// The words of a text, at spaces that stand outside double quotes.
std::vector<std::string> wordsIn(const std::string& text) {
    std::vector<std::string> words;
    bool isInWord = false;
    bool isQuoted = false;
    for (const char c : text) {
        isQuoted = c == '"' ? !isQuoted : isQuoted;
        if (c == ' ' && !isQuoted) {
            isInWord = false;
            continue;
        }
        if (!isInWord) {
            words.emplace_back();
        }
        isInWord = true;
        words.back() += c;
    }
    return words;
}

MethodCall CheckRun::methodCall(const std::string& text) const {
    std::vector<std::string> words = wordsIn(text);
    const std::size_t point = words.empty() ? std::string::npos : words.front().find('.');
    if (point == std::string::npos) {
        throw BrokerError("method '" + text + "' is not CLASS.METHOD name=value ...");
    }
    MethodCall call = {
        words.front().substr(0, point), words.front().substr(point + 1), {words.begin() + 1, words.end()}};
    if (!findMethod(broker_, call.className, call.method)) {
        throw BrokerError("method '" + text + "': no class that --mof declares has it");
    }
    return call;
}

CheckReport CheckRun::run() {
    for (const std::string& text : checkOptions_.methods) {
        methods_.push_back(methodCall(text));
    }
    for (const Pass& pass : passes()) {
        report_.passes.emplace_back(pass.name);
    }
    if (!methods_.empty()) {
        report_.passes.emplace_back(argumentsPass);
    }
    report_.passes.emplace_back(residuePass);
    report_.passes.emplace_back(unloadingPass);
    for (const std::string& name : classNames()) {
        report_.classes.push_back({name, false, 0, ""});
    }
    for (const MethodCall& call : methods_) {
        const bool isChecked =
            std::any_of(report_.classes.begin(), report_.classes.end(),
                        [&](const CheckedClass& checked) { return sameName(checked.name, call.className); });
        if (!isChecked) {
            throw BrokerError("method " + call.className + '.' + call.method +
                              " is of no class that is checked; name the class with --class");
        }
    }
    for (std::size_t i = 0; i < report_.classes.size(); ++i) {
        runClass(i, report_.classes.size());
        if (!canLoad_) {
            return std::move(report_);
        }
    }
    reportRefusals();
    const std::vector<std::string> served = servedClasses();
    if (!served.empty()) {
        unload(served);
    }
    if (served.empty() && report_.findings.empty()) {
        throw BrokerError("the provider serves none of the classes; its answer for " +
                          report_.classes.front().name + " is " + report_.classes.front().answer +
                          "; name its MOF files with --mof");
    }
    finishReport();
    return std::move(report_);
}

std::vector<std::string> CheckRun::servedClasses() const {
    std::vector<std::string> names;
    for (const CheckedClass& checked : report_.classes) {
        if (checked.isServed) {
            names.push_back(checked.name);
        }
    }
    return names;
}

// The part of a class's name that says whose it is.
std::string schemaOf(const std::string& className) {
    return encoding::foldedName(className.substr(0, className.find('_')));
}

// Classes of others, such as the standard's, are refused rightly. That one of the provider's own schema is
// not known to it is most often a mistake in a name.
void CheckRun::reportRefusals() {
    std::set<std::string> schemas;
    for (const std::string& name : servedClasses()) {
        schemas.insert(schemaOf(name));
    }
    for (const CheckedClass& checked : report_.classes) {
        const bool isNamed = !checkOptions_.classes.empty(); // then its refusal has been told
        if (!checked.isServed && !isNamed && schemas.count(schemaOf(checked.name)) != 0) {
            report_.findings.add({CheckKind::notServed, checked.name, passes().front().name,
                                  textOf(queryOf("ein", checked.name)),
                                  checked.answer + "; it serves other classes of this schema: does it"
                                                   " compare the class with a misspelt name?"});
        }
    }
}

void CheckRun::finishReport() {
    std::vector<std::string> called;
    for (const MethodCall& call : methods_) {
        called.push_back(call.className + '.' + call.method);
    }
    report_.untested =
        untestedBy(broker_, report_, called, sampleSize(checkOptions_.isExhaustive), checkOptions_.writes);
    for (const std::string& text : untried_) {
        if (std::find(report_.untested.begin(), report_.untested.end(), text) == report_.untested.end()) {
            report_.untested.push_back(text);
        }
    }
    for (const std::string& text : report_.untested) {
        if (checkOptions_.isStrict) {
            report_.findings.add({CheckKind::untested, "", "", "", text});
        }
    }
}

void CheckRun::unload(const std::vector<std::string>& classes) {
    CheckTask task;
    task.pass = unloadingPass;
    task.skipped = skipped_;
    place_ = unloadingPass;
    if (task.skipped.count(cleaningUp) == 0) {
        CheckedClass unused;
        runOnce(task, unused, [&](const CheckTask& given, ChildOutput& output) {
            runUnloading(broker_, options_, given, classes, output);
        });
    }
}

void CheckRun::runClass(std::size_t position, std::size_t count) {
    CheckedClass& checked = report_.classes[position];
    CheckTask task;
    task.className = checked.name;
    task.isNamed = !checkOptions_.classes.empty();
    task.threads = checkOptions_.threads;
    task.rounds = checkOptions_.repetitions;
    for (const MethodCall& call : methods_) {
        if (sameName(call.className, checked.name)) {
            task.methods.push_back(call);
        }
    }
    class_ = checked.name + " (" + std::to_string(position + 1) + " of " + std::to_string(count) + "), ";
    runPasses(task, checked);
}

void CheckRun::runPasses(CheckTask& task, CheckedClass& checked) {
    constexpr std::size_t fewer = 5; // how keys come makes no difference between instances
    const auto run = [&](const char* name, const Work& work) {
        task.pass = name;
        task.firstKnown = 0;
        crashes_.clear();
        place_ = class_ + name;
        runUntilFinished(task, checked, work);
    };
    for (const Pass& pass : passes()) {
        task.isFirst = &pass == &passes().front();
        task.sample =
            checkOptions_.isExhaustive || task.isFirst ? sampleSize(checkOptions_.isExhaustive) : fewer;
        task.writes = checkOptions_.writes && task.isFirst;
        task.conduct = pass.conduct;
        run(pass.name, [&](const CheckTask& given, ChildOutput& output) {
            runPass(broker_, options_, given, pass, output);
        });
        if (!checked.isServed || !canLoad_) {
            return;
        }
    }
    if (!task.methods.empty()) {
        run(argumentsPass, [&](const CheckTask& given, ChildOutput& output) {
            runArguments(broker_, options_, given, output);
        });
    }
    run(residuePass,
        [&](const CheckTask& given, ChildOutput& output) { runResidue(broker_, options_, given, output); });
}

// Each time that a child ends early or hangs, what did it is left out, and another child goes on.
void CheckRun::runUntilFinished(CheckTask& task, CheckedClass& checked, const Work& work) {
    constexpr int mostCrashes = 300;
    constexpr int mostHangs = 5;
    int crashes = 0;
    int hangs = 0;
    while (crashes < mostCrashes && hangs < mostHangs) {
        if (task.isFirst) {
            task.known.clear(); // this child tells them anew
        }
        if (runOnce(task, checked, work)) {
            return;
        }
        canLoad_ = task.skipped.count(loading) == 0;
        if (!canLoad_) {
            return;
        }
        ++(hasHung_ ? hangs : crashes);
    }
    report_.findings.add({CheckKind::crash, task.className, task.pass, "",
                          "the pass was given up after " + std::to_string(crashes) + " crashes and " +
                              std::to_string(hangs) + " hangs; what follows is not checked"});
}

bool CheckRun::runOnce(CheckTask& task, CheckedClass& checked, const Work& work) {
    atWork_.clear();
    unserved_.clear();
    left_ = 0;
    std::cout.flush();
    const ChildReceiver receiver = {[&](const std::string& line) { receive(messageOf(line), task, checked); },
                                    [&](const std::string& line) { receiveError(line, task); }};
    const ChildResult result = runInChild([&](ChildOutput& output) { work(task, output); }, receiver,
                                          std::chrono::seconds(checkOptions_.timeoutSeconds));
    hasHung_ = result.end == ChildEnd::hung;
    if (result.end == ChildEnd::finished) {
        return true;
    }
    reportEnd(result, task);
    return false;
}

void CheckRun::receive(const Message& message, CheckTask& task, CheckedClass& checked) {
    switch (message.kind) {
    case Message::Kind::begin:
        ++report_.requests;
        atWork_[message.number] = message;
        lastRequest_ = message.text;
        showProgress(message.text);
        break;
    case Message::Kind::end:
        atWork_.erase(message.number);
        break;
    case Message::Kind::finding:
        report_.findings.add(message.finding);
        break;
    case Message::Kind::classServed:
        checked.isServed = true;
        checked.instances = std::max(checked.instances, message.number);
        break;
    case Message::Kind::classRefused:
        checked.answer = message.text;
        break;
    case Message::Kind::unserved:
        unserved_ = message.text;
        break;
    case Message::Kind::unusable:
        throw BrokerError(message.text);
    case Message::Kind::asked:
        task.known.push_back(message.known);
        break;
    case Message::Kind::queriesLeft:
        task.firstKnown += left_ > message.number ? left_ - message.number : 0;
        left_ = message.number;
        break;
    case Message::Kind::untested:
        untried_.push_back(message.text);
        break;
    }
}

// The pass, the class and what is left come first: a line of a terminal may be too short for the rest.
void CheckRun::showProgress(const std::string& request) {
    progress_.show(place_ + (left_ > 0 ? ", " + std::to_string(left_) + " left" : "") + ": " + request);
}

// What the child writes to its standard error stream is the user's to read, and a sanitizer's report besides.
void CheckRun::receiveError(const std::string& line, const CheckTask& task) {
    std::cerr << line << '\n';
    const std::string report = sanitizerReport(line);
    const bool isTold = task.pass == unloadingPass; // which repeats requests of earlier passes
    if (!report.empty() && !isTold) {
        report_.findings.add({CheckKind::sanitizer, task.className, task.pass, lastRequest_, report});
    }
}

// Of several threads' requests, each may be the one that did it. What one slot's failing calls do again and
// again is given up for that slot.
void CheckRun::reportEnd(const ChildResult& result, CheckTask& task) {
    constexpr unsigned int mostOfAGroup = 4;
    std::string requests;
    for (const auto& [number, begun] : atWork_) {
        requests += (requests.empty() ? "" : " | ") + begun.text;
        task.skipped.insert(begun.text);
        skipped_.insert(begun.text);
        if (!begun.group.empty()) {
            task.skippedFaults.insert(begun.summary);
            if (++crashes_[begun.group] >= mostOfAGroup) {
                task.skippedFaults.insert(begun.group);
            }
        }
    }
    const bool isCrash = result.end == ChildEnd::crashed;
    const std::string what =
        (isCrash ? result.text : "no answer for " + std::to_string(checkOptions_.timeoutSeconds) + " s") +
        (isCrash && !unserved_.empty() ? " after " + unservedWords(unserved_) : "");
    report_.findings.add({isCrash ? CheckKind::crash : CheckKind::hang, task.className, task.pass, requests,
                          atWork_.empty() ? what : atWork_.begin()->second.summary + ": " + what});
}

} // namespace

int runCheck(const Options& options, const CheckOptions& checkOptions) {
    if (!options.faults.empty() || options.hasConduct) {
        throw BrokerError(
            "check puts faults, keys, instances and paths on the provider itself: leave --fault, "
            "--keys, --new-instance and --path out");
    }
    const CheckReport report = CheckRun(options, checkOptions).run();
    const bool isColoured = ::isatty(STDOUT_FILENO) == 1 && std::getenv("NO_COLOR") == nullptr;
    printReport(std::cout, options.format, report, isColoured);
    return report.findings.empty() ? 0 : 1;
}

} // namespace oxahv::runner
