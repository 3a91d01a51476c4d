#include "linux/ffmpeg/images/ImageWorkers.h"

#include "linux/ffmpeg/images/ImageOf.h"

#include <algorithm>
#include <string>
#include <sys/resource.h>
#include <unistd.h>
#include <utility>

namespace ffmpeg {

namespace {

constexpr unsigned kMostWorkers = 4;
/// Of the pictures that all decoders together may work on: each keeps up to 17 of them, of 1.5 bytes a pixel.
constexpr std::int64_t kMostPixels = std::int64_t(4) * 3840 * 2160;

int processors()
{
    return static_cast<int>(std::clamp(std::thread::hardware_concurrency(), 1u, kMostWorkers));
}

base::ErrorRef failure(const Movie& movie, const std::string& what)
{
    return base::Error::make("ffmpeg", AVERROR_INVALIDDATA, "“" + movie.file()->name() + "” " + what + ".");
}

} // namespace

ImageWorkers::ImageWorkers(base::Result<std::shared_ptr<const Movie>> movie, int niceness)
    : m_movie(movie && !movie.value()->video() ? failure(*movie.value(), "has no pictures") : std::move(movie)),
      m_niceness(niceness)
{
}

ImageWorkers::~ImageWorkers()
{
    cancel();
    for (const auto& worker : m_workers)
        worker->thread.join();
}

void ImageWorkers::cancel()
{
    Waiting dropped;
    {
        const std::lock_guard lock(m_mutex);
        *m_cancelled = true;
        dropped.swap(m_waiting);
    }
    m_changed.notify_all();
    const std::lock_guard lock(m_calling);
}

void ImageWorkers::add(std::vector<Request> requests)
{
    m_affinity.assertHere();
    {
        const std::lock_guard lock(m_mutex);
        for (Request& each : requests) {
            const std::int64_t tick = tickOf(each.time);
            m_waiting.emplace(tick, std::move(each));
        }
        while (m_workers.size() < std::min(m_waiting.size(), workerLimit())) {
            Worker& worker = *m_workers.emplace_back(std::make_unique<Worker>());
            worker.thread = std::thread([this, &worker] { work(worker); });
        }
    }
    m_changed.notify_all();
}

/// Times beyond the ends are those of the ends.
std::int64_t ImageWorkers::tickOf(base::MediaTime time) const
{
    if (!m_movie)
        return 0;
    const Movie& movie = *m_movie.value();
    if (!(time > base::MediaTime::zero()))
        time = base::MediaTime::zero();
    if (time > movie.duration())
        time = movie.duration();
    return movie.video()->tickAt(time);
}

std::size_t ImageWorkers::workerLimit() const
{
    if (!m_movie)
        return 1;
    const AVFrame& picture = m_movie.value()->firstFrame()->picture();
    const std::int64_t pixels = std::max<std::int64_t>(1, std::int64_t(picture.width) * picture.height);
    return static_cast<std::size_t>(std::clamp<std::int64_t>(kMostPixels / pixels, 1, processors()));
}

void ImageWorkers::work(Worker& worker)
{
    if (m_niceness > 0)
        setpriority(PRIO_PROCESS, static_cast<id_t>(gettid()), m_niceness);
    while (const auto job = next(worker))
        make(worker, *job);
}

std::optional<ImageWorkers::Job> ImageWorkers::next(Worker& worker)
{
    std::unique_lock lock(m_mutex);
    for (;;) {
        if (*m_cancelled)
            return std::nullopt;
        if (m_movie && !worker.walk && !worker.error && !m_waiting.empty()
            && m_waiting.begin()->first > m_movie.value()->firstFrame()->pts()) {
            lock.unlock();
            auto walk = PictureWalk::open(m_movie.value(), m_cancelled);
            lock.lock();
            if (walk)
                worker.walk = std::move(walk).value();
            else
                worker.error = failure(*m_movie.value(), "cannot be read: " + walk.error()->description());
            continue;
        }
        const auto before = worker.group;
        const auto chosen = choose(worker);
        if (!chosen)
            worker.group.reset();
        if (before && worker.group != before)
            m_changed.notify_all(); // what came late and lies behind in the group is anybody's now
        if (chosen) {
            const int threads = worker.group && allLieIn(worker, *worker.group) ? processors() : 1;
            Job job{std::move((*chosen)->second), (*chosen)->first, threads, PictureWalk::Then::Rest};
            const auto behind = m_waiting.erase(*chosen);
            if (worker.group && behind != m_waiting.end() && worker.walk->groupOf(behind->first) == *worker.group)
                job.then = PictureWalk::Then::GoOn;
            worker.tick = job.tick;
            return job;
        }
        m_changed.wait(lock);
    }
}

/// What comes next in the group that is under way; else the first in one that nobody else is in.
std::optional<ImageWorkers::Waiting::iterator> ImageWorkers::choose(Worker& worker)
{
    if (m_waiting.empty())
        return std::nullopt;
    if (!worker.walk)
        return m_waiting.begin();
    if (worker.group) {
        const auto ahead = m_waiting.lower_bound(worker.tick);
        if (ahead != m_waiting.end() && worker.walk->groupOf(ahead->first) == *worker.group)
            return ahead;
    }
    for (auto each = m_waiting.begin(); each != m_waiting.end(); ++each) {
        const std::int64_t group = worker.walk->groupOf(each->first);
        if (!isOthers(worker, group)) {
            worker.group = group;
            return each;
        }
    }
    return std::nullopt;
}

bool ImageWorkers::isOthers(const Worker& worker, std::int64_t group) const
{
    return std::any_of(m_workers.begin(), m_workers.end(),
                       [&](const auto& each) { return each.get() != &worker && each->group == group; });
}

bool ImageWorkers::allLieIn(const Worker& worker, std::int64_t group) const
{
    return std::none_of(m_workers.begin(), m_workers.end(),
                        [&](const auto& each) { return each.get() != &worker && each->group; })
           && std::all_of(m_waiting.begin(), m_waiting.end(),
                          [&](const auto& each) { return worker.walk->groupOf(each.first) == group; });
}

void ImageWorkers::make(Worker& worker, const Job& job)
{
    const base::MediaTime time = job.request.time;
    if (!m_movie)
        return answer(job.request, nullptr, m_movie.error());
    const Movie& movie = *m_movie.value();
    if (!time.isValid() || time.kind == base::MediaTime::Kind::Indefinite)
        return answer(job.request, nullptr, failure(movie, "has no picture at what is not a time"));
    if (job.tick <= movie.firstFrame()->pts())
        return answer(job.request, movie.firstFrame(), nullptr);
    if (!worker.walk)
        return answer(job.request, nullptr, worker.error);
    PictureWalk& walk = *worker.walk;
    if (walk.threads() != job.threads && !walk.goesOnTo(job.tick))
        walk.setThreads(job.threads);
    const std::int64_t before = walk.decodedCount();
    const FrameRef frame = walk.at(job.tick, job.then);
    m_decodedCount += walk.decodedCount() - before;
    answer(job.request, frame, failure(movie, "has no picture at that time that can be decoded"));
}

/// `error` is told when there is no picture.
void ImageWorkers::answer(const Request& request, const FrameRef& frame, const base::ErrorRef& error)
{
    const platform::ImageRef image = frame && !*m_cancelled ? imageOf(*frame, request.maximumSize) : nullptr;
    const std::lock_guard lock(m_calling);
    if (*m_cancelled)
        return;
    using Result = platform::ImageGenerator::Result;
    if (image)
        (*request.handler)(request.time, image, frame->time(), Result::Succeeded, nullptr);
    else
        (*request.handler)(request.time, nullptr, base::MediaTime::invalid(), Result::Failed,
                           error ? error : failure(*m_movie.value(), "has a picture that cannot be drawn"));
}

} // namespace ffmpeg
