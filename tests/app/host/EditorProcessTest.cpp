// The process that an editor is: what it is started with, how its end is told, and where its program is found.
#include "app/host/EditorProcess.h"

#include "app/host/ClipsaProgram.h"
#include "linux/posix/FileDescriptor.h"
#include "support/Child.h"
#include "support/EventLoop.h"
#include "support/RefusedSystemCalls.h"
#include "support/SignalMask.h"

#include <gmock/gmock.h>

#include <csignal>
#include <cstdlib>
#include <fcntl.h>
#include <fstream>
#include <optional>
#include <sys/stat.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

using tests::PrivateDirectory;
using tests::Words;

namespace fs = std::filesystem;

/// Another file in the place of a standard stream, while it lives.
class StandardStream {
public:
    StandardStream(int number, const posix::FileDescriptor& file)
        : m_number(number), m_before(::fcntl(number, F_DUPFD_CLOEXEC, 10))
    {
        ::dup2(file.get(), number);
    }
    ~StandardStream() { ::dup2(m_before.get(), m_number); }
    StandardStream(const StandardStream&) = delete;
    StandardStream& operator=(const StandardStream&) = delete;

private:
    const int m_number;
    const posix::FileDescriptor m_before;
};

class AnEditorsProcess : public testing::Test {
protected:
    /// What this test inherited from whoever runs it is not its host's.
    AnEditorsProcess() { ::close_range(3, ~0U, CLOSE_RANGE_CLOEXEC); }

    /// A shell that does what `script` says; files are in `$0`, the test's directory.
    void start(const std::string& script)
    {
        m_start.program = "/bin/sh";
        m_start.arguments = {"-c", script, m_directory.path()};
        auto started = host::EditorProcess::start(m_start, [this](host::ProcessEnd end) {
            ++m_ends;
            m_end = end;
        });
        ASSERT_TRUE(started) << started.error()->description();
        m_process = std::move(started).value();
    }
    void run(const std::string& script)
    {
        start(script);
        ASSERT_TRUE(tests::pumpUntil([&] { return m_ends > 0; }));
    }
    std::string read(const char* name) const { return PrivateDirectory::read(m_directory.path() / name); }
    posix::FileDescriptor open(const char* name) const
    {
        return posix::FileDescriptor(::open(m_directory.write(name, "").c_str(), O_RDWR | O_CLOEXEC));
    }

    PrivateDirectory m_directory;
    host::ProcessStart m_start;
    std::unique_ptr<host::EditorProcess> m_process;
    int m_ends = 0;
    host::ProcessEnd m_end;
};

TEST_F(AnEditorsProcess, HasTheFilesThatItIsGivenAndNoOthers)
{
    const auto lock = open("the lock");
    const auto report = open("the report");
    const auto other = open("another");
    m_start.lock = lock.get();
    m_start.report = report.get();
    {
        // The host's own, which are three different ones.
        const StandardStream input(STDIN_FILENO, open("the input"));
        const StandardStream output(STDOUT_FILENO, open("the output"));
        const StandardStream errors(STDERR_FILENO, open("the errors"));
        start("for each in /proc/$$/fd/*; do echo \"${each##*/} $(readlink $each)\" >>\"$0/files\"; done");
    }
    ASSERT_TRUE(tests::pumpUntil([&] { return m_ends > 0; }));
    const std::string files = read("files");
    EXPECT_THAT(files,
                AllOf(HasSubstr("0 /dev/null\n"), HasSubstr("3 " + (m_directory.path() / "the lock").native()),
                      HasSubstr("4 " + (m_directory.path() / "the report").native()), Not(HasSubstr("another"))));
    // What it says is none of its host's results.
    EXPECT_THAT(files, AllOf(HasSubstr("1 " + (m_directory.path() / "the errors").native() + "\n"),
                             HasSubstr("2 " + (m_directory.path() / "the errors").native() + "\n")));
}

TEST_F(AnEditorsProcess, HasNoLockAndNoReportIfThereAreNone)
{
    run("ls /proc/$$/fd >\"$0/files\"");
    EXPECT_THAT(read("files"), AllOf(HasSubstr("2\n"), Not(HasSubstr("3\n")), Not(HasSubstr("4\n"))));
}

TEST_F(AnEditorsProcess, HasItsHostsVariablesAndItsOwnInTheirPlace)
{
    ::setenv("FROM_THE_HOST", "host's", 1);
    ::setenv("FROM_THE", "host's too", 1);
    ::setenv("OF_BOTH", "host's", 1);
    m_start.environment = {{"OF_BOTH", "editor's"}, {"NEW", "a=b"}};
    run("env >\"$0/variables\"");
    for (const char* name : {"FROM_THE_HOST", "FROM_THE", "OF_BOTH"})
        ::unsetenv(name);
    EXPECT_THAT(read("variables"),
                AllOf(HasSubstr("FROM_THE_HOST=host's\n"), HasSubstr("FROM_THE=host's too\n"),
                      HasSubstr("OF_BOTH=editor's\n"), Not(HasSubstr("OF_BOTH=host's")), HasSubstr("NEW=a=b\n")));
}

TEST_F(AnEditorsProcess, IsNotReachedByTheKeysOfItsHostsTerminalAndHearsItsSignals)
{
    sigset_t blocked = {};
    ::sigaddset(&blocked, SIGINT);
    ::sigaddset(&blocked, SIGUSR1);
    std::optional<tests::SignalMask> before(std::in_place);
    ::pthread_sigmask(SIG_BLOCK, &blocked, nullptr);
    std::vector<sighandler_t> handlers;
    for (const int number : {SIGINT, SIGTERM, SIGHUP, SIGPIPE})
        handlers.push_back(std::signal(number, SIG_IGN));
    run("grep -E 'SigBlk|SigIgn' /proc/self/status >\"$0/signals\"; cut -d' ' -f5 /proc/$$/stat >\"$0/group\"; "
        "echo $$ >\"$0/process\"");
    for (std::size_t i = 0; const int number : {SIGINT, SIGTERM, SIGHUP, SIGPIPE})
        std::signal(number, handlers[i++]);
    before.reset();
    const std::string signals = read("signals");
    EXPECT_THAT(signals, StartsWith("SigBlk:\t0000000000000000\nSigIgn:\t"));
    const auto ignored = std::stoull(signals.substr(signals.rfind('\t')), nullptr, 16);
    for (const int number : {SIGINT, SIGTERM, SIGHUP, SIGPIPE})
        EXPECT_EQ(ignored >> (number - 1) & 1U, 0U) << number;
    EXPECT_EQ(read("group"), read("process"));
}

TEST_F(AnEditorsProcess, TellsOnceHowItEnded)
{
    run("exit 7");
    EXPECT_EQ(m_end.exitStatus, 7);
    EXPECT_EQ(m_end.signal, 0);
    EXPECT_EQ(m_end.words(), "with exit status 7");
    m_process->signal(SIGKILL); // nobody is there any more
    m_process.reset();
    EXPECT_EQ(m_ends, 1);
}

TEST_F(AnEditorsProcess, TellsWhichSignalEndedIt)
{
    start("kill -STOP $$; exit 0");
    m_process->signal(SIGTERM);
    m_process->signal(SIGCONT);
    ASSERT_TRUE(tests::pumpUntil([&] { return m_ends > 0; }));
    EXPECT_EQ(m_end.signal, SIGTERM);
    EXPECT_EQ(m_end.words(), "by signal 15 (Terminated)");
}

TEST_F(AnEditorsProcess, EndsWithItsOwnerWithoutAWord)
{
    const auto pipe = m_directory.path() / "pipe";
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    start("echo $$ >\"$0/pipe\"; trap '' TERM; while :; do read _ <\"$0/pipe\"; done");
    const pid_t process = std::stoi(PrivateDirectory::read(pipe));
    m_process.reset();
    EXPECT_NE(::kill(process, 0), 0) << "it still runs";
    EXPECT_EQ(m_ends, 0);
}

TEST_F(AnEditorsProcess, CanGoWithItsOwnerFromInsideOfItsEnd)
{
    m_start.program = "/bin/true";
    bool ended = false;
    auto started = host::EditorProcess::start(m_start, [&](host::ProcessEnd) {
        m_process.reset();
        ended = true;
    });
    ASSERT_TRUE(started);
    m_process = std::move(started).value();
    EXPECT_TRUE(tests::pumpUntil([&] { return ended; }));
}

TEST_F(AnEditorsProcess, ThatCannotBeStartedSaysWhy)
{
    m_start.program = m_directory.path() / "nothing";
    const auto started = host::EditorProcess::start(m_start, [this](host::ProcessEnd) { ++m_ends; });
    ASSERT_FALSE(started);
    EXPECT_EQ(started.error()->code(), ENOENT);
    EXPECT_THAT(started.error()->description(), StartsWith("cannot start " + m_start.program));
    EXPECT_EQ(m_ends, 0);
}

TEST_F(AnEditorsProcess, ThatCannotBeWatchedIsEndedAgain)
{
    const auto hasChildren = [] { return ::waitpid(-1, nullptr, WNOHANG | WNOWAIT) >= 0; };
    ASSERT_FALSE(hasChildren());
    m_start.program = "/bin/sleep";
    m_start.arguments = {"1000"};
    std::thread([&] {
        tests::refuseSystemCalls({{SYS_pidfd_open, EMFILE}});
        const auto started = host::EditorProcess::start(m_start, [this](host::ProcessEnd) { ++m_ends; });
        EXPECT_FALSE(started);
        EXPECT_THAT(started.error()->description(), StartsWith("cannot watch /bin/sleep"));
    }).join();
    EXPECT_FALSE(hasChildren());
    EXPECT_EQ(m_ends, 0);
}

/// `clipsa` where it has been installed, with its other programs in some of the places where they can be.
class AnInstalledHost : public tests::ClipsaProgram {
protected:
    AnInstalledHost()
    {
        fs::create_directories(m_prefix / "bin");
        fs::copy_file(tests::program("clipsa"), m_prefix / "bin/clipsa");
    }
    /// A program that says who it is.
    void install(const fs::path& place, mode_t mode = 0700)
    {
        fs::create_directories((m_prefix / place).parent_path());
        std::ofstream(m_prefix / place) << "#!/bin/sh\necho \"" + place.native() + " $*\" >>\"$WHO\"\nexit 9\n";
        ::chmod((m_prefix / place).c_str(), mode);
    }
    /// Who was started, if anybody was.
    std::string started(const Words& words, const tests::Program::Variables& more = {})
    {
        fs::remove(m_who);
        tests::Program::Variables variables = {{"WHO", m_who},
                                               {"CLIPSA_EDITOR", ""},
                                               {"PATH", "relative:" + (m_prefix / "path").native() + ":/usr/bin:/bin"},
                                               {"XDG_CACHE_HOME", directory.path() / "cache"}};
        for (const auto& [name, value] : more)
            variables[name] = value;
        Words all = words;
        all.insert(all.begin(), m_prefix / "bin/clipsa");
        tests::Program program(all, variables);
        m_status = program.wait();
        errors = program.errors();
        const std::string who = PrivateDirectory::read(m_who);
        return who.substr(0, who.find(' '));
    }
    std::string editor(const tests::Program::Variables& more = {}) { return started({"open", m_movie}, more); }

    const fs::path m_prefix = directory.path() / "prefix";
    const fs::path m_who = directory.path() / "who";
    const fs::path m_movie = directory.write("race.mp4", "moving pictures");
    int m_status = -1;
};

TEST_F(AnInstalledHost, FindsItsEditorBesideItInItsPrefixOrInThePath)
{
    EXPECT_EQ(editor(), "");
    EXPECT_EQ(m_status, 1);
    EXPECT_EQ(errors, "clipsa: there is no clipsa-editor beside this program; install Clipsa again\n");
    install("path/clipsa-editor");
    EXPECT_EQ(editor(), "path/clipsa-editor");
    EXPECT_EQ(m_status, 3);
    install("libexec/clipsa/clipsa-editor");
    EXPECT_EQ(editor(), "libexec/clipsa/clipsa-editor");
    install("bin/clipsa-editor", 0600);
    EXPECT_EQ(editor(), "libexec/clipsa/clipsa-editor") << "what cannot be started is no program";
    fs::remove(m_prefix / "bin/clipsa-editor");
    fs::create_directory(m_prefix / "bin/clipsa-editor");
    EXPECT_EQ(editor(), "libexec/clipsa/clipsa-editor") << "nor is a directory";
    fs::remove(m_prefix / "bin/clipsa-editor");
    install("bin/clipsa-editor");
    EXPECT_EQ(editor(), "bin/clipsa-editor");
    install("own/editor");
    EXPECT_EQ(editor({{"CLIPSA_EDITOR", m_prefix / "own/editor"}}), "own/editor");
    EXPECT_EQ(editor({{"CLIPSA_EDITOR", m_prefix / "own/none"}}), "bin/clipsa-editor");
}

TEST_F(AnInstalledHost, BecomesItsMediaProgramWithTheSameWords)
{
    EXPECT_EQ(started({"probe", "m"}), "");
    EXPECT_EQ(m_status, 1);
    EXPECT_EQ(errors, "clipsa: there is no clipsa-media beside this program; install Clipsa again\n");
    install("libexec/clipsa/clipsa-media");
    EXPECT_EQ(started({"probe", "m"}), "libexec/clipsa/clipsa-media");
    EXPECT_EQ(m_status, 9);
    EXPECT_EQ(PrivateDirectory::read(m_who), "libexec/clipsa/clipsa-media probe m\n");
    install("bin/clipsa-media", 0600);
    EXPECT_EQ(started({"probe", "m"}), "");
    EXPECT_EQ(m_status, 1);
    EXPECT_THAT(errors, AllOf(StartsWith("clipsa: cannot start "), HasSubstr("bin/clipsa-media: that is not allowed")));
    ::chmod((m_prefix / "bin/clipsa-media").c_str(), 0700);
    EXPECT_EQ(started({"probe", "m"}), "bin/clipsa-media");
}

} // namespace
