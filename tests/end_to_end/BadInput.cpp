// Files that are no movies, or no longer: refused in one line, or shown as far as they go. Never a crash, never a loss.
#include "end_to_end/Machine.h"
#include "support/CaseName.h"
#include "support/WithoutPrivileges.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <ostream>
#include <sys/stat.h>
#include <utility>

using namespace tests;
using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

namespace {

class BadInput : public testing::Test {
protected:
    /// One line that names the file, and no editor.
    void expectRefused(const std::filesystem::path& file)
    {
        const auto end = m_machine.open(file);
        EXPECT_TRUE(end.inTime);
        EXPECT_EQ(end.exitStatus, 2);
        EXPECT_THAT(end.out, IsEmpty());
        EXPECT_THAT(end.err, AllOf(StartsWith("clipsa: "), HasSubstr(file.native())));
        EXPECT_EQ(std::count(end.err.begin(), end.err.end(), '\n'), 1) << end.err;
        EXPECT_THAT(m_machine.remains(), IsEmpty());
    }

    Machine m_machine;
};

class BrokenMovie : public testing::TestWithParam<const char*> {
protected:
    Machine m_machine;
};

} // namespace

TEST_F(BadInput, AMovieThatIsNotThereIsRefused)
{
    expectRefused(m_machine.home() / "missing.mp4");
}

TEST_F(BadInput, ADirectoryIsRefused)
{
    expectRefused(m_machine.home());
    EXPECT_TRUE(std::filesystem::exists(m_machine.home()));
}

TEST_F(BadInput, WithoutADisplayThePersonReadsWhatIsMissing)
{
    const auto movie = m_machine.movie("clock.mp4");
    m_machine.set("QT_QPA_PLATFORM", "xcb");
    for (const auto& [display, words] :
         {std::pair{"", "there is no display to open a window on; start Clipsa in a graphical session\n"},
          std::pair{":987", "no window can be opened on the display :987; is it running"}}) {
        m_machine.set("DISPLAY", display);
        const auto end = m_machine.open(movie);
        EXPECT_EQ(end.exitStatus, 3);
        EXPECT_THAT(end.err, AllOf(StartsWith(std::string("clipsa-editor: ") + words), HasSubstr("is untouched: ")));
        EXPECT_EQ(std::count(end.err.begin(), end.err.end(), '\n'), 2) << end.err;
        EXPECT_THAT(m_machine.remains(), IsEmpty());
    }
}

TEST_F(BadInput, AnEmptyFileIsRefused)
{
    const auto file = m_machine.movie("empty.mp4");
    expectRefused(file);
    EXPECT_TRUE(std::filesystem::exists(file));
}

TEST_F(BadInput, AFileThatMayNotBeReadIsRefused)
{
    const tests::WithoutPrivileges here;
    const auto file = m_machine.movie("clock.mp4");
    ::chmod(file.c_str(), 0);
    expectRefused(file);
}

TEST_F(BadInput, APipeIsRefusedAndNotWaitedFor)
{
    const auto pipe = m_machine.home() / "pipe.mp4";
    ASSERT_EQ(::mkfifo(pipe.c_str(), S_IRUSR | S_IWUSR), 0);
    expectRefused(pipe);
}

TEST_F(BadInput, ALinkToNowhereIsRefused)
{
    const auto link = m_machine.home() / "link.mp4";
    std::filesystem::create_symlink("nowhere", link);
    expectRefused(link);
    EXPECT_TRUE(std::filesystem::is_symlink(link));
}

TEST_F(BadInput, AFileThatIsNoMovieOpensNoWindow)
{
    // Whoever gets a window presses its buttons.
    m_machine.setScript("tap Save");
    for (const char* name : {"not-a-movie.mp4", "no-moov.mp4"}) {
        const auto movie = m_machine.movie(name);
        const std::string bytes = PrivateDirectory::read(movie);
        const auto end = m_machine.open(movie);
        EXPECT_TRUE(end.inTime);
        EXPECT_EQ(end.exitStatus, 2);
        EXPECT_THAT(end.out, IsEmpty());
        EXPECT_THAT(end.err, HasSubstr("“" + std::string(name) + "”"));
        EXPECT_EQ(std::count(end.err.begin(), end.err.end(), '\n'), 1) << end.err;
        EXPECT_FALSE(std::filesystem::exists(m_machine.home() / "Videos"));
        EXPECT_EQ(PrivateDirectory::read(movie), bytes);
        EXPECT_THAT(m_machine.remains(), IsEmpty());
    }
}

TEST_P(BrokenMovie, OpensInAnEditorThatStaysUsable)
{
    const auto movie = m_machine.movie(GetParam());
    const std::string bytes = PrivateDirectory::read(movie);
    m_machine.keepReport();
    m_machine.setScript(R"(
        wait ready
        print {duration}
        key space
        key space
        key right
        key end
        key home
        size 844 390
        size 390 760
        picture broken.png
        print still here
        tap 195 100
        wait shown
        tap Cancel)");
    const auto end = m_machine.open(movie, {"--device", "phone"});

    EXPECT_TRUE(end.inTime);
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(end.out, IsEmpty());
    EXPECT_EQ(m_machine.report().size(), 2U);
    EXPECT_EQ(PrivateDirectory::read(movie), bytes);
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(EndToEnd, BrokenMovie,
                         testing::Values("audio-only.m4a", "truncated.mp4", "corrupt.mp4", "one-frame.mp4",
                                         "size-change.ts"),
                         [](const auto& broken) { return caseName(broken.param); });
