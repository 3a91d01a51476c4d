#include "app/host/TerminationSignals.h"

#include <QSocketNotifier>

#include <csignal>
#include <iterator>
#include <poll.h>
#include <sys/signalfd.h>
#include <unistd.h>
#include <utility>

namespace host {

namespace {

posix::FileDescriptor blockAndOpenSignals()
{
    sigset_t signals = {};
    for (const int number : {SIGINT, SIGTERM, SIGHUP})
        ::sigaddset(&signals, number);
    ::pthread_sigmask(SIG_BLOCK, &signals, nullptr);
    return posix::FileDescriptor(::signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK));
}

} // namespace

TerminationWatch::TerminationWatch() : m_signals(blockAndOpenSignals()), m_thread([this] { run(); }) {}

TerminationWatch::~TerminationWatch()
{
    m_affinity.assertHere();
    m_ending.happen();
    m_thread.join();
}

void TerminationWatch::run()
{
    for (;;) {
        pollfd inputs[] = {{m_ending.descriptor(), POLLIN, {}}, {m_signals.get(), POLLIN, {}}};
        ::poll(inputs, std::size(inputs), -1);
        if (inputs[0].revents != 0)
            return;
        signalfd_siginfo information = {};
        if (::read(m_signals.get(), &information, sizeof information) != sizeof information)
            continue;
        const int number = static_cast<int>(information.ssi_signo);
        if (m_arrived != 0)
            ::_exit(128 + number); // whatever the others are waiting for
        m_arrived = number;
        m_told.happen();
    }
}

TerminationSignals::TerminationSignals(std::function<void(int number)> arrived)
    : m_notifier(std::make_unique<QSocketNotifier>(m_watch.descriptor(), QSocketNotifier::Read))
{
    QObject::connect(m_notifier.get(), &QSocketNotifier::activated, m_notifier.get(),
                     [this, arrived = std::move(arrived)] {
                         m_notifier->setEnabled(false);
                         arrived(m_watch.arrived());
                     });
}

TerminationSignals::~TerminationSignals() = default;

} // namespace host
