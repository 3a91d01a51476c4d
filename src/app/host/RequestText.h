/// Texts that come from outside, checked and made fit for what they are used for. Any thread.
#pragma once

#include "base/Result.h"

#include <optional>
#include <string>
#include <string_view>

namespace host {

/// UTF-8, without NUL, and short enough to travel; `what` names it in the error.
base::Result<void> checkText(std::string_view text, const std::string& what);

/// A name for a file in a directory of our own: the last component, with what cannot be in a name or on the wire
/// replaced, short enough for a file system; `fallback` when nothing is left.
std::string safeFileName(std::string_view name, std::string_view fallback);

/// An app's name as a title, and as the start of the file names that the editor makes of it: slashes become fraction
/// slashes, line ends spaces, and it ends at 200 bytes, between two characters.
std::string safeAppName(std::string_view name);

/// "recording.mp4" gives "recording".
std::string withoutExtension(std::string_view fileName);

} // namespace host
