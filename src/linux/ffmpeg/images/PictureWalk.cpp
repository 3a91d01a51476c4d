#include "linux/ffmpeg/images/PictureWalk.h"

#include "linux/ffmpeg/TableLag.h"

#include <algorithm>
#include <utility>

namespace ffmpeg {

namespace {

/// Packets since the keyframe. A decoder that is drained gives its picture sooner, but has to begin anew behind it; who
/// comes back to the group must not wait long for that.
constexpr int kMostToDrain = 300;

} // namespace

PictureWalk::PictureWalk(std::shared_ptr<const Movie> movie, std::unique_ptr<Demuxer> demuxer,
                         std::unique_ptr<VideoDecoder> decoder, Cancelled cancelled)
    : m_movie(std::move(movie)), m_track(*m_movie->video()), m_demuxer(std::move(demuxer)),
      m_decoder(std::move(decoder)), m_cancelled(std::move(cancelled)), m_ahead(m_demuxer->stream(m_track.stream))
{
    m_demuxer->select({m_track.stream});
    if (!m_movie->hasTable(m_cancelled)) {
        m_index = m_movie->packetIndex(m_cancelled);
        return;
    }
    m_tableLag = tableLag(*m_demuxer, m_track.stream, m_track.origin);
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
    m_affinity.assertHere();
    auto decoder = VideoDecoder::open(m_demuxer->stream(m_track.stream), m_track, threads);
    if (!decoder)
        return;
    m_decoder = std::move(decoder).value();
    m_threads = threads;
    m_positioned = false;
}

std::int64_t PictureWalk::groupOf(std::int64_t tick) const
{
    m_affinity.assertHere();
    return keyframeBefore(tick).value_or(kNever);
}

FrameRef PictureWalk::at(std::int64_t tick, Then then)
{
    m_affinity.assertHere();
    if (!goesOnTo(tick))
        seek(tick);
    while (!*m_cancelled) {
        if (m_next && m_next->pts() <= tick)
            m_current = std::exchange(m_next, nullptr);
        else if (!m_next && !m_ended && !isFound(tick))
            decodeSome(tick, then);
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
    m_affinity.assertHere();
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
    m_ahead.restart();
    m_inside.clear();
    m_sentCount = 0;
    m_current = m_next = nullptr;
    m_positioned = m_awaitsKeyframe = true;
    m_finishing = m_ended = m_hasUntimed = false;
    m_keyframe = kNever;
    m_soughtTick = tick;
    m_stepBack = 0;
    if (!m_movie->hasTable(m_cancelled)) {
        const PacketEntry* keyframe = m_index ? m_index->keyframeAt(tick) : nullptr;
        m_fromStart = !keyframe || !m_demuxer->seekTo(m_track.stream, *keyframe);
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

/// Whether nothing that is still to come is shown between the current picture and `tick`.
bool PictureWalk::isFound(std::int64_t tick) const
{
    return m_current && !m_hasUntimed
           && std::none_of(m_inside.begin(), m_inside.end(),
                           [&](std::int64_t pts) { return pts > m_current->pts() && pts <= tick; })
           && !m_ahead.isAnyShown(m_current->pts(), tick);
}

void PictureWalk::decodeSome(std::int64_t tick, Then then)
{
    if (FrameRef frame = m_decoder->receive()) {
        ++m_decodedCount;
        std::erase_if(m_inside, [&](std::int64_t pts) { return pts <= frame->pts(); });
        // Broken files give pictures out of order; time does not go back for them.
        if (frame->pts() >= m_keyframe && (!m_current || frame->pts() > m_current->pts()))
            m_next = std::move(frame);
        return;
    }
    if (m_finishing) {
        m_ended = true;
        return;
    }
    m_ahead.fill(*m_demuxer);
    const bool isInside = std::any_of(m_inside.begin(), m_inside.end(), [&](std::int64_t pts) { return pts <= tick; });
    const bool drains = then == Then::Rest && isInside && !m_hasUntimed && m_sentCount <= kMostToDrain
                        && !m_ahead.isAnyShown(kNever, tick);
    if (m_ahead.isEmpty() || drains) {
        m_decoder->finish();
        m_finishing = true;
        m_positioned = m_positioned && !drains;
        return;
    }
    sendFirst(tick);
}

void PictureWalk::sendFirst(std::int64_t tick)
{
    const AVPacket& first = m_ahead.first();
    if (m_awaitsKeyframe && !m_fromStart) {
        if (!(first.flags & AV_PKT_FLAG_KEY)) {
            m_ahead.take();
            return;
        }
        if (first.pts != AV_NOPTS_VALUE)
            m_keyframe = first.pts;
        if (m_keyframe > tick) {
            m_ended = true; // nothing from here on is what was looked for
            return;
        }
    }
    m_awaitsKeyframe = false;
    const bool isPassed = m_ahead.isFirstPassed(tick);
    const Owned<AVPacket> standIn = m_ahead.standInForFirst(tick, !m_decoder->canLeaveGaps());
    const Owned<AVPacket> packet = m_ahead.take();
    m_hasUntimed = m_hasUntimed || packet->pts == AV_NOPTS_VALUE;
    if (!isPassed && !(packet->flags & AV_PKT_FLAG_DISCARD))
        m_inside.push_back(packet->pts);
    ++m_sentCount;
    m_decoder->setSkipsUnreferenced(isPassed);
    m_decoder->setMendsGaps(!standIn);
    m_decoder->send(standIn ? *standIn : *packet);
}

} // namespace ffmpeg
