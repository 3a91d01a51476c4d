/// Turns packets of a picture stream into pictures, in order of presentation. One thread at a time.
///
/// Damaged packets are passed over: there are fewer pictures then, or such with flaws, never an error.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "linux/ffmpeg/DecodedFrame.h"
#include "linux/ffmpeg/HardwareDevice.h"
#include "linux/ffmpeg/VideoTrack.h"

#include <memory>

namespace ffmpeg {

class VideoDecoder {
public:
    /// A file can show less of its pictures than their stream would.
    enum class Size { OfFile, OfStream };

    /// `hardware` can be null.
    static base::Result<std::unique_ptr<VideoDecoder>> open(const AVStream& stream, const VideoTrack& track,
                                                            int threads, const HardwareDevice* hardware = nullptr,
                                                            Size size = Size::OfFile);

    void send(const AVPacket& packet);
    /// No packet comes any more: the pictures that are still inside come out.
    void finish();
    /// The next picture; null when more packets are needed, or all have come out.
    FrameRef receive();
    /// Forgets everything: the next packet is one of another place.
    void flush();
    /// Leaves out pictures that no other picture refers to. For packets sent from now on.
    void setSkipsUnreferenced(bool skips);
    /// Makes up what is missing of a picture, which is slow. For packets sent from now on, if it canLeaveGaps(); decoders
    /// of several threads always do.
    void setMendsGaps(bool mends);
    bool canLeaveGaps() const
    {
        m_affinity.assertHere();
        return m_context->thread_count == 1;
    }
    /// What its owner calls last before another thread goes on with it.
    void detach() { m_affinity.detach(); }

private:
    VideoDecoder(Owned<AVCodecContext> context, const VideoTrack& track);

    base::Affinity m_affinity;
    Owned<AVCodecContext> m_context;
    Owned<AVFrame> m_frame;
    VideoTrack m_track;
    std::int64_t m_lastPts = AV_NOPTS_VALUE;
    std::int64_t m_firstKeyframe = AV_NOPTS_VALUE; ///< since the last flush
    std::int64_t m_step = 1;                       ///< between the last two pictures: for one that has no time
};

} // namespace ffmpeg
