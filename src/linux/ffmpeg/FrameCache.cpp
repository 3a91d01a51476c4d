#include "linux/ffmpeg/FrameCache.h"

#include <algorithm>
#include <iterator>

namespace ffmpeg {

void FrameCache::insert(const ShownFrame& shown, std::int64_t focus, Overflow overflow)
{
    const std::int64_t pts = shown.frame->pts();
    if (const auto found = m_entries.find(pts); found != m_entries.end()) {
        if (shown.frame->isReduced() && !found->second.frame->isReduced())
            return;
        erase(found);
    }
    m_entries.emplace(pts, shown);
    m_bytes += shown.frame->byteCount();
    m_fullCount += isReducible(*shown.frame);
    while (m_fullCount > fullLimit(*shown.frame)) {
        const auto entry = farthestFull(focus);
        if (overflow == Overflow::Reduce)
            reduce(entry);
        else
            erase(entry);
    }
    while (m_bytes > m_mostBytes && m_entries.size() > 1)
        erase(farther(m_entries.begin(), std::prev(m_entries.end()), focus));
}

std::size_t FrameCache::fullLimit(const DecodedFrame& picture) const
{
    return std::max(kKeptFull, m_mostBytes / 3 / std::max<std::size_t>(1, picture.byteCount()));
}

std::optional<ShownFrame> FrameCache::at(std::int64_t tick) const
{
    auto found = m_entries.upper_bound(tick);
    if (found == m_entries.begin())
        return std::nullopt;
    --found;
    return tick < found->second.until ? std::optional(found->second) : std::nullopt;
}

FrameRef FrameCache::nearest(std::int64_t tick) const
{
    auto found = m_entries.upper_bound(tick);
    if (found == m_entries.begin())
        return found == m_entries.end() ? nullptr : found->second.frame;
    const auto before = std::prev(found);
    const bool isBefore = found == m_entries.end() || tick - before->first <= found->first - tick;
    return (isBefore ? before : found)->second.frame;
}

std::int64_t FrameCache::capacity(const DecodedFrame& full, Overflow overflow) const
{
    const std::size_t bytes = std::max<std::size_t>(1, full.byteCount());
    if (!isReducible(full))
        return static_cast<std::int64_t>(m_mostBytes / bytes);
    const std::size_t kept = fullLimit(full);
    if (overflow == Overflow::Drop || m_mostBytes < kept * bytes)
        return static_cast<std::int64_t>(kept);
    const double side = static_cast<double>(kReducedLimit) / std::max(full.picture().width, full.picture().height);
    const double reduced = static_cast<double>(bytes) * side * side;
    return static_cast<std::int64_t>(static_cast<double>(m_mostBytes - kept * bytes) / reduced)
           + static_cast<std::int64_t>(kept);
}

bool FrameCache::isReducible(const DecodedFrame& frame)
{
    return !frame.isReduced() && std::max(frame.picture().width, frame.picture().height) > kReducedLimit;
}

void FrameCache::erase(Entries::iterator entry)
{
    m_bytes -= entry->second.frame->byteCount();
    m_fullCount -= isReducible(*entry->second.frame);
    m_entries.erase(entry);
}

FrameCache::Entries::iterator FrameCache::farthestFull(std::int64_t focus)
{
    const auto isFull = [](const auto& entry) { return isReducible(*entry.second.frame); };
    const auto first = std::find_if(m_entries.begin(), m_entries.end(), isFull);
    const auto last = std::find_if(m_entries.rbegin(), m_entries.rend(), isFull);
    return farther(first, std::prev(last.base()), focus);
}

void FrameCache::reduce(Entries::iterator entry)
{
    const ShownFrame full = entry->second;
    FrameRef small = DecodedFrame::reduced(full.frame, kReducedLimit);
    erase(entry);
    if (small) {
        m_bytes += small->byteCount();
        m_entries.emplace(full.frame->pts(), ShownFrame{std::move(small), full.until});
    }
}

FrameCache::Entries::iterator FrameCache::farther(Entries::iterator first, Entries::iterator last, std::int64_t focus)
{
    // In halves: the distance between two ticks can be larger than a tick can hold.
    return focus / 2 - first->first / 2 > last->first / 2 - focus / 2 ? first : last;
}

} // namespace ffmpeg
