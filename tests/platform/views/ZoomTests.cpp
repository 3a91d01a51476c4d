// A handle that is held still spreads the moments around it over the strip.
#include "TrimFixture.h"

namespace {

using platform::ScrubberHandle;
using testing::IsEmpty;
using tests::kZoomDelay;

struct Zooming : tests::Trims {};

TEST_F(Zooming, AHandleHeldStillSpreadsTheSecondsAroundItOverTheStrip)
{
    down(18);
    move(118);
    machine.advance(kZoomDelay - std::chrono::milliseconds(1));
    EXPECT_FALSE(scrubber->isZoomed());
    machine.advance(std::chrono::milliseconds(1));
    ASSERT_TRUE(scrubber->isZoomed());
    EXPECT_EQ(scrubber->editingStartValue(), 10);
    EXPECT_EQ(startX(), 126) << "it stays under the finger";
    said();
    // Four seconds over 300 points: 75 points a second.
    move(118 + 75);
    EXPECT_DOUBLE_EQ(scrubber->editingStartValue(), 11);
    move(118 + 75 + 1.25);
    EXPECT_NEAR(scrubber->editingStartValue(), 11 + 1.0 / 60, 1e-9) << "one picture of sixty a second";
    up(118 + 75 + 1.25);
    EXPECT_FALSE(scrubber->isZoomed());
    EXPECT_NEAR(scrubber->editingStartValue(), 11 + 1.0 / 60, 1e-9);
    EXPECT_NEAR(startX(), 26 + 10 * (11 + 1.0 / 60), 1e-6);
}

TEST_F(Zooming, AFingerThatMovesOnIsNotStill)
{
    down(18);
    machine.advance(std::chrono::milliseconds(400));
    move(30);
    machine.advance(std::chrono::milliseconds(400));
    EXPECT_FALSE(scrubber->isZoomed());
    move(32);
    machine.advance(std::chrono::milliseconds(100));
    EXPECT_TRUE(scrubber->isZoomed()) << "rolling a little is still";
}

TEST_F(Zooming, AFingerThatHasLeftNeverZooms)
{
    down(18);
    up(18);
    down(160);
    machine.advance(kZoomDelay);
    EXPECT_FALSE(scrubber->isZoomed());
    up(160);
    down(18);
    up(18);
    down(18);
    machine.advance(std::chrono::milliseconds(499));
    EXPECT_FALSE(scrubber->isZoomed());
}

TEST_F(Zooming, ADelayOfZeroMeansNever)
{
    scrubber->setZoomDelay(0);
    down(18);
    machine.advance(std::chrono::seconds(5));
    EXPECT_FALSE(scrubber->isZoomed());
}

TEST_F(Zooming, TheEndsOfTheMovieStayInsideTheZoomedStrip)
{
    down(18);
    machine.advance(kZoomDelay);
    EXPECT_EQ(startX(), 26);
    EXPECT_EQ(scrubber->timestamps().front(), 0);
    move(0);
    EXPECT_EQ(scrubber->editingStartValue(), 0);
    up(0);
    down(334);
    machine.advance(kZoomDelay);
    EXPECT_EQ(endX(), 326);
    EXPECT_EQ(scrubber->timestamps().front(), 26);
}

TEST_F(Zooming, AShortMovieIsZoomedToAQuarter)
{
    movie->duration = 8;
    scrubber->reloadData();
    down(18);
    machine.advance(kZoomDelay);
    move(18 + 300);
    EXPECT_NEAR(scrubber->editingStartValue(), 2, 1e-9);
}

TEST_F(Zooming, TheOtherHandleIsJustOutOfSightWhileZoomed)
{
    movie->duration = 3600 * 24;
    scrubber->reloadData();
    down(18);
    machine.advance(kZoomDelay);
    EXPECT_GT(endX(), 352);
    EXPECT_LT(scrubber->trimFrame()->frame().width(), 1000) << "not as wide as a day at this scale";
}

TEST_F(Zooming, ThePicturesOfTheZoomedMomentsAreAskedForAndTheOthersKept)
{
    const auto overview = scrubber->timestamps();
    for (const double timestamp : overview)
        scrubber->setThumbnailImage_forTimestamp(picture(), timestamp);
    down(18);
    move(118);
    machine.advance(kZoomDelay);
    const auto zoomed = scrubber->timestamps();
    EXPECT_EQ(zoomed.size(), overview.size());
    EXPECT_NEAR(zoomed.front(), 10 - 4.0 / 3, 1e-9);
    EXPECT_EQ(movie->requested, zoomed);
    scrubber->setThumbnailImage_forTimestamp(picture(), zoomed[3]);
    EXPECT_EQ(scrubber->thumbnails().size(), overview.size() + 1);
    movie->requested.clear();
    up(118);
    EXPECT_EQ(scrubber->timestamps(), overview);
    EXPECT_THAT(movie->requested, IsEmpty());
    EXPECT_EQ(scrubber->thumbnails().size(), overview.size());
}

TEST_F(Zooming, AReloadLetsGoOfAHandleAndKeepsTheRange)
{
    down(18);
    move(118);
    machine.advance(kZoomDelay);
    scrubber->reloadData();
    EXPECT_FALSE(scrubber->isZoomed());
    EXPECT_EQ(scrubber->held(), ScrubberHandle::None);
    EXPECT_EQ(scrubber->editingStartValue(), 10);
    EXPECT_TRUE(scrubber->isEditing());
    move(218);
    EXPECT_EQ(scrubber->editingStartValue(), 10);
}

} // namespace
