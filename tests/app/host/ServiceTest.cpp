// The service as it is installed: started by its bus for the first recorder that calls it.
#include "support/Paths.h"
#include "support/PrivateBus.h"
#include "support/Program.h"

#include <gmock/gmock.h>

#include <sys/stat.h>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

namespace {

const std::string kPython = "/usr/bin/python3"; // whose modules are the system's

class Service : public ::testing::Test {
protected:
    /// A bus that knows our service file; what it starts has the variables of this process.
    void startBus(const std::string& script)
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
        m_bus.emplace();
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
    std::optional<tests::PrivateBus> m_bus;
};

TEST_F(Service, TellsEachRecorderOfItsOwnSessionsAlone)
{
    startBus("finish=save,share wait");
    expectScenario("completed");
}

TEST_F(Service, TellsOfAnEditorThatEndedEarly)
{
    startBus("exit=9");
    expectScenario("failed");
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
    EXPECT_THAT(told, HasSubstr("/attachment/attachment\n"));
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

TEST_F(Service, TheExampleInShellRecordsAndEdits)
{
    const auto recorder = m_directory.write("recorder", "#!/bin/sh\necho moving pictures > \"$1\"\n");
    ::chmod(recorder.c_str(), 0700);
    const std::string path = tests::program("") + ":" + std::getenv("PATH");
    const auto run = [&](const std::string& script) {
        tests::Program example({"sh", "-c", "cd \"$0\" && exec \"$1\" Racer", m_directory.path(),
                                tests::sourceFile("docs/examples/record-and-edit.sh")},
                               {{"RECORDER", recorder},
                                {"PATH", path},
                                {"XDG_CACHE_HOME", m_cache},
                                {"CLIPSA_EDITOR", tests::program("fake-editor")},
                                {"FAKE_EDITOR", script}});
        EXPECT_EQ(example.wait(), 0) << example.errors();
        return example.output();
    };
    EXPECT_EQ(run("finish=save wait"), "Done with the recording: save\n");
    EXPECT_FALSE(std::filesystem::exists(m_directory.path() / "recording.mp4"));
    EXPECT_THAT(run("finish= wait"), HasSubstr("keeping it as recording.mp4"));
    EXPECT_EQ(tests::PrivateDirectory::read(m_directory.path() / "recording.mp4"), "moving pictures\n");
}

} // namespace
