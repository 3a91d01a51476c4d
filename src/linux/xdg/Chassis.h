/// What kind of machine this is, where no service on the system bus says it. Any thread; reads files.
#pragma once

#include <filesystem>
#include <optional>
#include <string>

namespace xdg {

/// In hostnamed's words ("handset", "tablet", "laptop", …): what the owner wrote into /etc/machine-info, else what the
/// firmware says of the enclosure. Nothing when neither knows. Paths are below `root`.
std::optional<std::string> chassisFromMachineInfo(const std::filesystem::path& root = "/");

} // namespace xdg
