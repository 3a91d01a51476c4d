#include "linux/ffmpeg/exporting/sound/TrackPackets.h"

#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/sound/AacFrame.h"
#include "linux/ffmpeg/exporting/sound/AacHeader.h"

#include <algorithm>
#include <utility>

namespace ffmpeg {

namespace {

// Microseconds: how far before a place another is tried, and how much farther each time.
constexpr std::int64_t kFarthestBack = std::int64_t{2} * AV_TIME_BASE;
constexpr std::int64_t kStepBack = AV_TIME_BASE;

} // namespace

TrackPackets::TrackPackets(std::shared_ptr<const Movie> movie, std::unique_ptr<Demuxer> demuxer, int stream)
    : m_movie(std::move(movie)), m_demuxer(std::move(demuxer)), m_stream(stream),
      m_parameters(avcodec_parameters_alloc())
{
}

base::Result<std::unique_ptr<TrackPackets>> TrackPackets::open(std::shared_ptr<const Movie> movie, int stream,
                                                               const Cancelled& cancelled)
{
    auto demuxer = Demuxer::open(movie->file(), cancelled);
    if (!demuxer)
        return demuxer.error();
    if (stream >= demuxer.value()->streamCount())
        return base::Error::make("ffmpeg", AVERROR_STREAM_NOT_FOUND, "it is no longer in the file");
    std::unique_ptr<TrackPackets> packets(new TrackPackets(std::move(movie), std::move(demuxer).value(), stream));
    if (const int error = packets->prepare(); error < 0)
        return base::Error::make(
            "ffmpeg", error, packets->isDamaged() ? "its packets are damaged" : "it cannot be read: " + textOf(error));
    return packets;
}

int TrackPackets::prepare()
{
    m_demuxer->select({m_stream});
    const AVCodecParameters& given = *stream().codecpar;
    if (const int error = avcodec_parameters_copy(m_parameters.get(), &given); error < 0)
        return error;
    if (given.codec_id != AV_CODEC_ID_AAC)
        return 0;
    if (given.extradata_size == 0)
        if (const int error = findAacHeader(); error < 0)
            return error == AVERROR_EOF ? 0 : error;
    return hearAac();
}

/// From the start. Fewer where the track has no more; an error when it has none.
int TrackPackets::readFirst(std::vector<Owned<AVPacket>>& packets, int count)
{
    toStart();
    for (int i = 0; i < count; ++i) {
        auto packet = newPacket();
        if (const int error = readFiltered(*packet); error < 0)
            return packets.empty() ? error : 0;
        packets.push_back(std::move(packet));
    }
    return 0;
}

/// Broadcast streams repeat the header in each packet; MP4 has it once, and some recorders forget it.
int TrackPackets::findAacHeader()
{
    std::vector<Owned<AVPacket>> packets;
    if (const int error = readFirst(packets, kAacPacketsToHear); error < 0)
        return error;
    if (std::any_of(packets.begin(), packets.end(), [](const auto& each) { return hasOwnAacHeader(*each); }))
        return openFilter();
    m_isDamaged = !makeAacHeader(*m_parameters, packets, stream().time_base);
    return m_isDamaged ? AVERROR_INVALIDDATA : 0;
}

int TrackPackets::openFilter()
{
    AVBSFContext* filter = nullptr;
    if (const int error = av_bsf_alloc(av_bsf_get_by_name("aac_adtstoasc"), &filter); error < 0)
        return error;
    m_filter.reset(filter);
    avcodec_parameters_copy(filter->par_in, m_parameters.get());
    filter->time_base_in = stream().time_base;
    if (const int error = av_bsf_init(filter); error < 0)
        return error;
    std::vector<Owned<AVPacket>> packets;
    if (const int error = readFirst(packets, 1); error < 0)
        return m_isDamaged && error == AVERROR_EOF ? AVERROR_INVALIDDATA : error;
    std::size_t size = 0;
    if (const auto* header = av_packet_get_side_data(packets[0].get(), AV_PKT_DATA_NEW_EXTRADATA, &size)) {
        if (!setExtradata(*m_parameters, {header, size}))
            return AVERROR(ENOMEM);
    }
    return 0;
}

/// The header does not always say how many samples a packet holds, nor at which rate.
int TrackPackets::hearAac()
{
    m_samplesOfAac = kAacFrame;
    if (!mayHoldMoreThanItSays(*m_parameters))
        return 0;
    std::vector<Owned<AVPacket>> packets;
    if (const int error = readFirst(packets, kAacPacketsToHear); error < 0)
        return error == AVERROR_EOF ? 0 : error;
    const auto heard = ffmpeg::hearAac(*m_parameters, packets);
    m_samplesOfAac = heard ? heard->samples : 0;
    if (heard) {
        m_parameters->sample_rate = heard->rate;
        m_parameters->frame_size = heard->samples;
        av_channel_layout_uninit(&m_parameters->ch_layout);
        av_channel_layout_default(&m_parameters->ch_layout, heard->channels);
    }
    return 0;
}

void TrackPackets::toStart()
{
    m_demuxer->seekToStart(m_stream);
    if (m_filter)
        av_bsf_flush(m_filter.get());
    m_expected = AV_NOPTS_VALUE;
    m_ahead.reset();
    m_isFromStart = true;
}

bool TrackPackets::trySeek(double seconds)
{
    if (!m_demuxer->seeksByTable() || seconds <= 0)
        return false;
    const auto start = static_cast<std::int64_t>(seconds * AV_TIME_BASE);
    const std::int64_t moment = start + m_movie->origin();
    // A place in the pictures' table can lie between two packets of the sound.
    for (std::int64_t back = 0; back <= kFarthestBack && back < start; back += kStepBack) {
        if (!m_demuxer->seekSound(m_stream, m_movie->video() ? m_movie->video()->stream : -1, moment - back))
            return false;
        if (m_filter)
            av_bsf_flush(m_filter.get());
        m_expected = AV_NOPTS_VALUE;
        m_isFromStart = false;
        auto packet = newPacket();
        if (readFiltered(*packet) < 0 || packet->pts == AV_NOPTS_VALUE)
            return false;
        const std::int64_t late = av_rescale_q(packet->pts, stream().time_base, AV_TIME_BASE_Q) - moment;
        if (late <= 0) {
            m_ahead = std::move(packet);
            return true;
        }
        if (late > kStepBack)
            return false; // it begins later, or has a gap
    }
    return false;
}

void TrackPackets::seek(double seconds)
{
    m_affinity.assertHere();
    m_ahead.reset();
    if (!trySeek(seconds))
        toStart();
}

int TrackPackets::readFiltered(AVPacket& packet)
{
    for (;;) {
        if (const int error = m_demuxer->read(packet); error < 0)
            return error;
        if (packet.stream_index != m_stream)
            continue;
        if (!m_filter)
            return 0;
        if (av_bsf_send_packet(m_filter.get(), &packet) >= 0 && av_bsf_receive_packet(m_filter.get(), &packet) >= 0)
            return 0;
        m_isDamaged = true;
    }
}

int TrackPackets::readTimed(AVPacket& packet)
{
    av_packet_unref(&packet);
    if (m_ahead) {
        av_packet_move_ref(&packet, m_ahead.get());
        m_ahead.reset();
    } else if (const int error = readFiltered(packet); error < 0) {
        return error;
    }
    if (packet.pts == AV_NOPTS_VALUE)
        packet.pts = packet.dts;
    if (packet.pts == AV_NOPTS_VALUE)
        packet.pts = m_expected != AV_NOPTS_VALUE ? m_expected
                                                  : av_rescale_q(m_movie->origin(), AV_TIME_BASE_Q, stream().time_base);
    m_expected = packet.pts + packet.duration;
    return 0;
}

int TrackPackets::read(AVPacket& packet)
{
    m_affinity.assertHere();
    if (const int error = readTimed(packet); error < 0)
        return error;
    if (packet.duration <= 0 && m_samplesOfAac == 0) {
        // It does not say how long it lasts: until the next one.
        auto next = newPacket();
        const bool isThere = readTimed(*next) >= 0;
        packet.duration = isThere && next->pts > packet.pts ? next->pts - packet.pts : m_duration;
        if (isThere)
            m_ahead = std::move(next);
    }
    m_duration = packet.duration;
    return 0;
}

void TrackPackets::detach()
{
    m_demuxer->detach();
    m_affinity.detach();
}

} // namespace ffmpeg
