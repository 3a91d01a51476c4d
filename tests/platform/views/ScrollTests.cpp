// Views that scroll, alerts, and what progress says.
#include "Fixture.h"

#include "platform/views/AlertController.h"
#include "platform/views/ListRow.h"
#include "platform/views/ProgressView.h"
#include "platform/views/ScrollView.h"

#include <chrono>

namespace tests {

namespace {

using platform::Key;
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

struct Alerting : WindowFixture {
    std::shared_ptr<Controller> root = controller("root");
    std::shared_ptr<platform::AlertController> alert =
        std::make_shared<platform::AlertController>("Delete it?", "It cannot be brought back.");
    std::vector<std::string> picked;

    Alerting()
    {
        window->setRootViewController(root);
        window->setVisible(true);
    }
    void addAction(const std::string& title, platform::AlertAction::Style style)
    {
        alert->addAction({title, style, [this, title] {
                              EXPECT_FALSE(root->presentedViewController()) << "it has gone first";
                              picked.push_back(title);
                          }});
    }
    void present()
    {
        root->present(alert, true);
        settle();
    }
    void settle()
    {
        machine.advance(std::chrono::milliseconds(300));
        window->commit();
    }
    std::vector<std::shared_ptr<platform::Button>> buttons()
    {
        std::vector<std::shared_ptr<platform::Button>> found;
        for (const auto& each : alert->view()->subviews())
            if (const auto button = std::dynamic_pointer_cast<platform::Button>(each))
                found.push_back(button);
        return found;
    }
};

TEST_F(Alerting, ReturnConfirmsAndEscapeCancels)
{
    addAction("Keep", platform::AlertAction::Style::Cancel);
    addAction("Delete", platform::AlertAction::Style::Default);
    present();
    EXPECT_TRUE(window->keyDown(Key::Return));
    settle();
    EXPECT_THAT(picked, ElementsAre("Delete"));
}

TEST_F(Alerting, EscapeDoesWhatCancelDoes)
{
    addAction("Keep", platform::AlertAction::Style::Cancel);
    addAction("Delete", platform::AlertAction::Style::Destructive);
    present();
    window->keyDown(Key::Return);
    settle();
    EXPECT_THAT(picked, IsEmpty()) << "what cannot be taken back is not done by a key pressed too often";
    EXPECT_TRUE(window->keyDown(Key::Escape));
    settle();
    EXPECT_THAT(picked, ElementsAre("Keep"));
}

TEST_F(Alerting, TheOnlyActionIsDoneByEveryWayOut)
{
    addAction("OK", platform::AlertAction::Style::Default);
    present();
    window->keyDown(Key::Escape);
    window->keyDown(Key::Return);
    settle();
    EXPECT_THAT(picked, ElementsAre("OK")) << "once";
}

TEST_F(Alerting, ItsButtonsAreHighEnoughForFingersAndStandSideBySideWhereTheyFit)
{
    addAction("Keep", platform::AlertAction::Style::Cancel);
    addAction("Delete", platform::AlertAction::Style::Destructive);
    present();
    const auto two = buttons();
    ASSERT_EQ(two.size(), 2U);
    EXPECT_EQ(two[0]->frame().height(), 44);
    EXPECT_EQ(two[0]->frame().minY(), two[1]->frame().minY());
    EXPECT_LT(two[0]->frame().minX(), two[1]->frame().minX());
    window->setRightToLeft(true);
    window->commit();
    EXPECT_GT(two[0]->frame().minX(), two[1]->frame().minX());
    tap(two[1]->convertToRoot({20, 20}).x, two[1]->convertToRoot({20, 20}).y);
    settle();
    EXPECT_THAT(picked, ElementsAre("Delete"));
}

TEST_F(Alerting, LongTitlesStandOneAboveTheOther)
{
    addAction("Keep everything as it is now", platform::AlertAction::Style::Cancel);
    addAction("Delete", platform::AlertAction::Style::Destructive);
    present();
    const auto two = buttons();
    EXPECT_EQ(two[0]->frame().maxY(), two[1]->frame().minY());
    EXPECT_EQ(two[0]->frame().width(), 288);
}

TEST_F(Alerting, ALongMessageLeavesTheButtonsOnTheScreen)
{
    alert = std::make_shared<platform::AlertController>("Why", std::string(5000, 'w'));
    addAction("OK", platform::AlertAction::Style::Default);
    window->transitionToSize({640, 240});
    present();
    const auto button = buttons().front();
    EXPECT_LE(button->convertToRoot({0, 44}).y, 240);
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
