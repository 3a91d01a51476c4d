/// The picture stream of a movie: where its ticks stand on the movie's time line, and how its pictures are turned.
#pragma once

#include "base/MediaTime.h"
#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/Orientation.h"

#include <cstdint>
#include <limits>

namespace ffmpeg {

struct VideoTrack {
    int stream = -1;
    AVRational timeBase{1, 90000};
    std::int64_t origin = 0; ///< the tick at which the movie begins
    /// Of all times that are reported: the time base's, made finer where it is coarser than 1/600 s.
    std::int32_t timescale = 90000;
    Orientation orientation;
    AVRational aspect{0, 1}; ///< of pixels; 0 leaves it to the pictures

    base::MediaTime timeOf(std::int64_t pts) const
    {
        return base::MediaTime::make((pts - origin) * timeBase.num, timeBase.den).convertedTo(timescale);
    }
    /// The last tick that is not behind `time`.
    std::int64_t tickAt(base::MediaTime time) const
    {
        const AVRational ticks{time.timescale, 1};
        const std::int64_t tick =
            av_rescale_rnd(time.value, timeBase.den, std::int64_t(ticks.num) * timeBase.num, AV_ROUND_DOWN);
        return tick + origin;
    }
};

/// The end of a picture behind which no other comes.
inline constexpr std::int64_t kForever = std::numeric_limits<std::int64_t>::max();

} // namespace ffmpeg
