#include "support/FakeMedia.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using base::MediaTime;
using Status = platform::PlayerItem::Status;

struct KeyLog final : runtime::KeyValueObserver {
    void observeValueForKeyPath_ofObject_change_context(std::string_view keyPath, runtime::Object&,
                                                        const runtime::KeyValueChange&, void*) override
    {
        keys.emplace_back(keyPath);
    }
    std::vector<std::string> keys;
};

class FakeMedia : public testing::Test {
protected:
    std::shared_ptr<platform::PlayerItem> itemOf(const std::string& path)
    {
        return media.playerItemWithAsset(media.assetWithURL(base::Url::fromPath(path)));
    }

    base::ManualClock clock;
    base::MainQueue mainQueue{clock};
    runtime::NotificationCenter center;
    tests::FakeMediaFramework media{mainQueue, center};
};

TEST_F(FakeMedia, AScriptedMovieGetsReadyAtTheNextDrain)
{
    media.movies["/a.mp4"] = tests::FakeMovie::lasting(3);
    const auto item = itemOf("/a.mp4");
    KeyLog log;
    item->addObserver(log, platform::PlayerItem::kStatusKey);
    item->addObserver(log, platform::PlayerItem::kDurationKey);
    EXPECT_EQ(item->status(), Status::Unknown);
    mainQueue.drain();
    EXPECT_EQ(item->status(), Status::ReadyToPlay);
    EXPECT_EQ(log.keys, (std::vector<std::string>{"duration", "status"}));
    EXPECT_EQ(item->asset()->tracksWithMediaType(platform::MediaType::Video).size(), 1u);
}

TEST_F(FakeMedia, AnUnscriptedMovieWaitsForTheTest)
{
    const auto item = itemOf("/b.mp4");
    mainQueue.drain();
    EXPECT_EQ(item->status(), Status::Unknown);
    media.item()->fail();
    EXPECT_EQ(item->status(), Status::Failed);
    EXPECT_TRUE(item->error());
}

TEST_F(FakeMedia, PlayingOnCallsWhoWaitsAndStopsAtTheEnd)
{
    media.movies["/a.mp4"] = tests::FakeMovie::lasting(1);
    const auto player = media.playerWithPlayerItem(itemOf("/a.mp4"));
    mainQueue.drain();
    std::vector<double> times;
    const auto token =
        player->addPeriodicTimeObserver(MediaTime::make(1, 4), [&](MediaTime t) { times.push_back(t.seconds()); });
    media.player()->advance(9);
    EXPECT_TRUE(times.empty()) << "it is paused";
    player->play();
    media.player()->advance(9);
    EXPECT_EQ(times, (std::vector<double>{0.25, 0.5, 0.75, 1}));
    EXPECT_FALSE(player->isPlaying());
    player->seekToTime(MediaTime::make(1, 2));
    EXPECT_EQ(player->currentTime(), MediaTime::make(1, 2));
    EXPECT_EQ(times.size(), 4u) << "observers never run inside the call";
    mainQueue.drain();
    EXPECT_EQ(times.back(), 0.5);
}

} // namespace
