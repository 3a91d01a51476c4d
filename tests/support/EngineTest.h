/// A fixture with the real media engine on the test movies: silent, its time driven by the test.
#pragma once

#include "base/System.h"
#include "linux/ffmpeg/FFmpegMediaFramework.h"
#include "linux/ffmpeg/FFmpegPlayer.h"
#include "support/MoviePictures.h"
#include "support/Paths.h"
#include "support/WaitUntil.h"

#include <gtest/gtest.h>

#include <chrono>
#include <memory>
#include <string>

namespace tests {

class EngineTest : public testing::Test {
protected:
    using Status = platform::PlayerItem::Status;
    using MediaTime = base::MediaTime;

    static std::string movie(const std::string& name) { return tests::movie(name); }
    static MediaTime at(double seconds) { return MediaTime::fromSeconds(seconds, 90000); }

    bool waitFor(const std::function<bool()>& predicate) { return waitUntil(mainQueue, predicate); }

    /// Opens a file; gives its final status.
    Status open(const std::string& path)
    {
        asset = media.assetWithURL(base::Url::fromPath(path));
        item = media.playerItemWithAsset(asset);
        player = std::dynamic_pointer_cast<ffmpeg::FFmpegPlayer>(media.playerWithPlayerItem(item));
        waitFor([&] { return item->status() != Status::Unknown; });
        return item->status();
    }
    /// Goes there and gives the number of the full picture that is shown then; -1 when none comes.
    int numberAt(MediaTime time)
    {
        bool came = false;
        const auto token = player->addPeriodicTimeObserver(at(1000), [&](MediaTime) { came = true; });
        player->seekToTime(time);
        waitFor([&] { return came && player->isSettled(); });
        player->removeTimeObserver(token);
        return numberIn(player->currentFrame());
    }
    /// Lets time go on by small steps, the workers keeping up.
    void playOn(std::chrono::milliseconds by, std::chrono::milliseconds step = std::chrono::milliseconds(5))
    {
        for (std::chrono::milliseconds gone{0}; gone < by; gone += step) {
            ASSERT_TRUE(
                waitFor([&] { return !player->isPlaying() || (player->isRunning() && player->hasPictures()); }));
            clock.advance(step);
            mainQueue.drain();
        }
    }

    base::ManualClock clock;
    base::MemoryLog log;
    base::MainQueue mainQueue{clock};
    base::WorkerQueue worker;
    base::System system{log, clock, mainQueue, worker, worker};
    runtime::NotificationCenter center;
    ffmpeg::FFmpegMediaFramework media{system, center, {}};
    std::shared_ptr<platform::Asset> asset;
    std::shared_ptr<platform::PlayerItem> item;
    std::shared_ptr<ffmpeg::FFmpegPlayer> player;
};

} // namespace tests
