#include "support/TempMovieNames.h"

#include <algorithm>
#include <cstddef>

namespace support {

namespace {

/// Bytes of an app's name, so that the seconds and the ending still fit into a file's.
constexpr std::size_t kLongestAppName = 200;

bool continuesCharacter(char byte)
{
    return (static_cast<unsigned char>(byte) & 0xC0) == 0x80;
}

/// What stands for a byte that no file name may have; empty when it may.
std::string_view substituteFor(char byte)
{
    if (byte == '/')
        return "\u2044"; // looks the same
    const bool isControl = (byte & 0xE0) == 0 || byte == 0x7F;
    return isControl ? " " : "";
}

} // namespace

std::string trimmedMovieName(std::string_view appName)
{
    std::string name;
    for (const char byte : appName) {
        const std::string_view substitute = substituteFor(byte);
        name += substitute.empty() ? std::string_view(&byte, 1) : substitute;
    }
    std::size_t end = std::min(name.size(), kLongestAppName);
    while (end > 0 && continuesCharacter(name[end]))
        --end;
    name.resize(end);
    return name + "_";
}

std::string tempMovieStem(std::string_view tempPath, std::string_view name)
{
    return std::string(tempPath) + "/" + std::string(name);
}

base::Url tempMovieUrl(std::string_view stem, base::Date now)
{
    return base::Url::fromPath(std::string(stem) + std::to_string(now.wholeSeconds()) + ".mp4");
}

} // namespace support
