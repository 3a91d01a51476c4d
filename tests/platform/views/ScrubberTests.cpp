#include "ScrubberFixture.h"

namespace {

using base::Rect;
using testing::ElementsAre;
using testing::IsEmpty;
using tests::Scrubbers;

TEST_F(Scrubbers, ThePlayHeadStandsInProportionOnTheTrack)
{
    EXPECT_EQ(scrubber->trackRect(), Rect::make(10, 0, 300, 38));
    EXPECT_EQ(scrubber->playHeadX(), 10);
    scrubber->reloadData();
    scrubber->setValue(15);
    EXPECT_EQ(scrubber->playHeadX(), 160);
    EXPECT_THAT(movie->said, IsEmpty());
}

TEST_F(Scrubbers, TheValueIsLimitedOnceTheDurationIsKnown)
{
    scrubber->setValue(100);
    EXPECT_EQ(scrubber->value(), 100);
    scrubber->reloadData();
    EXPECT_EQ(scrubber->value(), 30);
    scrubber->setValue(-1);
    EXPECT_EQ(scrubber->value(), 0);
    scrubber->setValue(std::nan(""));
    EXPECT_EQ(scrubber->value(), 0);
    EXPECT_THAT(movie->said, IsEmpty());
}

TEST_F(Scrubbers, AFingerAnywhereMovesThePlayHead)
{
    scrubber->reloadData();
    window->touchDown({1, {110, 110}, {}});
    window->touchMove({1, {210, 400}, {}});
    window->touchMove({1, {210, 401}, {}});
    window->touchMove({1, {390, 110}, {}});
    window->touchUp({1, {390, 110}, {}});
    EXPECT_THAT(movie->said, ElementsAre("begin 1", "value 10", "value 20", "value 30", "end 1"));
}

TEST_F(Scrubbers, AThumbThatTakesThePlayHeadMovesItFromWhereItIs)
{
    scrubber->reloadData();
    scrubber->setValue(15);
    const double x = scrubber->playHeadX();
    window->touchDown({1, {x + 20, 110}, {}});
    EXPECT_DOUBLE_EQ(scrubber->value(), 15);
    window->touchMove({1, {x + 30, 110}, {}});
    EXPECT_DOUBLE_EQ(scrubber->value(), 16);
    window->touchUp({1, {x + 30, 110}, {}});
    EXPECT_DOUBLE_EQ(scrubber->value(), 16);
}

TEST_F(Scrubbers, ASecondFingerIsIgnored)
{
    scrubber->reloadData();
    window->touchDown({1, {110, 110}, {}});
    window->touchDown({2, {210, 110}, {}});
    window->touchUp({2, {210, 110}, {}});
    window->touchCancel({1, {110, 110}, {}});
    EXPECT_THAT(movie->said, ElementsAre("begin 1", "value 10", "end 1"));
}

TEST_F(Scrubbers, WithoutADurationDragsAreIgnored)
{
    for (const double duration : {std::nan(""), 0.0, -1.0, HUGE_VAL}) {
        movie->duration = duration;
        scrubber->setValue(7);
        scrubber->reloadData();
        tap(110, 110);
        scrubber->scrubTo(3);
        EXPECT_EQ(scrubber->value(), 7);
        EXPECT_EQ(scrubber->duration(), 0);
        EXPECT_THAT(scrubber->timestamps(), IsEmpty());
    }
    EXPECT_THAT(movie->said, IsEmpty());
}

TEST_F(Scrubbers, ADisabledOneIgnoresDrags)
{
    scrubber->reloadData();
    scrubber->setEnabled(false);
    tap(110, 110);
    EXPECT_THAT(movie->said, IsEmpty());
}

TEST_F(Scrubbers, AMovieThatGoesAwayEndsTheDrag)
{
    scrubber->reloadData();
    window->touchDown({1, {110, 110}, {}});
    movie->duration = 0;
    scrubber->reloadData();
    window->touchUp({1, {210, 110}, {}});
    EXPECT_THAT(movie->said, ElementsAre("begin 1", "value 10", "end 1"));
}

TEST_F(Scrubbers, TheDelegateMayTakeItAway)
{
    scrubber->reloadData();
    movie->onBegin = [this] {
        scrubber->removeFromSuperview();
        scrubber.reset();
        movie.reset();
    };
    tap(110, 110);
    EXPECT_EQ(scrubber, nullptr);
}

TEST_F(Scrubbers, ScrubbingByKeysBeginsAndEnds)
{
    scrubber->reloadData();
    scrubber->scrubTo(12);
    scrubber->scrubTo(std::nan(""));
    EXPECT_THAT(movie->said, ElementsAre("begin 1", "value 12", "end 1"));
}

TEST_F(Scrubbers, AsksForAsManyPicturesAsFit)
{
    scrubber->reloadData();
    EXPECT_EQ(scrubber->timestamps().size(), 16U);
    EXPECT_EQ(movie->requested, scrubber->timestamps());
}

TEST_F(Scrubbers, KeepsOnlyPicturesOfCurrentTimestamps)
{
    scrubber->reloadData();
    const double second = scrubber->timestamps()[1];
    scrubber->setThumbnailImage_forTimestamp(picture(), second);
    scrubber->setThumbnailImage_forTimestamp(picture(), 0.123);
    scrubber->setThumbnailImage_forTimestamp(nullptr, 0);
    EXPECT_EQ(scrubber->thumbnails().size(), 1U);
    movie->duration = 7;
    scrubber->reloadData();
    EXPECT_THAT(scrubber->thumbnails(), IsEmpty());
}

TEST_F(Scrubbers, ANewWidthAsksForTheMissingPicturesOnly)
{
    movie->aspectRatio = 300.0 / 38 / 2;
    scrubber->reloadData();
    window->commit();
    EXPECT_THAT(movie->requested, ElementsAre(0, 15));
    scrubber->setThumbnailImage_forTimestamp(picture(), 0);
    movie->requested.clear();
    scrubber->setFrame(Rect::make(0, 100, 620, 38));
    window->commit();
    EXPECT_THAT(movie->requested, ElementsAre(7.5, 15, 22.5));
    EXPECT_EQ(scrubber->thumbnails().size(), 1U);
}

TEST_F(Scrubbers, ASourceThatIsGoneLeavesNothing)
{
    scrubber->reloadData();
    movie.reset();
    scrubber->reloadData();
    EXPECT_EQ(scrubber->duration(), 0);
    EXPECT_THAT(scrubber->timestamps(), IsEmpty());
}

TEST_F(Scrubbers, IsASliderToAssistiveTechnology)
{
    scrubber->reloadData();
    scrubber->setValue(5.9);
    const auto description = scrubber->accessibility();
    EXPECT_EQ(description.role, platform::AccessibilityRole::Slider);
    EXPECT_EQ(description.name, "Position");
    EXPECT_EQ(description.value, "5 s of 30 s");
    EXPECT_EQ(description.maximum, 30);
    movie->duration = 3700;
    scrubber->reloadData();
    EXPECT_EQ(scrubber->accessibility().value, "5 s of 3700 s");
}

} // namespace
