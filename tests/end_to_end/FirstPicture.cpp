// What is on the screen is what is in the movie: the right picture, the right way up, at the right place and time, in
// the right colours.
#include "end_to_end/Machine.h"
#include "end_to_end/Screenshot.h"
#include "support/CaseName.h"

#include <gmock/gmock.h>

#include <cmath>
#include <ostream>

using namespace tests;
using testing::SizeIs;

namespace {

struct Shown {
    const char* movie;
    Coded coded;
    double rate;      ///< squares' number a second of the movie's time line…
    double start;     ///< …which begins then
    int distance = 4; ///< of colours

    friend std::ostream& operator<<(std::ostream& stream, const Shown& shown) { return stream << shown.movie; }
};

class TheFirstPicture : public testing::TestWithParam<Shown> {
protected:
    Machine m_machine;
};

/// A place in every clock movie that no digit or square covers, and its colour.
QColor backgroundAt(const Screenshot& picture, const Coded& coded)
{
    return picture.at(coded, coded.width * 0.16, coded.height * 0.75);
}
const QColor kBackground(37, 64, 94);

} // namespace

TEST_P(TheFirstPicture, IsTheMoviesAndOthersFollowWhenTheUserMovesOn)
{
    const Shown& shown = GetParam();
    m_machine.setScale(2);
    m_machine.keepReport();
    m_machine.setScript(R"(
        size 390 760
        wait picture
        picture first.png
        wait ready
        print {frame}
        tap 195 100
        wait hidden
        picture start.png
        key right
        key right
        wait frame 1.7
        print {frame}
        picture later.png
        key escape)");

    const auto end = m_machine.open(m_machine.movie(shown.movie), {"--device", "phone"});

    ASSERT_EQ(end.exitStatus, 0) << end.err;
    const auto report = m_machine.report();
    ASSERT_THAT(report, SizeIs(2));
    const auto numberAt = [&](const std::string& seconds) {
        return static_cast<int>(std::lround((std::stod(seconds) - shown.start) * shown.rate));
    };

    const Screenshot first(m_machine.picture("first.png"));
    ASSERT_EQ(first.width(), 780);
    ASSERT_EQ(first.height(), 1520);
    EXPECT_TRUE(isNear(backgroundAt(first, shown.coded), kBackground, shown.distance))
        << words(backgroundAt(first, shown.coded));

    const Screenshot start(m_machine.picture("start.png"));
    EXPECT_EQ(start.number(shown.coded), 0);
    EXPECT_EQ(numberAt(report[0]), 0);
    // Black squares are told from no picture at all by what is between them.
    EXPECT_TRUE(isNear(start.at(shown.coded, 4, 4), QColor(63, 63, 63), shown.distance));

    const Screenshot later(m_machine.picture("later.png"));
    EXPECT_EQ(later.number(shown.coded), numberAt(report[1]));
    EXPECT_LE(std::stod(report[1]), 2.001);
}

INSTANTIATE_TEST_SUITE_P(EndToEnd, TheFirstPicture,
                         testing::Values(Shown{"clock.mp4", {640, 360}, 30, 0},
                                         Shown{"portrait.mp4", {360, 640}, 30, 0},
                                         Shown{"rotated.mp4", {640, 360, Turn::Counterclockwise}, 30, 0},
                                         Shown{"rotated-clockwise.mp4", {640, 360, Turn::Clockwise}, 30, 0},
                                         Shown{"vfr.mkv", {640, 360}, 1000, 0}, Shown{"vp9.webm", {640, 360}, 30, 0, 8},
                                         Shown{"start-offset.mp4", {640, 360}, 30, 1.5}),
                         [](const auto& shown) { return caseName(shown.param.movie); });

TEST(TheScreen, ShowsTheColoursThatWereRecorded)
{
    const Coded coded;
    const QColor patches[] = {{255, 0, 0}, {0, 255, 0}, {0, 0, 255}, {255, 255, 255}, {128, 128, 128}, {0, 0, 0}};
    for (const char* movie : {"bars-709.mp4", "bars-601.mp4", "bars-full.mp4"}) {
        SCOPED_TRACE(movie);
        Machine machine;
        machine.setScript(R"(
            size 640 480
            wait picture
            tap 320 80
            wait hidden
            picture patches.png
            key escape)");
        const auto end = machine.open(machine.movie(movie));
        ASSERT_EQ(end.exitStatus, 0) << end.err;
        const Screenshot screen(machine.picture("patches.png"));
        for (int i = 0; i < 6; ++i) {
            const int row = i / 3;
            const QColor colour = screen.at(coded, 106 + 212 * (i % 3), 50 + 260 * row);
            EXPECT_TRUE(isNear(colour, patches[i], 3)) << "patch " << i << " is " << words(colour);
        }
    }
}
