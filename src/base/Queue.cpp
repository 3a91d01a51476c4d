#include "base/Queue.h"

#include <algorithm>
#include <future>
#include <memory>
#include <utility>

namespace base {

void Queue::run(const Task& task)
{
    if (isCurrent()) {
        task();
        return;
    }
    // Shared: the caller goes on, and off its stack, while the task is still about to leave set_value().
    const auto done = std::make_shared<std::promise<void>>();
    const auto finished = done->get_future();
    post([&task, done] {
        task();
        done->set_value();
    });
    finished.wait();
}

MainQueue::MainQueue(const Clock& clock, std::function<void()> wake) : m_clock(clock), m_wake(std::move(wake)) {}

void MainQueue::post(Task task)
{
    std::function<void()> wake;
    {
        const std::lock_guard lock(m_mutex);
        m_tasks.push_back(std::move(task));
        wake = m_wake;
    }
    if (wake)
        wake();
}

bool MainQueue::isCurrent() const
{
    return std::this_thread::get_id() == m_thread;
}

void MainQueue::postAfter(Instant delay, Task task)
{
    std::function<void()> wake;
    {
        const std::lock_guard lock(m_mutex);
        m_delayed.push_back({m_clock.now() + delay, m_order++, std::move(task)});
        wake = m_wake;
    }
    if (wake)
        wake();
}

void MainQueue::setWake(std::function<void()> wake)
{
    const std::lock_guard lock(m_mutex);
    m_wake = std::move(wake);
}

std::size_t MainQueue::runDue()
{
    std::deque<Task> due;
    {
        const std::lock_guard lock(m_mutex);
        due.swap(m_tasks);
        const Instant now = m_clock.now();
        const auto waiting = std::stable_partition(m_delayed.begin(), m_delayed.end(),
                                                   [now](const Delayed& delayed) { return delayed.due <= now; });
        std::sort(m_delayed.begin(), waiting, [](const Delayed& a, const Delayed& b) {
            return std::pair(a.due, a.order) < std::pair(b.due, b.order);
        });
        for (auto it = m_delayed.begin(); it != waiting; ++it)
            due.push_back(std::move(it->task));
        m_delayed.erase(m_delayed.begin(), waiting);
    }
    for (Task& task : due) {
        task();
        task = nullptr; // what the task held dies before the next one runs
    }
    return due.size();
}

void MainQueue::drain()
{
    while (runDue() > 0) {}
}

std::optional<Instant> MainQueue::untilNext() const
{
    const std::lock_guard lock(m_mutex);
    if (!m_tasks.empty())
        return Instant(0);
    if (m_delayed.empty())
        return std::nullopt;
    const auto next = std::min_element(m_delayed.begin(), m_delayed.end(),
                                       [](const Delayed& a, const Delayed& b) { return a.due < b.due; });
    return std::max(Instant(0), next->due - m_clock.now());
}

WorkerQueue::WorkerQueue(std::function<void()> onStart)
    : m_thread([this, onStart = std::move(onStart)] { loop(onStart); })
{
}

WorkerQueue::~WorkerQueue()
{
    {
        const std::lock_guard lock(m_mutex);
        m_stopping = true;
    }
    m_changed.notify_all();
    m_thread.join();
}

void WorkerQueue::post(Task task)
{
    {
        const std::lock_guard lock(m_mutex);
        m_tasks.push_back(std::move(task));
    }
    m_changed.notify_all();
}

bool WorkerQueue::isCurrent() const
{
    return std::this_thread::get_id() == m_thread.get_id();
}

void WorkerQueue::finish()
{
    run([] {});
}

void WorkerQueue::loop(const std::function<void()>& onStart)
{
    if (onStart)
        onStart();
    for (;;) {
        Task task;
        {
            std::unique_lock lock(m_mutex);
            m_changed.wait(lock, [this] { return m_stopping || !m_tasks.empty(); });
            if (m_tasks.empty())
                return;
            task = std::move(m_tasks.front());
            m_tasks.pop_front();
        }
        task();
    }
}

void ManualQueue::post(Task task)
{
    const std::lock_guard lock(m_mutex);
    m_tasks.push_back(std::move(task));
}

std::size_t ManualQueue::drain()
{
    std::size_t ran = 0;
    for (;; ++ran) {
        Task task;
        {
            const std::lock_guard lock(m_mutex);
            if (m_tasks.empty())
                return ran;
            task = std::move(m_tasks.front());
            m_tasks.pop_front();
        }
        m_running = true;
        task();
        m_running = false;
    }
}

std::size_t ManualQueue::pending() const
{
    const std::lock_guard lock(m_mutex);
    return m_tasks.size();
}

} // namespace base
