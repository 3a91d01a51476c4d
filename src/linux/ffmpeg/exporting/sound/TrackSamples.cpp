#include "linux/ffmpeg/exporting/sound/TrackSamples.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <utility>

namespace ffmpeg {

namespace {

constexpr double kRunUp = 1.0;         ///< seconds read before the range, for decoders and for placing
constexpr double kDecodedBefore = 0.5; ///< of them; Opus needs 80 ms, MP3 a few packets
constexpr std::int64_t kSlack = 2;     ///< samples by which resampled pieces may seem to miss each other

std::int64_t samplesAt(const base::MediaTime& time, int rate)
{
    return time.convertedTo(rate).value;
}

} // namespace

TrackSamples::TrackSamples(std::unique_ptr<TrackPackets> packets, std::unique_ptr<SoundDecoder> decoder,
                           const ExportRange& range, int rate, int channels)
    : m_packets(std::move(packets)), m_decoder(std::move(decoder)), m_rate(rate), m_channels(channels),
      m_until(samplesAt(range.end, rate)), m_next(samplesAt(range.start, rate)), m_start(range.start.seconds()),
      m_packet(newPacket()), m_end(m_next)
{
    m_packets->seek(m_start - kRunUp);
}

std::unique_ptr<TrackSamples> TrackSamples::open(std::unique_ptr<TrackPackets> packets, const ExportRange& range,
                                                 int rate, int channels, std::function<void(const std::string&)> tell)
{
    auto decoder = SoundDecoder::open(packets->parameters(), packets->stream().time_base);
    if (!decoder)
        return nullptr;
    std::unique_ptr<TrackSamples> samples(
        new TrackSamples(std::move(packets), std::move(decoder), range, rate, channels));
    samples->m_tell = std::move(tell);
    return samples;
}

int TrackSamples::decodeUntil(std::int64_t wanted)
{
    while (!m_hasEnded && end() < wanted) {
        const int error = m_packets->read(*m_packet);
        if (error == AVERROR_EXIT)
            return error;
        if (error < 0) {
            m_isDamaged = m_isDamaged || error != AVERROR_EOF || m_packets->isDamaged();
            m_hasEnded = true;
            m_decoder->send(nullptr);
        } else {
            const double begins = static_cast<double>(m_packet->pts) * av_q2d(m_packets->stream().time_base)
                                  - static_cast<double>(m_packets->movie().origin()) / AV_TIME_BASE;
            if (begins < m_start - kDecodedBefore)
                continue;
            if (begins * m_rate > static_cast<double>(m_until + m_rate)) {
                m_hasEnded = true;
                m_decoder->send(nullptr);
            } else if (!m_decoder->send(m_packet.get())) {
                m_isDamaged = true;
            }
        }
        while (const AVFrame* frame = m_decoder->receive())
            take(*frame);
    }
    if (m_hasEnded) {
        placeWaiting();
        drainResampler();
    }
    // Of a track with nothing in it, whoever asks isEmpty() says so.
    const bool hasSound = !m_blocks.empty() || m_hasGiven;
    if (m_isDamaged && hasSound && m_tell) {
        m_tell("cannot be decoded everywhere; it is silent there");
        m_tell = nullptr;
    }
    return 0;
}

void TrackSamples::take(const AVFrame& frame)
{
    if (frame.nb_samples <= 0 || frame.sample_rate <= 0 || frame.ch_layout.nb_channels <= 0
        || frame.best_effort_timestamp == AV_NOPTS_VALUE)
        return;
    if (m_placement && m_placement->hasBegun() && m_placedRate == frame.sample_rate) {
        convert(frame);
        return;
    }
    if (m_placedRate != 0 && m_placedRate != frame.sample_rate)
        placeWaiting();
    m_placedRate = frame.sample_rate;
    m_waiting.emplace_back(av_frame_clone(&frame));
    if (m_waiting.size() >= kPiecesToBegin)
        placeWaiting();
}

void TrackSamples::placeWaiting()
{
    if (m_waiting.empty())
        return;
    std::vector<Placement::Piece> pieces;
    for (const auto& frame : m_waiting)
        pieces.push_back({frame->best_effort_timestamp, frame->nb_samples});
    m_placement = std::make_unique<Placement>(m_packets->stream().time_base, m_packets->movie().origin(), m_placedRate,
                                              Placement::Manner::Decoding);
    m_placement->begin(pieces);
    for (const auto& frame : std::exchange(m_waiting, {}))
        convert(*frame);
}

bool TrackSamples::prepare(const AVFrame& frame)
{
    const int channels = frame.ch_layout.nb_channels;
    if (m_resampler && m_fromRate == frame.sample_rate && m_fromFormat == frame.format && m_fromChannels == channels)
        return true;
    drainResampler();
    AVChannelLayout from{};
    if (frame.ch_layout.order == AV_CHANNEL_ORDER_UNSPEC)
        av_channel_layout_default(&from, channels);
    else
        av_channel_layout_copy(&from, &frame.ch_layout);
    // One channel is doubled by us: the library would make it quieter.
    const bool isDoubled = channels == 1 && m_channels == 2;
    AVChannelLayout to{};
    av_channel_layout_default(&to, isDoubled ? 1 : m_channels);
    SwrContext* made = nullptr;
    const int result = swr_alloc_set_opts2(&made, &to, AV_SAMPLE_FMT_FLTP, m_rate, &from,
                                           static_cast<AVSampleFormat>(frame.format), frame.sample_rate, 0, nullptr);
    m_resampler.reset(made);
    av_channel_layout_uninit(&from);
    av_channel_layout_uninit(&to);
    if (result < 0 || swr_init(m_resampler.get()) < 0) {
        m_resampler.reset();
        m_isDamaged = true;
        return false;
    }
    m_fromRate = frame.sample_rate;
    m_fromFormat = frame.format;
    m_fromChannels = channels;
    m_given = isDoubled ? 1 : static_cast<std::size_t>(m_channels);
    m_resampled = INT64_MIN;
    return true;
}

void TrackSamples::convert(const AVFrame& frame)
{
    const std::int64_t at = m_placement->place({frame.best_effort_timestamp, frame.nb_samples});
    const int surplus = std::min(SoundDecoder::surplusOf(frame), frame.nb_samples);
    const int count = frame.nb_samples - surplus;
    // What an edit list leaves out was decoded for what follows only.
    if ((frame.flags & AV_FRAME_FLAG_DISCARD) || count <= 0 || !prepare(frame))
        return;
    const std::int64_t placed = av_rescale(at, m_rate, m_fromRate) - swr_get_delay(m_resampler.get(), m_rate);
    if (m_resampled != INT64_MIN && std::abs(placed - m_resampled) > kSlack) {
        drainResampler();
        m_fromFormat = -1;
        if (!prepare(frame))
            return;
    }
    if (m_resampled == INT64_MIN)
        m_resampled = av_rescale(at, m_rate, m_fromRate);
    const int most = swr_get_out_samples(m_resampler.get(), count);
    if (most < 0)
        return;
    Planes samples(m_given, std::vector<float>(static_cast<std::size_t>(most)));
    std::vector<std::uint8_t*> planes;
    for (auto& plane : samples)
        planes.push_back(reinterpret_cast<std::uint8_t*>(plane.data()));
    const int got = swr_convert(m_resampler.get(), planes.data(), most,
                                const_cast<const std::uint8_t**>(frame.extended_data), count);
    if (got <= 0)
        return;
    for (auto& plane : samples)
        plane.resize(static_cast<std::size_t>(got));
    append(std::exchange(m_resampled, m_resampled + got), std::move(samples));
}

void TrackSamples::drainResampler()
{
    if (!m_resampler || m_resampled == INT64_MIN)
        return;
    const int most = swr_get_out_samples(m_resampler.get(), 0);
    if (most > 0 && swr_get_delay(m_resampler.get(), m_rate) > 0) {
        Planes samples(m_given, std::vector<float>(static_cast<std::size_t>(most)));
        std::vector<std::uint8_t*> planes;
        for (auto& plane : samples)
            planes.push_back(reinterpret_cast<std::uint8_t*>(plane.data()));
        if (const int got = swr_convert(m_resampler.get(), planes.data(), most, nullptr, 0); got > 0) {
            for (auto& plane : samples)
                plane.resize(static_cast<std::size_t>(got));
            append(m_resampled, std::move(samples));
        }
    }
    m_resampler.reset();
    m_resampled = INT64_MIN;
}

void TrackSamples::append(std::int64_t at, Planes samples)
{
    const auto count = static_cast<std::int64_t>(samples.front().size());
    const std::int64_t from = std::max({at, end(), m_next});
    const std::int64_t until = std::min(at + count, m_until);
    if (from >= until)
        return;
    for (auto& plane : samples) {
        plane.resize(static_cast<std::size_t>(until - at));
        plane.erase(plane.begin(), plane.begin() + (from - at));
        for (float& sample : plane)
            sample = std::isfinite(sample) ? sample : 0.0f;
    }
    if (samples.size() == 1)
        samples.resize(static_cast<std::size_t>(m_channels), samples.front());
    m_end = until;
    m_blocks.push_back({from, std::move(samples)});
}

bool TrackSamples::isEmpty()
{
    assertHere();
    return decodeUntil(m_next + 1) == 0 && end() <= m_next;
}

int TrackSamples::read(Planes& into, int count)
{
    assertHere();
    into.resize(static_cast<std::size_t>(m_channels));
    std::int64_t until = std::min(m_next + count, m_until);
    if (const int error = decodeUntil(until); error < 0)
        return error;
    if (m_hasEnded)
        until = std::min(until, std::max(m_next, end()));
    const auto length = static_cast<std::size_t>(until - m_next);
    for (auto& plane : into)
        plane.resize(plane.size() + length, 0.0f);
    while (!m_blocks.empty() && m_blocks.front().at < until) {
        const Block& block = m_blocks.front();
        const std::int64_t from = std::max(block.at, m_next);
        const std::int64_t to = std::min(block.end(), until);
        for (std::size_t channel = 0; channel < into.size() && from < to; ++channel) {
            const float* samples = block.samples[channel].data() + (from - block.at);
            std::copy(samples, samples + (to - from), into[channel].end() - (until - from));
        }
        if (block.end() > until)
            break;
        m_blocks.pop_front();
    }
    m_next = until;
    m_hasGiven = m_hasGiven || length > 0;
    return static_cast<int>(length);
}

void TrackSamples::detach()
{
    m_packets->detach();
    m_decoder->detach();
    if (m_placement)
        m_placement->detach();
    SampleSource::detach();
}

} // namespace ffmpeg
