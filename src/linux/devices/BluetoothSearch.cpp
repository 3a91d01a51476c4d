#include "linux/devices/BluetoothSearch.h"

#include <QDBusObjectPath>
#include <QSet>

namespace devices {

namespace {

/// Object Push, as devices list it among what they offer.
bool takesFiles(const QStringList& services)
{
    return services.contains(QStringLiteral("00001105-0000-1000-8000-00805f9b34fb"), Qt::CaseInsensitive);
}

bool says(const QVariantMap& properties, const char* property)
{
    return properties.value(QLatin1String(property)).toBool();
}

QString text(const QVariantMap& properties, const char* property)
{
    return properties.value(QLatin1String(property)).toString();
}

} // namespace

void BluetoothSearch::ask()
{
    connect(m_session, [this](const QDBusConnection& bus) {
        const QString obex = QStringLiteral("org.bluez.obex");
        DeviceSearch::ask(bus, questionToBus("NameHasOwner", {obex}), [this, bus](const QDBusMessage& reply) {
            if (isReply(reply, "b") && reply.arguments().constFirst().toBool())
                m_sender = bus;
        });
        DeviceSearch::ask(bus, questionToBus("ListActivatableNames", {}), [this, bus, obex](const QDBusMessage& reply) {
            if (isReply(reply, "as") && reply.arguments().constFirst().toStringList().contains(obex))
                m_sender = bus;
        });
    });
    connect(m_system, [this](const QDBusConnection& bus) {
        findOwner(bus, QStringLiteral("org.bluez"), [this, bus](const QString& owner) {
            DeviceSearch::ask(
                bus, question(owner, QStringLiteral("/"), "org.freedesktop.DBus.ObjectManager", "GetManagedObjects"),
                [this](const QDBusMessage& reply) { m_objects = managedObjects(reply); });
        });
    });
}

DeviceSearch::Devices BluetoothSearch::devices()
{
    Devices found;
    if (!m_sender)
        return found;
    QSet<QString> known;
    for (const Interfaces& interfaces : m_objects) {
        const QVariantMap device = interfaces.value(QStringLiteral("org.bluez.Device1"));
        const QString address = text(device, "Address");
        const QString adapterPath = device.value(QStringLiteral("Adapter")).value<QDBusObjectPath>().path();
        const QVariantMap adapter = m_objects.value(adapterPath).value(QStringLiteral("org.bluez.Adapter1"));
        if (address.isEmpty() || known.contains(address) || !says(device, "Paired") || says(device, "Blocked")
            || !says(adapter, "Powered") || !takesFiles(device.value(QStringLiteral("UUIDs")).toStringList()))
            continue;
        known.insert(address);                       // once, though two adapters may know it
        const QString alias = text(device, "Alias"); // the user's own name for it
        const QString name = alias.isEmpty() ? text(device, "Name") : alias;
        found.push_back(
            std::make_shared<BluetoothActivity>(environment(), name.toStdString(), *m_sender,
                                                BluetoothActivity::Address{address, text(adapter, "Address")}));
    }
    return found;
}

} // namespace devices
