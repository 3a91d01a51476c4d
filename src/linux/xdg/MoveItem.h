/// Moving an item, between file systems too, without ever replacing one. Any thread.
#pragma once

#include <string>

namespace xdg {

/// 0, or the `errno` of what failed: EEXIST when something is at `to`, a dangling link included.
///
/// Across file systems a copy is made beside `to` under a hidden name, with permissions and modification dates, links
/// as links, and is then renamed: what is at `to` is whole. Sockets, pipes and devices do not cross (EXDEV).
[[nodiscard]] int moveItem(const std::string& from, const std::string& to);

/// The copy's half of it: as `moveItem` across file systems, but `from` stays.
[[nodiscard]] int copyItem(const std::string& from, const std::string& to);

} // namespace xdg
