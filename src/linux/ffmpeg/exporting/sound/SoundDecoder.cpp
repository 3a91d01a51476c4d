#include "linux/ffmpeg/exporting/sound/SoundDecoder.h"

extern "C" {
#include <libavutil/intreadwrite.h>
}

namespace ffmpeg {

std::unique_ptr<SoundDecoder> SoundDecoder::open(const AVCodecParameters& parameters, AVRational timeBase)
{
    const AVCodec* codec = avcodec_find_decoder(parameters.codec_id);
    if (!codec)
        return nullptr;
    Owned<AVCodecContext> context(avcodec_alloc_context3(codec));
    context->thread_count = 1;
    if (avcodec_parameters_to_context(context.get(), &parameters) < 0)
        return nullptr;
    context->pkt_timebase = timeBase;
    context->flags2 |= AV_CODEC_FLAG2_SKIP_MANUAL;
    if (avcodec_open2(context.get(), codec, nullptr) < 0)
        return nullptr;
    return std::unique_ptr<SoundDecoder>(new SoundDecoder(std::move(context)));
}

bool SoundDecoder::send(const AVPacket* packet)
{
    m_affinity.assertHere();
    const int result = avcodec_send_packet(m_context.get(), packet);
    return result >= 0 || result == AVERROR_EOF;
}

const AVFrame* SoundDecoder::receive()
{
    m_affinity.assertHere();
    if (avcodec_receive_frame(m_context.get(), m_frame.get()) < 0)
        return nullptr;
    AVFrame& frame = *m_frame;
    // What WMA holds back to the very end has no packet whose time it could have.
    if (frame.best_effort_timestamp == AV_NOPTS_VALUE)
        frame.best_effort_timestamp = m_expected;
    if (frame.best_effort_timestamp != AV_NOPTS_VALUE && frame.sample_rate > 0)
        m_expected = frame.best_effort_timestamp
                     + av_rescale_q(frame.nb_samples, {1, frame.sample_rate}, m_context->pkt_timebase);
    return &frame;
}

int SoundDecoder::surplusOf(const AVFrame& frame)
{
    const AVFrameSideData* skipped = av_frame_get_side_data(&frame, AV_FRAME_DATA_SKIP_SAMPLES);
    if (!skipped || skipped->size < 8)
        return 0;
    return static_cast<int>(std::min<std::uint32_t>(AV_RL32(skipped->data + 4), INT32_MAX));
}

} // namespace ffmpeg
