// Amounts in the user's words: times, sizes, lists.
#include "linux/icu/MessageCatalog.h"

#include <unicode/fmtable.h>
#include <unicode/listformatter.h>
#include <unicode/locid.h>
#include <unicode/measfmt.h>
#include <unicode/measunit.h>
#include <unicode/measure.h>
#include <unicode/numfmt.h>
#include <unicode/unistr.h>

#include <algorithm>
#include <cmath>
#include <memory>
#include <vector>

namespace intl {

namespace {

constexpr double kSecondsInAMinute = 60;
constexpr double kMinutesInAnHour = 60;
constexpr double kLongest = 1e9; // seconds

/// What is no such time is none.
double sane(double seconds)
{
    return std::isfinite(seconds) ? std::clamp(seconds, 0.0, kLongest) : 0;
}

icu::Locale localeOf(const std::string& language)
{
    UErrorCode status = U_ZERO_ERROR;
    return icu::Locale::forLanguageTag(language, status);
}

std::string toUtf8(const icu::UnicodeString& text)
{
    std::string result;
    return text.toUTF8String(result);
}

std::string formatted(const icu::MeasureFormat& format, const std::vector<icu::Measure>& measures, UErrorCode& status)
{
    icu::UnicodeString text;
    icu::FieldPosition nowhere;
    format.formatMeasures(measures.data(), static_cast<std::int32_t>(measures.size()), text, nowhere, status);
    return toUtf8(text);
}

class Measures {
public:
    explicit Measures(UErrorCode& status) : m_status(status) {}

    void addHours(double number) { add(number, icu::MeasureUnit::createHour(m_status)); }
    void addMinutes(double number) { add(number, icu::MeasureUnit::createMinute(m_status)); }
    void addSeconds(double number) { add(number, icu::MeasureUnit::createSecond(m_status)); }
    const std::vector<icu::Measure>& all() const { return m_measures; }

private:
    void add(double number, icu::MeasureUnit* unit)
    {
        m_measures.emplace_back(icu::Formattable(number), unit, m_status);
    }

    UErrorCode& m_status;
    std::vector<icu::Measure> m_measures;
};

} // namespace

std::string MessageCatalog::duration(double seconds, int decimals) const
{
    constexpr double kHair = 1e-6; // a time that was added up may fall short of what it means
    const double scale = std::pow(10, decimals);
    const double reached = std::floor(sane(seconds) * scale + kHair) / scale;
    const double minutes = std::floor(reached / kSecondsInAMinute);
    const double hours = std::floor(minutes / kMinutesInAnHour);

    UErrorCode status = U_ZERO_ERROR;
    Measures measures(status);
    if (hours > 0)
        measures.addHours(hours);
    if (minutes > 0)
        measures.addMinutes(minutes - hours * kMinutesInAnHour);
    measures.addSeconds(reached - minutes * kSecondsInAMinute);

    const icu::Locale locale = localeOf(m_locale);
    icu::NumberFormat* numbers = icu::NumberFormat::createInstance(locale, status);
    if (numbers)
        numbers->setMaximumFractionDigits(decimals);
    const icu::MeasureFormat format(locale, UMEASFMT_WIDTH_WIDE, numbers, status); // owns the numbers
    return formatted(format, measures.all(), status);
}

std::string MessageCatalog::clock(double seconds) const
{
    const double whole = std::floor(sane(seconds));
    const double minutes = std::floor(whole / kSecondsInAMinute);
    const double hours = std::floor(minutes / kMinutesInAnHour);
    UErrorCode status = U_ZERO_ERROR;
    Measures measures(status);
    if (hours > 0)
        measures.addHours(hours);
    measures.addMinutes(minutes - hours * kMinutesInAnHour);
    measures.addSeconds(whole - minutes * kSecondsInAMinute);
    return formatted({localeOf(m_locale), UMEASFMT_WIDTH_NUMERIC, status}, measures.all(), status);
}

std::string MessageCatalog::fileSize(std::int64_t bytes) const
{
    constexpr double kThousand = 1000;
    constexpr double kShownWhole = 100; // from there on a decimal says nothing
    using Make = icu::MeasureUnit* (*)(UErrorCode&);
    constexpr Make kUnits[] = {&icu::MeasureUnit::createByte, &icu::MeasureUnit::createKilobyte,
                               &icu::MeasureUnit::createMegabyte, &icu::MeasureUnit::createGigabyte,
                               &icu::MeasureUnit::createTerabyte};
    auto number = static_cast<double>(std::max<std::int64_t>(0, bytes));
    std::size_t unit = 0;
    const auto rounded = [&] {
        return unit > 0 && number < kShownWhole ? std::round(number * 10) / 10 : std::round(number);
    };
    while (rounded() >= kThousand && unit + 1 < std::size(kUnits)) {
        number /= kThousand;
        ++unit;
    }
    UErrorCode status = U_ZERO_ERROR;
    const icu::Locale locale = localeOf(m_locale);
    icu::NumberFormat* numbers = icu::NumberFormat::createInstance(locale, status);
    if (numbers)
        numbers->setMaximumFractionDigits(number < kShownWhole && unit > 0 ? 1 : 0);
    const icu::MeasureFormat format(locale, UMEASFMT_WIDTH_SHORT, numbers, status); // owns the numbers
    return formatted(format, {{icu::Formattable(rounded()), kUnits[unit](status), status}}, status);
}

std::string MessageCatalog::list(const std::vector<std::string>& names) const
{
    UErrorCode status = U_ZERO_ERROR;
    const std::unique_ptr<icu::ListFormatter> format(icu::ListFormatter::createInstance(localeOf(m_locale), status));
    std::vector<icu::UnicodeString> parts;
    parts.reserve(names.size());
    for (const std::string& name : names)
        parts.push_back(icu::UnicodeString::fromUTF8(name));
    icu::UnicodeString text;
    if (format)
        format->format(parts.data(), static_cast<std::int32_t>(parts.size()), text, status);
    return toUtf8(text);
}

} // namespace intl
