#include "linux/ffmpeg/FFmpegPlayerItem.h"

#include <utility>

namespace ffmpeg {

std::shared_ptr<FFmpegPlayerItem> FFmpegPlayerItem::make(std::shared_ptr<FFmpegAsset> asset)
{
    const std::shared_ptr<FFmpegPlayerItem> item(new FFmpegPlayerItem(std::move(asset)));
    item->m_asset->whenLoaded([weak = item->weakSelf<FFmpegPlayerItem>()] {
        if (const auto self = weak.lock())
            self->assetLoaded();
    });
    return item;
}

base::MediaTime FFmpegPlayerItem::duration() const
{
    assertHere();
    return m_status == Status::ReadyToPlay ? m_asset->duration() : base::MediaTime::indefinite();
}

void FFmpegPlayerItem::assetLoaded()
{
    m_status = m_asset->movie() ? Status::ReadyToPlay : Status::Failed;
    if (m_status == Status::ReadyToPlay)
        didChangeValueForKey(kDurationKey);
    didChangeValueForKey(kStatusKey);
}

} // namespace ffmpeg
