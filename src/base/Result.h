/// A value, or the error that stood in its way. What the world can refuse returns one; nothing throws across folders.
#pragma once

#include "base/Error.h"

#include <cassert>
#include <utility>
#include <variant>

namespace base {

template <typename T> class [[nodiscard]] Result {
public:
    Result(T value) : m_state(std::in_place_index<0>, std::move(value)) {}
    Result(ErrorRef error) : m_state(std::in_place_index<1>, std::move(error)) { assert(this->error()); }

    explicit operator bool() const { return m_state.index() == 0; }

    /// Only when there is one.
    const T& value() const& { return std::get<0>(m_state); }
    T& value() & { return std::get<0>(m_state); }
    T&& value() && { return std::get<0>(std::move(m_state)); }
    T valueOr(T fallback) const { return *this ? value() : std::move(fallback); }

    /// Null on success.
    ErrorRef error() const { return *this ? nullptr : std::get<1>(m_state); }

private:
    std::variant<T, ErrorRef> m_state;
};

/// Success without a value, or an error.
template <> class [[nodiscard]] Result<void> {
public:
    Result() = default;
    Result(ErrorRef error) : m_error(std::move(error)) {}

    explicit operator bool() const { return !m_error; }
    ErrorRef error() const { return m_error; }

private:
    ErrorRef m_error;
};

} // namespace base
