#include "runtime/NotificationCenter.h"

#include <algorithm>
#include <utility>

namespace runtime {

void NotificationCenter::addObserver(const std::shared_ptr<Object>& observer, Selector selector, std::string name,
                                     const std::shared_ptr<Object>& object)
{
    const std::lock_guard lock(m_mutex);
    std::erase_if(m_registrations, [](const Registration& each) {
        return each.observer.expired() || (!each.anyObject && each.object.expired());
    });
    m_registrations.push_back({observer.get(), observer, std::move(selector), std::move(name), object, !object});
}

void NotificationCenter::removeObserver(const Object& observer)
{
    const std::lock_guard lock(m_mutex);
    std::erase_if(m_registrations, [&](const Registration& each) { return each.identity == &observer; });
}

void NotificationCenter::post(const std::string& name, const std::shared_ptr<Object>& object)
{
    std::vector<std::pair<std::shared_ptr<Object>, Selector>> receivers;
    {
        const std::lock_guard lock(m_mutex);
        for (const Registration& each : m_registrations)
            if (each.name == name && (each.anyObject || (object && each.object.lock() == object)))
                if (auto observer = each.observer.lock())
                    receivers.emplace_back(std::move(observer), each.selector);
    }
    if (receivers.empty())
        return;
    const auto notification = std::make_shared<Notification>(name, object);
    for (const auto& [observer, selector] : receivers)
        if (isRegistered(*observer, selector, name)) // who was told before may have taken it back
            observer->perform(selector, {toValue(notification)});
}

bool NotificationCenter::isRegistered(const Object& observer, const Selector& selector, const std::string& name) const
{
    const std::lock_guard lock(m_mutex);
    return std::any_of(m_registrations.begin(), m_registrations.end(), [&](const Registration& each) {
        return each.identity == &observer && each.selector == selector && each.name == name;
    });
}

std::size_t NotificationCenter::registrationCount() const
{
    const std::lock_guard lock(m_mutex);
    return m_registrations.size();
}

} // namespace runtime
