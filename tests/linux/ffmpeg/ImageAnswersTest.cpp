#include "support/ImageTest.h"

#include <gmock/gmock.h>

#include <map>

using testing::HasSubstr;

namespace {

/// Whether all that is asked for is answered, once, and from where.
using ImageAnswers = tests::ImageTest;

TEST_F(ImageAnswers, OfWhatIsNotATimeFail)
{
    use(movie("clock.mp4"));
    for (const auto time : {MediaTime::invalid(), MediaTime::indefinite()}) {
        const Answer answer = answerAt(time);
        EXPECT_EQ(answer.result, Result::Failed);
        EXPECT_EQ(answer.image, nullptr);
        ASSERT_TRUE(answer.error);
        EXPECT_THAT(answer.error->description(), HasSubstr("not a time"));
    }
}

TEST_F(ImageAnswers, CanBeMadeAfterTheFileWasRemoved)
{
    std::filesystem::copy_file(movie("clock.mp4"), copy, std::filesystem::copy_options::overwrite_existing);
    use(copy);
    bool loaded = false;
    asset->whenLoaded([&] { loaded = true; });
    ASSERT_TRUE(waitFor([&] { return loaded; }));
    std::filesystem::remove(copy);
    EXPECT_EQ(imageNumberAt(at(2)), 60);
}

TEST_F(ImageAnswers, OfMoviesThatCannotBeOpenedFailWithTheirError)
{
    for (const char* name : {"not-a-movie.mp4", "empty.mp4", "no-moov.mp4", "missing.mp4"}) {
        use(movie(name));
        const Answer answer = answerAt(at(1));
        EXPECT_EQ(answer.result, Result::Failed) << name;
        EXPECT_EQ(answer.error, asset->error()) << name;
    }
    use(movie("audio-only.m4a"));
    const Answer answer = answerAt(at(1));
    EXPECT_EQ(answer.result, Result::Failed);
    ASSERT_TRUE(answer.error);
    EXPECT_EQ(answer.error->description(), "“audio-only.m4a” has no pictures.");
}

TEST_F(ImageAnswers, OfDamagedMoviesAreAnsweredOnceEach)
{
    for (const char* name : {"truncated.mp4", "corrupt.mp4", "size-change.ts", "one-frame.mp4", "not-a-movie.mp4"}) {
        use(movie(name));
        generator->setMaximumSize({64, 64});
        for (int i = 19; i >= 0; --i)
            ask(MediaTime::make(i, 5));
        ASSERT_TRUE(waitForAnswers(20)) << name;
        EXPECT_TRUE(answerAt(at(0.1)).requested.isValid()) << "whatever came too often has come by now";
        std::map<std::int64_t, int> times;
        for (const Answer& each : answers) {
            ++times[each.requested.convertedTo(10).value];
            EXPECT_EQ(each.image == nullptr, each.result == Result::Failed);
            EXPECT_EQ(each.error != nullptr, each.result == Result::Failed);
        }
        EXPECT_EQ(times.size(), 21U) << name;
        EXPECT_EQ(answers.size(), 21U) << name;
    }
}

TEST_F(ImageAnswers, OfATruncatedMovieEndWithTheLastThatIsThere)
{
    use(movie("truncated.mp4"));
    EXPECT_EQ(imageNumberAt(at(1)), 30);
    const int last = imageNumberAt(at(3.9));
    EXPECT_GT(last, 40);
    EXPECT_LT(last, 80);
}

TEST_F(ImageAnswers, AreNotGivenAnyMoreWhenTheGeneratorIsGone)
{
    use(movie("long-gop.mp4"));
    for (int i = 0; i < 1200; i += 4)
        ask(MediaTime::make(i, 60));
    ASSERT_TRUE(waitForAnswers(3));
    generator = nullptr;
    const std::size_t before = count();
    EXPECT_LT(before, 300U);
    // Long enough for the others, had they not been given up.
    std::shared_ptr<platform::ImageGenerator> other = media.imageGeneratorWithAsset(asset);
    bool came = false;
    other->generateImagesAsynchronouslyForTimes(
        {MediaTime::make(1199, 60)}, [&](auto, auto, auto, auto, auto) { mainQueue.post([&came] { came = true; }); });
    ASSERT_TRUE(waitFor([&] { return came; }));
    EXPECT_EQ(count(), before);
}

TEST_F(ImageAnswers, AreGivenUpBeforeTheyHaveBegun)
{
    use(movie("clock.mp4"));
    ask(at(1));
    generator = nullptr;
    mainQueue.drain();
    EXPECT_TRUE(waitFor([&] { return !asset->tracks().empty(); }));
    mainQueue.drain();
    EXPECT_EQ(count(), 0U);
}

TEST_F(ImageAnswers, ComeOnAWorkerAndTheirHandlerDiesOnTheMainQueue)
{
    struct Witness {
        explicit Witness(std::thread::id& theDied) : died(theDied) {}
        ~Witness() { died = std::this_thread::get_id(); }
        std::thread::id& died;
    };
    std::thread::id died;
    use(movie("clock.mp4"));
    generator->generateImagesAsynchronouslyForTimes(
        {at(0), at(1), at(2)}, [witness = std::make_shared<Witness>(died),
                                keep = keep()](auto requested, const auto& image, auto actual, auto result,
                                               const auto& error) { keep(requested, image, actual, result, error); });
    ASSERT_TRUE(waitForAnswers(3));
    ASSERT_TRUE(waitFor([&] { return died != std::thread::id(); }));
    EXPECT_EQ(died, std::this_thread::get_id());
    for (const Answer& each : answers)
        EXPECT_NE(each.thread, std::this_thread::get_id());
}

TEST_F(ImageAnswers, AreMadeWhileThePlayerSeeks)
{
    ASSERT_EQ(open(movie("long-gop.mp4")), Status::ReadyToPlay);
    use(movie("long-gop.mp4"));
    for (int i = 0; i < 20; ++i)
        ask(MediaTime::make(i * 60, 60));
    for (const int number : {900, 30, 600})
        EXPECT_EQ(numberAt(MediaTime::make(number, 60)), number);
    ASSERT_TRUE(waitForAnswers(20));
    for (const Answer& each : answers)
        EXPECT_EQ(each.number(), each.requested.value);
}

} // namespace
