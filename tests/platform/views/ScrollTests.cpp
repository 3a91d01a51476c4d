// Views that scroll, and what progress says.
#include "Fixture.h"

#include "platform/views/ListRow.h"
#include "platform/views/ProgressView.h"
#include "platform/views/ScrollView.h"

#include <chrono>

namespace tests {

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

struct Scrolling : WindowFixture {
    std::shared_ptr<platform::ScrollView> scroll =
        add<platform::ScrollView>(base::Rect::make(0, 100, 400, 200), window);
    std::vector<std::shared_ptr<platform::ListRow>> rows;
    std::shared_ptr<Target> target = std::make_shared<Target>();

    Scrolling()
    {
        for (int i = 0; i < 10; ++i) {
            rows.push_back(add<platform::ListRow>(base::Rect::make(0, i * 56.0, 400, 56), scroll->contentView()));
            rows.back()->addTarget(target, Target::action(), platform::kTouchUpInside);
        }
        scroll->setContentHeight(560);
        window->commit();
    }
    void drag(double fromY, double toY, std::chrono::milliseconds step)
    {
        base::Instant now{0};
        window->touchDown({1, {200, fromY}, now});
        for (int i = 1; i <= 10; ++i)
            window->touchMove({1, {200, fromY + (toY - fromY) * i / 10}, now += step});
        window->touchUp({1, {200, toY}, now});
        window->commit();
    }
    void rest() { machine.advance(std::chrono::seconds(0)); }
};

TEST_F(Scrolling, ADragMovesTheContentWithTheFinger)
{
    drag(280, 180, std::chrono::milliseconds(400));
    EXPECT_EQ(scroll->contentOffset(), 80) << "but for what told it from a tap";
    EXPECT_EQ(rows[0]->convertToRoot({}).y, 20);
    EXPECT_THAT(target->senders, IsEmpty()) << "what it began on is not pressed";
    drag(120, 290, std::chrono::milliseconds(400));
    EXPECT_EQ(scroll->contentOffset(), 0) << "and no further than its end";
}

TEST_F(Scrolling, ATapInsideStillTaps)
{
    drag(280, 180, std::chrono::milliseconds(400));
    tap(200, 110);
    EXPECT_THAT(target->senders, ElementsAre(rows[1]));
    window->touchDown({1, {200, 110}, {}});
    window->touchMove({1, {203, 116}, {}});
    window->touchUp({1, {203, 116}, {}});
    EXPECT_EQ(target->senders.size(), 2U) << "a fingertip rolls";
}

TEST_F(Scrolling, AThrowCoastsAndAFingerStopsIt)
{
    drag(280, 230, std::chrono::milliseconds(10));
    const double thrown = scroll->contentOffset();
    for (int i = 0; i < 5; ++i)
        machine.advance(std::chrono::milliseconds(16));
    const double coasting = scroll->contentOffset();
    EXPECT_GT(coasting, thrown);
    window->touchDown({2, {200, 200}, {}});
    machine.advance(std::chrono::milliseconds(16));
    EXPECT_EQ(scroll->contentOffset(), coasting);
    window->touchCancel({2, {}, {}});
}

TEST_F(Scrolling, AThrowComesToRest)
{
    drag(280, 230, std::chrono::milliseconds(10));
    int steps = 0;
    while (machine.mainQueue.untilNext() && ++steps < 1000)
        machine.advance(std::chrono::milliseconds(16));
    EXPECT_LT(steps, 120);
    EXPECT_LE(scroll->contentOffset(), scroll->maximumOffset());
}

TEST_F(Scrolling, WhoStopsBeforeLiftingThrowsNothing)
{
    base::Instant now{0};
    window->touchDown({1, {200, 280}, now});
    window->touchMove({1, {200, 230}, now += std::chrono::milliseconds(20)});
    window->touchMove({1, {200, 220}, now += std::chrono::milliseconds(20)});
    window->touchUp({1, {200, 220}, now += std::chrono::milliseconds(500)});
    EXPECT_FALSE(machine.mainQueue.untilNext());
}

TEST_F(Scrolling, TheWheelScrollsWhatIsUnderIt)
{
    EXPECT_TRUE(window->scroll({200, 150}, -100));
    EXPECT_EQ(scroll->contentOffset(), 100);
    EXPECT_FALSE(window->scroll({200, 50}, -100)) << "not beside it";
    EXPECT_TRUE(window->scroll({200, 150}, -1000));
    EXPECT_EQ(scroll->contentOffset(), 360);
    EXPECT_FALSE(window->scroll({200, 150}, -10)) << "it is at its end";
}

TEST_F(Scrolling, TheFocusGoesThroughAllRowsInOrderAndIsScrolledIntoView)
{
    for (const auto& row : rows) {
        window->moveFocus(true);
        window->commit();
        ASSERT_EQ(window->focusedView(), row);
        EXPECT_GE(row->convertToRoot({}).y, 100);
        EXPECT_LE(row->convertToRoot({}).y + 56, 300);
    }
    window->moveFocus(true);
    window->commit();
    EXPECT_EQ(window->focusedView(), rows[0]);
    EXPECT_EQ(scroll->contentOffset(), 0);
}

TEST_F(Scrolling, WhatIsScrolledOutOfSightComesBetweenWhatStandsAboveAndBelow)
{
    const auto above = add<platform::ListRow>(base::Rect::make(0, 20, 400, 44), window);
    const auto below = add<platform::ListRow>(base::Rect::make(0, 320, 400, 44), window);
    scroll->setContentOffset(200);
    window->commit();
    window->moveFocus(true);
    EXPECT_EQ(window->focusedView(), above);
    window->moveFocus(true);
    EXPECT_EQ(window->focusedView(), rows[0]);
    window->moveFocus(false);
    window->moveFocus(false);
    EXPECT_EQ(window->focusedView(), below);
    window->moveFocus(false);
    EXPECT_EQ(window->focusedView(), rows[9]);
}

TEST_F(Scrolling, WhatIsLowerThanItsRoomDoesNotScroll)
{
    scroll->setContentHeight(150);
    window->commit();
    drag(280, 180, std::chrono::milliseconds(10));
    EXPECT_EQ(scroll->contentOffset(), 0);
    EXPECT_FALSE(window->scroll({200, 150}, -100));
}

TEST_F(Scrolling, AContentThatShrinksIsNotLeftOutOfSight)
{
    scroll->setContentOffset(360);
    scroll->setContentHeight(300);
    window->commit();
    EXPECT_EQ(scroll->contentOffset(), 100);
}

TEST_F(Scrolling, TheContentFollowsTheFingerFromWhereItWas)
{
    scroll->setContentOffset(100);
    window->commit();
    window->touchDown({1, {200, 280}, {}});
    window->touchMove({1, {200, 260}, {}});
    const double begun = scroll->contentOffset();
    window->touchMove({1, {200, 230}, {}});
    EXPECT_EQ(scroll->contentOffset(), begun + 30);
    EXPECT_GE(begun, 100);
    window->touchUp({1, {200, 225}, std::chrono::seconds(1)});
    EXPECT_EQ(scroll->contentOffset(), begun + 35) << "also the last bit of its way";
}

TEST_F(Scrolling, AThrowSlowsDownEvenly)
{
    scroll->setContentHeight(50'000);
    window->commit();
    drag(280, 230, std::chrono::milliseconds(10));
    std::vector<double> steps;
    double before = scroll->contentOffset();
    while (machine.mainQueue.untilNext() && steps.size() < 1000) {
        machine.advance(std::chrono::milliseconds(16));
        steps.push_back(scroll->contentOffset() - before);
        before = scroll->contentOffset();
    }
    ASSERT_GT(steps.size(), 10U);
    EXPECT_NEAR(steps[0], 500 * 0.016, 1e-6) << "as fast as the finger was";
    for (std::size_t i = 1; i < steps.size(); ++i)
        EXPECT_NEAR(steps[i], steps[i - 1] * 0.95, 1e-6);
    EXPECT_GE(steps.back() / 0.016, 20);
    EXPECT_LT(steps.back() / 0.016 * 0.95, 20) << "slower than that nobody sees it move";
}

TEST_F(Scrolling, TheWheelAndTheFocusStopAThrow)
{
    const auto isAtRest = [this] {
        window->commit();
        const double before = scroll->contentOffset();
        machine.advance(std::chrono::milliseconds(16));
        return scroll->contentOffset() == before;
    };
    drag(280, 230, std::chrono::milliseconds(10));
    EXPECT_FALSE(isAtRest());
    window->scroll({200, 150}, -1);
    EXPECT_TRUE(isAtRest());
    drag(280, 230, std::chrono::milliseconds(10));
    EXPECT_FALSE(isAtRest());
    scroll->reveal(*rows[3]);
    EXPECT_TRUE(isAtRest());
}

TEST_F(Scrolling, WhatIsRevealedHasABitOfItsNeighbourBesideIt)
{
    const auto reveal = [this](std::size_t row, double from) {
        scroll->setContentOffset(from);
        window->commit();
        scroll->reveal(*rows[row]);
        return scroll->contentOffset();
    };
    EXPECT_EQ(reveal(5, 0), 6 * 56 + 8 - 200);
    EXPECT_EQ(reveal(3, 360), 3 * 56 - 8);
    EXPECT_EQ(reveal(5, 140), 144) << "it is there, but nothing beside it";
    EXPECT_EQ(reveal(3, 164), 160);
    EXPECT_EQ(reveal(5, 150), 150) << "what is there already stays";
    EXPECT_EQ(reveal(0, 360), 0);
    EXPECT_EQ(reveal(9, 0), 360);
    const auto elsewhere = add<platform::ListRow>(base::Rect::make(0, 700, 400, 56), window);
    scroll->reveal(*elsewhere);
    EXPECT_EQ(scroll->contentOffset(), 360) << "what is not in it is nothing to it";
}

TEST_F(Scrolling, AScrollerSaysWhatPartIsSeen)
{
    const auto scroller = [this] {
        window->commit();
        return scroll->subviews().back();
    };
    const double length = 194.0 * 200 / 560;
    const auto expectAt = [&](double x, double y, double height) {
        const base::Rect frame = scroller()->frame();
        EXPECT_EQ(frame.minX(), x);
        EXPECT_NEAR(frame.minY(), y, 1e-6);
        EXPECT_EQ(frame.width(), 3);
        EXPECT_NEAR(frame.height(), height, 1e-6);
    };
    expectAt(394, 3, length);
    EXPECT_FALSE(scroller()->isHidden());
    scroll->setContentOffset(180);
    expectAt(394, 3 + (194 - length) / 2, length);
    scroll->setContentOffset(360);
    expectAt(394, 197 - length, length);
    window->setRightToLeft(true);
    expectAt(3, 197 - length, length);
    window->setRightToLeft(false);
    tap(395, 296);
    EXPECT_THAT(target->senders, ElementsAre(rows[9])) << "it is not in the way";
    scroll->setContentHeight(50'000);
    scroll->setContentOffset(0);
    expectAt(394, 3, 24);
    EXPECT_EQ(scroll->contentView()->frame(), base::Rect::make(0, 0, 400, 50'000));
    scroll->setContentHeight(200);
    EXPECT_TRUE(scroller()->isHidden()) << "all of it is seen";
}

TEST_F(Scrolling, IsGoneWhenNobodyHoldsIt)
{
    const std::weak_ptr<platform::View> weak = scroll;
    scroll->removeFromSuperview();
    scroll.reset();
    rows.clear();
    EXPECT_TRUE(weak.expired());
}

TEST(AText, TakesNoMoreLinesThanItMay)
{
    const platform::EstimatedText estimate;
    const double one = estimate.heightOf("short", {}, 200, 3);
    EXPECT_GT(one, 0);
    EXPECT_EQ(estimate.heightOf(std::string(1000, 'x'), {}, 200, 3), estimate.heightOf("a\nb\nc\nd", {}, 200, 3));
    EXPECT_GT(estimate.heightOf("a\nb", {}, 200, 0), one);
    EXPECT_EQ(estimate.heightOf("", {}, 200, 3), 0);
}

struct Progressing : WindowFixture {
    std::shared_ptr<platform::ProgressView> bar = add<platform::ProgressView>(base::Rect::make(0, 0, 200, 4), window);
    base::Rect fill() const { return bar->subviews().back()->frame(); }
};

TEST_F(Progressing, FillsFromWhereRowsBegin)
{
    bar->setProgress(0.25, "25 %");
    window->commit();
    EXPECT_EQ(fill(), base::Rect::make(0, 0, 50, 4));
    EXPECT_EQ(bar->accessibility().role, platform::AccessibilityRole::Progress);
    EXPECT_EQ(bar->accessibility().value, "25 %");
    EXPECT_EQ(bar->accessibility().maximum, 1);
    window->setRightToLeft(true);
    window->commit();
    EXPECT_EQ(fill(), base::Rect::make(150, 0, 50, 4));
    bar->setProgress(7);
    window->commit();
    EXPECT_EQ(fill().width(), 200);
}

TEST_F(Progressing, RunsAlongWhileNobodyKnowsHowFarItIs)
{
    window->commit();
    EXPECT_FALSE(machine.mainQueue.untilNext()) << "nothing moves at first";
    bar->setProgress(std::nullopt);
    window->commit();
    const base::Rect before = fill();
    EXPECT_EQ(bar->accessibility().maximum, 0);
    machine.advance(std::chrono::seconds(1));
    EXPECT_NE(fill(), before);
    bar->setProgress(1);
    machine.advance(std::chrono::seconds(1));
    EXPECT_FALSE(machine.mainQueue.untilNext()) << "and stands still when it is known";
}

TEST_F(Progressing, OfSomebodyWhoLooksMovesWhileHeLooks)
{
    const auto dots = add<platform::ActivityIndicator>(base::Rect::make(0, 20, 28, 8), window);
    window->commit();
    EXPECT_FALSE(machine.mainQueue.untilNext());
    dots->setAnimating(true);
    machine.advance(std::chrono::seconds(2));
    EXPECT_TRUE(machine.mainQueue.untilNext());
    dots->setAnimating(false);
    machine.advance(std::chrono::seconds(2));
    EXPECT_FALSE(machine.mainQueue.untilNext());
}

} // namespace

} // namespace tests
