/// The pictures of an exported movie.
#pragma once

#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/exporting/TrackSource.h"

#include <functional>
#include <memory>
#include <string>

namespace ffmpeg {

enum class VideoMode {
    Copy,  ///< encoded again only what the cuts break; an error that saysCannotCopy() where that is not possible
    Encode ///< all of it
};

/// The range's pictures, as a track. `movie` has pictures. `log` is called on the threads of this and of next().
base::Result<std::unique_ptr<TrackSource>> openVideoSource(std::shared_ptr<const Movie> movie, const ExportRange& range,
                                                           VideoMode mode, const Cancelled& cancelled,
                                                           std::function<void(const std::string&)> log);

} // namespace ffmpeg
