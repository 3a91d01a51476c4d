#include "linux/icu/MessageCatalog.h"

#include <unicode/fmtable.h>
#include <unicode/locid.h>
#include <unicode/measfmt.h>
#include <unicode/measunit.h>
#include <unicode/measure.h>
#include <unicode/msgfmt.h>
#include <unicode/numfmt.h>
#include <unicode/unistr.h>

#include <algorithm>
#include <cmath>
#include <vector>

namespace intl {

namespace {

constexpr const char* kTable = "Localizable";
constexpr const char* kEnglish = "en";
constexpr double kSecondsInAMinute = 60;
constexpr double kMinutesInAnHour = 60;

std::string baseOf(const std::string& language)
{
    return language.substr(0, language.find('-'));
}

icu::Formattable formattable(const platform::MessageArgument& argument)
{
    if (const auto* text = std::get_if<std::string>(&argument.value))
        return icu::UnicodeString::fromUTF8(*text);
    if (const auto* number = std::get_if<std::int64_t>(&argument.value))
        return *number;
    return std::get<double>(argument.value);
}

icu::Locale localeOf(const std::string& language)
{
    UErrorCode status = U_ZERO_ERROR;
    return icu::Locale::forLanguageTag(language, status);
}

} // namespace

MessageCatalog::MessageCatalog(platform::Bundles& bundles, const std::string& path) : m_locale(kEnglish)
{
    m_english = bundles.bundleWithPath(path + "/" + kEnglish + ".lproj");
    const platform::BundleRef bundle = bundles.bundleWithPath(path);
    if (!bundle)
        return;
    const std::vector<std::string> preferred = bundles.languages().preferredLanguages();
    const auto serving = bundles.languages().preferredLocalizations(bundle->localizations(), preferred);
    if (serving.empty())
        return;
    m_words = bundles.bundleWithPath(path + "/" + serving.front() + ".lproj");
    m_locale = serving.front();
    for (const std::string& language : preferred)
        if (baseOf(language) == baseOf(serving.front())) {
            m_locale = language;
            break;
        }
    m_isRightToLeft = localeOf(serving.front()).isRightToLeft();
}

std::string MessageCatalog::text(std::string_view key) const
{
    for (const auto& bundle : {m_words, m_english}) {
        std::string found = bundle ? bundle->localizedString(key, std::nullopt, kTable) : std::string(key);
        if (found != key)
            return found;
    }
    return std::string(key);
}

std::string MessageCatalog::text(std::string_view key, const std::vector<platform::MessageArgument>& arguments) const
{
    const std::string pattern = text(key);
    std::vector<icu::UnicodeString> names;
    std::vector<icu::Formattable> values;
    for (const platform::MessageArgument& each : arguments) {
        names.emplace_back(each.name);
        values.push_back(formattable(each));
    }
    UErrorCode status = U_ZERO_ERROR;
    const icu::MessageFormat format(icu::UnicodeString::fromUTF8(pattern), localeOf(m_locale), status);
    icu::UnicodeString message;
    format.format(names.data(), values.data(), static_cast<std::int32_t>(names.size()), message, status);
    if (U_FAILURE(status))
        return pattern; // the table is broken; its words are better than none
    std::string result;
    return message.toUTF8String(result);
}

std::string MessageCatalog::duration(double seconds, int decimals) const
{
    constexpr double kLongest = 1e9; // seconds
    constexpr double kHair = 1e-6;   // a time that was added up may fall short of what it means
    const double scale = std::pow(10, decimals);
    const double whole = std::isfinite(seconds) ? std::clamp(seconds, 0.0, kLongest) : 0;
    const double reached = std::floor(whole * scale + kHair) / scale;
    const double minutes = std::floor(reached / kSecondsInAMinute);
    const double hours = std::floor(minutes / kMinutesInAnHour);

    UErrorCode status = U_ZERO_ERROR;
    std::vector<icu::Measure> measures;
    const auto add = [&](double number, icu::MeasureUnit* unit) {
        measures.emplace_back(icu::Formattable(number), unit, status);
    };
    if (hours > 0)
        add(hours, icu::MeasureUnit::createHour(status));
    if (minutes > 0)
        add(minutes - hours * kMinutesInAnHour, icu::MeasureUnit::createMinute(status));
    add(reached - minutes * kSecondsInAMinute, icu::MeasureUnit::createSecond(status));

    const icu::Locale locale = localeOf(m_locale);
    icu::NumberFormat* numbers = icu::NumberFormat::createInstance(locale, status);
    if (numbers)
        numbers->setMaximumFractionDigits(decimals);
    const icu::MeasureFormat format(locale, UMEASFMT_WIDTH_WIDE, numbers, status); // owns the numbers
    icu::UnicodeString text;
    icu::FieldPosition nowhere;
    format.formatMeasures(measures.data(), static_cast<std::int32_t>(measures.size()), text, nowhere, status);
    std::string result;
    return text.toUTF8String(result);
}

} // namespace intl
