// What is shown above all else: how it comes and goes, and that nothing of it is left.
#include "PresentationFixture.h"

namespace tests {

namespace {

using platform::Key;
using platform::ModalPresentationStyle;
using testing::ElementsAre;
using testing::IsEmpty;

TEST_F(Presenting, ASheetIsCompleteOnlyWhenItIsFullyOnScreen)
{
    present();
    machine.advance(std::chrono::milliseconds(249));
    EXPECT_THAT(shown->events, IsEmpty());
    machine.advance(std::chrono::milliseconds(1));
    EXPECT_THAT(shown->events, ElementsAre("shown", "completed"));
    EXPECT_EQ(root->presentedViewController(), shown);
    EXPECT_EQ(shown->presentingViewController(), root);
    EXPECT_EQ(surface().maxY(), 800);
    EXPECT_EQ(surface().height(), 316) << "with a grabber above";
}

TEST_F(Presenting, ItIsGoneOnlyWhenItHasSlidOut)
{
    presentAndSettle();
    bool gone = false;
    shown->dismiss(true, [&] {
        gone = true;
        EXPECT_TRUE(isGone());
        EXPECT_FALSE(shown->presentingViewController());
        EXPECT_FALSE(shown->window());
    });
    machine.advance(std::chrono::milliseconds(249));
    EXPECT_FALSE(gone);
    EXPECT_TRUE(root->presentedViewController());
    machine.advance(std::chrono::milliseconds(1));
    EXPECT_TRUE(gone);
    EXPECT_THAT(shown->events, ElementsAre("ended"));
}

TEST_F(Presenting, WithoutAnimationItTakesNoTimeButIsToldOnTheQueue)
{
    present(false);
    EXPECT_THAT(shown->events, IsEmpty());
    machine.drain();
    EXPECT_THAT(shown->events, ElementsAre("shown", "completed"));
    root->dismiss(false);
    machine.drain();
    EXPECT_TRUE(isGone());
}

TEST_F(Presenting, WhoPresentsAlreadyOnlySaysSo)
{
    presentAndSettle();
    const auto second = std::make_shared<Shown>();
    root->present(second, true, [] { ADD_FAILURE() << "it is not shown"; });
    settle();
    EXPECT_EQ(root->presentedViewController(), shown);
    EXPECT_TRUE(machine.log.contains(base::MemoryLog::Line::Kind::Error,
                                     "a controller that presents already cannot present another one"));
}

TEST_F(Presenting, OneThatIsDismissedOnItsWayUpComesUpFirst)
{
    present();
    std::vector<std::string> ends;
    root->dismiss(true, [&] { ends.emplace_back("gone"); });
    settle();
    EXPECT_THAT(shown->events, ElementsAre("shown", "completed"));
    settle();
    EXPECT_THAT(ends, ElementsAre("gone"));
    EXPECT_TRUE(isGone());
}

TEST_F(Presenting, ASheetFitsIntoEachSizeThatTheWindowTakes)
{
    shown->height = 5000;
    presentAndSettle();
    EXPECT_EQ(surface(), base::Rect::make(0, 48, 400, 752));
    window->transitionToSize({800, 360});
    window->commit();
    EXPECT_EQ(surface(), base::Rect::make(120, 24, 560, 336));
    EXPECT_THAT(shown->events, ElementsAre("resized"));
    EXPECT_EQ(shown->view()->bounds().size.width, 560);
}

TEST_F(Presenting, WhatItPresentsItselfStandsAboveAndGoesFirst)
{
    presentAndSettle();
    const auto above = std::make_shared<Shown>();
    above->setModalPresentationStyle(ModalPresentationStyle::Alert);
    shown->present(above, true);
    settle();
    EXPECT_EQ(window->topPresentation()->presented(), above);
    tap(200, 20);
    settle();
    EXPECT_EQ(shown->presentedViewController(), above) << "an alert wants an answer";
    window->keyDown(Key::Escape);
    settle();
    EXPECT_EQ(window->topPresentation()->presented(), shown);
    shown->present(above, true);
    settle();
    root->dismiss(true);
    EXPECT_FALSE(above->window()) << "before it slides";
    settle();
    EXPECT_TRUE(isGone());
}

TEST_F(Presenting, NothingIsLeftWhenItsPresenterGoes)
{
    presentAndSettle();
    window->setRootViewController(controller("other"));
    EXPECT_FALSE(window->topPresentation());
    EXPECT_FALSE(shown->window());
    EXPECT_FALSE(root->presentedViewController());
    EXPECT_FALSE(shown->presentingViewController());
    tap(200, 20);
    settle();
    root.reset();
    settle();
}

TEST_F(Presenting, NothingOfWhatStandsAboveIsLeftEither)
{
    presentAndSettle();
    const auto above = std::make_shared<Shown>();
    shown->present(above, true);
    settle();
    window->setRootViewController(controller("other"));
    EXPECT_FALSE(window->topPresentation());
    EXPECT_FALSE(above->window());
    EXPECT_FALSE(shown->presentedViewController());
}

TEST_F(Presenting, OneIsPresentedInOnePlaceOnly)
{
    presentAndSettle();
    const auto child = controller("child");
    root->addChildViewController(child);
    root->view()->addSubview(child->view());
    child->present(shown, true);
    EXPECT_FALSE(child->presentedViewController());
    EXPECT_EQ(shown->presentingViewController(), root);
    EXPECT_TRUE(machine.log.contains(base::MemoryLog::Line::Kind::Error,
                                     "a controller that is presented already cannot be presented"));
    const auto nowhere = controller("nowhere");
    nowhere->present(std::make_shared<Shown>(), true);
    EXPECT_FALSE(nowhere->presentedViewController()) << "it is in no window";
}

TEST_F(Presenting, WhereNothingIsPresentedItIsGoneInTheNextTurn)
{
    bool gone = false;
    root->dismiss(true, [&] { gone = true; });
    EXPECT_FALSE(gone);
    machine.drain();
    EXPECT_TRUE(gone);
}

TEST_F(Presenting, NothingIsLeftWhenAChildThatPresentsGoes)
{
    auto child = controller("child");
    root->addChildViewController(child);
    root->view()->addSubview(child->view());
    child->didMoveToParentViewController(root.get());
    child->present(shown, true);
    settle();
    child->willMoveToParentViewController(nullptr);
    child->view()->removeFromSuperview();
    child->removeFromParentViewController();
    ASSERT_TRUE(window->topPresentation());
    child.reset();
    EXPECT_FALSE(window->topPresentation());
    EXPECT_FALSE(shown->window());
    EXPECT_FALSE(shown->presentingViewController());
}

TEST_F(Presenting, ASizeThatChangesOnTheWayUpIsTakenBeforeItIsComplete)
{
    present();
    shown->height = 400;
    shown->contentSizeDidChange();
    settle();
    EXPECT_EQ(surface().height(), 416);
    EXPECT_THAT(shown->events, IsEmpty()) << "it still grows";
    shown->height = 500;
    shown->contentSizeDidChange();
    settle();
    EXPECT_EQ(surface().height(), 416) << "nobody waits for ever";
    EXPECT_THAT(shown->events, ElementsAre("shown", "completed"));
    shown->contentSizeDidChange();
    window->commit();
    EXPECT_EQ(surface().height(), 516) << "what is up follows at once";
}

} // namespace

} // namespace tests
