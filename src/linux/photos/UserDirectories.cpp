#include "linux/photos/UserDirectories.h"

#include <filesystem>
#include <glib.h>

namespace photos {

namespace {

/// As file managers name it: links are kept, doubled slashes and the one at the end are not.
std::string plain(const std::filesystem::path& path)
{
    const auto normal = path.lexically_normal();
    return normal.has_filename() ? normal.native() : normal.parent_path().native();
}

} // namespace

UserDirectories UserDirectories::ofUser()
{
    const char* videos = g_get_user_special_dir(G_USER_DIRECTORY_VIDEOS);
    const std::filesystem::path home = g_get_home_dir();
    return {plain(videos ? std::filesystem::path(videos) : home / "Videos"),
            plain(std::filesystem::path(g_get_user_cache_dir()) / "thumbnails"),
            plain(std::filesystem::path(g_get_user_data_dir()) / "recently-used.xbel"),
            plain(std::filesystem::path(g_get_user_data_dir()) / "clipsa/unsaved")};
}

} // namespace photos
