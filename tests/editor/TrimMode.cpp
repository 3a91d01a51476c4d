// The ways into trim mode and out of it: handles, keys, buttons, a shake; and what the bars offer meanwhile.
#include "TrimmingFixture.h"

using platform::ExportSession;
using platform::Key;

namespace {

class TrimMode : public TrimmingTest {};

} // namespace

TEST_F(TrimMode, AShakeLeavesTheModeUnlessAnExportRuns)
{
    open();
    editor->becomeFirstResponder();
    confirm(2, 5);
    fake->window->motion(platform::MotionSubtype::Shake);
    EXPECT_TRUE(editor->isTrimming());
    succeed(5);
    trimFrom(1, 3);
    fake->window->motion(platform::MotionSubtype::Shake);
    EXPECT_FALSE(editor->isTrimming());
}

TEST_F(TrimMode, LeavingTheModeKeepsTheRange)
{
    open();
    trimFrom(2, 5);
    editor->undoAction();
    EXPECT_EQ(editor->editStartTime(), 2);
    EXPECT_EQ(editor->editEndTime(), 5);
    EXPECT_EQ(editor->videoURL()->path(), kMovie);
    EXPECT_EQ(fake->media.exportSessionCount(), 0U);
}

TEST_F(TrimMode, TheHandlesGoBackToTheEndsAnimated)
{
    open();
    editor->avTrimmer()->moveHandle(platform::ScrubberHandle::Start, 4);
    settle();
    const auto handle = editor->avTrimmer()->startHandle();
    const base::Rect before = handle->frame();
    handle->takeAnimations();
    editor->undoAction();
    EXPECT_LT(handle->frame().minX(), before.minX());
    const auto animations = handle->takeAnimations();
    ASSERT_EQ(animations.size(), 1U);
    EXPECT_EQ(animations.front().fromFrame, before);
    EXPECT_EQ(animations.front().duration, platform::MovieScrubber::kFrameDuration);
}

TEST_F(TrimMode, ThePhonesLowerBarHoldsPlayAloneInTheMode)
{
    open();
    editor->playAction();
    trimFrom(2, 5);
    EXPECT_EQ(bottom(), (Items{editor->flexSpace(), editor->playButton(), editor->flexSpace()}));
}

TEST_F(TrimMode, TheConfirmButtonConfirms)
{
    open();
    trimFrom(2, 5);
    tap(editor->trimButton()->view());
    ASSERT_TRUE(session());
    EXPECT_TRUE(session()->isRunning());
}

TEST_F(TrimMode, ThePadsBarInTheModeAndAfterIt)
{
    makePlatform(tests::FakePlatform::kPad);
    open();
    trimFrom(2, 5);
    EXPECT_EQ(top(), pad(editor->cancelTrimButton(), {editor->playButton(), editor->trimButton()}));
    editor->undoAction();
    EXPECT_EQ(top(), pad(editor->doneButton(), {editor->playButton(), editor->shareButton(), editor->saveButton()}));
}

TEST_F(TrimMode, BeforeTheModeWasEverEnteredThePreviewStillOffersCancel)
{
    open();
    editor->previewMode();
    EXPECT_EQ(top(), phoneTop(editor->cancelButton(), editor->saveButton()));
}

TEST_F(TrimMode, TheKeysIAndOSetTheEndsAtThePlayHeadAndEnterTheMode)
{
    open();
    editor->becomeFirstResponder();
    editor->avTrimmer()->setValue(3);
    EXPECT_TRUE(fake->window->keyDown(Key::Character, 'i'));
    settle();
    EXPECT_TRUE(editor->isTrimming());
    EXPECT_TRUE(editor->avTrimmer()->isEditing());
    EXPECT_EQ(editor->editStartTime(), 3);
    EXPECT_EQ(editor->editEndTime(), 10);
    EXPECT_EQ(top(), phoneTop(editor->cancelTrimButton(), editor->trimButton()));
    EXPECT_NEAR(player().currentTime().seconds(), 3, 1e-9) << "the picture at the handle";

    editor->avTrimmer()->setValue(7.5);
    EXPECT_TRUE(fake->window->keyDown(Key::Character, 'o'));
    EXPECT_EQ(editor->editEndTime(), 7.5);
}

TEST_F(TrimMode, EnterConfirmsOnceAndOnlyInTheMode)
{
    open();
    editor->becomeFirstResponder();
    fake->window->keyDown(Key::Return);
    EXPECT_EQ(fake->media.exportSessionCount(), 0U);
    trimFrom(2, 5);
    fake->window->keyDown(Key::Return);
    fake->window->keyDown(Key::Return);
    EXPECT_EQ(fake->media.exportSessionCount(), 1U);
    session()->finish(ExportSession::Status::Failed);
    fake->window->keyDown(Key::Return);
    EXPECT_EQ(fake->media.exportSessionCount(), 2U) << "as the button does";
}

TEST_F(TrimMode, EscapeLeavesTheModeFirstAndThenCloses)
{
    open();
    editor->becomeFirstResponder();
    trimFrom(2, 5);
    fake->window->keyDown(Key::Escape);
    EXPECT_FALSE(editor->isTrimming());
    EXPECT_TRUE(delegate->finishes.empty());
    fake->window->keyDown(Key::Escape);
    EXPECT_EQ(delegate->finishes.size(), 1U);
}

TEST_F(TrimMode, AFingerTakesAHandleAndTheBarsFollow)
{
    open();
    const base::Rect strip = stripFrame();
    const double y = strip.minY() + 19;
    fake->window->touchDown({1, {strip.minX() + 18, y}, {}});
    settle();
    EXPECT_TRUE(editor->isTrimming());
    EXPECT_EQ(top(), phoneTop(editor->cancelTrimButton(), editor->trimButton()));
    fake->window->touchMove({1, {strip.minX() + 18 + 154, y}, {}});
    fake->window->touchUp({1, {strip.minX() + 18 + 154, y}, {}});
    settle();
    EXPECT_NEAR(editor->editStartTime(), 5, 0.01);
    EXPECT_FALSE(editor->isScrubbing());
    EXPECT_NEAR(player().currentTime().seconds(), 5, 0.01);
    tap(editor->trimButton()->view());
    ASSERT_TRUE(session());
    EXPECT_NEAR(session()->timeRange->start.seconds(), 5, 0.01);
}

TEST_F(TrimMode, CancellingAndTakingTheOtherHandleStartsFromTheWholeMovie)
{
    open();
    editor->avTrimmer()->moveHandle(platform::ScrubberHandle::Start, 4);
    editor->undoAction();
    EXPECT_EQ(editor->editStartTime(), 4);
    editor->avTrimmer()->moveHandle(platform::ScrubberHandle::End, 8);
    EXPECT_EQ(editor->editStartTime(), 0) << "what the strip shows is what is cut";
    EXPECT_EQ(editor->editEndTime(), 8);
}
