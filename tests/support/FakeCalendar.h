/// A calendar that writes down what it was asked, and gives dates as "<format> @ <seconds>". One thread at a time.
#pragma once

#include "platform/files/DateFormatter.h"

#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace tests {

class FakeCalendar final : public platform::Calendar {
public:
    /// The names of the zones that were looked up.
    mutable std::vector<std::string> zonesAskedFor;
    /// The zones that were set on formatters, "device" for none.
    mutable std::vector<std::string> zonesSet;
    mutable int formattersMade = 0;
    /// Given instead, when it is set.
    std::optional<std::string> text;

    std::unique_ptr<platform::DateFormatter> makeDateFormatter() const override
    {
        ++formattersMade;
        return std::make_unique<Formatter>(*this);
    }

    std::optional<platform::TimeZone> timeZoneWithName(const std::string& name) const override
    {
        zonesAskedFor.push_back(name);
        return std::nullopt;
    }

private:
    class Formatter final : public platform::DateFormatter {
    public:
        explicit Formatter(const FakeCalendar& calendar) : m_calendar(calendar) {}

        void setDateFormat(std::string format) override { m_format = std::move(format); }
        void setTimeZone(const std::optional<platform::TimeZone>& zone) override
        {
            m_calendar.zonesSet.push_back(zone ? zone->name : "device");
        }
        std::string stringFromDate(base::Date date) const override
        {
            return m_calendar.text.value_or(m_format + " @ " + std::to_string(date.wholeSeconds()));
        }

    private:
        const FakeCalendar& m_calendar;
        std::string m_format;
    };
};

} // namespace tests
