/// The packets of an exported picture track in the order of decoding: gives them their times of decoding and durations.
/// One thread.
///
/// The i-th packet is decoded when the (i - depth)-th picture is shown: so times of decoding grow, are never behind those
/// of presentation, and need not be known of the source (Matroska does not keep them).
///
/// Keyframes that later pictures look past lead decoders astray where the stream ends or begins anew soon behind them:
/// FFmpeg's loses what it has not given by then. Such are no longer told to be keyframes, so that nobody begins there.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "linux/ffmpeg/Libraries.h"

#include <cstdint>
#include <deque>
#include <functional>
#include <optional>
#include <queue>
#include <vector>

namespace ffmpeg {

class PictureLine {
public:
    /// `step` is a usual picture's duration. No picture lasts longer than up to `end`; the one that is shown at `last`
    /// lasts so long.
    PictureLine(int depth, std::int64_t step, std::optional<std::int64_t> last, std::int64_t end);

    /// The packet's pts is set, and its duration where it is known; `isJoint` when nothing before it is needed for what
    /// follows. Fails when pictures are reordered more than `depth`.
    base::Result<void> push(Owned<AVPacket> packet, bool isJoint);
    /// Nothing more comes. `end` replaces the one that was known before, where the last was not.
    void finish(std::optional<std::int64_t> end = std::nullopt);
    /// False when more must be pushed first, or all have come out.
    bool pop(AVPacket& packet);
    /// What its owner calls last before another thread goes on with it.
    void detach() { m_affinity.detach(); }

private:
    struct Waiting {
        Owned<AVPacket> packet;
        bool isJoint;
    };

    void forgetLateKeyframes();

    base::Affinity m_affinity;
    int m_depth;
    std::int64_t m_step;
    std::optional<std::int64_t> m_last;
    std::int64_t m_end;
    std::deque<Waiting> m_packets;
    std::size_t m_followers; ///< that a keyframe needs
    std::priority_queue<std::int64_t, std::vector<std::int64_t>, std::greater<>> m_pending;
    std::int64_t m_count = 0;
    std::int64_t m_first = 0;
    std::int64_t m_lastDts = 0;
    bool m_finished = false;
};

} // namespace ffmpeg
