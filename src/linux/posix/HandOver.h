/// Puts a file where somebody else may do with it what they like: never the user's only one, but a name of its own for
/// the same bytes, or a copy. Any thread; a copy takes its time.
#pragma once

#include "base/Result.h"

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace posix {

enum class HandOverWay {
    HardLink, ///< whoever writes to it writes to the source
    Reflink,
    Copy
};

/// Is told of each step of a copy; false stops it.
using CopyProgress = std::function<bool(std::uint64_t copied, std::uint64_t total)>;

/// The first of `ways` that works, the last of which is a copy: makes `directory`/`name`, which must not exist. Reads
/// through `source` without moving its position; never writes to it. The modification date goes along, and so do the
/// permissions where the file system has them. After an error or a stop (ECANCELED) there is no such file.
base::Result<HandOverWay>
handOver(int source, const std::string& directory, const std::string& name, const CopyProgress& goOn = {},
         const std::vector<HandOverWay>& ways = {HandOverWay::HardLink, HandOverWay::Reflink, HandOverWay::Copy});

} // namespace posix
