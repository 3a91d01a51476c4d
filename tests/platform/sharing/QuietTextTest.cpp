// Texts of unknown origin, as a sheet shows them.
#include "platform/sharing/QuietText.h"

#include <gtest/gtest.h>

#include <chrono>
#include <string>

namespace {

using platform::quietName;
using platform::quietText;

TEST(AQuietText, KeepsWordsAndLines)
{
    EXPECT_EQ(quietText("A race\nhttps://example.org/ä?b=日本"), "A race\nhttps://example.org/ä?b=日本");
    EXPECT_EQ(quietText(""), "");
}

TEST(AQuietText, HasNeitherControlCharactersNorMarksOfDirection)
{
    EXPECT_EQ(quietText("a\u202Eb\u2066c\u200Fd\u061Ce\uFEFF"), "abcde");
    EXPECT_EQ(quietText(std::string("a\0b\x1B[31mc\x7F", 10)), "a b [31mc");
    EXPECT_EQ(quietText("a\u009Bb"), "a b");
    EXPECT_EQ(quietText("bad \xFF\xC3 bytes"), "bad bytes");
    EXPECT_EQ(quietText("a!b\u00A0c~"), "a!b\u00A0c~") << "what stands beside them stays";
}

TEST(AQuietText, HasNoEmptyLines)
{
    EXPECT_EQ(quietText("\n\n a \r\n \u2028\n b\n\n"), "a\nb");
    for (const char* end : {"\n", "\r", "\r\n", "\v", "\f", "\u0085", "\u2028", "\u2029"})
        EXPECT_EQ(quietText(std::string("a") + end + "b"), "a\nb");
}

TEST(AQuietText, EndsInAnEllipsisWhereItIsCutOff)
{
    EXPECT_EQ(quietText("abcdef", 3), "abc…");
    EXPECT_EQ(quietText("ääää", 2), "ää…");
    EXPECT_EQ(quietText("abc", 3), "abc");
    EXPECT_EQ(quietText("a   bcd", 4), "a bc…") << "what nobody sees is not counted";
    EXPECT_EQ(quietText(std::string(401, 'x')), std::string(400, 'x') + "…");
    EXPECT_EQ(quietName(std::string(121, 'x')), "\u2068" + std::string(120, 'x') + "…\u2069");
}

TEST(AQuietText, IsLookedForOnlySoFarBehindMarks)
{
    const auto marks = [](int count) {
        std::string text;
        for (int i = 0; i < count; ++i)
            text += "\u202E";
        return text;
    };
    EXPECT_EQ(quietText(marks(23) + "a", 3), "a");
    EXPECT_EQ(quietText(marks(24) + "a", 3), "…");
}

TEST(AQuietText, CostsNothingHoweverLongTheTextIs)
{
    std::string letters;
    letters.resize(50'000'000, 'x');
    std::string marks;
    while (marks.size() < 30'000'000)
        marks += "\u202E";
    const auto begin = std::chrono::steady_clock::now();
    EXPECT_LT(quietText(letters).size(), 500U);
    EXPECT_EQ(quietText(marks), "…");
    EXPECT_LT(std::chrono::steady_clock::now() - begin, std::chrono::milliseconds(50));
}

TEST(AQuietName, IsOneLineSetApart)
{
    EXPECT_EQ(quietName("a\nb\u202E.mp4"), "\u2068a b.mp4\u2069");
}

} // namespace
