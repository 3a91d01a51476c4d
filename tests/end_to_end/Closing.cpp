// The way in and out of the editor: what it says the movie is, what the host prints, what is left behind.
#include "end_to_end/Machine.h"

#include <gmock/gmock.h>

#include <sys/stat.h>

using namespace tests;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

class Closing : public testing::Test {
protected:
    Machine m_machine;
};

struct FileState {
    std::string bytes;
    timespec modified{};
    nlink_t names = 0;

    explicit FileState(const std::filesystem::path& path) : bytes(PrivateDirectory::read(path))
    {
        struct stat status = {};
        ::stat(path.c_str(), &status);
        modified = status.st_mtim;
        names = status.st_nlink;
    }
    bool operator==(const FileState& other) const
    {
        return bytes == other.bytes && modified.tv_sec == other.modified.tv_sec
               && modified.tv_nsec == other.modified.tv_nsec && names == other.names;
    }
};

constexpr const char* kClose = "wait picture\nwait ready\ntap Cancel";

} // namespace

TEST_F(Closing, TheCloseItemEndsTheEditorAndLeavesTheRecordingAndTheMachineAsTheyWere)
{
    const auto movie = m_machine.movie("clock.mp4");
    const FileState before(movie);
    m_machine.setScript(kClose);

    const auto end = m_machine.open(movie);

    EXPECT_TRUE(end.inTime);
    EXPECT_EQ(end.exitStatus, 0);
    EXPECT_THAT(end.out, IsEmpty()); // no activity, no line
    EXPECT_THAT(end.err, IsEmpty());
    EXPECT_THAT(m_machine.remains(), IsEmpty());
    EXPECT_TRUE(FileState(movie) == before);
}

TEST_F(Closing, InJsonTheListOfActivitiesIsEmptyToo)
{
    const auto movie = m_machine.movie("clock.mp4");
    m_machine.setScript(kClose);
    const auto end = m_machine.open(movie, {"--json"});
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_EQ(end.out, "{\"activityTypes\":[],\"movie\":\"" + movie.native()
                           + "\",\"saved\":[],\"unsaved\":[],\"results\":[]}\n");
}

TEST_F(Closing, OnRequestTheEditorSaysWhatItDoes)
{
    m_machine.setScript(kClose);
    const auto end = m_machine.open(m_machine.movie("clock.mp4"), {"--verbose"});
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(end.err, HasSubstr("clipsa: VKVideoEditorExtensionViewController -setupChildViewControllers\n"));
    EXPECT_THAT(end.out, IsEmpty());
}

TEST_F(Closing, TheEscapeKeyClosesToo)
{
    m_machine.setScript("wait ready\nkey escape");
    const auto end = m_machine.open(m_machine.movie("clock.mp4"));
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Closing, TheUserCanCloseBeforeAnythingIsLoaded)
{
    m_machine.setScript("tap Cancel");
    const auto end = m_machine.open(m_machine.movie("long-gop.mp4"));
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Closing, ATrimThatIsUnderWayIsGivenUp)
{
    // All of it would be encoded again.
    m_machine.setScript("wait ready\nwait frame\nkey right\nkey i\nkey return\nclose");
    const auto end = m_machine.open(m_machine.movie("long-gop.mp4"));
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_EQ(end.out, "SaveToCameraRoll\n");
    EXPECT_THAT(end.err, HasSubstr("VQVideoEditorViewController: Export Trim Video Cancelled\n"));
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Closing, TheUserCanCloseWhileTheMovieIsPlaying)
{
    m_machine.keepReport();
    m_machine.setScript(R"(
        wait ready
        print {chrome}
        key space
        wait hidden
        wait frame 0.1
        print {chrome}
        key escape)");
    const auto end = m_machine.open(m_machine.movie("clock.mp4"));
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(m_machine.report(), ElementsAre("shown", "hidden"));
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Closing, TheTitleIsTheAppAndTheDateWhenItWasRecorded)
{
    m_machine.keepReport();
    m_machine.setScript("wait ready\nprint {title}\nprint {date}\nprint {size} {duration}\ntap Cancel");
    m_machine.open(m_machine.movie("clock.mp4"), {"--app-name", "Träumerei 日本"});
    ASSERT_EQ(m_machine.report().size(), 3U);
    EXPECT_EQ(m_machine.report()[0], "Träumerei 日本");
    EXPECT_THAT(m_machine.report()[1], HasSubstr("May 17 09:30 AM"));
    EXPECT_EQ(m_machine.report()[2], "640x360 4.000");
}

TEST_F(Closing, WithoutAnAppsNameTheTitleIsTheFiles)
{
    m_machine.keepReport();
    m_machine.setScript("wait ready\nprint {title}\ntap Cancel");
    m_machine.open(m_machine.movie("clock.mp4"));
    EXPECT_THAT(m_machine.report(), ElementsAre("clock"));
}
