/// What is known of an application, put into the user's words. Any thread.
#pragma once

#include "linux/appstream/Component.h"
#include "linux/storefront/Source.h"

#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace appstream {

/// What a source says of one application in a language; nothing when it does not know it.
using FindComponent = std::function<std::optional<Component>(const std::string& locale)>;

/// By `find`, which is asked once for each language that is needed, the first of the options' to begin with. Texts are in the
/// first of them to which they were translated, else as they were written. Nothing when it does not know the application.
std::optional<storefront::Facts> factsOf(const FindComponent& find, const storefront::Options& options,
                                         bool inUsersLanguages);

} // namespace appstream
