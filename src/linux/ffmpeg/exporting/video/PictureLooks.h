/// What decoded pictures look like, for finding them again in a movie that was made of them. Values; any thread.
#pragma once

#include "base/Result.h"
#include "linux/ffmpeg/Libraries.h"

#include <cstdint>
#include <vector>

namespace ffmpeg {

struct PictureLook {
    std::uint64_t hash = 0;         ///< of size, format and every sample
    std::vector<std::uint8_t> dots; ///< a few samples of the first plane, as 8 bits
    bool isDamaged = false;         ///< the decoder said so: what it made up differs from time to time

    static PictureLook of(const AVFrame& picture);
};

/// Whether one is made of the other by an encoder that loses little.
bool areAlike(const PictureLook& a, const PictureLook& b);

/// Packets that need none before them, in the order of decoding. What cannot be decoded is left out.
base::Result<std::vector<PictureLook>> looksOf(const AVCodecParameters& parameters,
                                               const std::vector<Owned<AVPacket>>& packets);

} // namespace ffmpeg
