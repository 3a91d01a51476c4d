/// Queues of tasks: the main queue, on which everything that a user sees lives, and workers beside it.
#pragma once

#include "base/Clock.h"

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

namespace base {

using Task = std::function<void()>;

/// Runs tasks one after the other, in the order in which they were posted.
class Queue {
public:
    virtual ~Queue() = default;

    /// Any thread; returns at once.
    virtual void post(Task task) = 0;

    /// Whether the caller is a task of this queue (or, for the main queue, its thread).
    virtual bool isCurrent() const = 0;

    /// Runs `task` on this queue and waits for it; at once when already there.
    void run(const Task& task);
};

/// The main queue. It has no thread of its own: an event loop, or a test, runs what is due on the thread that made it.
class MainQueue final : public Queue {
public:
    /// `wake` is called, on any thread, whenever there may be something new to run.
    explicit MainQueue(const Clock& clock, std::function<void()> wake = {});

    void post(Task task) override;
    bool isCurrent() const override;

    /// Runs `task` once, not before `delay` has passed on the clock. Any thread.
    void postAfter(Instant delay, Task task);

    void setWake(std::function<void()> wake);

    /// Runs what is due now, but nothing that is posted meanwhile. Gives the number of tasks that ran.
    std::size_t runDue();
    /// Runs until nothing is due, tasks posted meanwhile included.
    void drain();
    /// How long until the next delayed task is due; nothing when none waits. Zero when something is due already.
    std::optional<Instant> untilNext() const;

private:
    struct Delayed {
        Instant due;
        std::uint64_t order;
        Task task;
    };

    const Clock& m_clock;
    std::thread::id m_thread = std::this_thread::get_id();

    mutable std::mutex m_mutex;
    std::function<void()> m_wake;
    std::deque<Task> m_tasks;
    std::vector<Delayed> m_delayed;
    std::uint64_t m_order = 0;
};

/// A worker with one thread. The destructor finishes what was posted before it, then joins.
class WorkerQueue final : public Queue {
public:
    /// `onStart` runs first on the worker's thread: to name it, or to lower its priority.
    explicit WorkerQueue(std::function<void()> onStart = {});
    ~WorkerQueue() override;

    void post(Task task) override;
    bool isCurrent() const override;
    /// Waits until everything that was posted before has run.
    void finish();

private:
    void loop(const std::function<void()>& onStart);

    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::deque<Task> m_tasks;
    bool m_stopping = false;
    std::thread m_thread;
};

/// A queue that tests run by hand, in place of a worker.
class ManualQueue final : public Queue {
public:
    void post(Task task) override;
    bool isCurrent() const override { return m_running; }

    /// Runs until nothing is left; gives the number of tasks that ran.
    std::size_t drain();
    std::size_t pending() const;

private:
    mutable std::mutex m_mutex;
    std::deque<Task> m_tasks;
    bool m_running = false;
};

} // namespace base
