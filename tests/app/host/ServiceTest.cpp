// The service as it is installed: started by its bus for the first recorder that calls it.
#include "linux/posix/FileDescriptor.h"
#include "support/Paths.h"
#include "support/PrivateBus.h"
#include "support/Program.h"
#include "support/RefusedSystemCalls.h"

#include <gmock/gmock.h>

#include <sys/stat.h>
#include <thread>

using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;
using testing::UnorderedElementsAre;

namespace {

const std::string kPython = "/usr/bin/python3"; // whose modules are the system's

class Service : public ::testing::Test {
protected:
    /// A bus that knows our service file; what it starts has the variables of this process.
    void startBus(const std::string& script, const std::vector<tests::RefusedSystemCall>& slow = {})
    {
        std::string file = tests::PrivateDirectory::read(tests::sourceFile("packaging/org.clipsa.Clipsa.service.in"));
        const std::string variable = "@CMAKE_INSTALL_FULL_BINDIR@";
        ASSERT_THAT(file, HasSubstr(variable));
        file.replace(file.find(variable), variable.size(), tests::program(""));
        m_directory.write("data/dbus-1/services/org.clipsa.Clipsa.service", file);
        ::setenv("XDG_DATA_HOME", (m_directory.path() / "data").c_str(), 1);
        ::setenv("XDG_DATA_DIRS", "/nowhere", 1);
        ::setenv("XDG_CACHE_HOME", m_cache.c_str(), 1);
        ::setenv("CLIPSA_EDITOR", tests::program("fake-editor").c_str(), 1);
        ::setenv("FAKE_EDITOR", script.c_str(), 1);
        // What the bus starts is held up as the thread is that started the bus.
        std::thread([&] {
            if (!slow.empty())
                m_heldUp = posix::FileDescriptor(tests::holdUpSystemCalls(slow));
            m_bus.emplace();
        }).join();
    }

    void expectSuccess(const std::vector<std::string>& words)
    {
        tests::Program program(words, {});
        EXPECT_EQ(program.wait(), 0) << program.errors();
        m_output = program.output();
        EXPECT_EQ(tests::PrivateDirectory::read(m_movie), "moving pictures");
    }

    void expectScenario(const std::string& scenario)
    {
        expectSuccess({kPython, tests::sourceFile("tests/app/host/recorders.py"), m_movie, scenario});
    }

    std::filesystem::path pipe(const char* variable)
    {
        const auto path = m_directory.path() / variable;
        EXPECT_EQ(::mkfifo(path.c_str(), 0600), 0);
        ::setenv(variable, path.c_str(), 1);
        return path;
    }

    tests::PrivateDirectory m_directory;
    std::filesystem::path m_movie = m_directory.write("my game.mp4", "moving pictures");
    std::filesystem::path m_cache = m_directory.path() / "cache";
    std::string m_output;
    posix::FileDescriptor m_heldUp;
    std::optional<tests::PrivateBus> m_bus;
};

TEST_F(Service, SaysThatItNeedsASession)
{
    tests::Program program({tests::program("clipsa"), "service"}, {{"DBUS_SESSION_BUS_ADDRESS", "unix:path=/nowhere"}});
    EXPECT_EQ(program.wait(), 1);
    EXPECT_THAT(program.errors(), StartsWith("clipsa: there is no session bus; "));
}

TEST_F(Service, ReadsNobodysFileWhereItServesTheOthers)
{
    // Looking at a movie's first bytes, to find a name for it.
    startBus("finish= wait", {{SYS_pread64, tests::kHeldUp, 2, 64, true}});
    expectScenario("slow_file");
}

TEST_F(Service, EndsWithItsBusWhateverAFileDoes)
{
    startBus("wait", {{SYS_pread64, tests::kHeldUp, 2, 64, true}});
    expectScenario("bus_end");
}

TEST_F(Service, WaitsForNoCopyThatNobodyWants)
{
    startBus("wait", {{SYS_linkat, EXDEV}, tests::noReflinks(), {SYS_copy_file_range, tests::kHeldUp}});
    expectScenario("slow_copy");
    EXPECT_TRUE(std::filesystem::is_empty(m_cache / "clipsa")) << "what was copied is left behind";
}

TEST_F(Service, TellsEachRecorderOfItsOwnSessionsAlone)
{
    startBus("finish=save,share wait");
    expectScenario("completed");
}

TEST_F(Service, TellsOfAnEditorThatEndedEarly)
{
    startBus("shared=Bluetooth,Phone exit=9");
    expectScenario("failed");
}

TEST_F(Service, TellsWhatWasSavedAndWithWhomItWasShared)
{
    startBus(
        "shared=Bluetooth,Phone saved=/videos/a.mp4 unshared=Mail, unsaved=/data/b.mp4 finish=Bluetooth,save wait");
    expectScenario("results");
}

TEST_F(Service, TellsWhatBecameOfSavedMoviesBeforeAndBehindTheUsersLastWord)
{
    startBus("saved=/videos/a.mp4 finish=save,save wait unsaved=/data/b.mp4");
    expectScenario("saves");
}

TEST_F(Service, ClosesTheEditorsOfARecorderThatVanishes)
{
    const auto there = pipe("PIPE_THERE");
    const auto closed = pipe("PIPE_CLOSED");
    startBus("tell=" + there.native() + " wait tell=" + closed.native());
    expectScenario("vanish");
}

TEST_F(Service, RefusesWhatIsNoRecordingInWords)
{
    startBus("finish= wait");
    expectScenario("refused");
    EXPECT_FALSE(std::filesystem::exists(m_cache)) << "something was touched";
}

TEST_F(Service, TakesFilesThatHaveNoNameAnyMore)
{
    const auto report = m_directory.path() / "report";
    startBus("report=" + report.native() + " finish= wait");
    expectScenario("nameless");
    const std::string told = tests::PrivateDirectory::read(report);
    EXPECT_THAT(told, HasSubstr("MovieURLKey=/private/var/mobile/Library/Velkor/a.webm\n"));
    EXPECT_THAT(told, StartsWith("VKVideoEditorExtensionFileAttachmentKey=" + m_cache.native()));
    EXPECT_THAT(told, HasSubstr("/attachment/log.txt\n"));
}

TEST_F(Service, TakesAttachmentsByTheirPathsAndHasOneAnswerToTheRest)
{
    const auto report = m_directory.path() / "report";
    startBus("report=" + report.native() + " finish= wait");
    expectScenario("attachments");
    EXPECT_THAT(tests::PrivateDirectory::read(report),
                StartsWith("VKVideoEditorExtensionFileAttachmentKey="
                           + std::filesystem::canonical(m_directory.path() / "log.txt").native() + "\n"));
}

TEST_F(Service, FollowsNoPathOfARecorderWithAnotherRoot)
{
    startBus("finish= wait");
    expectScenario("other_root");
    EXPECT_THAT(m_output, IsEmpty()) << "it could not take the place of a sandbox";
}

TEST_F(Service, FollowsNoPathOfARecorderWithOtherMounts)
{
    startBus("finish= wait");
    expectScenario("other_mounts");
    EXPECT_THAT(m_output, IsEmpty()) << "it could not take the place of a sandbox";
}

TEST_F(Service, OpensWhatAFileManagerGivesIt)
{
    const auto there = pipe("PIPE_THERE");
    startBus("tell=" + there.native() + " finish= wait");
    expectScenario("open_uris");
    EXPECT_THAT(tests::readPipe(there), HasSubstr("AppNameKey=my game\n"));
}

TEST_F(Service, AnswersTheExampleInPython)
{
    const auto report = m_directory.path() / "report";
    startBus("report=" + report.native() + " finish=save,share wait");
    expectSuccess({kPython, tests::sourceFile("docs/examples/record_and_edit.py"), m_movie, "Tux Racer"});
    EXPECT_EQ(m_output, "save\nshare\n");
    EXPECT_THAT(tests::PrivateDirectory::read(report), HasSubstr("AppNameKey=Tux Racer\n"));
}

TEST_F(Service, TellsTheExampleInPythonWithWhomItWasShared)
{
    startBus("shared=Bluetooth,Phone unshared=KDEConnect,Tablet shared=Mail, finish=Bluetooth,Mail wait");
    tests::Program example({kPython, tests::sourceFile("docs/examples/record_and_edit.py"), m_movie}, {});
    EXPECT_EQ(example.wait(), 0);
    EXPECT_EQ(example.output(), "Bluetooth\nMail\n");
    EXPECT_EQ(example.errors(), "shared with Phone by Bluetooth\n"
                                "not shared with Tablet by KDEConnect: it went away\n"
                                "shared by Mail\n");
}

TEST_F(Service, TellsTheExampleInPythonWhatIsWrong)
{
    startBus("exit=9");
    tests::Program early({kPython, tests::sourceFile("docs/examples/record_and_edit.py"), m_movie}, {});
    EXPECT_EQ(early.wait(), 1);
    EXPECT_EQ(early.errors(), "the editor ended early, with exit status 9\n");
    tests::Program wrong({kPython, tests::sourceFile("docs/examples/record_and_edit.py"), "/dev/null"}, {});
    EXPECT_EQ(wrong.wait(), 1);
    EXPECT_THAT(wrong.errors(), HasSubstr("not a regular file"));
}

TEST_F(Service, TheExampleInPythonSaysWhereAMovieIsKeptThatWasNotSaved)
{
    startBus("unsaved=/data/unsaved/race.mp4 finish=save wait");
    tests::Program example({kPython, tests::sourceFile("docs/examples/record_and_edit.py"), m_movie}, {});
    EXPECT_EQ(example.wait(), 1);
    EXPECT_EQ(example.output(), "save\n");
    EXPECT_THAT(example.errors(), AllOf(StartsWith("the movie is not in your videos ("),
                                        HasSubstr("); it is kept as /data/unsaved/race.mp4\n")));
}

TEST_F(Service, TheExampleInPythonWaitsForASaveThatTheUserDidNotWaitFor)
{
    startBus("finish=save wait unsaved=/data/unsaved/race.mp4");
    tests::Program example({kPython, tests::sourceFile("docs/examples/record_and_edit.py"), m_movie}, {});
    EXPECT_EQ(example.wait(), 1);
    EXPECT_EQ(example.output(), "save\n");
    EXPECT_THAT(example.errors(), HasSubstr("it is kept as /data/unsaved/race.mp4\n"));
}

TEST_F(Service, TheExampleInPythonSaysWhatItNeeds)
{
    const std::string example = tests::sourceFile("docs/examples/record_and_edit.py");
    tests::Program nothing({kPython, example}, {});
    EXPECT_EQ(nothing.wait(), 1);
    EXPECT_EQ(nothing.errors(), "record_and_edit.py MOVIE [APP-NAME]\n");
    startBus("finish= wait");
    tests::Program missing({kPython, example, m_directory.path() / "none.mp4"}, {});
    EXPECT_EQ(missing.wait(), 1);
    EXPECT_THAT(missing.errors(), AllOf(StartsWith("cannot read "), HasSubstr("none.mp4: No such file or directory")));
    EXPECT_THAT(missing.errors(), Not(HasSubstr("Traceback")));
}

TEST_F(Service, OpensWhatTheExampleOfTheShellGivesIt)
{
    const auto there = pipe("PIPE_THERE");
    startBus("tell=" + there.native() + " finish= wait");
    const std::string manual = tests::PrivateDirectory::read(tests::sourceFile("docs/for-recorders.md"));
    const std::size_t start = manual.find("gdbus call");
    ASSERT_NE(start, std::string::npos);
    std::string call = manual.substr(start, manual.find("```", start) - start);
    const std::string file = "/home/me/Videos/race.webm";
    ASSERT_THAT(call, HasSubstr(file));
    call.replace(call.find(file), file.size(), m_directory.write("race.webm", "moving pictures"));
    expectSuccess({"sh", "-c", call});
    EXPECT_THAT(tests::readPipe(there), HasSubstr("AppNameKey=race\n"));
}

/// The example for scripts, with a recorder that writes `recording` and ends with `recorderStatus`.
class ExampleInShell : public ::testing::Test {
protected:
    int run(const std::string& editorScript, const std::string& recording = "moving pictures", int recorderStatus = 0)
    {
        const auto recorder = m_directory.write("recorder", "#!/bin/sh\nprintf '" + recording + "' > \"$1\"\nexit "
                                                                + std::to_string(recorderStatus) + "\n");
        ::chmod(recorder.c_str(), 0700);
        std::filesystem::create_directories(m_videos);
        tests::Program example({"sh", "-c", "cd \"$0\" && exec \"$1\" Racer", m_videos,
                                tests::sourceFile("docs/examples/record-and-edit.sh")},
                               {{"RECORDER", recorder},
                                {"PATH", tests::program("") + ":" + std::getenv("PATH")},
                                {"XDG_CACHE_HOME", m_directory.path() / "cache"},
                                {"CLIPSA_EDITOR", tests::program("fake-editor")},
                                {"FAKE_EDITOR", editorScript}});
        const int status = example.wait();
        m_output = example.output();
        m_errors = example.errors();
        return status;
    }

    /// What all that is there contains, recording or not.
    std::vector<std::string> recordings() const
    {
        std::vector<std::string> contents;
        for (const auto& entry : std::filesystem::directory_iterator(m_videos))
            contents.push_back(tests::PrivateDirectory::read(entry.path()));
        return contents;
    }

    tests::PrivateDirectory m_directory;
    std::filesystem::path m_videos = m_directory.path() / "my videos";
    std::string m_output;
    std::string m_errors;
};

TEST_F(ExampleInShell, KeepsTheRecordingWhateverWasDoneWithIt)
{
    EXPECT_EQ(run("finish=SaveToCameraRoll wait"), 0) << m_errors; // a trim says the same, and saves nothing
    EXPECT_THAT(m_output, StartsWith("Done with the recording: SaveToCameraRoll\nIt stays in /"));
    EXPECT_THAT(recordings(), ElementsAre("moving pictures"));
}

TEST_F(ExampleInShell, ReplacesNoOlderRecording)
{
    EXPECT_EQ(run("finish= wait", "older"), 0) << m_errors;
    EXPECT_THAT(m_output, StartsWith("The recording was looked at and closed.\nIt stays in /"));
    EXPECT_EQ(run("finish= wait", "newer"), 0) << m_errors;
    EXPECT_THAT(recordings(), UnorderedElementsAre("older", "newer"));
}

TEST_F(ExampleInShell, KeepsTheRecordingWhenTheEditorCrashes)
{
    EXPECT_EQ(run("crash"), 3);
    EXPECT_THAT(m_errors, HasSubstr("Clipsa ended with status 3"));
    EXPECT_THAT(m_output, StartsWith("It stays in /"));
    EXPECT_THAT(recordings(), ElementsAre("moving pictures"));
}

TEST_F(ExampleInShell, SaysThatTheMovieWasNotSaved)
{
    EXPECT_EQ(run("unsaved=/data/unsaved/race.mp4 finish=save wait"), 1);
    EXPECT_THAT(m_errors, AllOf(HasSubstr("it is kept as /data/unsaved/race.mp4"), HasSubstr("ended with status 1")));
    EXPECT_THAT(recordings(), ElementsAre("moving pictures"));
}

TEST_F(ExampleInShell, EditsWhatARecorderLeavesThatWasInterrupted)
{
    EXPECT_EQ(run("finish= wait", "moving pictures", 130), 0) << m_errors;
    EXPECT_THAT(recordings(), ElementsAre("moving pictures"));
}

TEST_F(ExampleInShell, LeavesNothingWhereNothingWasRecorded)
{
    EXPECT_EQ(run("finish= wait", "", 7), 7);
    EXPECT_EQ(m_errors, "Nothing was recorded.\n");
    EXPECT_THAT(recordings(), IsEmpty());
    EXPECT_EQ(run("finish= wait", "", 0), 1);
}

} // namespace
