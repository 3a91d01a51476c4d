#include "linux/icu/Calendar.h"

#include "base/Environment.h"

#include <unicode/simpletz.h>
#include <unicode/smpdtfmt.h>
#include <unicode/timezone.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <ctime>
#include <mutex>
#include <utility>

namespace intl {

namespace {

std::unique_ptr<icu::TimeZone> zoneNamed(const std::string& name)
{
    std::unique_ptr<icu::TimeZone> zone(icu::TimeZone::createTimeZone(icu::UnicodeString::fromUTF8(name)));
    // What has no name that ICU knows becomes a zone all the same, of this one name.
    icu::UnicodeString id;
    if (zone && zone->getID(id) == UCAL_UNKNOWN_ZONE_ID)
        zone.reset();
    return zone;
}

/// Null when TZ is written in one of the ways that only the C library understands: as rules, or as a path.
std::unique_ptr<icu::TimeZone> zoneOfTheDevice(const base::Environment& environment)
{
    std::string name = environment("TZ");
    if (name.starts_with(':'))
        name.erase(0, 1);
    if (!name.empty())
        return zoneNamed(name);
    // ICU keeps what it finds in a variable that it does not guard.
    static std::mutex mutex;
    const std::lock_guard lock(mutex);
    return std::unique_ptr<icu::TimeZone>(icu::TimeZone::detectHostTimeZone());
}

/// A zone of the offset that the C library knows for `date`.
std::unique_ptr<icu::TimeZone> zoneOfTheLibrary(base::Date date)
{
    constexpr double kFarthest = 1e15; // seconds: years still fit into the library's type
    std::tm local = {};
    if (std::abs(date.secondsSince1970) < kFarthest) {
        const auto seconds = static_cast<std::time_t>(std::floor(date.secondsSince1970));
        ::tzset();
        ::localtime_r(&seconds, &local);
    }
    constexpr std::int32_t kMilliseconds = 1000;
    const auto offset = static_cast<std::int32_t>(local.tm_gmtoff) * kMilliseconds;
    return std::make_unique<icu::SimpleTimeZone>(offset, icu::UnicodeString("Local"));
}

class DateFormatter final : public platform::DateFormatter {
public:
    DateFormatter(const std::string& locale, const base::Environment& environment)
    {
        UErrorCode status = U_ZERO_ERROR;
        m_format = std::make_unique<icu::SimpleDateFormat>(icu::UnicodeString(), icu::Locale(locale.c_str()), status);
        if (U_FAILURE(status))
            m_format.reset();
        else
            adopt(zoneOfTheDevice(environment));
    }

    void setDateFormat(std::string format) override
    {
        if (m_format)
            m_format->applyPattern(icu::UnicodeString::fromUTF8(format));
    }

    void setTimeZone(const std::optional<platform::TimeZone>& zone) override
    {
        if (!m_format || !zone)
            return;
        if (auto known = zoneNamed(zone->name))
            adopt(std::move(known));
    }

    std::string stringFromDate(base::Date date) const override
    {
        if (!m_format)
            return {};
        if (!m_hasZone)
            m_format->adoptTimeZone(zoneOfTheLibrary(date).release());
        std::string text;
        icu::UnicodeString formatted;
        return m_format->format(date.secondsSince1970 * 1000, formatted).toUTF8String(text);
    }

private:
    void adopt(std::unique_ptr<icu::TimeZone> zone)
    {
        m_hasZone = zone != nullptr;
        if (zone)
            m_format->adoptTimeZone(zone.release());
    }

    std::unique_ptr<icu::SimpleDateFormat> m_format; ///< null when ICU has no data at all
    bool m_hasZone = false;                          ///< otherwise each date has an offset of its own
};

} // namespace

std::string localeFromPosixName(std::string_view name)
{
    const auto at = std::min(name.find('@'), name.size());
    const std::string_view modifier = name.substr(std::min(at + 1, name.size()));
    const std::string_view territory = name.substr(0, std::min(name.find('.'), at));
    if (territory.empty() || territory == "C" || territory == "POSIX")
        return "en_US_POSIX";

    std::string locale(territory);
    const std::string_view script = modifier.starts_with("latin")      ? "_Latn"
                                    : modifier.starts_with("cyrillic") ? "_Cyrl"
                                                                       : "";
    return locale.insert(std::min(locale.find('_'), locale.size()), script);
}

Calendar::Calendar(base::Environment environment)
    : m_environment(environment ? std::move(environment) : base::Environment(base::environment))
{
}

std::unique_ptr<platform::DateFormatter> Calendar::makeDateFormatter() const
{
    std::string name;
    for (const char* variable : {"LC_ALL", "LC_TIME", "LANG"})
        if (name.empty())
            name = m_environment(variable);
    return std::make_unique<DateFormatter>(localeFromPosixName(name), m_environment);
}

std::optional<platform::TimeZone> Calendar::timeZoneWithName(const std::string& name) const
{
    if (!zoneNamed(name))
        return std::nullopt;
    return platform::TimeZone{name};
}

} // namespace intl
