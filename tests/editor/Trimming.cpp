#include "EditorFixture.h"

#include "platform/sharing/ActivityTypes.h"
#include "support/WaitUntil.h"

#include <gmock/gmock.h>

#include <atomic>
#include <thread>

using base::MediaTime;
using platform::ExportSession;
using Line = base::MemoryLog::Line::Kind;

namespace {

class Trimming : public EditorTest {
protected:
    void trimFrom(double start, double end)
    {
        editor->movieScrubberDidBeginEditing(*editor->avTrimmer());
        editor->movieScrubber_editingStartValueDidChange(*editor->avTrimmer(), start);
        editor->movieScrubber_editingEndValueDidChange(*editor->avTrimmer(), end);
        settle();
    }
    void confirm(double start, double end)
    {
        trimFrom(start, end);
        editor->saveAction();
    }
    std::shared_ptr<tests::FakeExportSession> session() const { return fake->media.exportSession(); }
    /// The trim ends well, with a movie that lasts `seconds`.
    void succeed(double seconds)
    {
        fake->media.movies[editor->trimFilePath()->path()] = tests::FakeMovie::lasting(seconds);
        session()->finish(ExportSession::Status::Completed);
        settle();
    }
};

} // namespace

TEST_F(Trimming, TheRangeGoesFromTheStartAndLastsAsLongAsTheEndHandleSays)
{
    open();
    confirm(2, 5);
    ASSERT_TRUE(session()->isRunning());
    const auto range = session()->timeRange;
    ASSERT_TRUE(range);
    EXPECT_EQ(range->start, MediaTime::make(2, 1));
    EXPECT_EQ(range->duration, MediaTime::make(5, 1));
    EXPECT_EQ(range->end(), MediaTime::make(7, 1));
    EXPECT_EQ(range->start.timescale, player().currentTime().timescale);
    EXPECT_EQ(session()->fileType, platform::FileType::Mpeg4);
    EXPECT_FALSE(session()->audioMix);
}

TEST_F(Trimming, ALateStartRunsPastTheEndHandle)
{
    open();
    confirm(6, 8);
    EXPECT_EQ(session()->timeRange->end(), MediaTime::make(14, 1));
}

TEST_F(Trimming, TheExportReadsTheMovieThatIsShownAndWritesANewFile)
{
    open();
    fake->machine.clock.advance(std::chrono::seconds(3));
    confirm(2, 5);
    EXPECT_EQ(session()->asset->url()->path(), kMovie);
    EXPECT_EQ(editor->exportSession(), session());
    EXPECT_TRUE(editor->isExporting());
    EXPECT_EQ(session()->outputURL(), editor->trimFilePath());
    EXPECT_EQ(editor->trimFilePath()->path(), "/private/var/mobile/Library/Velkor//Game_1700000003.mp4");
}

TEST_F(Trimming, TheFormerTrimIsRemovedFirstAndTheSourceOfTheNextOneIsThatFile)
{
    open();
    const std::string first = editor->trimFilePath()->path();
    fake->machine.clock.advance(std::chrono::seconds(1));
    confirm(2, 5);
    // What would have been the first output is asked to go, although nothing was ever written there.
    settle();
    EXPECT_THAT(fake->files.calls, testing::Contains("exists " + first));

    const std::string second = editor->trimFilePath()->path();
    fake->files.addFile(second, 100);
    succeed(5);
    fake->machine.clock.advance(std::chrono::seconds(1));
    trimFrom(1, 2);
    editor->saveAction();
    EXPECT_EQ(session()->asset->url()->path(), second);
    EXPECT_NE(editor->trimFilePath()->path(), second);
    EXPECT_TRUE(fake->files.holds(second)) << "the removal is a worker's";
    settle();
    EXPECT_FALSE(fake->files.holds(second));
}

TEST_F(Trimming, TheMovieThatTheHostHandedOverIsNeverRemoved)
{
    open();
    fake->files.addFile(kMovie, 100);
    confirm(2, 5);
    succeed(5);
    confirm(1, 2);
    succeed(2);
    EXPECT_TRUE(fake->files.holds(kMovie));
    EXPECT_EQ(editor->originalVideoURL()->path(), kMovie);
}

TEST_F(Trimming, TwoTrimsInOneSecondHaveOneName)
{
    open();
    confirm(2, 5);
    const auto first = editor->trimFilePath();
    succeed(5);
    confirm(1, 2);
    EXPECT_EQ(editor->trimFilePath(), first);
    fake->machine.clock.advance(std::chrono::seconds(1));
    EXPECT_NE(editor->trimFileURL(), *first);
}

TEST_F(Trimming, SuccessShowsTheTrimmedMovieAndLeavesTheMode)
{
    open();
    const auto players = fake->media.playerCount();
    confirm(2, 5);
    editor->avTrimmer()->setEditing_animated(true, false);
    const auto output = editor->trimFilePath();
    succeed(5);
    EXPECT_FALSE(editor->isExporting());
    EXPECT_FALSE(editor->isTrimming());
    EXPECT_FALSE(editor->avTrimmer()->isEditing());
    EXPECT_EQ(editor->videoURL(), output);
    EXPECT_EQ(fake->media.playerCount(), players + 1);
    EXPECT_EQ(editor->avPlayerLayer()->player(), editor->avPlayer());
    EXPECT_EQ(top(), phoneTop(editor->doneButton(), editor->saveButton()));
    EXPECT_EQ(editor->editStartTime(), 0);
    EXPECT_EQ(editor->editEndTime(), 5);
    EXPECT_EQ(editor->avTrimmer()->duration(), 5);
}

TEST_F(Trimming, TheTrimmedMovieEndsAsTheFirstOneDid)
{
    open();
    const auto former = editor->avPlayerItem();
    confirm(2, 5);
    succeed(5);
    editor->playAction();
    EXPECT_TRUE(editor->isUIHidden());
    fake->notifications.post(platform::kPlayerItemDidPlayToEndNotification, former);
    EXPECT_TRUE(player().isPlaying()) << "the former item is nobody's any more";
    player().advance(20);
    settle();
    EXPECT_FALSE(player().isPlaying());
    EXPECT_FALSE(editor->isUIHidden());
}

TEST_F(Trimming, AnExportIsToldOfOnceTheMainQueueHasShownIt)
{
    open();
    confirm(2, 5);
    std::atomic<bool> told = false;
    std::thread worker([&, running = session()] {
        running->finish(ExportSession::Status::Completed);
        told = true;
    });
    EXPECT_TRUE(tests::waitUntil(fake->machine.mainQueue, [&] {
        EXPECT_TRUE(!told || !editor->isExporting()) << "the session's thread waits for the main queue";
        return !editor->isExporting();
    }));
    worker.join();
    settle();
    EXPECT_EQ(editor->videoURL(), editor->trimFilePath());
    EXPECT_FALSE(editor->isTrimming());
}

TEST_F(Trimming, AFailureIsLoggedAndEverythingStaysAsItWas)
{
    open();
    confirm(2, 5);
    session()->finish(ExportSession::Status::Failed, base::Error::make("fake", (1LL << 32) - 7, "No room."));
    settle();
    EXPECT_TRUE(fake->machine.log.contains(Line::Error,
                                           "VQVideoEditorViewController: Export Trim Video Failed, due to error: -7"));
    EXPECT_TRUE(editor->isExporting());
    EXPECT_TRUE(editor->isTrimming());
    EXPECT_EQ(top(), phoneTop(editor->cancelTrimButton(), editor->trimButton()));
    EXPECT_EQ(editor->videoURL()->path(), kMovie);
}

TEST_F(Trimming, AFailureWithoutAnErrorIsLoggedAsZero)
{
    open();
    confirm(2, 5);
    session()->finish(ExportSession::Status::Failed);
    EXPECT_TRUE(fake->machine.log.contains(Line::Error,
                                           "VQVideoEditorViewController: Export Trim Video Failed, due to error: 0"));
}

TEST_F(Trimming, ACancelledExportIsLoggedAndEverythingStaysAsItWas)
{
    open();
    confirm(2, 5);
    session()->finish(ExportSession::Status::Cancelled);
    settle();
    EXPECT_TRUE(fake->machine.log.contains(Line::Error, "VQVideoEditorViewController: Export Trim Video Cancelled"));
    EXPECT_TRUE(editor->isExporting());
    EXPECT_TRUE(editor->isTrimming());
    EXPECT_EQ(editor->videoURL()->path(), kMovie);
}

TEST_F(Trimming, AfterAFailureNeitherCancelNorAShakeLeavesTheMode)
{
    open();
    confirm(2, 5);
    session()->finish(ExportSession::Status::Failed);
    editor->undoAction();
    EXPECT_TRUE(editor->isTrimming());
    editor->becomeFirstResponder();
    fake->window->motion(platform::MotionSubtype::Shake);
    EXPECT_TRUE(editor->isTrimming());
    EXPECT_EQ(top(), phoneTop(editor->cancelTrimButton(), editor->trimButton()));
}

TEST_F(Trimming, AfterAFailureAnotherTrimThatSucceedsFreesTheEditor)
{
    open();
    confirm(2, 5);
    session()->finish(ExportSession::Status::Failed);
    editor->saveAction();
    EXPECT_EQ(fake->media.exportSessionCount(), 2U);
    succeed(5);
    EXPECT_FALSE(editor->isExporting());
    EXPECT_FALSE(editor->isTrimming());
}

TEST_F(Trimming, AShakeLeavesTheModeUnlessAnExportRuns)
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

TEST_F(Trimming, LeavingTheModeKeepsTheRange)
{
    open();
    trimFrom(2, 5);
    editor->undoAction();
    EXPECT_EQ(editor->editStartTime(), 2);
    EXPECT_EQ(editor->editEndTime(), 5);
    EXPECT_EQ(editor->videoURL()->path(), kMovie);
    EXPECT_EQ(fake->media.exportSessionCount(), 0U);
}

TEST_F(Trimming, EveryConfirmedTrimIsTold)
{
    open();
    confirm(2, 5);
    EXPECT_TRUE(fake->machine.log.contains(Line::Message, "saveAction"));
    succeed(5);
    confirm(1, 2);
    succeed(2);
    editor->doneAction();
    ASSERT_EQ(delegate->finishes.size(), 1U);
    EXPECT_EQ(*delegate->finishes.front(), ActivityTypes(2, platform::kActivityTypeSaveToCameraRoll));
}

TEST_F(Trimming, NothingIsConfirmedWhileTheShareSheetIsUp)
{
    open();
    trimFrom(2, 5);
    editor->setShareSheetUp(true);
    editor->saveAction();
    EXPECT_FALSE(editor->isExporting());
    EXPECT_TRUE(editor->activityTypes()->empty());
    EXPECT_FALSE(fake->machine.log.contains(Line::Message, "saveAction"));
}

TEST_F(Trimming, TheConfirmButtonConfirms)
{
    open();
    trimFrom(2, 5);
    tap(editor->trimButton()->view());
    ASSERT_TRUE(session());
    EXPECT_TRUE(session()->isRunning());
}

TEST_F(Trimming, ThePadsBarInTheModeAndAfterIt)
{
    makePlatform(tests::FakePlatform::kPad);
    open();
    trimFrom(2, 5);
    EXPECT_EQ(top(), pad(editor->cancelTrimButton(), {editor->playButton(), editor->trimButton()}));
    editor->undoAction();
    EXPECT_EQ(top(), pad(editor->doneButton(), {editor->playButton(), editor->shareButton(), editor->saveButton()}));
}

TEST_F(Trimming, BeforeTheModeWasEverEnteredThePreviewStillOffersCancel)
{
    open();
    editor->previewMode();
    EXPECT_EQ(top(), phoneTop(editor->cancelButton(), editor->saveButton()));
}

TEST_F(Trimming, ARunningExportKeepsItsEditorUntilTheMainQueueTakesItBack)
{
    open();
    confirm(2, 5);
    const auto running = session();
    const std::weak_ptr<VKVideoEditorViewController> watched = editor;
    editor.reset();
    fake->window->setRootViewController(nullptr);
    container.reset();
    settle();
    EXPECT_FALSE(watched.expired());
    std::thread([&] { running->finish(ExportSession::Status::Cancelled); }).join();
    EXPECT_FALSE(watched.expired()) << "not on the session's thread";
    settle();
    EXPECT_TRUE(watched.expired());
}

TEST_F(Trimming, AMovieThatCannotBeOpenedIsStillExportedAndFailsThere)
{
    open(std::nullopt);
    editor->setTrimming(true);
    editor->saveAction();
    ASSERT_TRUE(session());
    EXPECT_FALSE(session()->asset->url());
    session()->finish(ExportSession::Status::Failed, session()->asset->error());
    EXPECT_TRUE(editor->isExporting());
}

TEST_F(Trimming, TheKeysIAndOSetTheEndsAtThePlayHeadAndEnterTheMode)
{
    using platform::Key;
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

TEST_F(Trimming, EnterConfirmsOnceAndOnlyInTheMode)
{
    using platform::Key;
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

TEST_F(Trimming, EscapeLeavesTheModeFirstAndThenCloses)
{
    using platform::Key;
    open();
    editor->becomeFirstResponder();
    trimFrom(2, 5);
    fake->window->keyDown(Key::Escape);
    EXPECT_FALSE(editor->isTrimming());
    EXPECT_TRUE(delegate->finishes.empty());
    fake->window->keyDown(Key::Escape);
    EXPECT_EQ(delegate->finishes.size(), 1U);
}

TEST_F(Trimming, AFingerTakesAHandleAndTheBarsFollow)
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

TEST_F(Trimming, CancellingAndTakingTheOtherHandleStartsFromTheWholeMovie)
{
    open();
    editor->avTrimmer()->moveHandle(platform::ScrubberHandle::Start, 4);
    editor->undoAction();
    EXPECT_EQ(editor->editStartTime(), 4);
    editor->avTrimmer()->moveHandle(platform::ScrubberHandle::End, 8);
    EXPECT_EQ(editor->editStartTime(), 0) << "what the strip shows is what is cut";
    EXPECT_EQ(editor->editEndTime(), 8);
}
