/// The media engine on the FFmpeg libraries. Main queue only; outlives neither the system nor the notification center.
///
/// Assets of one URL share one open file: while any of them (or a player of one) lives, the movie can be read, even
/// after its file was removed. Players may outlive the framework.
#pragma once

#include "base/Affinity.h"
#include "base/System.h"
#include "base/WorkList.h"
#include "linux/ffmpeg/AudioOutput.h"
#include "platform/media/MediaFramework.h"
#include "runtime/NotificationCenter.h"

#include <functional>
#include <memory>
#include <string>

namespace ffmpeg {

struct Engine;
class FFmpegAsset;

struct Options {
    /// From the path that a URL names to the one that is opened; called on a worker. The path itself when empty.
    std::function<std::string(const std::string&)> resolvePath;
    /// The device that is heard. Empty plays silently, by the system's clock.
    MakeAudioOutput audioOutput;
    /// Where each export session stands as work, with its progress, until its end has been told or it goes without having
    /// been started. Outlives them; may be null.
    base::WorkList* works = nullptr;
    /// By how much the threads that make images stand back: 10 lets a player beside them go first.
    int imageNiceness = 0;
};

class FFmpegMediaFramework final : public platform::MediaFramework {
public:
    FFmpegMediaFramework(const base::System& system, runtime::NotificationCenter& center, Options options);
    ~FFmpegMediaFramework() override;

    std::shared_ptr<platform::Asset> assetWithURL(const std::optional<base::Url>& url) override;
    /// `asset` must be one of this framework's.
    std::shared_ptr<platform::PlayerItem> playerItemWithAsset(const std::shared_ptr<platform::Asset>& asset) override;
    std::shared_ptr<platform::Player> playerWithPlayerItem(const std::shared_ptr<platform::PlayerItem>& item) override;
    std::shared_ptr<platform::ImageGenerator>
    imageGeneratorWithAsset(const std::shared_ptr<platform::Asset>& asset) override;
    std::shared_ptr<platform::ExportSession> exportSessionWithAsset(const std::shared_ptr<platform::Asset>& asset,
                                                                    platform::ExportPreset preset) override;

    /// Whether the frame of a player has fewer pixels than the movie, because it was only scrubbed over: a player that
    /// rests soon shows the whole one.
    static bool isReduced(const platform::VideoFrame& frame);

private:
    std::shared_ptr<FFmpegAsset> ours(const std::shared_ptr<platform::Asset>& asset) const;

    std::shared_ptr<Engine> m_engine;
    base::Affinity m_affinity;
};

} // namespace ffmpeg
