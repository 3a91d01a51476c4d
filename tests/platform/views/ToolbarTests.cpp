#include "platform/views/Toolbar.h"

#include "platform/views/Label.h"
#include "support/EnglishWords.h"

#include "Fixture.h"

namespace {

using base::Rect;
using platform::BarButtonItem;
using platform::Button;
using platform::Toolbar;
using platform::View;
using testing::ElementsAre;
using testing::IsEmpty;
using Kind = BarButtonItem::Kind;

struct Bars : tests::WindowFixture {
    tests::EnglishWords words;
    std::shared_ptr<tests::Target> target = std::make_shared<tests::Target>();
    std::shared_ptr<Toolbar> bar = add<Toolbar>(Rect::make(0, 0, 400, 60), window);
    std::shared_ptr<BarButtonItem> flex = BarButtonItem::flexibleSpace();
    std::shared_ptr<BarButtonItem> fix = BarButtonItem::fixedSpace(2);
    std::shared_ptr<BarButtonItem> cancel = item(Kind::Cancel);
    std::shared_ptr<BarButtonItem> save = item(Kind::Save);
    std::shared_ptr<BarButtonItem> play = item(Kind::Play);
    std::shared_ptr<BarButtonItem> share = item(Kind::Action);
    std::shared_ptr<platform::Label> label = std::make_shared<platform::Label>(Rect::make(0, 0, 120, 17));
    std::shared_ptr<BarButtonItem> title = BarButtonItem::withCustomView(label);

    std::shared_ptr<BarButtonItem> item(Kind kind)
    {
        return std::make_shared<BarButtonItem>(words, kind, target, tests::Target::action());
    }
    void show(Toolbar::Items items)
    {
        bar->setItems(std::move(items));
        bar->layoutIfNeeded();
    }
    static Rect frame(const std::shared_ptr<BarButtonItem>& item) { return item->view()->frame(); }
};

TEST_F(Bars, TheTitleStandsInTheMiddleAndButtonsAtTheEnds)
{
    show({cancel, flex, title, flex, save});
    EXPECT_EQ(frame(cancel).minX(), Toolbar::kEndMargin);
    EXPECT_EQ(frame(save).maxX(), 400 - Toolbar::kEndMargin);
    EXPECT_EQ(frame(title), Rect::make(140, 21.5, 120, 17));
}

TEST_F(Bars, BeginAtTheRightWhereWordsDo)
{
    show({cancel, flex, title, flex, play, fix, save});
    std::vector<Rect> mirrored;
    for (const auto& item : {cancel, title, play, save})
        mirrored.push_back(
            Rect::make(400 - frame(item).maxX(), frame(item).minY(), frame(item).width(), frame(item).height()));
    window->setRightToLeft(true);
    bar->layoutIfNeeded();
    for (std::size_t i = 0; const auto& item : {cancel, title, play, save})
        EXPECT_EQ(frame(item), mirrored[i++]);
    EXPECT_EQ(frame(cancel).maxX(), 400 - Toolbar::kEndMargin);
    window->setRightToLeft(false);
    bar->layoutIfNeeded();
    EXPECT_EQ(frame(cancel).minX(), Toolbar::kEndMargin);
}

TEST_F(Bars, AButtonIsAsWideAsItsLettersWhateverTheAlphabet)
{
    const auto width = [](const char* text) {
        const auto button = std::make_shared<Button>();
        button->setTitle(text);
        return button->sizeThatFits().width;
    };
    EXPECT_NEAR(width("Cancel"), 6 * 0.6 * 17 + 16, 1e-9);
    EXPECT_NEAR(width("Отмена"), 6 * 0.6 * 17 + 16, 1e-9);
    EXPECT_NEAR(width("キャンセル"), 5 * 17 + 16, 1e-9);
    EXPECT_NEAR(width("취소하기요"), 5 * 17 + 16, 1e-9);
    EXPECT_EQ(width("Ok"), 44) << "a finger's width at least";
}

TEST_F(Bars, TheTitleMakesWayForNeighboursOnOneSide)
{
    bar->setFrame(Rect::make(0, 0, 340, 60));
    show({cancel, flex, title, flex, play, fix, share, fix, save});
    EXPECT_GE(frame(title).minX(), frame(cancel).maxX());
    EXPECT_EQ(frame(title).maxX(), frame(play).minX());
    EXPECT_LT(frame(title).width(), 120);
    EXPECT_EQ(frame(share).minX(), frame(play).maxX() + 2);
    EXPECT_NEAR(frame(save).maxX(), 332, 1e-9);
}

TEST_F(Bars, AShrunkTitleGrowsBackWhenThereIsRoom)
{
    show({cancel, flex, title, flex, save});
    bar->setFrame(Rect::make(0, 0, 180, 60));
    bar->layoutIfNeeded();
    EXPECT_LT(frame(title).width(), 120);
    EXPECT_GE(frame(title).minX(), frame(cancel).maxX());
    EXPECT_LE(frame(title).maxX(), frame(save).minX());
    bar->setFrame(Rect::make(0, 0, 100, 60));
    bar->layoutIfNeeded();
    EXPECT_EQ(frame(title).width(), 0);
    bar->setFrame(Rect::make(0, 0, 400, 60));
    bar->layoutIfNeeded();
    EXPECT_EQ(frame(title), Rect::make(140, 21.5, 120, 17));
}

TEST_F(Bars, AButtonBetweenFlexibleSpacesIsCentredInWhatIsLeft)
{
    show({flex, play, flex});
    EXPECT_EQ(frame(play).center().x, 200);
    show({share, flex, play, flex});
    EXPECT_EQ(frame(share).minX(), 8);
    EXPECT_EQ(frame(play).center().x, 222);
}

TEST_F(Bars, ButtonsAreLargeEnoughToTouchAndStayInsideTheBar)
{
    bar->setFrame(Rect::make(0, 0, 400, 44));
    const auto small = std::make_shared<Button>(Rect::make(0, 0, 10, 10));
    const auto custom = BarButtonItem::withCustomView(small);
    play->setWidth(12);
    show({play, custom, flex, save});
    for (const auto& each : {play, custom, save}) {
        EXPECT_GE(frame(each).width(), 44);
        EXPECT_EQ(frame(each).minY(), 0);
        EXPECT_EQ(frame(each).height(), 44);
    }
}

TEST_F(Bars, InAHigherBarTheTitlesOfButtonsStandLower)
{
    bar->setFrame(Rect::make(0, 0, 400, 85));
    show({cancel, flex, title, flex, play});
    EXPECT_EQ(frame(cancel).center().y, 50.5);
    EXPECT_EQ(frame(play).center().y, 42.5);
    EXPECT_EQ(frame(title).center().y, 42.5);
    bar->setFrame(Rect::make(0, 0, 400, 50));
    bar->layoutIfNeeded();
    EXPECT_EQ(frame(cancel).maxY(), 50);
}

TEST_F(Bars, OnlyTheViewsOfTheItemsAreInTheBar)
{
    show({cancel, fix, play, fix, save});
    EXPECT_THAT(bar->subviews(), ElementsAre(cancel->view(), play->view(), save->view()));
    show({cancel, flex, share});
    EXPECT_THAT(bar->subviews(), ElementsAre(cancel->view(), share->view()));
    EXPECT_EQ(play->view()->superview(), nullptr);
    show({});
    EXPECT_THAT(bar->subviews(), IsEmpty());
}

TEST_F(Bars, TheSameItemsAgainAreNoWork)
{
    show({cancel, flex, save});
    const auto before = bar->revision();
    bar->setItems({cancel, flex, save});
    EXPECT_EQ(bar->revision(), before);
    EXPECT_FALSE(bar->needsLayout());
}

TEST_F(Bars, AnItemThatAnotherBarTookComesBackWithTheSameItems)
{
    const auto other = add<Toolbar>(Rect::make(0, 100, 400, 44), window);
    show({share, flex, play});
    other->setItems({flex, play});
    EXPECT_EQ(play->view()->superview(), other);
    show({share, flex, play});
    EXPECT_EQ(play->view()->superview(), bar);
    other->setItems({});
    EXPECT_EQ(play->view()->superview(), bar);
}

TEST_F(Bars, StandardItemsHaveNamesAndLooks)
{
    const auto button = [](const std::shared_ptr<BarButtonItem>& item) {
        return std::dynamic_pointer_cast<Button>(item->view());
    };
    EXPECT_EQ(button(share)->glyph(), "share");
    EXPECT_EQ(button(share)->accessibility().name, "Share");
    EXPECT_EQ(button(play)->accessibility().name, "Play");
    EXPECT_EQ(button(item(Kind::Pause))->accessibility().name, "Pause");
    EXPECT_EQ(button(cancel)->title(), "Cancel");
    EXPECT_FALSE(button(cancel)->isEmphasized());
    EXPECT_TRUE(button(save)->isEmphasized());
    EXPECT_TRUE(button(item(Kind::Done))->isEmphasized());
    EXPECT_EQ(button(item(Kind::Undo))->title(), "Undo");
    EXPECT_EQ(flex->view(), nullptr);
    EXPECT_EQ(title->view(), label);
    share->setImageInsets({8, 0, -8, 0});
    EXPECT_EQ(button(share)->imageInsets(), (base::EdgeInsets{8, 0, -8, 0}));
}

TEST_F(Bars, ATapSendsTheItemsActionWithTheItemAsSender)
{
    show({play});
    tap(30, 30);
    EXPECT_THAT(target->senders, ElementsAre(play));
}

TEST_F(Bars, AnItemThatNobodyAnswersIsDisabledUntilSomebodyDoes)
{
    const auto lost = std::make_shared<BarButtonItem>(words, Kind::Save, target, runtime::Selector("unknown:"));
    show({lost, cancel});
    EXPECT_FALSE(std::dynamic_pointer_cast<Button>(lost->view())->isEnabled());
    EXPECT_TRUE(std::dynamic_pointer_cast<Button>(cancel->view())->isEnabled());
    target.reset();
    show({lost, cancel});
    EXPECT_FALSE(std::dynamic_pointer_cast<Button>(cancel->view())->isEnabled());
}

TEST_F(Bars, WhatIsNewInTheBarDoesNotFlyIn)
{
    show({play});
    play->view()->takeAnimations();
    platform::animate(machine.mainQueue, std::chrono::milliseconds(250), [this] { show({flex, play, share}); });
    EXPECT_EQ(play->view()->takeAnimations().size(), 1U);
    EXPECT_THAT(share->view()->takeAnimations(), IsEmpty());
}

} // namespace
