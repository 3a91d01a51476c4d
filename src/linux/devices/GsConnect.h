/// Devices that GSConnect reaches: paired, connected, and able to take files.
///
/// The same holds as for KDE Connect: only asked while it runs, and what it was given counts as taken when it says so.
#pragma once

#include "linux/devices/DeviceSearch.h"

namespace devices {

extern const Way kGsConnect;

class GsConnectSearch final : public DeviceSearch {
public:
    /// `session` outlives this.
    GsConnectSearch(const sharing::Environment& environment, Bus& session)
        : DeviceSearch(environment), m_session(session)
    {
    }

private:
    void ask() override;
    Devices devices() override { return m_devices; }
    void askDevice(const QDBusConnection& bus, const QString& owner, const QString& path,
                   const QVariantMap& properties);

    Bus& m_session;
    Devices m_devices;
    std::size_t m_asked = 0;
};

} // namespace devices
