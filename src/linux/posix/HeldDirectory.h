/// A directory of one process's own, below a root that it shares with others: a lock in it says that somebody still needs
/// it, and goes with the process. Any thread.
///
/// Nobody removes it with the object: whoever made it does, or, later, whoever sweeps the root.
#pragma once

#include "base/Result.h"
#include "linux/posix/FileDescriptor.h"

#include <chrono>
#include <string>
#include <string_view>

namespace posix {

struct HeldDirectory {
    std::string path;
    FileDescriptor lock; ///< whoever inherits it holds the directory, too

    /// `root`/`prefix`XXXXXX, which nobody but the user may enter. `root` is made where it is not there.
    static base::Result<HeldDirectory> make(const std::string& root, std::string_view prefix);
};

/// Whether nobody holds the directory any more, and it was made at least `age` ago. False for what is no directory of the
/// user's. One without a lock is being made just now, and is abandoned after a day.
bool isAbandoned(const std::string& path, std::chrono::seconds age = {});

/// With all that is in it, and the lock last: what cannot be removed, or when we are killed here, is swept another time.
void removeHeldDirectory(const std::string& path);

} // namespace posix
