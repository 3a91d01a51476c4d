#include "linux/devices/KdeConnect.h"

#include "linux/devices/HandingOver.h"
#include "platform/sharing/ActivityTypes.h"

#include <QDBusArgument>
#include <QDBusObjectPath>

#include <utility>

namespace devices {

const Way kKdeConnect = {platform::kActivityTypeKdeConnect, "SHARE_WAY_KDE_CONNECT", "device"};

namespace {

constexpr const char* kDeviceInterface = "org.kde.kdeconnect.device";

QString pathOf(const QString& id)
{
    return QStringLiteral("/modules/kdeconnect/devices/") + id;
}

class KdeConnectActivity final : public HandingOver {
public:
    KdeConnectActivity(const sharing::Environment& environment, std::string_view name, QDBusConnection bus,
                       QString owner, const QString& id)
        : HandingOver(environment, kKdeConnect, name, std::move(bus)), m_owner(std::move(owner)),
          m_path(pathOf(id) + QStringLiteral("/share"))
    {
    }

private:
    /// One by one: all versions of the daemon know how to take one.
    void handOver(const QString& address) override
    {
        ask(question(m_owner, m_path, "org.kde.kdeconnect.device.share", "shareUrl", {address}),
            [this](const QDBusMessage&) { accepted(); });
    }

    QString m_owner;
    QString m_path;
};

/// Whether the daemon says that it is paired, under the name that its version has for that; it lists only such devices,
/// but what it says of the device itself counts.
bool isPaired(const QVariantMap& properties)
{
    for (const char* const name : {"isPaired", "isTrusted"})
        if (const auto said = properties.constFind(QLatin1String(name)); said != properties.constEnd())
            return said->metaType() == QMetaType::fromType<bool>() && said->toBool();
    return true;
}

} // namespace

void KdeConnectSearch::ask()
{
    connect(m_session, [this](const QDBusConnection& bus) {
        findOwner(bus, QStringLiteral("org.kde.kdeconnect"), [this, bus](const QString& owner) {
            DeviceSearch::ask(bus,
                              question(owner, QStringLiteral("/modules/kdeconnect"), "org.kde.kdeconnect.daemon",
                                       "devices", {true, true}),
                              [this, bus, owner](const QDBusMessage& reply) {
                                  if (!isReply(reply, "as"))
                                      return;
                                  const QStringList ids = reply.arguments().constFirst().toStringList();
                                  for (const QString& id : ids.mid(0, kMostDevices))
                                      askDevice(bus, owner, id);
                              });
        });
    });
}

void KdeConnectSearch::askDevice(const QDBusConnection& bus, const QString& owner, const QString& id)
{
    const auto canShare = [this, bus, owner, id](const QString& name) {
        DeviceSearch::ask(
            bus, question(owner, pathOf(id), kDeviceInterface, "hasPlugin", {QStringLiteral("kdeconnect_share")}),
            [this, bus, owner, id, name](const QDBusMessage& reply) {
                if (isReply(reply, "b") && reply.arguments().constFirst().toBool())
                    m_devices.push_back(
                        std::make_shared<KdeConnectActivity>(environment(), name.toStdString(), bus, owner, id));
            });
    };
    DeviceSearch::ask(
        bus,
        question(owner, pathOf(id), "org.freedesktop.DBus.Properties", "GetAll", {QLatin1String(kDeviceInterface)}),
        [canShare](const QDBusMessage& reply) {
            if (!isReply(reply, "a{sv}"))
                return;
            const auto properties = qdbus_cast<QVariantMap>(reply.arguments().constFirst().value<QDBusArgument>());
            if (isPaired(properties) && properties.value(QStringLiteral("isReachable")).toBool())
                canShare(properties.value(QStringLiteral("name")).toString());
        });
}

} // namespace devices
