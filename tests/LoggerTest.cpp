// The logger: which messages it writes, where to, and what it survives.
#include "FailingMemory.h"
#include "ScratchFolder.h"

#include "HVLogger.h"
#include "HVMessageBuffer.h"

#include <atomic>
#include <fcntl.h>
#include <future>
#include <stdexcept>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <system_error>
#include <thread>
#include <unistd.h>
#include <vector>

using HVLog::HVLogger;
using HVLog::HVMessageBuffer;

namespace {

void log(int level, const std::string& text = "text") {
    HVLogger::logLevelMessage("function", "File.cpp", 3, "Test", level, nullptr, 0, 0, text);
}

class LoggerTest : public testing::Test, protected ScratchFolder {
protected:
    ~LoggerTest() override { HVLogger::reset(); }

    void keepLevels() {
        HVLogger::setSink([this](const HVLog::Message& message) { levels_.push_back(message.level); });
    }
    void writeToFile() {
        HVLogger::setFileSink(path());
        HVLogger::setThreshold(0);
    }

    std::vector<int> levels_;
};

} // namespace

TEST_F(LoggerTest, WritesByThresholdAndLevelOnceItHasASink) {
    keepLevels();
    log(6000); // there is no threshold
    HVLogger::setSink(nullptr);
    HVLogger::setThreshold(4000);
    HVLogger::setLevel(6000, false);
    HVLogger::setLevel(1000, true);
    log(4000);
    keepLevels();
    for (const int level : {1000, 3000, 3999, 4000, 4001, 6000}) {
        log(level);
    }
    EXPECT_THROW(HVLogger::setFileSink("/no such folder/file"), std::system_error);
    log(4002); // to the sink that there was
    HVLogger::reset();
    keepLevels();
    log(1000);
    log(5000);
    EXPECT_EQ(levels_, std::vector<int>({1000, 4000, 4001, 4002}));
}

TEST_F(LoggerTest, PassesTheWholeMessageToTheSink) {
    std::vector<std::string> seen;
    HVLogger::setSink([&](const HVLog::Message& m) {
        seen.push_back(std::string(m.function) + '|' + m.file + '|' + std::to_string(m.line) + '|' + m.text);
        seen.push_back(HVLogger::lineOf(m));
    });
    HVLogger::setThreshold(3000);
    log(4000, "one\ntwo");
    HVLogger::traceLevelMessage("function", "File.cpp", 3, "Test", 3000, nullptr, 0, 0, "text");
    EXPECT_EQ(seen, std::vector<std::string>({"function|File.cpp|3|one\ntwo", "log 4000 Test one two",
                                              "function|File.cpp|3|text", "trace 3000 Test text"}));
}

TEST_F(LoggerTest, DropsMessagesOfItsSinkAndPassesOnExceptions) {
    int calls = 0;
    HVLogger::setSink([&](const HVLog::Message&) {
        ++calls;
        log(6000);
        throw std::runtime_error("sink");
    });
    HVLogger::setThreshold(0);
    EXPECT_THROW(log(6000), std::runtime_error);
    EXPECT_THROW(log(6000), std::runtime_error);
    EXPECT_EQ(calls, 2);
}

TEST_F(LoggerTest, LeavesNoFileOpenWhenMemoryRunsOut) {
    const auto nextDescriptor = [] {
        const int next = ::dup(STDIN_FILENO);
        ::close(next);
        return next;
    };
    const int next = nextDescriptor();
    bool hasFailed = true;
    for (unsigned int n = 1; hasFailed; ++n) {
        failing::allocation(n);
        try {
            HVLogger::setFileSink(path());
        } catch (const std::bad_alloc&) {
        }
        hasFailed = failing::ended();
        EXPECT_EQ(nextDescriptor() == next, hasFailed) << n;
    }
}

TEST_F(LoggerTest, SurvivesAClosedPipe) {
    ASSERT_EQ(::mkfifo(path().c_str(), 0600), 0);
    const int reader = ::open(path().c_str(), O_RDONLY | O_NONBLOCK);
    writeToFile();
    ::close(reader);
    log(4000); // SIGPIPE would end this program, now or when it is let through again
}

TEST_F(LoggerTest, BeginsANewLineAfterAFullDisk) {
    writeToFile();
    rlimit earlier{};
    ASSERT_EQ(::getrlimit(RLIMIT_FSIZE, &earlier), 0);
    rlimit full{20, earlier.rlim_max};
    ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &full), 0);
    log(4000, "cut here"); // SIGXFSZ would end this program
    log(4000, "lost");
    full.rlim_cur = 60;
    ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &full), 0);
    log(4000, "whole");
    log(4000, "cut again");
    ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &earlier), 0);
    HVLogger::setFileSink(path()); // knows the cut line by the file
    log(4000, "last");
    EXPECT_EQ(content(),
              "log 4000 Test cut he\nlog 4000 Test whole\nlog 4000 Test cut a\nlog 4000 Test last\n");
}

TEST_F(LoggerTest, WorksAfterAForkBesideAThread) {
    std::atomic<bool> isInSink{false};
    std::atomic<bool> mayLeave{false};
    HVLogger::setSink([&](const HVLog::Message& message) {
        isInSink = true;
        while (!mayLeave && message.text == "slow") {
            std::this_thread::yield();
        }
        if (message.text == "fork" && ::fork() == 0) {
            throw std::runtime_error("in the child");
        }
    });
    HVLogger::setThreshold(0);
    std::thread other([] { log(4000, "slow"); });
    while (!isInSink) {
        std::this_thread::yield();
    }
    const auto logInChild = [] {
        ::alarm(20); // instead of hanging
        log(4000);
        HVLogger::setLevel(1, true);
        ::_exit(0);
    };
    if (::fork() == 0) {
        logInChild();
    }
    int status = 0;
    ASSERT_GT(::wait(&status), 0);
    EXPECT_EQ(status, 0);
    mayLeave = true;
    other.join();
    try {
        log(4000, "fork");
    } catch (const std::runtime_error&) {
        logInChild();
    }
    ASSERT_GT(::wait(&status), 0);
    EXPECT_EQ(status, 0);
}

TEST_F(LoggerTest, WritesWholeLinesFromManyThreads) {
    writeToFile();
    std::vector<std::future<void>> threads;
    for (const char letter : {'a', 'b', 'c', 'd'}) {
        threads.push_back(std::async(std::launch::async, [letter] {
            for (int i = 0; i < 100; ++i) {
                log(4000, std::string(200, letter));
            }
        }));
    }
    threads.clear();
    HVLogger::setFileSink(path()); // goes on behind what is there
    log(4000, std::string(200, 'e'));
    testing::internal::CaptureStderr();
    HVLogger::setStderrSink();
    log(4000, "shown");
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "log 4000 Test shown\n");
    std::ifstream lines(path());
    int count = 0;
    for (std::string line; std::getline(lines, line); ++count) {
        ASSERT_EQ(line, "log 4000 Test " + std::string(200, line.back()));
    }
    EXPECT_EQ(count, 401);
}

TEST(MessageBufferTest, StartsAnewAfterEachText) {
    HVMessageBuffer buffer;
    const char* const none = nullptr;
    for (int round = 0; round < 2; ++round) { // with and without a stream from before
        EXPECT_EQ(buffer.str(buffer << "a=" << none << "b"), "a=") << round;
        EXPECT_EQ(buffer.str(buffer << "a=" << none << 255), "a=") << round;
        EXPECT_EQ(buffer.str(buffer << "a=" << std::hex << 255 << " b=" << none << " c"), "a=ff b=") << round;
        EXPECT_EQ(buffer.str(buffer << "a=" << 255), "a=255") << round;
    }
    std::ostream& stream = buffer << "a" << 1;
    buffer << "b";
    stream << 2 << 'c';
    EXPECT_EQ(buffer.str(stream), "a1b2c");
    stream << 3;
    EXPECT_EQ(buffer.str(buffer), "3");
    EXPECT_EQ(buffer.str(buffer), "");
}

TEST(MessageBufferTest, ThrowsWhenMemoryRunsOut) {
    const std::string text(300, 'x');
    HVMessageBuffer buffer;
    std::ostream& stream = buffer << "a" << 1;
    failing::allocationsFrom(1);
    stream << text << 2; // a stream swallows what is thrown below it
    failing::ended();
    EXPECT_THROW(buffer.str(stream), std::bad_alloc);
    EXPECT_EQ(buffer.str(buffer << "a" << 1), "a1");

    stream.exceptions(std::ios_base::badbit); // a user of the stream leaves it as it likes
    buffer.str(stream << std::hex);
    EXPECT_EQ(buffer.str(buffer << 255 << static_cast<const char*>(nullptr)), "255");
    failing::allocationsFrom(1);
    HVMessageBuffer plain;
    EXPECT_THROW(plain << text.c_str(), std::bad_alloc);
    failing::ended();
}
