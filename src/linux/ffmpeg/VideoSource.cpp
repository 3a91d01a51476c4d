#include "linux/ffmpeg/VideoSource.h"

#include "linux/ffmpeg/TableLag.h"

#include <algorithm>
#include <cstdlib>
#include <utility>

namespace ffmpeg {

namespace {

/// Seconds. A finger that goes farther between two pictures looks for another place: all that lies between would come
/// too late.
constexpr std::int64_t kStride = 2;

} // namespace

VideoSource::VideoSource(std::shared_ptr<const Movie> movie, std::unique_ptr<Demuxer> demuxer,
                         std::unique_ptr<VideoDecoder> decoder, Cancelled cancelled)
    : m_movie(std::move(movie)), m_track(*m_movie->video()), m_demuxer(std::move(demuxer)),
      m_decoder(std::move(decoder)), m_cancelled(std::move(cancelled)), m_packet(newPacket())
{
    m_demuxer->select({m_track.stream});
    const AVRational told = m_demuxer->stream(m_track.stream).avg_frame_rate;
    const double rate = told.num > 0 && told.den > 0 ? std::clamp(av_q2d(told), 1.0, 240.0) : 60;
    const auto ticksOf = [&](std::int64_t pictures) {
        constexpr double kMost = 1e12; // broken files have ticks of any length
        const double ticks = static_cast<double>(pictures) / rate / av_q2d(m_track.timeBase);
        return ticks >= 0 && ticks < kMost ? static_cast<std::int64_t>(ticks) : static_cast<std::int64_t>(kMost);
    };
    const DecodedFrame& picture = *m_movie->firstFrame();
    const std::int64_t full = m_cache.capacity(picture, FrameCache::Overflow::Drop);
    m_shortReach = ticksOf(std::max(full / 4, std::min<std::int64_t>(full, 10)));
    m_longReach = ticksOf(m_cache.capacity(picture, FrameCache::Overflow::Reduce));
    m_stride = std::min(m_longReach, av_rescale_q(kStride, {1, 1}, m_track.timeBase));
}

base::Result<std::unique_ptr<VideoSource>> VideoSource::open(std::shared_ptr<const Movie> movie, Cancelled cancelled,
                                                             int threads)
{
    auto demuxer = movie->demuxer(cancelled);
    if (!demuxer)
        return demuxer.error();
    const VideoTrack& track = *movie->video();
    if (track.stream >= demuxer.value()->streamCount())
        return base::Error::make("ffmpeg", AVERROR_INVALIDDATA, "the file has changed");
    auto decoder = VideoDecoder::open(demuxer.value()->stream(track.stream), track, threads, HardwareDevice::shared());
    if (!decoder)
        return decoder.error();
    return std::unique_ptr<VideoSource>(new VideoSource(std::move(movie), std::move(demuxer).value(),
                                                        std::move(decoder).value(), std::move(cancelled)));
}

std::optional<ShownFrame> VideoSource::at(std::int64_t tick, Want want, const Stopped& stopped, const Glimpse& glimpse)
{
    m_affinity.assertHere();
    const std::int64_t before = std::exchange(m_lastTick, tick).value_or(kNever);
    const auto cached = m_cache.at(tick);
    if (cached && (want == Want::Any || !cached->frame->isReduced()))
        return cached;
    plan(tick, before, want, cached.has_value());
    const auto showsFarAhead = [&](const FrameRef& frame) {
        if (glimpse && frame && frame->pts() < tick - m_shortReach)
            glimpse(frame);
    };
    bool starts = false;
    bool isRepeated = false;
    if (!goesOnTo(tick)) {
        seek(tick);
        starts = true;
        if (glimpse && !cached && keyframeBefore(tick).value_or(tick) < tick - m_shortReach) {
            if (FrameRef nearest = m_cache.nearest(tick))
                glimpse(std::move(nearest));
        }
    }
    while (!stopped() && !*m_cancelled) {
        if (m_next && m_next->pts() <= tick) {
            if (std::exchange(starts, false))
                showsFarAhead(m_next);
            advance();
        } else if (!m_next && !m_ended) {
            decodeSome();
        } else if (m_current && m_current->pts() < m_skippedTo) {
            // One that was left out stands between: so long a gap between two pictures was not expected.
            m_skipBefore = std::exchange(isRepeated, true) ? kNever : m_current->pts();
            seek(tick);
        } else if (m_current) {
            const ShownFrame shown{m_current, m_next ? m_next->pts() : kForever};
            m_cache.insert(shown, tick, m_overflow, m_longReach);
            return shown;
        } else if (!m_fromStart) {
            seekFarther();
        } else if (m_next) {
            return ShownFrame{m_next, m_next->pts()};
        } else {
            return std::nullopt;
        }
    }
    return std::nullopt;
}

/// Who moves about a place will want what lies beside: all that is passed is kept then, and what has been kept is not
/// dropped when the finger rests. Who comes to a new place gets there sooner with less.
void VideoSource::plan(std::int64_t tick, std::int64_t before, Want want, bool isCached)
{
    const bool movesAbout = want == Want::Any && before != kNever && std::abs(tick - before) <= m_stride;
    const bool goesBack = movesAbout && tick < before;
    const bool rests = want == Want::Full && isCached;
    m_overflow = movesAbout || rests ? FrameCache::Overflow::Reduce : FrameCache::Overflow::Drop;
    m_skipBefore = tick - (movesAbout ? m_longReach : m_shortReach);
    m_focus = goesBack ? tick - m_longReach / 2 : tick;
}

bool VideoSource::goesOnTo(std::int64_t tick) const
{
    if (!m_positioned || tick < m_skippedTo
        || (m_current ? m_current->pts()
            : m_next  ? m_next->pts()
                      : kForever)
               > tick)
        return false;
    const std::int64_t head = m_next ? m_next->pts() : m_current->pts();
    const std::int64_t near = av_rescale_q(250, {1, 1000}, m_track.timeBase);
    const auto keyframe = keyframeBefore(tick);
    return m_ended || !keyframe || *keyframe <= head + near;
}

std::optional<std::int64_t> VideoSource::keyframeBefore(std::int64_t tick) const
{
    if (m_index) {
        const PacketEntry* found = m_index->keyframeAt(tick);
        return found ? std::optional(found->pts) : std::nullopt;
    }
    AVStream& stream = m_demuxer->stream(m_track.stream);
    const std::int64_t lag = m_tableLag.value_or(0);
    const AVIndexEntry* found = avformat_index_get_entry_from_timestamp(&stream, tick - lag, AVSEEK_FLAG_BACKWARD);
    return found ? std::optional(found->timestamp + lag) : std::nullopt;
}

void VideoSource::seek(std::int64_t tick)
{
    m_decoder->flush();
    m_current = m_next = nullptr;
    m_positioned = m_awaitsKeyframe = true;
    m_finishing = m_ended = false;
    m_soughtTick = tick;
    m_skippedTo = kNever;
    m_stepBack = 0;
    if (!m_movie->hasTable(m_cancelled)) {
        // Who starts to play does not wait for an index.
        if (!m_index && tick > m_movie->firstFrame()->pts())
            m_index = m_movie->packetIndex(m_cancelled);
        const PacketEntry* keyframe = m_index ? m_index->keyframeAt(tick) : nullptr;
        m_fromStart = !keyframe || !m_demuxer->seekTo(m_track.stream, *keyframe);
        if (m_fromStart)
            m_demuxer->seekToStart(m_track.stream);
        return;
    }
    if (!m_tableLag)
        m_tableLag = tableLag(*m_demuxer, m_track.stream, m_track.origin);
    const auto keyframe = keyframeBefore(tick);
    m_fromStart = keyframe && !keyframeBefore(*keyframe - 1);
    if (!m_demuxer->seek(m_track.stream, tick)) {
        m_fromStart = true;
        m_demuxer->seekToStart(m_track.stream);
    }
}

/// What the table led to lies behind the tick after all.
void VideoSource::seekFarther()
{
    const std::int64_t second = std::max<std::int64_t>(1, av_rescale_q(1, {1, 1}, m_track.timeBase));
    const std::int64_t step = m_stepBack ? m_stepBack * 2 : second;
    const std::int64_t tick = m_soughtTick - step;
    seek(tick);
    m_stepBack = step;
    if (tick < m_track.origin - second) {
        m_fromStart = true;
        m_demuxer->seekToStart(m_track.stream);
    }
}

void VideoSource::decodeSome()
{
    if (FrameRef frame = m_decoder->receive()) {
        ++m_decodedCount;
        // Broken files give pictures out of order; time does not go back for them.
        if (!m_current || frame->pts() > m_current->pts())
            m_next = std::move(frame);
        return;
    }
    if (m_finishing) {
        m_ended = true;
        return;
    }
    if (m_demuxer->read(*m_packet) != 0) {
        m_decoder->finish();
        m_finishing = true;
        return;
    }
    if (m_awaitsKeyframe && !(m_packet->flags & AV_PKT_FLAG_KEY) && !m_fromStart)
        return;
    m_awaitsKeyframe = false;
    const bool skips = m_packet->pts != AV_NOPTS_VALUE && m_packet->pts < m_skipBefore;
    if (skips)
        m_skippedTo = std::max(m_skippedTo, m_packet->pts);
    m_decoder->setSkipsUnreferenced(skips);
    m_decoder->send(*m_packet);
}

void VideoSource::advance()
{
    if (m_current && m_current->pts() >= m_skippedTo && !m_cache.at(m_current->pts()))
        m_cache.insert({m_current, m_next->pts()}, m_focus, m_overflow, m_longReach);
    m_current = std::move(m_next);
    m_next = nullptr;
}

} // namespace ffmpeg
