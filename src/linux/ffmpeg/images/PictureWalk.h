/// Gives the pictures that are visible at rising ticks of a movie, with one decoder that goes forward and never decodes a
/// group of pictures twice on the way. Keeps two pictures and a few packets. One thread.
///
/// A look at the packets ahead tells which pictures nobody will see: those that no other refers to are left out then,
/// however irregular the times are. It also tells when a picture is the last one before a tick.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/VideoDecoder.h"
#include "linux/ffmpeg/images/PacketsAhead.h"

#include <cstdint>
#include <limits>
#include <memory>
#include <optional>
#include <vector>

namespace ffmpeg {

class PictureWalk {
public:
    /// `movie` has pictures.
    static base::Result<std::unique_ptr<PictureWalk>> open(std::shared_ptr<const Movie> movie, Cancelled cancelled);

    /// The same for all ticks whose pictures are decoded from one keyframe; it grows with the ticks.
    std::int64_t groupOf(std::int64_t tick) const;

    enum class Then {
        GoOn, ///< later ticks of the same group are likely
        Rest  ///< none is known: it may cost a new start
    };

    /// The last picture at or before `tick`; before all pictures, the first. Null when it was cancelled, or when the movie
    /// gives none. Ticks may go back, too; that costs a new start at a keyframe.
    FrameRef at(std::int64_t tick, Then then = Then::GoOn);

    /// Whether it goes on to `tick` where it stands, without a new start.
    bool goesOnTo(std::int64_t tick) const;

    int threads() const { return m_threads; }
    /// Of the decoder. Begins anew at a keyframe; on failure all stays as it was.
    void setThreads(int threads);

    /// Pictures decoded so far, for tests and measurements.
    std::int64_t decodedCount() const { return m_decodedCount; }

private:
    static constexpr std::int64_t kNever = std::numeric_limits<std::int64_t>::min();

    PictureWalk(std::shared_ptr<const Movie> movie, std::unique_ptr<Demuxer> demuxer,
                std::unique_ptr<VideoDecoder> decoder, Cancelled cancelled);

    std::optional<std::int64_t> keyframeBefore(std::int64_t tick) const;
    void seek(std::int64_t tick);
    void seekFarther();
    bool isFound(std::int64_t tick) const;
    void decodeSome(std::int64_t tick, Then then);
    void sendFirst(std::int64_t tick);

    std::shared_ptr<const Movie> m_movie;
    VideoTrack m_track;
    std::unique_ptr<Demuxer> m_demuxer;
    std::unique_ptr<VideoDecoder> m_decoder;
    Cancelled m_cancelled;
    std::shared_ptr<const PacketIndex> m_index; ///< where the file has no table of its own
    PacketsAhead m_ahead;
    std::vector<std::int64_t> m_inside; ///< when the pictures are shown that the decoder has and has not given
    bool m_hasUntimed = false;          ///< there is one of which nobody knows
    int m_sentCount = 0;                ///< packets since the seek

    std::int64_t m_tableLag = 0;

    FrameRef m_current; ///< the last picture that came out, but one
    FrameRef m_next;    ///< the one behind it: known, so that the end of `m_current` is
    int m_threads = 1;
    bool m_positioned = false;
    bool m_fromStart = false; ///< nothing lies before the first packet since the seek
    bool m_awaitsKeyframe = false;
    std::int64_t m_keyframe = kNever; ///< what comes before it refers to what was not decoded
    bool m_finishing = false;
    bool m_ended = false;
    std::int64_t m_soughtTick = 0;
    std::int64_t m_stepBack = 0;
    std::int64_t m_decodedCount = 0;
    base::Affinity m_affinity = base::Affinity::detached();
};

} // namespace ffmpeg
