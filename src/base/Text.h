/// UTF-8 text of unknown origin. Any thread.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace base {

/// The bytes of the UTF-8 character that `text` begins with; 0 when it begins with none.
std::size_t characterLength(std::string_view text);

/// The small letter of an ASCII letter, whatever the locale; all else as it is.
char lowercase(char character);

/// What a hexadecimal digit stands for; -1 when it is none.
int hexadecimalDigit(char character);

/// `format` with its places filled: "%@" by the next of `arguments`, "%2$@" by the second. "%%" is a percent sign; what has no
/// argument is left out, and all else stays as it is.
std::string formatted(std::string_view format, const std::vector<std::string>& arguments);

/// `text` as one line for a terminal or a log: control characters, those that turn text around, and bytes that are no
/// UTF-8 become question marks.
std::string printable(std::string_view text);

} // namespace base
