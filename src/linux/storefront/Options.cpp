#include "linux/storefront/Options.h"

#include "base/Environment.h"

#include <algorithm>
#include <cctype>
#include <glib.h>
#include <utility>

namespace storefront {

namespace {

/// "de_AT@euro" of "de_AT.UTF-8@euro". Nothing of what is no locale: names become names of files.
std::string withoutCodeset(std::string name)
{
    const std::size_t codeset = name.find('.');
    if (codeset != std::string::npos)
        name.erase(codeset, std::min(name.find('@', codeset), name.size()) - codeset);
    const bool isName = std::all_of(name.begin(), name.end(), [](unsigned char character) {
        return std::isalnum(character) != 0 || character == '_' || character == '-' || character == '@';
    });
    if (name == "POSIX")
        return "C";
    return isName ? name : std::string();
}

/// Whether whoever reads `locale` has been served by `other` as far as can be.
bool isServedBy(const std::string& locale, const std::string& other)
{
    return other == locale || other.starts_with(locale + "_");
}

bool isEnglish(const std::string& locale)
{
    return locale == "C" || locale == "en" || locale.starts_with("en_") || locale.starts_with("en@");
}

} // namespace

std::vector<std::string> preferredLocales(const base::Environment& environment)
{
    std::vector<std::string> locales;
    for (const std::string& name : base::preferredLocales(environment)) {
        const std::string locale = withoutCodeset(name);
        if (locale.empty() || std::any_of(locales.begin(), locales.end(), [&](const std::string& other) {
                return isServedBy(locale, other);
            }))
            continue;
        // What is behind it would never be asked; nor need it be where another fails: that is what texts are written in.
        const bool isLast = isEnglish(locale);
        if (!isLast || locales.empty())
            locales.push_back(locale);
        if (isLast)
            break;
    }
    if (locales.empty())
        locales.emplace_back("C");
    return locales;
}

Options Options::ofUser()
{
    Options options;
    options.locales = preferredLocales(base::environment);
    std::vector<std::filesystem::path> data = {g_get_user_data_dir()};
    for (const char* const* each = g_get_system_data_dirs(); *each; ++each)
        data.emplace_back(*each);
    options.remotes.push_back(data.front() / "flatpak/appstream");
    for (const auto& directory : data)
        options.metainfo.push_back(directory / "metainfo");
    return options;
}

} // namespace storefront
