#include "base/Text.h"

#include <gtest/gtest.h>

namespace {

TEST(Text, PrintsNothingThatATerminalWouldObey)
{
    EXPECT_EQ(base::printable("Träumerei 日本 😀"), "Träumerei 日本 😀");
    EXPECT_EQ(base::printable("red \x1b[31m, bell \a, line\nline\r\t"), "red ?[31m, bell ?, line?line??");
    EXPECT_EQ(base::printable("\u007F\u0085\u009B2J\u00A0"), "???2J\u00A0");
    EXPECT_EQ(base::printable("gpj\u202Egnp\u2066 \u2028"), "gpj?gnp? ?");
    EXPECT_EQ(base::printable("caf\xE9 \xF0\x9F"), "caf? ??");
    EXPECT_EQ(base::printable(std::string_view("a\0b", 3)), "a?b");
}

TEST(Text, KnowsWhereACharacterEnds)
{
    EXPECT_EQ(base::characterLength(""), 0U);
    EXPECT_EQ(base::characterLength("ä"), 2U);
    EXPECT_EQ(base::characterLength("日"), 3U);
    EXPECT_EQ(base::characterLength("😀"), 4U);
    EXPECT_EQ(base::characterLength("\xC0\x80"), 0U) << "longer than needed";
    EXPECT_EQ(base::characterLength("\xED\xA0\x80"), 0U) << "half a pair";
    EXPECT_EQ(base::characterLength("\xE6\x97"), 0U) << "cut off";
}

} // namespace
