#include "linux/dbus/ExtensionLink.h"

#include "linux/dbus/DisconnectWatch.h"
#include "linux/dbus/Protocol.h"
#include "linux/dbus/Reply.h"
#include "linux/dbus/Wire.h"

#include <limits>
#include <utility>

namespace dbus {

namespace {

/// A movie that must be copied first is there when it is there; a host that has gone ends the wait.
constexpr int kNoLimit = std::numeric_limits<int>::max();
constexpr int kPingLimitMilliseconds = 20'000;

base::ErrorRef connectionEnded()
{
    return base::Error::make(kErrorDomain, kNotConnected, "the connection to the host has ended");
}

} // namespace

ExtensionLink::ExtensionLink(QDBusConnection connection, std::function<void()> ended)
    : m_connection(std::move(connection)), m_ended(std::move(ended))
{
    m_thread.setObjectName(QStringLiteral("host"));
    m_worker.moveToThread(&m_thread);
    m_thread.start();
    QMetaObject::invokeMethod(&m_worker, [this] {
        auto* watch = new DisconnectWatch(
            [this] {
                endOnWorker(connectionEnded());
                m_ended();
            },
            &m_worker);
        watch->watch(m_connection);
    });
}

ExtensionLink::~ExtensionLink()
{
    QMetaObject::invokeMethod(
        &m_worker,
        [this] {
            // No reply and no ending is heard from now on.
            qDeleteAll(m_worker.children());
            endOnWorker(connectionEnded());
        },
        Qt::BlockingQueuedConnection);
    m_thread.quit();
    m_thread.wait();
    QDBusConnection::disconnectFromPeer(m_connection.name());
}

void ExtensionLink::load(std::uint32_t item, std::uint32_t attachment, std::string type,
                         platform::ItemProvider::LoadCompletion completion)
{
    QMetaObject::invokeMethod(
        &m_worker, [this, item, attachment, type = std::move(type), completion = std::move(completion)]() mutable {
            if (!m_connection.isConnected()) {
                completion({}, connectionEnded());
                return;
            }
            auto message = QDBusMessage::createMethodCall(QString(), QLatin1String(kHostPath),
                                                          QLatin1String(kRuntimeInterface), QStringLiteral("LoadItem"));
            message << item << attachment << toQt(type);
            const std::uint64_t load = ++m_lastLoad;
            m_loads.emplace(load, std::move(completion));
            whenAnswered(m_connection.asyncCall(message, kNoLimit), m_worker,
                         [this, load, type = std::move(type)](const QDBusMessage& reply) {
                             auto found = m_loads.extract(load);
                             if (found.empty())
                                 return;
                             const auto loaded = itemFromReply(reply, type);
                             found.mapped()(loaded ? loaded.value() : runtime::Value(), loaded.error());
                         });
        });
}

bool ExtensionLink::send(const QDBusMessage& message, std::function<void(const base::ErrorRef&)> failed)
{
    {
        const std::lock_guard lock(m_mutex);
        if (m_hasEnded)
            return false;
    }
    if (!m_connection.send(message))
        return false;
    {
        const std::lock_guard lock(m_mutex);
        ++m_underWay;
    }
    const auto ping = QDBusMessage::createMethodCall(
        QString(), QLatin1String(kHostPath), QStringLiteral("org.freedesktop.DBus.Peer"), QStringLiteral("Ping"));
    const QDBusPendingCall answer = m_connection.asyncCall(ping, kPingLimitMilliseconds);
    QMetaObject::invokeMethod(&m_worker, [this, answer, failed = std::move(failed)] {
        whenAnswered(answer, m_worker, [this, failed](const QDBusMessage& reply) {
            // Without a connection the ending is told instead.
            if (reply.type() == QDBusMessage::ErrorMessage && m_connection.isConnected())
                failed(errorFromReply(reply));
            messageArrived();
        });
    });
    return true;
}

bool ExtensionLink::flush(std::chrono::milliseconds limit)
{
    std::unique_lock lock(m_mutex);
    return m_changed.wait_for(lock, limit, [this] { return m_hasEnded || m_underWay == 0; });
}

void ExtensionLink::endOnWorker(const base::ErrorRef& why)
{
    {
        const std::lock_guard lock(m_mutex);
        m_hasEnded = true;
    }
    m_changed.notify_all();
    for (auto& [load, completion] : std::exchange(m_loads, {}))
        completion({}, why);
}

void ExtensionLink::messageArrived()
{
    {
        const std::lock_guard lock(m_mutex);
        --m_underWay;
    }
    m_changed.notify_all();
}

} // namespace dbus
