// The processes below one, as the kernel lists them.
#pragma once

#include <string>
#include <sys/types.h>
#include <vector>

namespace oxahv::runner {

struct ProcessEntry {
    pid_t id = 0;
    pid_t parent = 0;
    std::string name; // of its program, at most 15 characters
};

// All processes that this one may see. Some may have ended, and others begun, by the time of the return.
std::vector<ProcessEntry> allProcesses();

// The children of a process.
std::vector<ProcessEntry> childrenOf(pid_t parent);

// Kills and reaps all processes below this one until there are none left. Of its grandchildren only those are
// found that become its children as their parents die, so this process has to be a subreaper.
void killDescendants();

} // namespace oxahv::runner
