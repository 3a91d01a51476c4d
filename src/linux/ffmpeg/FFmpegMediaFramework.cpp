#include "linux/ffmpeg/FFmpegMediaFramework.h"

#include "linux/ffmpeg/DecodedFrame.h"
#include "linux/ffmpeg/Engine.h"
#include "linux/ffmpeg/FFmpegAsset.h"
#include "linux/ffmpeg/FFmpegImageGenerator.h"
#include "linux/ffmpeg/FFmpegPlayer.h"
#include "linux/ffmpeg/FFmpegPlayerItem.h"
#include "linux/ffmpeg/exporting/FFmpegExportSession.h"

#include <utility>

namespace ffmpeg {

FFmpegMediaFramework::FFmpegMediaFramework(const base::System& system, runtime::NotificationCenter& center,
                                           Options options)
    : m_engine(std::make_shared<Engine>(system, center, std::move(options)))
{
    // What matters is told as errors; what the libraries say beside it names no file and helps nobody.
    av_log_set_level(AV_LOG_QUIET);
}

FFmpegMediaFramework::~FFmpegMediaFramework()
{
    m_affinity.assertHere();
}

std::shared_ptr<platform::Asset> FFmpegMediaFramework::assetWithURL(const std::optional<base::Url>& url)
{
    m_affinity.assertHere();
    return FFmpegAsset::make(m_engine, url);
}

std::shared_ptr<platform::PlayerItem>
FFmpegMediaFramework::playerItemWithAsset(const std::shared_ptr<platform::Asset>& asset)
{
    m_affinity.assertHere();
    return FFmpegPlayerItem::make(ours(asset));
}

std::shared_ptr<platform::Player>
FFmpegMediaFramework::playerWithPlayerItem(const std::shared_ptr<platform::PlayerItem>& item)
{
    m_affinity.assertHere();
    return FFmpegPlayer::make(m_engine, std::dynamic_pointer_cast<FFmpegPlayerItem>(item));
}

std::shared_ptr<platform::ImageGenerator>
FFmpegMediaFramework::imageGeneratorWithAsset(const std::shared_ptr<platform::Asset>& asset)
{
    m_affinity.assertHere();
    return FFmpegImageGenerator::make(m_engine, ours(asset));
}

std::shared_ptr<platform::ExportSession>
FFmpegMediaFramework::exportSessionWithAsset(const std::shared_ptr<platform::Asset>& asset,
                                             platform::ExportPreset /*preset: there is one*/)
{
    m_affinity.assertHere();
    return FFmpegExportSession::make(m_engine, ours(asset));
}

bool FFmpegMediaFramework::isReduced(const platform::VideoFrame& frame)
{
    const auto* const decoded = dynamic_cast<const DecodedFrame*>(&frame);
    return decoded && decoded->isReduced();
}

/// One that fails in place of one of another framework.
std::shared_ptr<FFmpegAsset> FFmpegMediaFramework::ours(const std::shared_ptr<platform::Asset>& asset) const
{
    auto own = std::dynamic_pointer_cast<FFmpegAsset>(asset);
    return own ? std::move(own) : FFmpegAsset::make(m_engine, std::nullopt);
}

} // namespace ffmpeg
