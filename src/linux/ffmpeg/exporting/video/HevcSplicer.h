/// Joins HEVC with what x265 encodes: its parameter sets are given numbers of their own, and stand beside the stream's. They
/// must agree with those in what hevc::Sps says.
#pragma once

#include "linux/ffmpeg/bitstream/HevcHeaders.h"
#include "linux/ffmpeg/exporting/video/Splicer.h"

#include <set>

namespace ffmpeg {

/// Its packets and its header have start codes; the muxer makes lengths of them.
class HevcSplicer final : public Splicer {
public:
    static base::Result<std::unique_ptr<Splicer>> make(const AVStream& stream, const AVFrame& picture);

    bool isJoint(const AVPacket& keyframe) const override;
    bool isOpenJoint(const AVPacket& keyframe) const override;
    int reorderDepth() const override;
    bool showsInOrder() const override
    {
        assertHere();
        return reorderDepth() == 0;
    }
    bool wantsToSee() const override
    {
        assertHere();
        return m_header.sets.size() > 3;
    }
    void see(const AVPacket& copied) override;
    base::Result<void> prepare(EncoderRequest& request, int reorderDepth) override;
    base::Result<void> join(const AVCodecContext& encoder) override;
    base::Result<void> describe(AVCodecParameters& parameters) override;
    base::Result<void> close(AVPacket& openJoint) override;
    base::Result<void> adoptCopied(AVPacket& packet) override;
    base::Result<void> adoptEncoded(AVPacket& packet) override;

private:
    HevcSplicer() = default;

    std::vector<ByteView> unitsIn(const AVPacket& packet) const;
    std::vector<Bytes> usedSets() const;
    void insertHdr(std::vector<ByteView>& units) const;

    hevc::Configuration m_header;
    std::set<std::uint32_t> m_usedPps; ///< empty when nobody looked
    std::vector<hevc::Sps> m_used;     ///< when pictures are encoded: of those that are copied
    hevc::Ids m_ids;                   ///< the encoder's
    std::vector<Bytes> m_encoderSets;
    Bytes m_hdrUnit; ///< stands in each keyframe; empty when the movie says nothing
};

} // namespace ffmpeg
