// What is brought to the disk, and what is swept from it.
#include "linux/posix/NewFile.h"

#include "support/Names.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <sys/file.h>

namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using tests::namesIn;
using tests::PrivateDirectory;
namespace fs = std::filesystem;

TEST(Flushing, IsDoneWhereTheFileSystemDoesItByItself)
{
    const PrivateDirectory directory;
    const posix::FileDescriptor file(::open(directory.write("x", "x").c_str(), O_RDONLY | O_CLOEXEC));
    EXPECT_EQ(posix::flush(file.get()), 0);
    for (const auto& [said, given] : {std::pair(EINVAL, 0), {ENOSYS, 0}, {EIO, EIO}, {ENOSPC, ENOSPC}}) {
        int number = -1;
        tests::whileRefusing({{SYS_fsync, said}}, [&] { number = posix::flush(file.get()); });
        EXPECT_EQ(number, given);
    }
}

class ASweep : public testing::Test {
protected:
    PrivateDirectory directory;
    const fs::path place = directory.path() / "place";
    posix::FileDescriptor parent;

    void SetUp() override
    {
        fs::create_directory(place);
        parent = posix::FileDescriptor(::open(place.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    }
};

TEST_F(ASweep, TakesTheHiddenFilesOfTheDeadAlone)
{
    const std::vector<std::string> kept = {"..clipsa-1-2.part", ".clipsa-.part",   ".clipsa-1-2.part.mp4",
                                           ".clipsa-notes",     "clipsa-1-2.part", "film.part"};
    for (const std::string& name : kept)
        directory.write("place/" + name, "not ours");
    fs::create_symlink("film.part", place / ".clipsa-link.part");
    fs::create_directory(place / ".clipsa-directory.part");
    directory.write("place/.clipsa-1-2.part", "half");
    directory.write("place/.clipsa-x.part", "half");
    const int writer = ::open(directory.write("place/.clipsa-3-4.part", "being written").c_str(), O_RDWR | O_CLOEXEC);
    ASSERT_EQ(::flock(writer, LOCK_EX), 0);
    posix::sweepNewFiles(parent.get());
    ::close(writer);
    std::vector<std::string> left = kept;
    left.insert(left.end(), {".clipsa-3-4.part", ".clipsa-directory.part", ".clipsa-link.part"});
    std::sort(left.begin(), left.end());
    EXPECT_EQ(namesIn(place), left);
}

TEST_F(ASweep, FindsThemAnyNumberOfTimes)
{
    for (int times = 0; times < 2; ++times) {
        directory.write("place/.clipsa-1-2.part", "half");
        posix::sweepNewFiles(parent.get());
        EXPECT_THAT(namesIn(place), IsEmpty());
    }
}

TEST_F(ASweep, OfWhatIsNoDirectoryDoesNothing)
{
    posix::sweepNewFiles(-1);
    const posix::FileDescriptor file(::open(directory.write("file", "x").c_str(), O_RDONLY | O_CLOEXEC));
    posix::sweepNewFiles(file.get());
    EXPECT_THAT(namesIn(directory.path()), ElementsAre("file", "place"));
}

} // namespace
