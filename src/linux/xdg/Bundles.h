/// The bundles of this machine: directories with an Info table, the frameworks below the mounted "/System/Library" among
/// them, and installed applications, which are known by their desktop entries. Any thread.
///
/// A directory that was opened is kept: whoever asks for it again gets the same bundle. Entries are read anew each time,
/// as applications come and go.
#pragma once

#include "linux/xdg/DesktopEntry.h"
#include "platform/files/Bundles.h"
#include "platform/files/FileManager.h"

#include <filesystem>
#include <map>
#include <mutex>
#include <string>
#include <vector>

namespace xdg {

struct BundlePlaces {
    /// Directories of frameworks, as the device knows them.
    std::vector<std::string> frameworks = {"/System/Library/Frameworks", "/System/Library/PrivateFrameworks"};
    /// Directories with `applications/` in them, most important first.
    std::vector<std::filesystem::path> applications;
    std::filesystem::path processes = "/proc";

    /// With the applications of the user and of the machine.
    static BundlePlaces ofUser();
};

class Bundles final : public platform::Bundles {
public:
    /// Files and languages outlive this.
    Bundles(platform::FileManager& files, const platform::Languages& languages, BundlePlaces places);

    const platform::Languages& languages() const override { return m_languages; }
    platform::BundleRef bundleWithPath(const std::string& path) override;
    platform::BundleRef bundleWithURL(const base::Url& url) override;
    platform::BundleRef bundleWithIdentifier(const std::string& identifier) override;
    /// Of the first framework whose Info table has the class.
    platform::BundleRef bundleForClassNamed(std::string_view name) override;
    std::optional<std::string> executablePathOfProcess(std::int32_t process) override;
    /// The nearest directory above it that has an Info table; else the entry that starts it.
    std::optional<base::Url> bundleURLForExecutableURL(const base::Url& executable) override;

private:
    std::shared_ptr<const DesktopEntry> applicationWithIdentifier(const std::string& identifier) const;

    platform::FileManager& m_files;
    const platform::Languages& m_languages;
    const BundlePlaces m_places;
    std::mutex m_mutex;
    std::map<std::string, platform::BundleRef> m_directories; ///< by path
};

} // namespace xdg
