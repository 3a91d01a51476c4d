/// SIGINT, SIGTERM and SIGHUP as calls from the event loop. Lives on the main thread.
#pragma once

#include "linux/posix/FileDescriptor.h"

#include <functional>
#include <memory>

class QSocketNotifier;

namespace host {

/// Keeps the signals from ending this process at once; before the first thread is started.
void blockTerminationSignals();

class TerminationSignals {
public:
    explicit TerminationSignals(std::function<void(int number)> arrived);
    ~TerminationSignals();

private:
    posix::FileDescriptor m_descriptor;
    std::unique_ptr<QSocketNotifier> m_notifier;
};

} // namespace host
