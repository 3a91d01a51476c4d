#include "app/host/StartMediaProgram.h"

#include "app/host/ExitStatus.h"
#include "app/host/Streams.h"
#include "base/Error.h"

#include <cerrno>
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
            complain(base::Error::fromErrno(errno, "cannot start " + program.native())->description());
            return kExitFailed;
        }
    }
    complain("there is no clipsa-media beside this program; install Clipsa again");
    return kExitFailed;
}

} // namespace host
