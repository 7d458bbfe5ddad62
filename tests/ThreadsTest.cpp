// Requests on many threads at once, beside everything else that a program may do with the library meanwhile.
// The logger's two functions are this program's own and take no lock, so that nothing orders the threads but
// the library itself.
#include "HVLogger.h"
#include "RoadRequest.h"
#include "Trace.h"
#include "Utility.h"
#include "utils.h"

#include <cstdlib>
#include <gtest/gtest.h>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

using PU = TK::ProviderUtilities;

namespace {

constexpr unsigned int threadCount = 8;

// The thread sanitizer makes each request more than ten times as long; the environment can ask for as many as
// without.
unsigned int requestsPerThread() {
#if defined(__SANITIZE_THREAD__)
    constexpr unsigned int usual = 1000;
#else
    constexpr unsigned int usual = 10000;
#endif
    const char* const wanted = std::getenv("OXAHV_TEST_REQUESTS");
    return wanted != nullptr ? static_cast<unsigned int>(std::stoul(wanted)) : usual;
}

const std::string category("Test.Threads");

thread_local unsigned int loggerCalls = 0;
thread_local std::string damaged; // an example
thread_local std::string own;     // a text that no other thread traces

// Whether a text is one whole trace of a place, and of this thread.
bool isWhole(const std::string& function, const std::string& file, const std::string& line,
             const std::string& text) {
    const auto starts = [&text](const std::string& start) { return text.rfind(start, 0) == 0; };
    const auto ends = [&text](const std::string& end) {
        return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
    };
    for (const char* const kind : {"ENTERING: ", "EXITING: "}) {
        const std::string flow = kind + function + "() in " + file + " [Line: " + line + ']';
        if (text == flow || (starts(flow + ",Parameters List:  ") && text.find('=') != std::string::npos &&
                             (text.find("own=") == std::string::npos || ends("own=" + own + " 1.5")))) {
            return true;
        }
    }
    const bool isMine =
        text.find("'own'") == std::string::npos || starts("VARIABLE: 'own' has Value '" + own + "' at line ");
    return (starts("VARIABLE: '") && ends("' at line " + line + " in " + file) && isMine) ||
           text == "MESSAGE [File: " + file + ", Line: " + line + "]: " + own;
}

void log(const char* function, const char* file, int line, const std::string& text) {
    ++loggerCalls;
    if (!isWhole(function, file, std::to_string(line), text)) {
        damaged = text;
    }
}

void trace(unsigned int number) {
    TK_TRACE_ENTERING(category);
    TK_TRACE_ENTERING_PARAMETERS(category, " number=" << number << " own=" << own << ' ' << 1.5);
    TK_TRACE_MESSAGE(category, own.c_str());
    TK_TRACE_VARIABLE(category, "number", number);
    TK_TRACE_VARIABLE(category, "own", own);
    TK_TRACE_EXITING_PARAMETERS(category, " own=" << own << ' ' << 1.5);
    TK_TRACE_EXITING(category);
}

bool convert() {
    std::vector<std::wstring> wide;
    std::vector<std::string> narrow;
    return TK::CUtility::AStringArrToWStringArr({own, "x"}, wide) &&
           TK::CUtility::WStringArrToAStringArr(wide, narrow) && narrow[0] == own &&
           TK::Utils::convertStringToDateTime("20260329013000.000250+001").getMonth() == 3;
}

bool lookUp() {
    return PU::getClassId("oxatk_ethernetport") == PU::getClassId("OXATK_EthernetPort") &&
           PU::extend_getClassId(own.c_str()) == 255 &&
           TK::make_wstring(own) == TK::make_wstring(PU::getNLSText(TK::make_wstring(own)));
}

bool useFile(TK::PropertyFile& file, unsigned int number) {
    const std::lock_guard<TK::Mutex> lock(TK::_fileMutex);
    TK::Utils::WriteStringToFile(file, "shared", own);
    TK::Utils::WriteUint32ToFile(file, own, number);
    return TK::Utils::ReadStringFromFile(file, "shared") == own &&
           TK::Utils::ReadUint32FromFile(file, own) == number;
}

} // namespace

void HVLog::HVLogger::logLevelMessage(const char* function, const char* file, int line,
                                      const std::string& /*category*/, int /*level*/, char* /*reserved*/,
                                      int /*reserved1*/, int /*reserved2*/, const std::string& text) {
    log(function, file, line, text);
}

void HVLog::HVLogger::traceLevelMessage(const char* function, const char* file, int line,
                                        const std::string& /*category*/, int /*level*/, char* /*reserved*/,
                                        int /*reserved1*/, int /*reserved2*/, const std::string& text) {
    log(function, file, line, text);
}

TEST(ThreadsTest, ServesRequestsBesideEverythingElse) {
    oxahv::EmbeddedBroker broker;
    hostRoad(broker);
    TK::PropertyFile file;
    const unsigned int requests = requestsPerThread();
    std::vector<std::thread> threads;
    for (unsigned int i = 0; i < threadCount; ++i) {
        threads.emplace_back([&, i] {
            own = std::string(20 + i, static_cast<char>('A' + i));
            for (unsigned int number = 0; number < requests; ++number) {
                trace(number);
                EXPECT_TRUE(roadAnswers(broker, own) && convert() && lookUp() && useFile(file, number));
            }
            EXPECT_GT(loggerCalls, requests * 50U);
            EXPECT_EQ(damaged, "");
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(broker.liveObjects().total(), 0U);
}
