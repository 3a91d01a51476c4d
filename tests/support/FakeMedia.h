/// A media engine in memory: movies are scripted, playing goes on only when a test says so. Main queue only.
///
///     base::ManualClock clock;
///     base::MainQueue mainQueue(clock);
///     runtime::NotificationCenter center;
///     tests::FakeMediaFramework media(mainQueue, center);
///     media.movies["/movie.mp4"] = tests::FakeMovie::lasting(10);  // its items get ready at the next drain
///     …
///     media.player()->advance(2.5);                                // plays on; observers are called as on the way
///
/// A URL that is not in `movies` gives an asset that stays unknown until the test calls `item()->becomeReady(…)` or
/// `item()->fail(…)`. No URL fails by itself. Calls are recorded in `player()->calls`.
#pragma once

#include "base/Queue.h"
#include "platform/media/MediaFramework.h"
#include "runtime/NotificationCenter.h"
#include "support/FakeExporting.h"
#include "support/FakePlayer.h"

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace tests {

class FakeMediaFramework final : public platform::MediaFramework {
public:
    FakeMediaFramework(base::MainQueue& mainQueue, runtime::NotificationCenter& center)
        : m_mainQueue(mainQueue), m_center(center)
    {
    }

    std::shared_ptr<platform::Asset> assetWithURL(const std::optional<base::Url>& url) override
    {
        (*listener)("asset " + (url ? url->path() : "of nothing"));
        urls.push_back(url);
        const auto asset = std::make_shared<FakeAsset>(m_mainQueue, url);
        m_assets.push_back(asset);
        if (const auto movie = scripted(asset)) {
            m_mainQueue.post([weak = asset->weakSelf<FakeAsset>(), movie = *movie] {
                if (const auto self = weak.lock())
                    self->load(movie);
            });
        }
        return asset;
    }
    std::shared_ptr<platform::PlayerItem> playerItemWithAsset(const std::shared_ptr<platform::Asset>& asset) override
    {
        (*listener)("item");
        const auto item = std::make_shared<FakePlayerItem>(asset);
        m_items.push_back(item);
        const auto movie = scripted(asset);
        if (!movie)
            return item;
        m_mainQueue.post([weak = item->weakSelf<FakePlayerItem>(), movie = *movie] {
            const auto self = weak.lock();
            if (!self)
                return;
            if (movie.error)
                self->fail(movie.error);
            else
                self->becomeReady(movie);
        });
        return item;
    }
    std::shared_ptr<platform::Player> playerWithPlayerItem(const std::shared_ptr<platform::PlayerItem>& item) override
    {
        (*listener)("player");
        const auto player = std::make_shared<FakePlayer>(m_mainQueue, m_center,
                                                         std::dynamic_pointer_cast<FakePlayerItem>(item), listener);
        m_players.push_back(player);
        return player;
    }

    std::shared_ptr<platform::ImageGenerator>
    imageGeneratorWithAsset(const std::shared_ptr<platform::Asset>& asset) override
    {
        (*listener)("generator");
        const auto generator = std::make_shared<FakeImageGenerator>(asset, listener);
        m_generators.push_back(generator);
        return generator;
    }
    std::shared_ptr<platform::ExportSession> exportSessionWithAsset(const std::shared_ptr<platform::Asset>& asset,
                                                                    platform::ExportPreset /*preset*/) override
    {
        (*listener)("session");
        const auto session = std::make_shared<FakeExportSession>(asset, listener);
        m_sessions.push_back(session);
        return session;
    }

    std::map<std::string, FakeMovie> movies;    ///< by path
    std::vector<std::optional<base::Url>> urls; ///< of all assets that were asked for
    /// Hears of calls of this and of players, sessions and generators.
    const CallListenerRef listener = std::make_shared<CallListener>();

    // The latest of each; null when it is gone.
    std::shared_ptr<FakeAsset> asset() const { return latest(m_assets); }
    std::shared_ptr<FakePlayerItem> item() const { return latest(m_items); }
    std::shared_ptr<FakePlayer> player() const { return latest(m_players); }
    std::shared_ptr<FakeImageGenerator> imageGenerator() const { return latest(m_generators); }
    std::shared_ptr<FakeExportSession> exportSession() const { return latest(m_sessions); }
    std::size_t imageGeneratorCount() const { return m_generators.size(); } ///< ever made
    std::size_t exportSessionCount() const { return m_sessions.size(); }    ///< ever made
    std::size_t playerCount() const { return m_players.size(); }            ///< ever made

private:
    template <typename T> static std::shared_ptr<T> latest(const std::vector<std::weak_ptr<T>>& all)
    {
        return all.empty() ? nullptr : all.back().lock();
    }
    std::optional<FakeMovie> scripted(const std::shared_ptr<platform::Asset>& asset) const
    {
        if (!asset || !asset->url())
            return FakeMovie::failing(base::Error::make("fake", -2, "There is no movie."));
        const auto found = movies.find(asset->url()->path());
        return found == movies.end() ? std::nullopt : std::optional(found->second);
    }

    base::MainQueue& m_mainQueue;
    runtime::NotificationCenter& m_center;
    std::vector<std::weak_ptr<FakeAsset>> m_assets;
    std::vector<std::weak_ptr<FakePlayerItem>> m_items;
    std::vector<std::weak_ptr<FakePlayer>> m_players;
    std::vector<std::weak_ptr<FakeImageGenerator>> m_generators;
    std::vector<std::weak_ptr<FakeExportSession>> m_sessions;
};

} // namespace tests
