// Activities: how they end, and what they are given.
#include "platform/sharing/Activity.h"

#include <gtest/gtest.h>

namespace tests {

namespace {

using platform::Activity;

class Sending : public Activity {
public:
    std::string activityType() const override { return "Sending"; }
    std::string activityTitle() const override { return "Send"; }
    void tell(std::optional<double> progress) const { noteProgress(progress); }
};

} // namespace

TEST(AnActivity, EndsOnceHoweverOftenItSaysSo)
{
    const auto sending = std::make_shared<Sending>();
    std::vector<Activity::End> ends;
    sending->setEndHandler([&](const Activity::End& end) { ends.push_back(end); });

    sending->activityDidFail(base::Error::make("test", 1, "the device has gone"));
    sending->activityDidFinish(true);

    ASSERT_EQ(ends.size(), 1U);
    EXPECT_FALSE(ends[0].completed);
    EXPECT_EQ(ends[0].error->description(), "the device has gone");
}

TEST(AnActivity, EndsAgainWhenItIsPerformedAgain)
{
    const auto sending = std::make_shared<Sending>();
    std::vector<bool> ends;
    const auto begin = [&] {
        sending->setProgressHandler([&](std::optional<double>) { ends.push_back(false); });
        sending->setEndHandler([&](const Activity::End& end) { ends.push_back(end.completed); });
    };
    begin();
    sending->activityDidFail(base::Error::make("test", 1, "the device is asleep"));
    sending->setEndHandler({});
    sending->activityDidFinish(true);
    EXPECT_EQ(ends, std::vector<bool>{false});

    begin();
    sending->tell(0.5);
    sending->activityDidFinish(true);
    sending->activityDidFinish(true);
    EXPECT_EQ(ends, (std::vector<bool>{false, false, true}));
}

TEST(AnActivity, MayBeLetGoOfByWhoHearsOfItsEnd)
{
    auto sending = std::make_shared<Sending>();
    sending->setEndHandler([&](const Activity::End&) { sending = nullptr; });

    sending->activityDidFinish(true);

    EXPECT_EQ(sending, nullptr);
}

TEST(AnActivity, CanBePerformedWithAnythingUnlessItSaysOtherwise)
{
    EXPECT_TRUE(std::make_shared<Sending>()->canPerformWithActivityItems({"text"}));
}

TEST(AnActivity, ToldToNobodyIsNoHarm)
{
    const auto sending = std::make_shared<Sending>();
    sending->tell(0.5);
    sending->activityDidFinish(true);
}

TEST(AnActivity, LetsGoOfThoseWhoListenOnceItHasEnded)
{
    const auto sending = std::make_shared<Sending>();
    const auto listener = std::make_shared<int>();
    sending->setProgressHandler([listener](std::optional<double>) {});
    sending->setEndHandler([listener](const Activity::End&) {});
    sending->activityDidFinish(true);
    EXPECT_EQ(listener.use_count(), 1);
}

TEST(AnActivity, TellsNoProgressOnceItHasEnded)
{
    const auto sending = std::make_shared<Sending>();
    std::vector<std::optional<double>> told;
    sending->setProgressHandler([&](std::optional<double> progress) { told.push_back(progress); });

    sending->tell(std::nullopt);
    sending->tell(0.5);
    sending->activityDidFinish(false);
    sending->tell(0.75);

    EXPECT_EQ(told, (std::vector<std::optional<double>>{std::nullopt, 0.5}));
}

TEST(ItemsToShare, AreTextsOnLinesAndFilesInOrder)
{
    const platform::ShareItems items{"Tux Racer by Tux", "", base::Url::fromPath("/tmp/race.mp4"),
                                     "https://example.org/race", base::Url::fromPath("/tmp/race.log")};

    EXPECT_EQ(platform::textOf(items), "Tux Racer by Tux\nhttps://example.org/race");
    EXPECT_EQ(platform::filesOf(items),
              (std::vector{base::Url::fromPath("/tmp/race.mp4"), base::Url::fromPath("/tmp/race.log")}));
}

} // namespace tests
