#include "linux/appstream/PublicPage.h"

#include "base/Text.h"

#include <algorithm>
#include <string_view>
#include <system_error>

namespace appstream {

namespace {

namespace fs = std::filesystem;

constexpr const char* kFlathubPage = "https://flathub.org/apps/";

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

/// Flatpak keeps an icon of each application that a remote publishes: remote/machine/active/icons/size/ID.png.
bool hasIcon(const fs::path& remote, const std::string& identifier)
{
    std::error_code error;
    for (auto machine = fs::directory_iterator(remote, error); !error && machine != end(machine);
         machine.increment(error))
        for (const char* size : {"128x128", "64x64"}) {
            std::error_code unknown;
            if (fs::exists(machine->path() / "active/icons" / size / (identifier + ".png"), unknown))
                return true;
        }
    return false;
}

bool isOfFlathub(const Component& component, const std::string& identifier, const std::vector<fs::path>& remotes)
{
    const std::string origin = component.origin();
    return origin == "flathub"
           || (origin == "flatpak"
               && (component.hasCustomKey("flathub::")
                   || std::any_of(remotes.begin(), remotes.end(), [&](const fs::path& directory) {
                          return hasIcon(directory / "flathub", identifier);
                      })));
}

} // namespace

std::optional<std::string> publicPage(const Component& component, const std::vector<fs::path>& remotes)
{
    const std::string reference = component.flatpakReference();
    const std::string identifier =
        reference.empty() ? withoutDesktop(component.identifier()) : stableApplication(reference);
    if (!isFlatpakIdentifier(identifier) || !isOfFlathub(component, identifier, remotes))
        return std::nullopt;
    return kFlathubPage + identifier;
}

} // namespace appstream
