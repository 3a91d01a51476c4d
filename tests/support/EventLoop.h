/// Waits for what arrives in a Qt event loop: no sleeping, and a deadline against hanging. The thread of the loop only.
#pragma once

#include "base/Queue.h"

#include <QAbstractEventDispatcher>
#include <QCoreApplication>
#include <QTimer>

#include <atomic>
#include <chrono>
#include <functional>
#include <future>
#include <memory>
#include <thread>

namespace tests {

/// Handles events until `predicate` holds; false when `deadline` has passed first.
inline bool pumpUntil(const std::function<bool()>& predicate,
                      std::chrono::milliseconds deadline = std::chrono::seconds(30))
{
    bool late = false;
    QTimer timer;
    QObject::connect(&timer, &QTimer::timeout, [&late] { late = true; });
    timer.start(deadline);
    while (!predicate()) {
        if (late)
            return false;
        QCoreApplication::processEvents(QEventLoop::WaitForMoreEvents);
    }
    return true;
}

/// The same, and runs what is posted to `mainQueue` meanwhile.
inline bool pumpUntil(base::MainQueue& mainQueue, const std::function<bool()>& predicate)
{
    auto* const dispatcher = QAbstractEventDispatcher::instance();
    mainQueue.setWake([dispatcher] { dispatcher->wakeUp(); });
    const bool holds = pumpUntil([&] {
        mainQueue.drain();
        return predicate();
    });
    mainQueue.setWake({});
    return holds;
}

/// Runs something that blocks on a thread of its own while this thread handles events; gives its result.
template <typename Work> auto whilePumping(Work&& work)
{
    auto* const dispatcher = QAbstractEventDispatcher::instance();
    std::atomic<bool> done = false;
    auto result = std::async(std::launch::async, [&] {
        struct Finally {
            std::atomic<bool>& done;
            QAbstractEventDispatcher* dispatcher;
            ~Finally()
            {
                done = true;
                dispatcher->wakeUp();
            }
        } finally{done, dispatcher};
        return work();
    });
    pumpUntil([&] { return done.load(); }, std::chrono::minutes(2));
    return result.get();
}

} // namespace tests
