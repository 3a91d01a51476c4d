#include "app/host/PrepareRequest.h"

#include "app/host/RequestText.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

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

TEST(Texts, AreCheckedAsUtf8)
{
    for (const char* good : {"", "ascii", "é", "€", "🎬", "\x7F"})
        EXPECT_TRUE(host::checkText(good, "it")) << good;
    for (const char* bad : {"\x80", "\xC0\x80", "\xC3", "\xE0\x80\x80", "\xED\xA0\x80", "\xF0\x80\x80\x80",
                            "\xF4\x90\x80\x80", "\xF5\x80\x80\x80", "\xE2\x82"})
        EXPECT_FALSE(host::checkText(bad, "it"));
    EXPECT_FALSE(host::checkText(std::string_view("\0", 1), "it"));
    EXPECT_FALSE(host::checkText(std::string_view("a\0b", 3), "it")) << "wherever it stands";
    EXPECT_TRUE(host::checkText(std::string(1024 * 1024, 'x'), "it")) << "as long as a text may be";
    EXPECT_FALSE(host::checkText(std::string(1024 * 1024 + 1, 'x'), "it"));
}

TEST(Texts, BecomeSafeFileNames)
{
    EXPECT_EQ(host::safeFileName("movie.mp4", "f"), "movie.mp4");
    EXPECT_EQ(host::safeFileName("../../etc/passwd", "f"), "passwd");
    EXPECT_EQ(host::safeFileName("/", "f"), "f");
    EXPECT_EQ(host::safeFileName("", "f"), "f");
    EXPECT_EQ(host::safeFileName(".", "f"), "f");
    EXPECT_EQ(host::safeFileName("..", "f"), "f");
    EXPECT_EQ(host::safeFileName("a\nb\x01.mp4", "f"), "a_b_.mp4");
    EXPECT_EQ(host::safeFileName("a\xFF.mp4", "f"), "a_.mp4");
    EXPECT_EQ(host::safeFileName(".mp4", "f"), ".mp4");
    const std::string longest = host::safeFileName(std::string(300, 'x') + ".webm", "f");
    EXPECT_EQ(longest.size(), 255U);
    EXPECT_TRUE(longest.ends_with("x.webm"));
    EXPECT_EQ(host::safeFileName("\xFF\xFE.\xFF", "f"), "__._") << "each byte that is no text";
    EXPECT_EQ(host::safeFileName("a\x1F b\x7F~", "f"), "a_ b_~");
    EXPECT_EQ(host::safeFileName("a/b/", "f"), "f");
    EXPECT_EQ(host::safeFileName(std::string(255, 'x'), "f"), std::string(255, 'x')) << "it fits";
    EXPECT_EQ(host::safeFileName(std::string(256, 'x'), "f"), std::string(255, 'x'));
    // An extension has fifteen letters at most; what is longer belongs to the stem, and is cut.
    EXPECT_TRUE(
        host::safeFileName(std::string(300, 'x') + "." + std::string(15, 'e'), "f").ends_with("x.eeeeeeeeeeeeeee"));
    EXPECT_EQ(host::safeFileName(std::string(300, 'x') + "." + std::string(16, 'e'), "f"), std::string(255, 'x'));
    EXPECT_EQ(host::safeFileName("." + std::string(300, 'e'), "f"), "." + std::string(254, 'e'));
    std::string wide;
    for (int i = 0; i < 100; ++i)
        wide += "€";
    EXPECT_TRUE(host::checkText(host::safeFileName(wide + ".mp4", "f"), "it")) << "cut within a character";
}

TEST(Texts, BecomeAppNamesThatFileNamesCanBeginWith)
{
    EXPECT_EQ(host::safeAppName("Tux Racer"), "Tux Racer");
    EXPECT_EQ(host::safeAppName("AC/DC\nLive"), "AC\u2044DC Live");
    EXPECT_EQ(host::safeAppName(std::string(300, 'x')), std::string(200, 'x'));
    EXPECT_EQ(host::safeAppName(std::string(198, 'x') + "éy"), std::string(198, 'x') + "é");
    EXPECT_EQ(host::safeAppName(std::string(199, 'x') + "éy"), std::string(199, 'x')) << "not within a character";
    EXPECT_EQ(host::safeAppName("a\x1F\x7F b\xFF"), "a   b_");
    EXPECT_EQ(host::withoutExtension("a.b.mp4"), "a.b");
    EXPECT_EQ(host::withoutExtension("plain"), "plain");
    EXPECT_EQ(host::withoutExtension(".hidden"), ".hidden");
}

} // namespace
