/// A value that threads share: it is read and replaced as a whole. Given out as a copy.
#pragma once

#include <mutex>
#include <utility>

namespace base {

template <typename T> class SharedValue {
public:
    SharedValue() = default;
    SharedValue(const SharedValue&) = delete;
    SharedValue& operator=(const SharedValue&) = delete;

    T value() const
    {
        const std::lock_guard lock(m_mutex);
        return m_value;
    }
    void setValue(T value)
    {
        const std::lock_guard lock(m_mutex);
        std::swap(m_value, value); // what was there goes behind the lock
    }

private:
    mutable std::mutex m_mutex;
    T m_value{};
};

} // namespace base
