#include "linux/icu/MessageCatalog.h"

#include <unicode/fmtable.h>
#include <unicode/locid.h>
#include <unicode/msgfmt.h>
#include <unicode/unistr.h>

#include <vector>

namespace intl {

namespace {

constexpr const char* kTable = "Localizable";
constexpr const char* kEnglish = "en";

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

} // namespace intl
