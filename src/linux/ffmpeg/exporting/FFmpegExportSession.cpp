#include "linux/ffmpeg/exporting/FFmpegExportSession.h"

#include <utility>

namespace ffmpeg {

std::shared_ptr<FFmpegExportSession> FFmpegExportSession::make(const std::shared_ptr<Engine>& engine,
                                                               std::shared_ptr<FFmpegAsset> asset)
{
    return std::shared_ptr<FFmpegExportSession>(new FFmpegExportSession(engine, std::move(asset)));
}

void FFmpegExportSession::setOutputURL(std::optional<base::Url> url)
{
    const std::lock_guard lock(m_mutex);
    m_outputURL = std::move(url);
}

void FFmpegExportSession::exportAsynchronously(std::function<void()> done)
{
    m_engine->reaper.post([self = std::static_pointer_cast<FFmpegExportSession>(shared_from_this()), done] {
        {
            const std::lock_guard lock(self->m_mutex);
            self->m_status = Status::Failed;
            self->m_error = base::Error::make("ffmpeg", AVERROR(ENOSYS), "Movies cannot be exported yet.");
        }
        done();
    });
}

platform::ExportSession::Status FFmpegExportSession::status() const
{
    const std::lock_guard lock(m_mutex);
    return m_status;
}

base::ErrorRef FFmpegExportSession::error() const
{
    const std::lock_guard lock(m_mutex);
    return m_error;
}

std::optional<base::Url> FFmpegExportSession::outputURL() const
{
    const std::lock_guard lock(m_mutex);
    return m_outputURL;
}

} // namespace ffmpeg
