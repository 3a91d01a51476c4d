#include "runtime/Class.h"

#include <mutex>
#include <utility>

namespace runtime {

namespace {

struct Registry {
    std::shared_mutex mutex;
    std::map<std::string, const Class*, std::less<>> classes;
};

// Never destroyed: classes are asked until the last object of the process is gone.
Registry& registry()
{
    static auto* const instance = new Registry;
    return *instance;
}

} // namespace

Class::Class(std::string name, const Class* superclass) : m_name(std::move(name)), m_superclass(superclass) {}

const Class* Class::named(std::string_view name)
{
    const std::shared_lock lock(registry().mutex);
    const auto found = registry().classes.find(name);
    return found == registry().classes.end() ? nullptr : found->second;
}

bool Class::isSubclassOf(const Class& other) const
{
    for (const Class* candidate = this; candidate; candidate = candidate->m_superclass)
        if (candidate == &other)
            return true;
    return false;
}

std::shared_ptr<Object> Class::instantiate() const
{
    return m_maker ? m_maker() : nullptr;
}

Implementation Class::implementation(const Selector& selector) const
{
    const std::shared_lock lock(registry().mutex);
    for (const Class* candidate = this; candidate; candidate = candidate->m_superclass)
        if (const auto found = candidate->m_methods.find(selector); found != candidate->m_methods.end())
            return found->second;
    return nullptr;
}

const InstanceVariable* Class::instanceVariable(const std::string& name) const
{
    for (const Class* candidate = this; candidate; candidate = candidate->m_superclass)
        if (const auto found = candidate->m_instanceVariables.find(name); found != candidate->m_instanceVariables.end())
            return &found->second;
    return nullptr;
}

bool Class::exchangeImplementations(const Class& first, const Selector& firstSelector, const Class& second,
                                    const Selector& secondSelector)
{
    const std::unique_lock lock(registry().mutex);
    const auto one = first.m_methods.find(firstSelector);
    const auto other = second.m_methods.find(secondSelector);
    if (one == first.m_methods.end() || other == second.m_methods.end())
        return false;
    std::swap(one->second, other->second);
    return true;
}

void Class::addMethod(const Selector& selector, Implementation implementation)
{
    m_methods[selector] = std::move(implementation);
}

void Class::addInstanceVariable(std::string name, InstanceVariable variable)
{
    m_instanceVariables[std::move(name)] = std::move(variable);
}

void Class::publish()
{
    const std::unique_lock lock(registry().mutex);
    registry().classes[m_name] = this;
}

} // namespace runtime
