/// The role of whoever knows what can be done with a movie on this machine: with mail, devices, other applications.
#pragma once

#include "platform/sharing/Activity.h"

#include <functional>
#include <memory>
#include <vector>

namespace platform {

class ActivityProvider {
public:
    /// Some more that can be done; `isLast` with the last of them, which may be none.
    using Found = std::function<void(std::vector<std::shared_ptr<Activity>> activities, bool isLast)>;

    virtual ~ActivityProvider() = default;

    /// Asks the system, anew each time, what can be done with `items`. Called on the main queue; returns at once, without
    /// waiting for anybody. `found` runs on the main queue, not before this returns, and not after the provider's end.
    /// A service that does not answer counts as one that is not there after a while.
    virtual void findActivities(const ShareItems& items, Found found) = 0;
};

} // namespace platform
