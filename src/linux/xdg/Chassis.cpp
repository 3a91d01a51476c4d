#include "linux/xdg/Chassis.h"

#include <fstream>
#include <string_view>

namespace xdg {

namespace {

std::string_view trimmed(std::string_view text)
{
    constexpr std::string_view kSpace = " \t\r";
    const auto first = text.find_first_not_of(kSpace);
    if (first == std::string_view::npos)
        return {};
    return text.substr(first, text.find_last_not_of(kSpace) - first + 1);
}

std::string_view unquoted(std::string_view text)
{
    const bool isQuoted =
        text.size() >= 2 && (text.front() == '"' || text.front() == '\'') && text.back() == text.front();
    return isQuoted ? text.substr(1, text.size() - 2) : text;
}

/// The last assignment counts, as in a shell.
std::optional<std::string> writtenByTheOwner(const std::filesystem::path& file)
{
    constexpr std::string_view kAssignment = "CHASSIS=";
    std::optional<std::string> chassis;
    std::ifstream lines(file);
    for (std::string line; std::getline(lines, line);)
        if (const std::string_view text = trimmed(line); text.starts_with(kAssignment))
            chassis = unquoted(text.substr(kAssignment.size()));
    return chassis && !chassis->empty() ? chassis : std::nullopt;
}

/// Enclosure types of the System Management BIOS reference, section "System Enclosure or Chassis Types".
std::optional<std::string> knownToTheFirmware(const std::filesystem::path& file)
{
    int type = 0;
    std::ifstream(file) >> type;
    switch (type) {
    case 0x03: // desktop
    case 0x04: // low-profile desktop
    case 0x06: // mini tower
    case 0x07: // tower
    case 0x0D: // all in one
    case 0x23: // mini PC
    case 0x24: // stick PC
        return "desktop";
    case 0x08: // portable
    case 0x09: // laptop
    case 0x0A: // notebook
    case 0x0E: // sub-notebook
        return "laptop";
    case 0x0B:
        return "handset";
    case 0x11: // main server chassis
    case 0x17: // rack mount
    case 0x1C: // blade
    case 0x1D: // blade enclosure
        return "server";
    case 0x1E:
        return "tablet";
    case 0x1F: // convertible
    case 0x20: // detachable
        return "convertible";
    default:
        return std::nullopt;
    }
}

} // namespace

std::optional<std::string> chassisFromMachineInfo(const std::filesystem::path& root)
{
    if (auto chassis = writtenByTheOwner(root / "etc/machine-info"))
        return chassis;
    return knownToTheFirmware(root / "sys/class/dmi/id/chassis_type");
}

} // namespace xdg
