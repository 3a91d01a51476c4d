// Alerts: what they say, what can be done about it, and where all of it stands.
#include "Fixture.h"

#include "platform/views/AlertController.h"
#include "platform/views/Presentation.h"

#include <algorithm>
#include <chrono>

namespace tests {

namespace {

using platform::Key;
using testing::ElementsAre;
using testing::IsEmpty;

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
    base::Rect surface() const { return window->topPresentation()->surface()->frame(); }
    std::vector<base::Rect> separators()
    {
        std::vector<base::Rect> found;
        for (const auto& each : alert->view()->subviews())
            if (std::dynamic_pointer_cast<platform::SurfaceView>(each))
                found.push_back(each->frame());
        return found;
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

TEST_F(Alerting, ItsWordsStandAboveItsButtonsInTheMiddleOfTheWindow)
{
    addAction("Keep", platform::AlertAction::Style::Cancel);
    addAction("Delete", platform::AlertAction::Style::Destructive);
    present();
    const auto views = alert->view()->subviews();
    const auto title = std::dynamic_pointer_cast<platform::Label>(views.at(0));
    const auto message = std::dynamic_pointer_cast<platform::Label>(views.at(1));
    ASSERT_TRUE(title && message);
    EXPECT_EQ(title->text(), "Delete it?");
    EXPECT_EQ(message->text(), "It cannot be brought back.");
    EXPECT_TRUE(title->isEmphasized());
    for (const auto& label : {title, message})
        EXPECT_EQ(label->textAlignment(), platform::TextAlignment::Center);
    EXPECT_EQ(surface(), base::Rect::make(56, 334, 288, 133));
    EXPECT_EQ(alert->view()->frame(), base::Rect::make(0, 0, 288, 133));
    EXPECT_EQ(title->frame(), base::Rect::make(20, 20, 248, 22));
    EXPECT_EQ(message->frame(), base::Rect::make(20, 50, 248, 19));
    EXPECT_EQ(buttons()[0]->frame(), base::Rect::make(0, 89, 144, 44));
    EXPECT_EQ(buttons()[1]->frame(), base::Rect::make(144, 89, 144, 44));
    EXPECT_THAT(separators(), ElementsAre(base::Rect::make(0, 89, 288, 0.5), base::Rect::make(144, 89, 0.5, 44)));
}

TEST_F(Alerting, ThreeButtonsStandOneAboveTheOther)
{
    for (const char* name : {"One", "Two", "Three"})
        addAction(name, platform::AlertAction::Style::Destructive);
    present();
    EXPECT_EQ(surface().height(), 89 + 3 * 44);
    for (int i = 0; i < 3; ++i) {
        EXPECT_EQ(buttons()[static_cast<std::size_t>(i)]->frame(), base::Rect::make(0, 89 + i * 44, 288, 44));
        EXPECT_EQ(separators()[static_cast<std::size_t>(i)], base::Rect::make(0, 89 + i * 44, 288, 0.5));
    }
}

TEST_F(Alerting, TwoButtonsStandSideBySideAsLongAsTheirTitlesHaveRoom)
{
    const auto heightWith = [this](std::size_t letters) {
        alert = std::make_shared<platform::AlertController>("Delete it?", "");
        addAction("Keep", platform::AlertAction::Style::Cancel);
        addAction(std::string(letters, 'x'), platform::AlertAction::Style::Default);
        return alert->contentSizeThatFits({288, 800}).height;
    };
    EXPECT_EQ(heightWith(11), 40 + 22 + 44);
    EXPECT_EQ(heightWith(12), 40 + 22 + 88);
}

TEST_F(Alerting, ItsWordsTakeTheirLinesAndNoMore)
{
    const auto heightWith = [this](std::size_t title, std::size_t message) {
        alert = std::make_shared<platform::AlertController>(std::string(title, 'x'), std::string(message, 'x'));
        addAction("OK", platform::AlertAction::Style::Default);
        return alert->contentSizeThatFits({288, 800}).height - 44 - 40;
    };
    EXPECT_EQ(heightWith(24, 0), 22);
    EXPECT_EQ(heightWith(25, 0), 43);
    EXPECT_EQ(heightWith(5000, 0), 64);
    EXPECT_EQ(heightWith(1, 27), 22 + 8 + 19);
    EXPECT_EQ(heightWith(1, 28), 22 + 8 + 38);
    EXPECT_EQ(heightWith(1, 5000), 22 + 8 + 188);
    EXPECT_EQ(alert->contentSizeThatFits({288, 100}).height, 100);
}

TEST_F(Alerting, WhatIsProposedStandsOutAndWhatCannotBeTakenBackIsMarked)
{
    using Style = platform::AlertAction::Style;
    const auto marks = [this](const std::vector<Style>& styles) {
        alert = std::make_shared<platform::AlertController>("Delete it?", "");
        for (const Style style : styles)
            addAction("x", style);
        std::string all;
        for (const auto& button : buttons())
            all += button->isEmphasized() ? "!" : button->isDestructive() ? "x" : ".";
        return all;
    };
    EXPECT_EQ(marks({Style::Cancel, Style::Default}), ".!");
    EXPECT_EQ(marks({Style::Cancel, Style::Destructive}), ".x");
    EXPECT_EQ(marks({Style::Cancel, Style::Destructive, Style::Default}), ".x!");
    EXPECT_EQ(marks({Style::Cancel}), "!");
}

TEST_F(Alerting, WithoutAMessageThereIsNone)
{
    alert = std::make_shared<platform::AlertController>("Done", "");
    addAction("OK", platform::AlertAction::Style::Default);
    present();
    EXPECT_TRUE(alert->view()->subviews().at(1)->isHidden());
    EXPECT_EQ(surface().height(), 40 + 22 + 44);
}

TEST_F(Alerting, OnALowScreenTheMessageIsCutOffAboveTheButtons)
{
    alert = std::make_shared<platform::AlertController>("Why", std::string(5000, 'w'));
    addAction("OK", platform::AlertAction::Style::Default);
    window->transitionToSize({640, 240});
    present();
    EXPECT_EQ(surface(), base::Rect::make(176, 8, 288, 224));
    EXPECT_EQ(alert->view()->subviews().at(1)->frame(), base::Rect::make(20, 50, 248, 110));
}

TEST_F(Alerting, TheOnlyActionIsDoneByEachKey)
{
    using Style = platform::AlertAction::Style;
    for (const auto& [style, key] : {std::pair{Style::Default, Key::Escape}, {Style::Cancel, Key::Return}}) {
        alert = std::make_shared<platform::AlertController>("Done", "");
        addAction("OK", style);
        present();
        window->keyDown(key);
        machine.drain();
        EXPECT_EQ(root->presentedViewController(), alert) << "it fades";
        settle();
        EXPECT_FALSE(root->presentedViewController());
    }
    EXPECT_THAT(picked, ElementsAre("OK", "OK"));
}

TEST_F(Alerting, KeysBeginAtWhatIsProposedOrElseDoesNoHarm)
{
    using Style = platform::AlertAction::Style;
    add<platform::Button>(base::Rect::make(0, 0, 100, 44), root->view());
    window->commit();
    const auto focused = [this](const std::vector<Style>& styles) {
        alert = std::make_shared<platform::AlertController>("Delete it?", "");
        for (const Style style : styles)
            addAction("x", style);
        window->moveFocus(true);
        present();
        const auto all = buttons();
        const auto place = std::find(all.begin(), all.end(), window->focusedView()) - all.begin();
        root->dismiss(false);
        settle();
        return place;
    };
    EXPECT_EQ(focused({Style::Cancel, Style::Default}), 1);
    EXPECT_EQ(focused({Style::Destructive, Style::Cancel}), 1);
    EXPECT_EQ(focused({Style::Destructive, Style::Destructive}), 0) << "then where all of them begin";
}

} // namespace

} // namespace tests
