/// Runs the main queue inside Qt's event loop. Made, used and ended on the main thread, after the QCoreApplication.
#pragma once

#include "base/Affinity.h"
#include "base/Queue.h"

#include <QObject>
#include <QTimer>

namespace loop {

/// Each wake becomes one posted event, however often the queue is woken before it arrives. Every turn runs what is due
/// and no more, so input and pictures get their turn between tasks that post each other.
class MainLoop final : public QObject {
public:
    explicit MainLoop(base::MainQueue& queue);
    /// Takes its wake out of the queue again: no thread may be inside `post()` then.
    ~MainLoop() override;

protected:
    bool event(QEvent* event) override;

private:
    void runDue();

    base::MainQueue& m_queue;
    QTimer m_timer;
    std::atomic<bool> m_posted = false;
    base::Affinity m_affinity;
};

} // namespace loop
