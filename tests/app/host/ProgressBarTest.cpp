#include "app/host/ProgressBar.h"

#include "linux/posix/FileDescriptor.h"

#include <gmock/gmock.h>

#include <cmath>
#include <cstdlib>
#include <pty.h>
#include <sys/ioctl.h>
#include <unistd.h>

namespace {

TEST(ProgressBar, FillsAsFarAsTheWorkHasCome)
{
    EXPECT_EQ(host::progressLine("Work", 0, 33), "Work [--------------------]   0 %");
    EXPECT_EQ(host::progressLine("Work", 0.5, 33), "Work [##########----------]  50 %");
    EXPECT_EQ(host::progressLine("Work", 1, 33), "Work [####################] 100 %");
}

TEST(ProgressBar, NeverSaysMoreThanIsDone)
{
    EXPECT_EQ(host::progressLine("Work", 0.9999, 33), "Work [###################-]  99 %");
}

TEST(ProgressBar, TakesWhatIsNoPartForTheNearestThatIs)
{
    EXPECT_EQ(host::progressLine("Work", -3, 33), host::progressLine("Work", 0, 33));
    EXPECT_EQ(host::progressLine("Work", 7, 33), host::progressLine("Work", 1, 33));
    EXPECT_EQ(host::progressLine("Work", std::nan(""), 33), host::progressLine("Work", 0, 33));
}

TEST(ProgressBar, CountsLettersAndLeavesTheBarOutWhereThereIsNoRoom)
{
    EXPECT_EQ(host::progressLine("Wörk", 0.5, 33), "Wörk [##########----------]  50 %");
    EXPECT_EQ(host::progressLine("Étés", 0.5, 33), "Étés [##########----------]  50 %");
    EXPECT_EQ(host::progressLine("Work", 0.5, 21), "Work [####----]  50 %");
    EXPECT_EQ(host::progressLine("Work", 0.5, 20), "Work  50 %");
    EXPECT_EQ(host::progressLine("Work", 0.5, 1000).size(), 100U);
}

TEST(ProgressBar, SaysNothingWhereNobodyLooks)
{
    std::FILE* const file = std::tmpfile();
    {
        host::ProgressBar bar("Work", file);
        bar.show(0.5);
        bar.clear();
    }
    EXPECT_EQ(std::ftell(file), 0);
    std::fclose(file);
}

/// A terminal of so many columns, and what is written to it.
class OnATerminal : public testing::Test {
protected:
    void open(unsigned short columns, const char* kind = "xterm")
    {
        ::setenv("TERM", kind, 1);
        winsize size = {24, columns, 0, 0};
        termios raw = {};
        int screen = -1;
        int program = -1;
        ASSERT_EQ(::openpty(&screen, &program, nullptr, &raw, &size), 0);
        m_screen = posix::FileDescriptor(screen);
        stream = ::fdopen(program, "w");
    }
    ~OnATerminal() override
    {
        std::fclose(stream);
        ::unsetenv("TERM");
    }

    /// Since it was asked for last; a terminal shows what is written to it when it comes to it.
    std::string shown()
    {
        std::fputc('|', stream);
        std::fflush(stream);
        std::string text;
        for (char each = 0; ::read(m_screen.get(), &each, 1) == 1 && each != '|';)
            text += each;
        return text;
    }

    static constexpr const char* kEmptyLine = "\r\033[K";

    std::FILE* stream = nullptr;
    posix::FileDescriptor m_screen;
};

TEST_F(OnATerminal, AProgressBarIsDrawnWhenItChangesAndTakenAwayInTheEnd)
{
    open(33);
    {
        host::ProgressBar bar("Work", stream);
        EXPECT_EQ(shown(), "");
        bar.show(0.5);
        EXPECT_EQ(shown(), kEmptyLine + host::progressLine("Work", 0.5, 33));
        bar.show(0.501);
        EXPECT_EQ(shown(), "") << "it looks the same";
        bar.show(0.51);
        EXPECT_EQ(shown(), kEmptyLine + host::progressLine("Work", 0.51, 33));
        bar.clear();
        EXPECT_EQ(shown(), kEmptyLine);
        bar.clear();
        EXPECT_EQ(shown(), "") << "there is nothing to take away";
        bar.show(0.51);
        EXPECT_EQ(shown(), kEmptyLine + host::progressLine("Work", 0.51, 33)) << "it was taken away";
    }
    EXPECT_EQ(shown(), kEmptyLine);
}

TEST_F(OnATerminal, AProgressBarIsAsWideAsTheTerminalOrAsMostAre)
{
    open(1);
    host::ProgressBar("Work", stream).show(0);
    EXPECT_EQ(shown(), kEmptyLine + host::progressLine("Work", 0, 1) + kEmptyLine);
    const winsize unknown = {};
    ASSERT_EQ(::ioctl(m_screen.get(), TIOCSWINSZ, &unknown), 0);
    host::ProgressBar("Work", stream).show(0);
    EXPECT_EQ(shown(), kEmptyLine + host::progressLine("Work", 0, 80) + kEmptyLine);
}

TEST_F(OnATerminal, AProgressBarIsNotDrawnWhereLinesCannotBeTakenAway)
{
    open(33, "dumb");
    host::ProgressBar("Work", stream).show(0.5);
    EXPECT_EQ(shown(), "");
}

} // namespace
