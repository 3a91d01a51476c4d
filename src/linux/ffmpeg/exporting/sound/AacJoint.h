/// Makes AAC packets that take the place of those at an edge of a cut, hold nothing from beyond it, and join the copied
/// ones without a seam. One thread.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/exporting/sound/AacFrame.h"
#include "linux/ffmpeg/exporting/sound/SampleSource.h"

#include <cstdint>
#include <optional>
#include <vector>

namespace ffmpeg {

/// A packet of AAC and what it decodes to.
struct AacPiece {
    Owned<AVPacket> packet;
    std::int64_t at = 0; ///< where its samples begin, in samples of the movie
    Planes sound;        ///< kAacFrame samples of each channel; what lies beyond the edge is silenced
};

struct AacJoint {
    std::vector<Owned<AVPacket>> encoded;
    std::size_t copied = 0; ///< the piece next to them that is copied: the first one, or the last one
};

class AacJoints {
public:
    explicit AacJoints(const AVCodecParameters& parameters);

    /// Packets in the place of those before `first` + n, for a cut within `first`: one before `first`, which decoders
    /// need to start, and so many as it takes to a place where both sides fit. Nothing when there is no such place.
    std::optional<AacJoint> atStart(const std::vector<AacPiece>& pieces, std::size_t first) const;
    /// Packets in the place of those up to `last`, for a cut within or at the end of `last`.
    std::optional<AacJoint> atEnd(const std::vector<AacPiece>& pieces, std::size_t last) const;

    /// All pieces decoded; what is damaged is silent. False when the stream is not what its header says.
    static bool decode(const AVCodecParameters& parameters, std::vector<AacPiece>& pieces);

private:
    using Frames = std::vector<Planes>;
    /// Frame i of `frames` is that of piece `start` + i; gives the packets of the pieces from `from` up to `until`.
    std::optional<std::vector<Owned<AVPacket>>> encode(const Frames& frames, std::ptrdiff_t start, std::ptrdiff_t from,
                                                       std::ptrdiff_t until) const;
    Frames framesOf(const std::vector<AacPiece>& pieces, std::ptrdiff_t from, std::ptrdiff_t until) const;
    /// Whether the packets in the place of those from `from` on decode to the same sound. The cut is in frame `edge`,
    /// the joint in frame `seam`; what we encoded lies between. `isKnown`: the windows are seen to fit.
    bool isSeamless(const std::vector<const AVPacket*>& packets, const std::vector<AacPiece>& pieces,
                    std::ptrdiff_t from, std::ptrdiff_t edge, std::ptrdiff_t seam, bool isKnown) const;

    base::Affinity m_affinity;
    const AVCodecParameters& m_parameters;
    std::size_t m_channels;
};

} // namespace ffmpeg
