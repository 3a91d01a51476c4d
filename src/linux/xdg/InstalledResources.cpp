#include "linux/xdg/InstalledResources.h"

#include <filesystem>
#include <system_error>

namespace xdg {

std::string resourceDirectory()
{
    std::error_code ignored;
    const std::filesystem::path programs = std::filesystem::read_symlink("/proc/self/exe", ignored).parent_path();
    const std::filesystem::path beside = programs / "../share/clipsa"; // first: another Clipsa's may be further away
    return std::filesystem::exists(beside, ignored) ? beside.native() : (programs / "../../share/clipsa").native();
}

std::string wordsPath()
{
    return resourceDirectory() + "/Clipsa.bundle";
}

} // namespace xdg
