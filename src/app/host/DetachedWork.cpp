#include "app/host/DetachedWork.h"

#include <QObject>

#include <thread>
#include <utility>

namespace host {

void DetachedWork::Client::post(std::function<void()> call)
{
    const std::lock_guard lock(m_mutex);
    if (m_receiver)
        QMetaObject::invokeMethod(m_receiver.get(), std::move(call), Qt::QueuedConnection);
}

DetachedWork::DetachedWork(std::function<void(Client& client)> work) : m_client(std::make_shared<Client>())
{
    m_client->m_receiver = std::make_unique<QObject>();
    std::thread([client = m_client, work = std::move(work)] { work(*client); }).detach();
}

DetachedWork::~DetachedWork()
{
    m_affinity.assertHere();
    cancel();
    std::unique_ptr<QObject> receiver;
    {
        const std::lock_guard lock(m_client->m_mutex);
        receiver = std::move(m_client->m_receiver);
    }
    // Destroyed here, and with it what has been posted: on its own thread.
}

} // namespace host
