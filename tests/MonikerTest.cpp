#include "Moniker.h"

#include "Allocations.h"

#include <cstring>
#include <functional>
#include <gtest/gtest.h>
#include <locale>
#include <new>
#include <type_traits>

using TK::FrameworkException;
using TK::Moniker;

namespace {

const char* const notSelected = "Key is not selected.";
const char* const notReadable =
    "Either the Key is not selected or the value is not compatible with the requested data type.";

std::string failureOf(const std::function<void()>& operation) {
    try {
        operation();
    } catch (const FrameworkException& exception) {
        return exception.what();
    }
    return "no exception";
}

// Reads the selected component as `T`, over a value that must survive a failure.
template <class T>
std::string failureOfReading(const Moniker& moniker, T untouched) {
    T value = untouched;
    std::string failure = failureOf([&] { moniker.getValue(value); });
    EXPECT_EQ(value, untouched);
    return failure;
}

std::string nameOf(const Moniker& moniker) {
    std::string name;
    moniker.getName(name);
    return name;
}

unsigned short typeOf(const Moniker& moniker) {
    unsigned short type = 99;
    moniker.getType(type);
    return type;
}

template <class T>
T valueOf(const Moniker& moniker) {
    T value{};
    moniker.getValue(value);
    return value;
}

Moniker oneOfEach() {
    Moniker moniker;
    moniker.addKey("a", static_cast<unsigned char>(65));
    moniker.addKey("b", static_cast<unsigned short>(65535));
    moniker.addKey("c", 4294967295U);
    moniker.addKey("d", 18446744073709551615ULL);
    moniker.addKey("e", std::string("te\0xt", 5));
    return moniker;
}

struct Grouped : std::numpunct<char> {
    std::string do_grouping() const override { return "\3"; }
    char do_thousands_sep() const override { return '.'; }
};

class GlobalLocale {
public:
    explicit GlobalLocale(const std::locale& locale) : earlier_(std::locale::global(locale)) {}
    ~GlobalLocale() { std::locale::global(earlier_); }
    GlobalLocale(const GlobalLocale&) = delete;
    GlobalLocale& operator=(const GlobalLocale&) = delete;

private:
    std::locale earlier_;
};

} // namespace

TEST(AMoniker, StartsEmptyWithNothingSelected) {
    Moniker moniker;
    EXPECT_EQ(moniker.getKeyCount(), 0U);
    EXPECT_FALSE(moniker.selectKey(0));
    EXPECT_EQ(failureOf([&] { typeOf(moniker); }), notSelected);
    EXPECT_EQ(failureOf([&] { nameOf(moniker); }), notSelected);
    EXPECT_EQ(failureOfReading<std::string>(moniker, "as it was"), notReadable);
    EXPECT_EQ(failureOfReading<unsigned char>(moniker, 7), notReadable);
    EXPECT_EQ(failureOfReading<unsigned short>(moniker, 7), notReadable);
    EXPECT_EQ(failureOfReading<unsigned int>(moniker, 7), notReadable);
    EXPECT_EQ(failureOfReading<unsigned long long>(moniker, 7), notReadable);
}

TEST(AMoniker, SelectsWhatWasAddedAndReadsItBack) {
    Moniker moniker;
    EXPECT_EQ(moniker.addKey("a", static_cast<unsigned char>(65)), 0);
    EXPECT_EQ(valueOf<unsigned char>(moniker), 65);
    EXPECT_EQ(moniker.addKey("b", static_cast<unsigned short>(65535)), 1);
    EXPECT_EQ(valueOf<unsigned short>(moniker), 65535);
    EXPECT_EQ(moniker.addKey("c", 4294967295U), 2);
    EXPECT_EQ(valueOf<unsigned int>(moniker), 4294967295U);
    EXPECT_EQ(moniker.addKey("d", 18446744073709551615ULL), 3);
    EXPECT_EQ(valueOf<unsigned long long>(moniker), 18446744073709551615ULL);
    EXPECT_EQ(moniker.addKey("a", std::string("te\0xt", 5)), 4); // a name may stand twice
    EXPECT_EQ(valueOf<std::string>(moniker), std::string("te\0xt", 5));
    EXPECT_EQ(nameOf(moniker), "a");
    ASSERT_EQ(moniker.getKeyCount(), 5U);
    for (unsigned int i = 0; i < 5; ++i) {
        ASSERT_TRUE(moniker.selectKey(i));
        EXPECT_EQ(typeOf(moniker), i); // the types were added in the order of their numbers
    }
}

TEST(AMoniker, ReadsEveryTypeOnlyAsItself) {
    Moniker moniker = oneOfEach();
    for (unsigned int i = 0; i < 5; ++i) {
        ASSERT_TRUE(moniker.selectKey(i));
        EXPECT_EQ(failureOfReading<unsigned char>(moniker, 65), i == 0 ? "no exception" : notReadable) << i;
        EXPECT_EQ(failureOfReading<unsigned short>(moniker, 65535), i == 1 ? "no exception" : notReadable)
            << i;
        EXPECT_EQ(failureOfReading<unsigned int>(moniker, 4294967295U), i == 2 ? "no exception" : notReadable)
            << i;
        EXPECT_EQ(failureOfReading<unsigned long long>(moniker, 18446744073709551615ULL),
                  i == 3 ? "no exception" : notReadable)
            << i;
        EXPECT_EQ(failureOfReading<std::string>(moniker, std::string("te\0xt", 5)),
                  i == 4 ? "no exception" : notReadable)
            << i;
    }
}

TEST(AMoniker, LosesItsSelectionToAPositionThatIsNotThere) {
    Moniker moniker = oneOfEach();
    ASSERT_TRUE(moniker.selectKey(2));
    EXPECT_FALSE(moniker.selectKey(5));
    EXPECT_EQ(failureOf([&] { nameOf(moniker); }), notSelected);
    EXPECT_TRUE(moniker.selectKey(4));
    EXPECT_EQ(nameOf(moniker), "e");
}

TEST(AMoniker, ReadsBackEveryByteThatIsNoWhiteSpace) {
    for (unsigned int byte = 0; byte < 256; ++byte) {
        Moniker moniker;
        moniker.addKey("k", static_cast<unsigned char>(byte));
        unsigned char value = 'x';
        moniker.getValue(value);
        const bool isWhiteSpace = byte == ' ' || (byte >= 9 && byte <= 13);
        EXPECT_EQ(value, isWhiteSpace ? 'x' : byte) << byte;
    }
}

TEST(AMoniker, CountsPositionsModulo65536) {
    Moniker moniker;
    for (unsigned int i = 0; i < 65536; ++i) {
        ASSERT_EQ(moniker.addKey("k", i), i);
    }
    EXPECT_EQ(moniker.addKey("over", 7U), 0);
    EXPECT_EQ(moniker.getKeyCount(), 65537U);
    EXPECT_EQ(nameOf(moniker), "k"); // the selection is the number that addKey returned
    ASSERT_TRUE(moniker.selectKey(65536));
    EXPECT_EQ(nameOf(moniker), "over");
}

TEST(AMoniker, IsIndependentOfItsCopies) {
    Moniker moniker = oneOfEach();
    ASSERT_TRUE(moniker.selectKey(1));
    Moniker copy(moniker);
    Moniker assigned;
    assigned = moniker;
    copy.addKey("new", 1U);
    EXPECT_EQ(nameOf(moniker), "b");
    EXPECT_EQ(nameOf(assigned), "b");
    EXPECT_EQ(nameOf(copy), "new");
    EXPECT_EQ(moniker.getKeyCount(), 5U);
    EXPECT_EQ(copy.getKeyCount(), 6U);
}

TEST(AMoniker, ReadsItsNumbersBackUnderALocaleThatGroupsDigits) {
    const GlobalLocale grouped(std::locale(std::locale::classic(), new Grouped));
    Moniker moniker;
    moniker.addKey("k", 1234567U);
    EXPECT_EQ(valueOf<unsigned int>(moniker), 1234567U);
}

TEST(AMoniker, IsAsItWasWhenMemoryRunsOut) {
    const std::string text(1000, 'x');
    Moniker other;
    other.addKey(text, text);
    const std::function<void(Moniker&)> operations[] = {
        [&](Moniker& moniker) { moniker.addKey(text, text); },
        [&](Moniker& moniker) { moniker.addKey(text, 18446744073709551615ULL); },
        [&](Moniker& moniker) { moniker = other; },
    };
    for (const auto& operation : operations) {
        bool reached = true;
        unsigned int failures = 0;
        for (unsigned int n = 1; reached; ++n) {
            Moniker moniker = oneOfEach();
            moniker.selectKey(1);
            failAllocation(n);
            try {
                operation(moniker);
                reached = failAllocation(0);
                EXPECT_FALSE(reached) << "a failed allocation was swallowed";
            } catch (const std::bad_alloc&) {
                failAllocation(0);
                ++failures;
                EXPECT_EQ(nameOf(moniker), "b");
                EXPECT_EQ(moniker.getKeyCount(), 5U);
            }
        }
        EXPECT_GT(failures, 0U);
    }
}

TEST(AMoniker, ReadsANumberWholeOrThrowsWhenMemoryRunsOut) {
    const GlobalLocale grouped(std::locale(std::locale::classic(), new Grouped));
    Moniker moniker;
    moniker.addKey("k", 18446744073709551615ULL);
    bool reached = true;
    for (unsigned int n = 1; reached; ++n) {
        unsigned long long value = 7;
        failAllocation(n);
        try {
            moniker.getValue(value);
            reached = failAllocation(0);
            EXPECT_FALSE(reached) << "a failed allocation was swallowed";
            EXPECT_EQ(value, 18446744073709551615ULL);
        } catch (const std::bad_alloc&) {
            failAllocation(0);
        }
    }
}

TEST(AFrameworkException, KeepsItsOwnCopyOfTheMessage) {
    static_assert(std::is_base_of_v<std::exception, FrameworkException>);
    static_assert(std::is_nothrow_destructible_v<FrameworkException>);
    char text[] = "a message that is longer than any short string buffer holds";
    const FrameworkException exception(text);
    const FrameworkException copy(exception);
    text[0] = 'X';
    EXPECT_STREQ(exception.what(), "a message that is longer than any short string buffer holds");
    EXPECT_STREQ(copy.what(), exception.what());
    FrameworkException assigned("");
    assigned = exception;
    EXPECT_STREQ(assigned.what(), exception.what());
    EXPECT_NE(copy.what(), exception.what());
    EXPECT_STREQ(FrameworkException(nullptr).what(), "");
}
