#include "linux/xdg/FileManager.h"

#include "linux/xdg/Modified.h"
#include "linux/xdg/MoveItem.h"
#include "support/Names.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"
#include "support/TestSystem.h"
#include "support/WithoutPrivileges.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;
using testing::UnorderedElementsAre;
using tests::setModified;

class TheFilesOfThisMachine : public testing::Test {
protected:
    tests::TestSystem machine;
    tests::PrivateDirectory directory;
    xdg::FileManager files{machine.system, mounts()};

    xdg::MountTable mounts() const
    {
        xdg::MountTable table;
        table.mount(xdg::kPrivateLibraryPrefix, directory.path() / "library");
        return table;
    }
    void SetUp() override { fs::create_directory(directory.path() / "library"); }
};

TEST_F(TheFilesOfThisMachine, AreCreatedWhenTheyWereModifiedIfThatWasBeforeTheirBirth)
{
    const fs::path file = directory.write("a.mp4", "a");
    setModified(file, 1'500'000'000.25);
    const auto attributes = files.attributesOfItem(file).value();
    EXPECT_EQ(attributes.creationDate, base::Date{1'500'000'000.25});
    EXPECT_EQ(attributes.modificationDate, base::Date{1'500'000'000.25});
}

TEST_F(TheFilesOfThisMachine, AreAsOldAsTheirContentsWhereNobodyKnowsTheirBirth)
{
    const std::string file = "/proc/version";
    struct statx found = {};
    ASSERT_EQ(::statx(AT_FDCWD, file.c_str(), 0, STATX_BTIME, &found), 0);
    if ((found.stx_mask & STATX_BTIME) != 0)
        return;
    const auto attributes = files.attributesOfItem(file).value();
    EXPECT_GT(attributes.modificationDate, base::Date{0});
    EXPECT_EQ(attributes.creationDate, attributes.modificationDate);
}

TEST_F(TheFilesOfThisMachine, ArePutIntoDirectoriesThatTheUsersMaskMakesPrivate)
{
    const mode_t before = ::umask(0);
    EXPECT_TRUE(files.createDirectory(directory.path() / "open"));
    ::umask(077);
    EXPECT_TRUE(files.createDirectory(directory.path() / "closed"));
    ::umask(before);
    EXPECT_EQ(fs::status(directory.path() / "open").permissions(), fs::perms(0777));
    EXPECT_EQ(fs::status(directory.path() / "closed").permissions(), fs::perms(0700));
    EXPECT_EQ(files.createDirectory(directory.path() / "open").error()->code(), EEXIST);
}

TEST_F(TheFilesOfThisMachine, AreFoundWithTheirSizeAndKind)
{
    const fs::path file = directory.write("a.mp4", "seven by");
    EXPECT_TRUE(files.fileExists(file));
    EXPECT_FALSE(files.fileExists(directory.path() / "b.mp4"));
    EXPECT_EQ(files.attributesOfItem(file).value().size, 8);
    EXPECT_FALSE(files.attributesOfItem(file).value().isDirectory);
    EXPECT_TRUE(files.attributesOfItem(directory.path()).value().isDirectory);
}

TEST_F(TheFilesOfThisMachine, AreCreatedAtTheirBirthIfTheyWereModifiedLater)
{
    const fs::path file = directory.write("a.mp4", "a");
    struct statx found = {};
    ASSERT_EQ(::statx(AT_FDCWD, file.c_str(), 0, STATX_BTIME, &found), 0);
    setModified(file, 4'000'000'000);
    // A file system that does not know when files are born leaves the modification.
    const double born = (found.stx_mask & STATX_BTIME) != 0 ? static_cast<double>(found.stx_btime.tv_sec) : 4e9;
    const auto attributes = files.attributesOfItem(file).value();
    EXPECT_NEAR(attributes.creationDate.secondsSince1970, born, 1);
    EXPECT_EQ(attributes.modificationDate, base::Date{4'000'000'000});
}

TEST_F(TheFilesOfThisMachine, KeepTheDateOfARecordingInItsHardLinksAndCopies)
{
    const fs::path recording = directory.write("recording.mp4", "movie");
    setModified(recording, 1'500'000'000);
    fs::create_hard_link(recording, directory.path() / "link.mp4");
    ASSERT_EQ(xdg::copyItem(recording, directory.path() / "copy.mp4"), 0);
    for (const char* name : {"link.mp4", "copy.mp4"})
        EXPECT_EQ(files.attributesOfItem(directory.path() / name).value().creationDate, base::Date{1'500'000'000});
}

TEST_F(TheFilesOfThisMachine, AreWrittenBelowTheMountAndKnownToOthersByTheirRealPath)
{
    EXPECT_TRUE(files.createDirectory("/private/var/mobile/Library/Velkor/"));
    EXPECT_TRUE(fs::is_directory(directory.path() / "library/Velkor"));
    EXPECT_EQ(files.resolvedPath("/private/var/mobile/Library/Velkor//a.mp4"),
              (directory.path() / "library/Velkor/a.mp4").native());
}

TEST_F(TheFilesOfThisMachine, OutsideAMountAreNotReachedByDots)
{
    directory.write("outside", "outside");
    EXPECT_FALSE(files.fileExists("/private/var/mobile/Library/../outside"));
    EXPECT_FALSE(files.removeItem("/private/var/mobile/Library/Velkor/../../outside"));
    EXPECT_TRUE(fs::exists(directory.path() / "outside"));
}

TEST_F(TheFilesOfThisMachine, StayWhereTheyAreMounted)
{
    directory.write("library/a.mp4", "a");
    for (const char* path : {"/private/var/mobile/Library", "/private/var/mobile/Library/a/../.."}) {
        EXPECT_EQ(files.removeItem(path).error()->code(), EBUSY);
        EXPECT_EQ(files.moveItem(path, directory.path() / "b").error()->code(), EBUSY);
    }
    EXPECT_TRUE(fs::exists(directory.path() / "library/a.mp4"));
}

TEST_F(TheFilesOfThisMachine, AreNotTakenForOneAnotherBecauseOfAZeroByte)
{
    const std::string path = directory.write("a", "a").native() + std::string("\0b", 2);
    EXPECT_FALSE(files.fileExists(path));
    EXPECT_EQ(files.removeItem(path).error()->code(), ENOENT);
    EXPECT_TRUE(fs::exists(directory.path() / "a"));
}

TEST_F(TheFilesOfThisMachine, GoWithTheirDirectoryButNotWhatItsLinksPointTo)
{
    const fs::path kept = directory.write("kept/a", "kept");
    directory.write("gone/b", "b");
    fs::create_directory_symlink(directory.path() / "kept", directory.path() / "gone/link");
    EXPECT_TRUE(files.removeItem(directory.path() / "gone"));
    EXPECT_EQ(tests::PrivateDirectory::read(kept), "kept");
    EXPECT_FALSE(fs::exists(directory.path() / "gone"));
}

TEST_F(TheFilesOfThisMachine, ThatCannotBeRemovedSayWhy)
{
    const tests::WithoutPrivileges here;
    directory.write("closed/a", "a");
    fs::permissions(directory.path() / "closed", fs::perms::owner_read | fs::perms::owner_exec);
    const auto removed = files.removeItem(directory.path() / "closed/a");
    fs::permissions(directory.path() / "closed", fs::perms::owner_all);
    ASSERT_FALSE(removed);
    EXPECT_EQ(removed.error()->code(), EACCES);
    EXPECT_THAT(removed.error()->description(), testing::HasSubstr("closed/a"));
}

TEST_F(TheFilesOfThisMachine, WithNamesThatAreNotTextAreListedByteForByte)
{
    directory.write("odd/\xff\xfe.mp4", "a");
    EXPECT_THAT(files.contentsOfDirectory(directory.path() / "odd").value(), UnorderedElementsAre("\xff\xfe.mp4"));
}

TEST_F(TheFilesOfThisMachine, HaveTheFreeSpaceThatAUserWithoutPrivilegesCanWrite)
{
    // Others write to this disk meanwhile: within a tenth is as good as equal.
    struct statvfs found = {};
    ASSERT_EQ(::statvfs(directory.path().c_str(), &found), 0);
    const double expected = static_cast<double>(found.f_bavail) * static_cast<double>(found.f_frsize);
    EXPECT_NEAR(static_cast<double>(files.attributesOfFileSystem(directory.path()).value().freeSize), expected,
                expected / 10);
}

TEST_F(TheFilesOfThisMachine, AreNotMovedInAnotherWayWhereMovingFails)
{
    const fs::path from = directory.write("a.mp4", "new");
    for (const int number : {EACCES, ENOSPC, EIO}) {
        tests::whileRefusing({{SYS_renameat2, number}}, [&] {
            EXPECT_EQ(files.moveItem(from, directory.path() / "b.mp4").error()->code(), number);
        });
        EXPECT_EQ(tests::PrivateDirectory::read(from), "new");
        EXPECT_FALSE(fs::exists(directory.path() / "b.mp4"));
    }
}

} // namespace
