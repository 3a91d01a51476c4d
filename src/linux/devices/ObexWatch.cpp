#include "linux/devices/ObexWatch.h"

#include <QDBusArgument>
#include <QDBusObjectPath>

#include <utility>

namespace devices {

namespace {

constexpr const char* kTransferInterface = "org.bluez.obex.Transfer1";

} // namespace

ObexWatch::ObexWatch(QDBusConnection bus, const QString& owner, Handlers handlers) : m_handlers(std::move(handlers))
{
    bus.connect(owner, QString(), QStringLiteral("org.freedesktop.DBus.Properties"),
                QStringLiteral("PropertiesChanged"), this, SLOT(propertiesChanged(QDBusMessage)));
    bus.connect(owner, QString(), QStringLiteral("org.freedesktop.DBus.ObjectManager"),
                QStringLiteral("InterfacesRemoved"), this, SLOT(interfacesRemoved(QDBusMessage)));
    bus.connect(QStringLiteral("org.freedesktop.DBus"), QStringLiteral("/org/freedesktop/DBus"),
                QStringLiteral("org.freedesktop.DBus"), QStringLiteral("NameOwnerChanged"), {owner},
                QStringLiteral("sss"), this, SLOT(nameOwnerChanged(QString, QString, QString)));
    bus.connect(QString(), QStringLiteral("/org/freedesktop/DBus/Local"), QStringLiteral("org.freedesktop.DBus.Local"),
                QStringLiteral("Disconnected"), this, SLOT(busEnded()));
}

void ObexWatch::letGo()
{
    m_affinity.assertHere();
    m_handlers = {};
    deleteLater();
}

void ObexWatch::propertiesChanged(const QDBusMessage& signal)
{
    m_affinity.assertHere();
    if (signal.signature() != QLatin1String("sa{sv}as")
        || signal.arguments().constFirst().toString() != QLatin1String(kTransferInterface))
        return;
    if (const auto changed = m_handlers.changed)
        changed(signal.path(), qdbus_cast<QVariantMap>(signal.arguments().at(1).value<QDBusArgument>()));
}

void ObexWatch::interfacesRemoved(const QDBusMessage& signal)
{
    m_affinity.assertHere();
    if (signal.signature() != QLatin1String("oas"))
        return;
    if (const auto removed = m_handlers.removed)
        removed(signal.arguments().constFirst().value<QDBusObjectPath>().path());
}

void ObexWatch::nameOwnerChanged(const QString&, const QString&, const QString& now)
{
    m_affinity.assertHere();
    if (const auto gone = m_handlers.gone; gone && now.isEmpty())
        gone();
}

void ObexWatch::busEnded()
{
    m_affinity.assertHere();
    if (const auto gone = m_handlers.gone)
        gone();
}

} // namespace devices
