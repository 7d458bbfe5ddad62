// What the tests of the command need: to start it as a shell would. RUNNER is its file.
#pragma once

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <string>
#include <sys/wait.h>
#include <unistd.h>

struct Outcome {
    int status; // -1: it was killed
    std::string output;
};

inline Outcome shell(const std::string& command) {
    FILE* const pipe = popen(command.c_str(), "r");
    std::string output;
    for (int c = 0; (c = std::fgetc(pipe)) != EOF;) {
        output += static_cast<char>(c);
    }
    const int status = pclose(pipe);
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, output};
}

inline Outcome run(const std::string& arguments, const std::string& redirection = "2>&1") {
    return shell(RUNNER " " + arguments + ' ' + redirection);
}

inline void expectFailure(const std::string& arguments, int status, const std::string& line) {
    const Outcome outcome = run(arguments);
    EXPECT_EQ(outcome.status, status) << arguments;
    EXPECT_EQ(outcome.output, "oxahv-provider: " + line + '\n') << arguments;
}

inline std::string onTerminal(const std::string& command) {
    return shell("script -qec \"" + command + "\" /dev/null </dev/null").output;
}

// A file that is gone at the end.
class File {
public:
    explicit File(const std::string& content = "") { std::ofstream(path_) << content; }
    ~File() { std::filesystem::remove(path_); }
    File(const File&) = delete;
    File& operator=(const File&) = delete;
    const std::string& path() const { return path_; }

private:
    static inline int count_ = 0;
    const std::string path_ =
        testing::TempDir() + "oxahv-command-" + std::to_string(::getpid()) + '-' + std::to_string(++count_);
};
