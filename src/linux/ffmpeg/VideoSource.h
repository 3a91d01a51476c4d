/// Gives the picture that is visible at any tick of a movie, with as little decoding as possible. One thread.
///
/// Decoding goes on where it stands whenever the tick lies ahead and no keyframe is nearer; what it passes is cached, so
/// that each group of pictures is decoded once, and stepping back finds its pictures there.
#pragma once

#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/FrameCache.h"
#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/VideoDecoder.h"

#include <functional>
#include <memory>
#include <optional>

namespace ffmpeg {

class VideoSource {
public:
    /// `movie` has pictures.
    static base::Result<std::unique_ptr<VideoSource>> open(std::shared_ptr<const Movie> movie, Cancelled cancelled,
                                                           int threads);

    enum class Want { Any, Full }; ///< a picture that was reduced will do; or not

    /// The last picture at or before `tick`; before all pictures, the first. Nothing when `stopped` said so (it is asked
    /// between packets), or when the movie gives no picture.
    std::optional<ShownFrame> at(std::int64_t tick, Want want, const std::function<bool()>& stopped);

    /// Whether pictures that are passed on the way are kept in a reduced form (while scrubbing) or as they are.
    void setReducing(bool reducing) { m_reducing = reducing; }
    const FrameCache& cache() const { return m_cache; }
    /// Pictures decoded so far, for tests and measurements.
    std::int64_t decodedCount() const { return m_decodedCount; }

private:
    static constexpr int kReducedLimit = 960; ///< pixels

    VideoSource(std::shared_ptr<const Movie> movie, std::unique_ptr<Demuxer> demuxer,
                std::unique_ptr<VideoDecoder> decoder, Cancelled cancelled);

    bool goesOnTo(std::int64_t tick) const;
    std::optional<std::int64_t> keyframeBefore(std::int64_t tick) const;
    void seek(std::int64_t tick);
    void seekFarther();
    void decodeSome();
    void advance(std::int64_t focus);

    std::shared_ptr<const Movie> m_movie;
    VideoTrack m_track;
    std::unique_ptr<Demuxer> m_demuxer;
    std::unique_ptr<VideoDecoder> m_decoder;
    Cancelled m_cancelled;
    Owned<AVPacket> m_packet;
    std::shared_ptr<const PacketIndex> m_index; ///< where the file has no table of its own
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
    bool m_reducing = true;
    std::int64_t m_decodedCount = 0;
};

} // namespace ffmpeg
