#include "runtime/Object.h"

#include <algorithm>
#include <utility>

namespace runtime {

KeyValueObserver::~KeyValueObserver() = default;

Object::Object() = default;
Object::~Object() = default;

const Class& Object::classObject()
{
    static const Class& instance = ClassBuilder<Object>("Object", nullptr).build();
    return instance;
}

const Class& Object::isa() const
{
    return classObject();
}

Value Object::perform(const Selector& selector, const Arguments& arguments)
{
    const Implementation implementation = isa().implementation(selector);
    return implementation ? implementation(*this, arguments) : Value{};
}

Value Object::instanceVariable(const std::string& name) const
{
    const InstanceVariable* variable = isa().instanceVariable(name);
    return variable ? variable->get(*this) : Value{};
}

bool Object::setInstanceVariable(const std::string& name, const Value& value)
{
    const InstanceVariable* variable = isa().instanceVariable(name);
    if (!variable)
        return false;
    variable->set(*this, value);
    return true;
}

void Object::addObserver(KeyValueObserver& observer, std::string keyPath, void* context)
{
    m_observations.push_back({&observer, std::move(keyPath), context, m_nextObservation++});
}

void Object::removeObserver(KeyValueObserver& observer, std::string_view keyPath)
{
    const auto latest = std::find_if(m_observations.rbegin(), m_observations.rend(), [&](const Observation& each) {
        return each.observer == &observer && each.keyPath == keyPath;
    });
    if (latest != m_observations.rend())
        m_observations.erase(std::next(latest).base());
}

void Object::didChangeValueForKey(std::string_view key)
{
    const auto keepAlive = weak_from_this().lock();
    const auto observations = m_observations;
    for (const Observation& observation : observations) {
        const bool stillThere = std::any_of(m_observations.begin(), m_observations.end(),
                                            [&](const Observation& each) { return each.id == observation.id; });
        if (stillThere && observation.keyPath == key)
            observation.observer->observeValueForKeyPath_ofObject_change_context(key, *this, {}, observation.context);
    }
}

TargetAction::TargetAction(std::weak_ptr<Object> target, Selector action)
    : m_target(std::move(target)), m_action(std::move(action))
{
}

bool TargetAction::isAnswered() const
{
    const auto target = m_target.lock();
    return target && !m_action.isNull() && target->respondsTo(m_action);
}

void TargetAction::send(const std::shared_ptr<Object>& sender) const
{
    // A copy of both: the message may replace this very target and action.
    const auto target = m_target.lock();
    const Selector action = m_action;
    if (target && !action.isNull() && target->respondsTo(action))
        target->perform(action, {toValue(sender)});
}

} // namespace runtime
