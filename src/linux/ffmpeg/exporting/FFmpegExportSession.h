/// Exports a movie, or a range of it, on threads of its own.
#pragma once

#include "linux/ffmpeg/Engine.h"
#include "linux/ffmpeg/FFmpegAsset.h"
#include "platform/media/ExportSession.h"

#include <mutex>

namespace ffmpeg {

class FFmpegExportSession final : public platform::ExportSession {
public:
    static std::shared_ptr<FFmpegExportSession> make(const std::shared_ptr<Engine>& engine,
                                                     std::shared_ptr<FFmpegAsset> asset);

    void setOutputURL(std::optional<base::Url> url) override;
    void setOutputFileType(platform::FileType /*type*/) override {}
    void setTimeRange(std::optional<base::MediaTimeRange> range) override { m_range = range; }
    void setAudioMix(std::optional<platform::AudioMix> mix) override { m_mix = std::move(mix); }
    void exportAsynchronously(std::function<void()> done) override;

    void cancelExport() override {}
    Status status() const override;
    base::ErrorRef error() const override;
    std::optional<base::Url> outputURL() const override;
    double progress() const override { return 0; }

private:
    FFmpegExportSession(std::shared_ptr<Engine> engine, std::shared_ptr<FFmpegAsset> asset)
        : m_engine(std::move(engine)), m_asset(std::move(asset))
    {
    }

    std::shared_ptr<Engine> m_engine;
    std::shared_ptr<FFmpegAsset> m_asset;
    std::optional<base::MediaTimeRange> m_range;
    std::optional<platform::AudioMix> m_mix;

    mutable std::mutex m_mutex;
    std::optional<base::Url> m_outputURL;
    Status m_status = Status::Unknown;
    base::ErrorRef m_error;
};

} // namespace ffmpeg
