#include "linux/ffmpeg/FrameCache.h"

#include <algorithm>
#include <iterator>

namespace ffmpeg {

namespace {

constexpr std::size_t kFull = 2; ///< steps that a picture in full can be reduced by

/// Decoding such pictures takes so much memory that little is left for keeping them.
bool isHuge(const DecodedFrame& frame)
{
    return std::max(frame.picture().width, frame.picture().height) > 1920;
}

} // namespace

void FrameCache::insert(const ShownFrame& shown, std::int64_t focus, Overflow overflow, std::int64_t reach)
{
    m_affinity.assertHere();
    const std::int64_t pts = shown.frame->pts();
    if (const auto found = m_entries.find(pts); found != m_entries.end()) {
        if (shown.frame->picture().width < found->second.frame->picture().width)
            return;
        erase(found);
    }
    m_entries.emplace(pts, shown);
    m_bytes += shown.frame->byteCount();
    ++m_counts[stepOf(*shown.frame)];
    while (m_counts[kFull] > fullLimit(*shown.frame)) {
        const auto entry = farthestOf(kFull, focus);
        if (overflow == Overflow::Reduce)
            reduce(entry, isHuge(*entry->second.frame) ? 0 : kFull - 1);
        else
            erase(entry);
    }
    while (m_bytes > m_mostBytes && m_entries.size() > 1)
        makeRoom(focus, overflow, reach);
}

void FrameCache::makeRoom(std::int64_t focus, Overflow overflow, std::int64_t reach)
{
    const auto last = farthest(focus);
    const bool isWanted = last->first / 2 >= focus / 2 - reach / 2 && last->first / 2 <= focus / 2 + reach / 2;
    const bool mayReduce = overflow != Overflow::Drop && isWanted;
    if (mayReduce && m_counts[1] > 0)
        reduce(farthestOf(1, focus), 0);
    else if (mayReduce && m_counts[kFull] > kKeptAmongReduced)
        reduce(farthestOf(kFull, focus), 0);
    else
        erase(last);
}

std::size_t FrameCache::fullLimit(const DecodedFrame& picture) const
{
    return std::max(kKeptFull, m_mostBytes / 4 / std::max<std::size_t>(1, picture.byteCount()));
}

std::optional<ShownFrame> FrameCache::at(std::int64_t tick) const
{
    m_affinity.assertHere();
    auto found = m_entries.upper_bound(tick);
    if (found == m_entries.begin())
        return std::nullopt;
    --found;
    return tick < found->second.until ? std::optional(found->second) : std::nullopt;
}

FrameRef FrameCache::nearest(std::int64_t tick) const
{
    m_affinity.assertHere();
    auto found = m_entries.upper_bound(tick);
    if (found == m_entries.begin())
        return found == m_entries.end() ? nullptr : found->second.frame;
    const auto before = std::prev(found);
    const bool isBefore = found == m_entries.end() || tick - before->first <= found->first - tick;
    return (isBefore ? before : found)->second.frame;
}

std::int64_t FrameCache::capacity(const DecodedFrame& full, Overflow overflow) const
{
    m_affinity.assertHere();
    const std::size_t bytes = std::max<std::size_t>(1, full.byteCount());
    const std::size_t step = stepOf(full);
    if (overflow == Overflow::Drop || step == 0)
        return static_cast<std::int64_t>(step == kFull ? fullLimit(full) : m_mostBytes / bytes);
    const std::size_t kept = std::min({kKeptAmongReduced, fullLimit(full), m_mostBytes / bytes});
    const double side =
        static_cast<double>(kReducedSides.back()) / std::max(full.picture().width, full.picture().height);
    const double reduced = static_cast<double>(bytes) * side * side;
    return static_cast<std::int64_t>(static_cast<double>(m_mostBytes - kept * bytes) / reduced)
           + static_cast<std::int64_t>(kept);
}

std::size_t FrameCache::stepOf(const DecodedFrame& frame)
{
    const int side = std::max(frame.picture().width, frame.picture().height);
    return static_cast<std::size_t>(
        std::count_if(kReducedSides.begin(), kReducedSides.end(), [&](int limit) { return side > limit; }));
}

void FrameCache::erase(Entries::iterator entry)
{
    m_bytes -= entry->second.frame->byteCount();
    --m_counts[stepOf(*entry->second.frame)];
    m_entries.erase(entry);
}

FrameCache::Entries::iterator FrameCache::farthest(std::int64_t focus)
{
    return farther(m_entries.begin(), std::prev(m_entries.end()), focus);
}

FrameCache::Entries::iterator FrameCache::farthestOf(std::size_t step, std::int64_t focus)
{
    const auto isOfStep = [&](const auto& entry) { return stepOf(*entry.second.frame) == step; };
    const auto first = std::find_if(m_entries.begin(), m_entries.end(), isOfStep);
    const auto last = std::find_if(m_entries.rbegin(), m_entries.rend(), isOfStep);
    return farther(first, std::prev(last.base()), focus);
}

/// So that `step` more steps would be possible.
void FrameCache::reduce(Entries::iterator entry, std::size_t step)
{
    const ShownFrame large = entry->second;
    FrameRef small = DecodedFrame::reduced(large.frame, kReducedSides[kReducedSides.size() - 1 - step]);
    erase(entry);
    if (small) {
        m_bytes += small->byteCount();
        ++m_counts[stepOf(*small)];
        m_entries.emplace(large.frame->pts(), ShownFrame{std::move(small), large.until});
    }
}

FrameCache::Entries::iterator FrameCache::farther(Entries::iterator first, Entries::iterator last, std::int64_t focus)
{
    // In halves: the distance between two ticks can be larger than a tick can hold.
    return focus / 2 - first->first / 2 > last->first / 2 - focus / 2 ? first : last;
}

} // namespace ffmpeg
