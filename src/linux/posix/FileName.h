/// What a file can be called wherever it may go. Any thread.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace posix {

/// `text` without what some file system, shell or file manager takes amiss, in at most so many bytes; never empty.
std::string fileNameSafe(std::string_view text, std::size_t mostBytes);

/// The same of a whole name: what is too long loses letters before its extension.
std::string wholeFileNameSafe(std::string_view name, std::size_t mostBytes);

} // namespace posix
