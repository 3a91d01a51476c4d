#include "platform/sharing/ActivityList.h"

#include "platform/sharing/ActivityTypes.h"

#include <algorithm>
#include <iterator>
#include <string_view>
#include <utility>

namespace platform {

namespace {

/// What people share with most, then what keeps the movie on this machine.
constexpr std::string_view kUsualOrder[] = {
    kActivityTypeMail,      kActivityTypeMessage,      kActivityTypeKdeConnect,
    kActivityTypeGsConnect, kActivityTypeBluetooth,    kActivityTypeOpenWith,
    kActivityTypeSaveACopy, kActivityTypeShowInFolder, kActivityTypeSaveToCameraRoll};

std::size_t usualRankOf(std::string_view type)
{
    const auto* const found = std::find(std::begin(kUsualOrder), std::end(kUsualOrder), type);
    // The application's own stand where people look first for what is special.
    return found == std::end(kUsualOrder) ? 0 : static_cast<std::size_t>(found - std::begin(kUsualOrder)) + 1;
}

} // namespace

void ActivityList::setExcludedTypes(std::vector<std::string> types)
{
    m_affinity.assertHere();
    m_excluded = std::move(types);
    std::erase_if(m_activities, [this](const std::shared_ptr<Activity>& activity) {
        return std::find(m_excluded.begin(), m_excluded.end(), activity->activityType()) != m_excluded.end();
    });
}

void ActivityList::setTypeOrder(std::vector<std::string> types)
{
    m_affinity.assertHere();
    m_order = std::move(types);
    sort();
}

void ActivityList::add(const Activities& activities)
{
    m_affinity.assertHere();
    for (const auto& activity : activities) {
        const bool isExcluded =
            std::find(m_excluded.begin(), m_excluded.end(), activity->activityType()) != m_excluded.end();
        if (!isExcluded && activity->canPerformWithActivityItems(m_items))
            m_activities.push_back(activity);
    }
    sort();
}

void ActivityList::freeze()
{
    m_affinity.assertHere();
    m_isFrozen = true;
}

std::pair<std::size_t, std::size_t> ActivityList::rankOf(const Activity& activity) const
{
    const std::string type = activity.activityType();
    const auto found = std::find(m_order.begin(), m_order.end(), type);
    return {static_cast<std::size_t>(found - m_order.begin()), usualRankOf(type)};
}

void ActivityList::sort()
{
    if (!m_isFrozen)
        std::stable_sort(m_activities.begin(), m_activities.end(),
                         [this](const auto& a, const auto& b) { return rankOf(*a) < rankOf(*b); });
}

} // namespace platform
