/// UTF-8 text of unknown origin. Any thread.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace base {

/// The bytes of the UTF-8 character that `text` begins with; 0 when it begins with none.
std::size_t characterLength(std::string_view text);

/// The small letter of an ASCII letter, whatever the locale; all else as it is.
char lowercase(char character);

/// What a hexadecimal digit stands for; -1 when it is none.
int hexadecimalDigit(char character);

/// `text` as one line for a terminal or a log: control characters, those that turn text around, and bytes that are no
/// UTF-8 become question marks.
std::string printable(std::string_view text);

} // namespace base
