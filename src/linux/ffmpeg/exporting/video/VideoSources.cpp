#include "linux/ffmpeg/exporting/video/VideoSources.h"

#include "linux/ffmpeg/exporting/video/EncodedVideoSource.h"
#include "linux/ffmpeg/exporting/video/SplicedVideoSource.h"

#include <limits>
#include <utility>

namespace ffmpeg {

base::Result<std::unique_ptr<TrackSource>> openVideoSource(std::shared_ptr<const Movie> movie, const ExportRange& range,
                                                           VideoMode mode, const Cancelled& cancelled,
                                                           std::function<void(const std::string&)> log)
{
    const std::int32_t timescale = movie->video()->timescale;
    const std::int64_t start = range.start.convertedTo(timescale).value;
    // Headers round a movie's length: what ends with it has all of its pictures.
    const bool isToEnd = range.end >= movie->duration();
    const std::int64_t end =
        isToEnd ? std::numeric_limits<std::int64_t>::max() / 4 : range.end.convertedTo(timescale).value;
    auto packets = PicturePackets::open(std::move(movie), cancelled);
    if (!packets)
        return packets.error();
    if (mode == VideoMode::Encode)
        return EncodedVideoSource::open(std::move(packets).value(), start, end);
    return SplicedVideoSource::open(std::move(packets).value(), start, end, std::move(log));
}

} // namespace ffmpeg
