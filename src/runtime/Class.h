/// A class as the runtime knows it: its name, what it answers, and its instance variables by name.
///
/// A class describes itself once, in `classObject()`, through a `ClassBuilder`. Classes live as long as the process and
/// can be found by name from anywhere. Looking up and exchanging methods is safe from any thread.
#pragma once

#include "runtime/Export.h"
#include "runtime/Selector.h"
#include "runtime/Value.h"

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <shared_mutex>
#include <string>
#include <string_view>

namespace runtime {

/// What runs when a message arrives.
using Implementation = std::function<Value(Object& self, const Arguments& arguments)>;

struct InstanceVariable {
    std::function<Value(const Object& self)> get;
    std::function<void(Object& self, const Value& value)> set;
};

class CLIPSA_RUNTIME Class {
public:
    Class(std::string name, const Class* superclass);
    Class(const Class&) = delete;
    Class& operator=(const Class&) = delete;

    /// Null when no class of that name was ever registered.
    static const Class* named(std::string_view name);

    const std::string& name() const { return m_name; }
    const Class* superclass() const { return m_superclass; }
    bool isSubclassOf(const Class& other) const;

    /// A new instance, made without arguments; null when the class has no such maker.
    std::shared_ptr<Object> instantiate() const;

    /// Own or inherited.
    bool respondsTo(const Selector& selector) const { return implementation(selector) != nullptr; }
    /// Empty when neither this class nor one above it answers.
    Implementation implementation(const Selector& selector) const;
    const InstanceVariable* instanceVariable(const std::string& name) const;

    /// Swaps what two classes (or one, with itself) do on a message that both themselves define.
    /// Gives false, and changes nothing, when one of them does not.
    static bool exchangeImplementations(const Class& first, const Selector& firstSelector, const Class& second,
                                        const Selector& secondSelector);

private:
    template <typename T> friend class ClassBuilder;

    void addMethod(const Selector& selector, Implementation implementation);
    void addInstanceVariable(std::string name, InstanceVariable variable);
    void setMaker(std::function<std::shared_ptr<Object>()> maker) { m_maker = std::move(maker); }
    void publish();

    std::string m_name;
    const Class* m_superclass;
    std::function<std::shared_ptr<Object>()> m_maker;
    // Methods change by exchange after the class was published, under the runtime's lock; the rest does not.
    mutable std::map<Selector, Implementation> m_methods;
    std::map<std::string, InstanceVariable> m_instanceVariables;
};

namespace detail {

template <typename T> using Stored = std::remove_cv_t<std::remove_reference_t<T>>;

template <typename T, typename R, typename... Parameters, std::size_t... Index>
Value call(T& self, R (T::*method)(Parameters...), const Arguments& arguments, std::index_sequence<Index...>)
{
    static const Value nothing;
    const auto argument = [&](std::size_t i) -> const Value& { return i < arguments.size() ? arguments[i] : nothing; };
    if constexpr (std::is_void_v<R>) {
        (self.*method)(fromValue<Stored<Parameters>>(argument(Index))...);
        return {};
    } else {
        return toValue((self.*method)(fromValue<Stored<Parameters>>(argument(Index))...));
    }
}

} // namespace detail

/// Fills in a class. `build()` publishes it under its name.
template <typename T> class ClassBuilder {
public:
    ClassBuilder(std::string name, const Class* superclass) : m_class(new Class(std::move(name), superclass)) {}

    /// Messages call `method` with the arguments unwrapped; missing ones are nil.
    template <typename R, typename... Parameters>
    ClassBuilder& method(std::string_view selector, R (T::*member)(Parameters...))
    {
        m_class->addMethod(Selector(selector), [member](Object& self, const Arguments& arguments) {
            // After an exchange with another class it can be an object of that one: not for this method.
            auto* const receiver = dynamic_cast<T*>(&self);
            return receiver ? detail::call(*receiver, member, arguments, std::index_sequence_for<Parameters...>{})
                            : Value{};
        });
        return *this;
    }
    /// An implementation that does not care which class it runs on.
    ClassBuilder& method(std::string_view selector, Implementation implementation)
    {
        m_class->addMethod(Selector(selector), std::move(implementation));
        return *this;
    }
    template <typename V> ClassBuilder& instanceVariable(std::string name, V T::*member)
    {
        m_class->addInstanceVariable(
            std::move(name),
            {[member](const Object& self) { return toValue(dynamic_cast<const T&>(self).*member); },
             [member](Object& self, const Value& value) { dynamic_cast<T&>(self).*member = fromValue<V>(value); }});
        return *this;
    }
    ClassBuilder& maker(std::function<std::shared_ptr<Object>()> maker)
    {
        m_class->setMaker(std::move(maker));
        return *this;
    }
    const Class& build()
    {
        m_class->publish();
        return *m_class;
    }

private:
    Class* m_class; // lives as long as the process: objects of plug-ins may outlive any order of destruction
};

} // namespace runtime
