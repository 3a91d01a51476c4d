// Texts that strangers send: what is taken as it is, and what is made of the rest.
#include "app/host/RequestText.h"

#include <gmock/gmock.h>

namespace {

TEST(Texts, AreCheckedAsUtf8)
{
    for (const char* good : {"", "ascii", "é", "€", "🎬", "\x7F"})
        EXPECT_TRUE(host::checkText(good, "it")) << good;
    for (const char* bad : {"\x80", "\xC0\x80", "\xC3", "\xE0\x80\x80", "\xED\xA0\x80", "\xF0\x80\x80\x80",
                            "\xF4\x90\x80\x80", "\xF5\x80\x80\x80", "\xE2\x82"})
        EXPECT_FALSE(host::checkText(bad, "it"));
    EXPECT_FALSE(host::checkText(std::string_view("\0", 1), "it"));
    EXPECT_FALSE(host::checkText(std::string_view("a\0b", 3), "it")) << "wherever it stands";
    EXPECT_TRUE(host::checkText(std::string(1024 * 1024, 'x'), "it")) << "as long as a text may be";
    EXPECT_FALSE(host::checkText(std::string(1024 * 1024 + 1, 'x'), "it"));
}

TEST(Texts, BecomeSafeFileNames)
{
    EXPECT_EQ(host::safeFileName("movie.mp4", "f"), "movie.mp4");
    EXPECT_EQ(host::safeFileName("../../etc/passwd", "f"), "passwd");
    EXPECT_EQ(host::safeFileName("/", "f"), "f");
    EXPECT_EQ(host::safeFileName("", "f"), "f");
    EXPECT_EQ(host::safeFileName(".", "f"), "f");
    EXPECT_EQ(host::safeFileName("..", "f"), "f");
    EXPECT_EQ(host::safeFileName("a\nb\x01.mp4", "f"), "a_b_.mp4");
    EXPECT_EQ(host::safeFileName("a\xFF.mp4", "f"), "a_.mp4");
    EXPECT_EQ(host::safeFileName(".mp4", "f"), ".mp4");
    const std::string longest = host::safeFileName(std::string(300, 'x') + ".webm", "f");
    EXPECT_EQ(longest.size(), 255U);
    EXPECT_TRUE(longest.ends_with("x.webm"));
    EXPECT_EQ(host::safeFileName("\xFF\xFE.\xFF", "f"), "__._") << "each byte that is no text";
    EXPECT_EQ(host::safeFileName("a\x1F b\x7F~", "f"), "a_ b_~");
    EXPECT_EQ(host::safeFileName("a/b/", "f"), "f");
    EXPECT_EQ(host::safeFileName(std::string(255, 'x'), "f"), std::string(255, 'x')) << "it fits";
    EXPECT_EQ(host::safeFileName(std::string(256, 'x'), "f"), std::string(255, 'x'));
    // An extension has fifteen letters at most; what is longer belongs to the stem, and is cut.
    EXPECT_TRUE(
        host::safeFileName(std::string(300, 'x') + "." + std::string(15, 'e'), "f").ends_with("x.eeeeeeeeeeeeeee"));
    EXPECT_EQ(host::safeFileName(std::string(300, 'x') + "." + std::string(16, 'e'), "f"), std::string(255, 'x'));
    EXPECT_EQ(host::safeFileName("." + std::string(300, 'e'), "f"), "." + std::string(254, 'e'));
    std::string wide;
    for (int i = 0; i < 100; ++i)
        wide += "€";
    EXPECT_TRUE(host::checkText(host::safeFileName(wide + ".mp4", "f"), "it")) << "cut within a character";
}

TEST(Texts, BecomeAppNamesThatFileNamesCanBeginWith)
{
    EXPECT_EQ(host::safeAppName("Tux Racer"), "Tux Racer");
    EXPECT_EQ(host::safeAppName("AC/DC\nLive"), "AC\u2044DC Live");
    EXPECT_EQ(host::safeAppName(std::string(300, 'x')), std::string(200, 'x'));
    EXPECT_EQ(host::safeAppName(std::string(198, 'x') + "éy"), std::string(198, 'x') + "é");
    EXPECT_EQ(host::safeAppName(std::string(199, 'x') + "éy"), std::string(199, 'x')) << "not within a character";
    EXPECT_EQ(host::safeAppName("a\x1F\x7F b\xFF"), "a   b_");
    EXPECT_EQ(host::withoutExtension("a.b.mp4"), "a.b");
    EXPECT_EQ(host::withoutExtension("plain"), "plain");
    EXPECT_EQ(host::withoutExtension(".hidden"), ".hidden");
}

} // namespace
