// Copies that are saved where the user wants them: whole, or not at all.
#include "linux/sharing/SaveCopy.h"

#include "linux/posix/FileDescriptor.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tests {

namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::Pair;

struct SavingACopy : testing::Test {
    static constexpr std::uint64_t kStep = 16 << 20; ///< of a copy

    PrivateDirectory directory;
    std::string bytes = std::string(3'000'000, 'm') + "end";
    fs::path movie = directory.write("movie.mp4", bytes);
    fs::path place = directory.write("there/race.mp4", "what was there");
    std::vector<std::pair<std::uint64_t, std::uint64_t>> steps;
    bool goesOn = true;

    base::Result<void> save(const std::string& path)
    {
        const posix::FileDescriptor source(::open(movie.c_str(), O_RDONLY | O_CLOEXEC));
        return sharing::saveCopy(source.get(), path, [this](std::uint64_t copied, std::uint64_t total) {
            steps.emplace_back(copied, total);
            return goesOn;
        });
    }
    base::Result<void> saveWhileRefusing(std::vector<RefusedSystemCall> calls)
    {
        base::Result<void> saved;
        calls.push_back(noReflinks());
        whileRefusing(calls, [&] { saved = save(place); });
        return saved;
    }
    void expectRefusal(const base::Result<void>& saved, const char* key, const char* name = "race.mp4")
    {
        ASSERT_FALSE(saved);
        EXPECT_EQ(saved.error()->userInfo().at(base::Error::kMessageKey), key) << saved.error()->description();
        EXPECT_EQ(saved.error()->userInfo().at("name"), name);
        EXPECT_EQ(PrivateDirectory::read(place), "what was there");
        const fs::directory_iterator entries(place.parent_path());
        EXPECT_EQ(std::distance(begin(entries), end(entries)), 1) << "something is left behind";
    }
};

TEST_F(SavingACopy, TakesThePlaceOfWhatIsThereWithTheMoviesBytesAndDate)
{
    const timespec times[] = {{1'600'000'000, 0}, {1'600'000'000, 0}};
    ASSERT_EQ(::utimensat(AT_FDCWD, movie.c_str(), times, 0), 0);
    ASSERT_TRUE(save(place));
    EXPECT_EQ(PrivateDirectory::read(place), bytes);
    struct stat status = {};
    ASSERT_EQ(::stat(place.c_str(), &status), 0);
    EXPECT_EQ(status.st_mtim.tv_sec, 1'600'000'000);
}

TEST_F(SavingACopy, TellsOfEachStepAndStops)
{
    fs::resize_file(movie, 2 * kStep);
    ASSERT_TRUE(saveWhileRefusing({{SYS_copy_file_range, EXDEV}}));
    EXPECT_THAT(steps, ElementsAre(Pair(kStep, 2 * kStep), Pair(2 * kStep, 2 * kStep)));
    directory.write("there/race.mp4", "what was there");
    goesOn = false;
    const auto stopped = saveWhileRefusing({{SYS_copy_file_range, EXDEV}});
    EXPECT_EQ(stopped.error()->code(), ECANCELED);
    expectRefusal(stopped, "SHARE_COPY_FAILED");
    EXPECT_EQ(steps.size(), 3U);
}

TEST_F(SavingACopy, CostsNothingWhereFilesShareTheirBytes)
{
    // A file system that says it has shared the blocks is believed; this one has done nothing.
    whileRefusing({{SYS_ioctl, 0, 1, FICLONE, true}}, [&] { EXPECT_TRUE(save(place)); });
    EXPECT_EQ(fs::file_size(place), 0U);
    EXPECT_TRUE(steps.empty());
}

TEST_F(SavingACopy, SaysWhenTheDiskIsFull)
{
    for (const int full : {ENOSPC, EDQUOT, EFBIG})
        expectRefusal(saveWhileRefusing({{SYS_copy_file_range, full}}), "SHARE_COPY_DISK_FULL");
}

TEST_F(SavingACopy, SaysWhenItMayNotBeThere)
{
    for (const int refused : {EACCES, EPERM, EROFS})
        expectRefusal(saveWhileRefusing({noUnnamedFiles(refused)}), "SHARE_COPY_NOT_ALLOWED");
}

TEST_F(SavingACopy, SaysThatItFailedWhereNobodyKnowsWhy)
{
    expectRefusal(saveWhileRefusing({{SYS_copy_file_range, EIO}}), "SHARE_COPY_FAILED");
    expectRefusal(save(directory.path() / "nowhere/race.mp4"), "SHARE_COPY_FAILED");
}

TEST_F(SavingACopy, TakesThePlaceOfNothingButFiles)
{
    const fs::path pipe = directory.path() / "pipe"; // beside what else is there
    ASSERT_EQ(::mkfifo(pipe.c_str(), S_IRWXU), 0);
    expectRefusal(save(pipe), "SHARE_COPY_FAILED", "pipe");
    EXPECT_TRUE(fs::is_fifo(pipe));
}

TEST_F(SavingACopy, NeedsAName)
{
    for (const char* name : {"", ".", ".."})
        expectRefusal(save(place.parent_path().native() + "/" + name), "SHARE_COPY_FAILED", name);
    expectRefusal(save("race.mp4"), "SHARE_COPY_FAILED");
}

TEST_F(SavingACopy, RemovesWhatSomebodyDiedOver)
{
    const pid_t dying = ::fork();
    if (dying == 0) {
        refuseSystemCalls({noReflinks(), noUnnamedFiles()});
        const posix::FileDescriptor source(::open(movie.c_str(), O_RDONLY | O_CLOEXEC));
        static_cast<void>(sharing::saveCopy(source.get(), place, [](auto, auto) -> bool { ::_exit(0); }));
        ::_exit(1);
    }
    int status = -1;
    ::waitpid(dying, &status, 0);
    ASSERT_EQ(status, 0);
    const auto count = [this] {
        const fs::directory_iterator entries(place.parent_path());
        return std::distance(begin(entries), end(entries));
    };
    EXPECT_EQ(count(), 2) << "what was there, and what is hidden";
    EXPECT_EQ(PrivateDirectory::read(place), "what was there");
    ASSERT_TRUE(save(place));
    EXPECT_EQ(count(), 1);
}

} // namespace

} // namespace tests
