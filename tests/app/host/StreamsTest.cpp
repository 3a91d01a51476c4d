// What the commands do when nobody can take their results, and when they are told to end while a file holds them up.
#include "app/host/Streams.h"
#include "app/host/ClipsaProgram.h"
#include "linux/posix/FileDescriptor.h"
#include "support/RefusedSystemCalls.h"

#include <gmock/gmock.h>

#include <cstdio>
#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

namespace {

using testing::AllOf;
using testing::AnyOf;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

using tests::movie;
using tests::Words;

class Streams : public tests::ClipsaProgram {
protected:
    /// `words` as a shell takes them, `clipsa` in front.
    int runInShell(const std::string& words, const tests::Program::Variables& variables = {})
    {
        tests::Program program({"sh", "-c", "exec \"$0\" " + words, tests::program("clipsa"), movie("clock.mp4"), out},
                               variables);
        const int status = program.wait();
        printed = program.output();
        errors = program.errors();
        return status;
    }
};

TEST_F(Streams, AResultThatCannotBeWrittenIsAFailure)
{
    for (const char* words : {"probe \"$1\" >/dev/full", "probe \"$1\" --json >/dev/full", "probe \"$1\" >&-",
                              "--help >/dev/full", "--version >&-"}) {
        EXPECT_EQ(runInShell(words), 1) << words;
        EXPECT_EQ(errors, "clipsa: cannot write to standard output; is the disk full, or the output closed?\n")
            << words;
    }
    const tests::Program::Variables variables = {{"FAKE_EDITOR", "finish=save wait"},
                                                 {"CLIPSA_EDITOR", tests::program("fake-editor")},
                                                 {"XDG_CACHE_HOME", directory.path() / "cache"}};
    EXPECT_EQ(runInShell("open \"$1\" >/dev/full", variables), 1);
    EXPECT_THAT(errors, HasSubstr("cannot write to standard output"));
}

TEST_F(Streams, NoFileTakesThePlaceOfAClosedStream)
{
    EXPECT_EQ(runInShell("trim \"$1\" --to 1 -o \"$2\" <&- >&- 2>&-"), 0);
    EXPECT_NEAR(probe(out)["duration"].toDouble(), 1, 0.05);
}

/// What `body` gives in a process of its own, where nothing else is open.
template <typename Body> int inAnotherProcess(Body body)
{
    const pid_t child = ::fork();
    if (child == 0) {
        ::close_range(STDIN_FILENO, ~0U, 0);
        ::_exit(body());
    }
    int status = -1;
    EXPECT_EQ(::waitpid(child, &status, 0), child);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

TEST_F(Streams, StandForTheMissingOnes)
{
    EXPECT_EQ(inAnotherProcess([] {
                  host::keepStandardStreams();
                  const bool areOpen = ::fcntl(STDIN_FILENO, F_GETFD) >= 0 && ::fcntl(STDERR_FILENO, F_GETFD) >= 0;
                  return areOpen ? ::open("/dev/null", O_RDONLY) : -1;
              }),
              3)
        << "the first number for other files";
}

TEST_F(Streams, ThatCannotBeWrittenDoNotHideWhatElseWentWrong)
{
    const auto statusWithOutput = [](int status) {
        return inAnotherProcess([status] {
            host::keepStandardStreams();
            std::fputs("text", stdout);
            return host::finishOutput(status);
        });
    };
    EXPECT_EQ(statusWithOutput(0), 1);
    EXPECT_EQ(statusWithOutput(3), 3);
    EXPECT_EQ(statusWithOutput(130), 130);
}

TEST_F(Streams, NothingOfANameReachesTheTerminalAsACommand)
{
    EXPECT_EQ(run({"probe", "/nowhere/\x1b]0;title\a.mp4"}), 2);
    EXPECT_THAT(errors, AllOf(HasSubstr("?]0;title?.mp4"), Not(HasSubstr("\x1b"))));
    const std::string link = directory.path() / "red\x1b[31m.mp4";
    std::filesystem::create_symlink(movie("clock.mp4"), link);
    EXPECT_EQ(run({"probe", link}), 0);
    EXPECT_THAT(printed, AllOf(HasSubstr("red?[31m.mp4\n"), Not(HasSubstr("\x1b"))));
    EXPECT_EQ(run({"open", "--tint", "\x1b[31m", link}), 2);
    EXPECT_THAT(errors, AllOf(HasSubstr("?[31m"), Not(HasSubstr("\x1b"))));
}

class Interrupting : public tests::ClipsaProgram {
protected:
    /// Starts a command whose reads of the movie never return, and waits for the first of them.
    std::unique_ptr<tests::Program> startWithoutAnswers(const Words& words)
    {
        // The dynamic loader's own reads are shorter.
        constexpr std::uint32_t kKilobytes = 0xFFFFFC00;
        std::unique_ptr<tests::Program> program;
        std::thread([&] {
            m_heldUp = posix::FileDescriptor(tests::holdUpSystemCalls({{SYS_pread64, tests::kHeldUp, 2, kKilobytes}}));
            program = std::make_unique<tests::Program>(command(words), tests::Program::Variables{});
        }).join();
        pollfd held = {m_heldUp.get(), POLLIN, 0};
        EXPECT_EQ(::poll(&held, 1, 30'000), 1) << "nothing is read";
        return program;
    }

    posix::FileDescriptor m_heldUp;
};

TEST_F(Interrupting, TheSecondSignalEndsACommandThatAFileHoldsUp)
{
    for (const Words& words : {Words{"trim", movie("clock.mp4"), "-o", out}, Words{"probe", movie("clock.mp4")},
                               Words{"thumbnails", movie("clock.mp4"), "-n", "1", "-o", out}}) {
        const auto program = startWithoutAnswers(words);
        program->signal(SIGINT);
        program->signal(SIGTERM); // two of a kind that come together are one
        EXPECT_THAT(program->wait(), AnyOf(128 + SIGINT, 128 + SIGTERM));
        EXPECT_THAT(program->errors(), IsEmpty());
    }
    EXPECT_FALSE(std::filesystem::exists(out));
}

TEST_F(Interrupting, TheSecondSignalLeavesAnEditorToItself)
{
    const std::string there = directory.path() / "there";
    const std::string asked = directory.path() / "asked";
    for (const std::string& pipe : {there, asked})
        ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    tests::Program program(command({"open", movie("clock.mp4")}),
                           {{"FAKE_EDITOR", "busy tell=" + there + " wait tell=" + asked},
                            {"CLIPSA_EDITOR", tests::program("fake-editor")},
                            {"XDG_CACHE_HOME", directory.path() / "cache"}});
    EXPECT_THAT(tests::readPipe(there), HasSubstr("MovieURLKey"));
    program.signal(SIGINT);
    program.signal(SIGTERM);
    EXPECT_THAT(program.wait(), AnyOf(128 + SIGINT, 128 + SIGTERM));
    EXPECT_THAT(tests::readPipe(asked), HasSubstr("MovieURLKey")) << "it finishes what it has begun";
}

} // namespace
