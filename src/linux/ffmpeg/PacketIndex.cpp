#include "linux/ffmpeg/PacketIndex.h"

#include <algorithm>

namespace ffmpeg {

namespace {

/// 46 hours at 60 pictures a second; a file that claims more is not a recording, and must not eat the memory.
constexpr std::size_t kMostPackets = 10'000'000;

} // namespace

std::shared_ptr<const PacketIndex> PacketIndex::build(Demuxer& demuxer, int video)
{
    const auto index = std::make_shared<PacketIndex>();
    const auto packet = newPacket();
    int result = 0;
    while ((result = demuxer.read(*packet)) == 0 && index->m_packets.size() < kMostPackets) {
        const AVStream& stream = demuxer.stream(packet->stream_index);
        const std::int64_t pts = packet->pts != AV_NOPTS_VALUE ? packet->pts : packet->dts;
        if (pts == AV_NOPTS_VALUE)
            continue;
        const std::int64_t end = av_rescale_q(pts + packet->duration, stream.time_base, AV_TIME_BASE_Q);
        index->m_end = std::max(index->m_end.value_or(end), end);
        if (packet->stream_index == video)
            index->m_packets.push_back({pts, packet->dts, packet->duration, packet->pos, packet->size,
                                        (packet->flags & AV_PKT_FLAG_KEY) != 0,
                                        (packet->flags & AV_PKT_FLAG_DISCARD) != 0});
    }
    if (result == AVERROR_EXIT || demuxer.readError() != 0)
        return nullptr;
    std::stable_sort(index->m_packets.begin(), index->m_packets.end(),
                     [](const PacketEntry& a, const PacketEntry& b) { return a.pts < b.pts; });
    std::copy_if(index->m_packets.begin(), index->m_packets.end(), std::back_inserter(index->m_keyframes),
                 [](const PacketEntry& each) { return each.isKey; });
    for (const PacketEntry& each : index->m_packets) {
        if (!each.isHidden && (index->m_shown.empty() || index->m_shown.back() != each.pts))
            index->m_shown.push_back(each.pts);
    }
    return index;
}

std::optional<std::int64_t> PacketIndex::pictureFrom(std::int64_t tick, int count) const
{
    if (m_shown.empty())
        return std::nullopt;
    const auto behind = std::upper_bound(m_shown.begin(), m_shown.end(), tick);
    const std::int64_t visible = std::max<std::int64_t>(0, behind - m_shown.begin() - 1);
    const auto last = static_cast<std::int64_t>(m_shown.size()) - 1;
    return m_shown[static_cast<std::size_t>(std::clamp<std::int64_t>(visible + count, 0, last))];
}

const PacketEntry* PacketIndex::keyframeAt(std::int64_t pts) const
{
    const auto behind = std::upper_bound(m_keyframes.begin(), m_keyframes.end(), pts,
                                         [](std::int64_t value, const PacketEntry& each) { return value < each.pts; });
    return behind == m_keyframes.begin() ? nullptr : &*std::prev(behind);
}

} // namespace ffmpeg
