// What the host offers, and its localised texts.
#include "LoggerCalls.h"
#include "TestLocales.h"

#include "ProviderUtilities.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <dlfcn.h>
#include <filesystem>
#include <iostream>
#include <iterator>
#include <sstream>
#include <thread>
#include <vector>

using TK::ProviderUtilities;

namespace {

const std::string device = "/dev/kvm";
const std::string server = "/opt/oxa/vex/bin/cimserver";

bool deviceOpens = false;
bool serverOpens = false;
std::vector<std::string> opened; // paths and modes, of these two files

// Standard output, with the number of times that it was flushed.
class Output : public std::stringbuf {
public:
    Output() : earlier_(std::cout.rdbuf(this)) {}
    ~Output() override { std::cout.rdbuf(earlier_); }
    Output(const Output&) = delete;
    Output& operator=(const Output&) = delete;

    int flushes() const { return flushes_; }

protected:
    int sync() override {
        ++flushes_;
        return 0;
    }

private:
    std::streambuf* earlier_;
    int flushes_ = 0;
};

auto openFiles() {
    return std::distance(std::filesystem::directory_iterator("/proc/self/fd"),
                         std::filesystem::directory_iterator());
}

} // namespace

// Stands between the library's file streams and the C library.
extern "C" __attribute__((visibility("default"))) FILE* fopen64(const char* path, const char* mode) {
    static const auto real =
        reinterpret_cast<FILE* (*)(const char*, const char*)>(::dlsym(RTLD_NEXT, "fopen64"));
    if (path != device && path != server) {
        return real(path, mode);
    }
    opened.push_back(path + std::string(" ") + mode);
    if (path == device ? deviceOpens : serverOpens) {
        return real("/dev/null", mode);
    }
    errno = EACCES;
    return nullptr;
}

TEST(TheHost, OffersVirtualMachinesWithADeviceAndWithoutTheServer) {
    const std::vector<std::string> deviceAlone = {device + " r"};
    const std::vector<std::string> both = {device + " r", server + " r"};
    const auto files = openFiles();
    for (const bool deviceThere : {false, true}) {
        for (const bool serverThere : {false, true}) {
            deviceOpens = deviceThere;
            serverOpens = serverThere;
            const Output output;
            std::string expected;
            for (int call = 0; call < 2; ++call) {
                opened.clear();
                EXPECT_EQ(ProviderUtilities::isKVM(), deviceThere && !serverThere);
                expected += deviceThere ? "" : "File cannot be found.";
                EXPECT_EQ(output.str(), expected);
                EXPECT_EQ(opened, deviceThere ? both : deviceAlone);
            }
            EXPECT_EQ(output.flushes(), 0);
            EXPECT_EQ(openFiles(), files);
        }
    }
    EXPECT_TRUE(loggerCalls().empty());
}

TEST(LocalisedTexts, AreInTheLanguageAndTheEncodingOfTheThread) {
    ::unsetenv("LANGUAGE");
    const ThreadLocale plain("C");
    const std::wstring key = L"The asset tag holds characters that are not allowed.";
    EXPECT_STREQ(ProviderUtilities::getNLSText(key), "The asset tag holds characters that are not allowed.");
    {
        const ThreadLocale german("de_DE.UTF-8");
        EXPECT_STREQ(ProviderUtilities::getNLSText(key),
                     "Das Inventarkennzeichen enth\xC3\xA4lt unzul\xC3\xA4ssige Zeichen.");
        EXPECT_STREQ(ProviderUtilities::getNLSText(L"no such t\u00E4xt"), "no such t\xC3\xA4xt");
        EXPECT_STREQ(ProviderUtilities::getNLSText(L""), "");
    }
    const ThreadLocale german("de_DE.ISO-8859-1");
    EXPECT_STREQ(ProviderUtilities::getNLSText(key),
                 "Das Inventarkennzeichen enth\xE4lt unzul\xE4ssige Zeichen.");
    EXPECT_TRUE(loggerCalls().empty());
}

TEST(LocalisedTexts, StayUntilTheirThreadHasAskedForEightMore) {
    // All made before: a text made later could come to lie, and be right, where a freed result was.
    std::vector<std::wstring> keys;
    std::vector<std::string> expected;
    for (std::size_t i = 0; i < 48; ++i) {
        keys.push_back(L"a key that no short string buffer holds, " + std::to_wstring(i));
        expected.push_back("a key that no short string buffer holds, " + std::to_string(i));
    }
    std::vector<const char*> texts;
    for (std::size_t i = 0; i < 24; ++i) {
        texts.push_back(ProviderUtilities::getNLSText(keys[i]));
        std::thread([&keys] {
            for (std::size_t other = 24; other < 48; ++other) {
                ProviderUtilities::getNLSText(keys[other]);
            }
        }).join();
        for (std::size_t valid = i < 7 ? 0 : i - 7; valid <= i; ++valid) {
            ASSERT_STREQ(texts[valid], expected[valid].c_str()) << "after " << i;
        }
    }
}
