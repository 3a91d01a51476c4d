#include "linux/icu/StringFolding.h"

#include <gtest/gtest.h>

namespace {

class AFoldedPrefix : public testing::Test {
protected:
    const intl::StringFolding folding{};
    bool begins(std::string_view text, std::string_view prefix) const { return folding.hasPrefix(text, prefix); }
};

TEST_F(AFoldedPrefix, IgnoresCase)
{
    EXPECT_TRUE(begins("VKClipsa_Final1700000000.mp4", "vkclipsa"));
    EXPECT_TRUE(begins("vkclipsa_final", "VKCLIPSA"));
    EXPECT_TRUE(begins("ΑΘΗΝΑ", "αθή"));
}

TEST_F(AFoldedPrefix, IsAtTheBeginningAndNowhereElse)
{
    EXPECT_FALSE(begins("My VKClipsa", "vkclipsa"));
    EXPECT_FALSE(begins("VKClip", "vkclipsa"));
    EXPECT_FALSE(begins("", "a"));
}

TEST_F(AFoldedPrefix, IgnoresMarksHoweverTheyAreWritten)
{
    EXPECT_TRUE(begins("Étude", "etu"));
    EXPECT_TRUE(begins("E\u0301tude", "Étu"));
    EXPECT_TRUE(begins("etude", "É"));
    EXPECT_TRUE(begins("ǅungla", "ǆ"));
}

TEST_F(AFoldedPrefix, IgnoresMarksThatFoldingBringsOut)
{
    EXPECT_TRUE(begins("İstanbul", "istan"));
    EXPECT_TRUE(begins("ᾳ", "Α"));
}

TEST_F(AFoldedPrefix, FoldsLettersToSeveral)
{
    EXPECT_TRUE(begins("Straße_1", "STRASSE"));
}

TEST_F(AFoldedPrefix, OfNothingBeginsEverything)
{
    EXPECT_TRUE(begins("a", ""));
    EXPECT_TRUE(begins("", ""));
    EXPECT_TRUE(begins("a", "\u0301"));
}

TEST_F(AFoldedPrefix, TakesBytesThatAreNotTextForThemselves)
{
    EXPECT_TRUE(begins("\xff_final", "\xff_FINAL"));
    EXPECT_FALSE(begins("\xff_final", "\xfe_final"));
    EXPECT_FALSE(begins("\xff", "\xef\xbf\xbd"));
    EXPECT_TRUE(begins("Chess\xff", "chess"));
    EXPECT_FALSE(begins("\xc3", "\xc3\x89"));
}

TEST_F(AFoldedPrefix, ReachesBeyondTheFirstPlane)
{
    EXPECT_TRUE(begins("𐐀bc", "𐐨B"));
    EXPECT_TRUE(begins("🎬 take", "🎬 T"));
}

} // namespace
