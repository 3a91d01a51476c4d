#include "support/SystemCalls.h"

#include <sys/file.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace tests {

SystemCalls& systemCalls()
{
    static SystemCalls calls;
    return calls;
}

namespace {

template <typename Hook, typename Argument> std::optional<ssize_t> stoodIn(const Hook& hook, Argument argument)
{
    return hook ? hook(argument) : std::nullopt;
}

} // namespace

} // namespace tests

// The program's own are found before the library's.
extern "C" {

ssize_t copy_file_range(int from, off64_t* in, int to, off64_t* out, size_t count, unsigned flags)
{
    if (const auto result = tests::stoodIn(tests::systemCalls().copying, count))
        return *result;
    return ::syscall(SYS_copy_file_range, from, in, to, out, count, flags);
}

ssize_t pwrite(int file, const void* data, size_t count, off_t offset)
{
    if (const auto result = tests::stoodIn(tests::systemCalls().writing, count)) {
        // Less than all, but that really.
        return *result > 0 ? ::syscall(SYS_pwrite64, file, data, *result, offset) : *result;
    }
    return ::syscall(SYS_pwrite64, file, data, count, offset);
}

int flock(int file, int operation) noexcept
{
    if (const auto result = tests::stoodIn(tests::systemCalls().locking, file))
        return static_cast<int>(*result);
    return static_cast<int>(::syscall(SYS_flock, file, operation));
}

int fsync(int file)
{
    if (const auto result = tests::stoodIn(tests::systemCalls().flushing, file))
        return static_cast<int>(*result);
    return static_cast<int>(::syscall(SYS_fsync, file));
}
}
