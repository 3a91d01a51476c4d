/// Announces named events about objects to whoever asked for them. Delivery happens at once, on the poster's thread;
/// adding, removing and posting are safe from any thread. Observers are held weakly.
#pragma once

#include "runtime/Object.h"

#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace runtime {

/// The argument of the message that observers get, as an object.
class CLIPSA_RUNTIME Notification final : public Object {
public:
    Notification(std::string name, std::weak_ptr<Object> object) : m_name(std::move(name)), m_object(std::move(object))
    {
    }

    const std::string& name() const { return m_name; }
    std::shared_ptr<Object> object() const { return m_object.lock(); }

private:
    std::string m_name;
    std::weak_ptr<Object> m_object;
};

class CLIPSA_RUNTIME NotificationCenter {
public:
    /// Sends `selector` to `observer` for each `name` posted about `object`; a null `object` means about any.
    void addObserver(const std::shared_ptr<Object>& observer, Selector selector, std::string name,
                     const std::shared_ptr<Object>& object);
    /// Takes back everything that `observer` asked for. May be called from the observer's destructor.
    void removeObserver(const Object& observer);
    void post(const std::string& name, const std::shared_ptr<Object>& object);
    std::size_t registrationCount() const;

private:
    struct Registration {
        const Object* identity; ///< for removal, when the weak reference has died already
        std::weak_ptr<Object> observer;
        Selector selector;
        std::string name;
        std::weak_ptr<Object> object;
        bool anyObject;
    };

    bool isRegistered(const Object& observer, const Selector& selector, const std::string& name) const;

    mutable std::mutex m_mutex;
    std::vector<Registration> m_registrations;
};

} // namespace runtime
