/// Exports a movie, or a range of it, on a thread of its own: what the role says, with the work in ExportJob.
///
/// Set up on the main queue. The session keeps itself alive until it has told its end; it then ends on the main queue,
/// where its asset lives.
#pragma once

#include "linux/ffmpeg/Engine.h"
#include "linux/ffmpeg/FFmpegAsset.h"
#include "platform/media/ExportSession.h"

#include <atomic>
#include <memory>
#include <mutex>

namespace ffmpeg {

class FFmpegExportSession final : public platform::ExportSession {
public:
    static std::shared_ptr<FFmpegExportSession> make(const std::shared_ptr<Engine>& engine,
                                                     std::shared_ptr<FFmpegAsset> asset);

    void setOutputURL(std::optional<base::Url> url) override;
    void setOutputFileType(platform::FileType /*there is one*/) override {}
    void setTimeRange(std::optional<base::MediaTimeRange> range) override { here(m_range) = range; }
    void setAudioMix(std::optional<platform::AudioMix> mix) override { here(m_mix) = std::move(mix); }
    void exportAsynchronously(std::function<void()> done) override;

    void cancelExport() override { *m_cancelled = true; }
    Status status() const override;
    base::ErrorRef error() const override;
    std::optional<base::Url> outputURL() const override;
    double progress() const override { return *m_progress; }

private:
    FFmpegExportSession(std::shared_ptr<Engine> engine, std::shared_ptr<FFmpegAsset> asset);

    base::ErrorRef claimOutput();
    std::string outputPath(const base::Url& url) const;
    void start(std::function<void()> done, const base::ErrorRef& refusal = nullptr);
    base::Result<void> work(const std::shared_ptr<const Movie>& movie) const;
    void finish(const base::Result<void>& result);

    // Main queue, and the thread while it works.
    std::shared_ptr<Engine> m_engine;
    std::shared_ptr<FFmpegAsset> m_asset;
    std::optional<base::MediaTimeRange> m_range;
    std::optional<platform::AudioMix> m_mix;

    OutputClaim m_claim; ///< on the output, until it has its name or is given up

    std::shared_ptr<base::Work> m_underWay; ///< the main queue's, then the export's thread's

    // Any thread.
    std::shared_ptr<std::atomic<bool>> m_cancelled = std::make_shared<std::atomic<bool>>(false);
    std::shared_ptr<std::atomic<double>> m_progress = std::make_shared<std::atomic<double>>(0);
    mutable std::mutex m_mutex;
    std::optional<base::Url> m_outputURL;
    Status m_status = Status::Unknown;
    base::ErrorRef m_error;
};

} // namespace ffmpeg
