#include "linux/ffmpeg/FrameCache.h"

#include <iterator>

namespace ffmpeg {

void FrameCache::insert(const ShownFrame& shown, std::int64_t focus)
{
    const std::int64_t pts = shown.frame->pts();
    if (const auto found = m_entries.find(pts); found != m_entries.end()) {
        if (shown.frame->isReduced() && !found->second.frame->isReduced())
            return;
        erase(found);
    }
    m_entries.emplace(pts, shown);
    m_bytes += shown.frame->byteCount();
    while (m_bytes > m_mostBytes && m_entries.size() > 1) {
        const auto first = m_entries.begin();
        const auto last = std::prev(m_entries.end());
        // In halves: the distance between two ticks can be larger than a tick can hold.
        erase(focus / 2 - first->first / 2 > last->first / 2 - focus / 2 ? first : last);
    }
}

std::optional<ShownFrame> FrameCache::at(std::int64_t tick) const
{
    auto found = m_entries.upper_bound(tick);
    if (found == m_entries.begin())
        return std::nullopt;
    --found;
    return tick < found->second.until ? std::optional(found->second) : std::nullopt;
}

void FrameCache::erase(Entries::iterator entry)
{
    m_bytes -= entry->second.frame->byteCount();
    m_entries.erase(entry);
}

} // namespace ffmpeg
