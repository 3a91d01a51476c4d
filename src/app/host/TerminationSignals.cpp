#include "app/host/TerminationSignals.h"

#include <QSocketNotifier>

#include <csignal>
#include <sys/signalfd.h>
#include <unistd.h>
#include <utility>

namespace host {

namespace {

sigset_t terminationSignals()
{
    sigset_t signals;
    ::sigemptyset(&signals);
    for (const int number : {SIGINT, SIGTERM, SIGHUP})
        ::sigaddset(&signals, number);
    return signals;
}

} // namespace

void blockTerminationSignals()
{
    const sigset_t signals = terminationSignals();
    ::pthread_sigmask(SIG_BLOCK, &signals, nullptr);
}

TerminationSignals::TerminationSignals(std::function<void(int number)> arrived)
{
    const sigset_t signals = terminationSignals();
    m_descriptor = posix::FileDescriptor(::signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK));
    m_notifier = std::make_unique<QSocketNotifier>(m_descriptor.get(), QSocketNotifier::Read);
    QObject::connect(m_notifier.get(), &QSocketNotifier::activated, m_notifier.get(),
                     [descriptor = m_descriptor.get(), arrived = std::move(arrived)] {
                         signalfd_siginfo information = {};
                         if (::read(descriptor, &information, sizeof information) == sizeof information)
                             arrived(static_cast<int>(information.ssi_signo));
                     });
}

TerminationSignals::~TerminationSignals() = default;

} // namespace host
