#include "platform/views/Window.h"

#include "platform/views/Button.h"

#include "Fixture.h"

namespace {

using namespace std::chrono_literals;
using base::Rect;
using base::Size;
using platform::Button;
using platform::Key;
using platform::View;
using testing::ElementsAre;

struct Transitions : tests::WindowFixture {
    std::shared_ptr<tests::Controller> root = controller("root");

    Transitions()
    {
        window->setRootViewController(root);
        window->setVisible(true);
        window->commit();
        taken();
    }
};

TEST_F(Transitions, OneRunsForAllSizesThatAreAskedForInOneTurn)
{
    std::vector<Size> sizes;
    root->onTransition = [&](Size size, platform::TransitionCoordinator&) { sizes.push_back(size); };
    window->requestSize({500, 500});
    window->requestSize({800, 400});
    EXPECT_THAT(sizes, ElementsAre());
    machine.drain();
    EXPECT_THAT(sizes, ElementsAre(Size{800, 400}));
    EXPECT_EQ(window->transitionCount(), 1U);
    EXPECT_EQ(window->bounds().size, (Size{800, 400}));
    EXPECT_EQ(root->view()->frame(), Rect::make(0, 0, 800, 400));
}

TEST_F(Transitions, NoneRunsWhenTheSizeIsBackToWhatItWas)
{
    window->requestSize({800, 400});
    window->requestSize({400, 800});
    machine.drain();
    EXPECT_EQ(window->transitionCount(), 0U);
}

TEST_F(Transitions, ASizeMayBeAskedForAgainAfterTheTurn)
{
    window->requestSize({800, 400});
    machine.drain();
    window->requestSize({400, 800});
    machine.drain();
    EXPECT_EQ(window->transitionCount(), 2U);
}

TEST_F(Transitions, TellFirstThenResizeThenRunAlongsideThenComplete)
{
    std::vector<std::string> order;
    root->onTransition = [&](Size, platform::TransitionCoordinator& coordinator) {
        order.push_back("told at " + std::to_string(static_cast<int>(window->bounds().width())));
        coordinator.animateAlongsideTransition(
            [&] {
                order.push_back("alongside at " + std::to_string(static_cast<int>(root->view()->bounds().width())));
                EXPECT_EQ(platform::currentAnimationDuration(), platform::Window::kTransitionDuration);
            },
            [&] { order.emplace_back("completed"); });
    };
    window->transitionToSize({800, 400});
    EXPECT_THAT(order, ElementsAre("told at 400", "alongside at 800"));
    EXPECT_FALSE(root->view()->needsLayout());
    machine.advance(249ms);
    EXPECT_EQ(order.size(), 2U);
    machine.advance(1ms);
    EXPECT_THAT(order, ElementsAre("told at 400", "alongside at 800", "completed"));
}

TEST_F(Transitions, ChildrenAreToldToo)
{
    const auto child = controller("child");
    root->addChildViewController(child);
    int told = 0;
    child->onTransition = [&](Size, platform::TransitionCoordinator&) { ++told; };
    window->transitionToSize({800, 400});
    EXPECT_EQ(told, 1);
}

TEST_F(Transitions, AThousandOfThemLeaveNothingBehind)
{
    using platform::LayoutAttribute;
    const auto bar = add(Rect::make(0, 756, 400, 44), root->view());
    const auto strip = add({}, root->view());
    strip->setTranslatesAutoresizingMaskIntoConstraints(false);
    root->onTransition = [&](Size, platform::TransitionCoordinator& coordinator) {
        coordinator.animateAlongsideTransition(
            [&] {
                const Size size = root->view()->bounds().size;
                bar->setFrame(Rect::make(0, size.height - 44, size.width, 44));
                if (size.width > size.height) {
                    bar->removeFromSuperview();
                    root->view()->addConstraint(
                        {strip, LayoutAttribute::Bottom, root->view(), LayoutAttribute::Bottom, 1, 0});
                } else {
                    root->view()->addSubview(bar);
                    root->view()->addConstraint({strip, LayoutAttribute::Bottom, bar, LayoutAttribute::Top, 1, 0});
                }
                root->view()->addConstraint({strip, LayoutAttribute::Height, {}, LayoutAttribute::None, 1, 38});
            },
            nullptr);
    };
    const auto rotate = [&] {
        window->requestSize({800, 400});
        machine.advance(1s);
        window->requestSize({400, 800});
        machine.advance(1s);
    };
    rotate();
    const auto constraints = root->view()->constraints().size();
    for (int i = 0; i < 500; ++i)
        rotate();
    machine.advance(1s);
    EXPECT_EQ(window->transitionCount(), 1002U);
    EXPECT_EQ(root->view()->constraints().size(), constraints);
    EXPECT_EQ(root->view()->children().size(), 2U);
    EXPECT_EQ(root->observerCount(), 0U);
    EXPECT_LE(strip->takeAnimations().size(), 2U);
    EXPECT_LE(window->takeAnimations().size(), 2U);
    EXPECT_EQ(machine.mainQueue.untilNext(), std::nullopt);
    EXPECT_EQ(strip->frame().maxY(), 756);
    EXPECT_EQ(strip->frame().height(), 38);
}

TEST_F(Transitions, AWindowThatIsGoneDoesNotResize)
{
    window->requestSize({800, 400});
    window.reset();
    machine.drain();
}

struct Focus : tests::WindowFixture {
    std::shared_ptr<Button> right = add<Button>(Rect::make(300, 12, 50, 40), window);
    std::shared_ptr<Button> left = add<Button>(Rect::make(10, 20, 50, 40), window);
    std::shared_ptr<Button> bottom = add<Button>(Rect::make(10, 700, 50, 40), window);
};

TEST_F(Focus, GoesFromTopToBottomAndFromLeftToRightAndAround)
{
    EXPECT_EQ(window->focusedView(), nullptr);
    std::vector<std::shared_ptr<View>> order;
    for (int i = 0; i < 4; ++i) {
        window->moveFocus(true);
        order.push_back(window->focusedView());
    }
    EXPECT_THAT(order, ElementsAre(left, right, bottom, left));
    window->moveFocus(false);
    EXPECT_EQ(window->focusedView(), bottom);
}

TEST_F(Focus, GoesFromRightToLeftWhereWordsDo)
{
    window->setRightToLeft(true);
    std::vector<std::shared_ptr<View>> order;
    for (int i = 0; i < 3; ++i) {
        window->moveFocus(true);
        order.push_back(window->focusedView());
    }
    EXPECT_THAT(order, ElementsAre(right, left, bottom));
}

TEST_F(Focus, SkipsWhatIsDisabledOrHidden)
{
    left->setEnabled(false);
    right->setHidden(true);
    window->moveFocus(true);
    EXPECT_EQ(window->focusedView(), bottom);
    bottom->setAlpha(0);
    window->moveFocus(true);
    EXPECT_EQ(window->focusedView(), nullptr);
}

TEST_F(Focus, IsClearedWhenTheFocusedViewLeaves)
{
    window->moveFocus(true);
    left->removeFromSuperview();
    EXPECT_EQ(window->focusedView(), nullptr);
    window->addSubview(left);
    EXPECT_EQ(window->focusedView(), nullptr);
}

TEST_F(Focus, ReturnAndSpaceActivateTheFocusedView)
{
    const auto target = std::make_shared<tests::Target>();
    left->addTarget(target, tests::Target::action(), platform::kTouchUpInside);
    EXPECT_FALSE(window->keyDown(Key::Return));
    window->moveFocus(true);
    EXPECT_TRUE(window->keyDown(Key::Return));
    EXPECT_TRUE(window->keyDown(Key::Space));
    EXPECT_EQ(target->senders.size(), 2U);
    left->setHidden(true);
    EXPECT_FALSE(window->keyDown(Key::Return));
}

TEST_F(Focus, KeysReachTheCommandsOfTheChainOfTheFirstResponder)
{
    const auto root = controller("root");
    const auto child = controller("child");
    window->setRootViewController(root);
    root->addChildViewController(child);
    root->view()->addSubview(child->view());
    root->commands = {{Key::Character, 's', true, runtime::Selector("command")},
                      {Key::Space, 0, false, runtime::Selector("command")},
                      {Key::Escape, 0, false, runtime::Selector("unknown")}};
    taken();
    EXPECT_FALSE(window->keyDown(Key::Space));
    child->becomeFirstResponder();
    EXPECT_TRUE(window->keyDown(Key::Space));
    EXPECT_TRUE(window->keyDown(Key::Character, 'S', true));
    EXPECT_FALSE(window->keyDown(Key::Character, 's', false));
    EXPECT_FALSE(window->keyDown(Key::Character, 'q', true));
    EXPECT_FALSE(window->keyDown(Key::Escape));
    EXPECT_THAT(taken(), ElementsAre("root command", "root command"));
    child->commands = {{Key::Space, 0, false, runtime::Selector("command")}};
    EXPECT_TRUE(window->keyDown(Key::Space));
    EXPECT_THAT(taken(), ElementsAre("child command"));
}

TEST_F(Focus, ShiftCountsTogetherWithControlAlone)
{
    const auto root = controller("root");
    window->setRootViewController(root);
    root->becomeFirstResponder();
    root->commands = {{Key::Character, 's', true, runtime::Selector("command"), true},
                      {Key::Character, 'i', false, runtime::Selector("command")}};
    taken();
    EXPECT_FALSE(window->keyDown(Key::Character, 's', true, false));
    EXPECT_TRUE(window->keyDown(Key::Character, 's', true, true));
    EXPECT_TRUE(window->keyDown(Key::Character, 'i', false, false));
    EXPECT_TRUE(window->keyDown(Key::Character, 'i', false, true)) << "as with Caps Lock";
    EXPECT_EQ(taken().size(), 3U);
}

} // namespace
