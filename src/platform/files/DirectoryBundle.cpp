#include "platform/files/DirectoryBundle.h"

#include <cerrno>
#include <cstddef>
#include <utility>

namespace platform {

namespace {

constexpr std::string_view kLanguageDirectory = ".lproj";
constexpr const char* kInfo = "Info";
constexpr std::size_t kLargestTable = std::size_t{4} << 20; // bytes; our largest has some ten thousand

const std::string* find(const StringsTable& table, std::string_view key)
{
    const auto found = table.find(key);
    return found == table.end() ? nullptr : &found->second;
}

} // namespace

std::shared_ptr<const DirectoryBundle> DirectoryBundle::open(FileManager& files, const Languages& languages,
                                                             const std::string& path)
{
    // Its contents are asked for because attributes are those of a link, where `path` is one.
    if (!files.contentsOfDirectory(path))
        return nullptr;
    return std::shared_ptr<const DirectoryBundle>(new DirectoryBundle(files, languages, path));
}

std::string DirectoryBundle::bundleIdentifier() const
{
    const std::string* identifier = find(table(pathOf({}, kInfo)), kIdentifierKey);
    return identifier ? *identifier : std::string();
}

std::vector<std::string> DirectoryBundle::localizations() const
{
    std::vector<std::string> found;
    for (const std::string& name : m_files.contentsOfDirectory(m_path).valueOr({}))
        if (name.size() > kLanguageDirectory.size() && name.ends_with(kLanguageDirectory))
            found.push_back(name.substr(0, name.size() - kLanguageDirectory.size()));
    return found;
}

StringsTable DirectoryBundle::infoDictionary() const
{
    return table(pathOf({}, kInfo));
}

StringsTable DirectoryBundle::localizedInfoDictionary() const
{
    return table(pathOf(chosenLocalization(), kInfo));
}

std::optional<std::string> DirectoryBundle::pathForResource(const std::string& name, const std::string& type,
                                                            const std::string& localization) const
{
    std::string path = pathOf(localization, name, type);
    if (!m_files.fileExists(path))
        return std::nullopt;
    return path;
}

std::string DirectoryBundle::localizedString(std::string_view key, const std::optional<std::string>& value,
                                             const std::string& tableName) const
{
    if (const std::string* text = find(table(pathOf({}, tableName)), key))
        return *text;
    if (const std::string* text = find(table(pathOf(chosenLocalization(), tableName)), key))
        return *text;
    return value && !value->empty() ? *value : std::string(key);
}

std::string DirectoryBundle::pathOf(const std::string& localization, const std::string& name,
                                    const std::string& type) const
{
    const std::string directory =
        localization.empty() ? m_path : m_path + "/" + localization + std::string(kLanguageDirectory);
    return directory + "/" + name + "." + type;
}

std::string DirectoryBundle::chosenLocalization() const
{
    const auto serving = m_languages.preferredLocalizations(localizations(), m_languages.preferredLanguages());
    if (!serving.empty())
        return serving.front();
    const std::string* development = find(table(pathOf({}, kInfo)), kDevelopmentLocalizationKey);
    return development ? *development : "en";
}

const StringsTable& DirectoryBundle::table(const std::string& path) const
{
    const std::lock_guard lock(m_mutex);
    const auto known = m_tables.find(path);
    if (known != m_tables.end())
        return known->second;
    StringsTable& table = m_tables[path];
    const auto text = m_files.contentsOfFile(path, kLargestTable);
    base::ErrorRef error = text.error();
    if (text) {
        ParsedStrings parsed = parseStrings(text.value(), path);
        table = std::move(parsed.table);
        error = parsed.error;
    }
    // A table that is not there is a table without words.
    if (error && error->code() != ENOENT)
        m_files.system().log.error(error->description());
    return table;
}

} // namespace platform
