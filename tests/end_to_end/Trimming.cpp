// A handle is dragged, the cut confirmed, and the cut movie shown: the whole editor with the real engine.
#include "end_to_end/Machine.h"
#include "end_to_end/Screenshot.h"

#include <gmock/gmock.h>

using namespace tests;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

/// An upright phone of 390 by 760 points: the strip's middle is at 697, and its track goes from 26 to 364. groups.mp4
/// lasts 8 seconds at 30 pictures a second, so that a second is 42.25 points.
class Trim : public testing::Test {
protected:
    Trim()
    {
        m_machine.setScale(2);
        m_machine.keepReport();
    }
    Child::End open(const std::string& script)
    {
        m_machine.setScript("size 390 760\nwait picture\nwait ready\n" + script);
        auto end = m_machine.open(m_machine.movie("groups.mp4"), {"--device", "phone", "--home-button", "yes"});
        EXPECT_EQ(end.exitStatus, 0) << end.err;
        return end;
    }
    int numberIn(const std::string& picture) const
    {
        const Screenshot screen(m_machine.picture(picture));
        EXPECT_FALSE(screen.isNull()) << picture;
        return screen.isNull() ? -1 : screen.number({640, 360});
    }

    Machine m_machine;
};

} // namespace

TEST_F(Trim, CutsToTheRangeThatTheHandlesSay)
{
    // From 2 seconds, and as long as the end says: 3.
    const auto end = open(R"(
        hold 18 697 102.5 697
        wait trimming
        wait frame 2
        picture start.png
        lift
        drag 372 697 160.75 697
        print {range} {duration}
        tap Done
        wait trimmed
        wait frame 0
        print {duration} {layout}
        tap 195 125
        wait hidden
        picture first.png
        key end
        wait frame 2.95
        picture last.png
        tap 195 125
        wait shown
        tap Done)");
    EXPECT_THAT(m_machine.report(), ElementsAre("2.000-3.000 8.000", "3.000 phone"));
    EXPECT_EQ(numberIn("start.png"), 60) << "the picture at the handle";
    EXPECT_EQ(numberIn("first.png"), 60);
    EXPECT_EQ(numberIn("last.png"), 149);
    EXPECT_THAT(end.out, HasSubstr("SaveToCameraRoll"));
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Trim, CutsWhatWasCutAlthoughItsFileIsRemovedAtTheStart)
{
    // The names of the files have the second in them.
    const auto end = open(R"(
        key right
        wait frame 1
        key i
        print {range}
        key return
        wait trimmed
        wait frame 0
        print {duration}
        later 1
        key right
        key right
        wait frame 2
        key i
        key return
        wait trimmed
        wait frame 0
        print {duration}
        tap 195 125
        wait hidden
        picture first.png
        tap 195 125
        wait shown
        tap Done)");
    EXPECT_THAT(m_machine.report(), ElementsAre("1.000-8.000", "7.000", "5.000"));
    EXPECT_EQ(numberIn("first.png"), 90);
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Trim, LeavesTheMovieAsItWasWhenItIsCancelled)
{
    for (const char* cancel : {"key undo", "tap Cancel", "key escape"}) {
        SCOPED_TRACE(cancel);
        const auto end = open(std::string(R"(
            drag 18 697 102.5 697
            wait trimming
            wait frame 2
            )") + cancel + R"(
            wait trimmed
            key home
            wait frame
            print {duration}
            picture first.png
            tap Done)");
        EXPECT_EQ(m_machine.report().back(), "8.000");
        EXPECT_EQ(numberIn("first.png"), 0);
        EXPECT_THAT(end.out, testing::Not(HasSubstr("SaveToCameraRoll")));
    }
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Trim, ShowsTheMoviesOwnPicturesInItsStrip)
{
    open(R"(
        wait thumbnails
        picture strip.png
        tap Cancel)");
    const Screenshot screen(m_machine.picture("strip.png"));
    // The movie's ground at its left, which every picture in the strip has there: the strip's own ground is grey.
    int blue = 0;
    for (int x = 2 * 26; x < 2 * 364; ++x) {
        const QColor colour = screen.at(x, 2 * 700);
        blue += colour.blue() > colour.red() + 30 ? 1 : 0;
    }
    EXPECT_GT(blue, 50);
}
