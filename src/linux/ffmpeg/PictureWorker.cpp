#include "linux/ffmpeg/PictureWorker.h"

#include <algorithm>
#include <chrono>
#include <utility>

namespace ffmpeg {

namespace {

/// One more than there are cores keeps them all busy while a finished picture is fetched; beyond that only memory grows.
int threadCount()
{
    return static_cast<int>(std::clamp(std::thread::hardware_concurrency() + 1, 2u, 5u));
}

/// A finger that has not moved for so long rests.
constexpr std::chrono::milliseconds kRest{80};

} // namespace

PictureWorker::PictureWorker(std::shared_ptr<const Movie> movie, Arrived arrived)
    : m_movie(std::move(movie)), m_arrived(std::move(arrived)), m_thread([this] { loop(); })
{
}

PictureWorker::~PictureWorker()
{
    cancel();
    m_thread.join();
}

void PictureWorker::cancel()
{
    {
        const std::lock_guard lock(m_mutex);
        *m_cancelled = true;
    }
    m_changed.notify_all();
}

void PictureWorker::show(std::uint64_t generation, std::int64_t tick)
{
    m_affinity.assertHere();
    request(generation, tick, false);
}

void PictureWorker::play(std::uint64_t generation, std::int64_t tick)
{
    m_affinity.assertHere();
    request(generation, tick, true);
}

void PictureWorker::request(std::uint64_t generation, std::int64_t tick, bool plays)
{
    {
        const std::lock_guard lock(m_mutex);
        m_request = {generation, tick, plays};
        m_generation = generation;
        m_dueTick = tick;
        m_queue.clear();
        m_exhausted = false;
    }
    m_changed.notify_all();
}

FrameRef PictureWorker::takeDue(std::int64_t tick)
{
    m_affinity.assertHere();
    FrameRef due;
    {
        const std::lock_guard lock(m_mutex);
        m_dueTick = std::max(m_dueTick, tick);
        while (!m_queue.empty() && m_queue.front()->pts() <= tick) {
            due = std::move(m_queue.front());
            m_queue.pop_front();
        }
    }
    if (due)
        m_changed.notify_all();
    return due;
}

std::optional<std::int64_t> PictureWorker::nextDue() const
{
    m_affinity.assertHere();
    const std::lock_guard lock(m_mutex);
    return m_queue.empty() ? std::nullopt : std::optional(m_queue.front()->pts());
}

bool PictureWorker::isAhead() const
{
    m_affinity.assertHere();
    const std::lock_guard lock(m_mutex);
    return !m_queue.empty() || m_exhausted;
}

/// With the lock held. One picture, however large, is always decoded ahead.
bool PictureWorker::hasRoom() const
{
    return m_queue.empty() || (m_queue.size() < kAhead && m_queue.size() * m_queue.back()->byteCount() < kAheadBytes);
}

void PictureWorker::loop()
{
    m_inside.assertHere();
    const auto source = VideoSource::open(m_movie, m_cancelled, threadCount());
    for (;;) {
        Request request;
        {
            std::unique_lock lock(m_mutex);
            const auto hasWork = [&] {
                return *m_cancelled || m_answered != m_generation
                       || (m_request.plays && m_playedTo != kForever && hasRoom());
            };
            if (m_unrefined)
                m_changed.wait_for(lock, kRest, hasWork);
            else
                m_changed.wait(lock, hasWork);
            if (*m_cancelled)
                return;
            request = m_request;
        }
        if (!source) {
            give(request, std::nullopt);
        } else if (m_answered != request.generation) {
            answer(*source.value(), request);
        } else if (request.plays) {
            playOn(*source.value(), request);
        } else if (m_unrefined) {
            refine(*source.value(), request);
        }
    }
}

void PictureWorker::answer(VideoSource& source, const Request& request)
{
    m_inside.assertHere();
    const auto want = request.plays ? VideoSource::Want::Played : VideoSource::Want::Any;
    VideoSource::Glimpse glimpse;
    if (!request.plays)
        glimpse = [&](FrameRef frame) { m_arrived(request.generation, std::move(frame), What::Glimpse); };
    const auto shown = source.at(
        request.tick, want, [&] { return isOvertaken(request); }, glimpse);
    if (isOvertaken(request) || *m_cancelled)
        return;
    give(request, shown);
}

void PictureWorker::give(const Request& request, const std::optional<ShownFrame>& shown)
{
    m_inside.assertHere();
    m_answered = request.generation;
    m_unrefined = shown && shown->frame->isReduced();
    m_playedTo = shown ? shown->until : kForever;
    if (m_playedTo == kForever) {
        const std::lock_guard lock(m_mutex);
        m_exhausted = true;
    }
    m_arrived(request.generation, shown ? shown->frame : nullptr, What::Picture);
}

void PictureWorker::refine(VideoSource& source, const Request& request)
{
    m_inside.assertHere();
    const auto shown = source.at(request.tick, VideoSource::Want::Full, [&] { return isOvertaken(request); });
    m_unrefined = false;
    if (!isOvertaken(request))
        m_arrived(request.generation, shown ? shown->frame : nullptr, What::Picture);
}

/// A picture that comes too late is queued all the same: a machine that is too slow for the movie shows what it can.
/// But it is the only one; the next is what was due when it was begun.
void PictureWorker::playOn(VideoSource& source, const Request& request)
{
    m_inside.assertHere();
    std::int64_t tick = m_playedTo;
    {
        const std::lock_guard lock(m_mutex);
        tick = std::max(tick, m_dueTick);
    }
    const auto shown = source.at(tick, VideoSource::Want::Played, [&] { return isOvertaken(request); });
    if (isOvertaken(request) || *m_cancelled)
        return;
    bool tells = false;
    {
        const std::lock_guard lock(m_mutex);
        if (isOvertaken(request))
            return;
        tells = m_queue.empty();
        if (shown)
            m_queue.push_back(shown->frame);
        m_playedTo = shown ? shown->until : kForever;
        m_exhausted = m_playedTo == kForever;
    }
    if (tells)
        m_arrived(request.generation, nullptr, What::Picture);
}

} // namespace ffmpeg
