#include "linux/sharing/Outbox.h"

#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"
#include "support/WithoutPrivileges.h"

#include <gmock/gmock.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <ctime>
#include <fcntl.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>

namespace {

namespace fs = std::filesystem;
using sharing::Outbox;
using testing::HasSubstr;
using tests::PrivateDirectory;

struct stat statusOf(const fs::path& path)
{
    struct stat status = {};
    EXPECT_EQ(::lstat(path.c_str(), &status), 0) << path;
    return status;
}

class AnOutbox : public ::testing::Test {
protected:
    std::shared_ptr<const Outbox::File> put(const std::string& name = "Tux Racer.mp4",
                                            Outbox::Use use = Outbox::Use::Read)
    {
        auto file = m_outbox.put(m_movie, name, {}, use);
        EXPECT_TRUE(file) << file.error()->description();
        return file ? std::move(file).value() : nullptr;
    }

    std::string nameFor(const std::string& name)
    {
        const auto file = put(name);
        return file ? fs::path(file->path()).filename().string() : "";
    }

    std::size_t count() const
    {
        std::error_code error;
        const fs::directory_iterator entries(m_root, error);
        return static_cast<std::size_t>(std::distance(begin(entries), end(entries)));
    }

    /// The directory below the outbox that `file` lies in.
    fs::path held(const std::string& file) const { return m_root / *fs::relative(file, m_root).begin(); }

    void date(const fs::path& path, std::chrono::seconds ago)
    {
        const timespec then = {std::time(nullptr) - ago.count(), 0};
        const timespec times[] = {then, then};
        ASSERT_EQ(::utimensat(AT_FDCWD, path.c_str(), times, 0), 0);
    }

    void expectRefusal(const base::ErrorRef& error, const char* message)
    {
        ASSERT_TRUE(error);
        EXPECT_EQ(error->userInfo().at(base::Error::kMessageKey), message) << error->description();
        EXPECT_EQ(error->userInfo().at("name"), "Tux Racer.mp4");
        EXPECT_EQ(count(), 0U) << "something is left behind";
    }

    PrivateDirectory m_directory;
    std::string m_bytes = std::string(3'000'000, 'm') + "end";
    fs::path m_movie = m_directory.write("movies/movie.mp4", m_bytes);
    fs::path m_root = m_directory.path() / "cache/clipsa/outbox";
    Outbox m_outbox{m_root};
};

TEST_F(AnOutbox, IsNotThereUntilItIsNeeded)
{
    m_outbox.sweep();
    EXPECT_FALSE(fs::exists(m_root));
    put();
    EXPECT_TRUE(fs::exists(m_root));
}

TEST_F(AnOutbox, HoldsWhatWasGivenToItUnderTheNameThatItsReceiverSees)
{
    const auto file = put();
    EXPECT_EQ(fs::path(file->path()).filename(), "Tux Racer.mp4");
    EXPECT_EQ(PrivateDirectory::read(file->path()), m_bytes);
    EXPECT_EQ(statusOf(file->path()).st_mtim.tv_sec, statusOf(m_movie).st_mtim.tv_sec);
}

TEST_F(AnOutbox, ShowsNothingBesideTheFile)
{
    const auto file = put();
    const fs::directory_iterator entries(fs::path(file->path()).parent_path());
    EXPECT_EQ(std::distance(begin(entries), end(entries)), 1);
}

TEST_F(AnOutbox, IsForTheUserAlone)
{
    const mode_t before = ::umask(0);
    const auto file = put();
    ::umask(before);
    EXPECT_EQ(statusOf(held(file->path())).st_mode & ACCESSPERMS, 0700U);
    EXPECT_EQ(statusOf(fs::path(file->path()).parent_path()).st_mode & ACCESSPERMS, 0700U);
}

TEST_F(AnOutbox, KeepsTwoFilesOfOneName)
{
    const auto one = put();
    const auto other = put();
    EXPECT_NE(one->path(), other->path());
    EXPECT_EQ(PrivateDirectory::read(one->path()), PrivateDirectory::read(other->path()));
}

TEST_F(AnOutbox, KeepsTheFileWhenTheMovieIsGone)
{
    const auto file = put();
    fs::remove(m_movie);
    EXPECT_EQ(PrivateDirectory::read(file->path()), m_bytes);
}

TEST_F(AnOutbox, TakesNoRoomForWhatIsOnlyRead)
{
    tests::whileRefusing({tests::noReflinks(), {SYS_copy_file_range, ENOSPC}}, [&] {
        const auto file = put();
        ASSERT_TRUE(file);
        EXPECT_EQ(statusOf(file->path()).st_ino, statusOf(m_movie).st_ino);
    });
}

TEST_F(AnOutbox, RatherHasBytesOfItsOwnWhereTheyTakeNoRoomEither)
{
    // A file system that says it has shared the blocks is believed; this one has done nothing.
    tests::whileRefusing({{SYS_ioctl, 0, 1, FICLONE, true}}, [&] {
        const auto file = put();
        ASSERT_TRUE(file);
        EXPECT_NE(statusOf(file->path()).st_ino, statusOf(m_movie).st_ino);
        EXPECT_EQ(statusOf(file->path()).st_size, 0);
    });
}

TEST_F(AnOutbox, GivesNobodyTheUsersOwnFileToChange)
{
    tests::whileRefusing({tests::noReflinks()}, [&] {
        const auto file = put("Tux Racer.mp4", Outbox::Use::Change);
        ASSERT_TRUE(file);
        std::ofstream(file->path()) << "changed";
        EXPECT_EQ(PrivateDirectory::read(m_movie), m_bytes);
    });
}

TEST_F(AnOutbox, GivesADescriptorThatCannotBeWrittenTo)
{
    const auto file = put();
    const posix::FileDescriptor open = file->openForReading();
    ASSERT_TRUE(open);
    EXPECT_EQ(::fcntl(open.get(), F_GETFL) & O_ACCMODE, O_RDONLY);
    EXPECT_EQ(::write(open.get(), "x", 1), -1);
    EXPECT_EQ(::fcntl(open.get(), F_GETFD) & FD_CLOEXEC, FD_CLOEXEC);
}

TEST_F(AnOutbox, CallsFilesWhatEveryProgramTakes)
{
    EXPECT_EQ(nameFor("a/b\\c\n\x7f.mp4"), "a-b-c.mp4");
    EXPECT_EQ(nameFor("../../etc/passwd"), "etc-passwd");
    EXPECT_EQ(nameFor("movie\u202E4pm.exe.mp4"), "movie4pm.exe.mp4") << "text that is turned around";
    EXPECT_EQ(nameFor("Tux & \"Racer\" 100%.mp4"), "Tux & -Racer- 100%.mp4");
    EXPECT_EQ(nameFor(std::string("zero\0byte.mp4", 13)), "zero\uFFFDbyte.mp4");
    EXPECT_EQ(nameFor("\xff\xfe.webm"), "\uFFFD\uFFFD.webm");
    EXPECT_EQ(nameFor("録画.mp4"), "録画.mp4");
    EXPECT_EQ(nameFor("-rf"), "rf");
    for (const char* empty : {"", ".", "..", "/", "\u202E"})
        EXPECT_EQ(nameFor(empty), "Recording");
    EXPECT_EQ(nameFor(" .mp4"), "Recording.mp4");
}

TEST_F(AnOutbox, ShortensNamesAndKeepsWhatKindOfFileTheyAre)
{
    const std::string name = nameFor(std::string(1'000'000, 'n') + ".mp4");
    EXPECT_EQ(name.size(), Outbox::kLongestName);
    EXPECT_THAT(name, testing::EndsWith("n.mp4"));

    std::string wide;
    for (int i = 0; i < 100; ++i)
        wide += "録";
    EXPECT_EQ(nameFor(wide + ".mkv"), wide.substr(0, 114) + ".mkv") << "no character is cut in two";
    EXPECT_EQ(nameFor("a." + std::string(500, 'x')).size(), Outbox::kLongestName) << "no extension";
}

TEST_F(AnOutbox, KeepsForADayWhatNobodyHolds)
{
    const std::string path = put()->path();
    date(held(path), std::chrono::hours(23));
    m_outbox.sweep();
    EXPECT_TRUE(fs::exists(path));
    date(held(path), std::chrono::hours(24));
    m_outbox.sweep();
    EXPECT_EQ(count(), 0U);
}

TEST_F(AnOutbox, CountsTheDayFromTheEndOfTheCopy)
{
    // What was made in no time at all is not older than what is in it.
    std::string path;
    tests::whileRefusing({tests::noReflinks()}, [&] {
        const auto file = m_outbox.put(
            m_movie, "a.mp4",
            [&](std::uint64_t, std::uint64_t) {
                path = fs::directory_iterator(m_root)->path();
                date(path, std::chrono::hours(30));
                return true;
            },
            Outbox::Use::Change);
        EXPECT_TRUE(file);
    });
    ASSERT_FALSE(path.empty());
    EXPECT_GT(statusOf(path).st_mtim.tv_sec, std::time(nullptr) - 60);
}

TEST_F(AnOutbox, KeepsWhatSomebodyHoldsForAsLongAsThat)
{
    auto file = put();
    const std::string path = file->path();
    date(held(path), std::chrono::hours(100));
    m_outbox.sweep();
    EXPECT_TRUE(fs::exists(path));
    file.reset();
    m_outbox.sweep();
    EXPECT_FALSE(fs::exists(path));
}

TEST_F(AnOutbox, KeepsWhatAnotherProcessHolds)
{
    std::array<int, 2> there{};
    std::array<int, 2> end{};
    ASSERT_EQ(::pipe(there.data()), 0);
    ASSERT_EQ(::pipe(end.data()), 0);
    const pid_t holder = ::fork();
    if (holder == 0) {
        ::close(end[1]);
        const auto file = Outbox(m_root).put(m_movie, "a.mp4");
        char wait = 0;
        const bool told = ::write(there[1], "", 1) == 1;
        ::_exit(told && ::read(end[0], &wait, 1) == 0 && file ? 0 : 1);
    }
    char ready = 0;
    ASSERT_EQ(::read(there[0], &ready, 1), 1);
    const fs::path path = fs::directory_iterator(m_root)->path();
    date(path, std::chrono::hours(100));
    m_outbox.sweep();
    EXPECT_TRUE(fs::exists(path));
    ::kill(holder, SIGKILL);
    ::waitpid(holder, nullptr, 0);
    for (const int descriptor : {there[0], there[1], end[0], end[1]})
        ::close(descriptor);
    m_outbox.sweep();
    EXPECT_FALSE(fs::exists(path));
}

TEST_F(AnOutbox, KeepsWhatAClockThatWasSetBackMadeInTheFutureForADayToo)
{
    const std::string path = put()->path();
    date(held(path), -std::chrono::hours(1));
    m_outbox.sweep();
    EXPECT_TRUE(fs::exists(path));
    date(held(path), -std::chrono::hours(1000));
    m_outbox.sweep();
    EXPECT_FALSE(fs::exists(path));
}

TEST_F(AnOutbox, RemovesAtOnceWhatSomebodyDiedOver)
{
    const pid_t dying = ::fork();
    if (dying == 0) {
        tests::refuseSystemCalls({tests::noReflinks()});
        static_cast<void>(Outbox(m_root).put(
            m_movie, "a.mp4", [](std::uint64_t, std::uint64_t) -> bool { ::_exit(0); }, Outbox::Use::Change));
        ::_exit(1);
    }
    int status = 0;
    ::waitpid(dying, &status, 0);
    ASSERT_EQ(status, 0);
    EXPECT_EQ(count(), 1U);
    m_outbox.sweep();
    EXPECT_EQ(count(), 0U);
}

TEST_F(AnOutbox, SweepsOnlyWhatIsItsOwn)
{
    put();
    const fs::path other = m_root / "of-somebody-else";
    fs::create_directory(other);
    fs::create_directory_symlink(m_movie.parent_path(), m_root / "file-link");
    date(other, std::chrono::hours(100));
    m_outbox.sweep();
    EXPECT_TRUE(fs::exists(other));
    EXPECT_TRUE(fs::exists(m_movie));
}

TEST_F(AnOutbox, MakesRoomBeforeItTakesMore)
{
    const std::string old = put()->path();
    date(held(old), std::chrono::hours(25));
    put();
    EXPECT_FALSE(fs::exists(old));
    EXPECT_EQ(count(), 1U);
}

TEST_F(AnOutbox, TellsOfACopysProgressAndCanBeStopped)
{
    std::uint64_t total = 0;
    tests::whileRefusing({tests::noReflinks()}, [&] {
        const auto stopped = m_outbox.put(
            m_movie, "Tux Racer.mp4",
            [&](std::uint64_t, std::uint64_t all) {
                total = all;
                return false;
            },
            Outbox::Use::Change);
        ASSERT_FALSE(stopped);
        EXPECT_EQ(stopped.error()->code(), ECANCELED);
    });
    EXPECT_EQ(total, m_bytes.size());
    EXPECT_EQ(count(), 0U);
}

TEST_F(AnOutbox, SaysWhenTheDiskIsFull)
{
    tests::whileRefusing({tests::noReflinks(), {SYS_linkat, EXDEV}, {SYS_copy_file_range, ENOSPC}},
                         [&] { expectRefusal(m_outbox.put(m_movie, "Tux Racer.mp4").error(), "SHARE_DISK_FULL"); });
    tests::whileRefusing({{SYS_mkdir, ENOSPC}},
                         [&] { expectRefusal(m_outbox.put(m_movie, "Tux Racer.mp4").error(), "SHARE_DISK_FULL"); });
}

TEST_F(AnOutbox, SaysWhenTheDiskBecomesFullInTheMiddleOfACopy)
{
    rlimit before = {};
    ::getrlimit(RLIMIT_FSIZE, &before);
    const rlimit limit = {1'000'000, before.rlim_max};
    const auto handler = std::signal(SIGXFSZ, SIG_IGN);
    base::ErrorRef error;
    tests::whileRefusing({tests::noReflinks()}, [&] {
        ::setrlimit(RLIMIT_FSIZE, &limit);
        error = m_outbox.put(m_movie, "Tux Racer.mp4", {}, Outbox::Use::Change).error();
        ::setrlimit(RLIMIT_FSIZE, &before);
    });
    std::signal(SIGXFSZ, handler);
    expectRefusal(error, "SHARE_DISK_FULL");
    EXPECT_EQ(PrivateDirectory::read(m_movie), m_bytes);
}

TEST_F(AnOutbox, SaysWhenTheMovieIsGone)
{
    fs::remove(m_movie);
    expectRefusal(m_outbox.put(m_movie, "Tux Racer.mp4").error(), "SHARE_FILE_GONE");
}

TEST_F(AnOutbox, SaysWhenTheMovieMayNotBeRead)
{
    const tests::WithoutPrivileges here;
    fs::permissions(m_movie, fs::perms::none);
    expectRefusal(m_outbox.put(m_movie, "Tux Racer.mp4").error(), "SHARE_FILE_NOT_ALLOWED");
}

TEST_F(AnOutbox, SaysWhenThereIsNoPlaceForIt)
{
    m_directory.write("cache/clipsa", "a file where the directory should be");
    const auto refused = m_outbox.put(m_movie, "Tux Racer.mp4");
    ASSERT_FALSE(refused);
    EXPECT_EQ(refused.error()->userInfo().at(base::Error::kMessageKey), "SHARE_CANNOT_PREPARE");
}

TEST_F(AnOutbox, TakesOnlyFilesAndDoesNotWaitForPipes)
{
    expectRefusal(m_outbox.put(m_movie.parent_path(), "Tux Racer.mp4").error(), "SHARE_CANNOT_PREPARE");
    const fs::path pipe = m_directory.path() / "pipe";
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    expectRefusal(m_outbox.put(pipe, "Tux Racer.mp4").error(), "SHARE_CANNOT_PREPARE");
    expectRefusal(m_outbox.put(std::string("/dev/null"), "Tux Racer.mp4").error(), "SHARE_CANNOT_PREPARE");
}

TEST_F(AnOutbox, OfTheUserLiesInTheCache)
{
    const std::string before = ::getenv("XDG_CACHE_HOME") ? ::getenv("XDG_CACHE_HOME") : "";
    ::setenv("XDG_CACHE_HOME", (m_directory.path() / "cache").c_str(), 1);
    const auto outbox = Outbox::ofUser();
    ::setenv("XDG_CACHE_HOME", before.c_str(), 1);
    ASSERT_TRUE(outbox);
    const auto file = outbox.value().put(m_movie, "a.mp4");
    ASSERT_TRUE(file);
    EXPECT_THAT(file.value()->path(), HasSubstr((m_directory.path() / "cache/clipsa/outbox/").native()));
}

} // namespace
