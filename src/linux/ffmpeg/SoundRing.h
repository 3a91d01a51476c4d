/// Samples on their way from the mixer to the device, by their place on the movie's time line.
///
/// One thread writes, one reads, neither waits. A device that is ahead of the mixer hears silence and time goes on: what
/// comes too late is passed over, so sound never lags behind the pictures. Nor does that of a device that comes late.
#pragma once

#include <algorithm>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace ffmpeg {

class SoundRing {
public:
    explicit SoundRing(std::size_t frames) : m_samples(frames * 2), m_capacity(static_cast<std::int64_t>(frames)) {}

    /// From now on position `frame` comes next. Only while nobody reads.
    void reset(std::int64_t frame)
    {
        m_written = frame;
        m_read = frame;
        m_earliest = frame;
        m_skipped = 0;
    }

    /// What lies before `frame` is no longer wanted: the next that is read is this or a later one. Any thread.
    void hurryTo(std::int64_t frame) { m_earliest = frame; }
    /// How many frames were left out for that since reset(). Any thread.
    std::int64_t skipped() const { return m_skipped; }

    /// What the writer is to write next: where it stopped, or where the reader is when that is ahead.
    std::int64_t next() const { return std::max(m_written.load(), m_read.load()); }
    /// How many frames behind next() there is room for.
    std::size_t room() const
    {
        return static_cast<std::size_t>(std::max<std::int64_t>(0, m_read + m_capacity - next()));
    }
    /// `frames` pairs that begin at position `from`; no more than room() said.
    void write(std::int64_t from, const float* samples, std::size_t frames)
    {
        for (std::size_t i = 0; i < frames; ++i) {
            float* slot = at(from + static_cast<std::int64_t>(i));
            slot[0] = samples[2 * i];
            slot[1] = samples[2 * i + 1];
        }
        m_written.store(from + static_cast<std::int64_t>(frames), std::memory_order_release);
    }

    /// The next `frames` pairs; silence where nothing was written in time.
    void read(float* into, std::size_t frames)
    {
        const std::int64_t late = std::max<std::int64_t>(0, m_earliest - m_read);
        m_skipped += late;
        const std::int64_t from = m_read + late;
        const std::int64_t written = m_written.load(std::memory_order_acquire);
        const auto ready =
            static_cast<std::size_t>(std::clamp<std::int64_t>(written - from, 0, static_cast<std::int64_t>(frames)));
        for (std::size_t i = 0; i < ready; ++i) {
            const float* slot = at(from + static_cast<std::int64_t>(i));
            into[2 * i] = slot[0];
            into[2 * i + 1] = slot[1];
        }
        std::fill(into + 2 * ready, into + 2 * frames, 0.0f);
        m_read.store(from + static_cast<std::int64_t>(frames), std::memory_order_release);
    }

private:
    float* at(std::int64_t frame) { return m_samples.data() + 2 * (((frame % m_capacity) + m_capacity) % m_capacity); }

    std::vector<float> m_samples;
    std::int64_t m_capacity;
    std::atomic<std::int64_t> m_written{0};
    std::atomic<std::int64_t> m_read{0};
    std::atomic<std::int64_t> m_earliest{0};
    std::atomic<std::int64_t> m_skipped{0};
};

} // namespace ffmpeg
