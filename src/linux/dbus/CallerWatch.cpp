#include "linux/dbus/CallerWatch.h"

#include "linux/dbus/Reply.h"

#include <QDBusMessage>

#include <utility>

namespace dbus {

CallerWatch::CallerWatch(const QDBusConnection& bus, std::function<void(const QString& name)> left)
    : m_left(std::move(left))
{
    m_watcher.setConnection(bus);
    m_watcher.setWatchMode(QDBusServiceWatcher::WatchForUnregistration);
    QObject::connect(&m_watcher, &QDBusServiceWatcher::serviceUnregistered, &m_watcher,
                     [this](const QString& name) { m_left(name); });
}

void CallerWatch::watch(const QString& name)
{
    m_affinity.assertHere();
    if (m_watcher.watchedServices().contains(name))
        return;
    m_watcher.addWatchedService(name);
    // It may have left before we watched; then nobody says so any more.
    auto question =
        QDBusMessage::createMethodCall(QStringLiteral("org.freedesktop.DBus"), QStringLiteral("/org/freedesktop/DBus"),
                                       QStringLiteral("org.freedesktop.DBus"), QStringLiteral("NameHasOwner"));
    whenAnswered(m_watcher.connection().asyncCall(question << name), m_watcher,
                 [this, name](const QDBusMessage& reply) {
                     if (reply.arguments() == QVariantList{false})
                         m_left(name);
                 });
}

void CallerWatch::forget(const QString& name)
{
    m_affinity.assertHere();
    m_watcher.removeWatchedService(name);
}

} // namespace dbus
