/// The page of an application in the public form of the catalogue that it stands in. Any thread.
#pragma once

#include "linux/appstream/Component.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace appstream {

/// | catalogue | known by | page |
/// |---|---|---|
/// | Flathub | the origin "flathub"; or "flatpak", which the tools of all such repositories write, with a custom value of Flathub's or an icon among those of the remote "flathub" | https://flathub.org/apps/ID |
///
/// ID is that of the Flatpak bundle, without ".desktop" where there is none. Of other branches than "stable" there are no
/// pages. Distributions (Debian, Fedora, …) have no lasting page by an application's id: there is none for their origins.
///
/// `remotes` are the directories of storefront::Options.
std::optional<std::string> publicPage(const Component& component, const std::vector<std::filesystem::path>& remotes);

} // namespace appstream
