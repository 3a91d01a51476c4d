#include "linux/portals/Applications.h"

#include "base/Environment.h"
#include "base/Text.h"
#include "base/Url.h"

#include <algorithm>
#include <filesystem>
#include <glib.h>
#include <memory>
#include <set>
#include <sstream>
#include <string_view>
#include <unistd.h>

namespace portals {

namespace {

namespace fs = std::filesystem;

constexpr const char* kGroup = G_KEY_FILE_DESKTOP_GROUP;
constexpr std::string_view kSuffix = ".desktop";
/// Bytes; those of large programs have some hundred thousand.
constexpr std::uintmax_t kLargestFile = std::uintmax_t{1} << 20U;

using KeyFile = std::unique_ptr<GKeyFile, decltype(&g_key_file_unref)>;

KeyFile keyFileAt(const fs::path& path)
{
    KeyFile file(g_key_file_new(), g_key_file_unref);
    std::error_code error;
    // Its size is that of a regular file, or none.
    if (fs::file_size(path, error) > kLargestFile || error
        || !g_key_file_load_from_file(file.get(), path.c_str(), G_KEY_FILE_NONE, nullptr))
        file.reset();
    return file;
}

std::string textOf(char* taken)
{
    const std::unique_ptr<char, decltype(&g_free)> text(taken, g_free);
    return text ? text.get() : "";
}

std::string text(GKeyFile* file, const char* key)
{
    return textOf(g_key_file_get_string(file, kGroup, key, nullptr));
}

std::vector<std::string> list(GKeyFile* file, const char* group, const char* key)
{
    char** const taken = g_key_file_get_string_list(file, group, key, nullptr, nullptr);
    std::vector<std::string> found;
    for (char** each = taken; each && *each; ++each)
        found.emplace_back(*each);
    g_strfreev(taken);
    return found;
}

/// Only paths that begin at the root count.
std::vector<std::string> pathsIn(const std::string& variable)
{
    std::vector<std::string> paths;
    std::istringstream stream(variable);
    for (std::string path; std::getline(stream, path, ':');)
        if (path.starts_with('/'))
            paths.push_back(path);
    return paths;
}

std::vector<std::string> directories(const char* own, const char* ownDefault, const char* others,
                                     const char* othersDefault)
{
    std::vector<std::string> found = pathsIn(base::environment(own));
    if (found.size() != 1)
        found = {base::environment("HOME") + ownDefault};
    const std::string theirs = base::environment(others);
    for (std::string& path : pathsIn(theirs.empty() ? othersDefault : theirs))
        found.push_back(std::move(path));
    return found;
}

std::optional<std::string> programAt(const std::vector<std::string>& places, const std::string& name)
{
    if (name.starts_with('/'))
        return ::access(name.c_str(), X_OK) == 0 ? std::optional(name) : std::nullopt;
    for (const std::string& place : places) {
        const std::string path = place + "/" + name;
        std::error_code error;
        if (fs::is_regular_file(path, error) && ::access(path.c_str(), X_OK) == 0)
            return path;
    }
    return std::nullopt;
}

/// An identifier that the bus can start it by.
bool isBusName(const std::string& identifier)
{
    return g_ascii_isalpha(identifier.c_str()[0]) && identifier.find('.') != std::string::npos
           && std::all_of(identifier.begin(), identifier.end(), [](char letter) {
                  return g_ascii_isalnum(letter) || letter == '.' || letter == '_' || letter == '-';
              });
}

bool isTrue(GKeyFile* file, const char* key)
{
    return g_key_file_get_boolean(file, kGroup, key, nullptr);
}

std::optional<Application> messageApplication(GKeyFile* file, const fs::path& path, const std::string& identifier,
                                              const std::vector<std::string>& programs)
{
    const std::vector<std::string> interfaces = list(file, kGroup, "Implements");
    if (std::find(interfaces.begin(), interfaces.end(), kMessageComposer) == interfaces.end()
        || text(file, "Type") != G_KEY_FILE_DESKTOP_TYPE_APPLICATION || isTrue(file, "Hidden")
        || isTrue(file, "Terminal"))
        return std::nullopt;
    if (const std::string needed = text(file, "TryExec"); !needed.empty() && !programAt(programs, needed))
        return std::nullopt;
    Application found{identifier,
                      textOf(g_key_file_get_locale_string(file, kGroup, "Name", nullptr, nullptr)),
                      path.native(),
                      {},
                      {}};
    if (found.name.empty() || base::printable(found.name) != found.name)
        found.name = identifier;
    if (isTrue(file, "DBusActivatable") && isBusName(identifier))
        return found;
    found.command = text(file, "Exec");
    const auto words = commandFor(found, "/movie.mp4");
    const auto program = words.empty() ? std::nullopt : programAt(programs, words.front());
    if (!program)
        return std::nullopt;
    found.program = *program;
    return found;
}

/// One word of a command, with its codes filled.
std::string filled(const std::string& word, const Application& application, const std::string& path, bool& takesFile)
{
    std::string result;
    for (std::size_t at = 0; at < word.size(); ++at) {
        if (word[at] != '%' || at + 1 == word.size()) {
            result += word[at];
            continue;
        }
        switch (word[++at]) {
        case '%':
            result += '%';
            break;
        case 'f':
        case 'F':
            result += path;
            takesFile = true;
            break;
        case 'u':
        case 'U':
            result += base::Url::fromPath(path).string();
            takesFile = true;
            break;
        case 'c':
            result += application.name;
            break;
        case 'k':
            result += application.entry;
            break;
        default: // nothing that matters, or has mattered for long
            break;
        }
    }
    return result;
}

bool isInstalled(const ApplicationDirectories& places, const std::string& entry)
{
    return std::any_of(places.data.begin(), places.data.end(), [&](const std::string& place) {
        std::error_code error;
        return entry.find('/') == std::string::npos && fs::is_regular_file(place + "/applications/" + entry, error);
    });
}

bool opensMailAddresses(const ApplicationDirectories& places)
{
    constexpr const char* kMailto = "x-scheme-handler/mailto";
    const auto knows = [&](const std::string& path, const char* group) {
        const KeyFile file = keyFileAt(path);
        const auto entries = file ? list(file.get(), group, kMailto) : std::vector<std::string>();
        return std::any_of(entries.begin(), entries.end(),
                           [&](const std::string& entry) { return isInstalled(places, entry); });
    };
    std::vector<std::string> lists = places.configuration;
    for (const std::string& place : places.data)
        lists.push_back(place + "/applications");
    std::vector<std::string> names{"mimeapps.list"};
    for (std::istringstream desktops(base::environment("XDG_CURRENT_DESKTOP")); desktops.good();) {
        std::string desktop;
        std::getline(desktops, desktop, ':');
        std::transform(desktop.begin(), desktop.end(), desktop.begin(), base::lowercase);
        names.push_back(desktop + "-mimeapps.list");
    }
    for (const std::string& place : lists)
        for (const std::string& name : names)
            if (knows(place + "/" + name, "Default Applications") || knows(place + "/" + name, "Added Associations"))
                return true;
    return std::any_of(places.data.begin(), places.data.end(), [&](const std::string& place) {
        return knows(place + "/applications/mimeinfo.cache", "MIME Cache");
    });
}

} // namespace

ApplicationDirectories ApplicationDirectories::ofUser()
{
    return {directories("XDG_CONFIG_HOME", "/.config", "XDG_CONFIG_DIRS", "/etc/xdg"),
            directories("XDG_DATA_HOME", "/.local/share", "XDG_DATA_DIRS", "/usr/local/share:/usr/share"),
            pathsIn(base::environment("PATH"))};
}

std::vector<Application> messageApplications(const ApplicationDirectories& directories)
{
    std::vector<Application> found;
    std::set<std::string> known; // one in front hides those behind it
    for (const std::string& place : directories.data) {
        const fs::path root = fs::path(place) / "applications";
        std::error_code error;
        for (auto entry = fs::recursive_directory_iterator(root, error); !error && entry != end(entry);
             entry.increment(error)) {
            // "vendor/program.desktop" is called "vendor-program.desktop".
            std::string identifier = entry->path().lexically_relative(root).native();
            std::replace(identifier.begin(), identifier.end(), '/', '-');
            if (!identifier.ends_with(kSuffix))
                continue;
            identifier.resize(identifier.size() - kSuffix.size());
            if (!known.insert(identifier).second)
                continue;
            if (const KeyFile file = keyFileAt(entry->path()))
                if (auto application = messageApplication(file.get(), entry->path(), identifier, directories.programs))
                    found.push_back(std::move(*application));
        }
    }
    std::sort(found.begin(), found.end(), [](const Application& one, const Application& other) {
        return std::tie(one.name, one.identifier) < std::tie(other.name, other.identifier);
    });
    return found;
}

std::vector<std::string> commandFor(const Application& application, const std::string& path)
{
    int count = 0;
    char** words = nullptr;
    if (!g_shell_parse_argv(application.command.c_str(), &count, &words, nullptr))
        return {};
    std::vector<std::string> command;
    bool takesFile = false;
    for (int i = 0; i < count; ++i) {
        const std::string word = words[i];
        std::string result = filled(word, application, path, takesFile);
        if (!result.empty() || word.empty()) // a code alone that stands for nothing is no word
            command.push_back(std::move(result));
    }
    g_strfreev(words);
    if (!command.empty() && !application.program.empty())
        command.front() = application.program;
    return takesFile ? command : std::vector<std::string>();
}

std::optional<std::string> mailProgram(const ApplicationDirectories& directories)
{
    auto program = programAt(directories.programs, "xdg-email");
    return program && opensMailAddresses(directories) ? program : std::nullopt;
}

} // namespace portals
