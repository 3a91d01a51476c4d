/// Gives sound as samples, from a start to an end. One thread at a time.
#pragma once

#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/exporting/Detachable.h"

#include <cstddef>
#include <vector>

namespace ffmpeg {

/// Samples by channel.
using Planes = std::vector<std::vector<float>>;

class SampleSource : public Detachable {
public:
    virtual int rate() const = 0;
    virtual int channels() const = 0;
    /// Appends up to `count` samples to each channel and tells how many; fewer only at the end. What cannot be read is
    /// silent; a negative AVERROR where reading was cancelled.
    virtual int read(Planes& into, int count) = 0;
};

} // namespace ffmpeg
