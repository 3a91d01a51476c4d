#include "runtime/NotificationCenter.h"

#include <utility>

namespace runtime {

void NotificationCenter::addObserver(const std::shared_ptr<Object>& observer, Selector selector, std::string name,
                                     const std::shared_ptr<Object>& object)
{
    const std::lock_guard lock(m_mutex);
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
            if (each.name == name && (each.anyObject || each.object.lock() == object))
                if (auto observer = each.observer.lock())
                    receivers.emplace_back(std::move(observer), each.selector);
    }
    if (receivers.empty())
        return;
    const auto notification = std::make_shared<Notification>(name, object);
    for (const auto& [observer, selector] : receivers)
        observer->perform(selector, {toValue(notification)});
}

std::size_t NotificationCenter::registrationCount() const
{
    const std::lock_guard lock(m_mutex);
    return m_registrations.size();
}

} // namespace runtime
