#include "app/editor/StartTrace.h"

#include "base/Environment.h"

#include <cstdio>
#include <ctime>

namespace app {

void markStart(const char* name)
{
    static const bool wanted = !base::environment("CLIPSA_TRACE_START").empty();
    if (!wanted)
        return;
    // Not std::chrono, because others must be able to read the same clock.
    timespec now = {};
    ::clock_gettime(CLOCK_MONOTONIC, &now);
    std::fprintf(stderr, "%s %lld%09ld\n", name, static_cast<long long>(now.tv_sec), now.tv_nsec);
}

} // namespace app
