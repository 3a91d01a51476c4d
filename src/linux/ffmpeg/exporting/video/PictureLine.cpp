#include "linux/ffmpeg/exporting/video/PictureLine.h"

#include "linux/ffmpeg/exporting/CannotCopy.h"

#include <algorithm>
#include <utility>

namespace ffmpeg {

PictureLine::PictureLine(int depth, std::int64_t step, std::optional<std::int64_t> last, std::int64_t end)
    : m_depth(depth), m_step(std::max<std::int64_t>(1, step)), m_last(last), m_end(end),
      m_followers(2 * static_cast<std::size_t>(std::max(depth, 0)))
{
}

base::Result<void> PictureLine::push(Owned<AVPacket> packet, bool isJoint)
{
    m_affinity.assertHere();
    if (isJoint)
        forgetLateKeyframes();
    if (m_count == 0)
        m_first = packet->pts;
    m_pending.push(packet->pts);
    std::int64_t dts = m_first - (m_depth - m_count) * m_step;
    if (m_count >= m_depth) {
        dts = m_pending.top();
        m_pending.pop();
        if (dts > packet->pts || (m_count > 0 && dts <= m_lastDts))
            return cannotCopy(dts == m_lastDts ? "several pictures have the same time"
                                               : "its pictures are reordered farther than it says");
    }
    ++m_count;
    m_lastDts = packet->dts = dts;
    if (packet->duration <= 0)
        packet->duration = m_step;
    const std::int64_t rest = std::max<std::int64_t>(1, m_end - packet->pts);
    packet->duration = m_last && packet->pts == *m_last ? rest : std::min(packet->duration, rest);
    m_packets.push_back({std::move(packet), isJoint});
    return {};
}

void PictureLine::finish(std::optional<std::int64_t> end)
{
    m_affinity.assertHere();
    m_finished = true;
    forgetLateKeyframes();
    if (m_packets.empty())
        return;
    AVPacket& last = *m_packets.back().packet;
    if (!m_last)
        last.duration = end ? std::max<std::int64_t>(1, *end - last.pts) : last.duration;
    else if (last.pts != *m_last) // the whole track shall last as long as its pictures
        last.duration = std::clamp<std::int64_t>(m_end - m_depth * m_step - last.dts, 1,
                                                 std::max<std::int64_t>(1, m_end - last.pts));
}

void PictureLine::forgetLateKeyframes()
{
    for (std::size_t i = m_packets.size() - std::min(m_packets.size(), m_followers); i < m_packets.size(); ++i)
        if (!m_packets[i].isJoint)
            m_packets[i].packet->flags &= ~AV_PKT_FLAG_KEY;
}

bool PictureLine::pop(AVPacket& packet)
{
    m_affinity.assertHere();
    // The last one is held back: its duration is known at the end.
    if (m_packets.size() < (m_finished ? 1 : m_followers + 2))
        return false;
    av_packet_unref(&packet);
    av_packet_move_ref(&packet, m_packets.front().packet.get());
    m_packets.pop_front();
    return true;
}

} // namespace ffmpeg
