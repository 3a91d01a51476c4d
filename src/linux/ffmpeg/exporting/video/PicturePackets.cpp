#include "linux/ffmpeg/exporting/video/PicturePackets.h"

#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/CannotCopy.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace ffmpeg {

namespace {

constexpr std::size_t kMostOfOneTime = 64; ///< more is a broken file, not a burst

} // namespace

PicturePackets::PicturePackets(std::shared_ptr<const Movie> movie, std::unique_ptr<Demuxer> demuxer)
    : m_movie(std::move(movie)), m_demuxer(std::move(demuxer)),
      m_scale(std::int64_t(track().timescale) / track().timeBase.den * track().timeBase.num), m_packet(newPacket()),
      m_peeked(newPacket())
{
    m_demuxer->select({track().stream});
    if (stream().codecpar->codec_id == AV_CODEC_ID_H264)
        m_h264 = h264::Configuration::parse(extradataOf(*stream().codecpar));
}

base::Result<std::unique_ptr<PicturePackets>> PicturePackets::open(std::shared_ptr<const Movie> movie,
                                                                   Cancelled cancelled)
{
    auto demuxer = movie->demuxer(std::move(cancelled));
    if (!demuxer)
        return demuxer.error();
    return std::unique_ptr<PicturePackets>(new PicturePackets(std::move(movie), std::move(demuxer).value()));
}

void PicturePackets::seek(std::int64_t outTick)
{
    m_affinity.assertHere();
    m_ready.clear();
    m_next = nullptr;
    m_ended = 0;
    const std::int64_t second = std::max<std::int64_t>(1, av_rescale_q(1, {1, 1}, track().timeBase));
    const std::int64_t wanted = outTick / m_scale + track().origin;
    std::int64_t back = 0;
    for (;;) {
        const std::int64_t target = wanted - back;
        // Formats without a table find their way only from the start; nor is there anything before it to skip.
        m_startsMovie = !m_demuxer->seeksByTable() || outTick <= 0 || target < track().origin - second
                        || !m_demuxer->seek(track().stream, target);
        peek();
        // Before what an edit list hides there may be pictures of the same times that it shows.
        const bool isEarly = m_hasPeeked && m_peeked->pts != AV_NOPTS_VALUE && !(m_peeked->flags & AV_PKT_FLAG_DISCARD)
                             && this->outTick(m_peeked->pts) <= outTick;
        if (m_startsMovie || m_demuxer->isCancelled())
            return;
        const std::uint32_t until = isEarly ? picturesUntilRefreshed() : 0;
        if (isEarly && until == 0)
            return;
        if (isEarly && isRefreshed(until, outTick) && m_demuxer->seek(track().stream, target)) {
            peek();
            return;
        }
        // The table's times are those of decoding, and a file that is cut has a table that is not.
        back = back ? back * 2 : second;
    }
}

void PicturePackets::peek()
{
    if (m_startsMovie)
        m_demuxer->seekToStart(track().stream);
    do {
        m_hasPeeked = readFile(*m_peeked) == 0;
    } while (m_hasPeeked && !m_startsMovie && !(m_peeked->flags & AV_PKT_FLAG_KEY));
}

std::vector<ByteView> PicturePackets::unitsIn(const AVPacket& packet) const
{
    if (!m_h264)
        return {};
    if (h264::Configuration::hasStartCodes(extradataOf(*m_demuxer->stream(track().stream).codecpar)))
        return unitsBetweenStartCodes(payloadOf(packet));
    return unitsBehindLengths(payloadOf(packet), m_h264->lengthSize).value_or(std::vector<ByteView>{});
}

/// By the keyframe that was peeked.
std::uint32_t PicturePackets::picturesUntilRefreshed() const
{
    std::uint32_t until = 0;
    for (const ByteView nal : unitsIn(*m_peeked))
        if (h264::unitOf(nal) == h264::Unit::Info)
            until = std::max(until, h264::picturesUntilRefreshed(nal));
    return until;
}

/// Whether so many pictures behind the one that was peeked there is one that is not shown later; reads them.
bool PicturePackets::isRefreshed(std::uint32_t until, std::int64_t outTick)
{
    const auto isReference = [](ByteView nal) {
        constexpr std::uint8_t kImportance = 0x60;
        const h264::Unit unit = h264::unitOf(nal);
        return (unit == h264::Unit::Slice || unit == h264::Unit::SliceA || unit == h264::Unit::Idr)
               && (nal[0] & kImportance);
    };
    while (readFile(*m_packet) == 0) {
        const auto units = unitsIn(*m_packet);
        if (std::none_of(units.begin(), units.end(), isReference) || --until > 0)
            continue;
        return m_packet->pts != AV_NOPTS_VALUE && this->outTick(m_packet->pts) <= outTick;
    }
    return false;
}

int PicturePackets::read(AVPacket& packet)
{
    m_affinity.assertHere();
    if (m_ready.empty())
        if (const int result = gatherOneTime(); result != 0)
            return result;
    av_packet_unref(&packet);
    av_packet_move_ref(&packet, m_ready.front().get());
    m_ready.pop_front();
    return 0;
}

int PicturePackets::gatherOneTime()
{
    if (m_ended != 0)
        return m_ended;
    if (!m_next) {
        m_next = newPacket();
        if (const int result = readAsItIs(*m_next); result != 0) {
            m_next = nullptr;
            return result;
        }
    }
    const std::int64_t pts = m_next->pts;
    const auto isHidden = [](const AVPacket& each) { return (each.flags & AV_PKT_FLAG_DISCARD) != 0; };
    std::ptrdiff_t keyframe = -1;
    do {
        keyframe = m_next->flags & AV_PKT_FLAG_KEY ? std::ssize(m_ready) : keyframe;
        m_ready.push_back(std::exchange(m_next, newPacket()));
        m_ended = readAsItIs(*m_next);
    } while (m_ended == 0 && pts != AV_NOPTS_VALUE && m_next->pts == pts
             && isHidden(*m_next) == isHidden(*m_ready.back()) && m_ready.size() < kMostOfOneTime);
    if (m_ended != 0)
        m_next = nullptr;
    // A keyframe keeps its time: whoever begins there does not know what stood before it. Else the last does, which is
    // the one that was seen.
    const std::ptrdiff_t fixed = keyframe >= 0 ? keyframe : std::ssize(m_ready) - 1;
    for (std::ptrdiff_t i = 0; pts != AV_NOPTS_VALUE && i < std::ssize(m_ready); ++i)
        m_ready[static_cast<std::size_t>(i)]->pts = pts + i - fixed;
    return 0;
}

int PicturePackets::readFile(AVPacket& packet)
{
    const int result = m_demuxer->read(packet);
    if (result == 0 && m_showsInOrder && packet.pts == AV_NOPTS_VALUE)
        packet.pts = packet.dts;
    return result;
}

int PicturePackets::readAsItIs(AVPacket& packet)
{
    if (!m_hasPeeked)
        return readFile(packet);
    m_hasPeeked = false;
    av_packet_unref(&packet);
    av_packet_move_ref(&packet, m_peeked.get());
    return 0;
}

base::Result<PicturePacket> PicturePackets::look(const AVPacket& packet, const Splicer& splicer) const
{
    if (packet.pts == AV_NOPTS_VALUE)
        return cannotCopy("its packets do not say when they are shown");
    if (splicer.holdsHalf(packet))
        return cannotCopy("the fields of its pictures stand in packets of their own");
    const bool isKey = packet.flags & AV_PKT_FLAG_KEY;
    return PicturePacket{outTick(packet.pts),
                         isKey,
                         isKey && splicer.isJoint(packet),
                         isKey && splicer.isOpenJoint(packet),
                         (packet.flags & AV_PKT_FLAG_DISCARD) != 0,
                         splicer.picturesHeldBack(packet)};
}

base::Result<PacketWindow> PicturePackets::headWindow(std::int64_t start, std::int64_t end, const Splicer& splicer)
{
    m_affinity.assertHere();
    seek(start);
    PacketWindow window;
    window.startsMovie = m_startsMovie;
    int behindStart = 0;
    int behindEnd = 0;
    std::int64_t visible = 0;
    std::optional<std::int64_t> openJoint;
    while (read(*m_packet) == 0) {
        const auto looked = look(*m_packet, splicer);
        if (!looked)
            return looked.error();
        const PicturePacket& each = looked.value();
        if (each.isKey && !each.isHidden && each.pts <= start && !window.packets.empty()) {
            window.packets.clear();
            window.startsMovie = false;
        }
        window.packets.push_back(each);
        if (openJoint && each.pts > *openJoint)
            return window; // all that is shown before it was decoded right behind it
        if (each.isOpenJoint && !each.isHidden && each.pts > start && !openJoint)
            openJoint = each.pts;
        if (each.pts <= start && !each.isHidden)
            visible = std::max(visible, each.pts);
        behindStart += !each.isHidden && each.pts > start;
        behindEnd += !each.isHidden && each.pts >= end;
        if (each.isJoint && !each.isOpenJoint && !each.isHidden && each.pts > start && window.packets.size() > 1)
            return window;
        // What is visible at the start is a joint itself: all that follows can be copied.
        const PicturePacket& first = window.packets.front();
        const bool startsWithIt = (first.isJoint || first.isOpenJoint) && !first.isHidden && first.pts >= visible;
        if (behindEnd > kFarthestReorder || (startsWithIt && behindStart > kFarthestReorder))
            return window;
    }
    window.endsMovie = true;
    return window;
}

base::Result<PacketWindow> PicturePackets::tailWindow(std::int64_t from, std::int64_t end, const Splicer& splicer)
{
    m_affinity.assertHere();
    const std::int64_t second = track().timescale;
    from = std::min(from, m_movie->duration().convertedTo(track().timescale).value);
    for (std::int64_t back = 0;; back = back ? back * 2 : second) {
        seek(from - back);
        PacketWindow window;
        window.startsMovie = m_startsMovie;
        int behindEnd = 0;
        while (read(*m_packet) == 0) {
            const auto looked = look(*m_packet, splicer);
            if (!looked)
                return looked.error();
            const PicturePacket& each = looked.value();
            if (each.isJoint && !each.isHidden && each.pts < end && !window.packets.empty()) {
                window.packets.clear();
                window.startsMovie = false;
            }
            window.packets.push_back(each);
            behindEnd += !each.isHidden && each.pts >= end;
            if (behindEnd > kFarthestReorder || (each.isJoint && !each.isHidden && each.pts >= end))
                return window;
        }
        window.endsMovie = true;
        // A file that is cut has nothing where its table leads to.
        if (!window.packets.empty() || m_startsMovie || isCancelled())
            return window;
    }
}

bool PicturePackets::isInterrupted()
{
    m_affinity.assertHere();
    if (!isMov())
        return false;
    AVStream& stream = this->stream();
    const int count = avformat_index_get_entries_count(&stream);
    bool hasBegun = false;
    bool isHidden = false;
    for (int i = 0; i < count; ++i) {
        const bool wasHidden = isHidden;
        isHidden = avformat_index_get_entry(&stream, i)->flags & AVINDEX_DISCARD_FRAME;
        if (hasBegun && wasHidden && !isHidden)
            return true;
        hasBegun = hasBegun || !isHidden;
    }
    return false;
}

base::Result<std::vector<PicturePacket>> PicturePackets::copiedWindow(const VideoPlan& plan, const Splicer& splicer)
{
    m_affinity.assertHere();
    seek(plan.copyFrom);
    std::vector<PicturePacket> packets;
    int behind = 0;
    while (behind <= kFarthestReorder && read(*m_packet) == 0) {
        const auto looked = look(*m_packet, splicer);
        if (!looked)
            return looked.error();
        const PicturePacket& each = looked.value();
        const bool isShown = !each.isHidden;
        if (isShown && !plan.copiesToHidden && plan.copyTo == each.pts)
            break;
        const bool isBehind = isShown && each.pts > plan.lastPts;
        behind += isBehind;
        if (!isBehind && (!packets.empty() || (isShown && each.pts == plan.copyFrom)))
            packets.push_back(each);
    }
    return packets;
}

void PicturePackets::detach()
{
    m_demuxer->detach();
    m_affinity.detach();
}

} // namespace ffmpeg
