#include "linux/ffmpeg/SoundTrack.h"

#include "linux/ffmpeg/AudioOutput.h"

#include <algorithm>
#include <cstdlib>

namespace ffmpeg {

namespace {

/// Decoders of sound need what came before: AAC a packet, Opus 80 ms.
constexpr std::int64_t kPreroll = kSampleRate / 5;
/// Files round times to a millisecond or so; that is no gap.
constexpr std::int64_t kJitter = kSampleRate / 50;
/// A longer gap than this is not filled with silence in memory.
constexpr std::int64_t kLongestGap = std::int64_t{10} * kSampleRate;

} // namespace

SoundTrack::SoundTrack(Owned<AVCodecContext> context, const AVStream& stream, std::int64_t origin)
    : m_context(std::move(context)), m_frame(newFrame()), m_stream(stream.index), m_timeBase(stream.time_base),
      m_origin(origin)
{
}

std::unique_ptr<SoundTrack> SoundTrack::open(const AVStream& stream, std::int64_t origin)
{
    const AVCodec* codec = avcodec_find_decoder(stream.codecpar->codec_id);
    if (!codec)
        return nullptr;
    Owned<AVCodecContext> context(avcodec_alloc_context3(codec));
    context->thread_count = 1;
    if (avcodec_parameters_to_context(context.get(), stream.codecpar) < 0)
        return nullptr;
    context->pkt_timebase = stream.time_base;
    if (avcodec_open2(context.get(), codec, nullptr) < 0)
        return nullptr;
    return std::unique_ptr<SoundTrack>(new SoundTrack(std::move(context), stream, origin));
}

void SoundTrack::seek(std::int64_t frame)
{
    m_affinity.assertHere();
    avcodec_flush_buffers(m_context.get());
    m_resampler.reset();
    m_format = -1;
    m_samples.clear();
    m_wanted = m_start = frame;
    m_continues = false;
}

std::int64_t SoundTrack::frameAt(std::int64_t pts) const
{
    return av_rescale_q(pts, m_timeBase, {1, kSampleRate}) - av_rescale_q(m_origin, AV_TIME_BASE_Q, {1, kSampleRate});
}

bool SoundTrack::isTooEarly(const AVPacket& packet) const
{
    m_affinity.assertHere();
    return packet.pts != AV_NOPTS_VALUE && frameAt(packet.pts + packet.duration) + kPreroll < m_wanted;
}

void SoundTrack::decode(const AVPacket& packet)
{
    m_affinity.assertHere();
    if (avcodec_send_packet(m_context.get(), &packet) < 0)
        return; // damaged: silence
    while (avcodec_receive_frame(m_context.get(), m_frame.get()) >= 0)
        take(*m_frame);
}

bool SoundTrack::prepare(const AVFrame& frame)
{
    const int channels = frame.ch_layout.nb_channels;
    if (m_resampler && m_rate == frame.sample_rate && m_format == frame.format && m_channels == channels)
        return true;
    AVChannelLayout from{};
    if (frame.ch_layout.order == AV_CHANNEL_ORDER_UNSPEC)
        av_channel_layout_default(&from, channels);
    else
        av_channel_layout_copy(&from, &frame.ch_layout);
    // One channel is doubled by us: the library would make it quieter.
    AVChannelLayout to{};
    av_channel_layout_default(&to, channels == 1 ? 1 : 2);
    SwrContext* made = nullptr;
    const int result = swr_alloc_set_opts2(&made, &to, AV_SAMPLE_FMT_FLT, kSampleRate, &from,
                                           static_cast<AVSampleFormat>(frame.format), frame.sample_rate, 0, nullptr);
    m_resampler.reset(made);
    av_channel_layout_uninit(&from);
    av_channel_layout_uninit(&to);
    if (result < 0 || swr_init(m_resampler.get()) < 0) {
        m_resampler.reset();
        return false;
    }
    m_rate = frame.sample_rate;
    m_format = frame.format;
    m_channels = channels;
    return true;
}

void SoundTrack::take(const AVFrame& frame)
{
    if (frame.nb_samples <= 0 || frame.sample_rate <= 0 || !prepare(frame))
        return;
    const std::int64_t waiting = swr_get_delay(m_resampler.get(), kSampleRate);
    const int most = swr_get_out_samples(m_resampler.get(), frame.nb_samples);
    if (most <= 0)
        return;
    m_converted.resize(static_cast<std::size_t>(most) * 2);
    auto* into = reinterpret_cast<std::uint8_t*>(m_converted.data());
    const int got = swr_convert(m_resampler.get(), &into, most, const_cast<const std::uint8_t**>(frame.extended_data),
                                frame.nb_samples);
    if (got <= 0)
        return;
    if (m_channels == 1) {
        for (std::size_t i = static_cast<std::size_t>(got); i-- > 0;)
            m_converted[2 * i] = m_converted[2 * i + 1] = m_converted[i];
    }
    const std::int64_t pts = frame.best_effort_timestamp;
    append(pts == AV_NOPTS_VALUE ? end() : frameAt(pts) - waiting, m_converted.data(), static_cast<std::size_t>(got));
}

void SoundTrack::append(std::int64_t at, const float* samples, std::size_t frames)
{
    if (m_continues && std::abs(at - end()) < kJitter)
        at = end();
    if (at > end()) {
        if (at - end() > kLongestGap && m_samples.empty())
            m_start = at; // nothing to keep: the silence is not stored
        else
            m_samples.resize(m_samples.size() + static_cast<std::size_t>(std::min(at - end(), kLongestGap)) * 2);
    }
    const std::int64_t early = std::min(end() - at, static_cast<std::int64_t>(frames));
    if (early > 0) {
        samples += early * 2;
        frames -= static_cast<std::size_t>(early);
    }
    m_samples.insert(m_samples.end(), samples, samples + frames * 2);
    m_continues = m_continues || frames > 0;
}

void SoundTrack::addTo(float* into, std::int64_t from, std::size_t frames)
{
    m_affinity.assertHere();
    const std::int64_t until = from + static_cast<std::int64_t>(frames);
    const std::int64_t first = std::max(from, m_start);
    const std::int64_t last = std::min(until, end());
    for (std::int64_t frame = first; frame < last; ++frame) {
        const float* sample = m_samples.data() + (frame - m_start) * 2;
        into[(frame - from) * 2] += sample[0];
        into[(frame - from) * 2 + 1] += sample[1];
    }
    if (until >= end()) {
        m_samples.clear();
        m_start = std::max(until, m_start);
    } else if (until > m_start) {
        m_samples.erase(m_samples.begin(), m_samples.begin() + (until - m_start) * 2);
        m_start = until;
    }
}

} // namespace ffmpeg
