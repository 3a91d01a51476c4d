/// Pictures of a range, copied but for those that the cuts break. One thread.
#pragma once

#include "linux/ffmpeg/exporting/TrackSource.h"
#include "linux/ffmpeg/exporting/video/PictureEncoder.h"
#include "linux/ffmpeg/exporting/video/PictureFeed.h"
#include "linux/ffmpeg/exporting/video/PictureLine.h"
#include "linux/ffmpeg/exporting/video/PicturePackets.h"
#include "linux/ffmpeg/exporting/video/PictureScaler.h"
#include "linux/ffmpeg/exporting/video/Splicer.h"

#include <functional>
#include <optional>
#include <string>

namespace ffmpeg {

class SplicedVideoSource final : public TrackSource {
public:
    using TellLog = std::function<void(const std::string&)>;

    /// `end` is where the range ends in ticks of the output on the movie's time line, or behind all pictures.
    /// Where nothing can be copied the error says why: see CannotCopy.h.
    static base::Result<std::unique_ptr<TrackSource>> open(std::unique_ptr<PicturePackets> packets, std::int64_t start,
                                                           std::int64_t end, TellLog log);

    base::Result<void> describe(AVStream& output) override;
    /// May still find that the packets cannot be copied.
    base::Result<bool> next(AVPacket& packet) override;
    base::Result<std::vector<Joint>> joints() override
    {
        assertHere();
        return m_witness.joints();
    }
    void detach() override;

private:
    enum class State { Head, Copy, Tail, Ended };

    SplicedVideoSource(std::unique_ptr<PicturePackets> packets, std::unique_ptr<Splicer> splicer, VideoPlan plan,
                       std::int64_t start, std::int64_t end, TellLog log);

    base::Result<void> findInterruptions();
    base::Result<void> prepareEncoder();
    base::Result<void> showToSplicer();
    base::Result<void> goOn();
    base::Result<void> beginStretch(State state);
    base::Result<void> encodeSome();
    base::Result<void> encode(const AVFrame& picture, std::int64_t pts);
    base::Result<void> copyOne();
    base::Result<void> leap();
    bool isFirstCopied(const AVPacket& packet) const;
    bool isBehindCopied(const AVPacket& packet) const;
    base::Result<void> endCopying(bool isExpected);
    base::Result<void> openEncoder();

    std::unique_ptr<PicturePackets> m_packets;
    std::unique_ptr<Splicer> m_splicer;
    VideoPlan m_plan; ///< of a gap that was reached on the way, from there on
    std::int64_t m_start;
    std::int64_t m_end;
    TellLog m_log;

    AVPixelFormat m_format; ///< of the source's pictures
    EncoderRequest m_request;
    std::vector<std::uint8_t> m_encoderHeader; ///< the same in each stretch
    std::unique_ptr<PictureEncoder> m_encoder;
    std::optional<PictureScaler> m_packer; ///< where the encoder wants the same in another format
    std::unique_ptr<PictureFeed> m_feed;
    std::int64_t m_lastEncoded;
    std::unique_ptr<PictureLine> m_line;
    State m_state = State::Head;
    bool m_hasReachedJoint = false;          ///< decoding the head
    bool m_isPastJoint = false;              ///< copying
    std::int64_t m_lastDts = AV_NOPTS_VALUE; ///< of what was copied, in the stream's ticks
    JointWitness m_witness;
    Owned<AVPacket> m_copied; ///< where copying begins, when it was read already
};

} // namespace ffmpeg
