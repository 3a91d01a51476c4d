/// Joins copied packets with encoded ones of the same codec under one header. One thread at a time.
#pragma once

#include "base/Result.h"
#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/exporting/Detachable.h"
#include "linux/ffmpeg/exporting/video/PictureEncoder.h"

#include <memory>

namespace ffmpeg {

class Splicer : public Detachable {
public:
    /// For the stream's codec. The error says why its packets cannot be copied, or not be joined with others.
    /// `picture` is one of the stream's.
    static base::Result<std::unique_ptr<Splicer>> make(const AVStream& stream, const AVFrame& picture);

    /// Whether nothing before this keyframe is needed for what follows it, and none of that is shown before it.
    virtual bool isJoint(const AVPacket& keyframe) const = 0;
    /// Whether the former can be said of it, and what follows it and is shown before it can be left out.
    virtual bool isOpenJoint(const AVPacket& /*keyframe*/) const { return false; }
    /// How many more pictures this packet decodes for showing them later than it shows that were decoded before.
    virtual int picturesHeldBack(const AVPacket& /*packet*/) const { return 0; }
    /// Whether it holds one field of a picture, and the next packet the other.
    virtual bool holdsHalf(const AVPacket& /*packet*/) const { return false; }
    /// How far the stream says that its pictures are reordered; 0 when it does not.
    virtual int reorderDepth() const { return 0; }
    /// Whether the stream says that its pictures are shown in the order of decoding.
    virtual bool showsInOrder() const { return false; }

    /// Whether it must see every packet that will be copied before the header is known.
    virtual bool wantsToSee() const { return false; }
    virtual void see(const AVPacket& /*copied*/) {}

    /// Completes what the pictures beside the copied ones are encoded with. Its format may become another that holds the
    /// same.
    virtual base::Result<void> prepare(EncoderRequest& request, int reorderDepth) = 0;
    /// The encoder is open: its header joins the stream's. Called once, and only when something is encoded.
    virtual base::Result<void> join(const AVCodecContext& encoder) = 0;
    /// The output's header: `parameters` are the stream's.
    virtual base::Result<void> describe(AVCodecParameters& parameters) = 0;

    // What becomes of packets. They keep their times.
    /// An open joint becomes a joint. The pictures that are shown before it are not copied. Comes before adoptCopied().
    virtual base::Result<void> close(AVPacket& /*openJoint*/) { return {}; }
    virtual base::Result<void> adoptCopied(AVPacket& packet) = 0;
    virtual base::Result<void> adoptEncoded(AVPacket& packet) = 0;
};

} // namespace ffmpeg
