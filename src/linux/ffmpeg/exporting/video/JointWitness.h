/// Remembers what stands on both sides of each joint of an output, for checking it. One thread.
///
/// A joint is where packets of one origin follow those of another, under one header. It is good when whoever decodes
/// across it sees what the source's decoder sees of copied packets, and the encoder's own of encoded ones. A few packets
/// tell: those that a group before the joint begins with, and those behind it. What is left out between them may be,
/// because the joint begins a group that needs none of it; so checking costs the same however long the groups are.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "linux/ffmpeg/exporting/video/PictureLooks.h"

#include <cstdint>
#include <deque>
#include <memory>
#include <vector>

namespace ffmpeg {

struct JointSide {
    std::int64_t firstPacket = 0; ///< of the output's, in the order of decoding
    std::int64_t packets = 0;
    std::vector<PictureLook> looks; ///< of their pictures, decoded by themselves, in the order of presentation
};

struct Joint {
    JointSide before; ///< empty where the output begins
    JointSide after;
};

class JointWitness {
public:
    /// What comes now is the stream's, as it was read, or an encoder's, as it gave it.
    base::Result<void> beginStretch(const AVCodecParameters& parameters);
    base::Result<void> beginStretch(const AVCodecContext& encoder);
    /// A picture that the encoder is given.
    void seePicture(const AVFrame& picture);
    /// The next packet of the output. Times tell the order of presentation alone.
    void seePacket(const AVPacket& packet, bool beginsGroup);

    /// All is written: decodes what was remembered. The error says that an encoder's pictures are not those it was given.
    base::Result<std::vector<Joint>> joints() const;
    /// What its owner calls last before another thread goes on with it.
    void detach() { m_affinity.detach(); }

private:
    struct Group {
        std::int64_t firstPacket = 0;
        std::vector<Owned<AVPacket>> packets;
    };
    struct Parameters {
        AVCodecParameters* get() const { return m_owned.get(); }
        struct Freeing {
            void operator()(AVCodecParameters* parameters) const { avcodec_parameters_free(&parameters); }
        };
        std::unique_ptr<AVCodecParameters, Freeing> m_owned{avcodec_parameters_alloc()};
    };
    struct Stretch {
        Parameters parameters;
        Group first;
        Group last; ///< the last group that began behind the first's beginning
        std::vector<PictureLook> given;
    };

    static void add(Group& group, const AVPacket& packet);
    static base::Result<JointSide> sideOf(const Stretch& stretch, const Group& group);

    base::Affinity m_affinity;
    std::deque<Stretch> m_stretches;
    std::int64_t m_packets = 0;
};

} // namespace ffmpeg
