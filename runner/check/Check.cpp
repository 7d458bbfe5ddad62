#include "check/Check.h"

#include "check/CrashLine.h"
#include "check/Examination.h"
#include "check/Strain.h"
#include "check/Unloading.h"
#include "show/ProgressLine.h"
#include "show/Text.h"
#include "show/Values.h"

#include <Names.h>
#include <algorithm>
#include <chrono>
#include <iostream>
#include <map>
#include <set>
#include <unistd.h>

namespace oxahv::runner {

namespace {

struct Pass {
    const char* name;
    Conduct conduct;
    bool reports; // what any request shows; the last passes look for something else
    void (*strain)(Client& client);
};

const std::vector<Pass>& passes() {
    constexpr auto full = NewInstances::full;
    static const std::vector<Pass> all = {
        {"exact keys", {}, true, nullptr},
        {"untyped keys", {KeyMode::untyped}, true, strainByConduct},
        {"signed keys", {KeyMode::signedIntegers}, true, strainByConduct},
        {"chars keys", {KeyMode::chars}, true, strainByConduct},
        {"text keys", {KeyMode::text}, true, strainByConduct},
        {"bare instances", {KeyMode::exact, NewInstances::bare}, true, nullptr},
        {"reversed keys", {KeyMode::exact, full, {true, false, ""}}, true, strainByConduct},
        {"other case", {KeyMode::exact, full, {false, true, ""}}, true, strainByConduct},
        {"host", {KeyMode::exact, full, {false, false, "host.example.com"}}, true, strainByConduct},
        {"threads", {}, false, strainByThreads},
        {"faults", {}, false, strainByFaults},
    };
    return all;
}
constexpr const char* unloadingPass = "unloading";

// In the child

constexpr const char* loading = "loading the provider";
constexpr const char* cleaningUp = "the provider's cleanup";

void unloadProviders(Client& client) {
    client.doing(cleaningUp, [&] {
        for (const Library& library : client.options().libraries) {
            client.broker().unload(providerName(library));
        }
    });
}

void endProvider(Client& client, std::size_t before) {
    if (client.task().skipped.count(cleaningUp) != 0) {
        return;
    }
    unloadProviders(client);
    const std::size_t after = client.broker().liveObjects().total();
    if (after > before) {
        client.find(CheckKind::leftOver, cleaningUp,
                    "objects left at the end: " + std::to_string(after - before));
    }
}

void load(Client& client) {
    client.broker().setUnservedHandler([&client](const std::string& className) {
        client.tell({Message::Kind::unserved, 0, className});
    });
    client.broker().setMessageHandler([&client](const BrokerMessage& message) {
        if (message.isBrokers) {
            client.find(CheckKind::exception, cleaningUp, message.text);
        }
    });
    client.doing(loading, [&] { loadProviders(client.broker(), client.options()); });
}

void runTask(EmbeddedBroker& broker, const Options& options, const CheckTask& task, const Pass& pass,
             ChildOutput& output) {
    Client client(broker, options, task, output, pass.reports);
    const std::size_t before = broker.liveObjects().total();
    try {
        load(client);
        apply(broker, pass.conduct);
        Examination(client).run();
        client.setReports(true);
        if (pass.strain != nullptr) {
            pass.strain(client);
        }
        if (pass.reports) {
            endProvider(client, before);
        }
    } catch (const std::exception& exception) {
        client.tell({Message::Kind::unusable, 0, exception.what()});
    }
    broker.setUnservedHandler(nullptr);
    broker.setMessageHandler(nullptr);
}

// Sends what every client sends, unloads the libraries and looks whether they are gone.
void runUnloading(EmbeddedBroker& broker, const Options& options, const CheckTask& task,
                  const std::vector<std::string>& classes, ChildOutput& output) {
    Client client(broker, options, task, output, false); // what the requests show has been told
    try {
        load(client);
        for (const std::string& className : classes) {
            client.askPlainly(queryOf("ei", className));
            const std::optional<Answer> names = client.askPlainly(queryOf("ein", className));
            if (names && !names->results.empty()) {
                client.askPlainly(queryOf("gi", names->results.front().path));
            }
        }
        unloadProviders(client);
        client.setReports(true);
        for (const Library& library : options.libraries) {
            const std::string why = whyStillMapped(library.file);
            if (!why.empty()) {
                client.find(CheckKind::staysMapped, cleaningUp,
                            providerName(library) + " stays mapped when it is unloaded: " + why);
            }
        }
    } catch (const std::exception& exception) {
        client.tell({Message::Kind::unusable, 0, exception.what()});
    }
    broker.setUnservedHandler(nullptr);
    broker.setMessageHandler(nullptr);
}

// In the parent

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
    void runPass(const Pass& pass, CheckTask& task, CheckedClass& checked);
    bool runOnce(CheckTask& task, CheckedClass& checked, const std::function<void(ChildOutput&)>& work);
    std::vector<std::string> servedClasses() const;
    void mindRefusals();
    void unload(const std::vector<std::string>& classes);
    void receive(const Message& message, CheckedClass& checked);
    void reportEnd(const ChildResult& result, CheckTask& task);

    const Options& options_;
    const CheckOptions& checkOptions_;
    EmbeddedBroker broker_; // has the classes; only children load the provider
    std::vector<MethodCall> methods_;
    CheckReport report_;
    bool canLoad_ = true;
    ProgressLine progress_;
    std::string place_;                         // for the progress
    std::map<std::size_t, std::string> atWork_; // the child's requests that have begun and not ended
    std::string unserved_;                      // the class of the child's last upcall that found no provider
    std::set<std::string> skipped_;             // all that has ended or blocked the provider
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
    mindRefusals();
    const std::vector<std::string> served = servedClasses();
    if (!served.empty()) {
        unload(served);
    }
    if (served.empty() && report_.findings.empty()) {
        throw BrokerError("the provider serves none of the classes; its answer for " +
                          report_.classes.front().name + " is " + report_.classes.front().answer +
                          "; name its MOF files with --mof");
    }
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
void CheckRun::mindRefusals() {
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

void CheckRun::unload(const std::vector<std::string>& classes) {
    CheckTask task;
    task.pass = unloadingPass;
    task.skipped = skipped_;
    place_ = std::string(unloadingPass) + ": ";
    if (task.skipped.count(cleaningUp) == 0) {
        CheckedClass unused;
        runOnce(task, unused,
                [&](ChildOutput& output) { runUnloading(broker_, options_, task, classes, output); });
    }
}

void CheckRun::runClass(std::size_t position, std::size_t count) {
    CheckedClass& checked = report_.classes[position];
    CheckTask task;
    task.className = checked.name;
    task.isNamed = !checkOptions_.classes.empty();
    task.threads = checkOptions_.threads;
    for (const MethodCall& call : methods_) {
        if (sameName(call.className, checked.name)) {
            task.methods.push_back(call);
        }
    }
    for (const Pass& pass : passes()) {
        place_ = '[' + std::to_string(position + 1) + '/' + std::to_string(count) + "] " + pass.name + ": ";
        task.pass = pass.name;
        task.conduct = pass.conduct;
        runPass(pass, task, checked);
        if (!checked.isServed) {
            break;
        }
    }
}

// Each time that a child ends early or hangs, the request that did it is left out and the pass run again.
void CheckRun::runPass(const Pass& pass, CheckTask& task, CheckedClass& checked) {
    constexpr int mostAttempts = 20;
    for (int attempt = 0; attempt < mostAttempts; ++attempt) {
        const bool isFinished = runOnce(
            task, checked, [&](ChildOutput& output) { runTask(broker_, options_, task, pass, output); });
        canLoad_ = task.skipped.count(loading) == 0;
        if (isFinished || !canLoad_) {
            return;
        }
    }
    report_.findings.add({CheckKind::crash, task.className, task.pass, "",
                          "the pass was given up after " + std::to_string(mostAttempts) +
                              " crashes and hangs; what follows is not checked"});
}

bool CheckRun::runOnce(CheckTask& task, CheckedClass& checked,
                       const std::function<void(ChildOutput&)>& work) {
    atWork_.clear();
    unserved_.clear();
    std::cout.flush();
    const ChildResult result =
        runInChild(work,
                   {[&](const std::string& line) { receive(messageOf(line), checked); },
                    [](const std::string& line) { std::cerr << line << '\n'; }},
                   std::chrono::seconds(checkOptions_.timeoutSeconds));
    if (result.end == ChildEnd::finished) {
        return true;
    }
    reportEnd(result, task);
    return false;
}

void CheckRun::receive(const Message& message, CheckedClass& checked) {
    switch (message.kind) {
    case Message::Kind::begin:
        ++report_.requests;
        atWork_[message.number] = message.text;
        progress_.show(place_ + message.text);
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
    }
}

// What a request does, without its operands: what ends the provider in one way is one finding.
std::string briefly(const std::string& request) {
    const std::size_t fault = request.find(" --fault ");
    const std::string verb = request.substr(0, request.find(' '));
    const bool isVerb = verb.size() == 2 || verb == "ein";
    if (!isVerb || fault == std::string::npos) {
        return isVerb ? verb : request;
    }
    const std::size_t slot = fault + std::string(" --fault ").size();
    return verb + " with " + request.substr(slot, request.rfind(':') - slot) + " failing";
}

// Of several threads' requests, each may be the one that did it.
void CheckRun::reportEnd(const ChildResult& result, CheckTask& task) {
    std::string requests;
    for (const auto& [number, text] : atWork_) {
        requests += (requests.empty() ? "" : " | ") + text;
        task.skipped.insert(text);
        skipped_.insert(text);
    }
    const bool isCrash = result.end == ChildEnd::crashed;
    const std::string what =
        (isCrash ? result.text : "no answer for " + std::to_string(checkOptions_.timeoutSeconds) + " s") +
        (isCrash && !unserved_.empty() ? " after " + unservedWords(unserved_) : "");
    report_.findings.add({isCrash ? CheckKind::crash : CheckKind::hang, task.className, task.pass, requests,
                          atWork_.empty() ? what : briefly(atWork_.begin()->second) + ": " + what});
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
