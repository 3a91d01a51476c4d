#include "linux/ffmpeg/FFmpegMediaFramework.h"

#include "linux/ffmpeg/Engine.h"
#include "linux/ffmpeg/FFmpegAsset.h"
#include "linux/ffmpeg/FFmpegPlayer.h"
#include "linux/ffmpeg/FFmpegPlayerItem.h"

#include <cassert>
#include <utility>

namespace ffmpeg {

FFmpegMediaFramework::FFmpegMediaFramework(const base::System& system, runtime::NotificationCenter& center,
                                           Options options)
    : m_engine(std::make_shared<Engine>(system, center, std::move(options)))
{
    // What matters is told as errors; what the libraries say beside it names no file and helps nobody.
    av_log_set_level(AV_LOG_QUIET);
}

FFmpegMediaFramework::~FFmpegMediaFramework() = default;

std::shared_ptr<platform::Asset> FFmpegMediaFramework::assetWithURL(const std::optional<base::Url>& url)
{
    return FFmpegAsset::make(m_engine, url);
}

std::shared_ptr<platform::PlayerItem>
FFmpegMediaFramework::playerItemWithAsset(const std::shared_ptr<platform::Asset>& asset)
{
    auto own = std::dynamic_pointer_cast<FFmpegAsset>(asset);
    return FFmpegPlayerItem::make(own ? std::move(own) : FFmpegAsset::make(m_engine, std::nullopt));
}

std::shared_ptr<platform::Player>
FFmpegMediaFramework::playerWithPlayerItem(const std::shared_ptr<platform::PlayerItem>& item)
{
    return FFmpegPlayer::make(m_engine, std::dynamic_pointer_cast<FFmpegPlayerItem>(item));
}

} // namespace ffmpeg
