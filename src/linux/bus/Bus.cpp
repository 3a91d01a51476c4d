#include "linux/bus/Bus.h"

#undef signals // GIO has a member of that name
#include <gio/gio.h>
#include <mutex>
#include <optional>
#include <thread>
#include <utility>
#include <vector>

namespace bus {

namespace {

/// Whether it answers who connects. Qt has one thread for all connections of a process, waits on it for the bus to say
/// hello for as long as that takes, and joins it at the process's end: one bus that is stuck would hold up our host's
/// messages as well, and us for ever.
bool letsUsIn(GBusType bus)
{
    gchar* const address = g_dbus_address_get_for_bus_sync(bus, nullptr, nullptr);
    if (!address)
        return false;
    const auto flags = static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT
                                                         | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
    GDBusConnection* const trial = g_dbus_connection_new_for_address_sync(address, flags, nullptr, nullptr, nullptr);
    g_free(address);
    if (!trial)
        return false;
    g_dbus_connection_close_sync(trial, nullptr, nullptr);
    g_object_unref(trial);
    return true;
}

/// What is not connected.
QDBusConnection nothing()
{
    return QDBusConnection(QString());
}

} // namespace

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
    return [] { return letsUsIn(G_BUS_TYPE_SESSION) ? QDBusConnection::sessionBus() : nothing(); };
}

Bus::Connect Bus::system()
{
    return [] { return letsUsIn(G_BUS_TYPE_SYSTEM) ? QDBusConnection::systemBus() : nothing(); };
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
