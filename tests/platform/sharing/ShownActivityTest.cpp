// Activities that show something of their own above the sheet, and those that were given up there.
#include "SharingFixture.h"

namespace tests {

namespace {

using platform::AlertController;
using platform::Key;
using testing::ElementsAre;

/// Beside a mail, an upload that shows something of its own, is closed, and ends later all the same.
class GivenUp : public Sharing {
protected:
    void giveUp()
    {
        upload->endsWhenCancelled = false;
        upload->controller = std::make_shared<platform::ViewController>();
        open({upload, mail});
        tapRow(0);
        settle();
        window->keyDown(Key::Escape);
        settle();
        EXPECT_FALSE(sheet->isPerforming());
    }

    const std::shared_ptr<DrivenActivity> upload = activity("upload");
    const std::shared_ptr<DrivenActivity> mail = activity("mail");
};

TEST_F(GivenUp, DoesNotTellTheProgressOfWhatIsPerformedNow)
{
    giveUp();
    tapRow(1);
    const auto& bar = *row(1)->progressView();
    mail->tell(0.25);
    upload->tell(0.75);
    EXPECT_EQ(bar.progress(), 0.25) << "that one was given up";
    mail->tell(1.5);
    EXPECT_EQ(bar.progress(), 1);
    mail->tell(-1);
    EXPECT_EQ(bar.progress(), 0);
    mail->tell(std::nullopt);
    EXPECT_EQ(bar.progress(), std::nullopt);
}

TEST_F(Sharing, WhatAnActivityShowsStandsAboveTheSheet)
{
    struct Shown final : platform::ViewController {
        void presentationDidShow() override { isUp = true; }
        bool isUp = false;
    };
    const auto upload = activity("upload");
    const auto shown = std::make_shared<Shown>();
    upload->controller = shown;
    open({upload});
    tapRow(0);
    machine.drain();
    EXPECT_FALSE(shown->isUp) << "it slides up";
    settle();
    EXPECT_TRUE(shown->isUp);
    EXPECT_EQ(sheet->presentedViewController(), upload->controller);
    EXPECT_EQ(upload->performed, 0) << "it is shown in place of being performed";
    upload->activityDidFinish(true);
    settle();
    EXPECT_TRUE(isGone());
    EXPECT_FALSE(upload->controller->window());
    EXPECT_THAT(results, ElementsAre("upload yes"));
}

TEST_F(Sharing, WhatAnActivityShowsGoesBeforeItsErrorIsTold)
{
    const auto upload = activity("upload");
    upload->controller = std::make_shared<platform::ViewController>();
    open({upload});
    tapRow(0);
    settle();
    upload->activityDidFail(error("no network"));
    settle();
    settle();
    const auto alert = std::dynamic_pointer_cast<AlertController>(sheet->presentedViewController());
    ASSERT_TRUE(alert);
    EXPECT_EQ(alert->message(), "no network");
}

TEST_F(Sharing, ClosingWhatAnActivityShowsCancelsIt)
{
    const auto upload = activity("upload");
    upload->controller = std::make_shared<platform::ViewController>();
    open({upload});
    tapRow(0);
    settle();
    window->keyDown(Key::Escape);
    settle();
    EXPECT_EQ(upload->cancelled, 1);
    EXPECT_FALSE(isGone());
    EXPECT_FALSE(sheet->isPerforming());
    EXPECT_TRUE(row(0)->row()->isEnabled());
}

TEST_F(GivenUp, CountsWhenItIsCompletedAllTheSame)
{
    giveUp();
    upload->activityDidFinish(true);
    settle();
    EXPECT_THAT(results, ElementsAre("upload yes"));
}

TEST_F(GivenUp, DoesNotEndWhatIsPerformedNow)
{
    giveUp();
    tapRow(1);
    upload->activityDidFail(error("no network"));
    settle();
    EXPECT_TRUE(sheet->isPerforming());
    EXPECT_FALSE(sheet->presentedViewController());
    mail->activityDidFinish(true);
    settle();
    EXPECT_THAT(results, ElementsAre("mail yes"));
}

TEST_F(GivenUp, IsNoNewsWhenItFailsAfterwards)
{
    giveUp();
    upload->activityDidFail(error("no network"));
    settle();
    EXPECT_FALSE(sheet->presentedViewController());
    EXPECT_FALSE(isGone());
}

} // namespace

} // namespace tests
