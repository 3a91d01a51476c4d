#include "app/host/EditorDirectory.h"

#include "linux/dbus/HostConnection.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"
#include "support/WithoutPrivileges.h"

#include <gmock/gmock.h>

#include <fcntl.h>
#include <optional>
#include <pwd.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <utime.h>

using testing::HasSubstr;
using testing::StartsWith;

namespace {

class EditorDirectories : public ::testing::Test {
protected:
    host::EditorDirectory make()
    {
        auto made = host::EditorDirectory::make(m_root);
        EXPECT_TRUE(made) << made.error()->description();
        return std::move(made).value();
    }

    /// As an editor leaves it that was killed along with its host.
    std::filesystem::path dead(const std::string& name)
    {
        const auto path = m_root / name;
        std::filesystem::create_directories(path / "private/Velkor");
        std::ofstream(path / "private/Velkor/movie.mp4") << "trimmed";
        std::ofstream(path / "lock").flush();
        return path;
    }

    int sweep() { return host::sweepEditorDirectories(m_root); }

    tests::PrivateDirectory m_directory;
    std::filesystem::path m_root = m_directory.path() / "cache/clipsa";
};

TEST_F(EditorDirectories, AreForTheUserAlone)
{
    const auto directory = make();
    EXPECT_THAT(directory.path(), StartsWith(m_root.native() + "/editor-"));
    for (const std::string& path : {directory.path(), directory.deviceRoot(), directory.movieDirectory()})
        EXPECT_EQ(std::filesystem::status(path).permissions(), std::filesystem::perms::owner_all) << path;
    EXPECT_EQ(directory.movieDirectory(), directory.path() + "/private/Velkor");
}

TEST_F(EditorDirectories, GoWithAllThatIsInThem)
{
    std::string path;
    const auto outside = m_directory.write("outside/precious", "x");
    {
        const auto directory = make();
        path = directory.path();
        std::ofstream(directory.movieDirectory() + "/movie.mp4") << "x";
        std::filesystem::create_symlink(outside.parent_path(), directory.path() + "/link");
    }
    EXPECT_FALSE(std::filesystem::exists(path));
    EXPECT_TRUE(std::filesystem::exists(outside));
}

TEST_F(EditorDirectories, AreTwoForTwoEditors)
{
    const auto first = make();
    const auto second = make();
    EXPECT_NE(first.path(), second.path());
}

TEST_F(EditorDirectories, OfLivingEditorsAreNotSwept)
{
    const auto directory = make();
    EXPECT_EQ(sweep(), 0);
    EXPECT_TRUE(std::filesystem::exists(directory.path() + "/lock"));
}

TEST_F(EditorDirectories, LiveAsLongAsSomebodyHasTheLock)
{
    auto directory = std::make_optional(make());
    const std::string path = directory->path();
    // What an editor inherits, and keeps when its host is killed.
    std::optional<posix::FileDescriptor> inherited(
        posix::FileDescriptor(::fcntl(directory->lock(), F_DUPFD_CLOEXEC, 3)));
    std::filesystem::rename(path, path + "-kept"); // the host's end does not find it, as if it had been killed
    directory.reset();
    std::filesystem::rename(path + "-kept", path);

    EXPECT_EQ(sweep(), 0);
    inherited.reset();
    EXPECT_EQ(sweep(), 1);
    EXPECT_FALSE(std::filesystem::exists(path));
}

TEST_F(EditorDirectories, OfDeadEditorsAreSwept)
{
    const auto first = dead("editor-aaaaaa");
    const auto second = dead("editor-bbbbbb");
    EXPECT_EQ(sweep(), 2);
    EXPECT_FALSE(std::filesystem::exists(first));
    EXPECT_FALSE(std::filesystem::exists(second));
    EXPECT_TRUE(std::filesystem::exists(m_root));
}

TEST_F(EditorDirectories, ThatCannotBeRemovedAsAWholeAreSweptAnotherTime)
{
    const auto path = dead("editor-aaaaaa");
    const auto closed = path / "private/Velkor";
    {
        const tests::WithoutPrivileges here;
        std::filesystem::permissions(closed, std::filesystem::perms::owner_read | std::filesystem::perms::owner_exec);
        sweep();
    }
    EXPECT_TRUE(std::filesystem::exists(closed / "movie.mp4"));
    EXPECT_TRUE(std::filesystem::exists(path / "lock")) << "it says that nobody lives there";
    std::filesystem::permissions(closed, std::filesystem::perms::owner_all);
    EXPECT_EQ(sweep(), 1);
    EXPECT_FALSE(std::filesystem::exists(path));
}

TEST_F(EditorDirectories, SweepingLeavesWhatIsNotAnEditors)
{
    std::filesystem::create_directories(m_root / "other");
    std::ofstream(m_root / "other/lock").flush();
    std::ofstream(m_root / "editor-file") << "a file";
    EXPECT_EQ(sweep(), 0);
    EXPECT_TRUE(std::filesystem::exists(m_root / "other/lock"));
    EXPECT_TRUE(std::filesystem::exists(m_root / "editor-file"));
    EXPECT_EQ(host::sweepEditorDirectories(m_directory.path() / "missing"), 0);
}

TEST_F(EditorDirectories, SweepingFollowsNoLinks)
{
    const auto precious = m_directory.write("outside/precious", "x");
    std::ofstream(precious.parent_path() / "lock").flush();
    std::filesystem::create_directories(m_root);
    std::filesystem::create_symlink(precious.parent_path(), m_root / "editor-linked");
    const auto withLink = dead("editor-withlink");
    std::filesystem::create_directory_symlink(precious.parent_path(), withLink / "private/away");
    const auto lockIsLink = dead("editor-locklink");
    std::filesystem::remove(lockIsLink / "lock");
    std::filesystem::create_symlink(precious, lockIsLink / "lock");

    EXPECT_EQ(sweep(), 1);
    EXPECT_TRUE(std::filesystem::exists(precious));
    EXPECT_TRUE(std::filesystem::is_symlink(m_root / "editor-linked"));
    EXPECT_FALSE(std::filesystem::exists(withLink));
    EXPECT_TRUE(std::filesystem::exists(lockIsLink)) << "not made by us";
}

TEST_F(EditorDirectories, OneThatIsBeingMadeIsLeftForADay)
{
    const auto young = m_root / "editor-young";
    std::filesystem::create_directories(young);
    EXPECT_EQ(sweep(), 0);
    const auto madeBefore = [&](time_t seconds) {
        const time_t then = ::time(nullptr) - seconds;
        const utimbuf times = {then, then};
        ASSERT_EQ(::utime(young.c_str(), &times), 0);
    };
    madeBefore(24 * 60 * 60 - 60);
    EXPECT_EQ(sweep(), 0);
    madeBefore(24 * 60 * 60 + 60);
    EXPECT_EQ(sweep(), 1);
    EXPECT_FALSE(std::filesystem::exists(young));
}

TEST_F(EditorDirectories, OfOtherUsersAreLeftToThem)
{
    const auto path = dead("editor-theirs");
    if (::chown(path.c_str(), 12'345, 12'345) != 0)
        return; // only the super-user can give files away
    EXPECT_EQ(sweep(), 0);
    EXPECT_TRUE(std::filesystem::exists(path / "private/Velkor/movie.mp4"));
}

TEST_F(EditorDirectories, WhoseLocksCannotBeAskedForAreLeft)
{
    const auto path = dead("editor-aaaaaa");
    tests::whileRefusing({{SYS_faccessat2, EIO}, {SYS_faccessat, EIO}}, [&] { EXPECT_EQ(sweep(), 0); });
    EXPECT_TRUE(std::filesystem::exists(path));
}

TEST_F(EditorDirectories, ThatCannotBeLockedAreNotMade)
{
    tests::whileRefusing({{SYS_flock, ENOLCK}}, [&] {
        const auto made = host::EditorDirectory::make(m_root);
        ASSERT_FALSE(made);
        EXPECT_EQ(made.error()->code(), ENOLCK);
        EXPECT_THAT(made.error()->description(), StartsWith("cannot lock " + m_root.native() + "/editor-"));
    });
    EXPECT_TRUE(std::filesystem::is_empty(m_root));
}

TEST_F(EditorDirectories, HaveALockThatNobodyElseCanTake)
{
    const auto directory = make();
    EXPECT_FALSE(std::filesystem::exists(directory.path() + "/lock.new"));
    const posix::FileDescriptor again(::open((directory.path() + "/lock").c_str(), O_RDWR | O_CLOEXEC));
    ASSERT_TRUE(again);
    EXPECT_NE(::flock(again.get(), LOCK_EX | LOCK_NB), 0);
    EXPECT_EQ(std::filesystem::status(directory.path() + "/lock").permissions(), std::filesystem::perms(0600));
}

TEST_F(EditorDirectories, ALongPathGetsItsSocketElsewhere)
{
    EXPECT_EQ(make().socketPath().value().rfind(m_root.native(), 0), 0U);
    const std::string parent = m_directory.path().native() + "/";
    const std::size_t rest = make().socketPath().value().size() - m_root.native().size();
    for (const std::size_t more : {0U, 1U}) {
        m_root = parent + std::string(dbus::HostConnection::kMaximumPathSize - rest - parent.size() + more, 'x');
        EXPECT_EQ(make().socketPath().value().starts_with(m_root.native()), more == 0) << "the longest, and one more";
    }

    m_root = m_directory.path() / std::string(120, 'x') / "clipsa";
    tests::PrivateDirectory runtime;
    const char* const before = std::getenv("XDG_RUNTIME_DIR");
    const std::string kept = before ? before : "";
    ::setenv("XDG_RUNTIME_DIR", runtime.path().c_str(), 1);
    std::string socket;
    {
        const auto directory = make();
        socket = directory.socketPath().value();
        EXPECT_EQ(socket, runtime.path() / ("clipsa-" + std::filesystem::path(directory.path()).filename().native()));
        EXPECT_LE(socket.size(), dbus::HostConnection::kMaximumPathSize);
        std::ofstream{socket};
    }
    EXPECT_FALSE(std::filesystem::exists(socket)) << "goes with the directory";

    const std::string runtimes[] = {"", "/nowhere", runtime.path() / std::string(100, 'y')};
    std::filesystem::create_directory(runtimes[2]);
    for (const std::string& variable : runtimes) {
        ::setenv("XDG_RUNTIME_DIR", variable.c_str(), 1);
        {
            const auto directory = make();
            socket = directory.socketPath().value();
            EXPECT_THAT(socket, StartsWith("/tmp/clipsa-editor-"));
            EXPECT_EQ(std::filesystem::status(std::filesystem::path(socket).parent_path()).permissions(),
                      std::filesystem::perms::owner_all)
                << "nobody else reaches it";
            std::ofstream{socket};
        }
        EXPECT_FALSE(std::filesystem::exists(std::filesystem::path(socket).parent_path())) << "goes with it, too";
    }
    ::unsetenv("XDG_RUNTIME_DIR");
    if (before)
        ::setenv("XDG_RUNTIME_DIR", kept.c_str(), 1);
}

TEST_F(EditorDirectories, ARootThatCannotBeMadeIsAnError)
{
    const auto file = m_directory.write("file", "x");
    const auto made = host::EditorDirectory::make(file.native() + "/below");
    ASSERT_FALSE(made);
    EXPECT_THAT(made.error()->description(), HasSubstr("cannot make a directory in"));
}

TEST_F(EditorDirectories, LieInTheCache)
{
    const char* const before = std::getenv("HOME");
    const std::string home = before ? before : "/";
    ::setenv("XDG_CACHE_HOME", "/elsewhere", 1);
    EXPECT_EQ(host::editorDirectoriesRoot().value(), "/elsewhere/clipsa");
    ::setenv("XDG_CACHE_HOME", "relative", 1);
    ::setenv("HOME", "/home/somebody", 1);
    EXPECT_EQ(host::editorDirectoriesRoot().value(), "/home/somebody/.cache/clipsa");
    for (const char* none : {"", "relative"}) {
        ::setenv("HOME", none, 1);
        EXPECT_EQ(host::editorDirectoriesRoot().value(),
                  ::getpwuid(::geteuid())->pw_dir + std::string("/.cache/clipsa"));
    }
    ::setenv("HOME", home.c_str(), 1);
}

} // namespace
