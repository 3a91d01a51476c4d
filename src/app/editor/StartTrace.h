/// Tells how far the start has come, for ./bench: with CLIPSA_TRACE_START in the environment, each mark is a line of
/// standard error with a name and the nanoseconds of CLOCK_MONOTONIC. Any thread.
#pragma once

namespace app {

void markStart(const char* name);

} // namespace app
