/// Encodes pictures. One thread, but the encoder uses more.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "linux/ffmpeg/Libraries.h"

#include <cstdint>
#include <deque>
#include <map>
#include <memory>
#include <optional>
#include <string>

namespace ffmpeg {

/// Values of "crf" between which an encoder can be asked for the quality that a source deserves: DeservedQuality.h.
struct QualityScale {
    int finest;
    int trial;
    int coarsest;
    int stepsAHalf; ///< coarser by so many it makes about half of the bytes
};

/// What comes out. Everything is as in the source, unless a codec cannot do that.
struct EncoderRequest {
    std::string encoder; ///< as FFmpeg calls it
    AVPixelFormat format = AV_PIX_FMT_YUV420P;
    int width = 0;
    int height = 0;
    AVRational timeBase{1, 90000};
    AVRational frameRate{30, 1}; ///< encoders choose levels and budgets by it; a time base misleads them
    AVRational aspect{0, 1};
    AVColorRange range = AVCOL_RANGE_UNSPECIFIED;
    AVColorPrimaries primaries = AVCOL_PRI_UNSPECIFIED;
    AVColorTransferCharacteristic transfer = AVCOL_TRC_UNSPECIFIED;
    AVColorSpace matrix = AVCOL_SPC_UNSPECIFIED;
    AVChromaLocation chroma = AVCHROMA_LOC_UNSPECIFIED;
    bool isInterlaced = false;
    int profile = FF_PROFILE_UNKNOWN;
    int keyframeInterval = 0; ///< pictures; 0 for one group
    int threads = 0;          ///< as many as there are cores
    std::map<std::string, std::string> options;
    std::optional<QualityScale> scale; ///< nothing where the options say all

    /// The source's picture in all that is not the encoder's own: size, format, colours, aspect, rate.
    static EncoderRequest like(const AVStream& stream, const AVFrame& picture, AVRational timeBase);
};

class PictureEncoder {
public:
    static base::Result<std::unique_ptr<PictureEncoder>> open(const EncoderRequest& request);

    /// The header of what comes out; known from the start.
    const AVCodecContext& context() const
    {
        m_affinity.assertHere();
        return *m_context;
    }
    /// `pts` grows from picture to picture. Pictures are as the request says.
    base::Result<void> encode(const AVFrame& picture, std::int64_t pts, std::int64_t duration);
    /// Nothing more is encoded; the rest comes out.
    base::Result<void> finish();
    /// Null when there is none at the moment.
    Owned<AVPacket> take();
    /// What its owner calls last before another thread goes on with it.
    void detach() { m_affinity.detach(); }

private:
    explicit PictureEncoder(Owned<AVCodecContext> context) : m_context(std::move(context)) {}
    base::Result<void> drain();

    base::Affinity m_affinity;
    Owned<AVCodecContext> m_context;
    std::deque<Owned<AVPacket>> m_packets;
    std::deque<std::pair<std::int64_t, std::int64_t>> m_durations; ///< by pts, of what is inside
};

} // namespace ffmpeg
