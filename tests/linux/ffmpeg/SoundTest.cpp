#include "linux/ffmpeg/SoundMixer.h"
#include "support/DrivenDevice.h"
#include "support/EngineTest.h"

#include <algorithm>
#include <atomic>
#include <cmath>
#include <numbers>

namespace {

using namespace std::chrono_literals;

/// How loud a tone is in `samples` (pairs at 48 kHz), as the peak of a sine.
double toneIn(const std::vector<float>& samples, double frequency, std::size_t channel)
{
    double sine = 0;
    double cosine = 0;
    const std::size_t frames = samples.size() / 2;
    for (std::size_t i = 0; i < frames; ++i) {
        const double angle = 2 * std::numbers::pi * frequency * static_cast<double>(i) / 48000;
        sine += static_cast<double>(samples[2 * i + channel]) * std::sin(angle);
        cosine += static_cast<double>(samples[2 * i + channel]) * std::cos(angle);
    }
    return 2 * std::hypot(sine, cosine) / static_cast<double>(frames);
}

class Sound : public tests::EngineTest {
protected:
    void TearDown() override
    {
        player = nullptr;
        item = nullptr; // the last of the engine whose threads use the device
    }
    std::unique_ptr<ffmpeg::SoundMixer> mixer(const std::string& name)
    {
        auto file = ffmpeg::OpenFile::open(movie(name));
        const auto opened = ffmpeg::Movie::open(std::move(file).value(), nullptr);
        return std::move(ffmpeg::SoundMixer::open(opened.value(), nullptr)).value();
    }
    static std::vector<float> mix(ffmpeg::SoundMixer& from, double seconds)
    {
        std::vector<float> samples(static_cast<std::size_t>(seconds * 48000) * 2);
        from.mix(samples.data(), samples.size() / 2);
        return samples;
    }
    void playFile(ffmpeg::FFmpegMediaFramework& framework, const std::string& name)
    {
        item = framework.playerItemWithAsset(framework.assetWithURL(base::Url::fromPath(movie(name))));
        player = std::dynamic_pointer_cast<ffmpeg::FFmpegPlayer>(framework.playerWithPlayerItem(item));
        player->play();
        ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    }

    void letTimePass(std::chrono::milliseconds by)
    {
        for (std::chrono::milliseconds gone{0}; gone < by; gone += 10ms) {
            clock.advance(10ms);
            mainQueue.drain();
        }
    }

    /// Device and clock go on together until there is something to hear.
    double secondsUntilHeard()
    {
        int steps = 0;
        EXPECT_TRUE(waitFor([&] {
            const auto samples = device.play(1200);
            ++steps;
            clock.advance(25ms);
            mainQueue.drain();
            return std::any_of(samples.begin(), samples.end(), [](float each) { return std::abs(each) > 0.02f; });
        }));
        return steps * 0.025;
    }

    tests::DrivenDevice device;
};

TEST_F(Sound, AllTracksAreHeardAtOnceEachAtItsOwnLevel)
{
    const auto from = mixer("clock.mp4");
    mix(*from, 0.5);
    const auto second = mix(*from, 1);
    // Making the tone stereo took 3 dB off it when the movie was made.
    EXPECT_NEAR(toneIn(second, 440, 0), 0.088, 0.005);
    EXPECT_NEAR(toneIn(second, 440, 1), 0.088, 0.005);
    EXPECT_NEAR(toneIn(second, 880, 0), 0.125, 0.005) << "one channel is heard on both sides, no quieter";
    EXPECT_NEAR(toneIn(second, 880, 1), 0.125, 0.01);
}

TEST_F(Sound, AfterASeekTheSamplesAreThoseOfThatTime)
{
    const auto from = mixer("clock.mp4");
    const auto all = mix(*from, 4);
    for (const std::int64_t frame : {96000, 24000, 150001, 0, 1}) {
        from->seek(frame);
        const auto part = mix(*from, 0.2);
        for (std::size_t i = 0; i < part.size(); i += 97)
            ASSERT_NEAR(part[i], all[static_cast<std::size_t>(frame) * 2 + i], 2e-3) << frame << " + " << i;
    }
}

TEST_F(Sound, OtherCodecsAndContainersToo)
{
    for (const auto* name : {"vp9.webm", "vfr.mkv"}) {
        const auto from = mixer(name);
        from->seek(48000);
        const auto part = mix(*from, 0.5);
        EXPECT_NEAR(toneIn(part, 440, 0), 0.125, 0.015) << name;
    }
}

TEST_F(Sound, BeforeAndBehindTheSoundThereIsSilence)
{
    const auto from = mixer("start-offset.mp4");
    EXPECT_LT(toneIn(mix(*from, 1), 440, 0), 1e-3);
    mix(*from, 0.6);
    EXPECT_GT(toneIn(mix(*from, 1), 440, 0), 0.08);
    from->seek(6 * 48000);
    EXPECT_LT(toneIn(mix(*from, 1), 440, 0), 1e-3);
}

TEST_F(Sound, TimeGoesOnWithWhatTheDeviceHasPlayed)
{
    ffmpeg::FFmpegMediaFramework heard(system, center, {{}, device.maker()});
    playFile(heard, "clock.mp4");
    EXPECT_EQ(player->currentTime(), at(0));
    clock.advance(900ms);
    EXPECT_EQ(player->currentTime(), at(0)) << "the clock does not count";
    const auto samples = device.play(24000);
    EXPECT_EQ(player->currentTime(), at(0.5));
    EXPECT_GT(toneIn(std::vector<float>(samples.begin(), samples.begin() + 2400 * 2), 440, 0), 0.05);
    clock.advance(10ms);
    ASSERT_TRUE(waitFor([&] {
        clock.advance(1ms);
        return tests::numberIn(player->currentFrame()) == 15;
    }));
}

TEST_F(Sound, PausingSilencesAndPlayingGoesOnWhereItStood)
{
    ffmpeg::FFmpegMediaFramework heard(system, center, {{}, device.maker()});
    playFile(heard, "clock.mp4");
    device.play(4800);
    player->pause();
    EXPECT_EQ(player->currentTime(), at(0.1));
    for (const float sample : device.play(480))
        EXPECT_EQ(sample, 0);
    player->play();
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    device.play(4800);
    EXPECT_EQ(player->currentTime(), at(0.2));
}

TEST_F(Sound, ADeviceThatIsAheadHearsSilenceAndTimeGoesOn)
{
    ffmpeg::FFmpegMediaFramework heard(system, center, {{}, device.maker()});
    playFile(heard, "clock.mp4");
    device.play(150000);
    EXPECT_EQ(player->currentTime(), MediaTime::make(150000, 48000));
    ASSERT_TRUE(waitFor([&] {
        const auto samples = device.play(240);
        return !samples.empty() && std::abs(samples[100]) > 1e-3f;
    })) << "it catches up";
}

TEST_F(Sound, ADeviceMayWantMuchAtOnceAtTheFirstMoment)
{
    ffmpeg::FFmpegMediaFramework heard(system, center, {{}, device.maker()});
    playFile(heard, "clock.mp4");
    const auto samples = device.play(ffmpeg::kFramesAhead + 4800);
    const auto from = mixer("clock.mp4");
    const auto wanted = mix(*from, 0.3);
    ASSERT_EQ(samples.size(), wanted.size());
    for (std::size_t i = 0; i < samples.size(); ++i)
        ASSERT_NEAR(samples[i], wanted[i], 1e-6) << i;
}

TEST_F(Sound, ADeviceThatNeverAsksDoesNotStopThePictures)
{
    ffmpeg::FFmpegMediaFramework heard(system, center, {{}, device.maker()});
    playFile(heard, "clock.mp4");
    letTimePass(3000ms);
    EXPECT_NEAR(player->currentTime().seconds(), 2, 0.001) << "it was waited for at first";
    EXPECT_TRUE(waitFor([&] { return tests::numberIn(player->currentFrame()) == 60; }));
    letTimePass(2100ms);
    EXPECT_FALSE(player->isPlaying()) << "the end is reached";
}

TEST_F(Sound, ADeviceThatWakesUpLateIsHeardAtTheTimeOfThePictures)
{
    ffmpeg::FFmpegMediaFramework heard(system, center, {{}, device.maker()});
    playFile(heard, "start-offset.mp4"); // silent up to 1.5 s
    letTimePass(2000ms);
    EXPECT_NEAR(player->currentTime().seconds(), 1, 0.001);
    EXPECT_NEAR(1 + secondsUntilHeard(), 1.5, 0.11) << "no sooner, no later";
    EXPECT_NEAR(player->currentTime().seconds(), 1.5, 0.03);
}

TEST_F(Sound, ADeviceThatStopsOnTheWayIsLeftBehindUntilItGoesOn)
{
    ffmpeg::FFmpegMediaFramework heard(system, center, {{}, device.maker()});
    playFile(heard, "clock.mp4");
    device.play(24000);
    EXPECT_EQ(player->currentTime(), at(0.5));
    letTimePass(2000ms);
    EXPECT_NEAR(player->currentTime().seconds(), 1.5, 0.001);
    device.play(4800);
    EXPECT_NEAR(player->currentTime().seconds(), 1.5, 0.11);
    device.play(24000);
    EXPECT_NEAR(player->currentTime().seconds(), 2, 0.11);
}

TEST_F(Sound, ADeviceThatIsOpenedLateIsHeardFromThereOn)
{
    const auto isHeldUp = std::make_shared<std::atomic<bool>>(true);
    const auto make = [isHeldUp, maker = device.maker()](ffmpeg::AudioOutput::Fill fill) {
        isHeldUp->wait(true);
        return maker(std::move(fill));
    };
    const auto open = [&](int*) {
        *isHeldUp = false;
        isHeldUp->notify_all();
    };
    ffmpeg::FFmpegMediaFramework heard(system, center, {{}, make});
    int any = 0;
    std::unique_ptr<int, decltype(open)> opener(&any, open); // also where an assertion fails
    item = heard.playerItemWithAsset(heard.assetWithURL(base::Url::fromPath(movie("start-offset.mp4"))));
    player = std::dynamic_pointer_cast<ffmpeg::FFmpegPlayer>(heard.playerWithPlayerItem(item));
    player->play();
    ASSERT_TRUE(waitFor([&] {
        clock.advance(2100ms);
        mainQueue.drain();
        return player->isRunning();
    })) << "it is not waited for any longer";
    letTimePass(1000ms);
    EXPECT_NEAR(player->currentTime().seconds(), 1, 0.01);
    opener.reset();
    ASSERT_TRUE(waitFor([&] { return device.isPlaying(); }));
    mainQueue.drain();
    EXPECT_NEAR(1 + secondsUntilHeard(), 1.5, 0.11);
    EXPECT_NEAR(player->currentTime().seconds(), 1.5, 0.03);
}

TEST_F(Sound, WithoutADeviceMoviesPlayByTheClock)
{
    device.isMissing = true;
    ffmpeg::FFmpegMediaFramework heard(system, center, {{}, device.maker()});
    playFile(heard, "clock.mp4");
    EXPECT_EQ(device.made, 1);
    clock.advance(100ms);
    EXPECT_EQ(player->currentTime(), at(0.1));
}

TEST_F(Sound, MoviesWithoutSoundNeedNoDevice)
{
    ffmpeg::FFmpegMediaFramework heard(system, center, {{}, device.maker()});
    playFile(heard, "no-sound.mp4");
    clock.advance(100ms);
    EXPECT_EQ(player->currentTime(), at(0.1));
    EXPECT_EQ(device.made, 0);
}

TEST_F(Sound, TheDeviceGoesWithThePlayer)
{
    {
        ffmpeg::FFmpegMediaFramework heard(system, center, {{}, device.maker()});
        playFile(heard, "clock.mp4");
        EXPECT_TRUE(device.isPlaying());
        player = nullptr;
        item = nullptr;
    }
    EXPECT_FALSE(device.isPlaying()) << "the framework waited for it";
}

} // namespace
