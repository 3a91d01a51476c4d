// How a reader gets to another place. What the library says of a place that it has gone to cannot be believed of every
// format: some count their times from the first packet that was read, some keep halves of packets from the old place.
#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/PacketIndex.h"

#include <algorithm>
#include <array>
#include <limits>
#include <utility>

namespace ffmpeg {

namespace {

/// The time of an entry of Matroska's table that lies behind all others.
constexpr std::int64_t kBehindAll = std::numeric_limits<std::int64_t>::max() / 2;

/// Bytes. In some streams what follows a place begins with the rest of a picture, and is taken for one with the next:
/// so far before it another one begins.
constexpr std::int64_t kBefore = 128 << 10;

std::int64_t timeOf(const AVPacket& packet)
{
    return packet.pts != AV_NOPTS_VALUE ? packet.pts : packet.dts;
}

bool isIt(const AVPacket& packet, const PacketEntry& entry)
{
    return timeOf(packet) == entry.pts && packet.pos == entry.position && packet.size == entry.size;
}

bool isBehind(const AVPacket& packet, const PacketEntry& entry)
{
    const bool isLater = packet.dts != AV_NOPTS_VALUE && entry.dts != AV_NOPTS_VALUE && packet.dts > entry.dts;
    return isLater || (entry.position >= 0 && packet.pos > entry.position);
}

} // namespace

void Demuxer::leave()
{
    m_isFresh = false;
    m_peeked.reset();
    m_readError = m_lost = 0;
}

bool Demuxer::seek(int stream, std::int64_t timestamp)
{
    m_affinity.assertHere();
    leave();
    if (!isMatroska())
        return av_seek_frame(m_context.get(), stream, timestamp, AVSEEK_FLAG_BACKWARD) >= 0;
    // Behind the last entry of its table Matroska would read on until the next keyframe, which may be to the end of a
    // large file; and without any entry all of it. So no entry is the last.
    AVStream& about = this->stream(stream);
    av_add_index_entry(&about, file().size(), kBehindAll, 0, 0, AVINDEX_KEYFRAME);
    return av_seek_frame(m_context.get(), stream, timestamp, AVSEEK_FLAG_BACKWARD) >= 0
           && avformat_index_get_entry(&about, 0)->timestamp != kBehindAll;
}

bool Demuxer::seekSound(int sound, int pictures, std::int64_t moment)
{
    m_affinity.assertHere();
    const auto seekBy = [&](int by) { return seek(by, av_rescale_q(moment, AV_TIME_BASE_Q, stream(by).time_base)); };
    // Matroska's table is that of the pictures; of the sound it knows what happened to be read.
    return (isMatroska() && pictures >= 0 && seekBy(pictures)) || seekBy(sound);
}

bool Demuxer::seekToByte(std::int64_t position)
{
    // Matroska's parser does not find its way there.
    if (position < 0 || isMatroska())
        return false;
    leave();
    return avformat_seek_file(m_context.get(), -1, 0, position, position, AVSEEK_FLAG_BYTE) >= 0;
}

bool Demuxer::seekTo(int stream, const PacketEntry& packet)
{
    m_affinity.assertHere();
    std::array ways{Way::ByPlace, Way::BeforePlace, Way::ByTime};
    std::iter_swap(ways.begin(), std::find(ways.begin(), ways.end(), m_way));
    for (const Way way : ways) {
        if (go(way, stream, packet) && readUpTo(stream, packet)) {
            m_way = way;
            return true;
        }
    }
    return startOver() && readUpTo(stream, packet);
}

bool Demuxer::go(Way way, int stream, const PacketEntry& packet)
{
    switch (way) {
    case Way::ByPlace:
        return seekToByte(packet.position);
    case Way::BeforePlace:
        return packet.position > 0 && seekToByte(std::max<std::int64_t>(0, packet.position - kBefore));
    case Way::ByTime:
        return seek(stream, packet.pts);
    }
    return false;
}

bool Demuxer::readUpTo(int stream, const PacketEntry& wanted)
{
    auto packet = newPacket();
    while (read(*packet) == 0) {
        if (packet->stream_index != stream)
            continue;
        if (isIt(*packet, wanted)) {
            m_peeked = std::move(packet);
            return true;
        }
        if (isBehind(*packet, wanted))
            return false;
    }
    return false;
}

bool Demuxer::seekToStart(int stream)
{
    m_affinity.assertHere();
    if (m_isFresh)
        return true;
    // Elsewhere no table need have the first packet, and only a new reader counts from it.
    // Far enough before any start, and no overflow in sums.
    return (isMov() && seek(stream, INT64_MIN / 4)) || startOver();
}

bool Demuxer::startOver()
{
    leave();
    const std::int64_t position = m_position;
    const bool hasLooked = m_hasLookedAtPackets;
    Owned<AVIOContext> io = std::move(m_io);
    Owned<AVFormatContext> before = std::move(m_context); // ends before what it reads through
    if (const int error = begin(); error < 0) {
        m_lost = m_readError != 0 ? m_readError : error; // it stands where nobody wants to read
        m_context = std::move(before);
        m_io = std::move(io);
        m_position = position; // where its buffer ends
        m_hasLookedAtPackets = hasLooked;
        return false;
    }
    if (isMatroska())
        keepTable(*before);
    if (m_selected)
        select(std::vector<int>(*m_selected));
    return true;
}

/// What was learnt by reading, too: of a file without a table it is all there is.
void Demuxer::keepTable(AVFormatContext& before)
{
    for (int i = 0; i < std::min(streamCount(), static_cast<int>(before.nb_streams)); ++i) {
        AVStream& known = *before.streams[i];
        for (int each = 0; each < avformat_index_get_entries_count(&known); ++each) {
            const AVIndexEntry& entry = *avformat_index_get_entry(&known, each);
            av_add_index_entry(&stream(i), entry.pos, entry.timestamp, entry.size, entry.min_distance, entry.flags);
        }
    }
}

bool Demuxer::findsKeyframes(int stream)
{
    m_affinity.assertHere();
    if (!isMatroska() || !m_isFresh)
        return isMov();
    const std::int64_t lookedTo = m_hasLookedAtPackets ? avio_tell(m_context->pb) : 0;
    if (!seek(stream, 0))
        return false;
    // Of Matroska whoever has not read a packet knows what its table says, and nothing else; who has looked at some knows
    // their keyframes too. The last entry is ours.
    AVStream& about = this->stream(stream);
    const AVIndexEntry* last = avformat_index_get_entry(&about, avformat_index_get_entries_count(&about) - 2);
    return last && last->pos >= lookedTo;
}

} // namespace ffmpeg
