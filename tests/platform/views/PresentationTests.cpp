// What is shown above all else: how it comes and goes, and that nothing behind it can be reached meanwhile.
#include "Fixture.h"

#include "platform/views/BarButtonItem.h"
#include "platform/views/Presentation.h"
#include "platform/views/Toolbar.h"
#include "support/EnglishWords.h"

#include <chrono>

namespace tests {

namespace {

using platform::Key;
using platform::ModalPresentationStyle;
using platform::SurfaceView;
using testing::ElementsAre;
using testing::IsEmpty;

/// What is presented: as high as it was told, with a button at its top.
class Shown final : public platform::ViewController {
public:
    void viewDidLoad() override
    {
        button->setFrame(base::Rect::make(0, 0, 100, 44));
        view()->addSubview(button);
    }
    base::Size contentSizeThatFits(base::Size room) override { return {room.width, std::min(height, room.height)}; }
    bool presentationShouldClose() override
    {
        ++asked;
        return allowsClosing;
    }
    void presentationDidShow() override { events.emplace_back("shown"); }
    void presentationDidEnd() override { events.emplace_back("ended"); }
    void viewWillTransitionToSize_withTransitionCoordinator(base::Size size,
                                                            platform::TransitionCoordinator& coordinator) override
    {
        ViewController::viewWillTransitionToSize_withTransitionCoordinator(size, coordinator);
        events.emplace_back("resized");
    }

    double height = 300;
    bool allowsClosing = true;
    int asked = 0;
    std::vector<std::string> events;
    std::shared_ptr<platform::Button> button = std::make_shared<platform::Button>();
};

struct Presenting : WindowFixture {
    std::shared_ptr<Controller> root = controller("root");
    std::shared_ptr<Target> target = std::make_shared<Target>();
    std::shared_ptr<platform::Button> behind = std::make_shared<platform::Button>();
    std::shared_ptr<Shown> shown = std::make_shared<Shown>();
    EnglishWords words;

    Presenting()
    {
        root->commands = {{Key::Space, 0, false, runtime::Selector("command")},
                          {Key::Escape, 0, false, runtime::Selector("command")}};
        window->setLog(machine.log);
        window->setRootViewController(root);
        window->setVisible(true);
        behind->setFrame(base::Rect::make(0, 0, 400, 800));
        behind->addTarget(target, Target::action(), platform::kTouchUpInside);
        root->view()->addSubview(behind);
        root->becomeFirstResponder();
        window->commit();
        taken();
    }

    void settle() { machine.advance(std::chrono::milliseconds(300)); }
    void present(bool animated = true)
    {
        root->present(shown, animated, [this] { shown->events.emplace_back("completed"); });
        window->commit();
    }
    void presentAndSettle()
    {
        present();
        settle();
        window->commit();
        shown->events.clear();
    }
    base::Rect surface() const { return window->topPresentation()->surface()->frame(); }
    bool isGone() const { return !root->presentedViewController() && !window->topPresentation(); }
    void drag(double fromY, double toY, std::chrono::milliseconds step)
    {
        base::Instant now{0};
        window->touchDown({1, {200, fromY}, now});
        for (int i = 1; i <= 10; ++i)
            window->touchMove({1, {200, fromY + (toY - fromY) * i / 10}, now += step});
        window->commit();
        window->touchUp({1, {200, toY}, now});
        window->commit();
    }
};

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
    tap(200, 20);
    settle();
    root.reset();
    settle();
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

struct Popping : Presenting {
    std::shared_ptr<platform::Toolbar> bar = std::make_shared<platform::Toolbar>(base::Rect::make(0, 0, 1000, 60));
    std::shared_ptr<platform::BarButtonItem> share = std::make_shared<platform::BarButtonItem>(
        words, platform::BarButtonItem::Kind::Action, target, Target::action());
    std::shared_ptr<platform::BarButtonItem> save =
        std::make_shared<platform::BarButtonItem>(words, platform::BarButtonItem::Kind::Save, target, Target::action());

    Popping()
    {
        window->transitionToSize({1000, 700});
        behind->removeFromSuperview();
        bar->setAutoresizingMask(platform::kFlexibleWidth);
        bar->setItems({platform::BarButtonItem::flexibleSpace(), share, save});
        root->view()->addSubview(bar);
        shown->setModalPresentationStyle(ModalPresentationStyle::Popover);
        shown->setPopoverSource(share);
        window->commit();
    }
    double sourceMiddle() const { return share->view()->convertToRoot({22, 0}).x; }
    double arrow() const { return surface().minX() + window->topPresentation()->surface()->arrow().position; }
    SurfaceView::Arrow::Edge edge() const { return window->topPresentation()->surface()->arrow().edge; }
};

TEST_F(Popping, APopoverPointsAtWhatItCameFrom)
{
    presentAndSettle();
    EXPECT_EQ(static_cast<int>(platform::ModalPresentationStyle::Popover), 7);
    EXPECT_EQ(edge(), SurfaceView::Arrow::Edge::Top);
    EXPECT_EQ(arrow(), sourceMiddle());
    EXPECT_EQ(surface().minY(), share->view()->convertToRoot({0, 44}).y + SurfaceView::kArrowHeight);
    EXPECT_LE(surface().maxX(), 992);
    EXPECT_EQ(surface().height(), 300);
}

TEST_F(Popping, APopoverStaysAtItsSourceThroughSizesAndChangesOfTheBar)
{
    presentAndSettle();
    window->transitionToSize({700, 1000});
    window->commit();
    EXPECT_EQ(arrow(), sourceMiddle());
    const double before = arrow();
    bar->setItems({share, platform::BarButtonItem::flexibleSpace(), save});
    window->commit();
    EXPECT_NE(sourceMiddle(), before);
    EXPECT_EQ(arrow(), sourceMiddle());
    bar->setFrame(base::Rect::make(0, 940, 700, 60));
    window->commit();
    EXPECT_EQ(edge(), SurfaceView::Arrow::Edge::Bottom);
    EXPECT_EQ(surface().maxY(), share->view()->convertToRoot({0, 0}).y - SurfaceView::kArrowHeight);
}

TEST_F(Popping, APopoverWhoseSourceIsNowhereStandsInTheMiddle)
{
    presentAndSettle();
    bar->setItems({save});
    window->commit();
    EXPECT_EQ(edge(), SurfaceView::Arrow::Edge::None);
    EXPECT_EQ(surface().center(), (base::Point{500, 350}));
    bar->setItems({share});
    window->commit();
    EXPECT_EQ(edge(), SurfaceView::Arrow::Edge::Top);
    bar->setHidden(true);
    window->commit();
    EXPECT_EQ(surface().center(), (base::Point{500, 350}));
}

TEST_F(Popping, ItFollowsTheMirroredBar)
{
    presentAndSettle();
    window->setRightToLeft(true);
    window->commit();
    EXPECT_LT(sourceMiddle(), 500);
    EXPECT_EQ(arrow(), sourceMiddle());
    EXPECT_GE(surface().minX(), 8);
}

} // namespace

} // namespace tests
