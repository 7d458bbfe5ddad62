#include "check/Processes.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <dirent.h>
#include <fstream>
#include <iterator>
#include <memory>
#include <sstream>
#include <sys/wait.h>
#include <unistd.h>

namespace oxahv::runner {

namespace {

// The name stands in parentheses and may hold any character, so its end is the last one of the line.
ProcessEntry entryOf(const std::string& folder) {
    std::ifstream stream("/proc/" + folder + "/stat");
    std::string line;
    std::getline(stream, line);
    const std::size_t begin = line.find('(');
    const std::size_t end = line.rfind(')');
    ProcessEntry entry;
    if (begin == std::string::npos || end == std::string::npos || end < begin) {
        return entry; // it has ended
    }
    std::istringstream rest(line.substr(end + 1));
    std::string state;
    rest >> state >> entry.parent;
    entry.id = static_cast<pid_t>(std::stol(folder));
    entry.name = line.substr(begin + 1, end - begin - 1);
    return entry;
}

} // namespace

std::vector<ProcessEntry> allProcesses() {
    std::vector<ProcessEntry> all;
    const std::unique_ptr<DIR, int (*)(DIR*)> folder(::opendir("/proc"), ::closedir);
    for (const dirent* entry = nullptr; folder && (entry = ::readdir(folder.get())) != nullptr;) {
        const std::string name = entry->d_name;
        if (name.find_first_not_of("0123456789") == std::string::npos) {
            all.push_back(entryOf(name));
        }
    }
    return all;
}

std::vector<ProcessEntry> childrenOf(pid_t parent) {
    std::vector<ProcessEntry> all = allProcesses();
    all.erase(
        std::remove_if(all.begin(), all.end(),
                       [&](const ProcessEntry& entry) { return entry.id == 0 || entry.parent != parent; }),
        all.end());
    return all;
}

void killDescendants() {
    while (true) {
        for (const ProcessEntry& child : childrenOf(::getpid())) {
            ::kill(child.id, SIGKILL);
        }
        const pid_t ended = ::waitpid(-1, nullptr, 0);
        if (ended < 0 && errno != EINTR) {
            return; // ECHILD: there is none left
        }
    }
}

} // namespace oxahv::runner
