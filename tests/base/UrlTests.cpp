#include "base/Url.h"

#include <gtest/gtest.h>

namespace {

using base::Url;

TEST(UrlTests, PathsAreKeptByteForByte)
{
    EXPECT_EQ(Url::fromPath("//a//b%20c/").path(), "//a//b%20c/");
}

TEST(UrlTests, AFilesAddressIsEncodedWhereItMustBe)
{
    EXPECT_EQ(Url::fromPath("/a b/ü?#%.mp4").string(), "file:///a%20b/%C3%BC%3F%23%25.mp4");
}

TEST(UrlTests, EveryPathComesBackFromItsAddress)
{
    for (const char* path : {"/a b", "//doubled//slashes", "/per%20cent", "/ümläut", "relative/path", "/", "", "a:b"}) {
        const auto url = Url::fromPath(path);
        const auto back = Url::fromString(url.string());
        ASSERT_TRUE(back) << path;
        EXPECT_EQ(*back, url) << path;
    }
}

TEST(UrlTests, TheHostOfAFilesAddressIsSkipped)
{
    EXPECT_EQ(Url::fromString("file://localhost/a")->path(), "/a");
}

TEST(UrlTests, BrokenEscapesStayAsTheyAre)
{
    EXPECT_EQ(Url::fromString("file:///a%2")->path(), "/a%2");
    EXPECT_EQ(Url::fromString("file:///a%zz")->path(), "/a%zz");
}

TEST(UrlTests, TextWithoutASchemeIsNoAddress)
{
    EXPECT_FALSE(Url::fromString(""));
    EXPECT_FALSE(Url::fromString("/a/b"));
    EXPECT_FALSE(Url::fromString(":x"));
    EXPECT_FALSE(Url::fromString("a b:c"));
    EXPECT_FALSE(Url::fromString("12:34"));
}

TEST(UrlTests, SchemesAreTheSameInAnyCase)
{
    EXPECT_TRUE(Url::fromString("FILE:///a")->isFile());
}

TEST(UrlTests, OtherAddressesAreKeptAsTheyAre)
{
    const auto url = Url::fromString("https://example.org/a%20b?c#d");
    ASSERT_TRUE(url);
    EXPECT_FALSE(url->isFile());
    EXPECT_EQ(url->path(), "");
    EXPECT_EQ(url->string(), "https://example.org/a%20b?c#d");
}

TEST(UrlTests, TheLastPathComponentStandsBehindTheLastSlash)
{
    EXPECT_EQ(Url::fromPath("/a/b.mp4").lastPathComponent(), "b.mp4");
    EXPECT_EQ(Url::fromPath("b.mp4").lastPathComponent(), "b.mp4");
    EXPECT_EQ(Url::fromPath("/a/").lastPathComponent(), "");
}

} // namespace
