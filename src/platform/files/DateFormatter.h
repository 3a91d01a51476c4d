/// Dates in the user's words. Any thread; one formatter at a time by one thread.
#pragma once

#include "base/Date.h"

#include <memory>
#include <optional>
#include <string>

namespace platform {

/// A time zone that exists.
struct TimeZone {
    std::string name;
};

class DateFormatter {
public:
    virtual ~DateFormatter() = default;
    /// A pattern of Unicode date field symbols: "MMMM d hh:mm a".
    virtual void setDateFormat(std::string format) = 0;
    /// Nothing keeps the device's current zone.
    virtual void setTimeZone(const std::optional<TimeZone>& zone) = 0;
    virtual std::string stringFromDate(base::Date date) const = 0;
};

/// Makes formatters, in the device's current locale and zone at that moment.
class Calendar {
public:
    virtual ~Calendar() = default;
    virtual std::unique_ptr<DateFormatter> makeDateFormatter() const = 0;
    /// Nothing when no zone has that name.
    virtual std::optional<TimeZone> timeZoneWithName(const std::string& name) const = 0;
};

} // namespace platform
