#include "EditorFixture.h"
#include "Story.h"

#include <gmock/gmock.h>

#include <tuple>

using platform::Key;
using platform::MotionSubtype;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

class Lifecycle : public EditorTest {};

} // namespace

TEST_F(Lifecycle, TheEditorIsFirstResponderWhileItIsShown)
{
    open();
    EXPECT_EQ(fake->window->firstResponder(), editor);
    fake->window->setVisible(false);
    EXPECT_EQ(fake->window->firstResponder(), nullptr);
}

TEST_F(Lifecycle, HidingAndAtOnceConfiguringShowsTheChromeAgain)
{
    open();
    editor->hideUI();
    EXPECT_TRUE(editor->isUIHidden());
    editor->configureClipsaUIHidden();
    EXPECT_FALSE(editor->isUIHidden());
    EXPECT_EQ(editor->topToolBar()->alpha(), 1.0);
}

TEST_F(Lifecycle, BarsAndScrubberFadeTogetherAndTheLargePlayButtonStays)
{
    open();
    editor->hideUI();
    for (const std::shared_ptr<platform::View>& view :
         {std::static_pointer_cast<platform::View>(editor->topToolBar()),
          std::static_pointer_cast<platform::View>(editor->bottomToolBar()),
          std::static_pointer_cast<platform::View>(editor->scrubberContainterView())}) {
        EXPECT_EQ(view->alpha(), 0.0);
        const auto animations = view->takeAnimations();
        ASSERT_EQ(animations.size(), 1U);
        EXPECT_EQ(animations.front().duration, std::chrono::milliseconds(250));
    }
    EXPECT_EQ(editor->videoOverlayPlayButton()->asView()->alpha(), 1.0);
    EXPECT_EQ(editor->titleLabel()->alpha(), 1.0);
}

TEST_F(Lifecycle, ATapOnTheMovieTogglesTheChromeAndNothingElse)
{
    open();
    tap(40, 200);
    EXPECT_TRUE(editor->isUIHidden());
    EXPECT_FALSE(player().isPlaying());
    tap(40, 200);
    EXPECT_FALSE(editor->isUIHidden());
}

TEST_F(Lifecycle, AFadedBarTakesNoTaps)
{
    open();
    const auto cancel = editor->cancelButton()->view();
    editor->hideUI();
    settle();
    tap(cancel);
    EXPECT_TRUE(delegate->finishes.empty());
    EXPECT_FALSE(editor->isUIHidden());
}

TEST_F(Lifecycle, AShakeWhileTrimmingUndoesAndIsPassedOn)
{
    open();
    editor->movieScrubberDidBeginEditing(*editor->avTrimmer());
    fake->window->motion(MotionSubtype::Shake);
    EXPECT_FALSE(editor->isTrimming());
    EXPECT_EQ(container->motions, 1);
}

TEST_F(Lifecycle, AShakeWhileExportingDoesNotUndoButIsPassedOn)
{
    open();
    editor->movieScrubberDidBeginEditing(*editor->avTrimmer());
    editor->setExporting(true);
    fake->window->motion(MotionSubtype::Shake);
    EXPECT_TRUE(editor->isTrimming());
    EXPECT_EQ(container->motions, 1);
}

TEST_F(Lifecycle, AShakeOutsideTrimModeChangesNothingButIsPassedOn)
{
    open();
    const auto expectNothingBut = [this](int motions) {
        Story story(*fake, editor);
        fake->window->motion(MotionSubtype::Shake);
        settle();
        EXPECT_THAT(story.end(), IsEmpty());
        EXPECT_EQ(container->motions, motions);
    };
    expectNothingBut(1); // before the first play, when the lower bar holds no play item
    editor->movieScrubberDidBeginEditing(*editor->avTrimmer());
    editor->undoAction();
    editor->playAction();
    expectNothingBut(2);
}

TEST_F(Lifecycle, OtherMotionsAreOnlyPassedOn)
{
    open();
    editor->movieScrubberDidBeginEditing(*editor->avTrimmer());
    fake->window->motion(MotionSubtype::None);
    EXPECT_TRUE(editor->isTrimming());
    EXPECT_EQ(container->motions, 1);
}

TEST_F(Lifecycle, ThePictureFillsTheViewAfterEachLayout)
{
    open();
    EXPECT_EQ(editor->avPlayerLayer()->frame(), base::Rect::make(0, 0, 360, 720));
    turnTo({720, 360});
    EXPECT_EQ(editor->avPlayerLayer()->frame(), base::Rect::make(0, 0, 720, 360));
}

TEST_F(Lifecycle, AReleasedEditorLeavesNoTemporaryFile)
{
    fake->files.addDirectory("/private/var/mobile/Library/Velkor");
    fake->files.addFile("/private/var/mobile/Library/Velkor/movie.mp4", 5);
    fake->files.addFile("/private/var/mobile/Library/Velkor/Game_1.mp4", 7);
    open();
    editor.reset();
    fake->window->setRootViewController(nullptr);
    container.reset();
    settle();
    const auto names = fake->files.contentsOfDirectory("/private/var/mobile/Library/Velkor");
    ASSERT_TRUE(names);
    EXPECT_TRUE(names.value().empty());
}

TEST_F(Lifecycle, AReleasedEditorIsReallyGoneAndObservesNothing)
{
    open();
    const std::weak_ptr<VKVideoEditorViewController> gone = editor;
    const auto item = editor->avPlayerItem();
    const auto keptPlayer = fake->media.player();
    editor.reset();
    fake->window->setRootViewController(nullptr);
    container.reset();
    settle();
    EXPECT_TRUE(gone.expired());
    EXPECT_EQ(item->observerCount(), 0U);
    EXPECT_FALSE(keptPlayer->hasObservers());
    EXPECT_EQ(fake->notifications.registrationCount(), 0U);
}

TEST_F(Lifecycle, AReleasedEditorIsGoneAlsoWhenItsPlayerStillWaitsForTheEndOfATrim)
{
    open();
    trimFrom(2, 5);
    editor->playAction();
    const std::weak_ptr<VKVideoEditorViewController> gone = editor;
    const auto keptPlayer = fake->media.player();
    close();
    EXPECT_TRUE(gone.expired());
    EXPECT_TRUE(keptPlayer->hasObservers()) << "the boundary goes with its player";
    keptPlayer->advance(4);
}

TEST_F(Lifecycle, AHandleThatWasMovedDoesNotKeepAnEditor)
{
    for (const auto move : {&VKVideoEditorViewController::movieScrubber_editingStartValueDidChange,
                            &VKVideoEditorViewController::movieScrubber_editingEndValueDidChange}) {
        makePlatform(tests::FakePlatform::kPhone);
        open();
        ((*editor).*move)(*editor->avTrimmer(), 3);
        const std::weak_ptr<VKVideoEditorViewController> gone = editor;
        editor.reset();
        fake->window->setRootViewController(nullptr);
        container.reset();
        EXPECT_TRUE(gone.expired());
        settle();
    }
}

TEST_F(Lifecycle, TheCloseItemFinishesWithTheListItselfAndPausesThePlayer)
{
    open();
    editor->activityTypes()->push_back("mail");
    player().play();
    tap(editor->cancelButton()->view());
    ASSERT_EQ(delegate->finishes.size(), 1U);
    EXPECT_EQ(delegate->finishes.front(), editor->activityTypes());
    EXPECT_FALSE(player().isPlaying());
}

TEST_F(Lifecycle, NothingFinishesWhileTheShareSheetIsUp)
{
    open();
    editor->setShareSheetUp(true);
    tap(editor->cancelButton()->view());
    EXPECT_TRUE(delegate->finishes.empty());
}

TEST_F(Lifecycle, EscapeLeavesTrimModeFirstAndThenTheEditor)
{
    open();
    editor->movieScrubberDidBeginEditing(*editor->avTrimmer());
    EXPECT_TRUE(fake->window->keyDown(platform::Key::Escape));
    EXPECT_FALSE(editor->isTrimming());
    EXPECT_TRUE(delegate->finishes.empty());
    EXPECT_TRUE(fake->window->keyDown(platform::Key::Escape));
    EXPECT_EQ(delegate->finishes.size(), 1U);
}

TEST_F(Lifecycle, SpacePlaysAndPauses)
{
    open();
    EXPECT_TRUE(fake->window->keyDown(platform::Key::Space));
    EXPECT_TRUE(player().isPlaying());
    EXPECT_TRUE(fake->window->keyDown(platform::Key::Space));
    EXPECT_FALSE(player().isPlaying());
}

TEST_F(Lifecycle, EveryKeyHasAnActionThatTheEditorAnswers)
{
    open();
    std::vector<std::tuple<Key, char, bool, std::string>> commands;
    for (const platform::KeyCommand& command : editor->keyCommands()) {
        EXPECT_TRUE(editor->respondsTo(command.action)) << command.action.name();
        commands.emplace_back(command.key, command.character, command.control, command.action.name());
    }
    EXPECT_THAT(
        commands,
        ElementsAre(
            std::tuple(Key::Space, '\0', false, "togglePlayback"), std::tuple(Key::Left, '\0', false, "seekBackward"),
            std::tuple(Key::Right, '\0', false, "seekForward"), std::tuple(Key::Comma, '\0', false, "stepBackward"),
            std::tuple(Key::Period, '\0', false, "stepForward"), std::tuple(Key::Home, '\0', false, "goToStart"),
            std::tuple(Key::End, '\0', false, "goToEnd"), std::tuple(Key::Character, 'i', false, "trimStartHere"),
            std::tuple(Key::Character, 'o', false, "trimEndHere"), std::tuple(Key::Return, '\0', false, "confirmTrim"),
            std::tuple(Key::Character, 's', true, "shareAction"), std::tuple(Key::Escape, '\0', false, "leave")));
}

TEST_F(Lifecycle, ArrowsMoveThePlayHeadByASecondAndHomeAndEndToTheEnds)
{
    open();
    using platform::Key;
    const auto press = [this](Key key) {
        EXPECT_TRUE(fake->window->keyDown(key));
        settle();
        return player().currentTime().seconds();
    };
    EXPECT_NEAR(press(Key::Right), 1, 1e-9);
    EXPECT_NEAR(press(Key::Right), 2, 1e-9);
    EXPECT_NEAR(press(Key::Left), 1, 1e-9);
    EXPECT_NEAR(press(Key::End), 10, 1e-9);
    EXPECT_NEAR(press(Key::Right), 10, 1e-9);
    EXPECT_NEAR(press(Key::Home), 0, 1e-9);
    EXPECT_FALSE(editor->isScrubbing());
}

TEST_F(Lifecycle, CommaAndPeriodGoPictureByPicture)
{
    open();
    using platform::Key;
    const auto press = [this](Key key) {
        EXPECT_TRUE(fake->window->keyDown(key));
        settle();
        EXPECT_NEAR(editor->avTrimmer()->value(), player().currentTime().seconds(), 1e-9);
        return player().currentTime().seconds() * 30;
    };
    EXPECT_NEAR(press(Key::Period), 1, 1e-9);
    EXPECT_NEAR(press(Key::Period), 2, 1e-9);
    EXPECT_NEAR(press(Key::Comma), 1, 1e-9);
    EXPECT_TRUE(fake->window->keyDown(Key::Space));
    EXPECT_TRUE(player().isPlaying());
    EXPECT_NEAR(press(Key::Period), 2, 1e-9);
    EXPECT_FALSE(player().isPlaying());
    EXPECT_EQ(bottom(), (Items{editor->shareButton(), editor->flexSpace(), editor->playButton(), editor->flexSpace()}))
        << "the bar says so, too";
}
