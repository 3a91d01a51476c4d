/// Calls of the system that a test stands in for, where what matters happens once or in an order: a signal in the middle,
/// a disk that takes less than it was given, somebody who comes in between. For suites that link tests-system-calls; one
/// test at a time, and while nothing runs that calls them.
#pragma once

#include <functional>
#include <optional>
#include <sys/types.h>

namespace tests {

/// Told before the call is made; what it gives, if anything, is the call's result, with errno.
struct SystemCalls {
    std::function<std::optional<ssize_t>(std::size_t count)> copying; ///< copy_file_range()
    std::function<std::optional<ssize_t>(std::size_t count)> writing; ///< pwrite()
    std::function<std::optional<ssize_t>(int file)> locking;          ///< flock()
    std::function<std::optional<ssize_t>(int file)> flushing;         ///< fsync()
};

/// What the calls do now; empty: as always.
SystemCalls& systemCalls();

} // namespace tests
