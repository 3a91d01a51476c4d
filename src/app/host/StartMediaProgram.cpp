#include "app/host/StartMediaProgram.h"

#include "app/host/ExitStatus.h"
#include "app/host/Streams.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <string>
#include <system_error>
#include <unistd.h>

namespace host {

int startMediaProgram(char* const words[])
{
    std::error_code ignored;
    const std::filesystem::path own = std::filesystem::read_symlink("/proc/self/exe", ignored).parent_path();
    for (const auto& program : {own / "clipsa-media", own.parent_path() / "libexec/clipsa/clipsa-media"}) {
        ::execv(program.c_str(), words);
        if (errno != ENOENT && errno != ENOTDIR) {
            // NOLINTNEXTLINE(concurrency-mt-unsafe): there is one thread
            complain("cannot start " + program.native() + ": " + std::strerror(errno));
            return kExitFailed;
        }
    }
    complain("there is no clipsa-media beside this program; install Clipsa again");
    return kExitFailed;
}

} // namespace host
