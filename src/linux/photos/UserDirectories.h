/// Where the user's desktop keeps what belongs to the library.
#pragma once

#include <string>

namespace photos {

/// Absolute, without a slash at the end; none of them needs to be there.
struct UserDirectories {
    std::string videos;       ///< the library
    std::string thumbnails;   ///< of all programs, one directory for each size below it
    std::string recentFiles;  ///< the file that lists them for all programs
    std::string unsaved = {}; ///< ours: movies that could not be put into the library

    /// As the user has set them; the directory for videos is ~/Videos when none is set. Any thread.
    static UserDirectories ofUser();
};

} // namespace photos
