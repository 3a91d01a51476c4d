#include "linux/icu/LineBreaking.h"

#include <gmock/gmock.h>

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST(BrokenLines, AreBrokenBetweenWords)
{
    EXPECT_THAT(intl::brokenIntoLines("one two three four", 8), ElementsAre("one two", "three", "four"));
    EXPECT_THAT(intl::brokenIntoLines("one two", 7), ElementsAre("one two")) << "a space at the end takes no room";
    EXPECT_THAT(intl::brokenIntoLines("one two", 6), ElementsAre("one", "two"));
    EXPECT_THAT(intl::brokenIntoLines("unbreakable word", 5), ElementsAre("unbreakable", "word"));
    EXPECT_THAT(intl::brokenIntoLines("", 5), IsEmpty());
}

TEST(BrokenLines, EndWhereTheTextSaysSo)
{
    EXPECT_THAT(intl::brokenIntoLines("one\ntwo three\n\nfour", 20), ElementsAre("one", "two three", "", "four"));
    EXPECT_THAT(intl::brokenIntoLines("one\n", 20), ElementsAre("one"));
}

TEST(BrokenLines, KeepWhatBelongsTogether)
{
    EXPECT_THAT(intl::brokenIntoLines("Il dure 5\u00A0minutes", 12), ElementsAre("Il dure", "5\u00A0minutes"));
    EXPECT_THAT(intl::brokenIntoLines("(one) two, three.", 6), ElementsAre("(one)", "two,", "three."));
}

TEST(BrokenLines, CountLettersWhateverTheAlphabet)
{
    EXPECT_THAT(intl::brokenIntoLines("жжж жжж жжж", 7), ElementsAre("жжж жжж", "жжж"));
    EXPECT_THAT(intl::brokenIntoLines("e\u0301e\u0301e\u0301 e\u0301e\u0301e\u0301", 7),
                ElementsAre("e\u0301e\u0301e\u0301 e\u0301e\u0301e\u0301"))
        << "marks take no room";
}

TEST(BrokenLines, NeedNoSpacesWhereThereAreNone)
{
    EXPECT_THAT(intl::brokenIntoLines("録画を待っています", 8), ElementsAre("録画を", "待ってい", "ます"))
        << "no line begins with a small letter";
    EXPECT_THAT(intl::brokenIntoLines("録画中です。次です。", 10), ElementsAre("録画中で", "す。次で", "す。"))
        << "no line begins with a full stop";
}

} // namespace
