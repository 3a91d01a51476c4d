// Sharing: what goes along, what the sheet is asked for, and what of it the host hears.
#include "EditorFixture.h"

#include "platform/sharing/ActivityRow.h"
#include "platform/sharing/ActivityTypes.h"
#include "platform/sharing/ShareListView.h"
#include "platform/sharing/ShareSheet.h"
#include "platform/sharing/ShareSummary.h"
#include "support/FakeActivities.h"

#include <gmock/gmock.h>

namespace {

using base::Url;
using platform::kActivityTypeCopyToPasteboard;
using platform::kActivityTypeMail;
using platform::kActivityTypeMessage;
using platform::kActivityTypePostToFacebook;
using platform::ShareItems;
using platform::ShareSheet;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

void declareVideoService()
{
    static const bool declared = [] {
        runtime::ClassBuilder<runtime::Object>("YTCategoriesRequest", &runtime::Object::classObject()).build();
        runtime::ClassBuilder<tests::FakeActivity>("VKYouTubeActivity", &platform::Activity::classObject())
            .maker([] { return std::make_shared<tests::FakeActivity>("VKPublishToYouTube"); })
            .build();
        return true;
    }();
    static_cast<void>(declared);
}

class Sharing : public EditorTest {
protected:
    void SetUp() override
    {
        EditorTest::SetUp();
        // Kept for the life of the process.
        const auto framework = fake->bundles.add("/System/Library/Frameworks/Velkor.framework");
        framework->tables["Localizable"]["SHARE_TEXT_FORMAT"] = "%1$@ by %2$@";
        fake->files.addFile(kMovie, 1000);
    }

    /// Presses Share; the store has not answered yet.
    void share()
    {
        editor->shareAction();
        settle();
    }
    void storeAnswers(std::optional<std::string> name, std::optional<std::string> author,
                      std::optional<std::string> link)
    {
        fake->store.answer({{{link, name, author, std::nullopt}}});
        settle();
    }
    /// Until the sheet is all there.
    void sheetComes()
    {
        fake->machine.advance(std::chrono::seconds(1));
        settle();
    }
    void shareAndWait()
    {
        share();
        storeAnswers("Tux Racer", "Tux", "https://example.org/tux");
        sheetComes();
    }
    std::shared_ptr<ShareSheet> sheet() const
    {
        return std::dynamic_pointer_cast<ShareSheet>(editor->presentedViewController());
    }
    /// Picks an activity of that type, which ends so, and leaves the sheet.
    void use(const std::string& type, bool completed)
    {
        const auto activity = std::make_shared<tests::FakeActivity>(type);
        fake->sharing.found.answers.back()({activity}, true);
        settle();
        sheet()->list()->rowOf(*activity)->row()->activate();
        activity->activityDidFinish(completed);
        settle();
        if (!completed)
            sheet()->closePressed();
        sheetComes();
    }
    std::vector<std::string> messages() const { return fake->machine.log.texts(base::MemoryLog::Line::Kind::Message); }
    const ActivityTypes& done() const { return *editor->activityTypes(); }
};

} // namespace

TEST_F(Sharing, AsksTheStoreAboutTheAppAndShowsTheSheetWithItsAnswer)
{
    open();
    share();
    EXPECT_THAT(messages(), Contains("displayShareSheetWithVideoURL"));
    EXPECT_EQ(sheet(), nullptr);

    storeAnswers("Tux Racer", "Tux", "https://example.org/tux");

    ASSERT_NE(sheet(), nullptr);
    EXPECT_EQ(sheet()->activityItems(),
              (ShareItems{"Tux Racer by Tux", "https://example.org/tux", Url::fromPath(kMovie)}));
}

TEST_F(Sharing, WaitsForTheMainQueuesNextTurn)
{
    open();
    editor->shareAction();
    EXPECT_THAT(messages(), testing::Not(Contains("displayShareSheetWithVideoURL")));
    EXPECT_EQ(top(), phoneTop(editor->cancelButton(), editor->saveButton()));
    settle();
    EXPECT_THAT(messages(), Contains("displayShareSheetWithVideoURL"));
    EXPECT_EQ(top(), phoneTop(editor->doneButton(), editor->saveButton()));
}

TEST_F(Sharing, GivesTheBareNameOfAnAppWhoseAuthorIsNotKnown)
{
    open();
    share();
    storeAnswers("Tux Racer", std::nullopt, std::nullopt);
    EXPECT_EQ(sheet()->activityItems(), (ShareItems{"Tux Racer", "", Url::fromPath(kMovie)}));
}

TEST_F(Sharing, GivesEmptyTextsWhereNothingIsKnown)
{
    open();
    share();
    storeAnswers(std::nullopt, std::nullopt, std::nullopt);
    EXPECT_EQ(sheet()->activityItems(), (ShareItems{"", "", Url::fromPath(kMovie)}));
}

TEST_F(Sharing, GivesTheHostsMessageInPlaceOfTextAndLink)
{
    open();
    editor->setOverrideShareMessage("Look at this");
    shareAndWait();
    EXPECT_EQ(sheet()->activityItems(), (ShareItems{"Look at this", Url::fromPath(kMovie)}));
}

TEST_F(Sharing, GivesTheHostsAttachmentBehindTheMovie)
{
    open();
    editor->setFileAttachmentURL(Url::fromPath("/race.log"));
    shareAndWait();
    EXPECT_EQ(sheet()->activityItems(), (ShareItems{"Tux Racer by Tux", "https://example.org/tux",
                                                    Url::fromPath(kMovie), Url::fromPath("/race.log")}));
}

TEST_F(Sharing, GivesTheMovieOfTheMomentOfTheTap)
{
    open();
    share();
    editor->setVideoURL(Url::fromPath("/trimmed.mp4"));
    storeAnswers("Tux Racer", "Tux", "");
    EXPECT_THAT(sheet()->activityItems(), Contains(platform::ShareItem(Url::fromPath(kMovie))));
}

TEST_F(Sharing, CallsTheMovieWhatItsReceiverSeesWithoutItsKind)
{
    open();
    shareAndWait();
    const std::string name = Url::fromPath(kMovie).lastPathComponent();
    EXPECT_EQ(sheet()->summary()->nameLabel()->text(), "Recording of " + name.substr(0, name.rfind('.')));
}

TEST_F(Sharing, LeavesOutThePasteboardAndKeepsTheSheetsOwnOrder)
{
    open();
    shareAndWait();
    EXPECT_THAT(sheet()->activityList().excludedTypes(), ElementsAre(kActivityTypeCopyToPasteboard));
    EXPECT_THAT(sheet()->activityList().typeOrder(), IsEmpty());
    EXPECT_THAT(sheet()->activityList().activities(), IsEmpty());
}

TEST_F(Sharing, IsUpOnceTheSheetIsAllOnTheScreenAndNoLongerThanThat)
{
    open();
    share();
    storeAnswers("Tux Racer", "Tux", "");
    EXPECT_FALSE(editor->isShareSheetUp()) << "it is on its way";
    sheetComes();
    EXPECT_TRUE(editor->isShareSheetUp());
    sheet()->closePressed();
    sheetComes();
    EXPECT_FALSE(editor->isShareSheetUp());
    EXPECT_EQ(sheet(), nullptr);
}

TEST_F(Sharing, KeepsSaveAndDoneFromDoingAnythingWhileTheSheetIsUp)
{
    open();
    shareAndWait();
    editor->saveAction();
    editor->doneAction();
    settle();
    EXPECT_THAT(done(), IsEmpty());
    EXPECT_THAT(delegate->finishes, IsEmpty());
    EXPECT_EQ(fake->media.exportSession(), nullptr);
}

TEST_F(Sharing, NotesWhatWasCompletedAndTellsTheHostWhenTheUserIsDone)
{
    open();
    shareAndWait();
    use(kActivityTypeMail, true);
    EXPECT_THAT(done(), ElementsAre(kActivityTypeMail));
    shareAndWait();
    use(kActivityTypeMail, true);
    editor->doneAction();
    ASSERT_THAT(delegate->finishes, SizeIs(1));
    EXPECT_THAT(*delegate->finishes[0], ElementsAre(kActivityTypeMail, kActivityTypeMail));
    EXPECT_THAT(fake->sharing.ended, ElementsAre("Mail completed", "Mail completed"));
}

TEST_F(Sharing, NotesNothingThatWasCancelledOrFailed)
{
    open();
    shareAndWait();
    use(kActivityTypeMail, false);
    EXPECT_THAT(done(), IsEmpty());
}

TEST_F(Sharing, AsksTheStoreAnewEachTimeAlsoWhileTheSheetIsUp)
{
    open();
    shareAndWait();
    const auto first = sheet();
    share();
    EXPECT_EQ(fake->store.requests.size(), 2U);
    storeAnswers("Tux Racer", "Tux", "");
    EXPECT_EQ(sheet(), first) << "who presents already presents nothing else";
    EXPECT_TRUE(editor->isShareSheetUp());
}

TEST_F(Sharing, NotesItInATurnOfItsOwn)
{
    open();
    shareAndWait();
    const auto mail = std::make_shared<tests::FakeActivity>(kActivityTypeMail);
    fake->sharing.found.answers.back()({mail}, true);
    settle();
    sheet()->list()->rowOf(*mail)->row()->activate();
    mail->activityDidFinish(true);
    fake->machine.clock.advance(std::chrono::seconds(1));
    while (sheet() && fake->machine.mainQueue.runDue() > 0)
        EXPECT_THAT(done(), IsEmpty());
    EXPECT_EQ(sheet(), nullptr);
    EXPECT_THAT(done(), IsEmpty()) << "whoever hears of the sheet's end comes first";
    settle();
    EXPECT_THAT(done(), ElementsAre(kActivityTypeMail));
}

TEST_F(Sharing, KeepsNoEditorThatHasGone)
{
    const auto drop = [this] {
        const std::weak_ptr<VKVideoEditorViewController> weak = editor;
        editor.reset();
        fake->window->setRootViewController(nullptr);
        container.reset();
        return weak.expired();
    };
    open();
    editor->shareAction();
    EXPECT_TRUE(drop()) << "before the main queue's next turn";
    fake->machine.drain();

    open();
    share();
    storeAnswers("Tux Racer", "Tux", "");
    const auto sheetOfIt = sheet();
    EXPECT_TRUE(drop()) << "on the sheet's way up";
    fake->machine.drain();
}

TEST_F(Sharing, ShowsNothingWhenTheStoreAnswersAnEditorThatHasGone)
{
    open();
    share();
    close();
    fake->store.answer({});
    fake->machine.drain();
}

TEST_F(Sharing, ResetsThePhonesTopBarToDoneAndSave)
{
    open();
    editor->playAction();
    share();
    EXPECT_EQ(top(), phoneTop(editor->doneButton(), editor->saveButton()));
}

class SharingOnAPad : public Sharing {
protected:
    void SetUp() override
    {
        Sharing::SetUp();
        fake->device.idiom = platform::InterfaceIdiom::Pad;
    }
};

TEST_F(SharingOnAPad, PutsThePlayItemBackAlsoWhileTheMovieIsPlaying)
{
    open();
    editor->playAction();
    share();
    EXPECT_EQ(top(), pad(editor->doneButton(), {editor->playButton(), editor->shareButton(), editor->saveButton()}));
}

TEST_F(SharingOnAPad, HasNeitherPlayNorPauseBeforeTheFirstPlay)
{
    open();
    share();
    Items items = pad(editor->doneButton(), {editor->playButton(), editor->shareButton(), editor->saveButton()});
    std::erase(items, editor->playButton());
    EXPECT_EQ(top(), items);
}

TEST_F(SharingOnAPad, ShowsTheSheetAtTheShareItem)
{
    open();
    shareAndWait();
    EXPECT_EQ(sheet()->modalPresentationStyle(), platform::ModalPresentationStyle::Popover);
    EXPECT_EQ(sheet()->popoverSource(), editor->shareButton());
}

TEST_F(Sharing, SlidesTheSheetUpOnAPhone)
{
    open();
    shareAndWait();
    EXPECT_EQ(sheet()->modalPresentationStyle(), platform::ModalPresentationStyle::Sheet);
}

TEST_F(Sharing, HasAKeyOfItsOwn)
{
    open();
    editor->becomeFirstResponder();
    EXPECT_TRUE(fake->window->keyDown(platform::Key::Character, 's', true, true));
    settle();
    EXPECT_THAT(messages(), Contains("displayShareSheetWithVideoURL"));
}

TEST_F(Sharing, IsWhatTheShareButtonDoes)
{
    open();
    fake->window->commit();
    tap(editor->shareButton()->view());
    EXPECT_THAT(messages(), Contains("displayShareSheetWithVideoURL"));
}

// Classes stay as long as the process: behind these tests it has the video service's client library.

TEST_F(Sharing, OffersTheVideoServiceBehindMailAndMessageWhereItsClientLibraryIs)
{
    declareVideoService();
    open();
    shareAndWait();
    EXPECT_THAT(sheet()->activityList().activities(), SizeIs(1));
    EXPECT_THAT(sheet()->activityList().typeOrder(),
                ElementsAre(kActivityTypeMail, kActivityTypeMessage, "VKPublishToYouTube",
                            kActivityTypeCopyToPasteboard, kActivityTypePostToFacebook));
    EXPECT_THAT(sheet()->activityList().excludedTypes(), ElementsAre(kActivityTypeCopyToPasteboard));
}

TEST_F(Sharing, LeavesTheVideoServiceToItsOwnApplicationWhereThatIs)
{
    declareVideoService();
    fake->bundles.add("/applications/video")->identifier = "com.youtube.ShareExtension";
    open();
    shareAndWait();
    EXPECT_THAT(sheet()->activityList().activities(), IsEmpty());
    EXPECT_THAT(sheet()->activityList().typeOrder(), IsEmpty());
    EXPECT_THAT(sheet()->activityList().excludedTypes(), ElementsAre(kActivityTypeCopyToPasteboard));
}
