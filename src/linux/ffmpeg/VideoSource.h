/// Gives the picture that is visible at any tick of a movie, with as little decoding as possible. One thread.
///
/// Decoding goes on where it stands whenever the tick lies ahead and no keyframe is nearer. Far before the tick, pictures
/// that no other refers to are left out. What is passed near it is cached as it is; while the ticks move about a place,
/// as under a finger, all that is passed is cached, so that each group of pictures is decoded once or twice.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/FrameCache.h"
#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/VideoDecoder.h"

#include <cstdint>
#include <functional>
#include <limits>
#include <memory>
#include <optional>

namespace ffmpeg {

class VideoSource {
public:
    /// `movie` has pictures.
    static base::Result<std::unique_ptr<VideoSource>> open(std::shared_ptr<const Movie> movie, Cancelled cancelled,
                                                           int threads);

    enum class Want {
        Any,   ///< a picture that was reduced will do: a finger moves
        Full,  ///< only a full one: the finger rests, and may go on
        Played ///< a full one, and next the one behind it
    };

    using Stopped = std::function<bool()>;
    using Glimpse = std::function<void(FrameRef)>;

    /// The last picture at or before `tick`; before all pictures, the first. Nothing when `stopped` said so (it is asked
    /// between packets), or when the movie gives no picture. What takes long gives `glimpse` one or two other pictures on
    /// the way: the nearest that is at hand, and the one from which decoding starts.
    std::optional<ShownFrame> at(std::int64_t tick, Want want, const Stopped& stopped, const Glimpse& glimpse = {});

    const FrameCache& cache() const { return m_cache; }
    /// Pictures decoded so far, for tests and measurements.
    std::int64_t decodedCount() const { return m_decodedCount; }

private:
    static constexpr std::int64_t kNever = std::numeric_limits<std::int64_t>::min();

    VideoSource(std::shared_ptr<const Movie> movie, std::unique_ptr<Demuxer> demuxer,
                std::unique_ptr<VideoDecoder> decoder, Cancelled cancelled);

    void plan(std::int64_t tick, std::int64_t before, Want want, bool isCached);
    bool goesOnTo(std::int64_t tick) const;
    std::optional<std::int64_t> keyframeBefore(std::int64_t tick) const;
    void seek(std::int64_t tick);
    void seekFarther();
    void decodeSome();
    void advance();

    std::shared_ptr<const Movie> m_movie;
    VideoTrack m_track;
    std::unique_ptr<Demuxer> m_demuxer;
    std::unique_ptr<VideoDecoder> m_decoder;
    Cancelled m_cancelled;
    Owned<AVPacket> m_packet;
    std::shared_ptr<const PacketIndex> m_index; ///< where the file has no table of its own
    std::optional<std::int64_t> m_tableLag;     ///< known once it is needed
    FrameCache m_cache;

    FrameRef m_current; ///< the last picture that came out, but one
    FrameRef m_next;    ///< the one behind it: known, so that the end of `m_current` is
    bool m_positioned = false;
    bool m_fromStart = false; ///< the first picture since the seek is the movie's first
    bool m_awaitsKeyframe = false;
    bool m_finishing = false;
    bool m_ended = false;
    std::int64_t m_soughtTick = 0;
    std::int64_t m_stepBack = 0;
    std::int64_t m_decodedCount = 0;

    // How far before a tick pictures are wanted too, in ticks: at a new place, and where a finger moves; and how far it
    // can go at once and still be moving about a place.
    std::int64_t m_shortReach = 0;
    std::int64_t m_longReach = 0;
    std::int64_t m_stride = 0;
    // The same for the tick that is looked for, and what is to be kept.
    std::optional<std::int64_t> m_lastTick;
    std::int64_t m_focus = 0;
    FrameCache::Overflow m_overflow = FrameCache::Overflow::Drop;
    std::int64_t m_skipBefore = kNever;
    std::int64_t m_skippedTo = kNever; ///< up to here pictures can be missing
    base::Affinity m_affinity = base::Affinity::detached();
};

} // namespace ffmpeg
