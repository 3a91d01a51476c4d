/// What installed applications say of themselves: a small file for each, read anew each time, as applications come and
/// go. About a millisecond. Any thread.
#pragma once

#include "base/Log.h"
#include "linux/appstream/Component.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace appstream {

class Metainfo {
public:
    /// Larger files are no descriptions.
    static constexpr std::uintmax_t kLargestFile = std::uintmax_t(4) << 20;

    /// The log outlives it.
    Metainfo(base::Log& log, std::vector<std::filesystem::path> directories);

    /// From the most important directory that has it; nothing when none has, or the file cannot be read, which is said on
    /// the log.
    std::optional<Component> find(const std::string& identifier, const std::string& locale) const;

private:
    std::optional<std::filesystem::path> fileOf(const std::string& identifier) const;

    base::Log& m_log;
    const std::vector<std::filesystem::path> m_directories;
};

} // namespace appstream
