#include "linux/ffmpeg/VideoDecoder.h"

#include <utility>

namespace ffmpeg {

namespace {

/// Larger pictures are an attack, or nothing that could be shown: 8K is 33 million pixels.
constexpr std::int64_t kMostPixels = 64 << 20;

base::ErrorRef failure(int error, const AVStream& stream)
{
    return base::Error::make("ffmpeg", error,
                             std::string("its pictures (") + avcodec_get_name(stream.codecpar->codec_id)
                                 + ") cannot be decoded: " + textOf(error));
}

} // namespace

VideoDecoder::VideoDecoder(Owned<AVCodecContext> context, const VideoTrack& track)
    : m_context(std::move(context)), m_frame(newFrame()), m_track(track)
{
}

base::Result<std::unique_ptr<VideoDecoder>> VideoDecoder::open(const AVStream& stream, const VideoTrack& track,
                                                               int threads, const HardwareDevice* hardware, Size size)
{
    const AVCodec* codec = avcodec_find_decoder(stream.codecpar->codec_id);
    if (!codec)
        return failure(AVERROR_DECODER_NOT_FOUND, stream);
    Owned<AVCodecContext> context(avcodec_alloc_context3(codec));
    int error = avcodec_parameters_to_context(context.get(), stream.codecpar);
    if (size == Size::OfStream && stream.codecpar->codec_id == AV_CODEC_ID_H264) // others go by their stream anyway
        context->width = context->height = 0;
    context->pkt_timebase = stream.time_base;
    context->thread_count = threads;
    context->thread_type = FF_THREAD_FRAME;
    context->max_pixels = kMostPixels;
    // Behind a keyframe that is no new beginning of the stream the decoder thinks that pictures are damaged until it has
    // given the keyframe; where few follow they would be lost. receive() knows better.
    context->flags |= AV_CODEC_FLAG_OUTPUT_CORRUPT;
    if (hardware)
        hardware->offerTo(*context);
    if (error >= 0)
        error = avcodec_open2(context.get(), codec, nullptr);
    if (error < 0)
        return failure(error, stream);
    return std::unique_ptr<VideoDecoder>(new VideoDecoder(std::move(context), track));
}

void VideoDecoder::send(const AVPacket& packet)
{
    m_affinity.assertHere();
    if (m_firstKeyframe == AV_NOPTS_VALUE && (packet.flags & AV_PKT_FLAG_KEY))
        m_firstKeyframe = packet.pts;
    // Pictures were taken out before, so the decoder has room; anything else it says is about a damaged packet.
    avcodec_send_packet(m_context.get(), &packet);
}

void VideoDecoder::finish()
{
    m_affinity.assertHere();
    avcodec_send_packet(m_context.get(), nullptr);
}

FrameRef VideoDecoder::receive()
{
    m_affinity.assertHere();
    for (;;) {
        const int result = avcodec_receive_frame(m_context.get(), m_frame.get());
        if (result == AVERROR(EAGAIN) || result == AVERROR_EOF || result == AVERROR(EINVAL))
            return nullptr;
        if (result < 0)
            continue; // a damaged picture; the decoder reports each once
        Owned<AVFrame> picture = HardwareDevice::inMemory(std::exchange(m_frame, newFrame()));
        if (!picture)
            continue;
        std::int64_t pts = picture->best_effort_timestamp;
        if (pts == AV_NOPTS_VALUE)
            pts = m_lastPts == AV_NOPTS_VALUE ? m_track.origin : m_lastPts + m_step;
        // What is shown before the first keyframe looks back at pictures that were not sent.
        if ((picture->flags & AV_FRAME_FLAG_CORRUPT) && (m_firstKeyframe == AV_NOPTS_VALUE || pts < m_firstKeyframe))
            continue;
        if (m_lastPts != AV_NOPTS_VALUE && pts > m_lastPts)
            m_step = pts - m_lastPts;
        m_lastPts = pts;
        return std::make_shared<DecodedFrame>(std::move(picture), pts, m_track.timeOf(pts), m_track.orientation,
                                              m_track.aspect);
    }
}

void VideoDecoder::flush()
{
    m_affinity.assertHere();
    avcodec_flush_buffers(m_context.get());
    m_lastPts = m_firstKeyframe = AV_NOPTS_VALUE;
}

void VideoDecoder::setSkipsUnreferenced(bool skips)
{
    m_affinity.assertHere();
    m_context->skip_frame = skips ? AVDISCARD_NONREF : AVDISCARD_DEFAULT;
}

void VideoDecoder::setMendsGaps(bool mends)
{
    m_affinity.assertHere();
    m_context->error_concealment = mends || !canLeaveGaps() ? FF_EC_GUESS_MVS | FF_EC_DEBLOCK : 0;
}

} // namespace ffmpeg
