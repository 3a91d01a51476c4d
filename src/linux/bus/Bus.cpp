#include "linux/bus/Bus.h"

#include <mutex>
#include <optional>
#include <thread>
#include <utility>
#include <vector>

namespace bus {

struct Bus::State {
    Connect connect;

    // On the main queue.
    std::optional<QDBusConnection> connection;
    std::vector<std::function<void(const QDBusConnection&)>> waiting;

    std::mutex mutex;       ///< guards what follows
    base::MainQueue* queue; ///< none once nobody waits any more
};

Bus::Connect Bus::session()
{
    return [] { return QDBusConnection::sessionBus(); };
}

Bus::Connect Bus::system()
{
    return [] { return QDBusConnection::systemBus(); };
}

Bus::Bus(base::MainQueue& queue, Connect connect) : m_state(std::make_shared<State>())
{
    m_state->connect = std::move(connect);
    m_state->queue = &queue;
}

Bus::~Bus()
{
    m_affinity.assertHere();
    m_state->waiting.clear();
    const std::lock_guard lock(m_state->mutex);
    m_state->queue = nullptr;
}

void Bus::use(std::function<void(const QDBusConnection& bus)> use)
{
    m_affinity.assertHere();
    if (m_state->connection && m_state->connection->isConnected()) {
        const QDBusConnection connection = *m_state->connection;
        use(connection);
        return;
    }
    m_state->waiting.push_back(std::move(use));
    if (m_state->waiting.size() > 1)
        return;
    std::thread([state = m_state] {
        const QDBusConnection made = state->connect();
        const std::lock_guard lock(state->mutex);
        if (!state->queue)
            return;
        state->queue->post([state, made] {
            state->connection = made;
            for (const auto& each : std::exchange(state->waiting, {}))
                each(made);
        });
    }).detach();
}

} // namespace bus
