// Values on their way: driven by a clock that stands still until a test moves it.
#include "Stage.h"

#include <chrono>
#include <functional>

namespace tests {

namespace {

using namespace std::chrono_literals;

class Animations : public Stage {
protected:
    explicit Animations(double atScale = 1) : Stage(atScale) {}

    void animate(base::Instant duration, const std::function<void()>& changes)
    {
        platform::animate(mainQueue, duration, changes);
        look();
    }
    int redAt(double x, double y) { return colorAt(x, y).red(); }
};

class AnimationsAtTwo : public Animations {
protected:
    AnimationsAtTwo() : Animations(2) {}
};

TEST_F(Animations, AlphaGoesSlowlyFastSlowlyFromTheOldValueToTheNew)
{
    const auto view = addColor(base::Rect::make(0, 0, 50, 50), kRed);
    look();
    animate(200ms, [&] { view->setAlpha(0); });
    EXPECT_EQ(view->alpha(), 0) << "the model is there at once";
    EXPECT_EQ(redAt(25, 25), 255);
    clock.advance(50ms);
    EXPECT_NEAR(redAt(25, 25), 215, 3);
    clock.advance(50ms);
    EXPECT_NEAR(redAt(25, 25), 128, 3);
    clock.advance(100ms);
    EXPECT_EQ(redAt(25, 25), 0);
}

TEST_F(Animations, FramesMoveAndGrow)
{
    const auto view = addColor(base::Rect::make(0, 0, 20, 20), kRed);
    look();
    animate(200ms, [&] { view->setFrame(base::Rect::make(100, 0, 60, 20)); });
    clock.advance(100ms);
    EXPECT_EQ(redAt(49, 10), 0);
    EXPECT_EQ(redAt(51, 10), 255);
    EXPECT_EQ(redAt(89, 10), 255);
    EXPECT_EQ(redAt(91, 10), 0);
    clock.advance(100ms);
    EXPECT_EQ(redAt(99, 10), 0);
    EXPECT_EQ(redAt(159, 10), 255);
}

TEST_F(Animations, ANewOneStartsFromWhatIsShown)
{
    const auto view = addColor(base::Rect::make(0, 0, 50, 50), kRed);
    look();
    animate(200ms, [&] { view->setAlpha(0); });
    clock.advance(100ms);
    EXPECT_NEAR(redAt(25, 25), 128, 3);
    animate(200ms, [&] { view->setAlpha(1); });
    EXPECT_NEAR(redAt(25, 25), 128, 3);
    clock.advance(100ms);
    EXPECT_NEAR(redAt(25, 25), 191, 3);
    clock.advance(100ms);
    EXPECT_EQ(redAt(25, 25), 255);
}

TEST_F(Animations, AChangeWithoutAnimationIsShownAtOnce)
{
    const auto view = addColor(base::Rect::make(0, 0, 50, 50), kRed);
    look();
    animate(200ms, [&] { view->setAlpha(0); });
    clock.advance(100ms);
    view->setAlpha(0.8);
    EXPECT_NEAR(redAt(25, 25), 204, 3);
    clock.advance(50ms);
    EXPECT_NEAR(redAt(25, 25), 204, 3);
}

TEST_F(Animations, AFadeThatBeginsAtAValueThatWasNeverShownBeginsThere)
{
    const auto view = addColor(base::Rect::make(0, 0, 50, 50), kRed);
    look();
    view->setAlpha(0);
    animate(200ms, [&] { view->setAlpha(1); });
    EXPECT_EQ(redAt(25, 25), 0);
    clock.advance(100ms);
    EXPECT_NEAR(redAt(25, 25), 128, 3);
}

TEST_F(Animations, TheyComeToAnEnd)
{
    const auto view = addColor(base::Rect::make(0, 0, 50, 50), kRed);
    look();
    animate(200ms, [&] { view->setAlpha(0); });
    clock.advance(200ms);
    look();
    const auto commits = presenter->statistics().commits;
    settle();
    look();
    EXPECT_EQ(presenter->statistics().commits, commits);
}

TEST_F(Animations, TheyMoveWithoutBeingAskedFor)
{
    const auto view = addColor(base::Rect::make(0, 0, 50, 50), kRed);
    look();
    animate(200ms, [&] { view->setAlpha(0); });
    const auto commits = presenter->statistics().commits;
    settleUntil([&] {
        clock.advance(5ms);
        return presenter->statistics().commits >= commits + 3;
    });
    EXPECT_GE(presenter->statistics().commits, commits + 3);
}

TEST_F(Animations, WhatOverlapsDoesNotShowThroughInAFade)
{
    const auto parent = add<platform::View>(base::Rect::make(0, 0, 100, 100));
    parent->setBackgroundColor(kBlue);
    for (int i = 0; i < 3; ++i) {
        const auto child = std::make_shared<platform::View>(base::Rect::make(10, 10, 50, 50));
        child->setBackgroundColor(kRed);
        parent->addSubview(child);
    }
    look();
    animate(200ms, [&] { parent->setAlpha(0); });
    clock.advance(100ms);
    EXPECT_NEAR(colorAt(80, 80).blue(), 128, 3);
    EXPECT_NEAR(colorAt(30, 30).red(), 128, 3);
    EXPECT_EQ(colorAt(30, 30).blue(), 0) << "the parent's ground is behind its children";
    clock.advance(100ms);
    EXPECT_EQ(colorAt(30, 30), QColor(0, 0, 0));
}

TEST_F(Animations, ChildrenBeyondTheirParentFadeWithIt)
{
    const auto parent = addColor(base::Rect::make(50, 20, 50, 20), kBlue);
    const auto child = std::make_shared<platform::View>(base::Rect::make(-20, 10, 30, 40));
    child->setBackgroundColor(kRed);
    parent->addSubview(child);
    const QImage before = look();
    parent->setAlpha(0.5);
    const QImage half = look();
    for (int y = 0; y < 100; ++y)
        for (int x = 0; x < 200; ++x) {
            const QColor full = before.pixelColor(x, y);
            const QColor shown = half.pixelColor(x, y);
            ASSERT_NEAR(shown.red(), full.red() / 2.0, 2) << x << "," << y;
            ASSERT_NEAR(shown.blue(), full.blue() / 2.0, 2) << x << "," << y;
        }
    parent->setAlpha(1);
    EXPECT_EQ(look(), before);
}

TEST_F(AnimationsAtTwo, AFadeStaysSharp)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto parent = add<platform::Toolbar>(base::Rect::make(0, 20, 200, 60));
    const auto label = std::make_shared<platform::Label>(base::Rect::make(10, 10, 100, 17));
    label->setText("Sharp text");
    parent->addSubview(label);
    const QImage before = look();
    parent->setAlpha(0.5);
    const QImage half = look();
    for (int y = 0; y < 200; ++y)
        for (int x = 0; x < 400; ++x)
            ASSERT_NEAR(half.pixelColor(x, y).green(), (255 + before.pixelColor(x, y).green()) / 2.0, 2)
                << x << "," << y;
}

} // namespace

} // namespace tests
