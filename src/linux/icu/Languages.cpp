#include "linux/icu/Languages.h"

#include "base/Environment.h"

#include <unicode/localematcher.h>
#include <unicode/locid.h>

#include <algorithm>
#include <iterator>
#include <optional>
#include <utility>

namespace intl {

namespace {

constexpr const char* kUndetermined = "und";
constexpr const char* kNoLanguage = "en_US_POSIX"; // what localeFromPosixName() makes of "C"

/// As in "pt-BR"; nothing of what names no language.
std::optional<std::string> languageTag(const std::string& posixName)
{
    const std::string name = localeFromPosixName(posixName);
    if (name == kNoLanguage)
        return std::nullopt;
    UErrorCode status = U_ZERO_ERROR;
    auto tag = icu::Locale(name.c_str()).toLanguageTag<std::string>(status);
    if (U_FAILURE(status) || tag.empty() || tag.starts_with(kUndetermined))
        return std::nullopt;
    return tag;
}

std::vector<std::string> preferredIn(const base::Environment& environment)
{
    std::vector<std::string> preferred;
    for (const std::string& name : base::preferredLocales(environment))
        if (const auto tag = languageTag(name);
            tag && std::find(preferred.begin(), preferred.end(), *tag) == preferred.end())
            preferred.push_back(*tag);
    if (preferred.empty())
        preferred.emplace_back("en");
    return preferred;
}

icu::Locale localeOf(const std::string& tag)
{
    UErrorCode status = U_ZERO_ERROR;
    icu::Locale locale = icu::Locale::forLanguageTag(tag, status);
    if (U_FAILURE(status) || *locale.getLanguage() == '\0')
        locale.setToBogus();
    return locale;
}

} // namespace

Languages::Languages(const base::Environment& environment)
    : m_preferred(preferredIn(environment ? environment : base::Environment(base::environment)))
{
}

std::vector<std::string> Languages::preferredLocalizations(const std::vector<std::string>& localizations,
                                                           const std::vector<std::string>& preferences) const
{
    // The matcher tells which one it means by its address.
    std::vector<icu::Locale> known;
    std::vector<std::size_t> places; // in `localizations`
    for (std::size_t i = 0; i < localizations.size(); ++i)
        if (icu::Locale locale = localeOf(localizations[i]); !locale.isBogus()) {
            known.push_back(std::move(locale));
            places.push_back(i);
        }

    UErrorCode status = U_ZERO_ERROR;
    icu::LocaleMatcher::Builder builder;
    builder.setSupportedLocales(known.begin(), known.end());
    builder.setNoDefaultLocale();
    const icu::LocaleMatcher matcher = builder.build(status);

    std::vector<std::string> serving;
    for (const std::string& preference : preferences) {
        const icu::Locale desired = localeOf(preference);
        if (desired.isBogus() || U_FAILURE(status))
            continue;
        const auto result = matcher.getBestMatchResult(desired, status);
        if (U_FAILURE(status) || !result.getSupportedLocale())
            continue;
        const std::string& name = localizations[places[static_cast<std::size_t>(result.getSupportedIndex())]];
        if (std::find(serving.begin(), serving.end(), name) == serving.end())
            serving.push_back(name);
    }
    return serving;
}

} // namespace intl
