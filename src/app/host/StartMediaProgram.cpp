#include "app/host/StartMediaProgram.h"

#include "app/host/ExitStatus.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
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
            std::fprintf(stderr, "clipsa: cannot start %s: %s\n", program.c_str(), std::strerror(errno));
            return kExitFailed;
        }
    }
    std::fputs("clipsa: there is no clipsa-media beside this program; install Clipsa again\n", stderr);
    return kExitFailed;
}

} // namespace host
