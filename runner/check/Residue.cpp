#include "check/Residue.h"

#include "check/ProcessState.h"
#include "check/Processes.h"
#include "check/Strain.h"
#include "show/Text.h"

#include <algorithm>
#include <chrono>
#include <dlfcn.h>
#include <thread>
#include <unistd.h>

namespace oxahv::runner {

namespace {

constexpr const char* loading = "loading the provider";
constexpr const char* ending = "the provider's cleanup";

class Residue {
public:
    explicit Residue(Client& client) : client_(client), start_(currentState()), last_(start_) {}

    void run(const std::function<void()>& load, const std::function<void()>& unload) {
        load();
        compareState(loading, loading);
        const std::vector<KnownQuery> chosen = oneOfEachShape(client_.task().known);
        for (std::size_t i = client_.task().firstKnown; i < chosen.size(); ++i) {
            client_.tell({Message::Kind::queriesLeft, chosen.size() - i, ""});
            if (!chosen[i].leavesObjects) { // which take heap too
                repeat(chosen[i].query);
            }
        }
        unload();
        compareState(ending, ending);
        compareEnd();
    }

private:
    void repeat(const Query& query) {
        const std::string request = textOf(query);
        const std::string verb = query.operation->name;
        client_.askPlainly(query);
        compareState(request, verb);
        client_.askPlainly(query); // what it keeps from the first time on, it has now
        const ProcessState warm = currentState();
        client_.askPlainly(query);
        const ProcessState second = currentState();
        client_.askPlainly(query);
        const std::vector<std::string> left = newDescriptors(second, currentState());
        if (!newDescriptors(warm, second).empty() && !left.empty()) {
            client_.find(CheckKind::residue, request,
                         (verb + " leaves ").append(left.front()).append(" open each time"));
        }
        last_ = currentState();
        findLeak(query);
    }

    // A cache or a pool grows for a while; a leak grows for ever.
    void findLeak(const Query& query) {
        constexpr std::size_t few = 8;
        constexpr std::size_t many = 100;
        constexpr std::size_t least = 16; // the smallest block of the heap
        if (growth(query, few) < few * least || growth(query, few) < few * least) {
            return;
        }
        growth(query, many);
        std::size_t bytes = growth(query, many);
        for (int i = 0; i < 3 && bytes >= many * least; ++i) { // a table that grows at last is none
            bytes = std::min(bytes, growth(query, many));
        }
        if (bytes >= many * least) {
            std::string text = query.operation->name;
            text.append(" leaves ")
                .append(std::to_string(bytes / many))
                .append(" bytes of the heap each time");
            client_.find(CheckKind::residue, textOf(query), text);
        }
    }

    std::size_t growth(const Query& query, std::size_t times) {
        client_.broker().forgetDeadObjects(); // their memory would count as what the provider leaves
        const std::size_t before = heapInUse();
        for (std::size_t i = 0; i < times; ++i) {
            client_.askPlainly(query);
        }
        client_.broker().forgetDeadObjects();
        const std::size_t after = heapInUse();
        return after > before ? after - before : 0;
    }

    // Reports what has changed since the last time.
    void compareState(const std::string& request, const std::string& what) {
        const std::string text = output_.take();
        if (!text.empty()) {
            client_.find(CheckKind::residue, request,
                         what + " writes to the standard output: " + printable(text, 60));
        }
        ProcessState now = currentState();
        for (const std::string& change : stateChanges(last_, now)) {
            client_.find(CheckKind::residue, request, what + ' ' + change);
        }
        last_ = std::move(now);
    }

    // Threads need a moment to end.
    void compareEnd() {
        for (int i = 0; i < 20 && currentState().threads > start_.threads; ++i) {
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
        }
        const ProcessState end = currentState();
        if (end.threads > start_.threads) {
            find("leaves a thread running, in code that is unloaded: " +
                 std::to_string(end.threads - start_.threads));
        }
        for (const std::string& descriptor : newDescriptors(start_, end)) {
            find("leaves " + descriptor + " open");
        }
        for (const ProcessEntry& process : remainingProcesses()) {
            find("leaves a process: " + process.name);
        }
        reportLeaks();
    }

    // The parent's other children are orphans of this process's.
    static std::vector<ProcessEntry> remainingProcesses() {
        std::vector<ProcessEntry> remaining;
        for (const ProcessEntry& process : allProcesses()) {
            const bool isBelow = process.parent == ::getpid() || process.parent == ::getppid();
            if (isBelow && process.id != ::getpid() && process.id != 0) {
                remaining.push_back(process);
            }
        }
        return remaining;
    }

    // The runtime of a sanitizer, where there is one, reports leaks at the end of a process that this one
    // does not reach.
    static void reportLeaks() {
        void* const check = ::dlsym(RTLD_DEFAULT, "__lsan_do_recoverable_leak_check");
        if (check != nullptr) {
            reinterpret_cast<int (*)()>(check)();
        }
    }

    void find(const std::string& text) { client_.find(CheckKind::residue, ending, "the provider " + text); }

    Client& client_;
    CapturedOutput output_;
    ProcessState start_;
    ProcessState last_;
};

} // namespace

void findResidue(Client& client, const std::function<void()>& load, const std::function<void()>& unload) {
    Residue(client).run(load, unload);
}

} // namespace oxahv::runner
