/// Asks one service for its devices. Main queue only.
///
/// Each question and each bus that is waited for counts; when the last has been answered the search ends by itself, unless
/// it was ended before.
#pragma once

#include "linux/devices/Calls.h"
#include "linux/devices/DeviceActivity.h"

#include <chrono>
#include <functional>
#include <memory>
#include <vector>

namespace devices {

class DeviceSearch : public std::enable_shared_from_this<DeviceSearch> {
public:
    using Devices = std::vector<std::shared_ptr<DeviceActivity>>;
    using Ended = std::function<void(Devices devices)>;

    /// A service that takes longer counts as one that is not there; of one that answers in part, that part counts.
    static constexpr std::chrono::seconds kLimit{2};
    /// More than anybody has: the rest is left out.
    static constexpr std::size_t kMostDevices = 50;

    virtual ~DeviceSearch() = default;
    DeviceSearch(const DeviceSearch&) = delete;
    DeviceSearch& operator=(const DeviceSearch&) = delete;

    /// `ended` runs once, not before this returns, with what there is, by name; not once this has gone.
    void begin(Ended ended);
    /// Ends it now, with what is known.
    void end();

protected:
    explicit DeviceSearch(const sharing::Environment& environment)
        : m_environment(environment), m_calls(environment.system.mainQueue)
    {
    }

    const sharing::Environment& environment() const { return m_environment; }

    virtual void ask() = 0;
    virtual Devices devices() = 0;

    void connect(Bus& bus, std::function<void(const QDBusConnection& connection)> connected);
    void ask(const QDBusConnection& bus, const QDBusMessage& question, Calls::Answer answer);
    /// Asks for the connection that has `name` on the bus, to talk to that one: a name can be activated, and change hands.
    /// `found` is not called where nobody has it.
    void findOwner(const QDBusConnection& bus, const QString& name, std::function<void(const QString& owner)> found);

private:
    void answered();

    const sharing::Environment& m_environment;
    Calls m_calls;
    Ended m_ended;
    std::size_t m_open = 0;
    base::Affinity m_affinity;
};

} // namespace devices
