#include "linux/devices/BluetoothActivity.h"

#include "linux/devices/HandingOver.h"
#include "linux/devices/ObexWatch.h"
#include "platform/sharing/ActivityTypes.h"

#include <QDBusArgument>
#include <QDBusObjectPath>

#include <algorithm>
#include <utility>

namespace devices {

const Way kBluetooth = {platform::kActivityTypeBluetooth, "SHARE_WAY_BLUETOOTH", "bluetooth"};

namespace {

constexpr const char* kClient = "org.bluez.obex.Client1";

QString serviceName()
{
    return QStringLiteral("org.bluez.obex");
}

void removeSession(const QDBusConnection& bus, const QString& service, const QString& session)
{
    bus.send(question(service, QStringLiteral("/org/bluez/obex"), kClient, "RemoveSession",
                      {QVariant::fromValue(QDBusObjectPath(session))}));
}

QString firstPath(const QDBusMessage& reply)
{
    return reply.arguments().constFirst().value<QDBusObjectPath>().path();
}

} // namespace

BluetoothActivity::BluetoothActivity(const sharing::Environment& environment, std::string_view name,
                                     QDBusConnection session, Address address)
    : DeviceActivity(environment, kBluetooth, name), m_bus(std::move(session)), m_address(std::move(address)),
      m_calls(environment.system.mainQueue)
{
}

BluetoothActivity::~BluetoothActivity()
{
    BluetoothActivity::stop();
}

void BluetoothActivity::send()
{
    m_next = 0;
    m_sent = 0;
    findService([this] {
        // Now that the user wants it, it may be started; it runs only while somebody sends.
        m_calls.ask(m_bus, questionToBus("StartServiceByName", {serviceName(), 0U}), kStartLimit,
                    [this](const QDBusMessage& started) {
                        const auto fails = [this, why = wordsForLog(started)] {
                            failed("SHARE_DEVICE_SERVICE_GONE", why);
                        };
                        if (isReply(started, "u"))
                            findService(fails);
                        else
                            fails();
                    });
    });
}

void BluetoothActivity::findService(std::function<void()> otherwise)
{
    m_calls.ask(m_bus, questionToBus("GetNameOwner", {serviceName()}), kStartLimit,
                [this, otherwise = std::move(otherwise)](const QDBusMessage& reply) {
                    if (isReply(reply, "s"))
                        createSession(reply.arguments().constFirst().toString());
                    else
                        otherwise();
                });
}

void BluetoothActivity::createSession(const QString& owner)
{
    m_service = owner;
    // First: a small file may be over before we hear what its transfer is called.
    m_watch = new ObexWatch(m_bus, owner,
                            {[this](const QString& path, const QVariantMap& properties) {
                                 merge(path, properties);
                                 look();
                             },
                             [this](const QString& path) {
                                 if (path == m_session) {
                                     failed("SHARE_DEVICE_BROKEN_OFF", "the session was removed");
                                     return;
                                 }
                                 if (isOurs(path))
                                     m_transfers[path].isRemoved = true;
                                 look();
                             },
                             [this] { failed("SHARE_DEVICE_SERVICE_GONE", "the service has left the bus"); }});
    const QVariantMap arguments = {{QStringLiteral("Target"), QStringLiteral("opp")},
                                   {QStringLiteral("Source"), m_address.adapter}};
    m_calls.ask(
        m_bus,
        question(owner, QStringLiteral("/org/bluez/obex"), kClient, "CreateSession", {m_address.device, arguments}),
        kSessionLimit,
        [this](const QDBusMessage& reply) {
            if (!isReply(reply, "o")) {
                failed("SHARE_DEVICE_GONE", wordsForLog(reply));
                return;
            }
            m_session = firstPath(reply);
            sendNext();
        },
        [bus = m_bus, owner](const QDBusMessage& reply) {
            if (isReply(reply, "o"))
                removeSession(bus, owner, firstPath(reply));
        });
}

void BluetoothActivity::sendNext()
{
    m_transfer.clear();
    m_transfers.clear();
    if (m_next == files().size()) {
        complete();
        return;
    }
    const QString path = QString::fromStdString(files()[m_next].path());
    m_calls.ask(m_bus, question(m_service, m_session, "org.bluez.obex.ObjectPush1", "SendFile", {path}), kSessionLimit,
                [this](const QDBusMessage& reply) {
                    if (!isReply(reply, "oa{sv}")) {
                        failed("SHARE_DEVICE_BROKEN_OFF", wordsForLog(reply));
                        return;
                    }
                    m_transfer = firstPath(reply);
                    // What came by a signal is newer.
                    if (!m_transfers.contains(m_transfer))
                        merge(m_transfer, qdbus_cast<QVariantMap>(reply.arguments().at(1).value<QDBusArgument>()));
                    look();
                });
}

void BluetoothActivity::merge(const QString& path, const QVariantMap& properties)
{
    if (!isOurs(path))
        return;
    Transfer& transfer = m_transfers[path];
    if (const auto status = properties.value(QStringLiteral("Status")).toString(); !status.isEmpty())
        transfer.status = status;
    if (const auto transferred = properties.value(QStringLiteral("Transferred")); transferred.isValid())
        transfer.transferred = transferred.toULongLong();
}

bool BluetoothActivity::isOurs(const QString& transfer) const
{
    return !m_session.isEmpty() && transfer.startsWith(m_session + QLatin1Char('/'));
}

void BluetoothActivity::look()
{
    const auto found = m_transfers.find(m_transfer);
    if (m_transfer.isEmpty() || found == m_transfers.end())
        return;
    const Transfer& transfer = found->second;
    if (transfer.status == QLatin1String("complete")) {
        m_sent += files()[m_next++].size;
        sendNext();
        return;
    }
    if (transfer.status == QLatin1String("error") || transfer.isRemoved) {
        m_transfer.clear(); // there is nothing to be cancelled
        failed("SHARE_DEVICE_BROKEN_OFF", transfer.isRemoved ? "the transfer was removed" : "the transfer has failed");
        return;
    }
    std::uint64_t total = 0;
    for (const File& file : files())
        total += file.size;
    const std::uint64_t sent = m_sent + std::min(transfer.transferred, files()[m_next].size);
    if (total > 0 && transfer.status != QLatin1String("queued"))
        setProgress(static_cast<double>(sent) / static_cast<double>(total));
}

void BluetoothActivity::failed(const char* key, const std::string& why)
{
    fail(key, files()[std::min(m_next, files().size() - 1)].name, why);
}

void BluetoothActivity::stop()
{
    m_calls.forget();
    if (m_watch)
        std::exchange(m_watch, nullptr)->letGo();
    if (const QString transfer = std::exchange(m_transfer, {}); !transfer.isEmpty())
        m_bus.send(question(m_service, transfer, "org.bluez.obex.Transfer1", "Cancel"));
    if (const QString session = std::exchange(m_session, {}); !session.isEmpty())
        removeSession(m_bus, m_service, session);
}

} // namespace devices
