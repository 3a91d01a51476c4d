/// What is shared, in order: texts, and files by their addresses.
#pragma once

#include "base/Url.h"

#include <string>
#include <variant>
#include <vector>

namespace platform {

using ShareItem = std::variant<std::string, base::Url>;
using ShareItems = std::vector<ShareItem>;

/// The files among them, in order: the movie, then what goes along with it.
std::vector<base::Url> filesOf(const ShareItems& items);
/// The texts among them that are not empty, one a line.
std::string textOf(const ShareItems& items);

} // namespace platform
