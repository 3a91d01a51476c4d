// The program itself, with an editor that does what a test says.
#include "app/host/OpenMovie.h"

#include "linux/posix/FileDescriptor.h"
#include "support/Paths.h"
#include "support/Program.h"
#include "support/RefusedSystemCalls.h"

#include <gmock/gmock.h>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

using testing::AllOf;
using testing::Contains;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

namespace {

class OpeningAMovie : public ::testing::Test {
protected:
    using Words = std::vector<std::string>;

    /// `script` is what the editor does; see fake_editor.cpp.
    std::unique_ptr<tests::Program> start(const std::string& script, const Words& options = {})
    {
        Words words = {tests::program("clipsa"), "open", m_movie};
        words.insert(words.end(), options.begin(), options.end());
        return std::make_unique<tests::Program>(
            words, tests::Program::Variables{{"FAKE_EDITOR", script},
                                             {"CLIPSA_EDITOR", tests::program("fake-editor")},
                                             {"XDG_CACHE_HOME", m_cache}});
    }

    std::filesystem::path pipe(const char* name)
    {
        const auto path = m_directory.path() / name;
        EXPECT_EQ(::mkfifo(path.c_str(), 0600), 0);
        return path;
    }

    /// The editors' directories that are there.
    Words directories() const
    {
        Words found;
        if (std::filesystem::exists(m_cache / "clipsa"))
            for (const auto& entry : std::filesystem::directory_iterator(m_cache / "clipsa"))
                found.push_back(entry.path());
        return found;
    }

    void expectUntouched() const
    {
        struct stat status = {};
        ASSERT_EQ(::stat(m_movie.c_str(), &status), 0);
        EXPECT_EQ(status.st_nlink, 1U);
        EXPECT_EQ(tests::PrivateDirectory::read(m_movie), "moving pictures");
    }

    static Words lines(const std::string& text)
    {
        Words all;
        std::istringstream stream(text);
        for (std::string line; std::getline(stream, line);)
            all.push_back(line);
        return all;
    }

    tests::PrivateDirectory m_directory;
    std::filesystem::path m_movie = std::filesystem::canonical(m_directory.write("Tux Racer.mp4", "moving pictures"));
    std::filesystem::path m_cache = m_directory.path() / "cache";
};

TEST_F(OpeningAMovie, SaysWhatItCopiesAndWhyInMegabytes)
{
    EXPECT_EQ(host::wordsOfCopy("/a.mp4", 123'999'999),
              "copying /a.mp4 (123 MB), because the editor's directory is on another file system");
}

TEST_F(OpeningAMovie, PrintsWhatWasDoneInOrder)
{
    const auto clipsa = start("finish=save,share,save wait");
    EXPECT_EQ(clipsa->wait(), 0);
    EXPECT_EQ(clipsa->output(), "save\nshare\nsave\n");
    EXPECT_THAT(clipsa->errors(), IsEmpty());
    EXPECT_THAT(directories(), IsEmpty());
    expectUntouched();
}

TEST_F(OpeningAMovie, PrintsWhatWasDoneBeforeTheEditorHasGone)
{
    const auto held = pipe("held");
    const auto program = start("finish=a wait tell=" + held.native());
    tests::readPipe(held); // which the editor opens when its host has heard it
    EXPECT_EQ(program->output(), "a\n");
    EXPECT_EQ(program->wait(), 0);
}

TEST_F(OpeningAMovie, PrintsOneObjectOnRequest)
{
    const auto clipsa = start("finish=a,b wait", {"--json"});
    EXPECT_EQ(clipsa->wait(), 0);
    EXPECT_EQ(clipsa->output(), "{\"activityTypes\":[\"a\",\"b\"],\"movie\":\"" + m_movie.native()
                                    + "\",\"saved\":[],\"unsaved\":[],\"results\":[]}\n");
}

TEST_F(OpeningAMovie, ASaveThatFailedIsSaidWithThePlaceWhereTheMovieIsKept)
{
    const auto clipsa = start("unsaved=/data/unsaved/race.mp4 finish=save wait");
    EXPECT_EQ(clipsa->wait(), 1);
    EXPECT_EQ(clipsa->output(), "save\n") << "what the editor told";
    EXPECT_EQ(clipsa->errors(), "clipsa: the movie is not in your videos; it is kept as /data/unsaved/race.mp4\n");
    expectUntouched();
}

TEST_F(OpeningAMovie, ASaveThatFailedAfterTheUserHadClosedIsSaidToo)
{
    const auto clipsa = start("finish=save wait unsaved=/data/unsaved/race.mp4");
    EXPECT_EQ(clipsa->wait(), 1);
    EXPECT_THAT(clipsa->errors(), HasSubstr("/data/unsaved/race.mp4"));
}

TEST_F(OpeningAMovie, ASaveThatFailedBeforeACrashIsSaidToo)
{
    const auto clipsa = start("unsaved=/data/unsaved/race.mp4 crash");
    EXPECT_EQ(clipsa->wait(), 3);
    EXPECT_THAT(clipsa->errors(), AllOf(HasSubstr("/data/unsaved/race.mp4"), HasSubstr("by signal 6")));
}

TEST_F(OpeningAMovie, AMovieThatCouldBeKeptNowhereIsSaidToBeLost)
{
    const auto clipsa = start("unsaved= finish=save wait");
    EXPECT_EQ(clipsa->wait(), 1);
    EXPECT_THAT(clipsa->errors(), AllOf(HasSubstr("could not be kept"), HasSubstr("the disk is full")));
}

TEST_F(OpeningAMovie, WhatTheEditorRefusesIsAWrongFile)
{
    const auto clipsa = start("refuse say=because exit=0");
    EXPECT_EQ(clipsa->wait(), 2);
    EXPECT_THAT(clipsa->output(), IsEmpty());
    EXPECT_EQ(clipsa->errors(), "because\n") << "it is said once";
    expectUntouched();
}

TEST_F(OpeningAMovie, TheObjectSaysWhatWasSavedAlsoBehindAClosedWindow)
{
    const auto clipsa = start("finish=save wait saved=/videos/a.mp4 unsaved=/data/b.mp4", {"--json"});
    EXPECT_EQ(clipsa->wait(), 1);
    EXPECT_THAT(clipsa->output(), HasSubstr("\"saved\":[\"/videos/a.mp4\"],\"unsaved\":[\"/data/b.mp4\"],"));
}

TEST_F(OpeningAMovie, TheObjectHasTheResultsInOrder)
{
    const auto clipsa = start("shared=KDEConnect,\"Phone\" saved=/videos/a.mp4 finish=KDEConnect wait unshared=Mail, "
                              "unsaved=/data/b.mp4 unsaved=",
                              {"--json"});
    EXPECT_EQ(clipsa->wait(), 1);
    EXPECT_THAT(clipsa->output(),
                EndsWith(R"(,"results":[{"outcome":"shared","type":"KDEConnect","receiver":"\"Phone\""},)"
                         R"({"outcome":"saved","path":"/videos/a.mp4"},)"
                         R"({"outcome":"not-shared","type":"Mail","reason":"it went away"},)"
                         R"({"outcome":"not-saved","path":"/data/b.mp4","reason":"the disk is full"},)"
                         R"({"outcome":"not-saved","reason":"the disk is full"}]})"
                         "\n"));
}

TEST_F(OpeningAMovie, TheObjectOfAUserWhoCouldNotFinishSaysWhatWasDoneAndWhyNot)
{
    const auto clipsa = start("shared=Mail,\u202E saved=/videos/a.mp4 crash", {"--json"});
    EXPECT_EQ(clipsa->wait(), 3);
    EXPECT_THAT(clipsa->output(), StartsWith("{\"movie\":\"/")) << "that nothing was done would be another thing";
    EXPECT_THAT(clipsa->output(),
                EndsWith(R"j("saved":["/videos/a.mp4"],"unsaved":[],"results":[)j"
                         "{\"outcome\":\"shared\",\"type\":\"Mail\",\"receiver\":\"\u202E\"},"
                         R"j({"outcome":"saved","path":"/videos/a.mp4"},)j"
                         R"j({"outcome":"failed","reason":"the editor ended early, by signal 6 (Aborted)"}]})j"
                         "\n"));
}

TEST_F(OpeningAMovie, TheObjectOfARefusedMovieSaysWhy)
{
    const auto clipsa = start("refuse exit=0", {"--json"});
    EXPECT_EQ(clipsa->wait(), 2);
    EXPECT_THAT(clipsa->output(), HasSubstr(R"("results":[{"outcome":"failed","reason":"it is no movie"}]})"));
}

TEST_F(OpeningAMovie, SharesAreNotPrintedAmongTheLines)
{
    const auto clipsa = start("shared=Mail,Anna unshared=Bluetooth,Phone finish=Mail wait");
    EXPECT_EQ(clipsa->wait(), 0) << "the user has read what could not be shared";
    EXPECT_EQ(clipsa->output(), "Mail\n");
    EXPECT_THAT(clipsa->errors(), IsEmpty());
}

TEST_F(OpeningAMovie, TheObjectHasNothingThatATerminalWouldObey)
{
    m_movie = std::filesystem::canonical(m_directory.write("\"red\u009B31m\u007F\n.mp4", "moving pictures"));
    const auto clipsa = start("finish=a\u009B2J wait", {"--json"});
    EXPECT_EQ(clipsa->wait(), 0) << clipsa->errors();
    EXPECT_THAT(clipsa->output(), HasSubstr("{\"activityTypes\":[\"a\\u009b2J\"],\"movie\":\""));
    EXPECT_THAT(clipsa->output(), HasSubstr("/\\\"red\\u009b31m\\u007f\\u000a.mp4\",\"saved\":[],"));
}

TEST_F(OpeningAMovie, PrintsNothingWhenNothingWasDone)
{
    const auto clipsa = start("finish= wait");
    EXPECT_EQ(clipsa->wait(), 0);
    EXPECT_THAT(clipsa->output(), IsEmpty());
}

TEST_F(OpeningAMovie, HandsOverTheRequiredValuesLast)
{
    const auto attachment = m_directory.write("log.txt", "x");
    const auto report = m_directory.path() / "report";
    const auto clipsa =
        start("report=" + report.native() + " finish= wait",
              {"--app-name", "Racer", "--bundle-id", "org.racer", "--attachment", attachment, "--message", "look",
               "--tint", "#ff0000", "--device", "pad", "--home-button", "no", "--graphics-quality", "10", "--verbose"});
    EXPECT_EQ(clipsa->wait(), 0) << clipsa->errors();
    const Words told = lines(tests::PrivateDirectory::read(report));
    ASSERT_GE(told.size(), 6U);
    EXPECT_THAT(
        Words(told.begin(), told.begin() + 6),
        ElementsAre("VKVideoEditorExtensionFileAttachmentKey=" + std::filesystem::canonical(attachment).native(),
                    "VKVideoEditorExtensionOverrideShareMessageKey=look",
                    "VKVideoEditorExtensionOverrideTintColorKey=1 0 0 1", "VKVideoEditorExtensionAppNameKey=Racer",
                    "VKVideoEditorExtensionBundleIdentifierKey=org.racer",
                    "VKVideoEditorExtensionMovieURLKey=/private/var/mobile/Library/Velkor/Tux Racer.mp4"));
    for (const char* word : {"--device", "pad", "--home-button", "no", "--graphics-quality", "10", "--verbose"})
        EXPECT_THAT(told, Contains(std::string("argument=") + word));
}

TEST_F(OpeningAMovie, HandsOverNoMoreThanIsNeeded)
{
    const auto report = m_directory.path() / "report";
    EXPECT_EQ(start("report=" + report.native() + " finish= wait")->wait(), 0);
    const Words told = lines(tests::PrivateDirectory::read(report));
    EXPECT_EQ(told.at(0), "VKVideoEditorExtensionAppNameKey=Tux Racer");
    EXPECT_EQ(told.at(1), "VKVideoEditorExtensionBundleIdentifierKey=org.clipsa.recording");
    EXPECT_THAT(told.at(2), StartsWith("VKVideoEditorExtensionMovieURLKey="));
    EXPECT_THAT(told.at(3), StartsWith("argument="));
}

TEST_F(OpeningAMovie, TheEditorMayRemoveWhatItWasGiven)
{
    EXPECT_EQ(start("remove-movie finish=save wait")->wait(), 0);
    expectUntouched();
}

TEST_F(OpeningAMovie, SaysHowAnEditorEndedThatDidNotFinish)
{
    const std::pair<const char*, const char*> ways[] = {
        {"crash", "by signal 6"}, {"exit=7", "with exit status 7"}, {"", "closed before it showed the recording"}};
    for (const auto& [script, words] : ways) {
        const auto clipsa = start(script);
        EXPECT_EQ(clipsa->wait(), 3);
        EXPECT_THAT(clipsa->output(), IsEmpty());
        EXPECT_THAT(clipsa->errors(),
                    AllOf(HasSubstr(words), HasSubstr("your recording is untouched: " + m_movie.native())));
        EXPECT_THAT(directories(), IsEmpty());
        expectUntouched();
    }
}

TEST_F(OpeningAMovie, ACrashAfterTheUserHasFinishedIsNoFailure)
{
    const auto clipsa = start("finish=save wait crash");
    EXPECT_EQ(clipsa->wait(), 0);
    EXPECT_EQ(clipsa->output(), "save\n");
}

TEST_F(OpeningAMovie, NeverLosesTheLastMessageOfAQuickExit)
{
    for (int i = 0; i < 100; ++i) {
        const auto clipsa = start("finish=save exit=0");
        ASSERT_EQ(clipsa->wait(), 0) << "in run " << i << ": " << clipsa->errors();
        ASSERT_EQ(clipsa->output(), "save\n");
        ASSERT_THAT(directories(), IsEmpty());
    }
}

TEST_F(OpeningAMovie, KeepsTheEditorsWordsOutOfTheResult)
{
    const auto clipsa = start("say=noise finish=save wait");
    EXPECT_EQ(clipsa->wait(), 0);
    EXPECT_EQ(clipsa->output(), "save\n");
    EXPECT_THAT(clipsa->errors(), HasSubstr("noise"));
}

TEST_F(OpeningAMovie, AnInterruptedHostClosesItsEditor)
{
    for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
        const auto there = pipe(std::to_string(signal).c_str());
        const auto clipsa = start("tell=" + there.native() + " wait");
        EXPECT_THAT(tests::readPipe(there), HasSubstr("MovieURLKey"));
        EXPECT_EQ(directories().size(), 1U);
        clipsa->signal(signal);
        EXPECT_EQ(clipsa->wait(), 128 + signal);
        EXPECT_THAT(clipsa->errors(), IsEmpty());
        EXPECT_THAT(directories(), IsEmpty());
        expectUntouched();
    }
}

TEST_F(OpeningAMovie, AnEditorEndsWithAHostThatWasKilledAndTheNextOneSweeps)
{
    const auto there = pipe("there");
    const auto noticed = pipe("noticed");
    const auto clipsa = start("tell=" + there.native() + " wait tell=" + noticed.native());
    EXPECT_THAT(tests::readPipe(there), HasSubstr("MovieURLKey"));
    clipsa->signal(SIGKILL);
    EXPECT_EQ(clipsa->wait(), 128 + SIGKILL);

    ASSERT_EQ(directories().size(), 1U);
    const std::string left = directories().at(0);
    EXPECT_EQ(start("finish= wait")->wait(), 0);
    EXPECT_THAT(directories(), ElementsAre(left)) << "the editor still lives in it";

    tests::readPipe(noticed);
    {
        const posix::FileDescriptor lock(::open((left + "/lock").c_str(), O_RDWR | O_CLOEXEC));
        ASSERT_EQ(::flock(lock.get(), LOCK_EX), 0) << "waits until the editor has gone";
    }
    EXPECT_EQ(start("finish= wait")->wait(), 0);
    EXPECT_THAT(directories(), IsEmpty());
    expectUntouched();
}

TEST_F(OpeningAMovie, BadInputIsOneLineAndTouchesNothing)
{
    const std::vector<std::vector<std::string>> wrong = {
        {"--tint", "red"}, {"--nonsense"}, {"--attachment", "/nowhere/x"}, {"--device", "x"}, {"second.mp4"}};
    for (const auto& options : wrong) {
        const auto clipsa = start("finish= wait", options);
        EXPECT_EQ(clipsa->wait(), 2);
        EXPECT_EQ(lines(clipsa->errors()).size(), 1U) << clipsa->errors();
        EXPECT_THAT(clipsa->errors(), StartsWith("clipsa: "));
    }
    for (const char* movie : {"/nowhere/movie.mp4", "/dev/null", "/"}) {
        m_movie = movie;
        const auto clipsa = start("finish= wait");
        EXPECT_EQ(clipsa->wait(), 2);
        EXPECT_THAT(clipsa->errors(), HasSubstr(movie));
    }
    EXPECT_FALSE(std::filesystem::exists(m_cache));
}

TEST_F(OpeningAMovie, ACacheThatCannotBeMadeIsSaid)
{
    m_cache = m_directory.write("file", "x");
    const auto clipsa = start("finish= wait");
    EXPECT_EQ(clipsa->wait(), 1);
    EXPECT_THAT(clipsa->errors(), HasSubstr("cannot make a directory in " + m_cache.native()));
    expectUntouched();
}

TEST_F(OpeningAMovie, TakesAMovieWhoseNameIsNoText)
{
    m_movie = m_directory.write("caf\xE9.mp4", "moving pictures");
    const auto report = m_directory.path() / "report";
    EXPECT_EQ(start("report=" + report.native() + " finish= wait")->wait(), 0);
    EXPECT_THAT(tests::PrivateDirectory::read(report), HasSubstr("/Velkor/caf_.mp4\n"));
}

TEST_F(OpeningAMovie, TellsItsVersionAndHelp)
{
    tests::Program version({tests::program("clipsa"), "--version"}, {});
    EXPECT_EQ(version.wait(), 0);
    EXPECT_THAT(version.output(), StartsWith("clipsa "));
    tests::Program help({tests::program("clipsa"), "--help"}, {});
    EXPECT_EQ(help.wait(), 0);
    EXPECT_THAT(help.output(), HasSubstr("clipsa open MOVIE"));
}

TEST_F(OpeningAMovie, AMovieThatHasNoRoomIsSaidToBeUntouched)
{
    tests::whileRefusing({{SYS_linkat, EXDEV}, tests::noReflinks(), {SYS_copy_file_range, ENOSPC}}, [&] {
        const auto clipsa = start("wait");
        EXPECT_EQ(clipsa->wait(), 1);
        EXPECT_THAT(clipsa->errors(), AllOf(HasSubstr("clipsa: cannot copy the recording: the disk is full"),
                                            EndsWith("; your recording is untouched: " + m_movie.native() + "\n")));
    });
    expectUntouched();
}

} // namespace
