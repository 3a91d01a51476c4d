/// What is in a directory. Any thread.
#pragma once

#include <algorithm>
#include <filesystem>
#include <string>
#include <system_error>
#include <vector>

namespace tests {

/// The names of what is in a directory, in order; none when it is not there.
inline std::vector<std::string> namesIn(const std::filesystem::path& directory)
{
    std::vector<std::string> names;
    std::error_code ignored;
    for (const auto& entry : std::filesystem::directory_iterator(directory, ignored))
        names.push_back(entry.path().filename());
    std::sort(names.begin(), names.end());
    return names;
}

} // namespace tests
