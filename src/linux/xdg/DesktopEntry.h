/// An installed application as a bundle: what its desktop entry says. Any thread.
///
/// The entry's own name is the bundle's name; the name in the user's language is its display name. Whoever wrote the entry
/// has not asked anybody: names that are empty, not UTF-8, or of more than one line, are none.
#pragma once

#include "platform/files/Bundle.h"
#include "platform/files/Languages.h"

#include <filesystem>
#include <map>
#include <memory>
#include <string>

namespace xdg {

class DesktopEntry final : public platform::Bundle {
public:
    /// Null when `path` holds no application, or one that its user has hidden.
    static std::shared_ptr<const DesktopEntry> open(const std::filesystem::path& path, std::string identifier,
                                                    const platform::Languages& languages);

    const std::string& bundlePath() const override { return m_path; }
    std::string bundleIdentifier() const override { return m_identifier; }
    /// An entry has no resources.
    std::string resourcePath() const override { return m_path; }
    /// The languages that its name was translated to.
    std::vector<std::string> localizations() const override;
    platform::StringsTable infoDictionary() const override;
    platform::StringsTable localizedInfoDictionary() const override;
    std::optional<std::string> pathForResource(const std::string&, const std::string&,
                                               const std::string&) const override
    {
        return std::nullopt;
    }
    std::string localizedString(std::string_view key, const std::optional<std::string>& value,
                                const std::string& table) const override;

    /// The program that it starts, as it is written there; empty when it names none.
    const std::string& program() const { return m_program; }

private:
    DesktopEntry(const std::filesystem::path& path, std::string identifier, const platform::Languages& languages)
        : m_path(path.native()), m_identifier(std::move(identifier)), m_languages(languages)
    {
    }

    const std::string m_path;
    const std::string m_identifier;
    const platform::Languages& m_languages;
    std::string m_name;
    std::map<std::string, std::string> m_names; ///< by language
    std::string m_program;
};

} // namespace xdg
