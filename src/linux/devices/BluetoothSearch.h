/// Devices that take files by Bluetooth: paired by an adapter that is on, with Object Push among their services. Whether
/// one is near is only known once it is tried.
///
/// BlueZ is asked only while it runs: without it no adapter is on. The OBEX service runs only while somebody sends, so it
/// is enough that it could be started.
#pragma once

#include "linux/devices/BluetoothActivity.h"
#include "linux/devices/DeviceSearch.h"
#include "linux/devices/ManagedObjects.h"

#include <optional>

namespace devices {

class BluetoothSearch final : public DeviceSearch {
public:
    /// The buses outlive this.
    BluetoothSearch(const sharing::Environment& environment, Bus& session, Bus& system)
        : DeviceSearch(environment), m_session(session), m_system(system)
    {
    }

private:
    void ask() override;
    Devices devices() override;

    Bus& m_session;
    Bus& m_system;
    std::optional<QDBusConnection> m_sender; ///< where the OBEX service is
    QMap<QString, Interfaces> m_objects;
};

} // namespace devices
