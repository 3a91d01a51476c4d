// What a confirmed trim exports, and what comes of it.
#include "TrimmingFixture.h"

#include "platform/sharing/ActivityTypes.h"
#include "support/WaitUntil.h"

#include <gmock/gmock.h>

#include <chrono>
#include <future>
#include <thread>

using base::MediaTime;
using platform::ExportSession;
using Line = base::MemoryLog::Line::Kind;

namespace {

class Trimming : public TrimmingTest {};

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

TEST_F(Trimming, AnAppNameThatNoFileCanHaveGivesALegalName)
{
    open();
    editor->setApplicationName("AC/DC");
    EXPECT_EQ(editor->trimFileURL().lastPathComponent().find("AC\u2044DC_"), 0U);
    EXPECT_EQ(editor->applicationName(), "AC/DC") << "it is shown as it is";
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
    // On the main queue already there is nobody to wait for.
    session()->finish(ExportSession::Status::Completed);
    EXPECT_FALSE(editor->isExporting());
    EXPECT_FALSE(editor->isTrimming());
    EXPECT_EQ(editor->videoURL(), editor->trimFilePath());
}

TEST_F(Trimming, AnExportsThreadWaitsUntilTheMainQueueHasShownTheMovie)
{
    open();
    confirm(2, 5);
    std::thread::id shower;
    fake->media.listener->heard = [&](const std::string& call) {
        if (call.starts_with("asset "))
            shower = std::this_thread::get_id();
    };
    std::promise<std::optional<base::Url>> shown;
    auto told = shown.get_future();
    std::thread worker([&, running = session()] {
        running->finish(ExportSession::Status::Completed);
        shown.set_value(editor->videoURL());
    });
    EXPECT_TRUE(tests::waitUntil(fake->machine.mainQueue,
                                 [&] { return told.wait_for(std::chrono::seconds(0)) == std::future_status::ready; }));
    worker.join();
    EXPECT_EQ(told.get(), editor->trimFilePath());
    EXPECT_FALSE(editor->isExporting());
    EXPECT_EQ(shower, std::this_thread::get_id());
    fake->media.listener->heard = {};
    settle();
}

TEST_F(Trimming, ClosingWhileATrimRunsTellsTheHostAndLetsItRunToItsEnd)
{
    fake->files.addDirectory("/private/var/mobile/Library/Velkor");
    open();
    confirm(2, 5);
    const auto running = session();
    const std::string trimmed = editor->trimFilePath()->path();
    editor->doneAction();
    ASSERT_EQ(delegate->finishes.size(), 1U);
    EXPECT_EQ(*delegate->finishes.front(), ActivityTypes{platform::kActivityTypeSaveToCameraRoll});
    EXPECT_TRUE(running->isRunning());
    EXPECT_FALSE(running->wasCancelled);
    EXPECT_TRUE(editor->isExporting());
    EXPECT_TRUE(editor->isTrimming());

    const std::weak_ptr<VKVideoEditorViewController> gone = editor;
    editor.reset();
    fake->window->setRootViewController(nullptr);
    container.reset();
    settle();
    EXPECT_FALSE(gone.expired());
    fake->files.addFile(trimmed, 100);
    running->finish(ExportSession::Status::Completed);
    settle();
    EXPECT_TRUE(gone.expired());
    EXPECT_FALSE(fake->files.holds(trimmed)) << "the end of the editor removes what came late, too";
    EXPECT_EQ(delegate->finishes.size(), 1U);
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
