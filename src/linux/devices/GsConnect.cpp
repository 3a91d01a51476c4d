#include "linux/devices/GsConnect.h"

#include "linux/devices/HandingOver.h"
#include "linux/devices/ManagedObjects.h"
#include "platform/sharing/ActivityTypes.h"

#include <QDBusArgument>
#include <QDBusMetaType>
#include <QDBusSignature>

#include <utility>

namespace devices {

/// What the action takes, `(sb)`: an address, and whether the device opens the file when it has it.
struct SharedFile {
    QString address;
    bool opens = false;
};

static QDBusArgument& operator<<(QDBusArgument& out, const SharedFile& file)
{
    out.beginStructure();
    out << file.address << file.opens;
    out.endStructure();
    return out;
}

static const QDBusArgument& operator>>(const QDBusArgument& in, SharedFile& file)
{
    in.beginStructure();
    in >> file.address >> file.opens;
    in.endStructure();
    return in;
}

} // namespace devices

Q_DECLARE_METATYPE(devices::SharedFile)

namespace devices {

const Way kGsConnect = {platform::kActivityTypeGsConnect, "SHARE_WAY_GSCONNECT", "device"};

namespace {

constexpr const char* kActions = "org.gtk.Actions";

QDBusMessage describe(const QString& owner, const QString& path)
{
    return question(owner, path, kActions, "Describe", {QStringLiteral("shareFile")});
}

/// Whether the action can be used now, and takes what we have: `(bgav)`, enabled, the parameter's type, the state.
bool takesFiles(const QDBusMessage& description)
{
    if (!isReply(description, "(bgav)"))
        return false;
    const auto action = description.arguments().constFirst().value<QDBusArgument>();
    bool isEnabled = false;
    QDBusSignature parameter;
    action.beginStructure();
    action >> isEnabled >> parameter;
    action.endStructure(); // or what Qt reads it with is never let go of
    return isEnabled && parameter.signature() == QLatin1String("(sb)");
}

class GsConnectActivity final : public HandingOver {
public:
    GsConnectActivity(const sharing::Environment& environment, std::string_view name, QDBusConnection bus,
                      QString owner, QString path)
        : HandingOver(environment, kGsConnect, name, std::move(bus)), m_owner(std::move(owner)), m_path(std::move(path))
    {
        qDBusRegisterMetaType<SharedFile>();
    }

private:
    /// Nobody says so when an action is used that cannot be used any more: it is asked first.
    void handOver(const QString& address) override
    {
        ask(describe(m_owner, m_path), [this, address](const QDBusMessage& description) {
            if (!takesFiles(description)) {
                deviceGone("it takes no files any more");
                return;
            }
            const QVariantList parameter = {QVariant::fromValue(SharedFile{address, false})};
            ask(question(m_owner, m_path, kActions, "Activate",
                         {QStringLiteral("shareFile"), QVariant(parameter), QVariantMap()}),
                [this](const QDBusMessage&) { accepted(); });
        });
    }

    QString m_owner;
    QString m_path;
};

} // namespace

void GsConnectSearch::ask()
{
    connect(m_session, [this](const QDBusConnection& bus) {
        findOwner(bus, QStringLiteral("org.gnome.Shell.Extensions.GSConnect"), [this, bus](const QString& owner) {
            DeviceSearch::ask(bus,
                              question(owner, QStringLiteral("/org/gnome/Shell/Extensions/GSConnect"),
                                       "org.freedesktop.DBus.ObjectManager", "GetManagedObjects"),
                              [this, bus, owner](const QDBusMessage& reply) {
                                  const auto objects = managedObjects(reply);
                                  for (auto object = objects.begin(); object != objects.end(); ++object)
                                      askDevice(
                                          bus, owner, object.key(),
                                          object->value(QStringLiteral("org.gnome.Shell.Extensions.GSConnect.Device")));
                              });
        });
    });
}

void GsConnectSearch::askDevice(const QDBusConnection& bus, const QString& owner, const QString& path,
                                const QVariantMap& properties)
{
    const auto says = [&properties](const char* property) {
        return properties.value(QLatin1String(property)).toBool();
    };
    if (!says("Connected") || !says("Paired") || m_asked == kMostDevices)
        return;
    ++m_asked;
    const std::string name = properties.value(QStringLiteral("Name")).toString().toStdString();
    DeviceSearch::ask(bus, describe(owner, path), [this, bus, owner, path, name](const QDBusMessage& description) {
        if (takesFiles(description))
            m_devices.push_back(std::make_shared<GsConnectActivity>(environment(), name, bus, owner, path));
    });
}

} // namespace devices
