#include "support/TempMovieNames.h"

namespace support {

std::string trimmedMovieName(std::string_view appName)
{
    return std::string(appName) + "_";
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
