/// Copies what is in a file into an empty one, in the quickest way that the file systems know. Any thread; copying blocks.
/// Both files stay open; the source's offset is left alone, that of the copy is not defined afterwards.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>

namespace posix {

/// Lets the copy have the source's blocks, which takes no time and no room. False where the file systems cannot do that.
bool shareContents(int from, int to);

/// Copies within the kernel or, where it cannot do that, by hand. Gives 0 or an error number: ENODATA when the source ends
/// before `size`, which is what it is to hold; without a size all of it is copied, however long it has become. `goOn` is
/// told how many bytes are there, and stops the copying with ECANCELED when it gives false; it may be empty.
int copyContents(int from, int to, std::optional<std::uint64_t> size,
                 const std::function<bool(std::uint64_t copied)>& goOn);

} // namespace posix
