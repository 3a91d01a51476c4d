/// Exports a movie, or a range of it, from the first to the last: what it takes and what happens. `progress` is called on
/// the thread of run(), `log` on others too.
#pragma once

#include "base/Log.h"
#include "linux/ffmpeg/Movie.h"
#include "platform/media/AudioMix.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>

namespace ffmpeg {

struct ExportJob {
    std::shared_ptr<const Movie> movie;
    std::string output; ///< where the file system has it
    std::optional<base::MediaTimeRange> range;
    std::optional<platform::AudioMix> mix;
    Cancelled cancelled;
    std::function<void(double)> progress; ///< from 0 to 1
    base::Log* log = nullptr;

    /// The output is whole under its name, or there is nothing of it. The error names the file.
    base::Result<void> run() const;
};

} // namespace ffmpeg
