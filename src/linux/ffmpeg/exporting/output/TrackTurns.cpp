#include "linux/ffmpeg/exporting/output/TrackTurns.h"

#include <chrono>
#include <utility>

namespace ffmpeg {

using base::Result;

namespace {

/// So many seconds of one track follow each other: fewer chunks make a smaller index and larger reads.
constexpr double kTurn = 0.5;

/// What is read ahead at most, and one turn more.
constexpr std::size_t kBytesAhead = 8 << 20;

/// Turns are handed over many at once: the two threads would spend their time waking each other. But when encoding
/// brings little, whoever shows progress does not wait for more than this.
constexpr std::size_t kBytesAtOnce = kBytesAhead / 4;
constexpr auto kPatience = std::chrono::milliseconds(20);

std::size_t sizeOf(const TrackTurns::Turn& turn)
{
    std::size_t size = 0;
    for (const auto& packet : turn.packets)
        size += static_cast<std::size_t>(packet->size);
    return size;
}

} // namespace

TrackTurns::TrackTurns(const std::vector<Track>& tracks)
{
    for (const Track& each : tracks) {
        each.source->detach();
        m_readings.push_back({each, nullptr});
    }
    m_thread = std::jthread([this] {
        auto end = readAll();
        for (const Reading& each : m_readings)
            each.track.source->detach();
        const std::lock_guard lock(m_mutex);
        m_end = std::move(end);
        m_changed.notify_all();
    });
}

TrackTurns::~TrackTurns()
{
    m_affinity.assertHere();
    const std::lock_guard lock(m_mutex);
    m_isUnwanted = true;
    m_changed.notify_all();
}

Result<void> TrackTurns::fetch(Reading& reading)
{
    reading.next = newPacket();
    const auto more = reading.track.source->next(*reading.next);
    if (!more)
        return more.error();
    if (more.value())
        av_packet_rescale_ts(reading.next.get(), reading.track.sourceTicks, reading.track.ticks);
    else
        reading.next = nullptr;
    return {};
}

Result<void> TrackTurns::readAll()
{
    for (Reading& each : m_readings) {
        if (auto done = fetch(each); !done)
            return done;
        if (!each.next && !give({static_cast<std::size_t>(&each - m_readings.data()), {}, true}))
            return {};
    }
    for (;;) {
        Reading* behind = nullptr;
        for (Reading& each : m_readings)
            if (each.next && (!behind || each.seconds() < behind->seconds()))
                behind = &each;
        if (!behind)
            return {};
        Turn turn;
        turn.track = static_cast<std::size_t>(behind - m_readings.data());
        const double until = behind->seconds() + kTurn;
        while (behind->next && behind->seconds() < until) {
            turn.packets.push_back(std::move(behind->next));
            if (auto done = fetch(*behind); !done)
                return done;
        }
        turn.isLast = !behind->next;
        if (!give(std::move(turn)))
            return {};
    }
}

bool TrackTurns::give(Turn turn)
{
    std::unique_lock lock(m_mutex);
    m_changed.wait(lock, [&] { return m_bytes < kBytesAhead || m_isUnwanted; });
    m_bytes += sizeOf(turn);
    m_read.push_back(std::move(turn));
    if (m_bytes >= kBytesAtOnce)
        m_changed.notify_all();
    return !m_isUnwanted;
}

Result<std::optional<TrackTurns::Turn>> TrackTurns::next()
{
    m_affinity.assertHere();
    if (m_taken.empty()) {
        std::unique_lock lock(m_mutex);
        while (m_read.empty() && !m_end)
            m_changed.wait_for(lock, kPatience, [&] { return m_bytes >= kBytesAtOnce || m_end; });
        if (m_read.empty())
            return *m_end ? Result<std::optional<Turn>>(std::nullopt) : m_end->error();
        m_taken.swap(m_read);
        m_bytes = 0;
        m_changed.notify_all();
    }
    Turn turn = std::move(m_taken.front());
    m_taken.pop_front();
    return std::optional(std::move(turn));
}

} // namespace ffmpeg
