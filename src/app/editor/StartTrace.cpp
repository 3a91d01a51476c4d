#include "app/editor/StartTrace.h"

#include <cstdio>
#include <cstdlib>
#include <ctime>

namespace app {

void markStart(const char* name)
{
    static const bool wanted = std::getenv("CLIPSA_TRACE_START"); // NOLINT(concurrency-mt-unsafe): nobody sets it
    if (!wanted)
        return;
    // Not std::chrono, because others must be able to read the same clock.
    timespec now = {};
    ::clock_gettime(CLOCK_MONOTONIC, &now);
    std::fprintf(stderr, "%s %lld%09ld\n", name, static_cast<long long>(now.tv_sec), now.tv_nsec);
}

} // namespace app
