// What devices call themselves, and what of that is shown.
#include "linux/devices/DeviceName.h"

#include <gtest/gtest.h>

using devices::readableName;

TEST(ADevicesName, StaysAsItIsWhereItIsText)
{
    EXPECT_EQ(readableName("Ada’s Pixel 7"), "Ada’s Pixel 7");
    EXPECT_EQ(readableName("هاتف أحمد"), "هاتف أحمد");
    EXPECT_EQ(readableName("👩‍💻 Laptop"), "👩‍💻 Laptop");
    EXPECT_EQ(readableName("می‌خواهم"), "می‌خواهم") << "the joiner is part of the word";
}

TEST(ADevicesName, IsOneLineWithoutSpaceAround)
{
    EXPECT_EQ(readableName("  a\t\r\n b\u2028\u2029c\u00A0\u3000d "), "a b c d");
    EXPECT_EQ(readableName("a\vb\fc"), "a b c");
}

TEST(ADevicesName, LosesControlCharactersAndMarksThatTurnTextAround)
{
    EXPECT_EQ(readableName(std::string("a\0b\x1B[31mc\x7F", 10)), "ab[31mc");
    EXPECT_EQ(readableName("a\u0080b\u009Fc"), "abc");
    EXPECT_EQ(readableName("a\u202Egnp.exe\u202Cb"), "agnp.exeb");
    EXPECT_EQ(readableName("\u200E\u200F\u061C\u2066x\u2069\u2067\uFEFF\u200B\u00AD"), "x");
    EXPECT_EQ(readableName("a\U000E0041b"), "ab");
}

TEST(ADevicesName, LosesEveryMarkAndNoneOfItsNeighbours)
{
    const auto between = [](const char* character) { return readableName(std::string("a") + character + "b"); };
    for (const char* hidden : {"\x01",   "\x08",   "\x0E",   "\x1F",   "\x7F",       "\u0080",    "\u009F", "\u00AD",
                               "\u061C", "\u180E", "\u200B", "\u200E", "\u200F",     "\u202A",    "\u202E", "\u2060",
                               "\u206F", "\uFEFF", "\uFFF9", "\uFFFB", "\U000E0000", "\U000E007F"})
        EXPECT_EQ(between(hidden), "ab");
    for (const char* space :
         {" ", "\t", "\r", "\u00A0", "\u1680", "\u2000", "\u200A", "\u2028", "\u2029", "\u202F", "\u205F", "\u3000"})
        EXPECT_EQ(between(space), "a b");
    for (const char* seen : {"!", "~", "\u00A1", "\u00AC", "\u00AE", "\u061B", "\u1FFF", "\u2010", "\u2027", "\u2030",
                             "\u2070", "\uFFFC", "\U000E0080", "\u200C", "\u200D"})
        EXPECT_EQ(between(seen), std::string("a") + seen + "b");
}

TEST(ADevicesName, LosesBytesThatAreNoText)
{
    EXPECT_EQ(readableName("a\xFF\xC0\x80z"), "az");
    EXPECT_EQ(readableName("a\xE2\x82"), "a");
}

TEST(ADevicesName, EndsInAnEllipsisWhenItIsLong)
{
    const std::string longest(40, 'x');
    EXPECT_EQ(readableName(longest), longest);
    EXPECT_EQ(readableName(longest + "y"), longest + "…");
    EXPECT_EQ(readableName(longest + "   \u200E"), longest) << "nothing is left out that could be seen";
    EXPECT_EQ(readableName(std::string(39, 'x') + " yz"), std::string(39, 'x') + "…");
    EXPECT_EQ(readableName(std::string(1'000'000, 'x')), longest + "…");
    std::string marks = "Z";
    for (int i = 0; i < 1000; ++i)
        marks += "\u0301";
    EXPECT_LT(readableName(marks).size(), 100U);
}

TEST(ADevicesName, IsEmptyWhenThereIsNothingToSee)
{
    EXPECT_EQ(readableName(""), "");
    EXPECT_EQ(readableName(" \t\u202E\u200B\u200D"), "");
    for (const char* blank : {"\u3164", "\u2800", "\u200C", "\u200D"})
        EXPECT_EQ(readableName(blank), "");
}
