#include "EditorFixture.h"

#include <gmock/gmock.h>

#include <thread>

namespace {

class Thumbnails : public EditorTest {
protected:
    static platform::ImageRef picture()
    {
        return std::make_shared<const platform::Image>(platform::Bitmap::transparent(1, 1), 1.0);
    }
    std::shared_ptr<tests::FakeImageGenerator> generator() const { return fake->media.imageGenerator(); }
    void request(double timestamp)
    {
        editor->movieScrubber_requestThumbnailImageForTimestamp(*editor->avTrimmer(), timestamp);
    }
    double shownTimestamp(std::size_t index) const { return editor->avTrimmer()->timestamps().at(index); }
    const std::map<double, platform::ImageRef>& shown() const { return editor->avTrimmer()->thumbnails(); }
    void openMovieOf(base::Size size, double scale)
    {
        close();
        fake = std::make_unique<tests::FakePlatform>(tests::FakePlatform::kPhone, scale);
        fake->media.movies[kMovie] = tests::FakeMovie::lasting(10, size);
        open();
    }
};

} // namespace

TEST_F(Thumbnails, TheStripOfALoadedMovieIsAskedForOneByOne)
{
    open();
    ASSERT_TRUE(generator());
    const auto& timestamps = editor->avTrimmer()->timestamps();
    ASSERT_GT(timestamps.size(), 5U);
    ASSERT_EQ(generator()->requests.size(), timestamps.size());
    for (std::size_t i = 0; i < timestamps.size(); ++i)
        EXPECT_NEAR(generator()->requests[i].time.seconds(), timestamps[i], 1e-9);
    for (const auto& request : generator()->requests)
        EXPECT_EQ(request.time.timescale, 1'000'000'000) << "so that it is not before the picture that it means";
    EXPECT_EQ(generator()->asset, editor->avPlayerItem()->asset());
    EXPECT_EQ(generator(), editor->thumbnailGenerator());
    EXPECT_EQ(fake->media.imageGeneratorCount(), 1U);
}

TEST_F(Thumbnails, APictureComesToTheStripOnTheMainQueue)
{
    open();
    const auto image = picture();
    std::thread([&] { generator()->succeed(2, image); }).join();
    EXPECT_TRUE(shown().empty());
    fake->machine.drain();
    ASSERT_EQ(shown().size(), 1U);
    EXPECT_EQ(shown().at(shownTimestamp(2)), image);
    EXPECT_EQ(editor->cachedTimeStamps()->object(shownTimestamp(2)), image);
}

TEST_F(Thumbnails, WhatIsAskedForTwiceIsMadeOnce)
{
    open();
    const auto image = picture();
    generator()->succeed(1, image);
    fake->machine.drain();
    const auto requests = generator()->requests.size();
    editor->avTrimmer()->reloadData();
    EXPECT_EQ(generator()->requests.size(), 2 * requests - 1) << "the one that is there is not made again";
    editor->avTrimmer()->setThumbnailImage_forTimestamp(picture(), shownTimestamp(1));
    request(shownTimestamp(1));
    EXPECT_NE(shown().at(shownTimestamp(1)), image) << "not before the main queue's next turn";
    fake->machine.drain();
    EXPECT_EQ(shown().at(shownTimestamp(1)), image);
}

TEST_F(Thumbnails, AnErrorLeavesNothingAndTheNextRequestTriesAgain)
{
    open();
    const auto requests = generator()->requests.size();
    generator()->fail(1);
    fake->machine.drain();
    EXPECT_TRUE(shown().empty());
    EXPECT_EQ(editor->cachedTimeStamps()->count(), 0U);
    request(shownTimestamp(1));
    EXPECT_EQ(generator()->requests.size(), requests + 1);
}

TEST_F(Thumbnails, APictureThatWasGivenUpLeavesNothingEither)
{
    open();
    const auto given = generator()->requests[1];
    given.handler(given.time, nullptr, base::MediaTime::invalid(), platform::ImageGenerator::Result::Cancelled,
                  nullptr);
    fake->machine.drain();
    EXPECT_TRUE(shown().empty());
    EXPECT_EQ(editor->cachedTimeStamps()->count(), 0U);
}

TEST_F(Thumbnails, TurningDropsAllAndAsksAgainAtTheNewSize)
{
    open();
    const auto former = generator();
    const auto request = former->requests[1];
    former->succeed(0, picture());
    fake->machine.drain();
    EXPECT_EQ(editor->cachedTimeStamps()->count(), 1U);
    turnTo({720, 360});
    ASSERT_NE(generator(), former);
    EXPECT_EQ(editor->thumbnailGenerator(), generator());
    EXPECT_EQ(editor->cachedTimeStamps()->count(), 0U);
    EXPECT_GE(generator()->requests.size(), editor->avTrimmer()->timestamps().size());

    request.handler(request.time, picture(), request.time, platform::ImageGenerator::Result::Succeeded, nullptr);
    fake->machine.drain();
    EXPECT_EQ(editor->cachedTimeStamps()->count(), 0U) << "too late to stand among those of the new size";
}

TEST_F(Thumbnails, AnotherMovieDropsAllOfTheFormer)
{
    open();
    generator()->succeed(0, picture());
    fake->machine.drain();
    const auto former = generator();
    fake->media.movies["/other.mp4"] = tests::FakeMovie::lasting(10);
    editor->reloadAVLayerWithURL(base::Url::fromPath("/other.mp4"));
    EXPECT_EQ(editor->thumbnailGenerator(), former) << "the strip keeps its data until the new item is loaded";
    settle();
    EXPECT_NE(editor->thumbnailGenerator(), former);
    EXPECT_EQ(generator()->asset->url()->path(), "/other.mp4");
    EXPECT_EQ(editor->cachedTimeStamps()->count(), 0U);
}

TEST_F(Thumbnails, ThePicturesMayComeAfterTheEditorHasGone)
{
    open();
    const auto request = generator()->requests[0];
    const std::weak_ptr<VKVideoEditorViewController> watched = editor;
    editor.reset();
    fake->window->setRootViewController(nullptr);
    container.reset();
    EXPECT_TRUE(watched.expired()) << "what is asked for does not keep it";
    std::thread([&] {
        request.handler(request.time, picture(), request.time, platform::ImageGenerator::Result::Succeeded, nullptr);
    }).join();
    fake->machine.drain();
}

TEST_F(Thumbnails, OneThreadWritesWhileTheOtherReads)
{
    open();
    const auto requests = generator()->requests;
    std::thread worker([&] {
        for (int round = 0; round < 50; ++round)
            for (const auto& request : requests)
                request.handler(request.time, picture(), request.time, platform::ImageGenerator::Result::Succeeded,
                                nullptr);
    });
    for (int round = 0; round < 50; ++round) {
        editor->avTrimmer()->reloadData();
        fake->machine.drain();
    }
    worker.join();
    fake->machine.drain();
    EXPECT_EQ(editor->cachedTimeStamps()->count(), requests.size());
    EXPECT_EQ(shown().size(), requests.size());
}

TEST_F(Thumbnails, TheSizeCarriesTheScaleOnceInHeightAndTwiceInWidth)
{
    openMovieOf({1920, 1080}, 2);
    EXPECT_EQ(editor->getThumbnailSize(), (base::Size{270, 76}));
    EXPECT_EQ(generator()->maximumSize(), (base::Size{270, 76}));
}

TEST_F(Thumbnails, TheSizeOfAnUprightMovieAtAFractionalScale)
{
    // 1.5 × 38 × 0.5625 is 32.0625.
    openMovieOf({1080, 1920}, 1.5);
    EXPECT_EQ(editor->getThumbnailSize(), (base::Size{1.5 * 32, 57}));
}

TEST_F(Thumbnails, HalfAPointIsRoundedToTheEvenOne)
{
    // 38 × 0.75 is 28.5, and 38 × 0.25 is 9.5.
    openMovieOf({750, 1000}, 1);
    EXPECT_EQ(editor->getThumbnailSize().width, 28);
    openMovieOf({250, 1000}, 1);
    EXPECT_EQ(editor->getThumbnailSize().width, 10);
}

TEST_F(Thumbnails, TheProductIsNarrowedBeforeItIsRounded)
{
    // 38 × float(5 / 76) lies just above 2.5, and is 2.5 in single precision: rounded to 2, not to 3.
    openMovieOf({5, 76}, 1);
    EXPECT_EQ(editor->getThumbnailSize().width, 2);
}

TEST_F(Thumbnails, AMovieWithoutAPictureBoundsNothing)
{
    auto movie = tests::FakeMovie::lasting(10);
    movie.tracks.erase(movie.tracks.begin());
    fake->media.movies[kMovie] = movie;
    open();
    EXPECT_TRUE(std::isnan(editor->getThumbnailSize().width));
    EXPECT_EQ(editor->getThumbnailSize().height, 38);
}
