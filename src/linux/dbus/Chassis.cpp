#include "linux/dbus/Chassis.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusVariant>

namespace dbus {

std::optional<std::string> chassis(std::chrono::milliseconds limit)
{
    const auto bus = QDBusConnection::systemBus();
    if (!bus.isConnected())
        return std::nullopt;
    auto call = QDBusMessage::createMethodCall(
        QStringLiteral("org.freedesktop.hostname1"), QStringLiteral("/org/freedesktop/hostname1"),
        QStringLiteral("org.freedesktop.DBus.Properties"), QStringLiteral("Get"));
    call << QStringLiteral("org.freedesktop.hostname1") << QStringLiteral("Chassis");
    const QDBusMessage reply = bus.call(call, QDBus::Block, static_cast<int>(limit.count()));
    if (reply.type() != QDBusMessage::ReplyMessage || reply.signature() != QLatin1String("v"))
        return std::nullopt;
    const QVariant value = reply.arguments().constFirst().value<QDBusVariant>().variant();
    if (value.metaType() != QMetaType::fromType<QString>() || value.toString().isEmpty())
        return std::nullopt;
    return value.toString().toStdString();
}

} // namespace dbus
