/// A moment on the calendar: seconds since 1 January 1970 UTC, fractions included.
#pragma once

#include <compare>
#include <cstdint>

namespace base {

struct Date {
    double secondsSince1970 = 0;

    /// Seconds from `earlier` to this moment; negative when `earlier` is later.
    double timeIntervalSince(Date earlier) const { return secondsSince1970 - earlier.secondsSince1970; }

    /// Whole seconds, truncated toward zero: how file names carry a date.
    std::int64_t wholeSeconds() const { return static_cast<std::int64_t>(secondsSince1970); }

    friend auto operator<=>(const Date&, const Date&) = default;
};

} // namespace base
