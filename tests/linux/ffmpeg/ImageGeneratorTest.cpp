#include "linux/ffmpeg/images/ImageOf.h"
#include "support/ImageTest.h"

#include <array>
#include <cmath>
#include <limits>
#include <numeric>
#include <random>

namespace {

using base::MediaTime;
using tests::pixelsOf;
using Images = tests::ImageTest;

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

} // namespace
