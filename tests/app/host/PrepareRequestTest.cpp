#include "app/host/PrepareRequest.h"

#include "app/host/RequestText.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"
#include "support/WithoutPrivileges.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <fcntl.h>
#include <sys/inotify.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

class Preparing : public ::testing::Test {
protected:
    dbus::EditRequest request(const std::filesystem::path& movie)
    {
        dbus::EditRequest asked;
        asked.moviePath = movie;
        return asked;
    }

    dbus::EditRequest descriptor(const std::filesystem::path& movie, int flags = O_RDONLY)
    {
        dbus::EditRequest asked;
        asked.movie = posix::FileDescriptor(::open(movie.c_str(), flags | O_CLOEXEC));
        EXPECT_TRUE(asked.movie);
        return asked;
    }

    static std::string refusal(dbus::EditRequest asked)
    {
        const auto prepared = host::prepare(asked);
        if (prepared)
            return "(accepted)";
        EXPECT_EQ(prepared.error()->domain(), dbus::kBadInputDomain);
        EXPECT_EQ(prepared.error()->description().find('\n'), std::string::npos);
        return prepared.error()->description();
    }

    tests::PrivateDirectory m_directory;
    std::filesystem::path m_movie = m_directory.write("my.game.mp4", "pictures");
};

TEST_F(Preparing, FillsInWhatIsNotSaid)
{
    auto asked = request(m_movie);
    ASSERT_TRUE(host::prepare(asked));
    EXPECT_TRUE(asked.movie);
    EXPECT_EQ(asked.movieName, "my.game.mp4");
    EXPECT_EQ(asked.appName, "my.game");
    EXPECT_EQ(asked.bundleIdentifier, "org.clipsa.recording");
    EXPECT_EQ(asked.message, std::nullopt);
    EXPECT_EQ(asked.tint, std::nullopt);
}

TEST_F(Preparing, KeepsWhatIsSaid)
{
    auto asked = request(m_movie);
    asked.appName = "Racer";
    asked.bundleIdentifier = "org.racer";
    asked.message = "";
    ASSERT_TRUE(host::prepare(asked));
    EXPECT_EQ(asked.appName, "Racer");
    EXPECT_EQ(asked.bundleIdentifier, "org.racer");
    EXPECT_EQ(asked.message, "");
}

TEST_F(Preparing, FollowsALinkToTheMovieFirst)
{
    const auto link = m_directory.path() / "latest.mp4";
    std::filesystem::create_symlink(m_movie, link);
    auto asked = request(link);
    ASSERT_TRUE(host::prepare(asked));
    EXPECT_EQ(asked.moviePath, std::filesystem::canonical(m_movie).native());
    EXPECT_EQ(asked.movieName, "my.game.mp4");
}

TEST_F(Preparing, RefusesWhatIsNoMovieFile)
{
    const auto missing = m_directory.path() / "missing.mp4";
    EXPECT_THAT(refusal(request(missing)), HasSubstr("there is no file " + missing.native()));
    EXPECT_THAT(refusal(request(m_movie / "below")), HasSubstr("there is no file"));
    EXPECT_THAT(refusal(request(m_directory.path())), HasSubstr("is a directory"));
    EXPECT_THAT(refusal(request(m_directory.write("empty.mp4", ""))), HasSubstr("is empty"));
    EXPECT_THAT(refusal(request("/dev/null")), HasSubstr("not a regular file"));
    EXPECT_THAT(refusal(request("")), HasSubstr("there is no file"));

    const auto pipe = m_directory.path() / "pipe";
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    EXPECT_THAT(refusal(request(pipe)), HasSubstr("not a regular file")) << "and does not wait for a writer";

    const auto loop = m_directory.path() / "loop";
    std::filesystem::create_symlink(loop, loop);
    EXPECT_THAT(refusal(request(loop)), HasSubstr("round in circles"));
    std::filesystem::create_symlink(missing, m_directory.path() / "dangling");
    EXPECT_THAT(refusal(request(m_directory.path() / "dangling")), HasSubstr("there is no file"));
}

TEST_F(Preparing, RefusesWhatMayNotBeRead)
{
    ::chmod(m_movie.c_str(), 0);
    if (::geteuid() != 0) { // root may read all
        EXPECT_THAT(refusal(request(m_movie)), HasSubstr("may not be read"));
    }
    ::chmod(m_movie.c_str(), 0600);
    EXPECT_THAT(refusal(descriptor(m_movie, O_WRONLY)), HasSubstr("not opened for reading"));
    EXPECT_THAT(refusal(descriptor(m_movie, O_PATH)), HasSubstr("not opened for reading"));
}

TEST_F(Preparing, LooksAtADescriptorAndNotAtItsName)
{
    auto asked = descriptor(m_movie);
    ASSERT_TRUE(host::prepare(asked));
    EXPECT_EQ(asked.movieName, "recording.mp4");
    EXPECT_EQ(asked.appName, "recording");
    EXPECT_THAT(asked.moviePath, IsEmpty());

    EXPECT_THAT(refusal(descriptor(m_directory.path())), HasSubstr("directory"));
    EXPECT_THAT(refusal(descriptor("/dev/null")), HasSubstr("not a regular file"));
    EXPECT_THAT(refusal(descriptor(m_directory.write("empty", ""))), HasSubstr("empty"));
    int ends[2] = {};
    ASSERT_EQ(::pipe2(ends, O_CLOEXEC), 0);
    const posix::FileDescriptor writing(ends[1]);
    dbus::EditRequest pipe;
    pipe.movie = posix::FileDescriptor(ends[0]); // which has no flags at all
    EXPECT_THAT(refusal(std::move(pipe)), HasSubstr("not a regular file"));
}

TEST_F(Preparing, NamesADescriptorByItsFirstBytes)
{
    const auto name = [&](const std::string& bytes) {
        auto asked = descriptor(m_directory.write("bytes", bytes));
        EXPECT_TRUE(host::prepare(asked));
        return asked.movieName;
    };
    EXPECT_EQ(name("\x1A\x45\xDF\xA3\x42\x82\x84webm"), "recording.webm");
    EXPECT_EQ(name("\x1A\x45\xDF\xA3\x42\x82\x88matroska"), "recording.mkv");
    EXPECT_EQ(name("x"), "recording.mp4");
    EXPECT_EQ(name("webm"), "recording.mp4");
    EXPECT_EQ(name("x\x1A\x45\xDF\xA3webm"), "recording.mp4") << "not at its start";
}

TEST_F(Preparing, ChecksAnAttachment)
{
    auto asked = request(m_movie);
    asked.attachmentPath = m_directory.path() / "gone.txt";
    EXPECT_THAT(refusal(std::move(asked)), HasSubstr("gone.txt"));

    asked = request(m_movie);
    const auto link = m_directory.path() / "link.txt";
    const auto log = std::filesystem::canonical(m_directory.write("log.txt", ""));
    std::filesystem::create_symlink(log, link);
    asked.attachmentPath = link;
    ASSERT_TRUE(host::prepare(asked)) << "an empty file can be shared";
    EXPECT_EQ(asked.attachmentPath, log.native()) << "whoever reads it later is where we are not";

    asked = request(m_movie);
    asked.attachment = posix::FileDescriptor(::open(log.c_str(), O_RDONLY | O_CLOEXEC));
    asked.attachmentName = "../a\nb.txt";
    ASSERT_TRUE(host::prepare(asked));
    EXPECT_EQ(asked.attachmentName, "a_b.txt");
    asked.attachmentName = "";
    ASSERT_TRUE(host::prepare(asked));
    EXPECT_EQ(asked.attachmentName, "attachment");

    asked = request(m_movie);
    asked.attachment = posix::FileDescriptor(::open(m_directory.path().c_str(), O_RDONLY | O_CLOEXEC));
    EXPECT_THAT(refusal(std::move(asked)), HasSubstr("directory"));

    asked = request(m_movie);
    asked.attachmentPath = m_directory.write("\xFF.txt", "x");
    EXPECT_THAT(refusal(std::move(asked)), HasSubstr("not UTF-8"));
}

/// A request with an attachment that somebody on the bus has named.
class PreparingForAnAsker : public Preparing {
protected:
    /// What is wrong with it: what the asker is told, and what not.
    std::pair<std::string, std::string> refused(const std::string& attachment)
    {
        auto asked = request(m_movie);
        asked.asker = std::make_shared<const dbus::Asker>();
        asked.attachmentPath = attachment;
        const auto prepared = host::prepare(asked, m_isConfined);
        if (prepared)
            return {"(accepted)", asked.attachmentPath};
        EXPECT_EQ(prepared.error()->domain(), dbus::kBadInputDomain);
        EXPECT_EQ(prepared.error()->code(), EACCES) << "one error";
        return {prepared.error()->description(), prepared.error()->userInfo().at(dbus::kUntoldKey)};
    }

    const std::string m_words = "the file of the option \"attachment\" cannot be had by its path; give an open file";
    host::Confinement m_isConfined = [](const dbus::Asker&) { return false; };
};

TEST_F(PreparingForAnAsker, TakesAFileThatCanBeHad)
{
    const auto log = std::filesystem::canonical(m_directory.write("log.txt", ""));
    EXPECT_EQ(refused(log), std::pair(std::string("(accepted)"), log.native()));
}

TEST_F(PreparingForAnAsker, HasOneAnswerToAllThatCannotBeHad)
{
    const auto missing = m_directory.path() / "missing.txt";
    const auto pipe = m_directory.path() / "pipe";
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    const auto loop = m_directory.path() / "loop";
    std::filesystem::create_symlink(loop, loop);
    const auto dangling = m_directory.path() / "dangling";
    std::filesystem::create_symlink(missing, dangling);
    const auto log = m_directory.write("log.txt", "x");
    const auto unreadable = m_directory.write("unreadable.txt", "x");
    ::chmod(unreadable.c_str(), 0);
    const std::pair<std::string, std::string> paths[] = {
        {missing, "there is no file"},
        {dangling, "there is no file"},
        {log / "below", "there is no file"},
        {log.native() + "/", "there is no file"},
        {m_directory.path(), "is a directory"},
        {"/", "is a directory"},
        {pipe, "not a regular file"},
        {"/dev/null", "not a regular file"},
        {"/dev/tty", ""},
        {loop, "round in circles"},
        {log.native() + std::string("\0", 1), "not UTF-8"},
        {m_directory.write("caf\xE9", "x"), "not UTF-8"},
        {"/" + std::string(std::size_t{1024} * 1024 - 1, 'x'), "cannot open"},
        {"/" + std::string(std::size_t{1024} * 1024, 'x'), "longer than 1 MiB"}};
    for (const auto& [path, reason] : paths) {
        const auto [told, untold] = refused(path);
        EXPECT_EQ(told, m_words) << path.substr(0, 200);
        EXPECT_NE(untold.find(reason), std::string::npos) << untold.substr(0, 200);
    }
    const tests::WithoutPrivileges withoutPrivileges;
    EXPECT_EQ(refused(unreadable).first, m_words);
    EXPECT_THAT(refused(unreadable).second, HasSubstr("may not be read"));
}

TEST_F(PreparingForAnAsker, FollowsNoPathForASandbox)
{
    m_isConfined = [](const dbus::Asker&) { return true; };
    const auto log = m_directory.write("log.txt", "x");
    const posix::FileDescriptor watch(::inotify_init1(IN_CLOEXEC | IN_NONBLOCK));
    ASSERT_GE(::inotify_add_watch(watch.get(), m_directory.path().c_str(), IN_OPEN), 0);
    const auto isOpened = [&](std::string_view name) {
        char events[4096] = {};
        const ssize_t count = ::read(watch.get(), events, sizeof events);
        return std::string_view(events, count > 0 ? static_cast<std::size_t>(count) : 0).find(name)
               != std::string_view::npos;
    };
    EXPECT_EQ(refused(log).first, m_words) << "the same words";
    EXPECT_FALSE(isOpened("log.txt"));
    EXPECT_EQ(refused(m_directory.path() / "missing.txt"), refused(log));
    m_isConfined = [](const dbus::Asker&) { return false; };
    EXPECT_EQ(refused(log).first, "(accepted)");
    EXPECT_TRUE(isOpened("log.txt")) << "it would have been noticed";
}

TEST_F(PreparingForAnAsker, AsksOfNobodyWhoGivesAnOpenFile)
{
    bool isAsked = false;
    auto asked = descriptor(m_movie);
    asked.asker = std::make_shared<const dbus::Asker>();
    asked.attachment = posix::FileDescriptor(::open(m_movie.c_str(), O_RDONLY | O_CLOEXEC));
    asked.attachmentName = "log.txt";
    ASSERT_TRUE(host::prepare(asked, [&](const dbus::Asker&) { return isAsked = true; }));
    EXPECT_EQ(asked.attachmentName, "log.txt");
    EXPECT_FALSE(isAsked);
}

TEST_F(PreparingForAnAsker, CountsWhoIsNotKnownAsConfined)
{
    auto asked = request(m_movie);
    asked.asker = std::make_shared<const dbus::Asker>();
    asked.attachmentPath = m_movie;
    EXPECT_EQ(refusal(std::move(asked)), m_words);
}

TEST_F(PreparingForAnAsker, TellsASandboxOnlyThatAMovieCannotBeHad)
{
    const auto told = [&](const std::string& movie, bool isConfined) {
        auto asked = request(movie);
        asked.asker = std::make_shared<const dbus::Asker>();
        const auto prepared = host::prepare(asked, [=](const dbus::Asker&) { return isConfined; });
        return prepared ? "(accepted)" : prepared.error()->description();
    };
    const std::string one = "the recording cannot be had by its path; call org.clipsa.Recorder1.Edit with an open file";
    const std::string missing = m_directory.path() / "missing.mp4";
    EXPECT_EQ(told(missing, true), one);
    EXPECT_EQ(told(m_directory.path(), true), one);
    EXPECT_EQ(told(m_directory.write("empty.mp4", ""), true), one);
    EXPECT_THAT(told(missing, false), HasSubstr("there is no file"));
    EXPECT_EQ(told(m_movie, true), "(accepted)");
}

TEST_F(Preparing, LooksAtAnAttachmentsDescriptorAsAtTheMovies)
{
    int ends[2] = {};
    ASSERT_EQ(::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
    const posix::FileDescriptor other(ends[1]);
    const std::pair<int, const char*> wrong[] = {
        {ends[0], "not a regular file"},
        {::open(m_movie.c_str(), O_WRONLY | O_CLOEXEC), "not opened for reading"},
        {::open(m_movie.c_str(), O_PATH | O_CLOEXEC), "not opened for reading"},
        {::open("/", O_RDONLY | O_CLOEXEC), "directory"},
        {::open("/dev/null", O_RDONLY | O_CLOEXEC), "not a regular file"},
        {1'000'000, "cannot look at"}};
    for (const auto& [number, words] : wrong) {
        auto asked = request(m_movie);
        asked.attachment = posix::FileDescriptor(number);
        EXPECT_THAT(refusal(std::move(asked)), AllOf(HasSubstr("the attachment"), HasSubstr(words)));
    }
}

TEST_F(Preparing, KeepsTheNameThatAMovieCameWith)
{
    auto asked = request(m_movie);
    asked.movieName = "a/b\n.webm";
    ASSERT_TRUE(host::prepare(asked));
    EXPECT_EQ(asked.movieName, "b_.webm");
    EXPECT_EQ(asked.appName, "b_");
    asked = descriptor(m_movie);
    asked.movieName = "race.webm";
    asked.appName = "AC/DC";
    ASSERT_TRUE(host::prepare(asked));
    EXPECT_EQ(asked.movieName, "race.webm");
    EXPECT_EQ(asked.appName, "AC\u2044DC");
}

TEST_F(Preparing, SaysWhatElseKeepsAFileFromBeingOpened)
{
    const std::pair<int, const char*> kWords[] = {{EACCES, " may not be read; ask its owner"},
                                                  {EPERM, " may not be read; ask its owner"},
                                                  {ENXIO, " is not a file with a movie"},
                                                  {ENOTDIR, "there is no file "},
                                                  {EMFILE, "cannot open "},
                                                  {EIO, "cannot open "}};
    for (const auto& [number, words] : kWords)
        tests::whileRefusing({{SYS_openat, number, 2, O_NOCTTY}}, [&, number = number, words = words] {
            auto asked = request(m_movie);
            const auto prepared = host::prepare(asked);
            ASSERT_FALSE(prepared);
            EXPECT_EQ(prepared.error()->code(), number);
            EXPECT_EQ(prepared.error()->domain(), dbus::kBadInputDomain);
            EXPECT_THAT(prepared.error()->description(), HasSubstr(words));
            EXPECT_THAT(prepared.error()->description(), HasSubstr(m_movie.native()));
        });
    dbus::EditRequest closed;
    closed.movie = posix::FileDescriptor(1'000'000);
    EXPECT_THAT(refusal(std::move(closed)), HasSubstr("cannot look at the movie"));
}

TEST_F(Preparing, RefusesTextsThatCannotTravel)
{
    const std::string huge(1024 * 1024 + 1, 'x');
    auto asked = request(m_movie);
    asked.message = huge;
    EXPECT_THAT(refusal(std::move(asked)), HasSubstr("the message is longer than 1 MiB"));
    asked = request(m_movie);
    asked.appName = huge;
    EXPECT_THAT(refusal(std::move(asked)), HasSubstr("the app's name is longer"));
    asked = request(m_movie);
    asked.bundleIdentifier = "\xC3(";
    EXPECT_THAT(refusal(std::move(asked)), HasSubstr("the bundle identifier is not UTF-8"));
}

} // namespace
