#include "linux/xdg/DesktopEntry.h"

#include "base/Text.h"

#include <glib.h>

#include <algorithm>
#include <utility>

namespace xdg {

namespace {

constexpr const char* kGroup = G_KEY_FILE_DESKTOP_GROUP;
constexpr std::string_view kNameKey = G_KEY_FILE_DESKTOP_KEY_NAME;
constexpr std::uintmax_t kLargestEntry = std::uintmax_t{1}
                                         << 20U; // bytes; those of large programs have some hundred thousand

using KeyFile = std::unique_ptr<GKeyFile, decltype(&g_key_file_unref)>;

KeyFile keyFileAt(const std::filesystem::path& path)
{
    KeyFile file(g_key_file_new(), g_key_file_unref);
    std::error_code error;
    // Its size is that of a regular file, or none.
    if (std::filesystem::file_size(path, error) > kLargestEntry || error
        || !g_key_file_load_from_file(file.get(), path.c_str(), G_KEY_FILE_KEEP_TRANSLATIONS, nullptr))
        file.reset();
    return file;
}

std::string text(GKeyFile* file, const std::string& key)
{
    const std::unique_ptr<char, decltype(&g_free)> found(g_key_file_get_string(file, kGroup, key.c_str(), nullptr),
                                                         g_free);
    return found ? found.get() : "";
}

/// Empty when it is none.
std::string name(GKeyFile* file, const std::string& key)
{
    std::string found = text(file, key);
    return base::printable(found) == found ? found : std::string();
}

/// "sr@latin" is "sr-Latn".
std::string languageOf(std::string posixName)
{
    const std::size_t at = posixName.find('@');
    const std::string modifier = at == std::string::npos ? "" : posixName.substr(at + 1);
    posixName.resize(std::min(posixName.find_first_of(".@"), posixName.size()));
    std::replace(posixName.begin(), posixName.end(), '_', '-');
    if (modifier == "latin" || modifier == "cyrillic")
        posixName.insert(std::min(posixName.find('-'), posixName.size()), modifier == "latin" ? "-Latn" : "-Cyrl");
    return posixName;
}

/// The first word, with quotes and backslashes as entries have them.
std::string firstWord(const std::string& command)
{
    int count = 0;
    char** words = nullptr;
    if (!g_shell_parse_argv(command.c_str(), &count, &words, nullptr))
        return {};
    std::string first = count > 0 ? words[0] : "";
    g_strfreev(words);
    return first;
}

} // namespace

std::shared_ptr<const DesktopEntry> DesktopEntry::open(const std::filesystem::path& path, std::string identifier,
                                                       const platform::Languages& languages)
{
    const KeyFile file = keyFileAt(path);
    if (!file || text(file.get(), G_KEY_FILE_DESKTOP_KEY_TYPE) != G_KEY_FILE_DESKTOP_TYPE_APPLICATION
        || g_key_file_get_boolean(file.get(), kGroup, G_KEY_FILE_DESKTOP_KEY_HIDDEN, nullptr))
        return nullptr;
    const std::shared_ptr<DesktopEntry> entry(new DesktopEntry(path, std::move(identifier), languages));
    entry->m_name = name(file.get(), std::string(kNameKey));
    entry->m_program = firstWord(text(file.get(), G_KEY_FILE_DESKTOP_KEY_EXEC));

    const std::string begin = std::string(kNameKey) + "[";
    char** keys = g_key_file_get_keys(file.get(), kGroup, nullptr, nullptr);
    for (char** key = keys; key && *key; ++key) {
        const std::string_view each = *key;
        if (!each.starts_with(begin) || !each.ends_with(']'))
            continue;
        if (std::string translated = name(file.get(), *key); !translated.empty())
            entry->m_names.emplace(languageOf(std::string(each.substr(begin.size(), each.size() - begin.size() - 1))),
                                   std::move(translated));
    }
    g_strfreev(keys);
    return entry;
}

std::vector<std::string> DesktopEntry::localizations() const
{
    std::vector<std::string> found;
    for (const auto& [language, translated] : m_names)
        found.push_back(language);
    return found;
}

platform::StringsTable DesktopEntry::infoDictionary() const
{
    platform::StringsTable table;
    if (!m_name.empty())
        table.emplace(platform::kBundleNameKey, m_name);
    return table;
}

platform::StringsTable DesktopEntry::localizedInfoDictionary() const
{
    // What has no language is English by custom: who prefers that to a translation gets it.
    std::vector<std::string> known = localizations();
    if (!m_names.contains("en"))
        known.emplace_back("en");
    const auto serving = m_languages.preferredLocalizations(known, m_languages.preferredLanguages());
    const auto found = serving.empty() ? m_names.end() : m_names.find(serving.front());
    platform::StringsTable table;
    if (found != m_names.end())
        table.emplace(platform::kBundleDisplayNameKey, found->second);
    return table;
}

std::string DesktopEntry::localizedString(std::string_view key, const std::optional<std::string>& value,
                                          const std::string& /*table*/) const
{
    return value && !value->empty() ? *value : std::string(key);
}

} // namespace xdg
