#include "app/editor/WorkWatch.h"

#include <atomic>
#include <utility>

namespace app {

/// What tasks on their way to the main queue hold: they do nothing once the watch has gone.
struct WorkWatch::Link {
    WorkWatch* watch = nullptr; ///< main queue
    std::atomic<bool> updateIsDue = false;
};

WorkWatch::WorkWatch(base::MainQueue& mainQueue, base::WorkList& list, Handlers handlers)
    : m_mainQueue(mainQueue), m_list(list), m_handlers(std::move(handlers)), m_link(std::make_shared<Link>())
{
    m_link->watch = this;
    m_list.setChangeHandler([&mainQueue, link = m_link] {
        // One task at a time, however often an export tells how far it is.
        if (link->updateIsDue.exchange(true))
            return;
        mainQueue.post([link] {
            link->updateIsDue = false;
            if (link->watch)
                link->watch->update();
        });
    });
}

WorkWatch::~WorkWatch()
{
    m_affinity.assertHere();
    m_list.setChangeHandler({});
    m_link->watch = nullptr;
}

void WorkWatch::update()
{
    const bool working = isWorking();
    if (std::exchange(m_working, working) == working) {
        if (m_shown)
            show();
        return;
    }
    if (working) {
        m_mainQueue.postAfter(kDelay, [link = m_link, serial = ++m_serial] {
            if (link->watch && link->watch->m_working && link->watch->m_serial == serial)
                link->watch->show();
        });
        m_handlers.begun();
        return;
    }
    if (std::exchange(m_shown, false))
        m_handlers.hide();
    m_handlers.ended();
}

void WorkWatch::show()
{
    m_shown = true;
    m_handlers.show(m_list.progress());
}

} // namespace app
