/// An asset as it is being played. Main queue only.
#pragma once

#include "linux/ffmpeg/FFmpegAsset.h"
#include "platform/media/PlayerItem.h"

#include <functional>
#include <memory>

namespace ffmpeg {

class FFmpegPlayerItem final : public platform::PlayerItem {
public:
    static std::shared_ptr<FFmpegPlayerItem> make(std::shared_ptr<FFmpegAsset> asset);

    std::shared_ptr<platform::Asset> asset() const override { return here(m_asset); }
    Status status() const override { return here(m_status); }
    base::ErrorRef error() const override { return here(m_asset)->error(); }
    base::MediaTime duration() const override;
    base::MediaTime currentTime() const override { return here(m_now) ? m_now() : base::MediaTime::zero(); }

    const std::shared_ptr<FFmpegAsset>& ffmpegAsset() const { return here(m_asset); }
    /// Who knows where it stands: the latest player. That one takes itself back before it goes.
    void setTimeSource(std::function<base::MediaTime()> now) { here(m_now) = std::move(now); }

private:
    explicit FFmpegPlayerItem(std::shared_ptr<FFmpegAsset> asset) : m_asset(std::move(asset)) {}

    void assetLoaded();

    std::shared_ptr<FFmpegAsset> m_asset;
    std::function<base::MediaTime()> m_now;
    Status m_status = Status::Unknown;
};

} // namespace ffmpeg
