/// Work on a thread of its own that may take for ever, because a file of somebody else's disk or network is in it.
///
/// Lives on a thread with a Qt event loop. Destroying it waits for nothing: what is still under way is left to itself.
#pragma once

#include "base/Affinity.h"

#include <atomic>
#include <functional>
#include <memory>
#include <mutex>

class QObject;

namespace host {

class DetachedWork {
public:
    /// Whom the work is for, as the work's thread sees it.
    class Client {
    public:
        /// False: nobody wants it any more, and it should end soon.
        bool isWaiting() const { return m_waiting; }
        /// Calls on the thread that started the work, in order; not once the DetachedWork has been destroyed.
        void post(std::function<void()> call);

    private:
        friend DetachedWork;

        std::atomic<bool> m_waiting = true;
        std::mutex m_mutex; // guards the receiver
        std::unique_ptr<QObject> m_receiver;
    };

    /// The work owns what it uses: it can outlive everything but the process.
    explicit DetachedWork(std::function<void(Client& client)> work);
    ~DetachedWork();
    DetachedWork(const DetachedWork&) = delete;
    DetachedWork& operator=(const DetachedWork&) = delete;

    /// Tells the work that nobody wants it any more. What it posts still comes.
    void cancel() { m_client->m_waiting = false; }

private:
    std::shared_ptr<Client> m_client;
    base::Affinity m_affinity;
};

} // namespace host
