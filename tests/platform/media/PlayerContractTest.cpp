// What any media engine keeps to: run against the fake that the editor's tests use, and against the real one.

#include "support/EngineTest.h"
#include "support/FakeMedia.h"
#include "support/Paths.h"

#include <algorithm>
#include <chrono>
#include <functional>
#include <memory>
#include <vector>

namespace {

using base::MediaTime;
using Status = platform::PlayerItem::Status;

MediaTime at(double seconds)
{
    return MediaTime::fromSeconds(seconds, 600);
}

/// An engine with one movie of 4 seconds, and how its time is driven.
struct Rig {
    virtual ~Rig() = default;
    virtual platform::MediaFramework& media() = 0;
    virtual base::Url movie() const = 0;
    /// Lets the player play on for so long, or until it stops.
    virtual void letPlay(platform::Player& player, double seconds) = 0;

    bool waitFor(const std::function<bool()>& predicate) { return tests::waitUntil(mainQueue, predicate); }

    base::ManualClock clock;
    base::MainQueue mainQueue{clock};
    runtime::NotificationCenter center;
};

struct FakeRig final : Rig {
    FakeRig() { framework.movies["/clock.mp4"] = tests::FakeMovie::lasting(4); }
    platform::MediaFramework& media() override { return framework; }
    base::Url movie() const override { return base::Url::fromPath("/clock.mp4"); }
    void letPlay(platform::Player& player, double seconds) override
    {
        dynamic_cast<tests::FakePlayer&>(player).advance(seconds);
        mainQueue.drain();
    }
    tests::FakeMediaFramework framework{mainQueue, center};
};

struct RealRig final : Rig {
    platform::MediaFramework& media() override { return framework; }
    base::Url movie() const override { return base::Url::fromPath(tests::movie("clock.mp4")); }
    void letPlay(platform::Player& player, double seconds) override
    {
        auto& real = dynamic_cast<ffmpeg::FFmpegPlayer&>(player);
        constexpr std::chrono::milliseconds kStep(5);
        for (std::chrono::duration<double> gone(0); gone.count() < seconds - 1e-9; gone += kStep) {
            ASSERT_TRUE(waitFor([&] { return !real.isPlaying() || (real.isRunning() && real.hasPictures()); }));
            clock.advance(kStep);
            mainQueue.drain();
        }
    }
    base::MemoryLog log;
    base::WorkerQueue worker;
    base::System system{log, clock, mainQueue, worker, worker};
    ffmpeg::FFmpegMediaFramework framework{system, center, {}};
};

struct EndLog final : runtime::Object {
    static const runtime::Class& classObject()
    {
        static const runtime::Class& instance =
            runtime::ClassBuilder<EndLog>("ContractEndLog", &runtime::Object::classObject())
                .method("ended:", &EndLog::ended_)
                .build();
        return instance;
    }
    const runtime::Class& isa() const override { return classObject(); }
    void ended_(std::shared_ptr<runtime::Object>) { ++count; }
    int count = 0;
};

struct Kind {
    const char* name;
    std::function<std::unique_ptr<Rig>()> make;
};

class PlayerContract : public testing::TestWithParam<Kind> {
protected:
    void SetUp() override
    {
        item = rig->media().playerItemWithAsset(rig->media().assetWithURL(rig->movie()));
        player = rig->media().playerWithPlayerItem(item);
        rig->center.addObserver(ends, runtime::Selector("ended:"), platform::kPlayerItemDidPlayToEndNotification, item);
        player->setActionAtItemEnd(platform::ActionAtItemEnd::Pause);
    }
    void becomeReady()
    {
        ASSERT_TRUE(rig->waitFor([&] { return item->status() == Status::ReadyToPlay; }));
    }
    void letPlay(double seconds) { rig->letPlay(*player, seconds); }

    std::unique_ptr<Rig> rig = GetParam().make();
    std::shared_ptr<platform::PlayerItem> item;
    std::shared_ptr<platform::Player> player;
    std::shared_ptr<EndLog> ends = std::make_shared<EndLog>();
};

TEST_P(PlayerContract, AnItemIsUnknownFirstAndReadyLater)
{
    EXPECT_EQ(item->status(), Status::Unknown);
    EXPECT_FALSE(item->duration().isNumeric());
    EXPECT_EQ(player->currentItem(), item);
    becomeReady();
    EXPECT_EQ(item->duration(), at(4));
    EXPECT_EQ(item->asset()->duration(), at(4));
    EXPECT_EQ(item->asset()->tracksWithMediaType(platform::MediaType::Video).size(), 1u);
}

TEST_P(PlayerContract, NoUrlFailsLater)
{
    const auto nothing = rig->media().playerItemWithAsset(rig->media().assetWithURL(std::nullopt));
    EXPECT_EQ(nothing->status(), Status::Unknown);
    ASSERT_TRUE(rig->waitFor([&] { return nothing->status() == Status::Failed; }));
    EXPECT_TRUE(nothing->error());
}

TEST_P(PlayerContract, SeeksTellTheirTimeAtOnceAndClampAtBothEnds)
{
    becomeReady();
    player->seekToTime(at(1.5));
    EXPECT_EQ(player->currentTime(), at(1.5));
    EXPECT_EQ(item->currentTime(), at(1.5));
    EXPECT_EQ(player->currentTime().timescale, item->duration().timescale);
    player->seekToTime(at(9));
    EXPECT_EQ(player->currentTime(), at(4));
    player->seekToTime(at(-9));
    EXPECT_EQ(player->currentTime(), at(0));
    player->seekToTime(at(2));
    player->seekToTime(MediaTime::invalid());
    player->seekToTime(MediaTime::indefinite());
    EXPECT_EQ(player->currentTime(), at(2));
}

TEST_P(PlayerContract, ASeekCallsPeriodicObserversLaterAndBoundaryObserversNot)
{
    becomeReady();
    int periodic = 0;
    int boundary = 0;
    const auto first = player->addPeriodicTimeObserver(at(0.1), [&](MediaTime) { ++periodic; });
    const auto second = player->addBoundaryTimeObserver({at(1)}, [&] { ++boundary; });
    player->seekToTime(at(2));
    EXPECT_EQ(periodic, 0);
    rig->mainQueue.drain();
    EXPECT_EQ(periodic, 1);
    EXPECT_EQ(boundary, 0);
}

TEST_P(PlayerContract, PlayingCallsObserversAndPausingStopsThem)
{
    becomeReady();
    int periodic = 0;
    std::vector<MediaTime> boundary;
    const auto first = player->addPeriodicTimeObserver(at(0.1), [&](MediaTime) { ++periodic; });
    const auto second =
        player->addBoundaryTimeObserver({at(0.5), at(3)}, [&] { boundary.push_back(player->currentTime()); });
    letPlay(1);
    EXPECT_EQ(periodic, 0) << "it is not playing";
    player->play();
    EXPECT_TRUE(player->isPlaying());
    letPlay(1.02);
    EXPECT_EQ(periodic, 10);
    ASSERT_EQ(boundary.size(), 1u);
    EXPECT_NEAR(boundary[0].seconds(), 0.5, 0.005);
    player->pause();
    EXPECT_FALSE(player->isPlaying());
    letPlay(1);
    EXPECT_EQ(periodic, 10);
    player->removeTimeObserver(first);
    player->play();
    letPlay(0.5);
    EXPECT_EQ(periodic, 10);
}

TEST_P(PlayerContract, TheEndPausesThereAndIsAnnouncedOnce)
{
    becomeReady();
    player->seekToTime(at(3.8));
    player->play();
    letPlay(0.1);
    EXPECT_EQ(ends->count, 0);
    letPlay(0.2);
    EXPECT_EQ(ends->count, 1);
    EXPECT_FALSE(player->isPlaying());
    EXPECT_EQ(player->currentTime(), at(4));
    letPlay(0.2);
    EXPECT_EQ(ends->count, 1);
}

TEST_P(PlayerContract, TheEndIsAnnouncedAlsoWhereABoundaryPausesThere)
{
    becomeReady();
    const auto token = player->addBoundaryTimeObserver({at(4)}, [&] { player->pause(); });
    for (int run = 1; run <= 2; ++run) {
        player->seekToTime(at(3.8));
        player->play();
        letPlay(0.3);
        EXPECT_EQ(ends->count, run);
        EXPECT_FALSE(player->isPlaying());
        EXPECT_EQ(player->currentTime(), at(4));
    }
    player->play();
    letPlay(0.1);
    EXPECT_EQ(ends->count, 3) << "where it stands at the end it ends again at once";
}

TEST_P(PlayerContract, WhereABoundaryAtTheEndGoesElsewhereItDoesNotEnd)
{
    becomeReady();
    bool pauses = false;
    const auto token = player->addBoundaryTimeObserver({at(4)}, [&] {
        if (pauses)
            player->pause();
        player->seekToTime(at(1));
    });
    for (const bool each : {false, true}) {
        pauses = each;
        player->seekToTime(at(3.9));
        player->play();
        letPlay(0.2);
        EXPECT_EQ(ends->count, 0);
        EXPECT_LT(player->currentTime(), at(1.2));
    }
}

TEST_P(PlayerContract, SeekingWhilePlayingGoesOnPlaying)
{
    becomeReady();
    player->play();
    letPlay(0.1);
    player->seekToTime(at(2));
    EXPECT_TRUE(player->isPlaying());
    letPlay(0.1);
    EXPECT_NEAR(player->currentTime().seconds(), 2.1, 0.006);
}

TEST_P(PlayerContract, ABoundaryThatPausesEndsTheRunThere)
{
    becomeReady();
    const auto token = player->addBoundaryTimeObserver({at(0.2)}, [&] { player->pause(); });
    player->play();
    letPlay(1);
    EXPECT_FALSE(player->isPlaying());
    EXPECT_NEAR(player->currentTime().seconds(), 0.2, 0.006);
}

TEST_P(PlayerContract, FormerBoundariesStayAttachedAndPauseEachRunFromBeforeThem)
{
    becomeReady();
    const auto former = player->addBoundaryTimeObserver({at(0.6)}, [&] { player->pause(); });
    for (int run = 0; run < 2; ++run) {
        player->seekToTime(at(0.3));
        const auto later = player->addBoundaryTimeObserver({at(0.9)}, [&] { player->pause(); });
        player->play();
        letPlay(1);
        EXPECT_FALSE(player->isPlaying());
        EXPECT_NEAR(player->currentTime().seconds(), 0.6, 0.006);
    }
}

TEST_P(PlayerContract, StepsGoPictureByPictureAndAddUp)
{
    becomeReady();
    const auto stands = [&](int picture) {
        return rig->waitFor([&] { return player->currentTime() == MediaTime::make(picture, 30); });
    };
    player->seekToTime(at(1.01));
    player->stepByCount(1);
    EXPECT_TRUE(stands(31));
    player->stepByCount(-2);
    EXPECT_TRUE(stands(29));
    for (const int count : {1, 1, -3, 6})
        player->stepByCount(count);
    EXPECT_TRUE(stands(34));
    EXPECT_EQ(player->currentTime().timescale, item->duration().timescale);
}

TEST_P(PlayerContract, StepsStopAtBothEnds)
{
    becomeReady();
    const auto stands = [&](int picture) {
        return rig->waitFor([&] { return player->currentTime() == MediaTime::make(picture, 30); });
    };
    player->stepByCount(1000);
    EXPECT_TRUE(stands(119));
    player->stepByCount(1);
    player->stepByCount(-1);
    EXPECT_TRUE(stands(118));
    player->seekToTime(at(4));
    player->stepByCount(-1);
    EXPECT_TRUE(stands(118)) << "at the end the last picture is shown";
    player->stepByCount(-1000);
    EXPECT_TRUE(stands(0));
}

TEST_P(PlayerContract, AStepPausesAndCallsPeriodicObserversLater)
{
    becomeReady();
    player->seekToTime(at(2));
    rig->mainQueue.drain();
    std::vector<MediaTime> told;
    const auto token = player->addPeriodicTimeObserver(at(1000), [&](MediaTime time) { told.push_back(time); });
    player->play();
    player->stepByCount(1);
    EXPECT_FALSE(player->isPlaying());
    EXPECT_TRUE(told.empty());
    ASSERT_TRUE(rig->waitFor([&] { return !told.empty(); }));
    EXPECT_EQ(told, std::vector<MediaTime>{MediaTime::make(61, 30)});
}

TEST_P(PlayerContract, ASeekOvertakesTheStepsBeforeIt)
{
    becomeReady();
    player->stepByCount(5);
    player->seekToTime(at(3));
    player->stepByCount(1);
    EXPECT_TRUE(rig->waitFor([&] { return player->currentTime() == MediaTime::make(91, 30); }));
}

TEST_P(PlayerContract, NobodyIsCalledAfterThePlayerIsGone)
{
    becomeReady();
    int calls = 0;
    const auto token = player->addPeriodicTimeObserver(at(0.1), [&](MediaTime) { ++calls; });
    player->seekToTime(at(1));
    player = nullptr;
    rig->mainQueue.drain();
    EXPECT_EQ(calls, 0);
}

INSTANTIATE_TEST_SUITE_P(Engines, PlayerContract,
                         testing::Values(Kind{"Fake", [] { return std::make_unique<FakeRig>(); }},
                                         Kind{"Real", [] { return std::make_unique<RealRig>(); }}),
                         [](const auto& each) { return std::string(each.param.name); });

} // namespace
