#include "linux/ffmpeg/exporting/FFmpegExportSession.h"

#include "linux/ffmpeg/exporting/ExportJob.h"

#include <cassert>
#include <cerrno>
#include <thread>
#include <utility>

namespace ffmpeg {

std::shared_ptr<FFmpegExportSession> FFmpegExportSession::make(const std::shared_ptr<Engine>& engine,
                                                               std::shared_ptr<FFmpegAsset> asset)
{
    return std::shared_ptr<FFmpegExportSession>(new FFmpegExportSession(engine, std::move(asset)));
}

FFmpegExportSession::FFmpegExportSession(std::shared_ptr<Engine> engine, std::shared_ptr<FFmpegAsset> asset)
    : m_engine(std::move(engine)), m_asset(std::move(asset))
{
    // Already now: whoever made it is about to start it, and nobody shall leave in between.
    if (m_engine->options.works)
        m_underWay = m_engine->options.works->begin();
}

void FFmpegExportSession::setOutputURL(std::optional<base::Url> url)
{
    assertHere();
    const std::lock_guard lock(m_mutex);
    m_outputURL = std::move(url);
}

void FFmpegExportSession::exportAsynchronously(std::function<void()> done)
{
    assertHere();
    {
        const std::lock_guard lock(m_mutex);
        assert(m_status == Status::Unknown);
        m_status = Status::Waiting;
    }
    if (const base::ErrorRef refusal = claimOutput()) {
        start(std::move(done), refusal);
        return;
    }
    auto self = std::static_pointer_cast<FFmpegExportSession>(shared_from_this());
    m_asset->whenLoaded([self, done = std::move(done)]() mutable { self->start(std::move(done)); });
}

std::string FFmpegExportSession::outputPath(const base::Url& url) const
{
    const auto& resolve = m_engine->options.resolvePath;
    return resolve ? resolve(url.path()) : url.path();
}

/// Null, or why this export cannot begin. Without a file to write to it fails later.
base::ErrorRef FFmpegExportSession::claimOutput()
{
    const auto url = outputURL();
    if (!url || !url->isFile())
        return nullptr;
    m_claim = m_engine->outputs.take(outputPath(*url));
    if (m_claim)
        return nullptr;
    return base::Error::make("ffmpeg", AVERROR(EEXIST),
                             "“" + url->lastPathComponent() + "” cannot be written: another export is writing it.");
}

void FFmpegExportSession::start(std::function<void()> done, const base::ErrorRef& refusal)
{
    {
        const std::lock_guard lock(m_mutex);
        m_status = Status::Exporting;
    }
    auto self = std::static_pointer_cast<FFmpegExportSession>(shared_from_this());
    // The movie is asked for here, because the asset is the main queue's.
    auto work = [self, refusal, movie = refusal ? nullptr : m_asset->movie(), why = m_asset->error(),
                 done = std::move(done)]() mutable {
        const auto result = refusal ? base::Result<void>(refusal) : movie ? self->work(movie) : base::Result<void>(why);
        self->m_claim = nullptr;
        // Why it could not be opened was logged when it was tried.
        if ((refusal || movie) && !result && !*self->m_cancelled)
            self->m_engine->system.log.error(result.error()->description());
        self->finish(result);
        movie = nullptr;
        std::exchange(done, nullptr)();
    };
    // Behind what is posted at the end: whoever waits for the end of all work finds that done.
    auto underWay = m_underWay;
    // Whoever is told may wait for the main queue, so nobody waits there for the thread before it has told. The session
    // and the thread then end there: the former's asset lives on that queue.
    auto thread = std::make_shared<std::jthread>();
    base::MainQueue& main = m_engine->system.mainQueue;
    auto started = std::make_shared<std::atomic<bool>>(false);
    *thread = std::jthread([self = std::move(self), work = std::move(work), thread, started, &main,
                            underWay = std::move(underWay)]() mutable {
        started->wait(false); // until `thread` is what it refers to
        {
            auto now = std::move(work);
            now();
        }
        self->m_underWay = nullptr;
        main.post([self = std::move(self), thread = std::move(thread)] {});
    });
    *started = true;
    started->notify_one();
}

base::Result<void> FFmpegExportSession::work(const std::shared_ptr<const Movie>& movie) const
{
    const auto url = outputURL();
    if (!url || !url->isFile())
        return base::Error::make("ffmpeg", AVERROR(EINVAL),
                                 "“" + movie->file()->name() + "” cannot be exported: there is no file to write to.");
    ExportJob job;
    job.movie = movie;
    job.output = outputPath(*url);
    job.range = m_range;
    job.mix = m_mix;
    job.cancelled = m_cancelled;
    // A second attempt, after copying failed, begins anew; what was told does not go back.
    job.progress = [told = m_progress, underWay = m_underWay](double part) {
        if (part <= *told)
            return;
        *told = part;
        if (underWay)
            underWay->setProgress(part);
    };
    job.log = &m_engine->system.log;
    return job.run();
}

void FFmpegExportSession::finish(const base::Result<void>& result)
{
    if (result)
        *m_progress = 1;
    const std::lock_guard lock(m_mutex);
    m_status = result ? Status::Completed : *m_cancelled ? Status::Cancelled : Status::Failed;
    m_error = m_status == Status::Failed ? result.error() : nullptr;
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
