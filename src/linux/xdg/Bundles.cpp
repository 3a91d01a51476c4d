#include "linux/xdg/Bundles.h"

#include "platform/files/DirectoryBundle.h"

#include <algorithm>
#include <climits>
#include <glib.h>
#include <sstream>
#include <unistd.h>
#include <utility>

namespace xdg {

namespace {

namespace fs = std::filesystem;

constexpr std::string_view kEntrySuffix = ".desktop";
constexpr const char* kInfoTable = "/Info.strings";

/// Where an entry of this identifier can lie below `applications/`: "sub-vendor" also as "sub/vendor".
std::vector<std::string> entryPaths(const std::string& identifier)
{
    std::vector<std::string> paths = {identifier};
    std::string nested = identifier;
    for (std::size_t dash = nested.find('-'); dash != std::string::npos; dash = nested.find('-', dash)) {
        nested[dash] = '/';
        if (fs::path(nested).lexically_normal() != nested)
            break; // no way out of the directory
        paths.push_back(nested);
    }
    return paths;
}

/// "sub/vendor.desktop" is called "sub-vendor".
std::string identifierOf(const fs::path& entry, const fs::path& applications)
{
    std::string identifier = entry.lexically_relative(applications).native();
    identifier.resize(identifier.size() - kEntrySuffix.size());
    std::replace(identifier.begin(), identifier.end(), '/', '-');
    return identifier;
}

bool isSafeIdentifier(const std::string& identifier)
{
    constexpr std::size_t kLongest = 255; // bytes, of a file name
    return !identifier.empty() && identifier.size() <= kLongest && identifier.find('/') == std::string::npos
           && identifier.find('\0') == std::string::npos && identifier.front() != '.';
}

bool isWordOf(const std::string& words, std::string_view word)
{
    std::istringstream stream(words);
    for (std::string each; stream >> each;)
        if (each == word)
            return true;
    return false;
}

/// Whether a command that begins with `program` starts the file at `executable`.
bool starts(const std::string& program, const fs::path& executable)
{
    if (program.empty() || fs::path(program).filename() != executable.filename())
        return false;
    const std::unique_ptr<char, decltype(&g_free)> found(g_find_program_in_path(program.c_str()), g_free);
    std::error_code error;
    return found && fs::equivalent(found.get(), executable, error);
}

} // namespace

BundlePlaces BundlePlaces::ofUser()
{
    BundlePlaces places;
    places.applications.emplace_back(g_get_user_data_dir());
    for (const char* const* each = g_get_system_data_dirs(); *each; ++each)
        places.applications.emplace_back(*each);
    return places;
}

Bundles::Bundles(platform::FileManager& files, const platform::Languages& languages, BundlePlaces places)
    : m_files(files), m_languages(languages), m_places(std::move(places))
{
}

platform::BundleRef Bundles::bundleWithPath(const std::string& path)
{
    if (path.ends_with(kEntrySuffix))
        return DesktopEntry::open(m_files.resolvedPath(path), fs::path(path).stem(), m_languages);
    const std::lock_guard lock(m_mutex);
    if (const auto known = m_directories.find(path); known != m_directories.end())
        return known->second;
    auto opened = platform::DirectoryBundle::open(m_files, m_languages, path);
    if (opened)
        m_directories.emplace(path, opened);
    return opened;
}

platform::BundleRef Bundles::bundleWithURL(const base::Url& url)
{
    return url.isFile() ? bundleWithPath(url.path()) : nullptr;
}

platform::BundleRef Bundles::bundleWithIdentifier(const std::string& identifier)
{
    if (!isSafeIdentifier(identifier))
        return nullptr;
    std::vector<platform::BundleRef> opened;
    {
        const std::lock_guard lock(m_mutex);
        for (const auto& [path, bundle] : m_directories)
            opened.push_back(bundle);
    }
    for (const auto& bundle : opened)
        if (bundle->bundleIdentifier() == identifier)
            return bundle;
    return applicationWithIdentifier(identifier);
}

std::shared_ptr<const DesktopEntry> Bundles::applicationWithIdentifier(const std::string& identifier) const
{
    for (const fs::path& place : m_places.applications)
        for (const std::string& path : entryPaths(identifier)) {
            const fs::path entry = place / "applications" / (path + std::string(kEntrySuffix));
            std::error_code error;
            // The first that is there counts, also when it says that there is no such application.
            if (fs::exists(fs::symlink_status(entry, error)))
                return DesktopEntry::open(entry, identifier, m_languages);
        }
    return nullptr;
}

platform::BundleRef Bundles::bundleForClassNamed(std::string_view name)
{
    for (const std::string& directory : m_places.frameworks) {
        std::vector<std::string> names = m_files.contentsOfDirectory(directory).valueOr({});
        std::sort(names.begin(), names.end());
        for (const std::string& each : names) {
            const platform::BundleRef bundle = bundleWithPath(directory + "/" + each);
            const auto info = bundle ? bundle->infoDictionary() : platform::StringsTable();
            const auto classes = info.find(platform::DirectoryBundle::kClassesKey);
            if (classes != info.end() && isWordOf(classes->second, name))
                return bundle;
        }
    }
    return nullptr;
}

std::optional<std::string> Bundles::executablePathOfProcess(std::int32_t process)
{
    const fs::path link = m_places.processes / std::to_string(process) / "exe";
    std::string path(PATH_MAX, '\0');
    const ssize_t size = process > 0 ? ::readlink(link.c_str(), path.data(), path.size()) : -1;
    if (size < 0)
        return std::nullopt;
    path.resize(static_cast<std::size_t>(size));
    return path;
}

std::optional<base::Url> Bundles::bundleURLForExecutableURL(const base::Url& executable)
{
    if (!executable.isFile() || !executable.path().starts_with('/'))
        return std::nullopt;
    const fs::path program = executable.path();
    for (fs::path directory = program.parent_path(); directory != directory.root_path();
         directory = directory.parent_path())
        if (m_files.fileExists(directory.native() + kInfoTable))
            return base::Url::fromPath(directory);

    for (const fs::path& place : m_places.applications) {
        const fs::path applications = place / "applications";
        std::error_code error;
        for (auto entry = fs::recursive_directory_iterator(applications, error); !error && entry != end(entry);
             entry.increment(error)) {
            if (entry->path().extension() != kEntrySuffix)
                continue;
            const auto known = applicationWithIdentifier(identifierOf(entry->path(), applications));
            if (known && starts(known->program(), program))
                return base::Url::fromPath(known->bundlePath());
        }
    }
    return std::nullopt;
}

} // namespace xdg
