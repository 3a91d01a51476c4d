/// Where a movie's pictures are: every packet of its picture stream, by time. Made in one pass over the file; immutable.
#pragma once

#include "linux/ffmpeg/Demuxer.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <vector>

namespace ffmpeg {

struct PacketEntry {
    std::int64_t pts;
    std::int64_t dts;
    std::int64_t duration; ///< 0 when the file does not say
    std::int64_t position; ///< of its bytes in the file; -1 when unknown
    int size;
    bool isKey;
    bool isHidden; ///< decoded but not shown: an edit list left it out
};

class PacketIndex {
public:
    /// Reads `demuxer` from its start to its end. Null when that was cancelled or failed.
    /// `video` is the picture stream, or -1 when only the length is wanted.
    static std::shared_ptr<const PacketIndex> build(Demuxer& demuxer, int video);

    /// In order of presentation.
    const std::vector<PacketEntry>& packets() const { return m_packets; }
    /// The last keyframe at or before `pts`; null when there is none.
    const PacketEntry* keyframeAt(std::int64_t pts) const;
    /// When the picture is shown that is so many behind (before, when negative) the one visible at `tick`; ends clamp.
    /// Nothing without pictures.
    std::optional<std::int64_t> pictureFrom(std::int64_t tick, int count) const;
    /// Where the last packet of any stream ends, in microseconds of the file's own time. Nothing without packets.
    std::optional<std::int64_t> end() const { return m_end; }

private:
    std::vector<PacketEntry> m_packets;
    std::vector<PacketEntry> m_keyframes;
    std::vector<std::int64_t> m_shown; ///< when each picture is shown; none twice
    std::optional<std::int64_t> m_end;
};

} // namespace ffmpeg
