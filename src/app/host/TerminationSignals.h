/// SIGINT, SIGTERM and SIGHUP: the first that comes asks us to end, the second ends the process at once.
///
/// They are waited for on a thread of their own, because every other one can be held up by a file on a slow disk.
#pragma once

#include "base/Affinity.h"
#include "linux/posix/Event.h"
#include "linux/posix/FileDescriptor.h"

#include <atomic>
#include <functional>
#include <memory>
#include <thread>

class QSocketNotifier;

namespace host {

/// From its beginning on the signals end nothing by themselves. One at a time, on the main thread, and made before any
/// other thread.
class TerminationWatch {
public:
    TerminationWatch();
    ~TerminationWatch();
    TerminationWatch(const TerminationWatch&) = delete;
    TerminationWatch& operator=(const TerminationWatch&) = delete;

    /// The signal that came; 0 when none did. Any thread.
    int arrived() const { return m_arrived; }
    /// Can be read from as soon as one has come; not to be read from.
    int descriptor() const
    {
        m_affinity.assertHere();
        return m_told.descriptor();
    }

private:
    void run();

    base::Affinity m_affinity;
    std::atomic<int> m_arrived = 0;
    posix::FileDescriptor m_signals;
    posix::Event m_told;
    posix::Event m_ending;
    std::thread m_thread;
};

/// The same as a call from the main thread's Qt event loop: once.
class TerminationSignals {
public:
    explicit TerminationSignals(std::function<void(int number)> arrived);
    ~TerminationSignals();

private:
    TerminationWatch m_watch;
    std::unique_ptr<QSocketNotifier> m_notifier;
};

} // namespace host
