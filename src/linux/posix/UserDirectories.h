/// Where a program keeps what is its own among the user's files. Asked before there are threads.
#pragma once

#include "base/Result.h"

#include <string>

namespace posix {

/// A path that a variable of the environment names; empty where it names none that begins at the root.
std::string environmentPath(const char* name);

/// "$XDG_CACHE_HOME/clipsa", or ".cache/clipsa" in the home directory; an error when there is neither.
base::Result<std::string> userCacheDirectory();

} // namespace posix
