/// Joins VP9 and AV1 with what is encoded beside it: their keyframes bring all headers along.
///
/// A keyframe that is shown leaves nothing of what was decoded before: not pictures, nor probabilities, segments, filters'
/// differences, quantisers or films of grain. So nothing of these must agree. What is decoded into (profile, depth,
/// subsampling, size) and what players ask for (matrix, range) does, because the encoder is given pictures of the stream:
/// one that changes any of them on the way is not joined. Two things are not the pictures':
/// - AV1's sequence header (bits of the order of pictures, tools, levels) begins a sequence anew where it differs from the
///   last, so each keyframe that is copied behind others must bring its own.
/// - VP9's size for rendering: decoders pass it by.
#pragma once

#include "linux/ffmpeg/bitstream/Bits.h"
#include "linux/ffmpeg/exporting/video/Splicer.h"

namespace ffmpeg {

class KeyframeSplicer final : public Splicer {
public:
    static base::Result<std::unique_ptr<Splicer>> make(const AVStream& stream, const AVFrame& picture);

    bool isJoint(const AVPacket& keyframe) const override;
    int picturesHeldBack(const AVPacket& packet) const override;
    /// Browsers' recordings grow on the way, and players make room for what the header says.
    bool wantsToSee() const override
    {
        assertHere();
        return !m_isAv1;
    }
    void see(const AVPacket& copied) override;
    base::Result<void> prepare(EncoderRequest& request, int reorderDepth) override;
    base::Result<void> join(const AVCodecContext& /*encoder*/) override
    {
        assertHere();
        return {};
    }
    base::Result<void> describe(AVCodecParameters& parameters) override;
    base::Result<void> adoptCopied(AVPacket& packet) override;
    base::Result<void> adoptEncoded(AVPacket& packet) override;

private:
    KeyframeSplicer() = default;

    base::Result<void> completeKeyframe(AVPacket& packet) const;

    bool m_isAv1 = false;
    Bytes m_header;   ///< AV1: what a keyframe must start with
    Bytes m_hdrUnits; ///< AV1: what stands behind that; empty when the movie says nothing
    AVPixelFormat m_format = AV_PIX_FMT_NONE;
    int m_width = 0;
    int m_height = 0;
};

} // namespace ffmpeg
