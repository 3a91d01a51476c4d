/// The page of an application in the public form of the catalogue that it stands in. Any thread.
#pragma once

#include "linux/appstream/Component.h"

#include <optional>
#include <string>

namespace appstream {

/// | catalogue | known by | page |
/// |---|---|---|
/// | Flathub | the origin "flathub"; or "flatpak", which the tools of such repositories write, with a custom value of Flathub's | https://flathub.org/apps/ID |
///
/// ID is that of the Flatpak bundle, without ".desktop" where there is none. Of other branches than "stable" there are no
/// pages. Distributions (Debian, Fedora, …) have no lasting page by an application's id: there is none for their origins.
std::optional<std::string> publicPage(const Component& component);

} // namespace appstream
