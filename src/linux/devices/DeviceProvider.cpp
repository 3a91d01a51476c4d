#include "linux/devices/DeviceProvider.h"

#include "linux/devices/BluetoothSearch.h"
#include "linux/devices/GsConnect.h"
#include "linux/devices/KdeConnect.h"

#include <algorithm>
#include <utility>

namespace devices {

/// One time that somebody asks.
class DeviceProvider::Finding : public std::enable_shared_from_this<Finding> {
public:
    explicit Finding(Found found) : m_found(std::move(found)) {}

    void begin(std::vector<std::shared_ptr<DeviceSearch>> searches)
    {
        m_searches = std::move(searches);
        m_open = m_searches.size();
        for (const auto& search : m_searches)
            search->begin([weak = weak_from_this()](DeviceSearch::Devices devices) {
                if (const auto self = weak.lock())
                    self->take(std::move(devices));
            });
    }
    void tellNothing()
    {
        m_open = 0;
        const Found found = m_found;
        found({}, true);
    }
    bool isOver() const { return m_open == 0; }

private:
    void take(DeviceSearch::Devices devices)
    {
        --m_open;
        m_all.insert(m_all.end(), devices.begin(), devices.end());
        tellApart();
        if (isOver()) {
            // They are whoever's that asked for them, and theirs alone.
            m_all.clear();
            m_searches.clear();
        }
        const Found found = m_found;
        found({devices.begin(), devices.end()}, isOver());
    }

    void tellApart()
    {
        for (const auto& device : m_all) {
            const auto count = [&](auto end, bool byItsWay) {
                return std::count_if(m_all.begin(), end, [&](const auto& other) {
                    return other->deviceName() == device->deviceName()
                           && (!byItsWay || &other->way() == &device->way());
                });
            };
            if (count(m_all.end(), false) < 2)
                continue;
            const auto itself = std::find(m_all.begin(), m_all.end(), device);
            const bool isOnlyOne = count(m_all.end(), true) == 1;
            device->tellApart(isOnlyOne ? 0 : static_cast<int>(count(std::next(itself), true)));
        }
    }

    Found m_found;
    std::vector<std::shared_ptr<DeviceSearch>> m_searches;
    std::size_t m_open = 1; ///< searches that have not answered; one as long as nobody has begun
    DeviceSearch::Devices m_all;
};

DeviceProvider::DeviceProvider(const sharing::Environment& environment, Buses buses)
    : m_environment(environment), m_session(environment.system.mainQueue, std::move(buses.session)),
      m_system(environment.system.mainQueue, std::move(buses.system))
{
}

DeviceProvider::~DeviceProvider()
{
    m_affinity.assertHere();
}

void DeviceProvider::findActivities(const platform::ShareItems& items, Found found)
{
    m_affinity.assertHere();
    std::erase_if(m_findings, [](const auto& finding) { return finding->isOver(); });
    const auto finding = std::make_shared<Finding>(std::move(found));
    m_findings.push_back(finding);
    if (platform::filesOf(items).empty()) {
        m_environment.system.mainQueue.post([weak = std::weak_ptr(finding)] {
            if (const auto self = weak.lock())
                self->tellNothing();
        });
        return;
    }
    finding->begin({std::make_shared<KdeConnectSearch>(m_environment, m_session),
                    std::make_shared<GsConnectSearch>(m_environment, m_session),
                    std::make_shared<BluetoothSearch>(m_environment, m_session, m_system)});
}

} // namespace devices
