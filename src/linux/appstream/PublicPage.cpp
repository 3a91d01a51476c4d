#include "linux/appstream/PublicPage.h"

#include "base/Text.h"

#include <algorithm>
#include <string_view>

namespace appstream {

namespace {

constexpr const char* kFlathubPage = "https://flathub.org/apps/";

bool isOfFlathub(const Component& component)
{
    const std::string origin = component.origin();
    return origin == "flathub" || (origin == "flatpak" && component.hasCustomKey("flathub::"));
}

/// As Flatpak wants them: letters, digits, "_" and "-" between at least two dots. So they need no escaping either.
bool isFlatpakIdentifier(std::string_view text)
{
    return std::count(text.begin(), text.end(), '.') >= 2 && text.front() != '.' && text.back() != '.'
           && text.find("..") == std::string_view::npos && std::all_of(text.begin(), text.end(), [](char character) {
                  const char small = base::lowercase(character);
                  return (small >= 'a' && small <= 'z') || (character >= '0' && character <= '9') || character == '.'
                         || character == '_' || character == '-';
              });
}

/// Of "app/ID/machine/stable"; of other references nothing.
std::string stableApplication(const std::string& reference)
{
    constexpr std::string_view kApplication = "app/", kStable = "/stable";
    if (!reference.starts_with(kApplication) || !reference.ends_with(kStable))
        return {};
    return reference.substr(kApplication.size(), reference.find('/', kApplication.size()) - kApplication.size());
}

} // namespace

std::optional<std::string> publicPage(const Component& component)
{
    if (!isOfFlathub(component))
        return std::nullopt;
    const std::string reference = component.flatpakReference();
    const std::string identifier =
        reference.empty() ? withoutDesktop(component.identifier()) : stableApplication(reference);
    if (!isFlatpakIdentifier(identifier))
        return std::nullopt;
    return kFlathubPage + identifier;
}

} // namespace appstream
