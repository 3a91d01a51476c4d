/// Dating files. Any thread.
#pragma once

#include <ctime>
#include <fcntl.h>
#include <filesystem>
#include <gtest/gtest.h>
#include <sys/stat.h>

namespace tests {

/// Seconds since 1970; of a link itself, not of what it points to.
inline void setModified(const std::filesystem::path& path, double seconds)
{
    struct timespec times[2] = {};
    for (struct timespec& time : times)
        time = {static_cast<std::time_t>(seconds),
                static_cast<long>((seconds - static_cast<double>(static_cast<std::time_t>(seconds))) * 1e9)};
    ASSERT_EQ(::utimensat(AT_FDCWD, path.c_str(), times, AT_SYMLINK_NOFOLLOW), 0);
}

} // namespace tests
