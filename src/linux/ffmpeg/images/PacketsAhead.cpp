#include "linux/ffmpeg/images/PacketsAhead.h"

#include <algorithm>
#include <utility>
#include <vector>

namespace ffmpeg {

namespace {

/// Broken files claim any size.
constexpr std::size_t kMostBytes = 16u << 20;

bool isShown(const AVPacket& packet)
{
    return !(packet.flags & AV_PKT_FLAG_DISCARD);
}

std::size_t sizeOf(const AVPacket& packet)
{
    return static_cast<std::size_t>(std::max(0, packet.size));
}

} // namespace

void PacketsAhead::restart()
{
    m_affinity.assertHere();
    m_entries.clear();
    m_readAll = false;
    if (m_references)
        m_references->restart();
}

void PacketsAhead::fill(Demuxer& demuxer)
{
    m_affinity.assertHere();
    std::size_t bytes = 0;
    for (const Entry& each : m_entries)
        bytes += sizeOf(*each.packet);
    while (!m_readAll && m_entries.size() < m_enough && bytes < kMostBytes) {
        Owned<AVPacket> packet = newPacket();
        m_readAll = demuxer.read(*packet) != 0;
        if (m_readAll)
            return;
        bytes += sizeOf(*packet);
        add(std::move(packet));
    }
}

void PacketsAhead::add(Owned<AVPacket> packet)
{
    m_affinity.assertHere();
    H264References::Picture picture;
    if (m_references)
        picture = m_references->follow(*packet);
    m_entries.push_back({std::move(packet), std::move(picture)});
}

Owned<AVPacket> PacketsAhead::take()
{
    m_affinity.assertHere();
    Owned<AVPacket> packet = std::move(m_entries.front().packet);
    m_entries.pop_front();
    return packet;
}

/// Whether another picture takes the place of this one before `tick`, or it is never shown.
bool PacketsAhead::isPassed(std::size_t index, std::int64_t tick) const
{
    const AVPacket& packet = *m_entries[index].packet;
    if (packet.pts == AV_NOPTS_VALUE || packet.pts > tick)
        return false;
    return !isShown(packet)
           || std::any_of(m_entries.begin() + static_cast<std::ptrdiff_t>(index), m_entries.end(),
                          [&](const Entry& each) {
                              const std::int64_t pts = each.packet->pts;
                              return pts != AV_NOPTS_VALUE && pts > packet.pts && pts <= tick && isShown(*each.packet);
                          });
}

Owned<AVPacket> PacketsAhead::standInForFirst(std::int64_t tick, bool isWhole) const
{
    m_affinity.assertHere();
    const Entry& first = m_entries.front();
    if (!first.picture.canBeReplaced() || !isFirstPassed(tick)
        || !std::all_of(m_entries.begin(), m_entries.end(), [](const Entry& each) { return each.picture.isKnown; }))
        return nullptr;
    const H264References::Picture& last = m_entries.back().picture;
    std::vector<bool> isNeeded(m_entries.size());
    for (std::size_t i = m_entries.size(); i-- > 0;) {
        const H264References::Picture& picture = m_entries[i].picture;
        bool needed = !isPassed(i, tick) || picture.slice.kind != h264::Slice::Kind::B || last.keeps(picture.number);
        for (std::size_t user = i + 1; !needed && user < m_entries.size(); ++user)
            needed = isNeeded[user] && m_entries[user].picture.refersToPicture(picture.number);
        isNeeded[i] = needed;
    }
    return isNeeded.front() ? nullptr : m_references->standInFor(*first.packet, first.picture, isWhole);
}

bool PacketsAhead::isAnyShown(std::int64_t pts, std::int64_t tick) const
{
    m_affinity.assertHere();
    if (!m_readAll && m_entries.size() + 1 < m_enough)
        return true; // nobody knows
    return std::any_of(m_entries.begin(), m_entries.end(), [&](const Entry& each) {
        const AVPacket& packet = *each.packet;
        return packet.pts == AV_NOPTS_VALUE || (packet.pts > pts && packet.pts <= tick && isShown(packet));
    });
}

} // namespace ffmpeg
