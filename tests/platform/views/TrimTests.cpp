// The two handles of a scrubber: taking them, their limits, and what keys and assistive technology do to them.
#include "TrimFixture.h"

namespace {

using base::Rect;
using platform::Key;
using platform::ScrubberHandle;
using testing::ElementsAre;
using testing::IsEmpty;
using tests::kZoomDelay;
using tests::Trims;

TEST_F(Trims, TheGripsStandAtTheEndsOfTheStrip)
{
    EXPECT_EQ(scrubber->stripRect(), Rect::make(10, 0, 332, 38));
    EXPECT_EQ(scrubber->trackRect(), Rect::make(26, 0, 300, 38));
    EXPECT_EQ(scrubber->trimFrame()->frame(), Rect::make(10, 0, 332, 38));
    EXPECT_EQ(scrubber->startHandle()->frame(), Rect::make(10, 0, 16, 38));
    EXPECT_EQ(scrubber->endHandle()->frame(), Rect::make(326, 0, 16, 38));
    EXPECT_FALSE(scrubber->trimFrame()->isEditing());
    EXPECT_EQ(scrubber->editingStartValue(), 0);
    EXPECT_EQ(scrubber->editingEndValue(), 30);
}

TEST_F(Trims, WithoutAMovieOrWithoutEditingThereAreNoGrips)
{
    scrubber->setEditable(false);
    window->commit();
    EXPECT_TRUE(scrubber->startHandle()->isHidden());
    EXPECT_EQ(scrubber->trackRect(), scrubber->stripRect());
    down(15);
    up(15);
    EXPECT_THAT(said(), ElementsAre("begin 1", "value 0", "end 1"));
    scrubber->setEditable(true);
    movie->duration = std::nan("");
    scrubber->reloadData();
    EXPECT_TRUE(scrubber->trimFrame()->isHidden());
    down(15);
    EXPECT_THAT(said(), IsEmpty());
}

TEST_F(Trims, TakingAGripBeginsEditingAndTellsBothEnds)
{
    down(18);
    EXPECT_TRUE(scrubber->isEditing());
    EXPECT_TRUE(scrubber->trimFrame()->isEditing());
    EXPECT_THAT(said(), ElementsAre("editing", "finish 30", "start 0"));
    move(48);
    EXPECT_EQ(scrubber->editingStartValue(), 3);
    up(48);
    EXPECT_THAT(said(), ElementsAre("start 3"));
    EXPECT_TRUE(scrubber->isEditing()) << "until it is told to leave";
    EXPECT_EQ(startX(), 56);

    down(334);
    move(284);
    up(284);
    EXPECT_THAT(said(), ElementsAre("finish 25"));
}

TEST_F(Trims, TheGripMovesFromWhereItIsNotToTheFinger)
{
    enter();
    down(4);
    EXPECT_EQ(scrubber->editingStartValue(), 0);
    move(14);
    EXPECT_DOUBLE_EQ(scrubber->editingStartValue(), 1);
}

TEST_F(Trims, AFingerThatLiftsLeavesTheHandleWhereItWasPlaced)
{
    down(18);
    move(118);
    up(120);
    EXPECT_EQ(scrubber->editingStartValue(), 10) << "fingers roll as they lift";
    down(334);
    up(284);
    EXPECT_EQ(scrubber->editingEndValue(), 25) << "but a quick one may say nothing on the way";
}

TEST_F(Trims, AGripIsAsWideAsAThumb)
{
    for (const double x : {1.0, 18.0, 39.0}) {
        down(x);
        EXPECT_EQ(scrubber->held(), ScrubberHandle::Start) << x;
        up(x);
    }
    for (const double x : {313.0, 334.0, 351.0}) {
        down(x);
        EXPECT_EQ(scrubber->held(), ScrubberHandle::End) << x;
        up(x);
    }
    down(41);
    EXPECT_EQ(scrubber->held(), ScrubberHandle::PlayHead);
}

TEST_F(Trims, WhatOneSeesIsWhatOneTakesWhereThePlayHeadStandsAtAGrip)
{
    scrubber->setValue(0);
    down(27);
    EXPECT_EQ(scrubber->held(), ScrubberHandle::PlayHead);
    up(27);
    down(24);
    EXPECT_EQ(scrubber->held(), ScrubberHandle::Start);
}

TEST_F(Trims, HandlesThatTouchAreTakenByTheirOwnSide)
{
    enter();
    scrubber->moveHandle(ScrubberHandle::Start, 20);
    scrubber->moveHandle(ScrubberHandle::End, 21);
    down(220);
    EXPECT_EQ(scrubber->held(), ScrubberHandle::Start);
    up(220);
    down(244);
    EXPECT_EQ(scrubber->held(), ScrubberHandle::End);
}

TEST_F(Trims, TheHandlesKeepTheMinimumLengthApart)
{
    down(18);
    move(350);
    EXPECT_EQ(scrubber->editingStartValue(), 29);
    up(350);
    down(334);
    move(0);
    EXPECT_EQ(scrubber->editingEndValue(), 30);
    up(0);
    EXPECT_THAT(said(), ElementsAre("editing", "finish 30", "start 0", "start 29"));
}

TEST_F(Trims, AMovieShorterThanTheMinimumIsKeptWhole)
{
    movie->duration = 0.5;
    scrubber->reloadData();
    down(18);
    move(200);
    up(200);
    EXPECT_EQ(scrubber->editingStartValue(), 0);
    EXPECT_EQ(scrubber->editingEndValue(), 0.5);
    EXPECT_TRUE(scrubber->isEditing());
}

TEST_F(Trims, AHandleNeitherScrubsNorLetsThePlayHeadStandInItsWay)
{
    down(18);
    EXPECT_TRUE(scrubber->playHead()->isHidden());
    EXPECT_TRUE(scrubber->isHighlighted());
    scrubber->scrubTo(4);
    EXPECT_EQ(scrubber->value(), 15);
    move(100);
    EXPECT_EQ(scrubber->value(), 15);
    up(100);
    EXPECT_FALSE(scrubber->playHead()->isHidden());
    EXPECT_FALSE(scrubber->isHighlighted());
}

TEST_F(Trims, OneFingerAtATime)
{
    down(18);
    window->touchDown({2, {334, 119}, {}});
    window->touchMove({2, {200, 119}, {}});
    window->touchUp({2, {200, 119}, {}});
    EXPECT_EQ(scrubber->editingEndValue(), 30);
    EXPECT_EQ(scrubber->held(), ScrubberHandle::Start);
    window->touchCancel({1, {18, 119}, {}});
    EXPECT_EQ(scrubber->held(), ScrubberHandle::None);
}

TEST_F(Trims, LeavingLetsGoAndShowsTheWholeMovieAgain)
{
    down(18);
    move(118);
    scrubber->setEditing_animated(false, false);
    EXPECT_EQ(scrubber->held(), ScrubberHandle::None);
    EXPECT_EQ(scrubber->editingStartValue(), 0);
    said();
    move(218);
    up(218);
    EXPECT_THAT(said(), IsEmpty());
    EXPECT_FALSE(scrubber->isEditing());
}

TEST_F(Trims, EnteringAgainTellsTheRangeThatIsShown)
{
    down(18);
    move(118);
    up(118);
    scrubber->setEditing_animated(false, false);
    said();
    down(334);
    EXPECT_THAT(said(), ElementsAre("editing", "start 0", "finish 30"));
}

TEST_F(Trims, EditingIsAStateThatIsSetWithoutTelling)
{
    scrubber->setEditing_animated(true, true);
    EXPECT_TRUE(scrubber->isEditing());
    EXPECT_THAT(said(), IsEmpty());
}

TEST_F(Trims, LeavingIsAnimatedOnlyIfAsked)
{
    for (const bool animated : {true, false}) {
        enter();
        scrubber->moveHandle(ScrubberHandle::Start, 10);
        scrubber->trimFrame()->takeAnimations();
        scrubber->setEditing_animated(false, animated);
        const auto animations = scrubber->trimFrame()->takeAnimations();
        ASSERT_EQ(animations.size(), animated ? 1U : 0U);
        if (animated) {
            EXPECT_EQ(animations.front().fromFrame, Rect::make(110, 0, 232, 38));
        }
        EXPECT_EQ(scrubber->trimFrame()->frame(), Rect::make(10, 0, 332, 38));
    }
}

TEST_F(Trims, TheDelegateMayLeaveAtOnce)
{
    movie->onEditing = [this] { scrubber->setEditing_animated(false, false); };
    down(18);
    move(118);
    up(118);
    EXPECT_THAT(said(), ElementsAre("editing"));
    EXPECT_EQ(scrubber->editingStartValue(), 0);
}

TEST_F(Trims, TheDelegateMayTakeItAwayWhileAHandleIsTaken)
{
    movie->onEditing = [this] {
        scrubber->removeFromSuperview();
        scrubber.reset();
        movie.reset();
    };
    tap(18, 119);
    machine.advance(kZoomDelay);
    EXPECT_EQ(scrubber, nullptr);
}

TEST_F(Trims, AnotherMovieIsChosenWhole)
{
    enter();
    scrubber->moveHandle(ScrubberHandle::Start, 10);
    movie->duration = 12;
    scrubber->reloadData();
    EXPECT_EQ(scrubber->editingStartValue(), 0);
    EXPECT_EQ(scrubber->editingEndValue(), 12);
}

TEST_F(Trims, ANewWidthPlacesEverythingAgain)
{
    enter();
    scrubber->moveHandle(ScrubberHandle::Start, 10);
    scrubber->setFrame(Rect::make(0, 100, 652, 38));
    window->commit();
    EXPECT_EQ(startX(), 26 + 200);
    EXPECT_EQ(endX(), 626);
}

// Keys and assistive technology

TEST_F(Trims, AHandleMovedByKeysBeginsEditing)
{
    scrubber->moveHandle(ScrubberHandle::End, 20);
    EXPECT_THAT(said(), ElementsAre("editing", "start 0", "finish 30", "finish 20"));
    scrubber->moveHandle(ScrubberHandle::End, std::nan(""));
    scrubber->setEnabled(false);
    scrubber->moveHandle(ScrubberHandle::End, 10);
    EXPECT_THAT(said(), IsEmpty());
}

TEST_F(Trims, EachHandleIsASlider)
{
    const auto start = scrubber->startHandle()->accessibility();
    EXPECT_EQ(start.role, platform::AccessibilityRole::Slider);
    EXPECT_EQ(start.name, "Trim start");
    EXPECT_EQ(start.value, "0.00 s");
    EXPECT_EQ(start.minimum, 0);
    EXPECT_EQ(start.maximum, 29);
    EXPECT_DOUBLE_EQ(start.step, 0.3);
    scrubber->endHandle()->setNumber(12.34);
    const auto end = scrubber->endHandle()->accessibility();
    EXPECT_EQ(end.name, "Trim end");
    EXPECT_EQ(end.value, "12.34 s");
    EXPECT_EQ(end.minimum, 1);
    EXPECT_EQ(end.maximum, 30);
    EXPECT_EQ(end.number, 12.34);
    EXPECT_EQ(scrubber->startHandle()->accessibility().maximum, 11.34);
    movie->duration = 7000;
    scrubber->reloadData();
    EXPECT_EQ(scrubber->endHandle()->accessibility().value, "7000.00 s");
    EXPECT_EQ(scrubber->endHandle()->accessibility().step, 1);
}

TEST_F(Trims, TheArrowsMoveTheHandleThatHasTheFocus)
{
    window->moveFocus(true);
    EXPECT_EQ(window->focusedView(), scrubber);
    EXPECT_FALSE(window->keyDown(Key::Right)) << "the play head's arrows are the editor's";
    window->moveFocus(true);
    ASSERT_EQ(window->focusedView(), scrubber->startHandle());
    EXPECT_TRUE(window->keyDown(Key::Right));
    EXPECT_TRUE(window->keyDown(Key::Right));
    EXPECT_TRUE(window->keyDown(Key::Left));
    EXPECT_DOUBLE_EQ(scrubber->editingStartValue(), 0.3);
    window->moveFocus(true);
    ASSERT_EQ(window->focusedView(), scrubber->endHandle());
    EXPECT_TRUE(window->keyDown(Key::Left));
    EXPECT_DOUBLE_EQ(scrubber->editingEndValue(), 29.7);
    EXPECT_FALSE(window->keyDown(Key::Left, 0, true));
    window->moveFocus(true);
    EXPECT_EQ(window->focusedView(), scrubber);
}

} // namespace
