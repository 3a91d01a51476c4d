// Fingers and keys while something is presented: what closes it, and that nothing behind it can be reached meanwhile.
#include "PresentationFixture.h"

namespace tests {

namespace {

using platform::Key;
using testing::ElementsAre;
using testing::IsEmpty;

TEST_F(Presenting, ATapBesideClosesIt)
{
    presentAndSettle();
    tap(200, 100);
    EXPECT_THAT(target->senders, IsEmpty()) << "what is behind hears nothing";
    settle();
    EXPECT_TRUE(isGone());
    tap(200, 100);
    EXPECT_EQ(target->senders.size(), 1U) << "and can be reached again";
}

TEST_F(Presenting, TheSecondOfTwoTapsDoesNotCloseWhatComesUp)
{
    present();
    tap(200, 100);
    settle();
    settle();
    EXPECT_FALSE(isGone());
    EXPECT_EQ(shown->asked, 0);
}

TEST_F(Presenting, EscapeClosesItEvenWhileItComesUp)
{
    present();
    EXPECT_TRUE(window->keyDown(Key::Escape));
    settle();
    settle();
    EXPECT_TRUE(isGone());
    EXPECT_THAT(shown->events, ElementsAre("shown", "completed", "ended"));
    EXPECT_THAT(taken(), testing::Not(testing::Contains("root command")));
}

TEST_F(Presenting, WhoWantsItClosedIsToldWhenItHasGone)
{
    bool told = false;
    const auto tell = [&] { told = true; };
    root->closePresented(tell);
    EXPECT_TRUE(std::exchange(told, false)) << "there is nothing";

    present();
    root->closePresented(tell);
    settle();
    EXPECT_FALSE(told) << "it was on its way up";
    settle();
    EXPECT_TRUE(std::exchange(told, false));
    EXPECT_TRUE(isGone());

    shown->allowsClosing = false; // it is in the middle of something…
    presentAndSettle();
    root->closePresented(tell);
    settle();
    EXPECT_FALSE(isGone());
    shown->dismiss(true); // …and ends that first
    EXPECT_FALSE(told);
    settle();
    EXPECT_TRUE(told);
}

TEST_F(Presenting, ItStaysWhereItDoesNotLetItselfBeClosed)
{
    shown->allowsClosing = false;
    presentAndSettle();
    window->keyDown(Key::Escape);
    tap(200, 100);
    drag(510, 790, std::chrono::milliseconds(5));
    settle();
    window->commit();
    EXPECT_EQ(shown->asked, 3);
    EXPECT_FALSE(isGone());
    EXPECT_EQ(surface().maxY(), 800) << "back where it was";
}

TEST_F(Presenting, ASwipeFollowsTheFingerAndCloses)
{
    presentAndSettle();
    const double y = surface().minY();
    base::Instant now{0};
    window->touchDown({1, {200, 600}, now});
    window->touchMove({1, {200, 612}, now += std::chrono::milliseconds(50)});
    window->touchMove({1, {200, 662}, now += std::chrono::milliseconds(500)});
    window->commit();
    EXPECT_EQ(surface().minY(), y + 50);
    window->touchMove({1, {200, 762}, now += std::chrono::milliseconds(500)});
    window->touchUp({1, {200, 762}, now += std::chrono::milliseconds(500)});
    settle();
    EXPECT_TRUE(isGone());
}

TEST_F(Presenting, APullOfAThirdClosesAndOneOfLessDoesNot)
{
    const auto pull = [this](double by) {
        base::Instant now{0};
        window->touchDown({1, {200, 600}, now});
        window->touchMove({1, {200, 612}, now += std::chrono::milliseconds(50)});
        window->touchMove({1, {200, 612 + by}, now += std::chrono::seconds(1)});
        window->touchUp({1, {200, 612 + by}, now += std::chrono::seconds(1)});
        settle();
        window->commit();
    };
    presentAndSettle();
    pull(105);
    EXPECT_FALSE(isGone());
    pull(106);
    EXPECT_TRUE(isGone());
}

TEST_F(Presenting, AThrowClosesFromACertainSpeedOn)
{
    presentAndSettle();
    drag(600, 660, std::chrono::milliseconds(10));
    settle();
    EXPECT_FALSE(isGone());
    drag(600, 660, std::chrono::milliseconds(8));
    settle();
    EXPECT_TRUE(isGone());
}

TEST_F(Presenting, WhatMovesIsNotPressed)
{
    shown->button->addTarget(target, Target::action(), platform::kTouchUpInside);
    present();
    const base::Point at = shown->button->convertToRoot({50, 20});
    tap(at.x, at.y);
    EXPECT_THAT(target->senders, IsEmpty());
    settle();
    tap(at.x, at.y);
    EXPECT_EQ(target->senders.size(), 1U);
}

TEST_F(Presenting, AShortSlowPullSpringsBack)
{
    presentAndSettle();
    drag(600, 660, std::chrono::milliseconds(100));
    settle();
    EXPECT_FALSE(isGone());
    EXPECT_EQ(surface().maxY(), 800);
}

TEST_F(Presenting, AShortQuickThrowCloses)
{
    presentAndSettle();
    drag(600, 660, std::chrono::milliseconds(5));
    settle();
    EXPECT_TRUE(isGone());
}

TEST_F(Presenting, APullThatTheSystemTakesAwaySpringsBack)
{
    presentAndSettle();
    window->touchDown({1, {200, 600}, {}});
    window->touchMove({1, {200, 620}, {}});
    window->touchMove({1, {200, 790}, {}});
    window->touchCancel({1, {}, {}});
    settle();
    window->commit();
    EXPECT_FALSE(isGone());
    EXPECT_EQ(surface().maxY(), 800);
}

TEST_F(Presenting, APullDoesNotPressTheButtonThatItBeganOn)
{
    shown->allowsClosing = false;
    shown->button->addTarget(target, Target::action(), platform::kTouchUpInside);
    presentAndSettle();
    const base::Point at = shown->button->convertToRoot({50, 20});
    window->touchDown({1, at, {}});
    EXPECT_TRUE(shown->button->isHighlighted());
    window->touchMove({1, {at.x, at.y + 15}, {}});
    EXPECT_FALSE(shown->button->isHighlighted());
    window->touchUp({1, {at.x, at.y + 15}, {}});
    EXPECT_THAT(target->senders, IsEmpty());
    tap(at.x, at.y);
    EXPECT_EQ(target->senders.size(), 1U);
}

TEST_F(Presenting, KeysAndTheFocusStayInside)
{
    window->moveFocus(true);
    ASSERT_EQ(window->focusedView(), behind);
    presentAndSettle();
    EXPECT_EQ(window->focusedView(), shown->button) << "who steers by keys goes on with them";
    window->moveFocus(true);
    EXPECT_EQ(window->focusedView(), shown->button);
    window->clearFocus();
    EXPECT_FALSE(window->keyDown(Key::Space));
    EXPECT_TRUE(window->keyDown(Key::Down));
    EXPECT_EQ(window->focusedView(), shown->button);
    window->clearFocus();
    root->becomeFirstResponder();
    EXPECT_FALSE(window->keyDown(Key::Space)) << "not even when somebody behind takes the keys";
    root->handlesMotion = true;
    window->motion(platform::MotionSubtype::Shake);
    EXPECT_THAT(taken(), IsEmpty());

    root->dismiss(true);
    settle();
    EXPECT_EQ(window->focusedView(), behind);
    EXPECT_EQ(window->firstResponder(), root);
    EXPECT_TRUE(window->keyDown(Key::Escape));
    EXPECT_THAT(taken(), ElementsAre("root command"));
}

TEST_F(Presenting, WhoTookTheKeysBeforeTakesThemAfterwards)
{
    presentAndSettle();
    EXPECT_NE(window->firstResponder(), root);
    root->dismiss(true);
    settle();
    EXPECT_EQ(window->firstResponder(), root);
}

TEST_F(Presenting, WithoutAFocusBeforeThereIsNoneAfterwards)
{
    presentAndSettle();
    EXPECT_EQ(window->focusedView(), nullptr);
    window->moveFocus(true);
    root->dismiss(true);
    settle();
    EXPECT_EQ(window->focusedView(), nullptr);
}

TEST_F(Presenting, AFingerThatIsDownBehindIsLetGoOf)
{
    window->touchDown({7, {200, 400}, {}});
    ASSERT_TRUE(behind->isHighlighted());
    present();
    EXPECT_FALSE(behind->isHighlighted());
    window->touchUp({7, {200, 400}, {}});
    EXPECT_THAT(target->senders, IsEmpty());
}

} // namespace

} // namespace tests
