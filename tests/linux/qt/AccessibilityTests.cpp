// What assistive technology sees and does, asked for as a screen reader's bridge would.
#include "Stage.h"

#include "linux/qt/StageWindow.h"
#include "linux/qt/accessibility/ViewAccessible.h"

#include <QAccessible>
#include <QAccessibleActionInterface>
#include <QAccessibleValueInterface>

namespace tests {

namespace {

class Accessible : public Stage {
protected:
    Accessible()
    {
        presenter->setTitle("Clipsa");
        bar = add<platform::Toolbar>(base::Rect::make(0, 0, 200, 44));
        button = std::make_shared<platform::Button>(base::Rect::make(8, 0, 60, 44));
        button->setTitle("Save");
        button->addTarget(target, Target::action(), platform::kTouchUpInside);
        bar->addSubview(button);
        const auto holder = add<platform::View>(base::Rect::make(0, 50, 200, 50));
        scrubber = std::make_shared<platform::MovieScrubber>(words);
        scrubber->setFrame(base::Rect::make(0, 10, 200, 38));
        scrubber->setDataSource(movie);
        scrubber->setDelegate(movie);
        scrubber->reloadData();
        holder->addSubview(scrubber);
        presenter->commit();
    }

    QAccessibleInterface* root() { return QAccessible::queryAccessibleInterface(&presenter->quickWindow()); }
    QAccessibleInterface* interfaceOf(const platform::View& view)
    {
        return QAccessible::queryAccessibleInterface(presenter->mirror().itemFor(view));
    }

    std::shared_ptr<Target> target = std::make_shared<Target>();
    std::shared_ptr<Movie> movie = std::make_shared<Movie>();
    std::shared_ptr<platform::Toolbar> bar;
    std::shared_ptr<platform::Button> button;
    std::shared_ptr<platform::MovieScrubber> scrubber;
};

TEST_F(Accessible, TheTreeHoldsWhatHasARole)
{
    ASSERT_TRUE(root());
    EXPECT_EQ(root()->role(), QAccessible::Window);
    EXPECT_EQ(root()->text(QAccessible::Name), "Clipsa");
    ASSERT_EQ(root()->childCount(), 2) << "a view without a role gives way to what it holds";
    QAccessibleInterface* toolbar = root()->child(0);
    EXPECT_EQ(toolbar->role(), QAccessible::ToolBar);
    ASSERT_EQ(toolbar->childCount(), 1);
    EXPECT_EQ(toolbar->child(0)->role(), QAccessible::Button);
    EXPECT_EQ(toolbar->child(0)->text(QAccessible::Name), "Save");
    EXPECT_EQ(root()->child(1)->role(), QAccessible::Slider);
    EXPECT_EQ(root()->child(2), nullptr);
}

TEST_F(Accessible, ParentsAndChildrenKnowEachOther)
{
    QAccessibleInterface* toolbar = root()->child(0);
    QAccessibleInterface* save = toolbar->child(0);
    EXPECT_EQ(save->parent(), toolbar);
    EXPECT_EQ(toolbar->parent(), root());
    EXPECT_EQ(root()->indexOfChild(toolbar), 0);
    EXPECT_EQ(toolbar->indexOfChild(save), 0);
    EXPECT_EQ(root()->child(1)->parent(), root());
    EXPECT_EQ(save->window(), &presenter->quickWindow());
}

TEST_F(Accessible, RectanglesAreThoseOfTheScreen)
{
    presenter->quickWindow().setPosition(30, 40);
    settle();
    EXPECT_EQ(interfaceOf(*button)->rect(), QRect(38, 40, 60, 44));
    EXPECT_EQ(root()->childAt(40, 50), interfaceOf(*button));
    EXPECT_EQ(root()->childAt(150, 50), interfaceOf(*bar));
}

TEST_F(Accessible, PressingRunsTheAction)
{
    QAccessibleActionInterface* actions = interfaceOf(*button)->actionInterface();
    ASSERT_TRUE(actions);
    EXPECT_TRUE(actions->actionNames().contains(QAccessibleActionInterface::pressAction()));
    actions->doAction(QAccessibleActionInterface::pressAction());
    EXPECT_EQ(target->senders.size(), 1U);
    button->setEnabled(false);
    EXPECT_TRUE(interfaceOf(*button)->state().disabled);
    EXPECT_TRUE(actions->actionNames().isEmpty());
    actions->doAction(QAccessibleActionInterface::pressAction());
    EXPECT_EQ(target->senders.size(), 1U);
}

TEST_F(Accessible, ASliderHasAValueAndMoves)
{
    QAccessibleInterface* slider = interfaceOf(*scrubber);
    EXPECT_EQ(slider->text(QAccessible::Value), "0 s of 10 s");
    QAccessibleValueInterface* value = slider->valueInterface();
    ASSERT_TRUE(value);
    EXPECT_EQ(value->maximumValue().toDouble(), 10);
    value->setCurrentValue(4);
    EXPECT_EQ(movie->value, 4);
    EXPECT_EQ(value->currentValue().toDouble(), 4);
    slider->actionInterface()->doAction(QAccessibleActionInterface::increaseAction());
    EXPECT_EQ(movie->value, 5);
    slider->actionInterface()->doAction(QAccessibleActionInterface::decreaseAction());
    EXPECT_EQ(movie->value, 4);
    value->setCurrentValue(99);
    EXPECT_EQ(movie->value, 10);
}

TEST_F(Accessible, TheFocusCanBeMoved)
{
    EXPECT_TRUE(interfaceOf(*scrubber)->state().focusable);
    interfaceOf(*scrubber)->actionInterface()->doAction(QAccessibleActionInterface::setFocusAction());
    EXPECT_EQ(window->focusedView(), scrubber);
    EXPECT_TRUE(interfaceOf(*scrubber)->state().focused);
    EXPECT_EQ(root()->focusChild(), interfaceOf(*scrubber));
}

TEST_F(Accessible, TheFocusAndItsValueAreTold)
{
    std::vector<std::pair<QAccessible::Event, QAccessibleInterface*>> events;
    qtui::Announcer announcer(
        [&](QAccessibleEvent* event) { events.emplace_back(event->type(), event->accessibleInterface()); });
    auto& stage = dynamic_cast<qtui::StageWindow&>(presenter->quickWindow());
    const auto told = [&](QAccessible::Event event, const platform::View& view) {
        events.clear();
        announcer.announce(stage);
        return events == std::vector{std::pair(event, interfaceOf(view))};
    };
    window->moveFocus(true);
    EXPECT_TRUE(told(QAccessible::Focus, *button));
    window->moveFocus(true);
    EXPECT_TRUE(told(QAccessible::Focus, *scrubber));
    announcer.announce(stage);
    EXPECT_EQ(events.size(), 1U) << "once";
    scrubber->setValue(7);
    EXPECT_TRUE(told(QAccessible::ValueChanged, *scrubber));
}

TEST_F(Accessible, WhatCannotBeSeenIsNotThere)
{
    bar->setAlpha(0);
    ASSERT_EQ(root()->childCount(), 1);
    EXPECT_EQ(root()->child(0)->role(), QAccessible::Slider);
    bar->setAlpha(1);
    button->removeFromSuperview();
    presenter->commit();
    EXPECT_EQ(root()->child(0)->childCount(), 0);
}

constexpr const char* kCutOff = "This recording was cut off: only the first 1.0 s are there.";

class SaidOfAVideo : public Stage {
protected:
    SaidOfAVideo()
    {
        add<platform::Toolbar>(base::Rect::make(0, 0, 200, 44));
        movie.cutOff = platform::CutOff{1, {}};
    }

    QAccessibleInterface* root() { return QAccessible::queryAccessibleInterface(&presenter->quickWindow()); }
    std::shared_ptr<FakePlayer> addVideo(base::Rect frame)
    {
        item = std::make_shared<FakePlayerItem>(std::make_shared<FakeAsset>(mainQueue, std::nullopt));
        return addPlayer(frame, white, item);
    }
    void showNow()
    {
        settle();
        presenter->commit();
    }
    /// What is told with the next picture: each event with the name of what it is of.
    std::vector<std::pair<QAccessible::Event, QString>> told()
    {
        showNow();
        events.clear();
        announcer.announce(dynamic_cast<qtui::StageWindow&>(presenter->quickWindow()));
        return events;
    }

    using Event = std::pair<QAccessible::Event, QString>;
    std::vector<Event> events;
    qtui::Announcer announcer{[this](QAccessibleEvent* event) {
        events.emplace_back(event->type(), event->accessibleInterface()->text(QAccessible::Name));
    }};
    FakeMovie movie = FakeMovie::lasting(10);
    std::shared_ptr<FakePlayerItem> item;
    platform::VideoFrameRef white =
        std::make_shared<FakeVideoFrame>(base::MediaTime::zero(), base::Size{200, 100}, 0xffffffff);
};

TEST_F(SaidOfAVideo, IsAMessageOfTheWindowBeforeItsViews)
{
    addVideo(base::Rect::make(0, 0, 200, 100));
    showNow();
    ASSERT_EQ(root()->childCount(), 1) << "a picture says nothing";
    item->becomeReady(movie);
    showNow();
    ASSERT_EQ(root()->childCount(), 2);
    QAccessibleInterface* message = root()->child(0);
    EXPECT_EQ(message->role(), QAccessible::AlertMessage);
    EXPECT_EQ(message->text(QAccessible::Name), kCutOff);
    EXPECT_EQ(message->parent(), root());
    EXPECT_EQ(message->rect().size(), QSize(200, 100));
    EXPECT_FALSE(message->state().invisible);
    EXPECT_EQ(root()->indexOfChild(message), 0);
    EXPECT_EQ(root()->child(1)->role(), QAccessible::ToolBar);
    EXPECT_EQ(root()->child(2), nullptr);
    const QPoint origin = presenter->quickWindow().position();
    EXPECT_EQ(root()->childAt(origin.x() + 5, origin.y() + 5), root()->child(1)) << "which is in front";
    EXPECT_EQ(root()->childAt(origin.x() + 5, origin.y() + 80), message);
}

TEST_F(SaidOfAVideo, IsWhyItCannotBePlayedToo)
{
    const auto broken = std::make_shared<FakePlayerItem>(nullptr);
    addPlayer(base::Rect::make(0, 0, 200, 100), nullptr, broken);
    broken->fail(base::Error::make("fake", -1, "It is damaged."));
    showNow();
    ASSERT_EQ(root()->childCount(), 2);
    EXPECT_EQ(root()->child(0)->text(QAccessible::Name), "It is damaged.");
}

TEST_F(SaidOfAVideo, IsToldOnceAndGoesWhenItPlays)
{
    const auto player = addVideo(base::Rect::make(0, 0, 200, 100));
    EXPECT_TRUE(told().empty());
    item->becomeReady(movie);
    EXPECT_EQ(told(), (std::vector<Event>{{QAccessible::ObjectShow, kCutOff}, {QAccessible::Alert, kCutOff}}));
    EXPECT_TRUE(told().empty()) << "once";
    player->play();
    player->show(white);
    EXPECT_EQ(told(), (std::vector<Event>{{QAccessible::ObjectHide, ""}}));
    EXPECT_EQ(root()->childCount(), 1);
    player->pause();
    player->show(white);
    EXPECT_EQ(told().size(), 2U);
}

TEST_F(SaidOfAVideo, IsNotThereWhileTheVideoIsOutOfSight)
{
    addVideo(base::Rect::make(0, 0, 200, 100));
    item->becomeReady(movie);
    showNow();
    ASSERT_EQ(root()->childCount(), 2);
    window->setAlpha(0);
    showNow();
    EXPECT_EQ(root()->childCount(), 1);
}

} // namespace

} // namespace tests
