#include "linux/posix/UserDirectories.h"

#include "base/Environment.h"

#include <cerrno>
#include <pwd.h>
#include <unistd.h>

namespace posix {

std::string environmentPath(const char* name)
{
    std::string value = base::environment(name);
    return value.starts_with('/') ? value : "";
}

base::Result<std::string> userCacheDirectory()
{
    if (const std::string cache = environmentPath("XDG_CACHE_HOME"); !cache.empty())
        return cache + "/clipsa";
    if (const std::string home = environmentPath("HOME"); !home.empty())
        return home + "/.cache/clipsa";
    const passwd* user = ::getpwuid(::geteuid()); // NOLINT(concurrency-mt-unsafe): asked once, before any thread
    if (user && user->pw_dir[0] == '/')
        return std::string(user->pw_dir) + "/.cache/clipsa";
    return base::Error::make(base::kPosixErrorDomain, ENOENT, "there is no home directory; set XDG_CACHE_HOME");
}

} // namespace posix
