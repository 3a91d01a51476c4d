// Every picture at its time, everywhere and for long.

#include "linux/ffmpeg/HardwareDevice.h"
#include "linux/ffmpeg/SoundMixer.h"
#include "support/DrivenDevice.h"
#include "support/EngineTest.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <random>
#include <unistd.h>
#include <vector>

namespace {

using namespace std::chrono_literals;

class Exactness : public tests::EngineTest {
protected:
    void TearDown() override
    {
        player = nullptr;
        item = nullptr; // the last of the engine whose threads use the device
        std::filesystem::remove(path);
    }

    /// A movie of `options`, made by FFmpeg.
    void make(const std::string& extension, const std::string& options)
    {
        path = testing::TempDir() + "exact-" + std::to_string(getpid()) + extension;
        ASSERT_EQ(std::system(("ffmpeg -nostdin -v error -y " + options + " " + path).c_str()), 0);
    }

    tests::DrivenDevice device;
    std::string path;
};

TEST_F(Exactness, RandomSeeksShowTheRightPictureOfARegularMovie)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    std::mt19937 random(1);
    for (int i = 0; i < 500; ++i) {
        const auto tick = static_cast<int>(random() % (120 * 512));
        ASSERT_EQ(numberAt(MediaTime::make(tick, 15360)), tick / 512);
    }
}

TEST_F(Exactness, RandomSeeksShowTheRightPictureOfALongGroup)
{
    ASSERT_EQ(open(movie("long-gop.mp4")), Status::ReadyToPlay);
    std::mt19937 random(2);
    for (int i = 0; i < 60; ++i) {
        const auto tick = static_cast<int>(random() % (1200 * 256));
        ASSERT_EQ(numberAt(MediaTime::make(tick, 15360)), tick / 256);
    }
}

TEST_F(Exactness, RandomSeeksShowTheRightPictureOfAnIrregularMovie)
{
    ASSERT_EQ(open(movie("vfr.mkv")), Status::ReadyToPlay);
    std::vector<int> times;
    for (int n = 0; n < 80; ++n)
        times.push_back(33 * n + 2 * (7 * n % 11) + 400 * (n / 20));
    std::mt19937 random(3);
    for (int i = 0; i < 440; ++i) {
        const auto time = static_cast<int>(random() % 4300);
        const auto behind = std::upper_bound(times.begin(), times.end(), time);
        ASSERT_EQ(numberAt(MediaTime::make(time, 1000)), *std::prev(behind));
    }
}

TEST_F(Exactness, PicturesThatStandForLongAreFoundAlthoughOthersAreLeftOut)
{
    // One in forty pictures is kept, at its time: a rate that the header does not tell.
    make(".mp4",
         "-i " + movie("long-gop.mp4")
             + " -an -vf \"select='if(lt(n,600),1,not(mod(n,40)))'\" -fps_mode vfr -c:v libx264 -preset veryfast"
               " -crf 20 -g 9999 -bf 3 -sc_threshold 0");
    ASSERT_EQ(open(path), Status::ReadyToPlay);
    for (const int n : {1190, 650, 599, 1000, 300, 839, 840, 10})
        EXPECT_EQ(numberAt(MediaTime::make(n, 60)), n < 600 ? n : n / 40 * 40);
}

TEST_F(Exactness, SoundAndPicturesDoNotDriftApartInTenMinutes)
{
    // A click every ten seconds; the pictures' times say where they belong.
    make(".mov", "-f lavfi -i testsrc=s=64x36:r=5:d=600 -f lavfi -i "
                 "\"aevalsrc='if(lt(mod(t,10),0.01),0.5,0)':s=8000:d=600\" -c:v libx264 -preset ultrafast -g 250"
                 " -c:a pcm_s16le");
    const auto opened = ffmpeg::Movie::open(ffmpeg::OpenFile::open(path).value(), nullptr);
    const auto mixer = ffmpeg::SoundMixer::open(opened.value(), nullptr);
    std::vector<float> second(2 * 48000);
    for (int at = 0; at < 600; ++at) {
        mixer.value()->mix(second.data(), second.size() / 2);
        const auto isLoud = [](float sample) { return std::abs(sample) > 0.2f; };
        const auto click = std::find_if(second.begin(), second.end(), isLoud) - second.begin();
        EXPECT_EQ(click < 48 * 2, at % 10 == 0) << "within a millisecond, at " << at;
    }

    ffmpeg::FFmpegMediaFramework loud(system, center, {{}, device.maker()});
    item = loud.playerItemWithAsset(loud.assetWithURL(base::Url::fromPath(path)));
    player = std::dynamic_pointer_cast<ffmpeg::FFmpegPlayer>(loud.playerWithPlayerItem(item));
    player->play();
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    constexpr std::size_t kStep = 9600; // a fifth of a second: one picture
    for (int shown = 1; shown < 2990; ++shown) {
        device.play(kStep);
        EXPECT_EQ(player->currentTime(), MediaTime::make(shown, 5));
        clock.advance(201ms);
        ASSERT_TRUE(waitFor([&] { return player->currentFrame()->time() == MediaTime::make(shown, 5); })) << shown;
    }
}

TEST_F(Exactness, MatroskaThatStartsFarFromZeroStartsAtZero)
{
    make(".mkv", "-i " + movie("clock.mp4") + " -map 0 -c copy -output_ts_offset 5000");
    ASSERT_EQ(open(path), Status::ReadyToPlay);
    EXPECT_NEAR(item->duration().seconds(), 4, 0.05);
    EXPECT_EQ(tests::numberIn(player->currentFrame()), 0);
    EXPECT_NEAR(player->currentFrame()->time().seconds(), 0, 0.03);
    // Its ticks are milliseconds, to which the start is rounded too.
    for (const int n : {60, 119, 30, 1})
        EXPECT_EQ(numberAt(MediaTime::make(n * 1000 / 30 + 5, 1000)), n);
}

TEST_F(Exactness, WithoutADeviceForDecodingTheProcessorDecodes)
{
    EXPECT_EQ(ffmpeg::HardwareDevice::open("/no/such/device"), nullptr);
    EXPECT_EQ(ffmpeg::HardwareDevice::open("/dev/null"), nullptr);
    EXPECT_EQ(ffmpeg::HardwareDevice::shared(), ffmpeg::HardwareDevice::shared());
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(numberAt(at(2)), 60);
}

} // namespace
