#include "linux/portals/RequestSignals.h"

namespace portals {

void RequestSignals::listenToRequest(QDBusConnection bus, const QString& owner, const QString& path)
{
    m_affinity.assertHere();
    bus.connect(owner, path, QStringLiteral("org.freedesktop.portal.Request"), QStringLiteral("Response"), this,
                SLOT(respond(QDBusMessage)));
}

void RequestSignals::listenToOwner(QDBusConnection bus, const QString& owner)
{
    m_affinity.assertHere();
    // Not bound to the bus's own name, as its owner would have to be waited for.
    bus.connect(QString(), QStringLiteral("/org/freedesktop/DBus"), QStringLiteral("org.freedesktop.DBus"),
                QStringLiteral("NameOwnerChanged"), {owner}, QStringLiteral("sss"), this,
                SLOT(changeOwner(QDBusMessage)));
    bus.connect(QString(), QStringLiteral("/org/freedesktop/DBus/Local"), QStringLiteral("org.freedesktop.DBus.Local"),
                QStringLiteral("Disconnected"), this, SLOT(endBus()));
}

void RequestSignals::respond(const QDBusMessage& response)
{
    m_affinity.assertHere();
    responded(response);
}

void RequestSignals::changeOwner(const QDBusMessage& change)
{
    m_affinity.assertHere();
    if (change.service() == QStringLiteral("org.freedesktop.DBus"))
        ownerChanged(change);
}

void RequestSignals::endBus()
{
    m_affinity.assertHere();
    busEnded();
}

} // namespace portals
