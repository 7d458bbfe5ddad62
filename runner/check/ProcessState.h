// The state of this process that a provider must leave as it is, since the server shares it.
#pragma once

#include <array>
#include <clocale>
#include <csignal>
#include <map>
#include <string>
#include <sys/stat.h>
#include <vector>

namespace oxahv::runner {

struct ProcessState {
    std::string locale;
    locale_t threadLocale = nullptr;
    mode_t umask = 0;
    std::string folder;
    std::map<std::string, std::string> environment;
    std::array<const void*, 65> handlers{}; // of signals, by their numbers
    std::map<int, std::string> descriptors; // with what each is open for, such as "/dev/null" or "pipe"
    std::size_t threads = 0;
};

ProcessState currentState();

// A sentence for each part that differs, such as "changes the umask from 022 to 077"; closed standard streams
// among them. Descriptors and threads may come and go within a provider's life, and are not looked at here.
std::vector<std::string> stateChanges(const ProcessState& before, const ProcessState& after);

// The descriptors that only the second one has: "descriptor 7 (/tmp/log)".
std::vector<std::string> newDescriptors(const ProcessState& before, const ProcessState& after);

// Bytes of the heap that are in use; 0 where the allocator does not say.
std::size_t heapInUse();

// Collects what this process writes to its standard output, in a file without name.
class CapturedOutput {
public:
    CapturedOutput();
    ~CapturedOutput();
    CapturedOutput(const CapturedOutput&) = delete;
    CapturedOutput& operator=(const CapturedOutput&) = delete;

    // What was written since the last call.
    std::string take() const;

private:
    int file_;
    int standardOutput_; // what it was before
};

} // namespace oxahv::runner
