/// What assets, items and players of one framework share: the system, the worker that opens movies, the open movies.
#pragma once

#include "base/System.h"
#include "linux/ffmpeg/FFmpegMediaFramework.h"
#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/exporting/output/OutputClaims.h"

#include <map>
#include <memory>
#include <mutex>
#include <string>

namespace ffmpeg {

struct Engine {
    Engine(const base::System& theSystem, runtime::NotificationCenter& theCenter, Options theOptions)
        : system(theSystem), center(theCenter), options(std::move(theOptions))
    {
    }

    /// The movie behind a path as URLs name it. On the opener only.
    base::Result<std::shared_ptr<Movie>> open(const std::string& path, const Cancelled& cancelled);

    /// Lets go of a worker that was told to stop, without waiting for it. Main queue.
    template <typename T> void retire(std::unique_ptr<T> worker)
    {
        if (worker)
            reaper.post([worker = std::shared_ptr<T>(std::move(worker))]() mutable { worker.reset(); });
    }

    const base::System& system;
    runtime::NotificationCenter& center;
    const Options options;
    OutputClaims outputs;

private:
    std::map<std::string, std::weak_ptr<Movie>> m_movies; ///< by resolved path

public:
    base::WorkerQueue reaper;
    base::WorkerQueue opener;
};

} // namespace ffmpeg
