#include "linux/ffmpeg/FFmpegAsset.h"
#include "linux/ffmpeg/Words.h"

#include <utility>

namespace ffmpeg {

base::Result<std::shared_ptr<Movie>> Engine::open(const std::string& path, const Cancelled& cancelled)
{
    const std::string resolved = options.resolvePath ? options.resolvePath(path) : path;
    std::erase_if(m_movies, [](const auto& each) { return each.second.expired(); });
    if (const auto found = m_movies.find(resolved); found != m_movies.end()) {
        auto movie = found->second.lock();
        if (movie && movie->file()->isStillAt(resolved))
            return movie;
    }
    auto file = OpenFile::open(resolved);
    if (!file)
        return file.error();
    auto movie = Movie::open(std::move(file).value(), cancelled);
    if (movie)
        m_movies[resolved] = movie.value();
    return movie;
}

std::shared_ptr<FFmpegAsset> FFmpegAsset::make(const std::shared_ptr<Engine>& engine, std::optional<base::Url> url)
{
    const std::shared_ptr<FFmpegAsset> asset(new FFmpegAsset(engine, std::move(url)));
    asset->load();
    return asset;
}

FFmpegAsset::FFmpegAsset(std::shared_ptr<Engine> engine, std::optional<base::Url> url)
    : m_engine(std::move(engine)), m_url(std::move(url)), m_cancelled(std::make_shared<std::atomic<bool>>(false))
{
}

FFmpegAsset::~FFmpegAsset()
{
    assertHere();
    *m_cancelled = true;
}

void FFmpegAsset::load()
{
    base::MainQueue& main = m_engine->system.mainQueue;
    const auto weak = weakSelf<FFmpegAsset>();
    const auto deliver = [weak, &main](base::Result<std::shared_ptr<Movie>> movie) {
        main.post([weak, movie = std::move(movie)]() mutable {
            // Locked here: a strong reference on the worker could be the last one and end us on the wrong thread.
            if (const auto self = weak.lock())
                self->finish(std::move(movie));
        });
    };
    if (!m_url) {
        deliver(base::Error::withMessage(base::Error::make("ffmpeg", AVERROR(EINVAL), "There is no movie to open."),
                                         "MOVIE_MISSING", {}));
        return;
    }
    if (!m_url->isFile()) {
        deliver(notAMovie(m_url->string(),
                          base::Error::withMessage(base::Error::make("ffmpeg", AVERROR(EINVAL), "it is not a file"),
                                                   "MOVIE_NOT_A_FILE", {})));
        return;
    }
    // The opener belongs to the engine and is joined before that goes, so the pointer is good while the task runs.
    m_engine->opener.post([deliver, engine = m_engine.get(), path = m_url->path(), cancelled = m_cancelled] {
        if (!*cancelled)
            deliver(engine->open(path, cancelled));
    });
}

void FFmpegAsset::finish(base::Result<std::shared_ptr<Movie>> movie)
{
    if (movie) {
        m_movie = std::move(movie).value();
    } else {
        m_error = movie.error();
        m_engine->system.log.error(m_error->description());
    }
    for (const auto& then : std::exchange(m_waiting, {}))
        then();
}

std::optional<platform::CutOff> FFmpegAsset::cutOff() const
{
    assertHere();
    return m_movie ? m_movie->cutOff() : std::nullopt;
}

void FFmpegAsset::whenLoaded(std::function<void()> then)
{
    assertHere();
    if (!m_movie && !m_error) {
        m_waiting.push_back(std::move(then));
        return;
    }
    m_engine->system.mainQueue.post([weak = weakSelf<FFmpegAsset>(), then = std::move(then)] {
        if (const auto self = weak.lock())
            then();
    });
}

base::MediaTime FFmpegAsset::duration() const
{
    assertHere();
    return m_movie ? m_movie->duration() : base::MediaTime::indefinite();
}

std::vector<platform::AssetTrack> FFmpegAsset::tracks() const
{
    assertHere();
    return m_movie ? m_movie->tracks() : std::vector<platform::AssetTrack>{};
}

} // namespace ffmpeg
