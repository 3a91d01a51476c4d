#include "linux/ffmpeg/FFmpegImageGenerator.h"
#include "linux/ffmpeg/VideoSource.h"
#include "support/CaseName.h"
#include "support/EngineTest.h"

#include <map>
#include <mutex>
#include <vector>

namespace {

/// Tables of files have the times of decoding, or of showing; where pictures are reordered, those lie on both sides of
/// where one group ends and the next begins.
class EdgesOfGroups : public tests::EngineTest, public testing::WithParamInterface<const char*> {
protected:
    /// Well inside the picture's time, in a file that counts milliseconds too.
    static MediaTime timeOf(int number) { return MediaTime::make(number * 3000 + 600, 90000); }
    /// Of 75 pictures in groups of 25.
    static std::vector<int> edges()
    {
        std::vector<int> numbers;
        for (const int keyframe : {0, 25, 50, 75})
            for (int number = keyframe - 4; number < keyframe + 4; ++number)
                if (number >= 0 && number < 75)
                    numbers.push_back(number);
        return numbers;
    }
    static std::vector<int> scattered()
    {
        std::vector<int> numbers = edges();
        std::stable_sort(numbers.begin(), numbers.end(), [](int a, int b) { return a * 7 % 19 < b * 7 % 19; });
        return numbers;
    }
};

INSTANTIATE_TEST_SUITE_P(OfManyKinds, EdgesOfGroups,
                         testing::Values("refs-recorder.mp4", "refs-strict.mp4", "refs-deep.mp4", "refs-temporal.mp4",
                                         "refs-open.mp4", "refs-forward.mp4", "refs-hevc.mp4", "refs-hevc-open.mp4",
                                         "refs-vp9.webm", "refs-av1.mp4"),
                         [](const auto& about) { return tests::caseName(about.param); });

TEST_P(EdgesOfGroups, AreFoundByThePlayerFromAnywhere)
{
    for (const auto& numbers : {edges(), scattered()}) {
        ASSERT_EQ(open(movie(GetParam())), Status::ReadyToPlay);
        for (const int number : numbers)
            EXPECT_EQ(numberAt(timeOf(number)), number);
    }
    for (const int number : {24, 25, 49, 50}) {
        ASSERT_EQ(open(movie(GetParam())), Status::ReadyToPlay);
        EXPECT_EQ(numberAt(timeOf(number)), number) << "at first";
    }
}

TEST_P(EdgesOfGroups, AreOnThumbnailsAskedForTogetherAndOneByOne)
{
    std::map<std::int64_t, int> numbers;
    std::mutex mutex;
    const auto ask = [&](platform::ImageGenerator& generator, int number) {
        generator.generateImagesAsynchronouslyForTimes(
            {timeOf(number)},
            [&](MediaTime requested, const platform::ImageRef& image, MediaTime, auto, const base::ErrorRef&) {
                const platform::Bitmap bitmap = image ? image->bitmap() : platform::Bitmap();
                {
                    const std::lock_guard lock(mutex);
                    numbers[requested.value] =
                        image ? tests::numberIn(tests::Pixels{bitmap.width, bitmap.height, bitmap.rgba}) : -1;
                }
                mainQueue.post([] {});
            });
    };
    const auto expectAll = [&](const std::vector<int>& all, const std::string& how) {
        ASSERT_TRUE(waitFor([&] {
            const std::lock_guard lock(mutex);
            return numbers.size() == all.size();
        })) << how;
        for (const int number : all)
            EXPECT_EQ(numbers.at(timeOf(number).value), number) << how;
        numbers.clear();
    };
    asset = media.assetWithURL(base::Url::fromPath(movie(GetParam())));
    const auto together = media.imageGeneratorWithAsset(asset);
    for (const int number : scattered())
        ask(*together, number);
    expectAll(edges(), "together");
    const auto single = media.imageGeneratorWithAsset(asset);
    for (const int number : scattered()) {
        ask(*single, number);
        expectAll({number}, "one by one");
    }
}

TEST_F(EdgesOfGroups, TheLastPictureOfAGroupIsDecodedFromItsOwnKeyframe)
{
    for (const char* name : {"refs-recorder.mp4", "refs-forward.mp4", "refs-deep.mp4", "refs-hevc.mp4"}) {
        const auto cancelled = std::make_shared<std::atomic<bool>>(false);
        const auto file = ffmpeg::OpenFile::open(movie(name)).value();
        const auto opened = ffmpeg::Movie::open(file, cancelled).value();
        const auto tick = [&](int number) { return opened->video()->tickAt(timeOf(number)); };
        for (const int last : {47, 48, 49}) {
            const auto source = std::move(ffmpeg::VideoSource::open(opened, cancelled, 1)).value();
            ASSERT_TRUE(source->at(tick(30), ffmpeg::VideoSource::Want::Full, [] { return false; }));
            const auto shown = source->at(tick(last), ffmpeg::VideoSource::Want::Full, [] { return false; });
            ASSERT_TRUE(shown);
            EXPECT_EQ(tests::numberIn(shown->frame), last);
            EXPECT_LE(source->decodedCount(), 25 + 4) << name << " " << last;
            const auto walk = std::move(ffmpeg::PictureWalk::open(opened, cancelled)).value();
            EXPECT_EQ(tests::numberIn(walk->at(tick(last), ffmpeg::PictureWalk::Then::Rest)), last);
            EXPECT_LE(walk->decodedCount(), 25) << name << " " << last;
            ASSERT_TRUE(walk->at(tick(30)));
            const auto before = walk->decodedCount();
            EXPECT_EQ(tests::numberIn(walk->at(tick(last))), last);
            EXPECT_LE(walk->decodedCount(), before + last - 30 + 4) << "goes on";
            EXPECT_EQ(walk->groupOf(tick(last)), walk->groupOf(tick(25)));
            EXPECT_NE(walk->groupOf(tick(last)), walk->groupOf(tick(50)));
        }
    }
}

} // namespace
