/// Saves a copy of a file where the user wants it. Any thread; takes its time.
#pragma once

#include "base/Result.h"

#include <cstdint>
#include <functional>
#include <string>

namespace sharing {

/// Makes `path`, or takes the place of what is there: with all of `source`'s bytes, or not at all, whatever happens. `goOn`
/// is told of each step, and stops it when it gives false (ECANCELED). The error carries a message for people.
base::Result<void> saveCopy(int source, const std::string& path,
                            const std::function<bool(std::uint64_t copied, std::uint64_t total)>& goOn);

} // namespace sharing
