/// Knows the nearby devices that a movie can be sent to: by KDE Connect, by GSConnect, by Bluetooth. Main queue only.
///
/// The services are asked side by side, and each has its devices told as soon as it has answered. Where several devices
/// have one name, their titles tell them apart, those that have been told before too.
#pragma once

#include "linux/devices/Calls.h"
#include "linux/sharing/Environment.h"
#include "platform/sharing/ActivityProvider.h"

#include <memory>
#include <vector>

namespace devices {

class DeviceProvider final : public platform::ActivityProvider {
public:
    struct Buses {
        Bus::Connect session = Bus::session();
        Bus::Connect system = Bus::system();
    };

    /// `environment` outlives this and what it finds.
    explicit DeviceProvider(const sharing::Environment& environment) : DeviceProvider(environment, Buses()) {}
    DeviceProvider(const sharing::Environment& environment, Buses buses);
    ~DeviceProvider() override;

    void findActivities(const platform::ShareItems& items, Found found) override;

private:
    class Finding;

    const sharing::Environment& m_environment;
    Bus m_session;
    Bus m_system;
    std::vector<std::shared_ptr<Finding>> m_findings;
    base::Affinity m_affinity;
};

} // namespace devices
