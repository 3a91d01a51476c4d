// The whole main job with the real processes: a recording is opened, cut and saved, and the recorder hears of it.
#include "end_to_end/Machine.h"
#include "end_to_end/SavedMovie.h"
#include "support/ProcessorTime.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <csignal>
#include <fstream>
#include <numeric>
#include <sys/stat.h>

using namespace tests;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;

namespace {

class Save : public testing::Test {
protected:
    Save() : m_movie(m_machine.movie("clock.mp4")), m_bytes(PrivateDirectory::read(m_movie)) {}
    void TearDown() override
    {
        EXPECT_EQ(PrivateDirectory::read(m_movie), m_bytes) << "the user's own file";
        struct stat status = {};
        ASSERT_EQ(::stat(m_movie.c_str(), &status), 0);
        EXPECT_EQ(status.st_nlink, 1u);
        EXPECT_THAT(m_machine.remains(), IsEmpty());
    }

    void setScript(const std::string& steps) { m_machine.setScript("wait picture\nwait ready\n" + steps); }
    Child::End open() { return m_machine.open(m_movie, {"--app-name", "Tux Racer"}); }
    std::filesystem::path library() const { return m_machine.home() / "Videos"; }
    std::vector<std::filesystem::path> saved() const { return filesIn(library()); }
    std::vector<std::filesystem::path> unsaved() const
    {
        return filesIn(m_machine.home() / ".local/share/clipsa/unsaved");
    }
    static std::vector<std::filesystem::path> filesIn(const std::filesystem::path& directory)
    {
        std::vector<std::filesystem::path> found;
        if (std::filesystem::is_directory(directory))
            for (const auto& entry : std::filesystem::directory_iterator(directory))
                found.push_back(entry.path());
        return found;
    }
    void expectMixed(const std::filesystem::path& movie)
    {
        const auto mixed = samplesIn(movie, 0);
        EXPECT_NEAR(levelOf(mixed, 440), levelOf(samplesIn(m_movie, 0), 440), 0.2) << "the app";
        EXPECT_NEAR(levelOf(mixed, 880), levelOf(samplesIn(m_movie, 1), 880), 0.2) << "the microphone";
        EXPECT_LT(levelOf(mixed, 660), -50);
        EXPECT_THAT(samplesIn(movie, 1), IsEmpty()) << "one track";
    }
    static std::vector<int> numbers(int first, int last)
    {
        std::vector<int> all(static_cast<std::size_t>(last - first + 1));
        std::iota(all.begin(), all.end(), first);
        return all;
    }

    Machine m_machine;
    const std::filesystem::path m_movie;
    const std::string m_bytes;
};

} // namespace

TEST_F(Save, PutsTheMovieIntoTheUsersVideosWithAllItsSoundMixed)
{
    setScript("tap Save");
    const auto end = open();
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_EQ(end.out, "SaveToCameraRoll\n");
    EXPECT_THAT(end.err, IsEmpty());

    ASSERT_THAT(saved(), SizeIs(1));
    const auto movie = saved().front();
    EXPECT_EQ(movie.filename(), "Tux Racer 2024-05-17 09-30-00.mp4");
    EXPECT_EQ(numbersIn(movie), numbers(0, 119));
    expectMixed(movie);
    struct stat status = {};
    ASSERT_EQ(::stat(movie.c_str(), &status), 0);
    EXPECT_EQ(status.st_mtim.tv_sec, 1715938200) << "the recording's date";
}

TEST_F(Save, SavesWhatWasCutAndTellsTheTrimAndTheSave)
{
    m_machine.keepReport();
    setScript(R"(
        key right
        wait frame 1
        key i
        print {range}
        key return
        wait trimmed
        wait frame 0
        print {duration}
        tap Save)");
    const auto end = open();
    EXPECT_EQ(end.out, "SaveToCameraRoll\nSaveToCameraRoll\n");
    EXPECT_THAT(m_machine.report(), ElementsAre("1.000-4.000", "3.000"));
    ASSERT_THAT(saved(), SizeIs(1));
    EXPECT_EQ(numbersIn(saved().front()), numbers(30, 119));
    expectMixed(saved().front());
}

TEST_F(Save, ASecondMovieOfTheSameNameTakesThePlaceOfNone)
{
    setScript("tap Save");
    open();
    open();
    ASSERT_THAT(saved(), SizeIs(2));
    for (const auto& movie : saved())
        EXPECT_EQ(numbersIn(movie), numbers(0, 119)) << movie;
}

TEST_F(Save, IsFinishedWhenTheUserClosesMeanwhile)
{
    setScript("tap Save\ntap Cancel");
    const auto end = open();
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_EQ(end.out, "SaveToCameraRoll\n");
    ASSERT_THAT(saved(), SizeIs(1));
    EXPECT_EQ(numbersIn(saved().front()), numbers(0, 119));
}

TEST_F(Save, IsFinishedWhenTheHostIsKilledMeanwhile)
{
    setScript("tap Save\nprint saving");
    auto host = m_machine.start({"open", m_movie, "--app-name", "Tux Racer"});
    ASSERT_TRUE(host.waitForText("saving\n"));
    const auto editors = m_machine.processes("clipsa-editor");
    host.signal(SIGKILL);
    host.wait();
    for (const pid_t editor : editors)
        EXPECT_TRUE(waitForEnd(editor, Child::kDeadline));
    ASSERT_THAT(saved(), SizeIs(1));
    EXPECT_EQ(numbersIn(saved().front()), numbers(0, 119));
    // The next one sweeps up what the dead host has left.
    setScript("tap Cancel");
    open();
}

// The moments are spread over the whole work of saving: from the tap to the end of the editor.
TEST_F(Save, LeavesTheWholeMovieOrNothingWheneverTheEditorIsKilled)
{
    constexpr int kMoments = 24;
    setScript("print saving\ntap Save");
    const Machine::Words open = {"open", m_movie, "--app-name", "Tux Racer"};
    auto first = m_machine.start(open);
    ASSERT_TRUE(first.waitForText("saving\n"));
    const auto editors = m_machine.processes("clipsa-editor");
    ASSERT_THAT(editors, SizeIs(1));
    const auto begin = processorTimeOf(editors.front()).value_or(ProcessorTime(0));
    const auto whole = waitForWork(editors.front()) - begin;
    ASSERT_EQ(first.wait().exitStatus, 0);
    ASSERT_THAT(saved(), SizeIs(1));
    const std::string wanted = PrivateDirectory::read(saved().front());

    int found = 0;
    for (int i = 0; i < kMoments; ++i) {
        SCOPED_TRACE("kill " + std::to_string(i));
        std::filesystem::remove_all(library());
        auto host = m_machine.start(open);
        ASSERT_TRUE(host.waitForText("saving\n"));
        for (const pid_t editor : m_machine.processes("clipsa-editor")) {
            waitForWork(editor, processorTimeOf(editor).value_or(ProcessorTime(0)) + whole * i / kMoments);
            ::kill(editor, SIGKILL);
        }
        const auto end = host.wait();
        const auto movies = saved();
        if (!movies.empty()) {
            ASSERT_THAT(movies, SizeIs(1));
            ASSERT_TRUE(PrivateDirectory::read(movies.front()) == wanted) << "not whole";
            ++found;
        } else {
            EXPECT_NE(end.exitStatus, 0) << "the recorder was told of a save";
        }
        ASSERT_TRUE(PrivateDirectory::read(m_movie) == m_bytes) << "the user's own file";
    }
    EXPECT_LT(found, kMoments);
}

TEST_F(Save, ALibraryThatCannotBeWrittenIsSaidAndTheMovieIsKeptElsewhere)
{
    std::ofstream(library()) << "not a directory";
    setScript("tap Save");
    const auto end = open();
    EXPECT_EQ(end.exitStatus, 1);
    EXPECT_EQ(end.out, "SaveToCameraRoll\n");
    EXPECT_THAT(end.err, HasSubstr("Error writing video to camera roll: "));
    EXPECT_THAT(end.err, HasSubstr(library().native()));
    EXPECT_EQ(std::count(end.err.begin(), end.err.end(), '\n'), 3)
        << "one line of the editor's words, one of the host's: " << end.err;
    EXPECT_EQ(PrivateDirectory::read(library()), "not a directory");
    ASSERT_THAT(unsaved(), SizeIs(1));
    EXPECT_THAT(end.err, HasSubstr("it is kept as " + unsaved().front().native()));
    EXPECT_EQ(numbersIn(unsaved().front()), numbers(0, 119));
    expectMixed(unsaved().front());
}

TEST_F(Save, ThatFailsLosesNoCutAlsoWhenTheUserHasClosedMeanwhile)
{
    std::ofstream(library()) << "not a directory";
    setScript(R"(
        key right
        wait frame 1
        key i
        key return
        wait trimmed
        wait frame 0
        tap Save
        tap Done)");
    const auto end = m_machine.open(m_movie, {"--app-name", "Tux Racer", "--json"});
    EXPECT_EQ(end.exitStatus, 1);
    ASSERT_THAT(unsaved(), SizeIs(1));
    EXPECT_EQ(unsaved().front().filename(), "Tux Racer 2024-05-17 09-30-00.mp4");
    EXPECT_THAT(end.out, HasSubstr("\"unsaved\":[\"" + unsaved().front().native() + "\"]"));
    EXPECT_EQ(numbersIn(unsaved().front()), numbers(30, 119));
}

TEST_F(Save, IsToldWithItsPlace)
{
    setScript("tap Save");
    const auto end = m_machine.open(m_movie, {"--json"});
    ASSERT_THAT(saved(), SizeIs(1));
    EXPECT_THAT(end.out, HasSubstr("\"saved\":[\"" + saved().front().native() + "\"],\"unsaved\":[]"));
}

TEST_F(Save, ThatFailsIsKeptBesideTheStoreWhereTheUsersDataCannotBeWritten)
{
    std::ofstream(library()) << "not a directory";
    m_machine.write("home/.local", "not a directory");
    setScript("tap Save");
    const auto end = open();
    EXPECT_EQ(end.exitStatus, 1);
    const auto beside = m_machine.home().parent_path() / "cache/clipsa/unsaved";
    ASSERT_THAT(filesIn(beside), SizeIs(1));
    EXPECT_THAT(end.err, HasSubstr("it is kept as " + filesIn(beside).front().native()));
    EXPECT_EQ(numbersIn(filesIn(beside).front()), numbers(0, 119));
    EXPECT_THAT(m_machine.editorDirectories(), ElementsAre(beside)) << "what sweeps the store leaves it alone";
    std::filesystem::remove_all(beside);
}

TEST_F(Save, ADamagedMovieIsSavedToo)
{
    const auto movie = m_machine.movie("corrupt.mp4");
    setScript("tap Save");
    const auto end = m_machine.open(movie);
    EXPECT_EQ(end.out, "SaveToCameraRoll\n");
    ASSERT_THAT(saved(), SizeIs(1));
    EXPECT_GT(std::filesystem::file_size(saved().front()), 10'000u);
}
