/// Puts a movie where an editor may do with it what it likes: never the user's only file, but a name of its own for
/// the same bytes, or a copy. Any thread; a copy takes its time.
#pragma once

#include "base/Result.h"

#include <cstdint>
#include <functional>
#include <string>

namespace host {

enum class HandOverWay { HardLink, Reflink, Copy };

/// Is told of each step of a copy; false stops it.
using CopyProgress = std::function<bool(std::uint64_t copied, std::uint64_t total)>;

/// The first way that works of hard link, reflink and copy, starting with `first`: makes `directory`/`name`, which must
/// not exist. Reads through `source` without moving its position; never writes to it. The modification date goes along,
/// and so do the permissions where the file system has them. After an error or a stop (ECANCELED) there is no such file.
base::Result<HandOverWay> handOver(int source, const std::string& directory, const std::string& name,
                                   const CopyProgress& goOn = {}, HandOverWay first = HandOverWay::HardLink);

} // namespace host
