#include "linux/dbus/DisconnectWatch.h"

#include <utility>

namespace dbus {

DisconnectWatch::DisconnectWatch(std::function<void()> ended, QObject* parent)
    : QObject(parent), m_ended(std::move(ended))
{
}

void DisconnectWatch::watch(QDBusConnection connection)
{
    m_affinity.assertHere();
    connection.connect(QString(), QStringLiteral("/org/freedesktop/DBus/Local"),
                       QStringLiteral("org.freedesktop.DBus.Local"), QStringLiteral("Disconnected"), this,
                       SLOT(tell()));
    // It may have ended before we listened; then nobody says so any more.
    if (!connection.isConnected())
        QMetaObject::invokeMethod(this, &DisconnectWatch::tell, Qt::QueuedConnection);
}

void DisconnectWatch::forget(QDBusConnection connection)
{
    m_affinity.assertHere();
    connection.disconnect(QString(), QStringLiteral("/org/freedesktop/DBus/Local"),
                          QStringLiteral("org.freedesktop.DBus.Local"), QStringLiteral("Disconnected"), this,
                          SLOT(tell()));
}

void DisconnectWatch::tell()
{
    if (const auto ended = std::exchange(m_ended, {}))
        ended();
}

} // namespace dbus
