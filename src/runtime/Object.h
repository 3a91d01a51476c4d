/// The root of everything that receives messages: it can be asked what it answers, sent messages by selector, observed
/// by key, and read by the names of its instance variables. Reference counted; observers and targets are weak.
#pragma once

#include "base/Affinity.h"
#include "runtime/Class.h"
#include "runtime/Export.h"
#include "runtime/Selector.h"
#include "runtime/Value.h"

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace runtime {

/// What a change of an observed key carries. Values travel only when the observer asked for them; ours never do.
struct KeyValueChange {};

/// Is told of changes to the keys that it observes, on the thread that made the change.
class CLIPSA_RUNTIME KeyValueObserver {
public:
    virtual ~KeyValueObserver();
    virtual void observeValueForKeyPath_ofObject_change_context(std::string_view keyPath, Object& object,
                                                                const KeyValueChange& change, void* context) = 0;
};

class CLIPSA_RUNTIME Object : public std::enable_shared_from_this<Object> {
public:
    Object();
    virtual ~Object();
    Object(const Object&) = delete;
    Object& operator=(const Object&) = delete;

    static const Class& classObject();
    virtual const Class& isa() const;

    bool respondsTo(const Selector& selector) const { return isa().respondsTo(selector); }
    /// Sends a message; an object that does not answer it does nothing and gives nothing.
    Value perform(const Selector& selector, const Arguments& arguments = {});

    /// Nothing when there is no instance variable of that name.
    Value instanceVariable(const std::string& name) const;
    /// False when there is no instance variable of that name.
    bool setInstanceVariable(const std::string& name, const Value& value);

    /// The observer is not retained and must stop observing before it goes. One entry for each call.
    void addObserver(KeyValueObserver& observer, std::string keyPath, void* context = nullptr);
    /// Takes back the latest entry of that observer and key; does nothing when there is none.
    void removeObserver(KeyValueObserver& observer, std::string_view keyPath);
    std::size_t observerCount() const { return m_observations.size(); }

    /// A typed strong reference to this; only while one exists already.
    template <typename T> std::shared_ptr<T> self() { return std::dynamic_pointer_cast<T>(shared_from_this()); }
    /// A typed weak reference to this, empty during construction and destruction.
    template <typename T> std::weak_ptr<T> weakSelf() { return std::dynamic_pointer_cast<T>(weak_from_this().lock()); }

protected:
    /// First thing in each entry point of what lives on one thread, which is the one that made it.
    void assertHere(base::SourceLocation where = base::SourceLocation::current()) const
    {
        m_affinity.assertHere(where);
    }
    /// The same where all that is done is reading or setting `member`, which it gives.
    template <typename T> T& here(T& member, base::SourceLocation where = base::SourceLocation::current()) const
    {
        assertHere(where);
        return member;
    }

    /// Tells the observers of `key`. They may come and go, and release this object, while they are told.
    void didChangeValueForKey(std::string_view key);

private:
    struct Observation {
        KeyValueObserver* observer;
        std::string keyPath;
        void* context;
        std::uint64_t id; ///< tells entries of one observer for one key apart
    };

    base::Affinity m_affinity;
    std::vector<Observation> m_observations;
    std::uint64_t m_nextObservation = 0;
};

/// Who is told what: a weak target and the message it gets. Sending does nothing once the target is gone, or when it
/// does not answer.
class CLIPSA_RUNTIME TargetAction {
public:
    TargetAction() = default;
    TargetAction(std::weak_ptr<Object> target, Selector action);

    std::shared_ptr<Object> target() const { return m_target.lock(); }
    const Selector& action() const { return m_action; }
    /// Whether sending now would reach somebody.
    bool isAnswered() const;
    void send(const std::shared_ptr<Object>& sender) const;

private:
    std::weak_ptr<Object> m_target;
    Selector m_action;
};

} // namespace runtime
