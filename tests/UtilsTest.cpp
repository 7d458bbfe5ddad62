// Dates as CIM texts, and the typed fields of property files.
#include "utils.h"

#include "LoggerCalls.h"
#include "Obvious.h"
#include "TestLocales.h"

#include <cstdio>
#include <gtest/gtest.h>
#include <limits>
#include <mutex>
#include <random>
#include <stdexcept>
#include <type_traits>
#include <utility>
#include <vector>

using TK::DateTime;
using TK::Utils;

namespace {

using obvious::date;
using obvious::formatted;
using obvious::parsed;

class CimDates : public testing::Test {
protected:
    CimDates() { forgetLoggerCalls(); }
    ~CimDates() override { forgetLoggerCalls(); }
};

constexpr const char* zeros = "00000000000000.000000+000";

} // namespace

TEST_F(CimDates, AreWritten) {
    const std::pair<DateTime, const char*> rows[] = {
        {date(2009, 3, 7, 5, 4, 9, 123, -5), "20090307050409.000123-300"},
        {date(0, 0, 0, 0, 0, 0, 0, 0), "19700101000000.000000+000"},
        {date(2024, 12, 31, 23, 59, 59, 999999, 1), "20241231235959.999999+060"},
        {date(2024, 1, 15, 8, 0, 0, 0, -1), "20240115080000.000000-060"},
        {date(1999, 7, 1, 0, 0, 0, 500000, 2), "19990701000000.500000+120"},
        {date(2009, 3, 7, 5, 4, 9, 123, -300), "20090307050409.000123-18000"},
        {date(7, 0, 15, 9, 9, 9, 1, 0), "00070115090909.000001+000"},
        {date(65535, 255, 255, 255, 255, 255, 4294967295U, -32768),
         "65535255255255255255.4294967295-1966080"},
        {date(10000, 100, 100, 100, 100, 100, 1000000, 32767), "10000100100100100100.1000000+1966020"},
    };
    for (const auto& [value, text] : rows) {
        EXPECT_EQ(Utils::convertCIMDateTime(value), text);
        EXPECT_EQ(takeTraces(), std::vector<std::string>({entering(utils, "convertCIMDateTime"),
                                                          exiting(utils, "convertCIMDateTime")}));
    }
}

TEST_F(CimDates, AreWrittenForEveryValueOfEveryField) {
    const DateTime base = date(2009, 3, 7, 5, 4, 9, 123, -5);
    for (int number = 0; number <= 65535; ++number) {
        DateTime value = base;
        value.setYear(static_cast<unsigned short>(number));
        ASSERT_EQ(Utils::convertCIMDateTime(value), formatted(value));
        value = base;
        value.setOffset(static_cast<short>(number - 32768));
        ASSERT_EQ(Utils::convertCIMDateTime(value), formatted(value));
        forgetLoggerCalls();
    }
    for (unsigned int number = 0; number <= 255; ++number) {
        const auto byte = static_cast<unsigned char>(number);
        for (void (DateTime::*const set)(unsigned char) :
             {&DateTime::setMonth, &DateTime::setDay, &DateTime::setHour, &DateTime::setMinute,
              &DateTime::setSecond}) {
            DateTime value = base;
            (value.*set)(byte);
            ASSERT_EQ(Utils::convertCIMDateTime(value), formatted(value));
        }
    }
    DateTime value = base;
    for (unsigned int power = 1; power <= 1000000000; power *= power < 1000000000 ? 10 : 5) {
        for (const unsigned int number : {power - 1, power, power + 1}) {
            value.setMillisecond(number);
            ASSERT_EQ(Utils::convertCIMDateTime(value), formatted(value));
        }
    }
}

TEST_F(CimDates, AreRead) {
    const std::pair<std::string, DateTime> rows[] = {
        {"20090307050409.000123-300", date(2009, 3, 7, 5, 4, 9, 123, -300)},
        {zeros, date(1970, 1, 1, 0, 0, 0, 0, 0)},
        {"**************.******+***", date(1970, 1, 1, 0, 0, 0, 0, 0)},
        {"*************************", date(1970, 1, 1, 0, 0, 0, 0, 0)},
        {"20090307050409.000123+060", date(2009, 3, 7, 5, 4, 9, 123, 60)},
        {"20090307050409.000123+0601234567", date(2009, 3, 7, 5, 4, 9, 123, 60)},
        {"20090307050409.000123", date(2009, 3, 7, 5, 4, 9, 123, 0)},
        {"20090307050409.000123-", date(2009, 3, 7, 5, 4, 9, 123, 0)},
        {"20090307050409.000123-3", date(2009, 3, 7, 5, 4, 9, 123, -3)},
        {"200903070504099000123-300", date(2009, 3, 7, 5, 4, 9, 123, -300)},
        {std::string("20090307050409\0"
                     "000123-300",
                     25),
         date(2009, 3, 7, 5, 4, 9, 123, -300)},
        {std::string("2\0"
                     "090\0"
                     "07050409.0\0"
                     "0123-3\0"
                     "0",
                     25),
         date(2, 1, 7, 5, 4, 9, 0, -3)},
        {"-001-1-2-3-4-5.-99999x300", date(65535, 255, 254, 253, 252, 251, 4294867297U, 0)},
        {" 2 9 3+7 5\t4\n9.  12 3 +60", date(2, 3, 7, 5, 4, 9, 12, 60)},
        {"99991399999999.9999999999", date(9999, 13, 99, 99, 99, 99, 999999, 9999)},
        {"--12++12- 1+ 2.0x1234   7", date(1970, 1, 12, 0, 1, 2, 0, 7)},
    };
    for (const auto& [text, value] : rows) {
        EXPECT_EQ(formatted(parsed(text)), formatted(value)) << "the model is wrong for " << text;
        EXPECT_TRUE(Utils::convertStringToDateTime(text) == value) << text;
        EXPECT_EQ(takeTraces(), std::vector<std::string>({entering(utils, "convertStringToDateTime"),
                                                          exiting(utils, "convertStringToDateTime")}));
    }
    // There and back, with the offset times 60.
    EXPECT_EQ(Utils::convertCIMDateTime(Utils::convertStringToDateTime("20090307050409.000123-300")),
              "20090307050409.000123-18000");
}

TEST_F(CimDates, AreReadWithAnythingInEveryField) {
    for (const std::size_t position : {0U, 4U, 6U, 8U, 10U, 12U, 14U, 15U, 19U, 21U, 23U}) {
        for (unsigned int pair = 0; pair <= 0xFFFF; pair += position == 4 ? 1 : 7) {
            std::string text = zeros;
            text[position] = static_cast<char>(pair);
            text[position + 1] = static_cast<char>(pair >> 8U);
            ASSERT_TRUE(Utils::convertStringToDateTime(text) == parsed(text)) << text;
            forgetLoggerCalls();
        }
    }
    std::mt19937 random(1); // NOLINT: the same texts in every run
    const std::string letters = "0123456789 \t\n-+*x.";
    for (int round = 0; round < 20000; ++round) {
        std::string text(21 + random() % 8, '\0');
        for (char& letter : text) {
            letter = letters[random() % letters.size()];
        }
        ASSERT_TRUE(Utils::convertStringToDateTime(text) == parsed(text)) << text;
        forgetLoggerCalls();
    }
}

TEST_F(CimDates, ThatEndTooEarlyThrowWithoutAnExitTrace) {
    for (std::size_t length = 0; length < 21; ++length) {
        EXPECT_THROW(Utils::convertStringToDateTime(std::string(zeros, length)), std::out_of_range) << length;
        EXPECT_EQ(takeTraces(), std::vector<std::string>({entering(utils, "convertStringToDateTime")}));
    }
}

TEST_F(CimDates, AreMadeOfStrippedAndPaddedTexts) {
    for (const std::size_t size : {0U, 1U, 65534U, 65535U, 65536U, 70000U}) {
        const std::string text(size, ' ');
        // Positions have 16 bits: without a NUL the last of them ends the text.
        EXPECT_EQ(Utils::stripSpaces(text).size(), std::min<std::size_t>(size, 65535));
        for (const std::size_t position : {0U, 2U, 65534U, 65535U, 65536U, 65539U}) {
            if (position < size) {
                std::string withNul = text;
                withNul[position] = '\0';
                EXPECT_EQ(Utils::stripSpaces(withNul + '\0'), std::string(position % 65536, ' ')) << position;
            }
        }
    }
    for (unsigned int count = 0; count <= 255; ++count) {
        EXPECT_EQ(Utils::addZero(static_cast<unsigned char>(count)), std::string(count, '0'));
    }
    EXPECT_TRUE(takeTraces().empty());
    static_assert(std::is_default_constructible_v<Utils> && std::is_destructible_v<Utils>);
    EXPECT_EQ(Utils().addZero(3), "000");
}

namespace {

// A property file with one value, which tells what it is asked.
class RecordingFile : public TK::PropertyFile {
public:
    using Calls = std::vector<std::pair<std::wstring, std::wstring>>;

    std::wstring getEntry(const std::wstring& key) override {
        calls_.emplace_back(L"get", key);
        return take();
    }
    void setEntry(const std::wstring& key, const std::wstring& value) override {
        calls_.emplace_back(key, value);
        stored_ = value;
        take();
    }

    void store(const std::wstring& value) { stored_ = value; }
    void fail() { fails_ = true; }
    Calls takeCalls() { return std::exchange(calls_, {}); }

private:
    std::wstring take() const {
        if (fails_) {
            throw std::logic_error("file");
        }
        return stored_;
    }

    std::wstring stored_;
    bool fails_ = false;
    Calls calls_;
};

// strtoul with 32 bits.
unsigned int uint32In(const std::string& text) {
    std::size_t i = text.find_first_not_of(" \t\n\v\f\r");
    if (i == std::string::npos) {
        return 0;
    }
    const bool negative = text[i] == '-';
    i += negative || text[i] == '+' ? 1 : 0;
    unsigned int number = 0;
    for (; i < text.size() && text[i] >= '0' && text[i] <= '9'; ++i) {
        const auto digit = static_cast<unsigned int>(text[i] - '0');
        if (number > (0xFFFFFFFFU - digit) / 10) {
            return 0xFFFFFFFFU;
        }
        number = number * 10 + digit;
    }
    return negative ? ~number + 1 : number;
}

class PropertyFileFields : public testing::Test {
protected:
    PropertyFileFields() { forgetLoggerCalls(); }
    ~PropertyFileFields() override { EXPECT_TRUE(takeTraces().empty()) << "none of them traces"; }

    RecordingFile file_;
    const ThreadLocale locale_{"C.UTF-8", LC_CTYPE_MASK};
};

// A number's text as the file gets it.
std::wstring padded(const std::wstring& digits, std::size_t length) {
    std::wstring text = digits;
    text.resize(length);
    return text;
}

} // namespace

TEST_F(PropertyFileFields, AreConvertedOnTheWay) {
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
    file_.store(L"2026-03-29 01:30:00");
    EXPECT_TRUE(Utils::ReadDateFromFile(file_, key) == date(2026, 3, 29, 1, 30, 0, 0, 0));
    EXPECT_EQ(file_.takeCalls(), (RecordingFile::Calls(3, {L"get", wideKey})));
}

TEST_F(PropertyFileFields, ReadNumbersOfThirtyTwoBits) {
    const std::pair<const wchar_t*, unsigned int> rows[] = {
        {L"", 0},
        {L"42", 42},
        {L"300", 300},
        {L"-1", 4294967295U},
        {L"12abc", 12},
        {L"abc", 0},
        {L"4294967295", 4294967295U},
        {L"4294967296", 4294967295U},
        {L"4294967297", 4294967295U},
        {L"-4294967295", 1},
        {L"-4294967296", 4294967295U},
        {L"-2147483648", 2147483648U},
        {L"18446744073709551615", 4294967295U},
        {L"18446744073709551616", 4294967295U},
        {L"-18446744073709551615", 4294967295U},
        {L"-18446744073709551617", 4294967295U},
        {L"99999999999999999999999999", 4294967295U},
        {L"000000000000000000000000000007", 7},
        {L"- 1", 0},
        {L"--1", 0},
        {L"-+1", 0},
        {L"+5", 5},
        {L" \t\n\v\f\r42", 42},
        {L"-", 0},
        {L"+", 0},
        {L"0x10", 0},
        {L"\u00A07", 0},
    };
    for (const auto& [text, number] : rows) {
        file_.store(text);
        EXPECT_EQ(Utils::ReadUint32FromFile(file_, "key"), number) << testing::PrintToString(text);
        EXPECT_EQ(Utils::ReadUint8FromFile(file_, "key"), number & 0xFFU) << testing::PrintToString(text);
    }
    file_.store(std::wstring(L"4\0002", 3));
    EXPECT_EQ(Utils::ReadUint32FromFile(file_, "key"), 4U);

    std::mt19937 random(1); // NOLINT: the same texts in every run
    const std::string letters = " \t-+0123456789429x";
    for (int round = 0; round < 50000; ++round) {
        std::string text(random() % 4, ' ');
        text.append(random() % 14, '\0');
        for (char& letter : text) {
            letter = letter == ' ' ? letters[random() % 4] : letters[4 + random() % (letters.size() - 4)];
        }
        file_.store(std::wstring(text.begin(), text.end()));
        ASSERT_EQ(Utils::ReadUint32FromFile(file_, "key"), uint32In(text)) << text;
        ASSERT_EQ(Utils::ReadUint8FromFile(file_, "key"), uint32In(text) & 0xFFU) << text;
    }
}

TEST_F(PropertyFileFields, WriteNumbersInTextsOfFixedLength) {
    for (unsigned int number = 0; number <= 255; ++number) {
        const auto byte = static_cast<unsigned char>(number);
        Utils::WriteUint8ToFile(file_, "k", byte);
        EXPECT_EQ(file_.takeCalls(), (RecordingFile::Calls{{L"k", padded(std::to_wstring(number), 4)}}));
        EXPECT_EQ(Utils::ReadUint8FromFile(file_, "k"), byte);
        file_.takeCalls();
    }
    const std::pair<unsigned int, const wchar_t*> rows[] = {{0, L"0"},
                                                            {1, L"1"},
                                                            {2147483647, L"2147483647"},
                                                            {2147483648U, L"-2147483648"},
                                                            {4294967295U, L"-1"}};
    for (const auto& [number, digits] : rows) {
        Utils::WriteUint32ToFile(file_, "k", number);
        EXPECT_EQ(file_.takeCalls(), (RecordingFile::Calls{{L"k", padded(digits, 16)}}));
        EXPECT_EQ(Utils::ReadUint32FromFile(file_, "k"), number);
        file_.takeCalls();
    }
    TK::PropertyFile memory;
    Utils::WriteUint32ToFile(memory, "k", 4294967295U);
    EXPECT_EQ(memory.getEntry(L"k"), L"-1");
}

TEST_F(PropertyFileFields, ReadDatesOrTheFirstSecondOf1970) {
    const DateTime none = date(1970, 1, 1, 0, 0, 0, 0, 0);
    const std::pair<const wchar_t*, DateTime> rows[] = {
        {L"", none},
        {L"0000-00-00 00:00:00", none},
        {L"0000-00-00", none},
        {L"10000-00-00", none},
        {L"x0000-00-00y", none},
        {L"2026-03-29 01:30:00", date(2026, 3, 29, 1, 30, 0, 0, 0)},
        {L"2026-03-29 01:30:00.250+060", date(2026, 3, 29, 1, 30, 0, 250, 60)},
    };
    for (const auto& [text, value] : rows) {
        file_.store(text);
        EXPECT_TRUE(Utils::ReadDateFromFile(file_, "k") == value) << testing::PrintToString(text);
    }
    for (const wchar_t* const text : {L"000-00-00", L"0000-00-0", L"yesterday", L" "}) {
        file_.store(text);
        EXPECT_THROW(Utils::ReadDateFromFile(file_, "k"), std::invalid_argument);
    }
}

TEST_F(PropertyFileFields, WriteDatesThatReadBack) {
    const DateTime value = date(2026, 3, 29, 1, 30, 0, 250, -300);
    Utils::WriteDateToFile(file_, "k", value);
    EXPECT_EQ(file_.takeCalls(), (RecordingFile::Calls{{L"k", L"2026-03-29 01:30:00.250-300"}}));
    EXPECT_TRUE(Utils::ReadDateFromFile(file_, "k") == value);
    Utils::WriteDateToFile(file_, "k", date(0, 0, 0, 5, 0, 0, 0, 0));
    EXPECT_TRUE(Utils::ReadDateFromFile(file_, "k") == date(1970, 1, 1, 0, 0, 0, 0, 0));
}

TEST_F(PropertyFileFields, PassOnWhatTheFileThrowsAndLockNothing) {
    const std::lock_guard<TK::Mutex> lock(TK::_fileMutex);
    file_.fail();
    const std::string key = "k";
    EXPECT_THROW(Utils::ReadStringFromFile(file_, key), std::logic_error);
    EXPECT_THROW(Utils::ReadUint8FromFile(file_, key), std::logic_error);
    EXPECT_THROW(Utils::ReadUint32FromFile(file_, key), std::logic_error);
    EXPECT_THROW(Utils::ReadDateFromFile(file_, key), std::logic_error);
    EXPECT_THROW(Utils::WriteStringToFile(file_, key, "v"), std::logic_error);
    EXPECT_THROW(Utils::WriteUint8ToFile(file_, key, 1), std::logic_error);
    EXPECT_THROW(Utils::WriteUint32ToFile(file_, key, 1), std::logic_error);
    EXPECT_THROW(Utils::WriteDateToFile(file_, key, DateTime()), std::logic_error);
    EXPECT_EQ(file_.takeCalls().size(), 8U);
}
