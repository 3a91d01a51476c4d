// Saving: the sound is mixed, the movie goes to the library, and the editor finishes whatever comes of it.
#include "EditorFixture.h"

#include "platform/sharing/ActivityTypes.h"

#include <gmock/gmock.h>

#include <functional>
#include <thread>
#include <tuple>

namespace {

using base::Url;
using platform::ExportSession;
using platform::kActivityTypeSaveToCameraRoll;
using testing::Contains;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::Not;
using testing::Optional;

constexpr const char* kMixFailed = "Error Mixing video Audio tracks";

class Saving : public EditorTest {
protected:
    void SetUp() override
    {
        EditorTest::SetUp();
        fake->files.addFile(kMovie, 1000);
    }
    /// What a test left under way ends before the editor that it holds.
    void TearDown() override
    {
        settle();
        if (const auto session = fake->media.exportSession(); session && session->isRunning())
            session->finish(ExportSession::Status::Cancelled);
        settle();
        while (fake->photos.hasBlock())
            fake->photos.runBlock();
        while (fake->photos.isBusy())
            libraryEnds();
        EditorTest::TearDown();
        settle();
    }

    void save()
    {
        editor->saveAction();
        settle();
    }
    void mixEnds(ExportSession::Status status)
    {
        fake->media.exportSession()->finish(status);
        settle();
    }
    void libraryEnds(const base::ErrorRef& error = nullptr)
    {
        if (error)
            fake->photos.fail(error);
        else
            fake->photos.finish();
        settle();
    }
    std::vector<std::string> errors() const { return fake->machine.log.texts(base::MemoryLog::Line::Kind::Error); }
    const ActivityTypes& done() const { return *editor->activityTypes(); }
};

TEST_F(Saving, TheMovieIsMixedPutIntoTheLibraryAndTheHostIsTold)
{
    open();
    save();
    const auto session = fake->media.exportSession();
    ASSERT_TRUE(session);
    EXPECT_THAT(session->asset->url(), Optional(Url::fromPath(kMovie)));
    EXPECT_THAT(fake->machine.log.texts(base::MemoryLog::Line::Kind::Message), Contains("saveAction"));
    EXPECT_THAT(fake->photos.urls, IsEmpty());

    const auto mixed = session->outputURL();
    mixEnds(ExportSession::Status::Completed);
    EXPECT_THAT(editor->videoURL(), mixed);
    EXPECT_THAT(fake->photos.urls, ElementsAre(mixed));
    EXPECT_THAT(delegate->finishes, IsEmpty()) << "not before the library has it";

    libraryEnds();
    ASSERT_THAT(delegate->finishes, ElementsAre(editor->activityTypes()));
    EXPECT_THAT(done(), ElementsAre(kActivityTypeSaveToCameraRoll));
    EXPECT_THAT(errors(), IsEmpty());
}

TEST_F(Saving, TheFormerMovieIsRemovedAlsoWhenTheHostSuppliedIt)
{
    open();
    save();
    EXPECT_TRUE(fake->files.holds(kMovie));
    mixEnds(ExportSession::Status::Completed);
    EXPECT_FALSE(fake->files.holds(kMovie));
}

TEST_F(Saving, TheListSaysSoBeforeAnythingIsSaved)
{
    open();
    editor->saveAction();
    EXPECT_THAT(done(), ElementsAre(kActivityTypeSaveToCameraRoll));
}

TEST_F(Saving, WhileTheShareSheetIsUpNothingHappensAndNothingIsListed)
{
    open();
    editor->setShareSheetUp(true);
    save();
    EXPECT_THAT(done(), IsEmpty());
    EXPECT_EQ(fake->media.exportSessionCount(), 0u);
    EXPECT_THAT(fake->machine.log.texts(base::MemoryLog::Line::Kind::Message), Not(Contains("saveAction")));
}

TEST_F(Saving, WhileTrimmingTheTrimIsAppliedNothingIsSavedAndEditingGoesOn)
{
    open();
    trimFrom(2, 5);
    save();
    EXPECT_THAT(done(), ElementsAre(kActivityTypeSaveToCameraRoll));
    ASSERT_TRUE(fake->media.exportSession());
    EXPECT_FALSE(fake->media.exportSession()->audioMix) << "a trim, not a mix";
    const auto trimmed = editor->trimFilePath();
    fake->media.movies[trimmed->path()] = tests::FakeMovie::lasting(3);
    mixEnds(ExportSession::Status::Completed);
    EXPECT_THAT(fake->photos.urls, IsEmpty());
    EXPECT_THAT(delegate->finishes, IsEmpty());
    EXPECT_THAT(done(), ElementsAre(kActivityTypeSaveToCameraRoll));

    EXPECT_EQ(editor->videoURL(), trimmed);
    editor->playAction();
    player().advance(2);
    EXPECT_TRUE(player().isPlaying());
    EXPECT_NEAR(editor->avTrimmer()->value(), 2, 0.05);
    trimFrom(1, 2);
    editor->undoAction();
    EXPECT_FALSE(editor->isTrimming()) << "nothing runs that would forbid it";
    trimFrom(1, 2);
    save();
    ASSERT_EQ(fake->media.exportSessionCount(), 2U);
    EXPECT_EQ(fake->media.exportSession()->asset->url(), trimmed);
    EXPECT_THAT(delegate->finishes, IsEmpty());
}

TEST_F(Saving, TwoConfirmedTrimsAndDoneListTheSaveTwice)
{
    open();
    for (int i = 0; i < 2; ++i) {
        editor->setTrimming(true);
        save();
        const auto output = fake->media.exportSession()->outputURL();
        fake->media.movies[output->path()] = tests::FakeMovie::lasting(5);
        mixEnds(ExportSession::Status::Completed);
        fake->machine.advance(std::chrono::seconds(1));
    }
    editor->doneAction();
    ASSERT_THAT(delegate->finishes, ElementsAre(editor->activityTypes()));
    EXPECT_THAT(done(), ElementsAre(kActivityTypeSaveToCameraRoll, kActivityTypeSaveToCameraRoll));
}

TEST_F(Saving, WithoutAMovieTheMixFailsAndTheLibraryIsStillAsked)
{
    open(std::nullopt);
    save();
    EXPECT_EQ(fake->media.exportSessionCount(), 0u);
    EXPECT_THAT(errors(), Contains(kMixFailed));
    EXPECT_THAT(fake->photos.urls, ElementsAre(std::nullopt));
    EXPECT_THAT(delegate->finishes, IsEmpty());
    libraryEnds();
    EXPECT_THAT(errors(), Contains("Error writing video to camera roll: " + std::to_string(EINVAL)));
    EXPECT_THAT(delegate->finishes, ElementsAre(editor->activityTypes()));
}

TEST_F(Saving, AMixThatFailsSavesTheMovieAsItIs)
{
    for (const auto status : {ExportSession::Status::Failed, ExportSession::Status::Cancelled}) {
        SCOPED_TRACE(static_cast<int>(status));
        makePlatform(tests::FakePlatform::kPhone);
        fake->files.addFile(kMovie, 1000);
        delegate->finishes.clear();
        open();
        save();
        mixEnds(status);
        EXPECT_THAT(errors(), Contains(kMixFailed));
        EXPECT_THAT(editor->videoURL(), Optional(Url::fromPath(kMovie)));
        EXPECT_TRUE(fake->files.holds(kMovie));
        EXPECT_THAT(fake->photos.urls, ElementsAre(Optional(Url::fromPath(kMovie))));
        libraryEnds();
        EXPECT_EQ(delegate->finishes.size(), 1u);
        TearDown();
    }
}

TEST_F(Saving, ALibraryThatFailsIsLoggedAndTheEditorFinishesAllTheSame)
{
    open();
    save();
    mixEnds(ExportSession::Status::Completed);
    libraryEnds(base::Error::make("posix", 0x1'0000'001c, "The disk is full."));
    EXPECT_THAT(errors(), ElementsAre("Error writing video to camera roll: 28")) << "the library has its own words";
    ASSERT_EQ(delegate->finishes.size(), 1u);
    EXPECT_THAT(done(), ElementsAre(kActivityTypeSaveToCameraRoll));
}

TEST_F(Saving, TheLibraryReadsTheMoviesPlaceWhenItsBlockRuns)
{
    open();
    fake->photos.runsBlocksAtOnce = false;
    save();
    mixEnds(ExportSession::Status::Completed);
    editor->setVideoURL(Url::fromPath("/another.mp4"));
    fake->photos.runBlock();
    EXPECT_THAT(fake->photos.urls, ElementsAre(Optional(Url::fromPath("/another.mp4"))));
    libraryEnds();
}

TEST_F(Saving, NoButtonIsDisabledMeanwhileAndNothingElseChanges)
{
    open();
    editor->playAction();
    editor->showUI();
    const auto whole = [this] {
        std::vector<std::tuple<std::shared_ptr<platform::View>, bool, bool, double>> views;
        const std::function<void(const std::shared_ptr<platform::View>&)> add = [&](const auto& view) {
            views.emplace_back(view, view->accessibility().enabled, view->isUserInteractionEnabled(), view->alpha());
            for (const auto& each : view->subviews())
                add(each);
        };
        fake->window->commit();
        add(fake->window);
        return views;
    };
    const auto before = whole();
    save();
    EXPECT_THAT(whole(), ElementsAreArray(before));
    EXPECT_FALSE(editor->isExporting());
    mixEnds(ExportSession::Status::Completed);
    EXPECT_THAT(whole(), ElementsAreArray(before));
    // The button is not only alive: it saves once more what the library is being given.
    fake->media.movies[editor->videoURL()->path()] = tests::FakeMovie::lasting(10);
    tap(editor->saveButton()->view());
    settle();
    ASSERT_EQ(fake->media.exportSessionCount(), 2U);
    mixEnds(ExportSession::Status::Completed);
    EXPECT_EQ(fake->photos.urls.size(), 2U);
    libraryEnds();
    EXPECT_THAT(whole(), ElementsAreArray(before)) << "but for what closing does";
    libraryEnds();
}

TEST_F(Saving, WhatTheLibraryTellsIsHeardOnTheMainQueuesNextTurn)
{
    open();
    save();
    mixEnds(ExportSession::Status::Completed);
    std::thread([this] { fake->photos.fail(base::Error::make("posix", 28, "The disk is full.")); }).join();
    EXPECT_THAT(errors(), IsEmpty());
    EXPECT_THAT(delegate->finishes, IsEmpty());
    settle();
    EXPECT_THAT(errors(), ElementsAre("Error writing video to camera roll: 28"));
    EXPECT_EQ(delegate->finishes.size(), 1U);
}

TEST_F(Saving, TheLogSaysSoBeforeTheListDoes)
{
    struct Witness final : base::Log {
        std::function<void(std::string_view)> heard;
        void message(std::string_view text) override { heard(text); }
        void error(std::string_view) override {}
        void console(std::string_view) override {}
    } log;
    const auto& system = fake->machine.system;
    const base::System heard{log, system.clock, system.mainQueue, system.backgroundQueue, system.defaultQueue};
    const auto& roles = fake->platform;
    const platform::Platform platform{heard,        roles.notifications, roles.device, roles.mainScreen, roles.images,
                                      roles.files,  roles.bundles,       roles.words,  roles.calendar,   roles.media,
                                      roles.photos, roles.store,         roles.sharing};
    std::vector<std::size_t> listed;
    log.heard = [&](std::string_view text) {
        if (text == "saveAction")
            listed.push_back(editor->activityTypes()->size());
    };
    editor = VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName(platform, {},
                                                                                       Url::fromPath(kMovie), {});
    editor->setTrimming(true);
    editor->saveAction();
    EXPECT_THAT(listed, ElementsAre(0));
    EXPECT_THAT(done(), ElementsAre(kActivityTypeSaveToCameraRoll));
    fake->media.exportSession()->finish(ExportSession::Status::Cancelled);
    settle();
    editor.reset();
}

TEST_F(Saving, AnEditorThatIsLetGoMeanwhileStaysUntilTheLibraryHasTheMovie)
{
    open();
    save();
    const std::weak_ptr<VKVideoEditorViewController> weak = editor;
    editor->willMoveToParentViewController(nullptr);
    editor->view()->removeFromSuperview();
    editor->removeFromParentViewController();
    editor.reset();
    fake->window->setRootViewController(nullptr);
    container.reset();
    settle();
    EXPECT_FALSE(weak.expired());

    auto session = fake->media.exportSession();
    fake->files.addFile(session->outputURL()->path(), 500);
    std::thread([session = std::move(session)]() mutable {
        session->finish(ExportSession::Status::Completed);
        session.reset();
    }).join();
    settle();
    EXPECT_FALSE(weak.expired());
    EXPECT_TRUE(fake->files.holds(fake->photos.urls.at(0)->path())) << "its end would have emptied the store";
    libraryEnds();
    EXPECT_TRUE(weak.expired());
    EXPECT_FALSE(fake->files.holds(fake->photos.urls.at(0)->path()));
}

TEST_F(Saving, TheSaveButtonSaves)
{
    open();
    tap(editor->saveButton()->view());
    EXPECT_EQ(fake->media.exportSessionCount(), 1u);
}

} // namespace
