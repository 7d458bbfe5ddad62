#include "check/ProcessState.h"

#include <algorithm>
#include <cerrno>
#include <clocale>
#include <cstdio>
#include <cstring>
#include <dirent.h>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <malloc.h>
#include <memory>
#include <sys/mman.h>
#include <system_error>
#include <unistd.h>

namespace oxahv::runner {

namespace {

// Only one line of it: reading the umask by umask() would change it for a moment.
mode_t currentUmask() {
    std::ifstream stream("/proc/self/status");
    const std::string label = "Umask:";
    for (std::string line; std::getline(stream, line);) {
        if (line.rfind(label, 0) == 0) {
            return static_cast<mode_t>(std::stoul(line.substr(label.size()), nullptr, 8));
        }
    }
    return 0;
}

std::map<std::string, std::string> currentEnvironment() {
    std::map<std::string, std::string> all;
    for (char** entry = ::environ; entry != nullptr && *entry != nullptr; ++entry) {
        const std::string text = *entry;
        const std::size_t equals = text.find('=');
        all[text.substr(0, equals)] = equals != std::string::npos ? text.substr(equals + 1) : "";
    }
    return all;
}

std::map<int, std::string> currentDescriptors() {
    std::map<int, std::string> all;
    const std::unique_ptr<DIR, int (*)(DIR*)> folder(::opendir("/proc/self/fd"), ::closedir);
    for (const dirent* entry = nullptr; folder && (entry = ::readdir(folder.get())) != nullptr;) {
        const std::string name = entry->d_name;
        if (name.find_first_not_of("0123456789") == std::string::npos &&
            std::stoi(name) != ::dirfd(folder.get())) {
            std::error_code error;
            all[std::stoi(name)] = std::filesystem::read_symlink("/proc/self/fd/" + name, error).string();
        }
    }
    return all;
}

std::size_t currentThreads() {
    std::error_code error;
    const std::filesystem::directory_iterator tasks("/proc/self/task", error);
    return error ? 0 : static_cast<std::size_t>(std::distance(begin(tasks), end(tasks)));
}

std::string octal(mode_t mode) {
    std::string text;
    for (const unsigned int shift : {6U, 3U, 0U}) {
        text += static_cast<char>('0' + (mode >> shift & 7U));
    }
    return text;
}

void compareEnvironments(const ProcessState& before, const ProcessState& after,
                         std::vector<std::string>& changes) {
    for (const auto& [name, value] : after.environment) {
        const auto found = before.environment.find(name);
        if (found == before.environment.end() || found->second != value) {
            changes.push_back("sets the environment variable " + name);
        }
    }
    for (const auto& [name, value] : before.environment) {
        if (after.environment.count(name) == 0) {
            changes.push_back("removes the environment variable " + name);
        }
    }
}

void compareStreams(const ProcessState& before, const ProcessState& after,
                    std::vector<std::string>& changes) {
    for (const auto& [number, target] : before.descriptors) {
        const auto found = after.descriptors.find(number);
        if (found == after.descriptors.end()) {
            changes.push_back("closes descriptor " + std::to_string(number) + ", which it has not opened");
        } else if (found->second != target && number <= STDERR_FILENO) {
            changes.push_back("opens descriptor " + std::to_string(number) + " for " + found->second);
        }
    }
}

} // namespace

ProcessState currentState() {
    ProcessState state;
    state.locale = std::setlocale(LC_ALL, nullptr);
    state.threadLocale = ::uselocale(nullptr);
    state.umask = currentUmask();
    std::error_code error;
    state.folder = std::filesystem::current_path(error).string();
    state.environment = currentEnvironment();
    for (int number = 1; number < static_cast<int>(state.handlers.size()); ++number) {
        struct sigaction action = {};
        if (::sigaction(number, nullptr, &action) == 0) {
            std::memcpy(&state.handlers.at(static_cast<std::size_t>(number)), &action.sa_handler,
                        sizeof(void*));
        }
    }
    state.descriptors = currentDescriptors();
    state.threads = currentThreads();
    return state;
}

std::vector<std::string> stateChanges(const ProcessState& before, const ProcessState& after) {
    std::vector<std::string> changes;
    if (before.locale != after.locale) {
        changes.push_back("changes the locale of the process from " + before.locale + " to " + after.locale);
    }
    if (before.threadLocale != after.threadLocale) {
        changes.emplace_back("leaves its thread in another locale");
    }
    if (before.umask != after.umask) {
        changes.push_back("changes the umask from " + octal(before.umask) + " to " + octal(after.umask));
    }
    if (before.folder != after.folder) {
        changes.push_back("changes the working folder to " + after.folder);
    }
    compareEnvironments(before, after, changes);
    for (std::size_t number = 1; number < before.handlers.size(); ++number) {
        if (before.handlers.at(number) != after.handlers.at(number)) {
            changes.push_back("changes the handler of signal " + std::to_string(number) + " (" +
                              ::strsignal(static_cast<int>(number)) + ')');
        }
    }
    compareStreams(before, after, changes);
    return changes;
}

std::vector<std::string> newDescriptors(const ProcessState& before, const ProcessState& after) {
    std::vector<std::string> all;
    for (const auto& [number, target] : after.descriptors) {
        if (before.descriptors.count(number) == 0) {
            all.push_back("descriptor " + std::to_string(number) + " (" + target + ')');
        }
    }
    return all;
}

std::size_t heapInUse() {
    const struct mallinfo2 info = ::mallinfo2();
    return info.uordblks + info.hblkhd;
}

CapturedOutput::CapturedOutput()
    : file_(::memfd_create("standard output", MFD_CLOEXEC)),
      standardOutput_(::fcntl(STDOUT_FILENO, F_DUPFD_CLOEXEC, 3)) {
    if (file_ < 0 || standardOutput_ < 0 || ::dup2(file_, STDOUT_FILENO) < 0) {
        throw std::system_error(errno, std::generic_category(), "capturing the standard output");
    }
}

CapturedOutput::~CapturedOutput() {
    ::dup2(standardOutput_, STDOUT_FILENO);
    ::close(standardOutput_);
    ::close(file_);
}

std::string CapturedOutput::take() const {
    std::cout.flush();
    static_cast<void>(std::fflush(stdout));
    std::string text(static_cast<std::size_t>(std::max<off_t>(::lseek(file_, 0, SEEK_END), 0)), '\0');
    const ssize_t size = ::pread(file_, text.data(), text.size(), 0);
    text.resize(static_cast<std::size_t>(std::max<ssize_t>(size, 0)));
    if (::ftruncate(file_, 0) == 0) {
        ::lseek(file_, 0, SEEK_SET);
    }
    return text;
}

} // namespace oxahv::runner
