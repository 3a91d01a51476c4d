#include "app/host/Streams.h"

#include "app/host/ExitStatus.h"
#include "base/Text.h"

#include <cstdio>
#include <fcntl.h>
#include <unistd.h>

namespace host {

void keepStandardStreams()
{
    // The lowest number that is free is the missing stream's. Written to one for reading, a result is an error.
    for (int number = ::open("/dev/null", O_RDONLY); number >= 0; number = ::open("/dev/null", O_RDONLY))
        if (number > STDERR_FILENO) {
            ::close(number);
            return;
        }
}

void complain(std::string_view text)
{
    std::fprintf(stderr, "clipsa: %s\n", base::printable(text).c_str());
}

int finishOutput(int status)
{
    const bool isWritten = std::fflush(stdout) == 0 && std::ferror(stdout) == 0;
    if (isWritten)
        return status;
    complain("cannot write to standard output; is the disk full, or the output closed?");
    return status == kExitDone ? kExitFailed : status;
}

} // namespace host
