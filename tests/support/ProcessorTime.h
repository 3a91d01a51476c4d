/// How far a program is, by the work that it has done: a clock on the wall goes on while others have the processors.
#pragma once

#include "support/Child.h"

#include <chrono>
#include <ctime>
#include <optional>
#include <sched.h>
#include <sys/types.h>

namespace tests {

using ProcessorTime = std::chrono::nanoseconds;

/// What all threads of a process have used so far; nothing once nobody knows of it any more.
inline std::optional<ProcessorTime> processorTimeOf(pid_t process)
{
    clockid_t clock{};
    timespec time{};
    if (::clock_getcpuclockid(process, &clock) != 0 || ::clock_gettime(clock, &time) != 0)
        return std::nullopt;
    return std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec);
}

/// Returns when the process has used so much, or has ended; gives what it has used. Nobody tells of that: it is asked
/// again and again.
inline ProcessorTime waitForWork(pid_t process, ProcessorTime amount = ProcessorTime::max())
{
    ProcessorTime last{};
    while (const auto used = processorTimeOf(process)) {
        last = *used;
        if (last >= amount || waitForEnd(process, Milliseconds(0)))
            break;
        ::sched_yield();
    }
    return last;
}

} // namespace tests
