/// Where time comes from. Everything that waits or dates asks a Clock, so that tests can drive time; any thread.
#pragma once

#include "base/Date.h"

#include <atomic>
#include <chrono>

namespace base {

/// Time since an arbitrary start; never goes back.
using Instant = std::chrono::nanoseconds;

class Clock {
public:
    virtual ~Clock() = default;

    /// Monotonic time, for waiting and measuring.
    virtual Instant now() const = 0;
    /// Calendar time, for names and dates.
    virtual Date date() const = 0;
};

/// The machine's own clocks.
class SystemClock final : public Clock {
public:
    Instant now() const override;
    Date date() const override;
};

/// Time that stands still until it is told to go on; both kinds advance together.
class ManualClock final : public Clock {
public:
    explicit ManualClock(Date start = {1'700'000'000.0}) : m_start(start) {}

    Instant now() const override { return Instant(m_elapsed.load()); }
    Date date() const override { return {m_start.secondsSince1970 + std::chrono::duration<double>(now()).count()}; }

    void advance(Instant by) { m_elapsed += by.count(); }

private:
    Date m_start;
    std::atomic<Instant::rep> m_elapsed{0};
};

} // namespace base
