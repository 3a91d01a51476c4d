#include "linux/ffmpeg/exporting/sound/TrackPackets.h"

#include "linux/ffmpeg/bitstream/NalUnits.h"

#include <algorithm>
#include <utility>

namespace ffmpeg {

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
        return base::Error::make("ffmpeg", error, "it cannot be read: " + textOf(error));
    return packets;
}

int TrackPackets::prepare()
{
    m_demuxer->select({m_stream});
    const AVCodecParameters& given = *stream().codecpar;
    if (const int error = avcodec_parameters_copy(m_parameters.get(), &given); error < 0)
        return error;
    if (given.codec_id != AV_CODEC_ID_AAC || given.extradata_size > 0)
        return 0;
    // Broadcast streams repeat the header in each packet; MP4 has it once.
    AVBSFContext* filter = nullptr;
    if (const int error = av_bsf_alloc(av_bsf_get_by_name("aac_adtstoasc"), &filter); error < 0)
        return error;
    m_filter.reset(filter);
    avcodec_parameters_copy(filter->par_in, &given);
    filter->time_base_in = stream().time_base;
    if (const int error = av_bsf_init(filter); error < 0)
        return error;
    const auto packet = newPacket();
    toStart();
    if (const int error = readFiltered(*packet); error < 0)
        return error == AVERROR_EOF ? 0 : error;
    std::size_t size = 0;
    if (const auto* header = av_packet_get_side_data(packet.get(), AV_PKT_DATA_NEW_EXTRADATA, &size)) {
        if (!setExtradata(*m_parameters, {header, size}))
            return AVERROR(ENOMEM);
    }
    return 0;
}

void TrackPackets::toStart()
{
    m_demuxer->seekToStart(m_stream);
    if (m_filter)
        av_bsf_flush(m_filter.get());
    m_expected = AV_NOPTS_VALUE;
    m_first.reset();
    m_isFromStart = true;
}

bool TrackPackets::trySeek(double seconds)
{
    if (!m_demuxer->seeksByTable() || seconds <= 0)
        return false;
    const bool ownTable = m_demuxer->isMov() || !m_movie->video();
    const int by = ownTable ? m_stream : m_movie->video()->stream;
    const auto moment = static_cast<std::int64_t>(seconds * AV_TIME_BASE) + m_movie->origin();
    if (!m_demuxer->seek(by, av_rescale_q(moment, AV_TIME_BASE_Q, m_demuxer->stream(by).time_base)))
        return false;
    if (m_filter)
        av_bsf_flush(m_filter.get());
    m_expected = AV_NOPTS_VALUE;
    m_isFromStart = false;
    auto packet = newPacket();
    if (readFiltered(*packet) < 0 || packet->pts == AV_NOPTS_VALUE
        || av_compare_ts(packet->pts, stream().time_base, moment, AV_TIME_BASE_Q) > 0)
        return false;
    m_first = std::move(packet);
    return true;
}

void TrackPackets::seek(double seconds)
{
    m_first.reset();
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
        if (av_bsf_send_packet(m_filter.get(), &packet) < 0)
            continue; // damaged
        if (av_bsf_receive_packet(m_filter.get(), &packet) >= 0)
            return 0;
    }
}

int TrackPackets::read(AVPacket& packet)
{
    av_packet_unref(&packet);
    if (m_first) {
        av_packet_move_ref(&packet, m_first.get());
        m_first.reset();
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

} // namespace ffmpeg
