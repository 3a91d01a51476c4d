/// Pushes files to a device by Bluetooth, one after the other in one session, and tells how far it is. Main queue only.
///
/// It is completed when the device has all of the last file. How long the device's user thinks about taking a file, and how
/// long it takes, has no limit: a link that breaks is the service's to notice, which then says that the transfer failed.
#pragma once

#include "linux/devices/Calls.h"
#include "linux/devices/DeviceActivity.h"

#include <QString>
#include <QVariantMap>

#include <chrono>
#include <functional>
#include <map>

namespace devices {

class ObexWatch;

extern const Way kBluetooth;

class BluetoothActivity final : public DeviceActivity {
public:
    /// Until the service runs.
    static constexpr std::chrono::seconds kStartLimit{10};
    /// Until the device has answered: it may be looked for, and waked up, for some seconds at each of three steps.
    static constexpr std::chrono::seconds kSessionLimit{30};

    struct Address {
        QString device;
        QString adapter;
    };

    BluetoothActivity(const sharing::Environment& environment, std::string_view name, QDBusConnection session,
                      Address address);
    ~BluetoothActivity() override;

private:
    struct Transfer {
        QString status;
        std::uint64_t transferred = 0;
        bool isRemoved = false;
    };

    void send() override;
    void stop() override;
    /// What Bluetooth carries in a minute is copied in a moment.
    bool tellsPutting() const override { return false; }

    /// Goes on with the service where it runs.
    void findService(std::function<void()> otherwise);
    void createSession(const QString& owner);
    void sendNext();
    void merge(const QString& path, const QVariantMap& properties);
    bool isOurs(const QString& transfer) const;
    /// Goes by what has been said of the transfer under way.
    void look();
    void failed(const char* key, const std::string& why);

    QDBusConnection m_bus;
    Address m_address;
    Calls m_calls;
    ObexWatch* m_watch = nullptr; ///< ours until it is let go
    QString m_service;
    QString m_session;
    QString m_transfer; ///< the one under way
    /// What has been said of transfers of the session: perhaps before we know which one is ours.
    std::map<QString, Transfer> m_transfers;
    std::size_t m_next = 0;
    std::uint64_t m_sent = 0; ///< bytes of the files before
};

} // namespace devices
