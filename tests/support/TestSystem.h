/// A machine that tests drive by hand: time stands still, workers run when told, and the log is kept.
/// Main thread only, but for what a test posts itself.
#pragma once

#include "base/System.h"

#include <cstddef>

namespace tests {

struct TestSystem {
    base::ManualClock clock;
    base::MemoryLog log;
    base::MainQueue mainQueue{clock};
    base::ManualQueue backgroundQueue;
    base::ManualQueue defaultQueue;
    base::System system{log, clock, mainQueue, backgroundQueue, defaultQueue};

    /// The clock starts at `start`.
    explicit TestSystem(base::Date start = {1'700'000'000.0}) : clock(start) {}
    TestSystem(const TestSystem&) = delete;
    TestSystem& operator=(const TestSystem&) = delete;

    /// Runs workers and the main queue by turns until none has anything due; delayed tasks wait for the clock.
    void drain()
    {
        std::size_t ran = 0;
        do {
            ran = backgroundQueue.drain() + defaultQueue.drain() + mainQueue.runDue();
        } while (ran > 0);
    }

    /// Lets time pass at once, then runs what has become due.
    void advance(base::Instant by)
    {
        clock.advance(by);
        drain();
    }
};

} // namespace tests
