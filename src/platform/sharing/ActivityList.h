/// Which activities a share sheet offers, and in which order. Main queue only.
///
/// They are found bit by bit. Until it is frozen, each takes the place that the order gives it; afterwards a new one goes
/// to the end: what stands under a finger stays there.
#pragma once

#include "base/Affinity.h"
#include "platform/sharing/Activity.h"

#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace platform {

class ActivityList {
public:
    using Activities = std::vector<std::shared_ptr<Activity>>;

    explicit ActivityList(ShareItems items) : m_items(std::move(items)) {}

    const std::vector<std::string>& excludedTypes() const { return m_excluded; }
    const std::vector<std::string>& typeOrder() const { return m_order; }
    void setExcludedTypes(std::vector<std::string> types);
    /// These types first, in that order; all others behind them as usual: the application's own, then those of the
    /// platform, from mail to the library; of one type in the order in which they were found.
    void setTypeOrder(std::vector<std::string> types);
    /// Those that can do something with the items and are not excluded.
    void add(const Activities& activities);
    void freeze();

    const Activities& activities() const
    {
        m_affinity.assertHere();
        return m_activities;
    }

private:
    std::pair<std::size_t, std::size_t> rankOf(const Activity& activity) const;
    void sort();

    base::Affinity m_affinity;
    ShareItems m_items;
    std::vector<std::string> m_excluded;
    std::vector<std::string> m_order;
    Activities m_activities;
    bool m_isFrozen = false;
};

} // namespace platform
