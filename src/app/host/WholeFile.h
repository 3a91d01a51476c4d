/// Writes files that are there whole or not at all. Any thread.
#pragma once

#include "base/Result.h"

#include <cstdint>
#include <filesystem>
#include <vector>

namespace host {

/// Writes `bytes` beside `path` and gives them its name when they are all there. Without `replaces`, a file that has the
/// name already is an error and stays as it is; the same goes for a name that appears meanwhile. Nobody may read it who
/// may not read a file with these permissions.
base::Result<void> writeWholeFile(const std::filesystem::path& path, const std::vector<std::uint8_t>& bytes,
                                  bool replaces, std::filesystem::perms permissions);

} // namespace host
