/// Keeps a movie that could not be put into the library. Any thread; it blocks.
#pragma once

#include "base/Result.h"
#include "linux/photos/LibraryName.h"

#include <string>
#include <vector>

namespace photos {

/// Gives the open movie a second name in the first of the directories that takes it, or a copy there where that is not
/// possible; a file that has other names already is rather copied, if there is room. Replaces nothing. A directory is
/// made when it is missing. Gives the path, or the first directory's error.
base::Result<std::string> keepUnsaved(int movie, const LibraryName& name, const std::vector<std::string>& directories);

} // namespace photos
