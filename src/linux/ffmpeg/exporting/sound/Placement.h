/// Tells where on the movie's time line the packets of a sound track lie, to the sample, although files round their
/// times. One thread.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Libraries.h"

#include <cstdint>
#include <vector>

namespace ffmpeg {

class Placement {
public:
    struct Piece {
        std::int64_t pts;     ///< in the stream's ticks
        std::int64_t samples; ///< how many it holds
    };

    /// Copying follows what the file says up to the rounding of its ticks; decoding smooths timestamps that were taken
    /// from a clock on the wall, because a hole of a few milliseconds would be heard as a click.
    enum class Manner { Copying, Decoding };

    /// `origin` is where the movie begins, in microseconds of the file's time.
    Placement(AVRational timeBase, std::int64_t origin, int rate, Manner manner);

    /// Finds where the first of these begins from the times of all: each was rounded in its own way, so together they
    /// know better.
    void begin(const std::vector<Piece>& pieces);
    bool hasBegun() const
    {
        m_affinity.assertHere();
        return m_hasBegun;
    }
    /// Where this piece begins; pieces come in order. A jump in time is followed.
    std::int64_t place(const Piece& piece);

    /// What the file says, in samples from the movie's start.
    double said(std::int64_t pts) const;
    /// What its owner calls last before another thread goes on with it.
    void detach() { m_affinity.detach(); }

private:
    base::Affinity m_affinity;
    double m_samplesPerTick;
    double m_origin;
    double m_tolerance; ///< samples
    double m_longest;   ///< what is smoothed for a while at most, in samples
    double m_drift = 0;
    bool m_hasBegun = false;
    std::int64_t m_next = 0;
};

/// Packets looked at to find where a track begins.
inline constexpr std::size_t kPiecesToBegin = 32;

} // namespace ffmpeg
