/// Texts as GLib makes them, so that they are the same as other programs'. Any thread.
#pragma once

#include <string>

namespace photos {

/// The address of a file by which desktops know it; `path` is absolute.
std::string uriOf(const std::string& path);

/// In hexadecimal digits.
std::string md5Of(const std::string& text);

} // namespace photos
