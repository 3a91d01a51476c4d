#include "base/Text.h"

#include <gtest/gtest.h>

namespace {

TEST(Text, PrintsNothingThatATerminalWouldObey)
{
    EXPECT_EQ(base::printable("Träumerei 日本 😀"), "Träumerei 日本 😀");
    EXPECT_EQ(base::printable("red \x1b[31m, bell \a, line\nline\r\t"), "red ?[31m, bell ?, line?line??");
    EXPECT_EQ(base::printable("\u007F\u0085\u009B2J\u00A0"), "???2J\u00A0");
    EXPECT_EQ(base::printable("gpj\u202Egnp\u2066 \u2028\u2029"), "gpj?gnp? ??");
    EXPECT_EQ(base::printable("\u202A\u202B\u202C\u202D\u2067\u2068\u2069"), "???????");
    EXPECT_EQ(base::printable("\u2027\u202F\u2065\u206A\U0001202E"), "\u2027\u202F\u2065\u206A\U0001202E");
    EXPECT_EQ(base::printable("caf\xE9 \xF0\x9F"), "caf? ??");
    EXPECT_EQ(base::printable(std::string_view("a\0b", 3)), "a?b");
}

TEST(Text, KnowsTheSmallLettersOfAsciiInEveryLocale)
{
    for (const auto& [letter, small] :
         {std::pair('A', 'a'), {'I', 'i'}, {'Z', 'z'}, {'@', '@'}, {'[', '['}, {'z', 'z'}})
        EXPECT_EQ(base::lowercase(letter), small) << letter;
    EXPECT_EQ(base::lowercase('\xC4'), '\xC4');
}

TEST(Text, KnowsHexadecimalDigits)
{
    for (const auto& [digit, number] : {std::pair('0', 0),
                                        {'9', 9},
                                        {'a', 10},
                                        {'f', 15},
                                        {'A', 10},
                                        {'F', 15},
                                        {'/', -1},
                                        {':', -1},
                                        {'@', -1},
                                        {'G', -1},
                                        {'`', -1},
                                        {'g', -1}})
        EXPECT_EQ(base::hexadecimalDigit(digit), number) << digit;
}

TEST(Text, FillsThePlacesOfAFormatInTheirOrderOrByNumber)
{
    EXPECT_EQ(base::formatted("%@ by %@", {"Tux Racer", "Tux"}), "Tux Racer by Tux");
    EXPECT_EQ(base::formatted("%2$@: %1$@!", {"Tux Racer", "Tux"}), "Tux: Tux Racer!");
    EXPECT_EQ(base::formatted("%@", {"%@ %2$@"}), "%@ %2$@") << "what is filled in is no format";
}

TEST(Text, LeavesOutOfAFormatWhatHasNoArgument)
{
    EXPECT_EQ(base::formatted("%@ and %@", {"one"}), "one and ");
    EXPECT_EQ(base::formatted("[%3$@]", {"one", "two"}), "[]");
    EXPECT_EQ(base::formatted("", {"one"}), "");
}

TEST(Text, KeepsInAFormatWhatIsNoPlace)
{
    EXPECT_EQ(base::formatted("100 %% of %d, %0$@, %1$d, 5 %", {"one"}), "100 % of %d, %0$@, %1$d, 5 %");
}

TEST(Text, KnowsWhereACharacterEnds)
{
    EXPECT_EQ(base::characterLength(""), 0U);
    EXPECT_EQ(base::characterLength("ä"), 2U);
    EXPECT_EQ(base::characterLength("日"), 3U);
    EXPECT_EQ(base::characterLength("😀"), 4U);
    EXPECT_EQ(base::characterLength("\xC0\x80"), 0U) << "longer than needed";
    EXPECT_EQ(base::characterLength("\xE0\x9F\xBF"), 0U) << "longer than needed";
    EXPECT_EQ(base::characterLength("\xF0\x8F\xBF\xBF"), 0U) << "longer than needed";
    EXPECT_EQ(base::characterLength("\xED\x9F\xBF"), 3U);
    EXPECT_EQ(base::characterLength("\xED\xA0\x80"), 0U) << "half a pair";
    EXPECT_EQ(base::characterLength("\xF4\x8F\xBF\xBF"), 4U) << "the last one";
    EXPECT_EQ(base::characterLength("\xF4\x90\x80\x80"), 0U) << "beyond the last one";
    EXPECT_EQ(base::characterLength("\xE6\x97"), 0U) << "cut off";
}

} // namespace
