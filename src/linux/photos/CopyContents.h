/// Copies what is in a file into an empty one, in the quickest way that the file systems know: shared blocks, a copy
/// within the kernel, a copy by hand. Any thread; it blocks.
#pragma once

#include "base/Result.h"

#include <cstdint>
#include <functional>

namespace photos {

/// `goOn` is told the part that is done, from 0 to 1, and stops the copying with ECANCELED when it gives false; it may be
/// empty. `size` is what the source holds: a source that ends earlier is an error. Both files stay open, and their offsets
/// are not defined afterwards.
base::Result<void> copyContents(int from, int to, std::uint64_t size, const std::function<bool(double)>& goOn);

} // namespace photos
