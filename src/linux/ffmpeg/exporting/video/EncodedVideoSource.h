/// Pictures of a range, all encoded without visible loss: for what cannot be copied. One thread.
///
/// To H.264; those of a high dynamic range to HEVC, with all that the source says of their light.
#pragma once

#include "linux/ffmpeg/bitstream/HdrMetadata.h"
#include "linux/ffmpeg/exporting/TrackSource.h"
#include "linux/ffmpeg/exporting/video/PictureEncoder.h"
#include "linux/ffmpeg/exporting/video/PictureFeed.h"
#include "linux/ffmpeg/exporting/video/PictureLine.h"
#include "linux/ffmpeg/exporting/video/PicturePackets.h"
#include "linux/ffmpeg/exporting/video/PictureScaler.h"

namespace ffmpeg {

class EncodedVideoSource final : public TrackSource {
public:
    /// As SplicedVideoSource::open.
    static base::Result<std::unique_ptr<TrackSource>> open(std::unique_ptr<PicturePackets> packets, std::int64_t start,
                                                           std::int64_t end);

    base::Result<void> describe(AVStream& output) override;
    base::Result<bool> next(AVPacket& packet) override;
    void detach() override;

private:
    /// `picture` is like those that come out.
    EncodedVideoSource(std::unique_ptr<PicturePackets> packets, const AVFrame& picture, std::int64_t start,
                       std::int64_t end);

    base::Result<void> goOn();
    base::Result<void> encode(const DecodedFrame& picture, std::int64_t until);
    base::Result<void> insertHdr(AVPacket& keyframe) const;
    base::Result<void> moveOut();

    std::unique_ptr<PicturePackets> m_packets;
    std::int64_t m_start;
    std::int64_t m_end;
    int m_shownWidth; ///< what is coded can have a column or row more
    int m_shownHeight;
    HdrMetadata m_hdr;
    EncoderRequest m_request;
    PictureScaler m_scaler;
    std::unique_ptr<PictureEncoder> m_encoder;
    std::unique_ptr<PictureFeed> m_feed;
    PictureLine m_line;
    FrameRef m_waiting; ///< decoded; encoded when its end is known
    bool m_ended = false;
};

} // namespace ffmpeg
