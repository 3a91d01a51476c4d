#include "linux/loop/MainLoop.h"

#include <QCoreApplication>
#include <QEvent>

#include <algorithm>

namespace loop {

namespace {

const QEvent::Type kWake = static_cast<QEvent::Type>(QEvent::registerEventType());

} // namespace

MainLoop::MainLoop(base::MainQueue& queue) : m_queue(queue)
{
    m_timer.setSingleShot(true);
    m_timer.setTimerType(Qt::PreciseTimer);
    connect(&m_timer, &QTimer::timeout, this, &MainLoop::runDue);
    m_queue.setWake([this] {
        if (!m_posted.exchange(true))
            QCoreApplication::postEvent(this, new QEvent(kWake));
    });
    // What was posted before there was a loop.
    m_posted = true;
    QCoreApplication::postEvent(this, new QEvent(kWake));
}

MainLoop::~MainLoop()
{
    m_affinity.assertHere();
    m_queue.setWake({});
}

bool MainLoop::event(QEvent* event)
{
    if (event->type() != kWake)
        return QObject::event(event);
    // Cleared before running: a task posted from now on wakes anew.
    m_posted = false;
    runDue();
    return true;
}

void MainLoop::runDue()
{
    m_queue.runDue();
    const auto next = m_queue.untilNext();
    if (!next) {
        m_timer.stop();
        return;
    }
    // Rounded up: a timer that fires too early would spin until the task is due.
    m_timer.start(std::chrono::ceil<std::chrono::milliseconds>(std::max(*next, base::Instant(0))));
}

} // namespace loop
