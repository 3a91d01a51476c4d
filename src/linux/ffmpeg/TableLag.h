/// How much earlier than they are shown a movie's own table says that keyframes come: in MP4 it has the times of decoding,
/// which lie before those of showing where pictures are reordered. (Seeking knows that; looking into the table does not.)
#pragma once

#include "linux/ffmpeg/Demuxer.h"

#include <cstdint>

namespace ffmpeg {

/// In ticks of the picture stream, the only one that `demuxer` reads; `origin` is where it begins. Moves the reader.
inline std::int64_t tableLag(Demuxer& demuxer, int stream, std::int64_t origin)
{
    demuxer.seek(stream, origin); // some read their table only when they need it
    const auto first = newPacket();
    if (demuxer.read(*first) != 0 || !demuxer.isMov() || first->pts == AV_NOPTS_VALUE || first->dts == AV_NOPTS_VALUE)
        return 0;
    return first->pts > first->dts ? first->pts - first->dts : 0;
}

} // namespace ffmpeg
