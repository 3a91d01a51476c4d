#include "linux/devices/DeviceSearch.h"

#include <algorithm>
#include <utility>

namespace devices {

void DeviceSearch::begin(Ended ended)
{
    m_affinity.assertHere();
    m_ended = std::move(ended);
    environment().system.mainQueue.postAfter(kLimit, [weak = weak_from_this()] {
        if (const auto self = weak.lock())
            self->end();
    });
    ask();
}

void DeviceSearch::end()
{
    m_affinity.assertHere();
    const Ended ended = std::exchange(m_ended, {});
    if (!ended)
        return;
    m_calls.forget();
    Devices found = devices();
    std::stable_sort(found.begin(), found.end(),
                     [](const auto& one, const auto& other) { return one->deviceName() < other->deviceName(); });
    if (found.size() > kMostDevices)
        found.resize(kMostDevices);
    ended(std::move(found));
}

void DeviceSearch::connect(Bus& bus, std::function<void(const QDBusConnection& connection)> connected)
{
    ++m_open;
    bus.use([weak = weak_from_this(), connected = std::move(connected)](const QDBusConnection& connection) {
        const auto self = weak.lock();
        if (!self || !self->m_ended)
            return;
        if (connection.isConnected())
            connected(connection);
        self->answered();
    });
}

void DeviceSearch::ask(const QDBusConnection& bus, const QDBusMessage& question, Calls::Answer answer)
{
    ++m_open;
    m_calls.ask(bus, question, kLimit, [this, answer = std::move(answer)](const QDBusMessage& reply) {
        answer(reply);
        answered();
    });
}

void DeviceSearch::findOwner(const QDBusConnection& bus, const QString& name,
                             std::function<void(const QString& owner)> found)
{
    ask(bus, questionToBus("GetNameOwner", {name}), [found = std::move(found)](const QDBusMessage& reply) {
        if (isReply(reply, "s"))
            found(reply.arguments().constFirst().toString());
    });
}

void DeviceSearch::answered()
{
    if (--m_open > 0)
        return;
    // Later: a bus that is there already answers at once, while there is more to be asked.
    environment().system.mainQueue.post([weak = weak_from_this()] {
        if (const auto self = weak.lock(); self && self->m_open == 0)
            self->end();
    });
}

} // namespace devices
