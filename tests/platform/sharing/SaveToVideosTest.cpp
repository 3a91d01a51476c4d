// Saving into the library of videos as a way to share.
#include "platform/sharing/SaveToVideosActivity.h"

#include "platform/sharing/ActivityTypes.h"
#include "support/EnglishWords.h"
#include "support/FakePhotoLibrary.h"
#include "support/TestSystem.h"

#include <gtest/gtest.h>

namespace tests {

namespace {

struct SavingToVideos : testing::Test {
    TestSystem machine;
    EnglishWords words;
    FakePhotoLibrary library;
    std::shared_ptr<platform::SaveToVideosActivity> activity =
        std::make_shared<platform::SaveToVideosActivity>(words, library, machine.mainQueue);
    std::vector<platform::Activity::End> ends;

    void perform()
    {
        activity->setEndHandler([this](const platform::Activity::End& end) { ends.push_back(end); });
        activity->prepareWithActivityItems(
            {"text", base::Url::fromPath("/tmp/race.mp4"), base::Url::fromPath("/tmp/notes.txt")});
        activity->performActivity();
    }
};

TEST_F(SavingToVideos, EndsWhenTheLibraryHasTheMovie)
{
    EXPECT_EQ(activity->activityType(), platform::kActivityTypeSaveToCameraRoll);
    EXPECT_EQ(activity->activityTitle(), "Save to Videos");
    perform();
    ASSERT_EQ(library.urls.size(), 1U) << "what goes along is no video";
    EXPECT_EQ(library.urls[0], base::Url::fromPath("/tmp/race.mp4"));
    machine.drain();
    EXPECT_TRUE(ends.empty());
    library.finish();
    EXPECT_TRUE(ends.empty()) << "not on the library's worker";
    machine.drain();
    ASSERT_EQ(ends.size(), 1U);
    EXPECT_TRUE(ends[0].completed);
}

TEST_F(SavingToVideos, SaysWhyItFailed)
{
    perform();
    library.fail(base::Error::make("posix", ENOSPC, "the disk is full"));
    machine.drain();
    ASSERT_EQ(ends.size(), 1U);
    EXPECT_FALSE(ends[0].completed);
    EXPECT_EQ(ends[0].error->description(), "the disk is full");
}

TEST_F(SavingToVideos, MayBeForgottenWhileTheLibraryWorks)
{
    perform();
    const std::weak_ptr<platform::Activity> weak = activity;
    activity.reset();
    EXPECT_TRUE(weak.expired());
    library.finish();
    machine.drain();
    EXPECT_TRUE(ends.empty());
    EXPECT_EQ(library.assets.size(), 1U);
}

TEST_F(SavingToVideos, MayBeForgottenBeforeTheMainQueueHearsOfItsEnd)
{
    perform();
    library.finish();
    activity.reset();
    machine.drain();
    EXPECT_TRUE(ends.empty());
}

TEST_F(SavingToVideos, SaysWhereTheLibraryHasPutTheMovie)
{
    activity->setReceiver("/home/u/Videos/race.mp4");
    EXPECT_EQ(activity->receiver(), "/home/u/Videos/race.mp4");
}

TEST_F(SavingToVideos, NeedsAMovie)
{
    EXPECT_FALSE(activity->canPerformWithActivityItems({"text"}));
    EXPECT_TRUE(activity->canPerformWithActivityItems({base::Url::fromPath("/tmp/race.mp4")}));
}

} // namespace

} // namespace tests
