/// Waits for what workers post to the main queue: no sleeping, and a deadline against hanging.
#pragma once

#include "base/Queue.h"

#include <chrono>
#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>

namespace tests {

/// Runs the main queue until `predicate` holds, woken by whatever is posted. False when `deadline` has passed first.
/// Call it on the main queue's thread. Delayed tasks run when their clock has come; see `tests::EngineTest` for driving
/// one. Replaces the queue's wake function while it waits.
inline bool waitUntil(base::MainQueue& mainQueue, const std::function<bool()>& predicate,
                      std::chrono::milliseconds deadline = std::chrono::seconds(20))
{
    struct Signal {
        std::mutex mutex;
        std::condition_variable changed;
        bool woken = false;
    };
    const auto signal = std::make_shared<Signal>();
    mainQueue.setWake([signal] {
        {
            const std::lock_guard lock(signal->mutex);
            signal->woken = true;
        }
        signal->changed.notify_all();
    });
    const auto until = std::chrono::steady_clock::now() + deadline;
    bool holds = false;
    for (;;) {
        mainQueue.drain();
        holds = predicate();
        if (holds || std::chrono::steady_clock::now() >= until)
            break;
        auto next = until;
        if (const auto delay = mainQueue.untilNext())
            next = std::min(next, std::chrono::steady_clock::now() + *delay);
        std::unique_lock lock(signal->mutex);
        signal->changed.wait_until(lock, next, [&] { return signal->woken; });
        signal->woken = false;
    }
    mainQueue.setWake({});
    return holds;
}

} // namespace tests
