#include "platform/sharing/CombinedActivities.h"

#include <cassert>
#include <utility>

namespace platform {

void CombinedActivities::findActivities(const ShareItems& items, Found found)
{
    m_affinity.assertHere();
    assert(!m_providers.empty()); // or nobody would say that there are no more
    const auto missing = std::make_shared<std::size_t>(m_providers.size());
    for (ActivityProvider* provider : m_providers)
        provider->findActivities(
            items, [missing, found](std::vector<std::shared_ptr<Activity>> activities, bool isLastOfProvider) {
                if (isLastOfProvider)
                    --*missing;
                found(std::move(activities), *missing == 0);
            });
}

} // namespace platform
