/// Joins H.264 with what x264 encodes: its parameter sets get an id of their own, and stand beside the stream's. They must
/// agree with those in all that decoders keep from one to the other: h264::Sps says what that is.
#pragma once

#include "linux/ffmpeg/bitstream/H264Headers.h"
#include "linux/ffmpeg/exporting/video/Splicer.h"

#include <set>

namespace ffmpeg {

class H264Splicer final : public Splicer {
public:
    static base::Result<std::unique_ptr<Splicer>> make(const AVStream& stream);

    bool isJoint(const AVPacket& keyframe) const override;
    bool holdsHalf(const AVPacket& packet) const override;
    int reorderDepth() const override;
    bool showsInOrder() const override;
    bool wantsToSee() const override
    {
        assertHere();
        return m_header.pps.size() > 1 || m_header.sps.size() > 1;
    }
    void see(const AVPacket& copied) override;
    base::Result<void> prepare(EncoderRequest& request, int reorderDepth) override;
    base::Result<void> join(const AVCodecContext& encoder) override;
    base::Result<void> describe(AVCodecParameters& parameters) override;
    base::Result<void> adoptCopied(AVPacket& packet) override;
    base::Result<void> adoptEncoded(AVPacket& packet) override;

private:
    H264Splicer() = default;

    std::vector<ByteView> unitsIn(const AVPacket& packet) const;
    bool isKnown(ByteView set) const;
    const h264::Sps& spsOf(ByteView slice) const;
    h264::Configuration usedSets() const;

    h264::Configuration m_header;
    bool m_hasStartCodes = false;
    std::vector<h264::Sps> m_sps;
    std::set<std::uint32_t> m_usedPps; ///< empty when nobody looked
    h264::Configuration m_used;        ///< when pictures are encoded: the sets of those that are copied
    h264::Sps::Restriction m_restriction{0, 1};
    std::vector<Bytes> m_encoderSps;
    std::vector<Bytes> m_encoderPps;
};

} // namespace ffmpeg
