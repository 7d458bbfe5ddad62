// What the host offers, and its localised texts.
#include "LoggerCalls.h"
#include "TestLocales.h"

#include "ProviderUtilities.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <dlfcn.h>
#include <iostream>
#include <sstream>
#include <string>
#include <thread>
#include <utility>
#include <vector>

using TK::ProviderUtilities;

namespace {

const std::string device = "/dev/kvm";
const std::string server = "/opt/oxa/vex/bin/cimserver";

bool deviceOpens = false;
bool serverOpens = false;
std::string opened; // paths and modes, of these two files

} // namespace

// Stands between the library's file streams and the C library.
extern "C" __attribute__((visibility("default"))) FILE* fopen64(const char* path, const char* mode) {
    static const auto real =
        reinterpret_cast<FILE* (*)(const char*, const char*)>(::dlsym(RTLD_NEXT, "fopen64"));
    if (path != device && path != server) {
        return real(path, mode);
    }
    opened += path + std::string(" ") + mode + ';';
    if (path == device ? deviceOpens : serverOpens) {
        return real("/dev/null", mode);
    }
    errno = EACCES;
    return nullptr;
}

TEST(HostProbeTest, NeedsTheDeviceAndNoServer) {
    struct : std::stringbuf {
        int flushes = 0;
        int sync() override { return ++flushes, 0; }
    } output;
    std::streambuf* const earlier = std::cout.rdbuf(&output);
    for (const bool deviceThere : {false, true}) {
        for (const bool serverThere : {false, true}) {
            deviceOpens = deviceThere;
            serverOpens = serverThere;
            opened.clear();
            output.str("");
            EXPECT_EQ(ProviderUtilities::isKVM(), deviceThere && !serverThere);
            EXPECT_EQ(output.str(), deviceThere ? "" : "File cannot be found.");
            EXPECT_EQ(opened, device + " r;" + (deviceThere ? server + " r;" : ""));
        }
    }
    std::cout.rdbuf(earlier);
    EXPECT_EQ(output.flushes, 0);
}

TEST(LocalisedTextTest, HasLanguageAndEncodingOfTheThread) {
    const std::wstring key = L"The asset tag holds characters that are not allowed.";
    const std::pair<const char*, const char*> rows[] = {
        {"C", "The asset tag holds characters that are not allowed."},
        {"de_DE.UTF-8", "Das Inventarkennzeichen enth\xC3\xA4lt unzul\xC3\xA4ssige Zeichen."},
        {"de_DE.ISO-8859-1", "Das Inventarkennzeichen enth\xE4lt unzul\xE4ssige Zeichen."}};
    for (const auto& [name, text] : rows) {
        const ThreadLocale locale(name);
        EXPECT_STREQ(ProviderUtilities::getNLSText(key), text);
    }
    EXPECT_TRUE(loggerCalls().empty());
}

TEST(LocalisedTextTest, StaysValidForSevenMoreCalls) {
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
        std::thread([&] {
            std::for_each(keys.begin() + 24, keys.end(), ProviderUtilities::getNLSText);
        }).join();
        for (std::size_t valid = i < 7 ? 0 : i - 7; valid <= i; ++valid) {
            ASSERT_STREQ(texts[valid], expected[valid].c_str()) << "after " << i;
        }
    }
}
