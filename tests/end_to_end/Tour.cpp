// The guided tour, for those who have no screen.
#include "end_to_end/Machine.h"
#include "end_to_end/Screenshot.h"

#include <gmock/gmock.h>

using namespace tests;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

namespace {

class Tour : public testing::Test {
protected:
    Tour()
    {
        // The tour brings what it needs.
        m_machine.set("QT_QPA_PLATFORM", "xcb");
        m_machine.set("XDG_RUNTIME_DIR", m_machine.home() / "nowhere");
    }
    Child::End take(const std::filesystem::path& movie, const Machine::Words& options = {})
    {
        Machine::Words words = {"tour", movie};
        words.insert(words.end(), options.begin(), options.end());
        return m_machine.run(words);
    }

    Machine m_machine;
    const std::filesystem::path m_output = m_machine.home() / "new/pictures";
};

} // namespace

TEST_F(Tour, LeavesAPictureOfEachStepAndSaysWhatItSaw)
{
    const auto movie = m_machine.movie("clock.mp4");
    const auto end = take(movie, {"--output", m_output, "--app-name", "Notes"});
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(end.err, IsEmpty());
    for (const char* text : {movie.c_str(), m_output.c_str(), "Notes", "640x360", "4.000 seconds", "has finished"})
        EXPECT_THAT(end.out, HasSubstr(text));

    int count = 0;
    for (const auto& file : std::filesystem::directory_iterator(m_output)) {
        if (file.path().extension() != ".png")
            continue;
        ++count;
        EXPECT_THAT(end.out, HasSubstr(file.path().filename().native()));
        EXPECT_FALSE(Screenshot(file.path()).isNull());
    }
    EXPECT_GE(count, 7);
    EXPECT_EQ(Screenshot(m_output / "1-upright.png").image(), Screenshot(m_output / "3-upright-again.png").image());
    EXPECT_EQ(Screenshot(m_output / "1-upright.png").image(), Screenshot(m_output / "5-chrome-shown.png").image());
    EXPECT_NE(Screenshot(m_output / "1-upright.png").image(), Screenshot(m_output / "4-chrome-hidden.png").image());
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Tour, FailsWhenThereIsNothingToSee)
{
    const auto end = take(m_machine.movie("not-a-movie.mp4"), {"--output", m_output});
    EXPECT_TRUE(end.inTime);
    EXPECT_EQ(end.exitStatus, 2);
    EXPECT_THAT(end.out, IsEmpty()) << "a summary of nothing";
    EXPECT_THAT(end.err, Not(IsEmpty()));
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Tour, GoesThroughMoviesThatAreShortStandStillOrBeginLate)
{
    for (const char* name : {"non-square.mp4", "still.mp4", "start-offset.mp4"}) {
        const auto end = take(m_machine.movie(name), {"--output", m_output});
        EXPECT_EQ(end.exitStatus, 0) << name << ": " << end.err;
        EXPECT_THAT(end.out, HasSubstr("12-trimmed.png"));
        EXPECT_THAT(end.out, HasSubstr("has finished"));
    }
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Tour, SaysThatThereAreNoPicturesToShow)
{
    const auto movie = m_machine.home() / "red\x1b[31m.m4a";
    std::filesystem::rename(m_machine.movie("audio-only.m4a"), movie);
    const auto end = take(movie, {"--output", m_output});
    EXPECT_TRUE(end.inTime);
    EXPECT_EQ(end.exitStatus, 3);
    EXPECT_THAT(end.err, HasSubstr("the movie has no pictures to show, only sound"));
    EXPECT_THAT(end.out, HasSubstr("red?[31m.m4a\n")) << "nothing for the terminal to obey";
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Tour, FindsAPlaceForItsSocketWhereHomeHasALongName)
{
    m_machine.set("XDG_CACHE_HOME", m_machine.home() / std::string(150, 'x'));
    const auto end = take(m_machine.movie("clock.mp4"), {"--output", m_output});
    EXPECT_EQ(end.exitStatus, 0) << end.err;
}

TEST_F(Tour, NeedsAPlaceForItsPictures)
{
    const auto movie = m_machine.movie("clock.mp4");
    EXPECT_EQ(take(movie).exitStatus, 2);
    EXPECT_EQ(take(movie, {"--output", m_machine.write("home/file", "text")}).exitStatus, 2);
    EXPECT_EQ(PrivateDirectory::read(m_machine.home() / "file"), "text");
}
