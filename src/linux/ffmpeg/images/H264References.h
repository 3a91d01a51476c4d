/// Tells which pictures of an H.264 stream each picture refers to, before anything is decoded. One thread.
///
/// Encoders mark pictures as references that only their neighbours refer to: who wants none of those can do without. What
/// is dropped so must be replaced by something that decodes in no time, because a decoder counts its references.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/bitstream/H264Slices.h"

#include <cstdint>
#include <map>
#include <memory>
#include <vector>

namespace ffmpeg {

class H264References {
public:
    /// A packet's picture. Pictures are numbered as they come.
    struct Picture {
        bool isKnown = false; ///< else nothing else is told
        std::int64_t number = 0;
        h264::Slice slice; ///< the first
        std::uint32_t sps = 0;
        std::vector<std::int64_t> refersTo;
        std::vector<std::int64_t> kept; ///< what later pictures can refer to, this one included

        bool refersToPicture(std::int64_t other) const;
        bool keeps(std::int64_t other) const;
        /// Whether others can refer to it, and it is none that begins anything.
        bool canBeReplaced() const { return isKnown && slice.importance != 0 && slice.kind == h264::Slice::Kind::B; }
    };

    /// Null when it is no such stream, or has a form that files of recorders do not have.
    static std::unique_ptr<H264References> of(const AVCodecParameters& parameters);

    /// The next packet is one of another place: nothing is known until pictures begin that refer to nothing before.
    void restart();
    /// Packets in the order of decoding.
    Picture follow(const AVPacket& packet);
    /// What can be sent in the place of `packet`, which holds `picture`. It is not shown, and but for its beginning it is
    /// missing, unless it `isWhole`. Null when memory ran out.
    Owned<AVPacket> standInFor(const AVPacket& packet, const Picture& picture, bool isWhole) const;

private:
    struct Reference {
        std::int64_t number;
        std::uint32_t frameNum;
        std::int64_t order;
    };

    explicit H264References(h264::Configuration configuration);
    bool readParameters();
    bool isKnownSet(ByteView nal) const;
    bool read(const AVPacket& packet, Picture& picture);
    bool readSlice(ByteView nal, Picture& picture, bool isFirst);
    bool begin(const h264::Slice& slice, const h264::Sps& sps);
    void mark(Picture& picture, const h264::Sps& sps);
    bool addReferences(const h264::Slice& slice, const h264::Sps& sps, Picture& picture) const;
    std::vector<Reference> listOf(const h264::Slice& slice, std::size_t which) const;

    base::Affinity m_affinity;
    h264::Configuration m_configuration;
    std::map<std::uint32_t, h264::Sps> m_sps;
    std::map<std::uint32_t, h264::Pps> m_pps;
    std::uint32_t m_standInId = 0; ///< of parameters: none that the stream uses

    bool m_isKnown = false;
    std::int64_t m_count = 0;
    std::vector<Reference> m_references; ///< the oldest first
    std::uint32_t m_frameNum = 0;        ///< of the latest reference
    std::int64_t m_orderBase = 0;        ///< the same, of the picture order: the high part, and the low one
    std::uint32_t m_orderLow = 0;
    std::int64_t m_order = 0; ///< of the latest picture
};

} // namespace ffmpeg
