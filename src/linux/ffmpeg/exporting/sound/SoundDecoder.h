/// Decodes the packets of one sound track, giving every sample there is: edit lists and priming are the caller's. One
/// thread.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Libraries.h"

#include <cstdint>
#include <memory>

namespace ffmpeg {

class SoundDecoder {
public:
    /// Null when there is none for it.
    static std::unique_ptr<SoundDecoder> open(const AVCodecParameters& parameters, AVRational timeBase);

    /// Null at the end of the track. False when the packet is damaged.
    bool send(const AVPacket* packet);
    /// The next frame, or null: send more.
    const AVFrame* receive();

    /// How many samples the file says do not belong to the sound at this frame's end.
    static int surplusOf(const AVFrame& frame);
    /// What its owner calls last before another thread goes on with it.
    void detach() { m_affinity.detach(); }

private:
    explicit SoundDecoder(Owned<AVCodecContext> context) : m_context(std::move(context)), m_frame(newFrame()) {}

    base::Affinity m_affinity;
    Owned<AVCodecContext> m_context;
    Owned<AVFrame> m_frame;
    std::int64_t m_expected = AV_NOPTS_VALUE; ///< when the next frame begins
};

} // namespace ffmpeg
