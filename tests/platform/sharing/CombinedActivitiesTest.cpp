// Several that know what can be done, asked as one.
#include "platform/sharing/CombinedActivities.h"
#include "support/FakeActivities.h"

#include <gmock/gmock.h>

namespace tests {

namespace {

class Combined : public ::testing::Test {
protected:
    void ask()
    {
        combined.findActivities({"text"}, [this](const auto& activities, bool isLast) {
            std::string batch;
            for (const auto& each : activities)
                batch += each->activityType() + " ";
            told.push_back(batch + (isLast ? "last" : "more"));
        });
    }
    static std::vector<std::shared_ptr<platform::Activity>> some(const char* type)
    {
        return {std::make_shared<FakeActivity>(type)};
    }

    FakeActivities near;
    FakeActivities far;
    platform::CombinedActivities combined{{&near, &far}};
    std::vector<std::string> told;
};

} // namespace

TEST_F(Combined, AsksEachWithTheItems)
{
    ask();
    EXPECT_THAT(near.asked, ::testing::ElementsAre(platform::ShareItems{"text"}));
    EXPECT_THAT(far.asked, ::testing::ElementsAre(platform::ShareItems{"text"}));
}

TEST_F(Combined, TellsWhatEachFindsAsItComesAndTheEndOnce)
{
    ask();
    far.answers[0](some("Bluetooth"), true);
    near.answers[0](some("Mail"), false);
    near.answers[0](some("Message"), true);
    EXPECT_THAT(told, ::testing::ElementsAre("Bluetooth more", "Mail more", "Message last"));
}

TEST_F(Combined, KeepsTheAnswersOfTwoQuestionsApart)
{
    ask();
    ask();
    near.answers[1]({}, true);
    far.answers[0]({}, true);
    far.answers[1](some("Bluetooth"), true);
    EXPECT_THAT(told, ::testing::ElementsAre("more", "more", "Bluetooth last"));
}

} // namespace tests
