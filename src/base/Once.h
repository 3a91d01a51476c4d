/// A value that is made at most once, by whoever asks first; others wait for it. Any thread.
#pragma once

#include <mutex>
#include <utility>

namespace base {

template <typename T> class Once {
public:
    /// The value; `make` runs only for the first caller.
    template <typename Make> const T& get(Make&& make)
    {
        std::call_once(m_flag, [&] { m_value = std::forward<Make>(make)(); });
        return m_value;
    }

private:
    std::once_flag m_flag;
    T m_value{};
};

} // namespace base
