/// A bundle that is a directory: `Info.strings` is its Info table, a directory `xx.lproj` holds the tables of a language,
/// `Info.strings` among them. A directory of one language is a bundle, too. Any thread.
///
/// Tables are read when they are first asked for, once. One that cannot be read, or only in part, is said on the log.
#pragma once

#include "platform/files/Bundle.h"
#include "platform/files/FileManager.h"
#include "platform/files/Languages.h"

#include <map>
#include <mutex>
#include <utility>

namespace platform {

class DirectoryBundle final : public Bundle {
public:
    /// Of an Info table: the language that is used where none serves the user ("en" unless it is said), what the bundle
    /// is known by, and the classes that come with it, divided by spaces.
    static constexpr const char* kDevelopmentLocalizationKey = "DevelopmentLocalization";
    static constexpr const char* kIdentifierKey = "BundleIdentifier";
    static constexpr const char* kClassesKey = "Classes";

    /// Null when there is no directory at `path`. Files and languages outlive it.
    static std::shared_ptr<const DirectoryBundle> open(FileManager& files, const Languages& languages,
                                                       const std::string& path);

    const std::string& bundlePath() const override { return m_path; }
    std::string bundleIdentifier() const override;
    std::string resourcePath() const override { return m_path; }
    std::vector<std::string> localizations() const override;
    StringsTable infoDictionary() const override;
    StringsTable localizedInfoDictionary() const override;
    std::optional<std::string> pathForResource(const std::string& name, const std::string& type,
                                               const std::string& localization) const override;
    std::string localizedString(std::string_view key, const std::optional<std::string>& value,
                                const std::string& table) const override;

private:
    DirectoryBundle(FileManager& files, const Languages& languages, std::string path)
        : m_files(files), m_languages(languages), m_path(std::move(path))
    {
    }

    /// A name in the directory itself, or in that of a language.
    std::string pathOf(const std::string& localization, const std::string& name,
                       const std::string& type = "strings") const;
    std::string chosenLocalization() const;
    const StringsTable& table(const std::string& path) const;

    FileManager& m_files;
    const Languages& m_languages;
    const std::string m_path;
    mutable std::mutex m_mutex;
    mutable std::map<std::string, StringsTable> m_tables; ///< by path; they stay where they are
};

} // namespace platform
