/// UTF-8 text of unknown origin. Any thread.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace base {

/// The bytes of the UTF-8 character that `text` begins with; 0 when it begins with none.
std::size_t characterLength(std::string_view text);

/// How many UTF-8 characters `text` has; each byte that belongs to none counts as one.
std::size_t characterCount(std::string_view text);

/// The small letter of an ASCII letter, whatever the locale; all else as it is.
char lowercase(char character);

/// `text` as one line for a terminal or a log: control characters, those that turn text around, and bytes that are no
/// UTF-8 become question marks.
std::string printable(std::string_view text);

} // namespace base
