#include "DateTime.h"
#include "Mutex.h"

#include <climits>
#include <cstdio>
#include <gtest/gtest.h>
#include <random>
#include <stdexcept>
#include <thread>
#include <type_traits>

using TK::DateTime;

namespace {

struct Fields {
    unsigned short year = 1970;
    unsigned char month = 1;
    unsigned char day = 1;
    unsigned char hour = 0;
    unsigned char minute = 0;
    unsigned char second = 0;
    unsigned int millisecond = 0;
    short offset = 0;
};

DateTime dateOf(const Fields& fields) {
    DateTime date;
    date.setYear(fields.year);
    date.setMonth(fields.month);
    date.setDay(fields.day);
    date.setHour(fields.hour);
    date.setMinute(fields.minute);
    date.setSecond(fields.second);
    date.setMillisecond(fields.millisecond);
    date.setOffset(fields.offset);
    return date;
}

std::string textOf(const Fields& f) {
    char text[100];
    int size = std::snprintf(text, sizeof text, "%04d-%02d-%02d %02d:%02d:%02d", f.year, f.month, f.day,
                             f.hour, f.minute, f.second);
    const auto end = [&] { return text + size; };
    const auto left = [&] { return sizeof text - static_cast<std::size_t>(size); };
    if (f.millisecond != 0) {
        size += std::snprintf(end(), left(), ".%03u", f.millisecond);
    }
    if (f.offset != 0) {
        size += std::snprintf(end(), left(), "%+04d", f.offset);
    }
    return text;
}

// The fields reach the getters, the text is the documented one, and the text reads back.
void check(const Fields& fields) {
    const DateTime date = dateOf(fields);
    const std::string text = date;
    ASSERT_EQ(text, textOf(fields));
    const DateTime again(text, 3);
    ASSERT_TRUE(again == date && !(again != date)) << text;
    ASSERT_TRUE(again.getYear() == fields.year && again.getMonth() == fields.month &&
                again.getDay() == fields.day && again.getHour() == fields.hour &&
                again.getMinute() == fields.minute && again.getSecond() == fields.second &&
                again.getMillisecond() == fields.millisecond && again.getOffset() == fields.offset)
        << text;
}

std::string failureOf(const std::string& text, unsigned int format = 3) {
    try {
        const DateTime date(text, format);
        return "no exception";
    } catch (const std::invalid_argument& failure) {
        return failure.what();
    }
}

static_assert(std::is_trivially_copyable_v<DateTime>);
static_assert(!std::is_copy_constructible_v<TK::Mutex>);

} // namespace

TEST(ADate, ReadsBackFromItsTextForEveryValueOfEveryField) {
    for (int value = 0; value <= USHRT_MAX; ++value) {
        Fields fields;
        fields.year = static_cast<unsigned short>(value);
        check(fields);
        fields.offset = static_cast<short>(value + SHRT_MIN);
        fields.millisecond = static_cast<unsigned int>(value) * 65537U;
        check(fields);
    }
    for (int value = 0; value <= UCHAR_MAX; ++value) {
        for (auto field : {&Fields::month, &Fields::day, &Fields::hour, &Fields::minute, &Fields::second}) {
            Fields fields;
            fields.*field = static_cast<unsigned char>(value);
            check(fields);
        }
    }
    std::mt19937 random(5);
    for (int i = 0; i < 20000; ++i) {
        const auto any = [&] { return static_cast<unsigned char>(random()); };
        check({static_cast<unsigned short>(random()), any(), any(), any(), any(), any(),
               static_cast<unsigned int>(random() >> (random() % 33 % 32)), static_cast<short>(random())});
    }
    check({USHRT_MAX, UCHAR_MAX, UCHAR_MAX, UCHAR_MAX, UCHAR_MAX, UCHAR_MAX, UINT_MAX, SHRT_MIN});
}

TEST(ADate, IsThePlainTextWhenItsLastFieldsAreZero) {
    EXPECT_EQ(std::string(DateTime()), "1970-01-01 00:00:00");
    EXPECT_TRUE(DateTime("1970-01-01 00:00:00", 3) == DateTime());
    EXPECT_TRUE(DateTime("1970-01-01 00:00:00.000-000", 3) == DateTime());
    EXPECT_TRUE(DateTime("1970-01-01 00:00:00+001", 3) != DateTime());
}

TEST(ADate, IsReadFromNoOtherText) {
    for (const char* const text : {"",
                                   " ",
                                   "1970",
                                   "1970-01-01",
                                   "1970-01-01 00:00",
                                   "1970-01-01 00:00:",
                                   "1970-01-01 00:00:0",
                                   "970-01-01 00:00:00",
                                   "1970-1-01 00:00:00",
                                   "1970/01/01 00:00:00",
                                   "1970-01-01T00:00:00",
                                   "1970-01-01  00:00:00",
                                   " 1970-01-01 00:00:00",
                                   "1970-01-01 00:00:00 ",
                                   "1970-01-01 00:00:00\n",
                                   "+1970-01-01 00:00:00",
                                   "-1970-01-01 00:00:00",
                                   "1970-+1-01 00:00:00",
                                   "1970-01--1 00:00:00",
                                   "65536-01-01 00:00:00",
                                   "99999999999999999999-01-01 00:00:00",
                                   "1970-256-01 00:00:00",
                                   "1970-01-01 00:00:256",
                                   "1970-01-01 00:00:00.",
                                   "1970-01-01 00:00:00.01",
                                   "1970-01-01 00:00:00.4294967296",
                                   "1970-01-01 00:00:00+",
                                   "1970-01-01 00:00:00+60",
                                   "1970-01-01 00:00:00+32768",
                                   "1970-01-01 00:00:00-32769",
                                   "1970-01-01 00:00:00+060.250",
                                   "1970-01-01 00:00:00+060+060",
                                   "1970-01-01 00:00:00.250.250",
                                   "0x7B-01-01 00:00:00"}) {
        EXPECT_EQ(failureOf(text), std::string("not a date: '") + text + "'");
    }
    const std::string nul("1970-01-01 00:00:00\0", 20);
    EXPECT_EQ(failureOf(nul), "not a date: '1970-01-01 00:00:00"); // what() ends where the text does
    for (const unsigned int format : {0U, 1U, 2U, 4U, UINT_MAX}) {
        EXPECT_EQ(failureOf("1970-01-01 00:00:00", format),
                  "unknown date format code " + std::to_string(format));
    }
}

TEST(AMutex, IsHeldByOneThreadAtATime) {
    static TK::Mutex mutex;
    const auto othersCanTakeIt = [] {
        bool taken = false;
        std::thread([&] {
            taken = mutex.try_lock();
            if (taken) {
                mutex.unlock();
            }
        }).join();
        return taken;
    };
    {
        const std::lock_guard<TK::Mutex> lock(mutex);
        EXPECT_FALSE(othersCanTakeIt());
    }
    EXPECT_TRUE(othersCanTakeIt());
}
