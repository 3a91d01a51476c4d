// Moving items within a file system and from one to another, with nothing replaced and nothing half done.
#include "linux/xdg/MoveItem.h"

#include "linux/xdg/FileManager.h"
#include "linux/xdg/Modified.h"
#include "support/Names.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"
#include "support/SystemCalls.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <optional>
#include <sys/stat.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::IsEmpty;
using tests::namesIn;
using tests::setModified;

/// File systems where renaming knows no flags, in both ways to say so.
class MovingWithoutFlags : public testing::TestWithParam<int> {
protected:
    int move(const std::string& to, std::vector<tests::RefusedSystemCall> refused = {})
    {
        int number = -1;
        refused.push_back({SYS_renameat2, GetParam()});
        tests::whileRefusing(refused, [&] { number = xdg::moveItem(from, (directory.path() / to).native()); });
        return number;
    }

    tests::PrivateDirectory directory;
    const fs::path from = directory.write("from/a.mp4", "new");
};

TEST_P(MovingWithoutFlags, TakesAnItemToItsPlace)
{
    EXPECT_EQ(move("b.mp4"), 0);
    EXPECT_EQ(tests::PrivateDirectory::read(directory.path() / "b.mp4"), "new");
    EXPECT_FALSE(fs::exists(from));
}

TEST_P(MovingWithoutFlags, NeverReplacesAnything)
{
    const fs::path old = directory.write("b.mp4", "old");
    fs::create_symlink("nowhere", directory.path() / "link.mp4");
    EXPECT_EQ(move("b.mp4"), EEXIST);
    EXPECT_EQ(move("link.mp4"), EEXIST) << "a link to nothing is something";
    EXPECT_EQ(tests::PrivateDirectory::read(old), "old");
    EXPECT_TRUE(fs::is_symlink(directory.path() / "link.mp4"));
    EXPECT_EQ(tests::PrivateDirectory::read(from), "new");
}

TEST_P(MovingWithoutFlags, SaysWhyItFails)
{
    EXPECT_EQ(move("none/b.mp4"), ENOENT);
    EXPECT_EQ(move("b.mp4", {{SYS_rename, EROFS}}), EROFS);
    EXPECT_EQ(tests::PrivateDirectory::read(from), "new");
}

INSTANTIATE_TEST_SUITE_P(Errors, MovingWithoutFlags, testing::Values(EINVAL, ENOSYS),
                         [](const auto& error) { return std::string(::strerrorname_np(error.param)); });

/// Two directories on different file systems, where this machine has two.
class MovingAcrossFileSystems : public testing::Test {
protected:
    static constexpr const char* kOtherFileSystem = "/dev/shm";

    tests::TestSystem machine;
    tests::PrivateDirectory here;
    std::optional<tests::PrivateDirectory> there;
    xdg::FileManager files{machine.system, {}};

    ~MovingAcrossFileSystems() override { tests::systemCalls() = {}; }

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
    EXPECT_THAT(namesIn(there->path()), ElementsAre("b.mp4"));
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
    EXPECT_THAT(namesIn(there->path()), ElementsAre("a.mp4"));
}

TEST_F(MovingAcrossFileSystems, LeavesNothingHalfDone)
{
    here.write("d/a", "a");
    ASSERT_EQ(::mkfifo((here.path() / "d/pipe").c_str(), 0600), 0);
    EXPECT_EQ(files.moveItem(here.path() / "d", there->path() / "d").error()->code(), EXDEV);
    EXPECT_THAT(namesIn(there->path()), IsEmpty());
    EXPECT_THAT(namesIn(here.path() / "d"), ElementsAre("a", "pipe"));
}

TEST_F(MovingAcrossFileSystems, LetsTheSourceGoWhenTheCopyIsOnTheDiskOnly)
{
    const fs::path from = here.write("a.mp4", "new");
    tests::systemCalls().flushing = [&](int) -> std::optional<ssize_t> {
        EXPECT_TRUE(fs::exists(from));
        EXPECT_FALSE(fs::exists(there->path() / "b.mp4"));
        errno = EIO;
        return -1;
    };
    EXPECT_EQ(files.moveItem(from, there->path() / "b.mp4").error()->code(), EIO);
    EXPECT_EQ(tests::PrivateDirectory::read(from), "new");
    EXPECT_THAT(namesIn(there->path()), IsEmpty());
}

TEST_F(MovingAcrossFileSystems, ShowsNobodyADirectoryThatIsBeingFilled)
{
    here.write("d/a", "a");
    fs::permissions(here.path() / "d", fs::perms::all);
    int flushed = 0;
    tests::systemCalls().flushing = [&](int) -> std::optional<ssize_t> {
        ++flushed;
        for (const auto& entry : fs::directory_iterator(there->path()))
            EXPECT_EQ(entry.status().permissions(), fs::perms::owner_all);
        return std::nullopt;
    };
    ASSERT_TRUE(files.moveItem(here.path() / "d", there->path() / "d"));
    EXPECT_EQ(flushed, 1);
    EXPECT_EQ(fs::status(there->path() / "d").permissions(), fs::perms::all);
}

TEST_F(MovingAcrossFileSystems, LeavesNothingOpen)
{
    const auto open = [] { return namesIn("/proc/self/fd").size(); };
    const auto before = open();
    ASSERT_TRUE(files.moveItem(here.write("a.mp4", "new"), there->path() / "b.mp4"));
    EXPECT_EQ(open(), before);
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
    EXPECT_THAT(namesIn(there->path()), ElementsAre(name));
}

} // namespace
