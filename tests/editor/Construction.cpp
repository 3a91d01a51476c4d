#include "EditorFixture.h"

#include "overlay/VKHighFidelityVideoOverlayButton.h"

#include <cstdlib>

using base::Rect;
using platform::BarButtonItem;
using platform::View;

namespace {

class Construction : public EditorTest {};

/// Runs `test` in a process of its own: the home-button answer is asked for once a process.
#define IN_A_PROCESS_OF_ITS_OWN(test)                                                                                  \
    EXPECT_EXIT(                                                                                                       \
        {                                                                                                              \
            test;                                                                                                      \
            std::_Exit(testing::Test::HasFailure() ? 1 : 0);                                                           \
        },                                                                                                             \
        testing::ExitedWithCode(0), "")

} // namespace

TEST_F(Construction, WithoutARectangleTheViewKeepsItsDefaultFrame)
{
    const Rect usual = std::make_shared<platform::ViewController>()->view()->frame();
    editor = VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName(
        fake->platform, "org.example.Game", base::Url::fromPath(kMovie), "Game");
    EXPECT_EQ(editor->view()->frame(), usual);
    EXPECT_EQ(editor->topToolBar()->tintColor(), std::nullopt);
}

TEST_F(Construction, ARectangleWithAreaBecomesTheViewsFrame)
{
    const Rect rect = Rect::make(10, 20, 300, 500);
    editor = VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName_overrideTintColor_size(
        fake->platform, {}, {}, {}, {}, rect);
    EXPECT_EQ(editor->view()->frame(), rect);
}

TEST_F(Construction, AnEmptyRectangleIsAsGoodAsNone)
{
    const Rect usual = std::make_shared<platform::ViewController>()->view()->frame();
    for (const Rect rect : {Rect::null(), Rect::make(5, 5, 0, 100), Rect::make(5, 5, 100, 0)}) {
        const auto other =
            VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName_overrideTintColor_size(
                fake->platform, {}, {}, {}, {}, rect);
        EXPECT_EQ(other->view()->frame(), usual);
    }
}

TEST_F(Construction, EverythingStartsAsTheUserFindsIt)
{
    open();
    EXPECT_TRUE(editor->isIntroMode());
    EXPECT_FALSE(editor->isTrimming());
    EXPECT_FALSE(editor->isExporting());
    EXPECT_FALSE(editor->isScrubbing());
    EXPECT_FALSE(editor->isUIHidden());
    EXPECT_FALSE(editor->isShareSheetUp());
    EXPECT_FALSE(editor->hasEdit());
    EXPECT_FALSE(editor->isPadMode());
    ASSERT_TRUE(editor->activityTypes());
    EXPECT_TRUE(editor->activityTypes()->empty());
    EXPECT_EQ(editor->videoURL(), base::Url::fromPath(kMovie));
    EXPECT_EQ(editor->originalVideoURL(), base::Url::fromPath(kMovie));
    EXPECT_EQ(editor->bundleIdentifier(), "org.example.Game");
    EXPECT_EQ(editor->trimFilePath(), base::Url::fromPath("/private/var/mobile/Library/Velkor//Game_1700000000.mp4"));
    ASSERT_EQ(player().seeks().size(), 1U);
    EXPECT_EQ(player().seeks().front(), base::MediaTime::zero());
}

TEST_F(Construction, TheTitleShowsTheAppWithTheRecordingsDateHangingBelow)
{
    fake->files.addFile(kMovie, 5, base::Date{1'234.0});
    open();
    const auto title = editor->titleLabel();
    EXPECT_EQ(title->text(), "Game");
    EXPECT_EQ(title->fontSize(), 15);
    EXPECT_EQ(title->textColor(), platform::Color::black());
    EXPECT_EQ(title->textAlignment(), platform::TextAlignment::Center);
    EXPECT_FALSE(title->clipsToBounds());
    EXPECT_EQ(title->frame().size, (base::Size{120, 17}));
    ASSERT_EQ(title->subviews().size(), 1U);
    const auto date = std::dynamic_pointer_cast<platform::Label>(title->subviews().front());
    ASSERT_TRUE(date);
    EXPECT_EQ(date->text(), "MMMM d hh:mm a @ 1234");
    EXPECT_EQ(date->fontSize(), 10);
    EXPECT_EQ(date->frame(), Rect::make(0, 17, 120, 17));
    EXPECT_EQ(date->textColor(), platform::Color::black());
    EXPECT_EQ(date->textAlignment(), platform::TextAlignment::Center);
    for (const auto& line : {title, date})
        EXPECT_EQ(line->backgroundColor(), platform::Color::clear()) << "the bar shines through";
    EXPECT_EQ(editor->titleButton()->view(), title);
}

TEST_F(Construction, TheTitleIsMadeAtTheOriginForItsBarToPlace)
{
    editor = VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName(
        fake->platform, "org.example.Game", base::Url::fromPath(kMovie), "Game");
    EXPECT_EQ(editor->titleLabel()->frame(), Rect::make(0, 0, 120, 17));
}

TEST_F(Construction, TheBarsAreAsWideAsTheViewAndAskTheEditor)
{
    open();
    for (const auto& bar : {editor->topToolBar(), editor->bottomToolBar()}) {
        EXPECT_EQ(bar->delegate(), editor);
        EXPECT_EQ(bar->autoresizingMask(), unsigned{platform::kFlexibleWidth});
    }
    editor->view()->setFrame(Rect::make(0, 0, 500, 720));
    EXPECT_EQ(editor->topToolBar()->frame().width(), 500);
    EXPECT_EQ(editor->bottomToolBar()->frame().width(), 500);
}

TEST_F(Construction, WhatCanBeTouchedHasANameForThoseWhoDoNotSeeIt)
{
    open();
    EXPECT_EQ(editor->videoOverlay()->accessibilityLabel(), "Recording");
    EXPECT_EQ(editor->topToolBar()->accessibilityLabel(), "Recording");
    EXPECT_EQ(editor->bottomToolBar()->accessibilityLabel(), "Playback");
}

TEST_F(Construction, NothingIsCheckedAnEditorWithoutAMovieStillOpensAndCloses)
{
    open(std::nullopt);
    EXPECT_FALSE(editor->currentItemLoaded());
    EXPECT_TRUE(std::isnan(editor->getPlayerDuration()));
    tap(editor->cancelButton()->view());
    EXPECT_EQ(delegate->finishes.size(), 1U);
}

TEST_F(Construction, TheViewsStandBackToFront)
{
    open();
    std::vector<const runtime::Object*> order;
    for (const View::Child& child : editor->view()->children())
        std::visit([&](const auto& each) { order.push_back(each.get()); }, child);
    ASSERT_EQ(order.size(), 7U);
    EXPECT_EQ(editor->view()->subviews().front()->backgroundColor(), platform::Color::black());
    EXPECT_EQ(order[1], editor->avPlayerLayer().get());
    EXPECT_EQ(order[2], editor->videoOverlay().get());
    EXPECT_EQ(order[3], editor->topToolBar().get());
    EXPECT_EQ(order[4], editor->scrubberContainterView().get());
    EXPECT_EQ(order[5], editor->videoOverlayPlayButton()->asView().get());
    // The phone arrangement brings its bar to the front of all.
    EXPECT_EQ(order[6], editor->bottomToolBar().get());
}

TEST_F(Construction, TheLargePlayButtonIsCentredOnTheScreen)
{
    open();
    EXPECT_EQ(editor->videoOverlayPlayButton()->asView()->frame(), Rect::make(140, 320, 80, 80));
    EXPECT_EQ(editor->videoOverlayPlayButton()->style(), 0);
}

TEST_F(Construction, TheScrubberIsSetUpForTrimming)
{
    open();
    EXPECT_EQ(editor->avTrimmer()->minimumTrimLength(), 1.0);
    EXPECT_EQ(editor->avTrimmer()->zoomDelay(), 0.5);
    EXPECT_EQ(editor->avTrimmer()->edgeInset(), 10.0);
    EXPECT_TRUE(editor->avTrimmer()->isEditable());
    EXPECT_EQ(editor->avTrimmer()->superview(), editor->scrubberContainterView());
    EXPECT_EQ(editor->scrubberContainterView()->style(), 2010);
}

TEST_F(Construction, TheItemsAreOfTheStandardKindsAndActOnTheEditor)
{
    open();
    using Kind = BarButtonItem::Kind;
    const std::vector<std::tuple<std::shared_ptr<BarButtonItem>, Kind, std::string>> expected{
        {editor->shareButton(), Kind::Action, "shareAction"}, {editor->undoButton(), Kind::Undo, "undoAction"},
        {editor->pauseButton(), Kind::Pause, "pauseAction"},  {editor->playButton(), Kind::Play, "playAction"},
        {editor->doneButton(), Kind::Done, "doneAction"},     {editor->saveButton(), Kind::Save, "saveAction"},
        {editor->cancelButton(), Kind::Cancel, "doneAction"}, {editor->cancelTrimButton(), Kind::Cancel, "undoAction"},
        {editor->trimButton(), Kind::Done, "saveAction"},
    };
    for (const auto& [item, kind, action] : expected) {
        EXPECT_EQ(item->kind(), kind) << action;
        EXPECT_EQ(item->targetAction().action().name(), action);
        EXPECT_EQ(item->targetAction().target(), editor);
    }
    EXPECT_EQ(editor->flexSpace()->kind(), Kind::FlexibleSpace);
    EXPECT_EQ(editor->fixSpace()->kind(), Kind::FixedSpace);
    EXPECT_DOUBLE_EQ(editor->fixSpace()->width(), 360 * 0.005);
}

TEST_F(Construction, ATintColoursTheTopBarOnly)
{
    const auto tinted =
        VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName_overrideTintColor_size(
            fake->platform, {}, {}, {}, platform::Color{1, 0, 0, 1}, Rect::make(0, 0, 360, 720));
    EXPECT_EQ(tinted->topToolBar()->tintColor(), (platform::Color{1, 0, 0, 1}));
    EXPECT_EQ(tinted->bottomToolBar()->tintColor(), std::nullopt);
}

TEST_F(Construction, ADeviceWithoutAHomeButtonHasTallerBars)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    IN_A_PROCESS_OF_ITS_OWN({
        fake->device.integers[std::string(platform::kDeviceHomeButtonKey)] = 2;
        open();
        EXPECT_FALSE(editor->hasHomeButton());
        EXPECT_EQ(editor->topToolBar()->frame(), Rect::make(0, 0, 360, 85));
        EXPECT_EQ(editor->bottomToolBar()->frame(), Rect::make(0, 720 - 64, 360, 64));
    });
}

TEST_F(Construction, AnyOtherAnswerMeansAHomeButton)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    for (const int answer : {0, 1, 3, -2}) {
        IN_A_PROCESS_OF_ITS_OWN({
            if (answer != 0)
                fake->device.integers[std::string(platform::kDeviceHomeButtonKey)] = answer;
            open();
            EXPECT_TRUE(editor->hasHomeButton());
            EXPECT_EQ(editor->topToolBar()->frame(), Rect::make(0, 0, 360, 60));
            EXPECT_EQ(editor->bottomToolBar()->frame(), Rect::make(0, 720 - 44, 360, 44));
        });
    }
}

TEST_F(Construction, ADeviceThatDoesNotKnowIsAskedForNought)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    IN_A_PROCESS_OF_ITS_OWN({
        open();
        EXPECT_EQ(fake->device.fallbacks, (std::vector<std::pair<std::string, std::int32_t>>{
                                              {std::string(platform::kDeviceHomeButtonKey), 0}}));
    });
}

TEST_F(Construction, TheHomeButtonIsAskedForOnceAProcess)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    IN_A_PROCESS_OF_ITS_OWN({
        open();
        fake->device.integers[std::string(platform::kDeviceHomeButtonKey)] = 2;
        EXPECT_TRUE(editor->deviceHasHomeButton());
    });
}
