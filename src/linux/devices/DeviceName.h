/// What a device calls itself, as it can stand in the user's list. Any thread.
#pragma once

#include <string>
#include <string_view>

namespace devices {

/// The longest name that is shown whole, in characters.
inline constexpr std::size_t kLongestName = 40;

/// One line without what is no text: control characters, marks that turn text around, bytes that are no UTF-8. A longer name
/// ends in an ellipsis. Empty when nothing is left that could be seen.
std::string readableName(std::string_view name);

} // namespace devices
