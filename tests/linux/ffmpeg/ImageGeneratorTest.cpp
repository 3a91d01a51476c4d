#include "linux/ffmpeg/FFmpegImageGenerator.h"
#include "linux/ffmpeg/images/ImageOf.h"
#include "support/EngineTest.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <filesystem>
#include <limits>
#include <map>
#include <mutex>
#include <numeric>
#include <random>
#include <thread>
#include <unistd.h>

using testing::HasSubstr;

namespace {

using base::MediaTime;
using Result = platform::ImageGenerator::Result;

/// As the helper that reads numbers wants it.
tests::Pixels pixelsOf(const platform::Bitmap& bitmap)
{
    tests::Pixels pixels{bitmap.width, bitmap.height, bitmap.rgba};
    for (std::size_t i = 0; i + 3 < pixels.bytes.size(); i += 4)
        std::swap(pixels.bytes[i], pixels.bytes[i + 2]);
    return pixels;
}

class Images : public tests::EngineTest {
protected:
    struct Answer {
        MediaTime requested, actual;
        platform::ImageRef image;
        Result result;
        base::ErrorRef error;
        std::thread::id thread;

        int number() const { return image ? tests::numberIn(pixelsOf(image->bitmap())) : -1; }
    };

    void TearDown() override { std::filesystem::remove(copy); }

    void use(const std::string& path)
    {
        asset = media.assetWithURL(base::Url::fromPath(path));
        generator = std::dynamic_pointer_cast<ffmpeg::FFmpegImageGenerator>(media.imageGeneratorWithAsset(asset));
        const std::lock_guard lock(mutex);
        answers.clear();
    }
    platform::ImageGenerator::Handler keep()
    {
        return [this](MediaTime requested, const platform::ImageRef& image, MediaTime actual, Result result,
                      const base::ErrorRef& error) {
            {
                const std::lock_guard lock(mutex);
                answers.push_back({requested, actual, image, result, error, std::this_thread::get_id()});
            }
            mainQueue.post([] {});
        };
    }
    void ask(MediaTime time) { generator->generateImagesAsynchronouslyForTimes({time}, keep()); }
    std::size_t count()
    {
        const std::lock_guard lock(mutex);
        return answers.size();
    }
    bool waitForAnswers(std::size_t number)
    {
        return waitFor([&] { return count() >= number; });
    }
    /// The one picture of `time`.
    Answer answerAt(MediaTime time)
    {
        const std::size_t before = count();
        ask(time);
        EXPECT_TRUE(waitForAnswers(before + 1));
        const std::lock_guard lock(mutex);
        return answers.size() > before ? answers.back() : Answer{};
    }
    int imageNumberAt(MediaTime time) { return answerAt(time).number(); }

    std::mutex mutex;
    std::vector<Answer> answers;
    std::shared_ptr<ffmpeg::FFmpegImageGenerator> generator;
    const std::string copy = testing::TempDir() + "images-" + std::to_string(getpid()) + ".mp4";
};

TEST_F(Images, ShowTheFrameOfTheirTimeAndNotTheKeyframeBeforeIt)
{
    use(movie("clock.mp4"));
    EXPECT_EQ(imageNumberAt(MediaTime::make(60LL * 512, 15360)), 60);
    EXPECT_EQ(imageNumberAt(MediaTime::make(61LL * 512 - 1, 15360)), 60);
    EXPECT_EQ(imageNumberAt(MediaTime::make(61LL * 512, 15360)), 61);
    const Answer answer = answerAt(MediaTime::make(45LL * 512 + 100, 15360));
    EXPECT_EQ(answer.number(), 45);
    EXPECT_EQ(answer.actual, MediaTime::make(45LL * 512, 15360));
    EXPECT_EQ(answer.requested, MediaTime::make(45LL * 512 + 100, 15360));
    EXPECT_EQ(answer.result, Result::Succeeded);
    EXPECT_EQ(answer.error, nullptr);
}

TEST_F(Images, AskedForOneByOneInAnyOrderDecodeALongGroupOnce)
{
    use(movie("long-gop.mp4"));
    std::vector<int> numbers(40);
    std::iota(numbers.begin(), numbers.end(), 0);
    std::shuffle(numbers.begin(), numbers.end(), std::mt19937(3));
    for (const int each : numbers)
        ask(MediaTime::make(each * 29 + 7, 60));
    EXPECT_EQ(count(), 0U) << "not before asking has come back";
    ASSERT_TRUE(waitForAnswers(40));
    for (const Answer& each : answers)
        EXPECT_EQ(each.number(), each.requested.value);
    EXPECT_TRUE(std::is_sorted(answers.begin(), answers.end(), [](const Answer& a, const Answer& b) {
        return a.requested < b.requested;
    })) << "forward";
    EXPECT_LE(generator->decodedCount(), 1138 + 40) << "up to the last one, each once";
    EXPECT_GE(generator->decodedCount(), 300);
}

TEST_F(Images, LeaveOutWhatNobodySees)
{
    use(movie("long-gop.mp4"));
    EXPECT_EQ(imageNumberAt(MediaTime::make(1000, 60)), 1000);
    EXPECT_LT(generator->decodedCount(), 900) << "of 1001 pictures, a part refers to nothing";
}

TEST_F(Images, OfManyGroupsDecodeEachOnceWhicheverOrderTheyAreAskedIn)
{
    use(movie("groups.mp4"));
    std::vector<int> numbers(24);
    std::iota(numbers.begin(), numbers.end(), 0);
    std::shuffle(numbers.begin(), numbers.end(), std::mt19937(5));
    for (const int each : numbers)
        ask(MediaTime::make(each * 10 + 9, 30));
    ASSERT_TRUE(waitForAnswers(24));
    for (const Answer& each : answers)
        EXPECT_EQ(each.number(), each.requested.value);
    EXPECT_LE(generator->decodedCount(), 240 + 8 * 8) << "each group once, and a few pictures behind each";
}

TEST_F(Images, ReadOnlyTheGroupsThatAreAskedFor)
{
    use(movie("groups.mp4"));
    EXPECT_EQ(imageNumberAt(MediaTime::make(211, 30)), 211);
    EXPECT_EQ(imageNumberAt(MediaTime::make(32, 30)), 32);
    EXPECT_LE(generator->decodedCount(), 12);
}

TEST_F(Images, OfOpenGroupsAreExactAroundTheirKeyframes)
{
    use(movie("open-groups.mp4"));
    std::size_t asked = 0;
    for (int number = 119; number >= 0; --number) {
        if (number % 30 > 24 || number % 30 < 4) {
            ask(MediaTime::make(number, 30));
            ++asked;
        }
    }
    ASSERT_TRUE(waitForAnswers(asked));
    for (const Answer& each : answers)
        EXPECT_EQ(each.number(), each.requested.value);
    for (const int number : {59, 61, 30, 29, 28, 27, 90})
        EXPECT_EQ(imageNumberAt(MediaTime::make(number, 30)), number);
}

TEST_F(Images, AskedForLaterGoOnWhereTheOthersStand)
{
    use(movie("long-gop.mp4"));
    EXPECT_EQ(imageNumberAt(MediaTime::make(500, 60)), 500);
    const auto once = generator->decodedCount();
    EXPECT_EQ(imageNumberAt(MediaTime::make(520, 60)), 520);
    EXPECT_LE(generator->decodedCount(), once + 30);
    EXPECT_EQ(imageNumberAt(MediaTime::make(100, 60)), 100) << "and go back when they must";
}

TEST_F(Images, KeepIrregularTimes)
{
    use(movie("vfr.mkv"));
    const auto time = [](int n) { return 33 * n + 2 * (7 * n % 11) + 400 * (n / 20); };
    for (int n = 0; n < 78; n += 3) {
        ask(MediaTime::make(time(n), 1000));
        ask(MediaTime::make(time(n + 1) - 1, 1000));
    }
    ASSERT_TRUE(waitForAnswers(52));
    for (const Answer& each : answers) {
        EXPECT_EQ(MediaTime::make(each.number(), 1000), each.actual);
        EXPECT_FALSE(each.actual > each.requested);
        EXPECT_GE(each.number() + 33 + 20 + 420, each.requested.value);
    }
    EXPECT_EQ(imageNumberAt(MediaTime::make(time(20) - 1, 1000)), time(19)) << "a gap shows the picture before it";
}

TEST_F(Images, StandUpright)
{
    use(movie("rotated.mp4"));
    const Answer counterclockwise = answerAt(MediaTime::make(77, 30));
    ASSERT_TRUE(counterclockwise.image);
    const tests::Pixels turned = pixelsOf(counterclockwise.image->bitmap());
    ASSERT_EQ(turned.width, 360);
    ASSERT_EQ(turned.height, 640);
    tests::Pixels back{640, 360, std::vector<std::uint8_t>(turned.bytes.size())};
    for (int y = 0; y < 360; ++y)
        for (int x = 0; x < 640; ++x)
            std::copy_n(turned.at(y, 639 - x), 4, back.bytes.begin() + (std::ptrdiff_t(y) * 640 + x) * 4);
    EXPECT_EQ(tests::numberIn(back), 77);
}

TEST_F(Images, AreFittedIntoTheirMaximumSize)
{
    const auto sizeOf = [&](const std::string& name, base::Size maximum) {
        use(movie(name));
        generator->setMaximumSize(maximum);
        const Answer answer = answerAt(at(0.5));
        return answer.image ? answer.image->size() : base::Size{};
    };
    EXPECT_EQ(sizeOf("clock.mp4", {128, 128}), (base::Size{128, 72}));
    EXPECT_EQ(sizeOf("rotated.mp4", {1000, 64}), (base::Size{36, 64}));
    EXPECT_EQ(sizeOf("non-square.mp4", {0, 0}), (base::Size{640, 240})) << "square pixels";
    EXPECT_EQ(sizeOf("non-square.mp4", {160, 160}), (base::Size{160, 60}));
    EXPECT_EQ(sizeOf("clock.mp4", {std::nan(""), 36}), (base::Size{64, 36}));
}

TEST(Fitting, KeepsTheAspectAndNeverEnlarges)
{
    constexpr double kInfinity = std::numeric_limits<double>::infinity();
    EXPECT_EQ(ffmpeg::fitted({1920, 1080}, {135, 76}), (base::Size{135, 76}));
    EXPECT_EQ(ffmpeg::fitted({1920, 1080}, {0, 108}), (base::Size{192, 108}));
    EXPECT_EQ(ffmpeg::fitted({1920, 1080}, {192, -5}), (base::Size{192, 108}));
    EXPECT_EQ(ffmpeg::fitted({1920, 1080}, {std::nan(""), std::nan("")}), (base::Size{1920, 1080}));
    EXPECT_EQ(ffmpeg::fitted({1920, 1080}, {kInfinity, kInfinity}), (base::Size{1920, 1080}));
    EXPECT_EQ(ffmpeg::fitted({1920, 1080}, {9999, 9999}), (base::Size{1920, 1080}));
    EXPECT_EQ(ffmpeg::fitted({1920, 1080}, {0.1, 0.1}), (base::Size{1, 1}));
}

TEST_F(Images, HaveTheColoursOfTheMovie)
{
    for (const char* name : {"bars-709.mp4", "bars-601.mp4", "bars-full.mp4"}) {
        use(movie(name));
        const Answer answer = answerAt(at(0.2));
        ASSERT_TRUE(answer.image) << name;
        const platform::Bitmap& bitmap = answer.image->bitmap();
        EXPECT_EQ(answer.image->scale(), 1);
        const auto expectColour = [&](int column, int row, std::array<int, 3> colour) {
            const std::uint8_t* pixel = bitmap.at(212 * column + 106, 180 * row + 90);
            for (std::size_t i = 0; i < 3; ++i)
                EXPECT_NEAR(pixel[i], colour[i], 4) << name << " patch " << column << ", " << row;
            EXPECT_EQ(pixel[3], 255);
        };
        expectColour(0, 0, {255, 0, 0});
        expectColour(1, 0, {0, 255, 0});
        expectColour(2, 0, {0, 0, 255});
        expectColour(1, 1, {128, 128, 128});
    }
}

TEST_F(Images, OfOffsetsEditListsBroadcastsAndOtherCodecsAreExactToo)
{
    use(movie("edit-list.mp4"));
    EXPECT_EQ(imageNumberAt(at(1)), 60);
    EXPECT_EQ(imageNumberAt(at(0)), 30);
    EXPECT_EQ(imageNumberAt(MediaTime::make(1, 30)), 31);
    use(movie("start-offset.mp4"));
    EXPECT_EQ(imageNumberAt(at(2.5)), 30);
    EXPECT_EQ(imageNumberAt(at(1)), 0) << "before the first picture, the first";
    use(movie("size-change.ts"));
    EXPECT_EQ(imageNumberAt(MediaTime::make(15, 30)), 15);
    const Answer other = answerAt(MediaTime::make(45, 30));
    EXPECT_EQ(other.number(), 45);
    EXPECT_EQ(other.image->size(), (base::Size{360, 640}));
    EXPECT_EQ(imageNumberAt(MediaTime::make(7, 30)), 7);
    use(movie("vp9.webm"));
    for (const int n : {50, 10, 59, 0})
        EXPECT_EQ(imageNumberAt(MediaTime::make(n * 1000 / 30 + 9, 1000)), n);
}

TEST_F(Images, BeyondTheEndsAreThoseOfTheEnds)
{
    use(movie("clock.mp4"));
    EXPECT_EQ(imageNumberAt(at(-5)), 0);
    EXPECT_EQ(imageNumberAt(at(4)), 119);
    EXPECT_EQ(imageNumberAt(MediaTime::make(std::numeric_limits<std::int64_t>::max(), 1)), 119);
    EXPECT_EQ(imageNumberAt(MediaTime::positiveInfinity()), 119);
    EXPECT_EQ(imageNumberAt({0, 0, MediaTime::Kind::NegativeInfinity}), 0);
}

TEST_F(Images, OfWhatIsNotATimeFail)
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

TEST_F(Images, CanBeMadeAfterTheFileWasRemoved)
{
    std::filesystem::copy_file(movie("clock.mp4"), copy, std::filesystem::copy_options::overwrite_existing);
    use(copy);
    bool loaded = false;
    asset->whenLoaded([&] { loaded = true; });
    ASSERT_TRUE(waitFor([&] { return loaded; }));
    std::filesystem::remove(copy);
    EXPECT_EQ(imageNumberAt(at(2)), 60);
}

TEST_F(Images, OfMoviesThatCannotBeOpenedFailWithTheirError)
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

TEST_F(Images, OfDamagedMoviesAreAnsweredOnceEach)
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

TEST_F(Images, OfATruncatedMovieEndWithTheLastThatIsThere)
{
    use(movie("truncated.mp4"));
    EXPECT_EQ(imageNumberAt(at(1)), 30);
    const int last = imageNumberAt(at(3.9));
    EXPECT_GT(last, 40);
    EXPECT_LT(last, 80);
}

TEST_F(Images, AreNotGivenAnyMoreWhenTheGeneratorIsGone)
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

TEST_F(Images, AreGivenUpBeforeTheyHaveBegun)
{
    use(movie("clock.mp4"));
    ask(at(1));
    generator = nullptr;
    mainQueue.drain();
    EXPECT_TRUE(waitFor([&] { return !asset->tracks().empty(); }));
    mainQueue.drain();
    EXPECT_EQ(count(), 0U);
}

TEST_F(Images, ComeOnAWorkerAndTheirHandlerDiesOnTheMainQueue)
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

TEST_F(Images, AreMadeWhileThePlayerSeeks)
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
