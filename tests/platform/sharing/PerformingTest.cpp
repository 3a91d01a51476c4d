// The share sheet while an activity is performed: how that goes on, and how all of it ends.
#include "SharingFixture.h"

namespace tests {

namespace {

using platform::AlertController;
using platform::Key;
using testing::ElementsAre;
using testing::IsEmpty;

TEST_F(Sharing, WhatCompletesClosesTheSheetAndIsTold)
{
    const auto mail = activity("mail");
    open({mail});
    tapRow(0);
    EXPECT_EQ(mail->prepared, items);
    EXPECT_EQ(mail->performed, 1);
    EXPECT_THAT(results, IsEmpty());
    mail->activityDidFinish(true);
    EXPECT_THAT(results, IsEmpty()) << "not before it is gone";
    settle();
    EXPECT_TRUE(isGone());
    EXPECT_THAT(results, ElementsAre("mail yes"));
    EXPECT_THAT(ended, ElementsAre("mail yes"));
    EXPECT_EQ(sheet->performedActivity(), mail);
    EXPECT_EQ(mail->cancelled, 0) << "it has ended";
}

TEST_F(Sharing, WhatEndsAtOnceDoesSo)
{
    const auto folder = activity("folder");
    folder->endsAtOnce = true;
    open({folder});
    tapRow(0);
    settle();
    EXPECT_THAT(results, ElementsAre("folder yes"));
}

TEST_F(Sharing, WhatTheUserCancelsInItsOwnDialogueLeadsBackToTheList)
{
    const auto mail = activity("mail");
    open({mail, activity("folder")});
    tapRow(0);
    mail->activityDidFinish(false);
    settle();
    machine.advance(std::chrono::seconds(2));
    EXPECT_FALSE(machine.mainQueue.untilNext()) << "nothing moves any more";
    EXPECT_FALSE(isGone());
    EXPECT_TRUE(row(0)->row()->isEnabled());
    EXPECT_TRUE(row(1)->row()->isEnabled());
    EXPECT_FALSE(sheet->presentedViewController());
    tapOn(*sheet->closeButton());
    settle();
    EXPECT_THAT(results, ElementsAre(" no"));
}

TEST_F(Sharing, WhatFailsSaysWhyAndLeadsBackToTheList)
{
    const auto mail = activity("mail");
    open({mail});
    tapRow(0);
    mail->activityDidFail(base::Error::withMessage(error("for the log"), "MOVIE_GONE", {{"name", "race.mp4"}}));
    settle();
    const auto alert = std::dynamic_pointer_cast<AlertController>(sheet->presentedViewController());
    ASSERT_TRUE(alert);
    EXPECT_EQ(alert->title(), "“\u2068mail\u2069” did not work");
    EXPECT_EQ(alert->message(), "“\u2068race.mp4\u2069” cannot be opened: it is no longer there.");
    window->keyDown(Key::Return);
    settle();
    EXPECT_FALSE(sheet->presentedViewController());
    EXPECT_FALSE(isGone());
    EXPECT_TRUE(row(0)->row()->isEnabled());
    EXPECT_THAT(results, IsEmpty());
}

TEST_F(Sharing, NamesStayInOnePieceInWhatFailed)
{
    // Whoever named them had another direction in mind, or something bad.
    const auto phone = activity("הטלפון\u202E של");
    open({phone});
    tapRow(0);
    phone->activityDidFail(
        base::Error::withMessage(error("for the log"), "MOVIE_GONE", {{"name", "a\u202E\n4pm.exe"}}));
    settle();
    const auto alert = std::dynamic_pointer_cast<AlertController>(sheet->presentedViewController());
    ASSERT_TRUE(alert);
    EXPECT_EQ(alert->title(), "“\u2068הטלפון של\u2069” did not work");
    EXPECT_EQ(alert->message(), "“\u2068a 4pm.exe\u2069” cannot be opened: it is no longer there.");
}

TEST_F(Sharing, WhatFailsWithoutWordsShowsItsDescription)
{
    const auto phone = activity("phone");
    open({phone});
    tapRow(0);
    phone->activityDidFail(error("for\u202E the log\x1b"));
    settle();
    const auto alert = std::dynamic_pointer_cast<AlertController>(sheet->presentedViewController());
    ASSERT_TRUE(alert);
    EXPECT_EQ(alert->message(), "for the log");
}

TEST_F(Sharing, WhileOneIsPerformedTheOthersWait)
{
    const auto send = activity("device");
    const auto mail = activity("mail");
    open({send, mail});
    tapRow(0);
    window->commit();
    EXPECT_FALSE(row(0)->progressView()->isHidden());
    EXPECT_FALSE(row(0)->cancelButton()->isHidden());
    EXPECT_TRUE(row(0)->row()->isBusy()) << "it looks as what can be pressed";
    EXPECT_FALSE(row(1)->row()->isEnabled());
    EXPECT_EQ(row(0)->progressView()->progress(), std::nullopt);
    EXPECT_GE(row(0)->cancelButton()->frame().width(), 44);
    EXPECT_EQ(row(0)->cancelButton()->frame().height(), 44);
    send->tell(0.404);
    EXPECT_EQ(row(0)->progressView()->progress(), 0.4);
    tapRow(1);
    EXPECT_EQ(mail->performed, 0);
    provider.found({activity("late")}, true);
    EXPECT_FALSE(row(2)->row()->isEnabled()) << "what comes meanwhile waits, too";
    tapOn(*row(0)->cancelButton());
    settle();
    EXPECT_EQ(send->cancelled, 1);
    EXPECT_FALSE(isGone());
    EXPECT_TRUE(row(0)->cancelButton()->isHidden());
    EXPECT_TRUE(row(0)->progressView()->isHidden());
    EXPECT_FALSE(row(0)->row()->isBusy());
    tapRow(1);
    EXPECT_EQ(mail->performed, 1);
}

TEST_F(Sharing, ClosingItWhileOneIsPerformedCancelsThatFirst)
{
    const auto send = activity("device");
    send->endsWhenCancelled = false;
    open({send});
    tapRow(0);
    window->keyDown(Key::Escape);
    machine.advance(std::chrono::milliseconds(500));
    EXPECT_EQ(send->cancelled, 1);
    EXPECT_FALSE(isGone());
    window->keyDown(Key::Escape);
    machine.advance(std::chrono::milliseconds(400));
    EXPECT_EQ(send->cancelled, 1);
    EXPECT_FALSE(isGone()) << "nor does asking twice make it quicker";
    send->activityDidFinish(false);
    settle();
    EXPECT_TRUE(isGone());
    EXPECT_THAT(ended, ElementsAre("device no"));
    EXPECT_THAT(results, ElementsAre("device no"));
}

TEST_F(Sharing, OneThatEndsAsSoonAsItIsCancelledLetsItCloseAtOnce)
{
    const auto send = activity("device");
    open({send});
    tapRow(0);
    tapOn(*sheet->closeButton());
    settle();
    EXPECT_TRUE(isGone());
    EXPECT_THAT(results, ElementsAre("device no"));
    const std::weak_ptr<platform::ShareSheet> weak = sheet;
    sheet.reset();
    EXPECT_TRUE(weak.expired()) << "nothing waits for it any more";
}

TEST_F(Sharing, ItDoesNotWaitForeverForOneThatDoesNotEnd)
{
    const auto send = activity("device");
    send->endsWhenCancelled = false;
    open({send});
    tapRow(0);
    window->keyDown(Key::Escape);
    machine.advance(std::chrono::milliseconds(999));
    EXPECT_EQ(sheet->presentingViewController(), root);
    machine.advance(std::chrono::milliseconds(1));
    settle();
    EXPECT_TRUE(isGone());
    EXPECT_THAT(results, ElementsAre(" no"));
    send->activityDidFinish(true);
    settle();
    EXPECT_THAT(results, ElementsAre(" no")) << "too late";
    EXPECT_THAT(ended, IsEmpty());
}

TEST_F(Sharing, WhatCompletesWhileItClosesStillCounts)
{
    const auto send = activity("device");
    send->endsWhenCancelled = false;
    open({send});
    tapRow(0);
    window->keyDown(Key::Escape);
    machine.advance(std::chrono::seconds(1));
    EXPECT_THAT(results, IsEmpty());
    send->activityDidFinish(true);
    settle();
    EXPECT_THAT(results, ElementsAre("device yes"));
}

TEST_F(Sharing, ItIsToldOnceHoweverItGoes)
{
    open({activity("mail")});
    root->dismiss(true);
    root->dismiss(true);
    settle();
    EXPECT_THAT(results, ElementsAre(" no"));
}

TEST_F(Sharing, ASheetThatIsTakenAwayCancelsWhatItPerforms)
{
    for (const bool hasBeenTaken : {false, true}) {
        results.clear();
        const auto send = activity("device");
        send->hasBeenTaken = hasBeenTaken;
        open({send});
        tapRow(0);
        root->dismiss(true);
        settle();
        EXPECT_TRUE(isGone());
        EXPECT_EQ(send->cancelled, 1);
        EXPECT_THAT(results, ElementsAre(" no"));
        EXPECT_THAT(ended, IsEmpty()) << "it is not there to tell";
    }
}

TEST_F(Sharing, WhatLeavesTakesNoMorePicks)
{
    const auto mail = activity("mail");
    open({mail});
    sheet->closePressed();
    row(0)->row()->activate();
    EXPECT_EQ(mail->performed, 0);
    settle();
    EXPECT_THAT(results, ElementsAre(" no"));
}

TEST_F(Sharing, ASheetIsKeptByNothingThatItPerforms)
{
    const auto send = activity("device");
    open({send});
    tapRow(0);
    const std::weak_ptr<platform::ShareSheet> weak = sheet;
    dropEverything();
    EXPECT_TRUE(weak.expired());
    send->tell(0.5);
    send->activityDidFinish(true);
    settle();
    EXPECT_THAT(ended, IsEmpty());
}

TEST_F(Sharing, WhatIsBeingCancelledIsCancelledOnceAndTellsNoMoreProgress)
{
    for (const bool isClosed : {false, true}) {
        const auto send = activity("device");
        send->endsWhenCancelled = false;
        open({send});
        tapRow(0);
        send->tell(0.5);
        if (isClosed)
            window->keyDown(Key::Escape);
        else
            tapOn(*row(0)->cancelButton());
        EXPECT_FALSE(row(0)->cancelButton()->isEnabled());
        EXPECT_EQ(row(0)->progressView()->progress(), std::nullopt);
        send->tell(0.9);
        EXPECT_EQ(row(0)->progressView()->progress(), std::nullopt);
        send->activityDidFinish(false);
        settle();
        EXPECT_EQ(isGone(), isClosed);
        if (isClosed)
            continue;
        tapRow(0);
        window->commit();
        EXPECT_TRUE(row(0)->cancelButton()->isEnabled()) << "it can be cancelled anew";
        send->activityDidFinish(true);
        settle();
        EXPECT_TRUE(isGone());
    }
}

} // namespace

} // namespace tests
