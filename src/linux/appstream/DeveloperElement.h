/// Who made an application, where its description says so in an element that AppStream 0.16 does not know yet. Any thread.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace appstream {

/// The text of component/developer/name in a description, as it was written; nothing of what has none or is no XML.
std::optional<std::string> developerElement(std::string_view xml);

} // namespace appstream
