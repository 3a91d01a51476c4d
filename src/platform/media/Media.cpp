#include "platform/media/Asset.h"
#include "platform/media/AudioMix.h"
#include "platform/media/PlayerLayer.h"

#include <algorithm>
#include <iterator>

namespace platform {

std::vector<AssetTrack> Asset::tracksWithMediaType(MediaType type) const
{
    assertHere();
    std::vector<AssetTrack> found;
    const auto all = tracks();
    std::copy_if(all.begin(), all.end(), std::back_inserter(found),
                 [type](const AssetTrack& track) { return track.type == type; });
    return found;
}

AudioMix audioMixOfAllTracks(const Asset& asset)
{
    AudioMix mix;
    for (const AssetTrack& track : asset.tracksWithMediaType(MediaType::Audio))
        mix.inputs.push_back({track.trackID});
    return mix;
}

PlayerLayer::~PlayerLayer()
{
    assertHere();
    unfollow();
}

std::shared_ptr<PlayerLayer> PlayerLayer::withPlayer(const std::shared_ptr<Player>& player)
{
    const std::shared_ptr<PlayerLayer> layer(new PlayerLayer);
    layer->setPlayer(player);
    return layer;
}

void PlayerLayer::setPlayer(const std::shared_ptr<Player>& player)
{
    assertHere();
    if (m_player == player)
        return;
    unfollow();
    follow(player);
    setNeedsDisplay();
}

void PlayerLayer::follow(const std::shared_ptr<Player>& player)
{
    m_player = player;
    m_item = player ? player->currentItem() : nullptr;
    if (m_item)
        m_item->addObserver(*this, PlayerItem::kStatusKey);
    if (m_player) {
        m_player->setFrameHandler([weak = weakSelf<PlayerLayer>()] {
            if (const auto self = weak.lock())
                self->setNeedsDisplay();
        });
    }
}

void PlayerLayer::unfollow()
{
    if (m_item)
        m_item->removeObserver(*this, PlayerItem::kStatusKey);
    if (m_player)
        m_player->setFrameHandler({});
    m_item = nullptr;
    m_player = nullptr;
}

void PlayerLayer::observeValueForKeyPath_ofObject_change_context(std::string_view /*keyPath*/,
                                                                 runtime::Object& /*object*/,
                                                                 const runtime::KeyValueChange& /*change*/,
                                                                 void* /*context*/)
{
    setNeedsDisplay();
}

bool PlayerLayer::hasFailed() const
{
    assertHere();
    return m_item && m_item->status() == PlayerItem::Status::Failed;
}

base::ErrorRef PlayerLayer::failure() const
{
    assertHere();
    return hasFailed() ? m_item->error() : nullptr;
}

std::optional<CutOff> PlayerLayer::notice() const
{
    assertHere();
    if (!m_item || m_item->status() != PlayerItem::Status::ReadyToPlay || !m_item->asset())
        return {};
    const bool isAtStart = !m_player->isPlaying() && m_player->currentTime().seconds() == 0;
    return isAtStart ? m_item->asset()->cutOff() : std::nullopt;
}

base::Rect PlayerLayer::videoRect(base::Rect bounds) const
{
    assertHere();
    const VideoFrameRef frame = currentFrame();
    if (!frame || bounds.isEmpty())
        return {};
    const base::Size size = frame->displaySize();
    if (!(size.width > 0) || !(size.height > 0))
        return {};
    const double scale = std::min(bounds.width() / size.width, bounds.height() / size.height);
    const base::Size fitted{size.width * scale, size.height * scale};
    return {
        {bounds.minX() + (bounds.width() - fitted.width) / 2, bounds.minY() + (bounds.height() - fitted.height) / 2},
        fitted};
}

} // namespace platform
