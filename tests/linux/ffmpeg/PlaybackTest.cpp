#include "support/EngineTest.h"

#include <algorithm>
#include <vector>

namespace {

using namespace std::chrono_literals;
using platform::ActionAtItemEnd;

/// Counts the ends that are announced.
struct EndLog final : runtime::Object {
    static const runtime::Class& classObject()
    {
        static const runtime::Class& instance = runtime::ClassBuilder<EndLog>("EndLog", &runtime::Object::classObject())
                                                    .method("ended:", &EndLog::ended_)
                                                    .build();
        return instance;
    }
    const runtime::Class& isa() const override { return classObject(); }
    void ended_(std::shared_ptr<runtime::Object>) { ++count; }
    int count = 0;
};

class Playback : public tests::EngineTest {
protected:
    /// Ready, playing, time going on.
    void playFile(const std::string& name)
    {
        ASSERT_EQ(open(movie(name)), Status::ReadyToPlay);
        center.addObserver(ends, runtime::Selector("ended:"), platform::kPlayerItemDidPlayToEndNotification, item);
        player->play();
        EXPECT_TRUE(player->isPlaying());
        ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    }

    std::shared_ptr<EndLog> ends = std::make_shared<EndLog>();
};

TEST_F(Playback, TimeGoesOnWithTheClock)
{
    playFile("no-sound.mp4");
    EXPECT_EQ(player->currentTime(), at(0));
    clock.advance(100ms);
    EXPECT_EQ(player->currentTime(), at(0.1));
    EXPECT_EQ(item->currentTime(), at(0.1));
    player->pause();
    clock.advance(1s);
    EXPECT_EQ(player->currentTime(), at(0.1));
    EXPECT_FALSE(player->isPlaying());
}

TEST_F(Playback, EveryPictureIsShownAtItsTime)
{
    playFile("no-sound.mp4");
    std::vector<int> shown;
    player->setFrameHandler([&] {
        shown.push_back(tests::numberIn(player->currentFrame()));
        EXPECT_EQ(player->currentFrame()->time(), MediaTime::make(shown.back(), 30));
        EXPECT_LE(player->currentFrame()->time(), player->currentTime());
    });
    playOn(1000ms);
    std::vector<int> expected;
    for (int i = 1; i <= 30; ++i)
        expected.push_back(i);
    EXPECT_EQ(shown, expected);
}

TEST_F(Playback, IrregularTimesAreNotMadeRegular)
{
    playFile("vfr.mkv");
    std::vector<MediaTime> changes;
    player->setFrameHandler([&] { changes.push_back(player->currentTime()); });
    playOn(1200ms, 1ms);
    ASSERT_GE(changes.size(), 20u);
    for (std::size_t i = 0; i < 22; ++i) {
        const auto n = static_cast<int>(i) + 1;
        EXPECT_EQ(changes[i], MediaTime::make(33 * n + 2 * (7 * n % 11) + 400 * (n / 20), 1000)) << n;
    }
}

TEST_F(Playback, PicturesThatAreLateAreDropped)
{
    playFile("no-sound.mp4");
    int changes = 0;
    player->setFrameHandler([&] { ++changes; });
    ASSERT_TRUE(waitFor([&] { return player->hasPictures(); }));
    clock.advance(200ms);
    mainQueue.drain();
    ASSERT_TRUE(waitFor([&] { return tests::numberIn(player->currentFrame()) == 6; }));
    EXPECT_LE(changes, 3) << "one that was ready, one that was being decoded, and the one that is due";
}

TEST_F(Playback, WhoIsFarBehindGoesStraightToWhatIsDue)
{
    playFile("long-gop.mp4");
    std::vector<int> shown;
    player->setFrameHandler([&] { shown.push_back(tests::numberIn(player->currentFrame())); });
    clock.advance(10s);
    mainQueue.drain();
    ASSERT_TRUE(waitFor([&] { return tests::numberIn(player->currentFrame()) == 600; }));
    EXPECT_LE(shown.size(), 3u);
    playOn(100ms);
    EXPECT_EQ(shown.back(), 606) << "and goes on from there";
}

TEST_F(Playback, PlayBeforeTheItemIsReadyStartsWhenItIs)
{
    asset = media.assetWithURL(base::Url::fromPath(movie("no-sound.mp4")));
    item = media.playerItemWithAsset(asset);
    player = std::dynamic_pointer_cast<ffmpeg::FFmpegPlayer>(media.playerWithPlayerItem(item));
    player->play();
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    clock.advance(50ms);
    EXPECT_EQ(player->currentTime(), at(0.05));
}

TEST_F(Playback, TheEndPausesAndIsAnnouncedOnce)
{
    playFile("no-sound.mp4");
    playOn(3990ms, 30ms);
    EXPECT_TRUE(player->isPlaying());
    EXPECT_EQ(ends->count, 0);
    playOn(100ms);
    EXPECT_FALSE(player->isPlaying());
    EXPECT_EQ(ends->count, 1);
    EXPECT_EQ(player->currentTime(), item->duration());
    ASSERT_TRUE(waitFor([&] { return player->isSettled(); }));
    EXPECT_EQ(tests::numberIn(player->currentFrame()), 119);
    clock.advance(1s);
    mainQueue.drain();
    EXPECT_EQ(ends->count, 1);
}

TEST_F(Playback, PlayingAtTheEndStaysThereAndEndsAgain)
{
    playFile("no-sound.mp4");
    player->seekToTime(at(4));
    ASSERT_TRUE(waitFor([&] { return ends->count == 1; }));
    EXPECT_FALSE(player->isPlaying());
    player->play();
    EXPECT_EQ(ends->count, 1) << "not inside the call";
    ASSERT_TRUE(waitFor([&] { return ends->count == 2; }));
    EXPECT_EQ(player->currentTime(), at(4));
    EXPECT_FALSE(player->isPlaying());
}

TEST_F(Playback, WithoutAnActionAtTheEndItGoesOnPlayingAtTheEnd)
{
    playFile("one-frame.mp4");
    player->setActionAtItemEnd(ActionAtItemEnd::None);
    clock.advance(1s);
    mainQueue.drain();
    EXPECT_EQ(ends->count, 1);
    EXPECT_TRUE(player->isPlaying());
    EXPECT_EQ(player->currentTime(), item->duration());
    player->seekToTime(at(0));
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
}

TEST_F(Playback, PeriodicObserversAreCalledAtEachInterval)
{
    playFile("no-sound.mp4");
    std::vector<MediaTime> told;
    const auto token = player->addPeriodicTimeObserver(MediaTime::make(1, 30), [&](MediaTime t) { told.push_back(t); });
    playOn(500ms, 1ms);
    ASSERT_EQ(told.size(), 15u);
    for (std::size_t i = 0; i < told.size(); ++i)
        EXPECT_NEAR(told[i].seconds(), static_cast<double>(i + 1) / 30, 0.0011);
    player->pause();
    clock.advance(1s);
    mainQueue.drain();
    EXPECT_EQ(told.size(), 15u) << "not while paused";
    player->removeTimeObserver(token);
    player->play();
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    playOn(100ms);
    EXPECT_EQ(told.size(), 15u);
}

TEST_F(Playback, ABoundaryIsCalledWhenItIsPassedAndNotBySeeks)
{
    playFile("no-sound.mp4");
    std::vector<MediaTime> passed;
    const auto token =
        player->addBoundaryTimeObserver({at(0.25), at(2)}, [&] { passed.push_back(player->currentTime()); });
    playOn(300ms, 1ms);
    ASSERT_EQ(passed.size(), 1u);
    EXPECT_NEAR(passed[0].seconds(), 0.25, 0.001);
    player->seekToTime(at(3));
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    playOn(50ms);
    EXPECT_EQ(passed.size(), 1u);
}

TEST_F(Playback, ACallbackMayPauseSeekAndLetGoOfThePlayer)
{
    playFile("no-sound.mp4");
    int later = 0;
    const auto pausing = player->addBoundaryTimeObserver({at(0.1)}, [&] { player->pause(); });
    const auto behind = player->addBoundaryTimeObserver({at(0.11)}, [&] { ++later; });
    playOn(300ms);
    EXPECT_FALSE(player->isPlaying());
    EXPECT_EQ(later, 0);
    const auto leaving = player->addBoundaryTimeObserver({at(0.2)}, [&] { player = nullptr; });
    player->play();
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    clock.advance(500ms);
    mainQueue.drain();
    EXPECT_EQ(player, nullptr);
}

TEST_F(Playback, SeekingWhilePlayingGoesOnFromThere)
{
    playFile("no-sound.mp4");
    playOn(100ms);
    player->seekToTime(at(2));
    EXPECT_EQ(player->currentTime(), at(2));
    EXPECT_TRUE(player->isPlaying());
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    EXPECT_EQ(tests::numberIn(player->currentFrame()), 60);
    playOn(100ms);
    EXPECT_EQ(player->currentTime(), at(2.1));
    EXPECT_EQ(tests::numberIn(player->currentFrame()), 63);
}

TEST_F(Playback, PausingAndPlayingAgainLosesNoPicture)
{
    playFile("no-sound.mp4");
    std::vector<int> shown;
    player->setFrameHandler([&] { shown.push_back(tests::numberIn(player->currentFrame())); });
    for (int i = 0; i < 6; ++i) {
        playOn(70ms);
        player->pause();
        player->play();
        ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    }
    for (std::size_t i = 1; i < shown.size(); ++i)
        EXPECT_EQ(shown[i], shown[i - 1] + 1);
    EXPECT_EQ(shown.size(), 12u);
}

TEST_F(Playback, AMovieOfSoundAlonePlaysToItsEnd)
{
    playFile("audio-only.m4a");
    clock.advance(5s);
    mainQueue.drain();
    EXPECT_EQ(ends->count, 1);
}

TEST_F(Playback, APlayerOfNothingDoesNothing)
{
    const auto nothing = media.playerWithPlayerItem(nullptr);
    nothing->play();
    nothing->seekToTime(at(1));
    mainQueue.drain();
    nothing->pause();
    EXPECT_EQ(nothing->currentFrame(), nullptr);
}

TEST_F(Playback, PlayersThatGoWhileTheyWorkAreNotWaitedFor)
{
    // The quickest of them: a loaded machine can stop any single one for as long as it likes.
    auto quickest = std::chrono::steady_clock::duration::max();
    for (int i = 0; i < 10; ++i) {
        playFile("long-gop.mp4");
        player->seekToTime(at(19));
        const auto before = std::chrono::steady_clock::now();
        player = nullptr;
        quickest = std::min(quickest, std::chrono::steady_clock::now() - before);
    }
    EXPECT_LT(quickest, 50ms);
}

} // namespace
