/// The thread of a player that decodes pictures: one at rest, or a few ahead of the time that is played.
///
/// Each request carries a generation; a newer request overtakes an older one between two packets. Asked by the thread
/// that made it; cancelled and destroyed on any.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/VideoSource.h"

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <thread>

namespace ffmpeg {

class PictureWorker {
public:
    /// Called on the worker's thread with the picture that a request asked for (null when there is none), and while
    /// playing with null whenever pictures have come to an empty queue, or no more will come. A glimpse is a picture of
    /// another moment, to be shown until the one that was asked for comes.
    enum class What { Picture, Glimpse };
    using Arrived = std::function<void(std::uint64_t generation, FrameRef frame, What what)>;

    PictureWorker(std::shared_ptr<const Movie> movie, Arrived arrived);
    /// Waits for the thread, which ends soon after cancel().
    ~PictureWorker();
    /// Nothing arrives any more that was not on its way.
    void cancel();

    /// Gives the picture at `tick`: whatever is at hand at once, and a full one when no other request follows.
    void show(std::uint64_t generation, std::int64_t tick);
    /// Gives the full picture at `tick`, then queues those behind it.
    void play(std::uint64_t generation, std::int64_t tick);

    /// The latest queued picture at or before `tick`; it and those before it leave the queue. Null when there is none.
    /// From now on pictures that are over by `tick` are not looked for: who is late goes straight to what is due.
    FrameRef takeDue(std::int64_t tick);
    /// When the next queued picture is due.
    std::optional<std::int64_t> nextDue() const;
    /// Whether a picture is queued, or none is left to be.
    bool isAhead() const;

private:
    /// Pictures, and bytes, that are decoded ahead of the time that is played: two at 3840 × 2160.
    static constexpr std::size_t kAhead = 8;
    static constexpr std::size_t kAheadBytes = 24u << 20;

    struct Request {
        std::uint64_t generation = 0;
        std::int64_t tick = 0;
        bool plays = false;
    };

    void loop();
    void answer(VideoSource& source, const Request& request);
    void give(const Request& request, const std::optional<ShownFrame>& shown);
    void refine(VideoSource& source, const Request& request);
    void playOn(VideoSource& source, const Request& request);
    void request(std::uint64_t generation, std::int64_t tick, bool plays);
    bool hasRoom() const;
    bool isOvertaken(const Request& request) const { return m_generation.load() != request.generation; }

    base::Affinity m_affinity; ///< of who asks
    const std::shared_ptr<const Movie> m_movie;
    const Arrived m_arrived;
    const std::shared_ptr<std::atomic<bool>> m_cancelled = std::make_shared<std::atomic<bool>>(false);

    mutable std::mutex m_mutex;
    std::condition_variable m_changed;
    std::atomic<std::uint64_t> m_generation{0};
    Request m_request;
    std::deque<FrameRef> m_queue;
    std::int64_t m_dueTick = 0; ///< what is played has come so far
    bool m_exhausted = false;   ///< no more pictures come to the queue

    // The thread's own.
    base::Affinity m_inside = base::Affinity::detached();
    std::uint64_t m_answered = 0;
    bool m_unrefined = false;    ///< what was given is reduced
    std::int64_t m_playedTo = 0; ///< the tick from which the next queued picture is visible

    std::thread m_thread;
};

} // namespace ffmpeg
