/// Several that know what can be done, as one: each answers when it can. Main queue only.
#pragma once

#include "base/Affinity.h"
#include "platform/sharing/ActivityProvider.h"

#include <vector>

namespace platform {

class CombinedActivities final : public ActivityProvider {
public:
    /// They outlive it; each is asked in this order.
    explicit CombinedActivities(std::vector<ActivityProvider*> providers) : m_providers(std::move(providers)) {}

    /// `isLast` comes once, with the last of the last of them.
    void findActivities(const ShareItems& items, Found found) override;

private:
    base::Affinity m_affinity;
    std::vector<ActivityProvider*> m_providers;
};

} // namespace platform
