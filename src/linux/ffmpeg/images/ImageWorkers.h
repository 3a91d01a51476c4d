/// The threads that make an image generator's pictures. Made and asked on one thread, the main queue's; cancelled and
/// destroyed anywhere.
///
/// Each has a decoder of one thread, which was faster for many groups of pictures than one decoder of many threads; only
/// when all that waits lies in one group, one decoder takes all processors. A group is given to one thread, and what is
/// asked for in it is answered in order, also what comes while it is under way.
#pragma once

#include "base/Affinity.h"
#include "base/Queue.h"
#include "linux/ffmpeg/images/PictureWalk.h"
#include "platform/media/ImageGenerator.h"

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <thread>
#include <vector>

namespace ffmpeg {

class ImageWorkers {
public:
    using Handler = platform::ImageGenerator::Handler;

    struct Request {
        base::MediaTime time;
        base::Size maximumSize;
        std::shared_ptr<const Handler> handler; ///< may die on any thread
    };

    /// All requests fail with the error, when there is no movie. `niceness` is added to the threads' own.
    ImageWorkers(base::Result<std::shared_ptr<const Movie>> movie, int niceness);
    /// Waits for the threads, which end soon after cancel().
    ~ImageWorkers();
    /// Waits for a handler that runs, if one does; then no other will.
    void cancel();

    void add(std::vector<Request> requests);
    /// Pictures decoded so far, for tests and measurements.
    std::int64_t decodedCount() const { return m_decodedCount; }

private:
    struct Worker {
        std::unique_ptr<PictureWalk> walk;
        base::ErrorRef error; ///< why there is no walk
        std::optional<std::int64_t> group;
        std::int64_t tick = 0; ///< of the latest request
        std::thread thread;
    };
    struct Job {
        Request request;
        std::int64_t tick;
        int threads;
        PictureWalk::Then then;
    };
    using Waiting = std::multimap<std::int64_t, Request>; ///< by tick

    std::int64_t tickOf(base::MediaTime time) const;
    std::size_t workerLimit() const;
    void work(Worker& worker);
    std::optional<Job> next(Worker& worker);
    std::optional<Waiting::iterator> choose(Worker& worker);
    bool isOthers(const Worker& worker, std::int64_t group) const;
    bool allLieIn(const Worker& worker, std::int64_t group) const;
    void make(Worker& worker, const Job& job);
    void answer(const Request& request, const FrameRef& frame, const base::ErrorRef& error);

    base::Affinity m_affinity; ///< of who asks
    const base::Result<std::shared_ptr<const Movie>> m_movie;
    const int m_niceness;
    const std::shared_ptr<std::atomic<bool>> m_cancelled = std::make_shared<std::atomic<bool>>(false);
    std::atomic<std::int64_t> m_decodedCount{0};

    std::mutex m_calling; ///< held while a handler runs; never together with the other
    std::mutex m_mutex;
    std::condition_variable m_changed;
    Waiting m_waiting;
    std::vector<std::unique_ptr<Worker>> m_workers;
};

} // namespace ffmpeg
