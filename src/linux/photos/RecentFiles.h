/// The list of recent files that all programs share. Any thread; it blocks.
#pragma once

#include "base/Result.h"

#include <string>

namespace photos {

/// Adds `file` to the list in the file `list`, which is made when it is missing and replaced at once. A list that cannot
/// be read is left as it is.
base::Result<void> addRecentFile(const std::string& list, const std::string& file);

} // namespace photos
