/// What goes into a mail, as its composer can take it. Any thread.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace portals {

/// Bytes. Composers are started with all of it in one argument, which the kernel limits to 128 KiB, and there a byte can
/// become three.
inline constexpr std::size_t kLongestMailBody = 30'000;
inline constexpr std::size_t kLongestMailSubject = 200;

/// One line, without marks that turn text around. What is too long ends in an ellipsis.
std::string mailSubject(std::string_view text);
/// Lines, without any other control characters. What is too long ends in an ellipsis: the user sees it in the composer,
/// where more can be written.
std::string mailBody(std::string_view text);

} // namespace portals
