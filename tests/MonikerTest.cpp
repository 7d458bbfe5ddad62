#include "MonikerText.h"

#include <gtest/gtest.h>
#include <locale>

using TK::FrameworkException;
using TK::Moniker;

namespace {

const char* const notSelected = "Key is not selected.";
const char* const notReadable =
    "Either the Key is not selected or the value is not compatible with the requested data type.";

// How one type of value reads the selected key; the value must survive a failure.
template <class T>
std::string read(const Moniker& moniker) {
    const T untouched{'\7'};
    T value = untouched;
    try {
        moniker.getValue(value);
    } catch (const FrameworkException& exception) {
        EXPECT_EQ(value, untouched);
        return exception.what();
    }
    return value == untouched ? "nothing" : "the value";
}

// In the order of the types' numbers.
std::string (*const readers[])(const Moniker&) = {&read<unsigned char>, &read<unsigned short>,
                                                  &read<unsigned int>, &read<unsigned long long>,
                                                  &read<std::string>};

Moniker oneOfEach() {
    Moniker moniker;
    EXPECT_EQ(moniker.addKey("a", static_cast<unsigned char>(65)), 0);
    EXPECT_EQ(selectedKey(moniker), "a:0=65");
    EXPECT_EQ(moniker.addKey("b", static_cast<unsigned short>(65535)), 1);
    EXPECT_EQ(moniker.addKey("c", 4294967295U), 2);
    EXPECT_EQ(moniker.addKey("d", 18446744073709551615ULL), 3);
    EXPECT_EQ(moniker.addKey("a", std::string("t\0t", 3)), 4); // a name may stand twice
    return moniker;
}

} // namespace

TEST(MonikerTest, StartsEmptyWithNothingSelected) {
    Moniker moniker;
    EXPECT_EQ(moniker.getKeyCount(), 0U);
    EXPECT_FALSE(moniker.selectKey(0));
    std::string name;
    unsigned short type = 0;
    EXPECT_EQ(selectedKey(moniker), notSelected);
    EXPECT_THROW(moniker.getType(type), FrameworkException);
    try {
        moniker.getName(name);
    } catch (const FrameworkException& exception) {
        name = exception.what();
    }
    EXPECT_EQ(name, notSelected);
    for (const auto reader : readers) {
        EXPECT_EQ(reader(moniker), notReadable);
    }
}

TEST(MonikerTest, ReadsEveryTypeOnlyAsItself) {
    Moniker moniker = oneOfEach();
    EXPECT_EQ(textOf(moniker), std::string("a:0=65 b:1=65535 c:2=4294967295 d:3=18446744073709551615 ") +
                                   std::string("a:4=t\0t  > a:4=t\0t", 18));
    for (unsigned int key = 0; key < 5; ++key) {
        ASSERT_TRUE(moniker.selectKey(key));
        for (unsigned int type = 0; type < 5; ++type) {
            EXPECT_EQ(readers[type](moniker), type == key ? "the value" : notReadable) << type << key;
        }
    }
    EXPECT_FALSE(moniker.selectKey(5));
    EXPECT_EQ(selectedKey(moniker), notSelected);
}

TEST(MonikerTest, ReadsBackEveryByteButWhiteSpace) {
    for (unsigned int byte = 0; byte < 256; ++byte) {
        Moniker moniker;
        moniker.addKey("k", static_cast<unsigned char>(byte));
        unsigned char value = 'x';
        moniker.getValue(value);
        const bool isWhiteSpace = byte == ' ' || (byte >= 9 && byte <= 13);
        EXPECT_EQ(value, isWhiteSpace ? 'x' : byte) << byte;
    }
}

TEST(MonikerTest, CountsPositionsModulo65536) {
    Moniker moniker;
    for (unsigned int i = 0; i < 65536; ++i) {
        ASSERT_EQ(moniker.addKey("k", i), i);
    }
    EXPECT_EQ(moniker.addKey("over", 7U), 0);
    EXPECT_EQ(moniker.getKeyCount(), 65537U);
    EXPECT_EQ(selectedKey(moniker), "k:2=0"); // the selection is the number that addKey returned
    ASSERT_TRUE(moniker.selectKey(65536));
    EXPECT_EQ(selectedKey(moniker), "over:2=7");
}

TEST(MonikerTest, CopiesAreIndependent) {
    Moniker moniker = oneOfEach();
    ASSERT_TRUE(moniker.selectKey(1));
    Moniker copy(moniker);
    Moniker assigned;
    assigned = moniker;
    const std::string before = textOf(moniker);
    copy.addKey("new", 1U);
    EXPECT_EQ(selectedKey(copy), "new:2=1");
    EXPECT_EQ(textOf(moniker), before);
    EXPECT_EQ(textOf(assigned), before);
}

TEST(MonikerTest, FormatsNumbersByTheGlobalLocale) {
    struct Grouped : std::numpunct<char> {
        std::string do_grouping() const override { return "\3"; }
        char do_thousands_sep() const override { return '.'; }
    };
    const std::locale earlier = std::locale::global(std::locale(std::locale::classic(), new Grouped));
    Moniker moniker;
    moniker.addKey("k", 1234567U);
    EXPECT_EQ(selectedKey(moniker), "k:2=1234567");
    moniker.addKey("k", static_cast<unsigned char>('x'));
    EXPECT_EQ(selectedKey(moniker), "k:0=120");
    ASSERT_TRUE(moniker.selectKey(0));
    std::locale::global(earlier);
    EXPECT_EQ(selectedKey(moniker), "k:2=1") << "of 1.234.567";
}

TEST(FrameworkExceptionTest, CopiesTheMessage) {
    std::string text = "a message that is longer than any short string buffer holds";
    const std::string before = text;
    FrameworkException copy(nullptr);
    EXPECT_STREQ(copy.what(), "");
    copy = FrameworkException(text.c_str());
    text[0] = 'X';
    EXPECT_EQ(copy.what(), before);
    EXPECT_EQ(FrameworkException(copy).what(), before);
}
