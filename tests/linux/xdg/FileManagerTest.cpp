#include "linux/xdg/FileManager.h"

#include "linux/xdg/MoveItem.h"
#include "support/PrivateDirectory.h"
#include "support/TestSystem.h"
#include "support/WithoutPrivileges.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <fcntl.h>
#include <optional>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;
using testing::IsEmpty;
using testing::UnorderedElementsAre;

void setModified(const fs::path& path, double seconds)
{
    struct timespec times[2] = {};
    for (struct timespec& time : times)
        time.tv_sec = static_cast<std::time_t>(seconds);
    ASSERT_EQ(::utimensat(AT_FDCWD, path.c_str(), times, AT_SYMLINK_NOFOLLOW), 0);
}

std::vector<std::string> namesIn(const fs::path& directory)
{
    std::vector<std::string> names;
    for (const auto& entry : fs::directory_iterator(directory))
        names.push_back(entry.path().filename());
    return names;
}

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
    setModified(file, 1'500'000'000);
    const auto attributes = files.attributesOfItem(file).value();
    EXPECT_EQ(attributes.creationDate, base::Date{1'500'000'000});
    EXPECT_EQ(attributes.modificationDate, base::Date{1'500'000'000});
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

/// Two directories on different file systems, where this machine has two.
class MovingAcrossFileSystems : public testing::Test {
protected:
    static constexpr const char* kOtherFileSystem = "/dev/shm";

    tests::TestSystem machine;
    tests::PrivateDirectory here;
    std::optional<tests::PrivateDirectory> there;
    xdg::FileManager files{machine.system, {}};

    void SetUp() override
    {
        struct stat mine = {};
        struct stat other = {};
        ASSERT_EQ(::stat(here.path().c_str(), &mine), 0);
        ASSERT_EQ(::stat(kOtherFileSystem, &other), 0) << "these tests need a second file system";
        ASSERT_NE(mine.st_dev, other.st_dev) << "these tests need a TMPDIR outside " << kOtherFileSystem;
        there.emplace(kOtherFileSystem);
    }
};

TEST_F(MovingAcrossFileSystems, KeepsContentsDatesAndPermissions)
{
    const std::string contents(300'000, 'm');
    const fs::path from = here.write("a.mp4", contents);
    fs::permissions(from, fs::perms::owner_read | fs::perms::group_read);
    setModified(from, 1'500'000'000);
    const fs::path to = there->path() / "b.mp4";
    ASSERT_TRUE(files.moveItem(from, to));
    EXPECT_EQ(tests::PrivateDirectory::read(to), contents);
    EXPECT_EQ(files.attributesOfItem(to).value().modificationDate, base::Date{1'500'000'000});
    EXPECT_EQ(fs::status(to).permissions(), fs::perms::owner_read | fs::perms::group_read);
    EXPECT_THAT(namesIn(here.path()), IsEmpty());
    EXPECT_THAT(namesIn(there->path()), UnorderedElementsAre("b.mp4"));
}

TEST_F(MovingAcrossFileSystems, TakesWholeDirectoriesWithLinksAsLinks)
{
    here.write("d/deep/a", "a");
    fs::create_symlink("deep/a", here.path() / "d/link");
    fs::permissions(here.path() / "d/deep", fs::perms::owner_read | fs::perms::owner_exec);
    setModified(here.path() / "d/deep", 1'500'000'000);
    const auto moved = files.moveItem(here.path() / "d", there->path() / "d");
    EXPECT_EQ(fs::status(there->path() / "d/deep").permissions(), fs::perms::owner_read | fs::perms::owner_exec);
    for (const auto* directory : {&here, &*there})
        if (fs::exists(directory->path() / "d/deep"))
            fs::permissions(directory->path() / "d/deep", fs::perms::owner_all);
    EXPECT_EQ(files.attributesOfItem(there->path() / "d/deep").value().modificationDate, base::Date{1'500'000'000});
    EXPECT_EQ(fs::read_symlink(there->path() / "d/link"), "deep/a");
    EXPECT_EQ(tests::PrivateDirectory::read(there->path() / "d/link"), "a");
    // Only the super-user could empty the source, whose directory forbids it; the others keep both.
    EXPECT_EQ(static_cast<bool>(moved), !fs::exists(here.path() / "d"));
}

TEST_F(MovingAcrossFileSystems, NeverReplacesAnything)
{
    const fs::path from = here.write("a.mp4", "new");
    const fs::path to = there->write("a.mp4", "old");
    EXPECT_EQ(files.moveItem(from, to).error()->code(), EEXIST);
    EXPECT_EQ(tests::PrivateDirectory::read(to), "old");
    EXPECT_EQ(tests::PrivateDirectory::read(from), "new");
    EXPECT_THAT(namesIn(there->path()), UnorderedElementsAre("a.mp4"));
}

TEST_F(MovingAcrossFileSystems, LeavesNothingHalfDone)
{
    here.write("d/a", "a");
    ASSERT_EQ(::mkfifo((here.path() / "d/pipe").c_str(), 0600), 0);
    EXPECT_EQ(files.moveItem(here.path() / "d", there->path() / "d").error()->code(), EXDEV);
    EXPECT_THAT(namesIn(there->path()), IsEmpty());
    EXPECT_THAT(namesIn(here.path() / "d"), UnorderedElementsAre("a", "pipe"));
}

TEST_F(MovingAcrossFileSystems, FailsWhereThereIsNoSuchDirectory)
{
    const fs::path from = here.write("a.mp4", "new");
    EXPECT_FALSE(files.moveItem(from, there->path() / "no/a.mp4"));
    EXPECT_EQ(tests::PrivateDirectory::read(from), "new");
}

TEST_F(MovingAcrossFileSystems, TakesTheLongestNamesThatAFileCanHave)
{
    const std::string name(255, 'n');
    const fs::path from = here.write(name, "a");
    EXPECT_TRUE(files.moveItem(from, there->path() / name));
    EXPECT_THAT(namesIn(there->path()), UnorderedElementsAre(name));
}

} // namespace
