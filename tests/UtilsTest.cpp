// Dates as CIM texts, and the typed fields of property files.
#include "utils.h"

#include "LoggerCalls.h"
#include "Obvious.h"
#include "TestLocales.h"

#include <gtest/gtest.h>
#include <limits>
#include <mutex>
#include <stdexcept>
#include <utility>
#include <vector>

using TK::DateTime;
using TK::Utils;

namespace {

using obvious::date;
using obvious::formatted;
using obvious::parsed;

class CimDateTest : public testing::Test {
protected:
    ~CimDateTest() override { takeTraces(); }
};

constexpr const char* zeros = "00000000000000.000000+000";

} // namespace

TEST_F(CimDateTest, WritesDates) {
    // The obvious version is right.
    EXPECT_EQ(formatted(date(2009, 3, 7, 5, 4, 9, 123, -5)), "20090307050409.000123-300");
    EXPECT_EQ(formatted(date(0, 0, 0, 0, 0, 0, 0, 0)), "19700101000000.000000+000");
    EXPECT_EQ(Utils::convertCIMDateTime(DateTime()), formatted(DateTime()));
    EXPECT_EQ(takeTraces(), passing(utils, "convertCIMDateTime"));
    const DateTime widest = date(65535, 255, 255, 255, 255, 255, 4294967295U, -32768);
    EXPECT_EQ(Utils::convertCIMDateTime(widest), formatted(widest));
}

TEST_F(CimDateTest, WritesEveryValueOfEveryField) {
    for (unsigned int number = 0; number <= 65535; ++number) {
        const auto byte = [number](unsigned int shift) {
            return static_cast<unsigned char>(number >> shift);
        };
        const DateTime value = date(static_cast<unsigned short>(number), byte(0), byte(1), byte(2), byte(3),
                                    byte(4), number * 65537, static_cast<short>(number));
        ASSERT_EQ(Utils::convertCIMDateTime(value), formatted(value));
        takeTraces();
    }
    DateTime value;
    for (unsigned int power = 1; power < 1000000000; power *= 10) {
        value.setMillisecond(power - 1);
        ASSERT_EQ(Utils::convertCIMDateTime(value), formatted(value));
    }
}

TEST_F(CimDateTest, ReadsDates) {
    const std::pair<const char*, DateTime> rows[] = {
        {"20090307050409.000123-300", date(2009, 3, 7, 5, 4, 9, 123, -300)},
        {"-001-1-2-3-4-5.-99999x300", date(65535, 255, 254, 253, 252, 251, 4294867297U, 0)},
        {"--12++12- 1+ 2.0x1234   7", date(1970, 1, 12, 0, 1, 2, 0, 7)},
        {"00000000000000.000000+1234567", date(1970, 1, 1, 0, 0, 0, 0, 123)},
        {zeros, DateTime()},
    };
    for (const auto& [text, value] : rows) {
        EXPECT_TRUE(parsed(text) == value) << "the obvious version";
        EXPECT_TRUE(Utils::convertStringToDateTime(text) == value);
        EXPECT_EQ(takeTraces(), passing(utils, "convertStringToDateTime"));
    }
}

TEST_F(CimDateTest, ReadsAnythingInEveryField) {
    for (const std::size_t position : {0U, 4U, 6U, 8U, 10U, 12U, 14U, 15U, 19U, 21U, 23U}) {
        for (unsigned int pair = 0; pair <= 0xFFFF; pair += position == 4 ? 1 : 7) {
            std::string text = zeros;
            text[position] = static_cast<char>(pair);
            text[position + 1] = static_cast<char>(pair >> 8U);
            ASSERT_TRUE(Utils::convertStringToDateTime(text) == parsed(text)) << text;
            takeTraces();
        }
    }
}

TEST_F(CimDateTest, ThrowsAtTextsThatEndTooEarly) {
    for (std::size_t length = 0; length < 21; ++length) {
        EXPECT_THROW(Utils::convertStringToDateTime(std::string(zeros, length)), std::out_of_range) << length;
        EXPECT_EQ(takeTraces(), entering(utils, "convertStringToDateTime"));
    }
}

TEST_F(CimDateTest, StripsAndPadsTexts) {
    const std::string text(70000, ' ');
    // Positions have 16 bits: without a NUL the last of them ends the text.
    EXPECT_EQ(Utils::stripSpaces(text).size(), 65535U);
    EXPECT_EQ(Utils::stripSpaces("text"), "text");
    for (const std::size_t position : {0U, 2U, 65539U}) {
        std::string withNul = text;
        withNul[position] = '\0';
        EXPECT_EQ(Utils::stripSpaces(withNul + '\0').size(), position % 65536) << position;
    }
    EXPECT_EQ(Utils::addZero(0), "");
    EXPECT_EQ(Utils().addZero(255), std::string(255, '0'));
    EXPECT_TRUE(loggerCalls().empty());
}

namespace {

// A property file with one value, which tells what it is asked.
class RecordingFile : public TK::PropertyFile {
public:
    using Calls = std::vector<std::pair<std::wstring, std::wstring>>;

    std::wstring getEntry(const std::wstring& key) override {
        calls_.emplace_back(L"get", key);
        return stored_;
    }
    void setEntry(const std::wstring& key, const std::wstring& value) override {
        calls_.emplace_back(key, value);
        stored_ = value;
    }

    void store(const std::wstring& value) { stored_ = value; }
    Calls takeCalls() { return std::exchange(calls_, {}); }

private:
    std::wstring stored_;
    Calls calls_;
};

class FileFieldsTest : public testing::Test {
protected:
    ~FileFieldsTest() override { EXPECT_EQ(takeTraces(), "") << "none of them traces"; }

    RecordingFile file_;
    const std::lock_guard<TK::Mutex> lock_{TK::_fileMutex}; // which none of them locks
    const ThreadLocale locale_{"C.UTF-8", LC_CTYPE_MASK};
};

} // namespace

TEST_F(FileFieldsTest, ConvertsKeysAndTexts) {
    const std::string key = "k\xC3\xA4\xE4";
    const std::wstring wideKey = L"k\u00E4\xDCE4";
    file_.store(std::wstring(L"v\u4E00\0w", 4));
    EXPECT_EQ(Utils::ReadStringFromFile(file_, key), std::string("v\xE4\xB8\x80\0w", 6));
    EXPECT_EQ(file_.takeCalls(), (RecordingFile::Calls{{L"get", wideKey}}));
    Utils::WriteStringToFile(file_, key, std::string("v\xE4\xB8\x80\0w", 6));
    EXPECT_EQ(file_.takeCalls(), (RecordingFile::Calls{{wideKey, std::wstring(L"v\u4E00\0w", 4)}}));
    file_.store(L"42");
    EXPECT_EQ(Utils::ReadUint8FromFile(file_, key), 42);
    EXPECT_EQ(Utils::ReadUint32FromFile(file_, key), 42U);
    file_.store(L"");
    Utils::ReadDateFromFile(file_, key);
    EXPECT_EQ(file_.takeCalls(), (RecordingFile::Calls(3, {L"get", wideKey})));
}

TEST_F(FileFieldsTest, ReadsNumbersOf32Bits) {
    const std::pair<const wchar_t*, unsigned int> rows[] = {{L"", 0},
                                                            {L"-", 0},
                                                            {L"+", 0},
                                                            {L"x1", 0},
                                                            {L"- 1", 0},
                                                            {L"\u00A07", 0},
                                                            {L"0x10", 0},
                                                            {L"12 3", 12},
                                                            {L" \t\n\v\f\r42", 42},
                                                            {L"+0007", 7},
                                                            {L"-1", 4294967295U},
                                                            {L"4294967295", 4294967295U},
                                                            {L"4294967296", 4294967295U},
                                                            {L"-4294967295", 1},
                                                            {L"-4294967296", 4294967295U},
                                                            {L"-18446744073709551617", 4294967295U}};
    for (const auto& [text, number] : rows) {
        file_.store(text);
        EXPECT_EQ(Utils::ReadUint32FromFile(file_, "key"), number) << testing::PrintToString(text);
        EXPECT_EQ(Utils::ReadUint8FromFile(file_, "key"), number & 0xFFU) << testing::PrintToString(text);
    }
    file_.store(std::wstring(L"4\0002", 3));
    EXPECT_EQ(Utils::ReadUint32FromFile(file_, "key"), 4U);
}

TEST_F(FileFieldsTest, WritesNumbersInTextsOfFixedLength) {
    const auto check = [&](const std::wstring& digits, std::size_t length) {
        std::wstring padded = digits;
        padded.resize(length);
        EXPECT_EQ(file_.takeCalls(), (RecordingFile::Calls{{L"k", padded}}));
    };
    for (const unsigned int number : {0U, 99U, 255U}) {
        Utils::WriteUint8ToFile(file_, "k", static_cast<unsigned char>(number));
        check(std::to_wstring(number), 4);
    }
    for (const int number : {0, std::numeric_limits<int>::max(), std::numeric_limits<int>::min(), -1}) {
        Utils::WriteUint32ToFile(file_, "k", static_cast<unsigned int>(number));
        check(std::to_wstring(number), 16);
    }
}

TEST_F(FileFieldsTest, ReadsAndWritesDates) {
    for (const wchar_t* const text : {L"", L"0000-00-00 00:00:00", L"x0000-00-00y"}) {
        file_.store(text);
        EXPECT_TRUE(Utils::ReadDateFromFile(file_, "k") == DateTime());
    }
    const DateTime written = date(2026, 3, 29, 1, 30, 0, 250, -300);
    Utils::WriteDateToFile(file_, "k", written);
    EXPECT_EQ(file_.takeCalls().back(),
              std::make_pair(std::wstring(L"k"), std::wstring(L"2026-03-29 01:30:00.250-300")));
    EXPECT_TRUE(Utils::ReadDateFromFile(file_, "k") == written);
    for (const wchar_t* const text : {L"000-00-00", L"0000-00-0", L"yesterday", L" "}) {
        file_.store(text);
        EXPECT_THROW(Utils::ReadDateFromFile(file_, "k"), std::invalid_argument);
    }
}
