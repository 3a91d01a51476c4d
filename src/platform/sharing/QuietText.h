/// A text of unknown origin, made fit to stand among other texts: no control characters, nothing that turns around what
/// stands beside it, and no longer than somebody looks at. Any thread.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace platform {

/// As many characters as fill some lines of a sheet, and more.
inline constexpr std::size_t kShownCharacters = 400;

/// The first characters of `text`, in lines: line breaks stay (one in place of several), other control characters become
/// spaces, marks of direction and bytes that are no UTF-8 are left out. An ellipsis stands for what was cut off.
/// Costs what the result is long, not what `text` is.
std::string quietText(std::string_view text, std::size_t mostCharacters = kShownCharacters);

/// The same on one line, and set apart from what stands around it, whichever way it runs itself.
std::string quietName(std::string_view name);

} // namespace platform
