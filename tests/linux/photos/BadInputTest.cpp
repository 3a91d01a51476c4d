// What the library does when it cannot: an error that says which file and why, on the log too; nothing half done, and
// the recording as it was.

#include "linux/photos/LibraryFixture.h"
#include "support/RefusedSystemCalls.h"
#include "support/SystemCalls.h"
#include "support/WithoutPrivileges.h"

#include <csignal>
#include <sys/resource.h>
#include <tuple>

namespace {

using testing::HasSubstr;
using tests::namesIn;
using tests::PrivateDirectory;
namespace fs = std::filesystem;

class TheVideoLibraryRefuses : public tests::LibraryFixture {};

TEST_F(TheVideoLibraryRefuses, NoMovieAtAll)
{
    const auto outcome = save(std::nullopt, options());
    expectFailure(outcome, EINVAL);
    EXPECT_THAT(outcome.text(), HasSubstr("there is none"));
    EXPECT_FALSE(fs::exists(videos));
}

TEST_F(TheVideoLibraryRefuses, AnAddressThatIsNotAFile)
{
    const auto outcome = save(base::Url::fromString("https://example.org/a.mp4"), options());
    expectFailure(outcome, EINVAL);
    EXPECT_THAT(outcome.text(), HasSubstr("https://example.org/a.mp4"));
}

TEST_F(TheVideoLibraryRefuses, AMovieThatHasVanished)
{
    const auto outcome = save(home.path() / "cache/gone.mp4");
    expectFailure(outcome, ENOENT);
    EXPECT_THAT(outcome.text(), HasSubstr("cache/gone.mp4"));
}

TEST_F(TheVideoLibraryRefuses, WhatIsNoFile)
{
    expectFailure(save(home.path() / "cache"), EISDIR);
}

TEST_F(TheVideoLibraryRefuses, APipeWithoutWaitingForIt)
{
    const fs::path pipe = home.path() / "pipe.mp4";
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    expectFailure(save(pipe), EINVAL);
}

TEST_F(TheVideoLibraryRefuses, AnEmptyFile)
{
    const auto outcome = save(home.write("empty.mp4", ""));
    expectFailure(outcome, ENODATA);
    EXPECT_THAT(outcome.text(), HasSubstr("it is empty"));
}

TEST_F(TheVideoLibraryRefuses, ANameWithAZeroByte)
{
    expectFailure(save(base::Url::fromPath(source.native() + std::string("\0x", 2)), options()), ENOENT);
}

TEST_F(TheVideoLibraryRefuses, AMovieThatMayNotBeRead)
{
    const tests::WithoutPrivileges here;
    const fs::path movie = home.write("closed.mp4", "closed");
    fs::permissions(movie, fs::perms::none);
    expectFailure(save(movie), EACCES);
}

TEST_F(TheVideoLibraryRefuses, AMovieThatBecomesShorterMeanwhile)
{
    const fs::path movie = home.write("shrinking.mp4", std::string(100'000, 'm'));
    tests::Outcome outcome;
    // The kernel gives nothing more where there should be some.
    tests::whileRefusing({tests::noReflinks()}, [&] {
        photos::VideoLibrary(options(), log, works)
            .performChanges(
                [&](platform::PhotoLibraryChange& change) {
                    change.createAssetFromVideoAtFileURL(base::Url::fromPath(movie));
                    fs::resize_file(movie, 50'000);
                },
                [&](bool success, const base::ErrorRef& error) {
                    outcome = {1, success, error};
                });
    });
    expectFailure(outcome, ENODATA);
    EXPECT_THAT(outcome.text(), testing::EndsWith(": it became shorter while it was copied"));
}

TEST_F(TheVideoLibraryRefuses, ToBeAFile)
{
    home.write("Videos", "a file");
    const auto outcome = save();
    expectFailure(outcome, ENOTDIR);
    EXPECT_THAT(outcome.text(), HasSubstr(source.native()));
    EXPECT_THAT(outcome.text(), HasSubstr(videos.native() + " is not a directory; make it a directory"));
    EXPECT_EQ(PrivateDirectory::read(videos), "a file");
}

TEST_F(TheVideoLibraryRefuses, ToBeBelowAFile)
{
    home.write("Media", "a file");
    auto with = options();
    with.directories.videos = home.path() / "Media/Videos";
    expectFailure(save(base::Url::fromPath(source), with), ENOTDIR);
}

TEST_F(TheVideoLibraryRefuses, ToBeALinkToNothing)
{
    fs::create_directory_symlink(home.path() / "unplugged", videos);
    const auto outcome = save();
    expectFailure(outcome, ENOENT);
    EXPECT_THAT(outcome.text(),
                HasSubstr("is a link to " + (home.path() / "unplugged").native() + ", which is not there"));
    EXPECT_FALSE(fs::exists(home.path() / "unplugged")) << "a missing disk is not made up for";
}

TEST_F(TheVideoLibraryRefuses, ToBeALinkToItself)
{
    fs::create_directory_symlink("Videos", videos);
    expectFailure(save(), ELOOP);
}

TEST_F(TheVideoLibraryRefuses, ADirectoryThatMayNotBeWritten)
{
    const tests::WithoutPrivileges here;
    fs::create_directory(videos);
    fs::permissions(videos, fs::perms::owner_read | fs::perms::owner_exec);
    const auto outcome = save();
    expectFailure(outcome, EACCES);
    EXPECT_THAT(outcome.text(), HasSubstr("allow writing there"));
}

TEST_F(TheVideoLibraryRefuses, AHomeWhereItCannotBeMade)
{
    const tests::WithoutPrivileges here;
    fs::permissions(home.path(), fs::perms::owner_read | fs::perms::owner_exec);
    const auto outcome = save();
    fs::permissions(home.path(), fs::perms::owner_all);
    expectFailure(outcome, EACCES);
}

TEST_F(TheVideoLibraryRefuses, AFileSystemThatIsReadOnly)
{
    tests::whileRefusing({tests::noUnnamedFiles(EROFS)}, [&] { expectFailure(save(), EROFS); });
}

/// A limit for the size of files, for the whole process: what the kernel writes up to it is really there.
class FileSizeLimit {
public:
    explicit FileSizeLimit(rlim_t bytes) : m_handler(std::signal(SIGXFSZ, SIG_IGN))
    {
        ::getrlimit(RLIMIT_FSIZE, &m_before);
        const rlimit limit = {bytes, m_before.rlim_max};
        ::setrlimit(RLIMIT_FSIZE, &limit);
    }
    ~FileSizeLimit()
    {
        ::setrlimit(RLIMIT_FSIZE, &m_before);
        std::signal(SIGXFSZ, m_handler);
    }
    FileSizeLimit(const FileSizeLimit&) = delete;
    FileSizeLimit& operator=(const FileSizeLimit&) = delete;

private:
    rlimit m_before = {};
    sighandler_t m_handler;
};

/// Both kinds of file that are on their way into the library, each copied in each way, with the room ending midway.
class AFullDisk : public tests::LibraryFixture, public testing::WithParamInterface<std::tuple<bool, int>> {
protected:
    std::vector<tests::RefusedSystemCall> poorWays() const
    {
        std::vector<tests::RefusedSystemCall> refused{tests::noReflinks()};
        if (std::get<0>(GetParam()))
            refused.push_back(tests::noUnnamedFiles());
        if (std::get<1>(GetParam()) > 0)
            refused.push_back({SYS_copy_file_range, EXDEV});
        if (std::get<1>(GetParam()) > 1)
            refused.push_back({SYS_sendfile, EINVAL});
        return refused;
    }
};

TEST_P(AFullDisk, LeavesNothingHalfDone)
{
    const long lastWay[] = {SYS_copy_file_range, SYS_sendfile, SYS_pwrite64};
    auto refused = poorWays();
    refused.push_back({lastWay[std::get<1>(GetParam())], ENOSPC});
    tests::Outcome outcome;
    tests::whileRefusing(refused, [&] { outcome = save(); });
    expectFailure(outcome, ENOSPC);
    EXPECT_THAT(outcome.text(), HasSubstr("cannot save " + source.native() + " in the library " + videos.native()));
    EXPECT_THAT(outcome.text(), HasSubstr("the disk is full; make room there"));
}

TEST_P(AFullDisk, LeavesNothingHalfDoneWhenSomeIsWritten)
{
    tests::Outcome outcome;
    tests::whileRefusing(poorWays(), [&] {
        const FileSizeLimit limit(1'500'000);
        outcome = save();
    });
    expectFailure(outcome, EFBIG);
}

TEST_P(AFullDisk, IsFoundOutByTheLastFlushAtTheLatest)
{
    auto refused = poorWays();
    refused.push_back({SYS_fsync, EDQUOT});
    tests::Outcome outcome;
    tests::whileRefusing(refused, [&] { outcome = save(); });
    expectFailure(outcome, EDQUOT);
}

TEST_P(AFullDisk, HasNoRoomForAName)
{
    auto refused = poorWays();
    refused.push_back({SYS_linkat, ENOSPC});
    refused.push_back({SYS_renameat2, ENOSPC});
    tests::Outcome outcome;
    tests::whileRefusing(refused, [&] { outcome = save(); });
    expectFailure(outcome, ENOSPC);
}

std::string wayName(const testing::TestParamInfo<std::tuple<bool, int>>& way)
{
    static constexpr const char* kWays[] = {"CopiedInTheKernel", "Sent", "CopiedByHand"};
    return std::string(std::get<0>(way.param) ? "Hidden" : "Unnamed") + kWays[std::get<1>(way.param)];
}

INSTANTIATE_TEST_SUITE_P(Ways, AFullDisk, testing::Combine(testing::Bool(), testing::Range(0, 3)), &wayName);

TEST_F(TheVideoLibraryRefuses, AMovieWhoseNameWouldNotLast)
{
    tests::systemCalls().flushing = [](int file) -> std::optional<ssize_t> {
        struct stat status = {};
        ::fstat(file, &status);
        if (!S_ISDIR(status.st_mode))
            return std::nullopt;
        errno = EIO;
        return -1;
    };
    const auto outcome = save();
    tests::systemCalls() = {};
    expectFailure(outcome, EIO);
}

TEST_F(TheVideoLibraryRefuses, BothMoviesWhenOnlyOneCanGetItsName)
{
    auto with = options();
    int steps = 0;
    with.goOn = [&] {
        // The second one's file goes before it is named, as on a disk that fails.
        if (++steps == 2)
            for (const std::string& file : namesIn(videos))
                if (!PrivateDirectory::read(videos / file).starts_with(bytes.substr(0, 9)))
                    fs::remove(videos / file);
        return true;
    };
    const fs::path other = home.write("other.mp4", "another movie");
    tests::Outcome outcome;
    tests::whileRefusing({tests::noUnnamedFiles(), tests::noReflinks()}, [&] {
        photos::VideoLibrary(with, log, works)
            .performChanges(
                [&](platform::PhotoLibraryChange& change) {
                    change.createAssetFromVideoAtFileURL(base::Url::fromPath(source));
                    change.createAssetFromVideoAtFileURL(base::Url::fromPath(other));
                },
                [&](bool success, const base::ErrorRef& error) {
                    outcome = {1, success, error};
                });
    });
    expectFailure(outcome, ENOENT);
}

TEST_F(TheVideoLibraryRefuses, OneOfTwoMoviesByTakingNeither)
{
    tests::Outcome outcome;
    photos::VideoLibrary(options(), log, works)
        .performChanges(
            [&](platform::PhotoLibraryChange& change) {
                change.createAssetFromVideoAtFileURL(base::Url::fromPath(source));
                change.createAssetFromVideoAtFileURL(base::Url::fromPath(home.path() / "gone.mp4"));
            },
            [&](bool success, const base::ErrorRef& error) {
                outcome = {1, success, error};
            });
    expectFailure(outcome, ENOENT);
}

} // namespace
