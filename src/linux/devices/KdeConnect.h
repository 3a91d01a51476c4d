/// Devices that KDE Connect reaches: paired, reachable, and able to take files.
///
/// The daemon is asked only while it runs, and never started: one that has just been started knows of no device for some
/// seconds, and a list that is only looked at should start nothing. What it was given counts as taken when it says so; it
/// does not publish how a transfer goes on.
#pragma once

#include "linux/devices/DeviceSearch.h"

namespace devices {

extern const Way kKdeConnect;

class KdeConnectSearch final : public DeviceSearch {
public:
    /// `session` outlives this.
    KdeConnectSearch(const sharing::Environment& environment, Bus& session)
        : DeviceSearch(environment), m_session(session)
    {
    }

private:
    void ask() override;
    Devices devices() override { return m_devices; }
    void askDevice(const QDBusConnection& bus, const QString& owner, const QString& id);

    Bus& m_session;
    Devices m_devices;
};

} // namespace devices
