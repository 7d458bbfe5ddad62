#include "DateTime.h"
#include "Mutex.h"
#include "Obvious.h"

#include <climits>
#include <cstdio>
#include <gtest/gtest.h>
#include <mutex>
#include <random>
#include <stdexcept>
#include <thread>
#include <type_traits>

using TK::DateTime;

namespace {

std::string failureOf(const std::string& text, unsigned int format = 3) {
    try {
        const DateTime date(text, format);
        return "no exception";
    } catch (const std::invalid_argument& failure) {
        return failure.what();
    }
}

// The text is the documented one, and reads back.
void check(unsigned short year, unsigned char month, unsigned char day, unsigned char hour,
           unsigned char minute, unsigned char second, unsigned int millisecond, short offset) {
    const DateTime date = obvious::date(year, month, day, hour, minute, second, millisecond, offset);
    char buffer[100];
    std::snprintf(buffer, sizeof buffer, "%04d-%02d-%02d %02d:%02d:%02d", year, month, day, hour, minute,
                  second);
    std::string text = buffer;
    std::snprintf(buffer, sizeof buffer, ".%03u", millisecond);
    text += millisecond != 0 ? buffer : "";
    std::snprintf(buffer, sizeof buffer, "%+04d", offset);
    text += offset != 0 ? buffer : "";
    ASSERT_EQ(std::string(date), text);
    const DateTime again(text, 3);
    ASSERT_TRUE(again == date && !(again != date)) << text;
}

static_assert(std::is_trivially_copyable_v<DateTime>);
static_assert(!std::is_copy_constructible_v<TK::Mutex>);

} // namespace

TEST(DateTimeTest, ReadsBackEveryValueOfEveryField) {
    std::mt19937 random(5);
    const auto any = [&] { return static_cast<unsigned char>(random()); };
    for (int value = 0; value <= USHRT_MAX; ++value) {
        check(static_cast<unsigned short>(value), 1, 1, 0, 0, 0, 0, 0);
        check(static_cast<unsigned short>(random()), any(), any(), any(), any(), any(),
              static_cast<unsigned int>(value) * 65537U, static_cast<short>(value + SHRT_MIN));
    }
    check(1970, 1, 1, 0, 0, 0, 7, 0);
    check(USHRT_MAX, UCHAR_MAX, UCHAR_MAX, UCHAR_MAX, UCHAR_MAX, UCHAR_MAX, UINT_MAX, SHRT_MIN);
    EXPECT_EQ(std::string(DateTime()), "1970-01-01 00:00:00");
    EXPECT_TRUE(DateTime("1970-01-01 00:00:00.000-000", 3) == DateTime());
    std::string other = "1970-01-01 00:00:00.000+000";
    for (char& digit : other) {
        if (digit == '0') {
            digit = '1';
            EXPECT_TRUE(DateTime(other, 3) != DateTime()) << other;
            digit = '0';
        }
    }
}

TEST(DateTimeTest, RejectsOtherTexts) {
    for (const char* const text :
         {"", "1970-01-01", "1970-01-01 00:00:0", "970-01-01 00:00:00", "1970/01/01 00:00:00",
          " 1970-01-01 00:00:00", "1970-01-01 00:00:00 ", "-1970-01-01 00:00:00", "65536-01-01 00:00:00",
          "99999999999999999999-01-01 00:00:00", "1970-256-01 00:00:00", "1970-01-01 00:00:00.01",
          "1970-01-01 00:00:00.4294967296", "1970-01-01 00:00:00+60", "1970-01-01 00:00:00+32768",
          "1970-01-01 00:00:00-32769", "1970-01-01 00:00:00+060.250"}) {
        EXPECT_EQ(failureOf(text), std::string("not a date: '") + text + "'");
    }
    for (const unsigned int format : {2U, 4U}) {
        EXPECT_EQ(failureOf("1970-01-01 00:00:00", format),
                  "unknown date format code " + std::to_string(format));
    }
}

TEST(MutexTest, IsHeldByOneThreadAtATime) {
    TK::Mutex mutex;
    const auto isFree = [&mutex] {
        bool taken = false;
        std::thread([&] { taken = std::unique_lock<TK::Mutex>(mutex, std::try_to_lock).owns_lock(); }).join();
        return taken;
    };
    mutex.lock();
    EXPECT_FALSE(isFree());
    mutex.unlock();
    EXPECT_TRUE(isFree());
}
