#include "platform/media/TimeObservers.h"

#include <algorithm>
#include <utility>

namespace platform {

using base::MediaTime;

TimeObservers::~TimeObservers()
{
    for (const auto& entry : m_entries)
        entry->active = false;
}

TimeObservers::Token TimeObservers::addPeriodic(MediaTime interval, std::function<void(MediaTime)> callback)
{
    m_affinity.assertHere();
    const auto entry = std::make_shared<Entry>();
    entry->interval = interval;
    entry->periodic = std::move(callback);
    m_entries.push_back(entry);
    return entry;
}

TimeObservers::Token TimeObservers::addBoundary(std::vector<MediaTime> times, std::function<void()> callback)
{
    m_affinity.assertHere();
    const auto entry = std::make_shared<Entry>();
    entry->times = std::move(times);
    entry->boundary = std::move(callback);
    m_entries.push_back(entry);
    return entry;
}

void TimeObservers::remove(const Token& token)
{
    m_affinity.assertHere();
    const auto found =
        std::find_if(m_entries.begin(), m_entries.end(), [&](const auto& each) { return each == token; });
    if (found == m_entries.end())
        return;
    (*found)->active = false;
    m_entries.erase(found);
}

std::optional<MediaTime> TimeObservers::Entry::nextAfter(MediaTime time) const
{
    if (periodic) {
        if (!interval.isNumeric() || interval.value <= 0)
            return std::nullopt;
        // The estimate can be one off in either direction; the comparisons are exact.
        auto count = static_cast<std::int64_t>(time.seconds() / interval.seconds()) - 1;
        const auto multiple = [&] { return MediaTime::make(interval.value * count, interval.timescale); };
        while (multiple() <= time)
            ++count;
        return multiple();
    }
    std::optional<MediaTime> next;
    for (const MediaTime& each : times)
        if (each > time && each.isNumeric() && (!next || each < *next))
            next = each;
    return next;
}

std::optional<MediaTime> TimeObservers::nextAfter(MediaTime time) const
{
    m_affinity.assertHere();
    std::optional<MediaTime> next;
    for (const auto& entry : m_entries) {
        const auto own = entry->nextAfter(time);
        if (own && (!next || *own < *next))
            next = own;
    }
    return next;
}

void TimeObservers::played(MediaTime from, MediaTime to)
{
    m_affinity.assertHere();
    const auto entries = m_entries; // callbacks add, remove, and may destroy this
    for (const auto& entry : entries) {
        if (!entry->active)
            continue;
        const auto next = entry->nextAfter(from);
        if (!next || *next > to)
            continue;
        if (entry->periodic)
            entry->periodic(to);
        else if (entry->boundary)
            entry->boundary();
    }
}

void TimeObservers::jumped(MediaTime to)
{
    m_affinity.assertHere();
    const auto entries = m_entries;
    for (const auto& entry : entries)
        if (entry->active && entry->periodic)
            entry->periodic(to);
}

} // namespace platform
