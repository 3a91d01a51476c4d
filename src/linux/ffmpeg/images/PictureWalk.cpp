#include "linux/ffmpeg/images/PictureWalk.h"

#include <algorithm>
#include <utility>

namespace ffmpeg {

namespace {

/// Of packets that were read ahead; broken files claim any size.
constexpr std::size_t kMostBytesAhead = 16u << 20;

bool isShown(const AVPacket& packet)
{
    return !(packet.flags & AV_PKT_FLAG_DISCARD);
}

} // namespace

PictureWalk::PictureWalk(std::shared_ptr<const Movie> movie, std::unique_ptr<Demuxer> demuxer,
                         std::unique_ptr<VideoDecoder> decoder, Cancelled cancelled)
    : m_movie(std::move(movie)), m_track(*m_movie->video()), m_demuxer(std::move(demuxer)),
      m_decoder(std::move(decoder)), m_cancelled(std::move(cancelled))
{
    m_demuxer->select({m_track.stream});
    if (!m_demuxer->seeksByTable()) {
        m_index = m_movie->packetIndex(m_cancelled);
        return;
    }
    m_demuxer->seek(m_track.stream, m_track.origin); // some read their table only when they need it
    const auto first = newPacket();
    if (m_demuxer->read(*first) == 0 && first->pts != AV_NOPTS_VALUE && first->dts != AV_NOPTS_VALUE)
        m_tableLag = std::max<std::int64_t>(0, first->pts - first->dts);
}

base::Result<std::unique_ptr<PictureWalk>> PictureWalk::open(std::shared_ptr<const Movie> movie, Cancelled cancelled)
{
    auto demuxer = movie->demuxer(cancelled);
    if (!demuxer)
        return demuxer.error();
    const VideoTrack& track = *movie->video();
    if (track.stream >= demuxer.value()->streamCount())
        return base::Error::make("ffmpeg", AVERROR_INVALIDDATA, "the file has changed");
    auto decoder = VideoDecoder::open(demuxer.value()->stream(track.stream), track, 1);
    if (!decoder)
        return decoder.error();
    return std::unique_ptr<PictureWalk>(new PictureWalk(std::move(movie), std::move(demuxer).value(),
                                                        std::move(decoder).value(), std::move(cancelled)));
}

void PictureWalk::setThreads(int threads)
{
    auto decoder = VideoDecoder::open(m_demuxer->stream(m_track.stream), m_track, threads);
    if (!decoder)
        return;
    m_decoder = std::move(decoder).value();
    m_threads = threads;
    m_positioned = false;
}

std::int64_t PictureWalk::groupOf(std::int64_t tick) const
{
    return keyframeBefore(tick).value_or(kNever);
}

FrameRef PictureWalk::at(std::int64_t tick)
{
    if (!goesOnTo(tick))
        seek(tick);
    while (!*m_cancelled) {
        if (m_next && m_next->pts() <= tick)
            m_current = std::exchange(m_next, nullptr);
        else if (!m_next && !m_ended)
            decodeSome(tick);
        else if (m_current)
            return m_current;
        else if (!m_fromStart)
            seekFarther();
        else
            return m_next;
    }
    return nullptr;
}

bool PictureWalk::goesOnTo(std::int64_t tick) const
{
    if (!m_positioned || !m_current || m_current->pts() > tick)
        return false;
    const std::int64_t head = m_next ? m_next->pts() : m_current->pts();
    const std::int64_t near = av_rescale_q(250, {1, 1000}, m_track.timeBase); // a seek would not be faster
    const auto keyframe = keyframeBefore(tick);
    return m_ended || !keyframe || *keyframe <= head + near;
}

std::optional<std::int64_t> PictureWalk::keyframeBefore(std::int64_t tick) const
{
    if (m_index) {
        const PacketEntry* found = m_index->keyframeAt(tick);
        return found ? std::optional(found->pts) : std::nullopt;
    }
    AVStream& stream = m_demuxer->stream(m_track.stream);
    const AVIndexEntry* found =
        avformat_index_get_entry_from_timestamp(&stream, tick - m_tableLag, AVSEEK_FLAG_BACKWARD);
    return found ? std::optional(found->timestamp + m_tableLag) : std::nullopt;
}

void PictureWalk::seek(std::int64_t tick)
{
    m_decoder->flush();
    m_ahead.clear();
    m_current = m_next = nullptr;
    m_positioned = m_awaitsKeyframe = true;
    m_readAll = m_finishing = m_ended = false;
    m_keyframe = kNever;
    m_soughtTick = tick;
    m_stepBack = 0;
    if (!m_demuxer->seeksByTable()) {
        const PacketEntry* keyframe = m_index ? m_index->keyframeAt(tick) : nullptr;
        m_fromStart = !keyframe || keyframe->position < 0 || !m_demuxer->seekToByte(keyframe->position);
    } else {
        const auto keyframe = keyframeBefore(tick);
        m_fromStart = (keyframe && !keyframeBefore(*keyframe - 1)) || !m_demuxer->seek(m_track.stream, tick);
    }
    if (m_fromStart)
        m_demuxer->seekToStart(m_track.stream);
}

/// What the table led to lies behind the tick after all.
void PictureWalk::seekFarther()
{
    const std::int64_t second = std::max<std::int64_t>(1, av_rescale_q(1, {1, 1}, m_track.timeBase));
    const std::int64_t step = m_stepBack ? m_stepBack * 2 : second;
    const std::int64_t tick = m_soughtTick - step;
    const std::int64_t sought = m_soughtTick;
    seek(tick);
    m_soughtTick = sought;
    m_stepBack = step;
    if (tick < m_track.origin - second && !m_fromStart) {
        m_fromStart = true;
        m_demuxer->seekToStart(m_track.stream);
    }
}

void PictureWalk::decodeSome(std::int64_t tick)
{
    if (FrameRef frame = m_decoder->receive()) {
        ++m_decodedCount;
        // Broken files give pictures out of order; time does not go back for them.
        if (frame->pts() >= m_keyframe && (!m_current || frame->pts() > m_current->pts()))
            m_next = std::move(frame);
        return;
    }
    if (m_finishing) {
        m_ended = true;
        return;
    }
    readAhead();
    if (m_ahead.empty()) {
        m_decoder->finish();
        m_finishing = true;
        return;
    }
    const Owned<AVPacket> packet = std::move(m_ahead.front());
    m_ahead.pop_front();
    if (m_awaitsKeyframe && !m_fromStart) {
        if (!(packet->flags & AV_PKT_FLAG_KEY))
            return;
        if (packet->pts != AV_NOPTS_VALUE)
            m_keyframe = packet->pts;
        if (m_keyframe > tick) {
            m_ended = true; // nothing from here on is what was looked for
            return;
        }
    }
    m_awaitsKeyframe = false;
    m_decoder->setSkipsUnreferenced(isPassed(*packet, tick));
    m_decoder->send(*packet);
}

void PictureWalk::readAhead()
{
    std::size_t bytes = 0;
    for (const auto& each : m_ahead)
        bytes += static_cast<std::size_t>(std::max(0, each->size));
    while (!m_readAll && m_ahead.size() < kAhead && bytes < kMostBytesAhead) {
        Owned<AVPacket> packet = newPacket();
        m_readAll = m_demuxer->read(*packet) != 0;
        if (m_readAll)
            return;
        bytes += static_cast<std::size_t>(std::max(0, packet->size));
        m_ahead.push_back(std::move(packet));
    }
}

/// Whether another picture takes the place of this one before `tick`, or it is never shown.
bool PictureWalk::isPassed(const AVPacket& packet, std::int64_t tick) const
{
    if (packet.pts == AV_NOPTS_VALUE || packet.pts > tick)
        return false;
    return !isShown(packet) || std::any_of(m_ahead.begin(), m_ahead.end(), [&](const Owned<AVPacket>& each) {
        return each->pts != AV_NOPTS_VALUE && each->pts > packet.pts && each->pts <= tick && isShown(*each);
    });
}

} // namespace ffmpeg
