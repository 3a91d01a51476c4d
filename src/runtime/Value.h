/// What messages and instance variables carry: anything that can be copied; objects as `std::shared_ptr<Object>`.
#pragma once

#include <any>
#include <memory>
#include <string>
#include <type_traits>
#include <vector>

namespace runtime {

class Object;

using Value = std::any;
using Arguments = std::vector<Value>;

namespace detail {

template <typename T> struct IsSharedObject : std::false_type {
};
template <typename T> struct IsSharedObject<std::shared_ptr<T>> : std::is_base_of<Object, T> {
};

} // namespace detail

/// Wraps `value`; pointers to any kind of object become pointers to Object, text becomes `std::string`.
template <typename T> Value toValue(T&& value)
{
    using Plain = std::decay_t<T>;
    if constexpr (detail::IsSharedObject<Plain>::value)
        return Value(std::shared_ptr<Object>(std::forward<T>(value)));
    else if constexpr (std::is_convertible_v<T, std::string> && !std::is_same_v<Plain, std::string>)
        return Value(std::string(std::forward<T>(value)));
    else
        return Value(std::forward<T>(value));
}

/// Unwraps; a value of another type gives `T{}` (nil for objects), as a message to nil would.
template <typename T> T fromValue(const Value& value)
{
    if constexpr (detail::IsSharedObject<T>::value) {
        const auto* object = std::any_cast<std::shared_ptr<Object>>(&value);
        return object ? std::dynamic_pointer_cast<typename T::element_type>(*object) : nullptr;
    } else {
        const auto* found = std::any_cast<T>(&value);
        return found ? *found : T{};
    }
}

} // namespace runtime
