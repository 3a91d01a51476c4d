/// Dates in the user's words, by ICU. Any thread; a formatter by one thread at a time.
///
/// Every formatter asks anew for the locale (LC_ALL, LC_TIME, LANG: the first that is set and not empty) and the zone
/// of the device, so that a change shows in the next title.
#pragma once

#include "base/Environment.h"
#include "platform/files/DateFormatter.h"

#include <functional>
#include <string>
#include <string_view>

/// Not `icu`, which is the library's own.
namespace intl {

/// What ICU calls the locale that POSIX calls `name`: no codeset, `@latin` and `@cyrillic` as scripts, other modifiers
/// dropped, "C" and "POSIX" and nothing as "en_US_POSIX".
std::string localeFromPosixName(std::string_view name);

class Calendar final : public platform::Calendar {
public:
    /// Asks the process's own environment unless given another.
    explicit Calendar(base::Environment environment = {});

    std::unique_ptr<platform::DateFormatter> makeDateFormatter() const override;
    std::optional<platform::TimeZone> timeZoneWithName(const std::string& name) const override;

private:
    base::Environment m_environment;
};

} // namespace intl
