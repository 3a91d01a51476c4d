#include "linux/xdg/MountTable.h"

#include <gtest/gtest.h>

namespace {

class AMountTable : public testing::Test {
protected:
    xdg::MountTable table;

    AMountTable()
    {
        table.mount(xdg::kPrivateLibraryPrefix, "/cache/editor");
        table.mount(xdg::kSystemLibraryPrefix, "/usr/share/clipsa");
    }
};

TEST_F(AMountTable, PutsADirectoryInPlaceOfAPrefix)
{
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/Velkor/a.mp4"), "/cache/editor/Velkor/a.mp4");
    EXPECT_EQ(table.resolved("/System/Library/Bundles/x"), "/usr/share/clipsa/Bundles/x");
    EXPECT_EQ(table.resolved("/private/var/mobile/Library"), "/cache/editor");
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/"), "/cache/editor");
}

TEST_F(AMountTable, TakesAnyNumberOfSlashesForOne)
{
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/Velkor//a.mp4"), "/cache/editor/Velkor/a.mp4");
    EXPECT_EQ(table.resolved("//private///var/mobile//Library//a//"), "/cache/editor/a");
}

TEST_F(AMountTable, MatchesWholeComponentsOnly)
{
    EXPECT_EQ(table.resolved("/private/var/mobile/LibraryOther/a"), "/private/var/mobile/LibraryOther/a");
    EXPECT_EQ(table.resolved("/private/var/mobile"), "/private/var/mobile");
    EXPECT_EQ(table.resolved("/home/private/var/mobile/Library/a"), "/home/private/var/mobile/Library/a");
}

TEST_F(AMountTable, LeavesOtherPathsAloneToTheLastByte)
{
    for (const char* path : {"", "/", "/home//user/../user/./a/", "private/var/mobile/Library/a", "../a", "/tmp/\xff"})
        EXPECT_EQ(table.resolved(path), path);
}

TEST_F(AMountTable, KeepsDotsWithinAMountAndLetsNoneEscape)
{
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/Velkor/../a"), "/cache/editor/a");
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/./Velkor/."), "/cache/editor/Velkor");
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/../../../etc/passwd"), "/cache/editor/etc/passwd");
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/Velkor/../../../Library/a"), "/cache/editor/Library/a");
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/.."), "/cache/editor");
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/...a"), "/cache/editor/...a");
}

TEST_F(AMountTable, IsNotGotAroundByDotsBeforeTheMount)
{
    EXPECT_EQ(table.resolved("/tmp/../private/var/./mobile/Library/a"), "/cache/editor/a");
    EXPECT_EQ(table.resolved("/../private/var/mobile/Library/a"), "/cache/editor/a");
}

TEST_F(AMountTable, PrefersTheLongestOfNestedMounts)
{
    table.mount("/private/var/mobile/Library/Deep", "/deep");
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/Deep/a"), "/deep/a");
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/Deep/../a"), "/deep/a");
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/Deeper/a"), "/cache/editor/Deeper/a");
}

TEST_F(AMountTable, MountsAPrefixAnew)
{
    table.mount("/System//Library/", "/build/resources");
    EXPECT_EQ(table.resolved("/System/Library/a"), "/build/resources/a");
}

TEST_F(AMountTable, GivesNothingForAPathWithAZeroByte)
{
    using namespace std::string_literals;
    EXPECT_EQ(table.resolved("/private/var/mobile/Library/Velkor\0.mp4"s), "");
    EXPECT_EQ(table.resolved("/tmp/a\0b"s), "");
}

TEST_F(AMountTable, KnowsItsRootsHoweverTheyAreWritten)
{
    EXPECT_TRUE(table.isRoot("/private/var/mobile/Library"));
    EXPECT_TRUE(table.isRoot("/private/var/mobile/Library/Velkor/../.."));
    EXPECT_TRUE(table.isRoot("/tmp/.."));
    EXPECT_TRUE(table.isRoot("/"));
    EXPECT_TRUE(table.isRoot("//"));
    EXPECT_TRUE(xdg::MountTable().isRoot("/")) << "without any mount, too";
    EXPECT_FALSE(table.isRoot("/private/var/mobile"));
    EXPECT_FALSE(table.isRoot("/private/var/mobile/Library/Velkor/"));
    EXPECT_FALSE(table.isRoot(""));
}

} // namespace
