/// Decodes a stretch of a movie's pictures, for encoding them again. One thread, but the decoder uses more.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/VideoDecoder.h"
#include "linux/ffmpeg/exporting/video/PicturePackets.h"

#include <functional>
#include <memory>

namespace ffmpeg {

class PictureFeed {
public:
    /// A packet that ends the stretch; it is not decoded.
    using IsEnd = std::function<bool(const AVPacket&)>;

    enum class Before { Decode, Skip };
    using Size = VideoDecoder::Size;

    /// Goes to the keyframe before `from`, which is a tick of the output. Pictures before it come out too, but with
    /// Before::Skip only what others need. `packets` lives longer; nobody else reads it before this has ended.
    static base::Result<std::unique_ptr<PictureFeed>> start(PicturePackets& packets, std::int64_t from, Before before,
                                                            Size size, IsEnd isEnd);

    /// The next picture in the order of presentation; null at the end. Packets that were damaged give none.
    base::Result<FrameRef> next();
    /// The packet that ended the stretch; null when the movie did, or before the end.
    Owned<AVPacket> takeEnd()
    {
        m_affinity.assertHere();
        return std::move(m_end);
    }
    /// What its owner calls last before another thread goes on with it.
    void detach();

private:
    PictureFeed(PicturePackets& packets, std::unique_ptr<VideoDecoder> decoder, std::int64_t skipBefore, IsEnd isEnd);

    base::Affinity m_affinity;
    PicturePackets& m_packets;
    std::unique_ptr<VideoDecoder> m_decoder;
    std::int64_t m_skipBefore;
    IsEnd m_isEnd;
    Owned<AVPacket> m_packet;
    Owned<AVPacket> m_end;
    bool m_finished = false;
};

} // namespace ffmpeg
