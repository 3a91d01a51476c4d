/// Makes the kernel refuse system calls to one thread, and to those that it starts, as a full disk or a poor file system
/// would, or hold them up, as a disk that does not answer. For ever, and also to programs that it starts: use it on a
/// thread that ends.
#pragma once

#include <cstddef>
#include <cstdint>
#include <fcntl.h>
#include <linux/filter.h>
#include <linux/fs.h>
#include <linux/seccomp.h>
#include <stdexcept>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <thread>
#include <unistd.h>
#include <vector>

namespace tests {

/// In place of an error: the call does not return.
inline constexpr int kHeldUp = -1;

struct RefusedSystemCall {
    long call;
    int error; ///< errno, or kHeldUp
    /// Only calls with any of these bits in this argument; all of them when there are no bits.
    unsigned argument = 0;
    std::uint32_t bits = 0;
    /// Only calls where the argument equals the bits.
    bool exactly = false;
    /// And only with so much, or more, in this other argument.
    unsigned other = 0;
    std::uint32_t least = 0;
};

/// What a file system without unnamed files says.
inline RefusedSystemCall noUnnamedFiles(int error = EOPNOTSUPP)
{
    return {SYS_openat, error, 2, O_TMPFILE & ~O_DIRECTORY};
}

/// No two files share blocks.
inline RefusedSystemCall noReflinks()
{
    return {SYS_ioctl, EOPNOTSUPP, 1, FICLONE, true};
}

inline std::vector<sock_filter> filterOf(const std::vector<RefusedSystemCall>& calls)
{
    const auto load = [](std::size_t offset) {
        return sock_filter(BPF_STMT(BPF_LD | BPF_W | BPF_ABS, static_cast<std::uint32_t>(offset)));
    };
    // The lower half of an argument: flags, requests and places in small files have no other.
    const auto loadArgument = [&](unsigned which) {
        return load(offsetof(seccomp_data, args) + which * sizeof(std::uint64_t));
    };
    const auto unlessSkip = [](int test, std::uint32_t value, int steps) {
        return sock_filter(
            BPF_JUMP(static_cast<std::uint16_t>(BPF_JMP | test | BPF_K), value, 0, static_cast<std::uint8_t>(steps)));
    };
    std::vector<sock_filter> filter;
    for (const RefusedSystemCall& refused : calls) {
        const int ofOther = refused.least ? 2 : 0;
        const int ofBits = refused.bits ? 2 : 0;
        filter.push_back(load(offsetof(seccomp_data, nr)));
        filter.push_back(unlessSkip(BPF_JEQ, static_cast<std::uint32_t>(refused.call), ofBits + ofOther + 1));
        if (refused.bits) {
            filter.push_back(loadArgument(refused.argument));
            filter.push_back(unlessSkip(refused.exactly ? BPF_JEQ : BPF_JSET, refused.bits, ofOther + 1));
        }
        if (refused.least) {
            filter.push_back(loadArgument(refused.other));
            filter.push_back(unlessSkip(BPF_JGE, refused.least, 1));
        }
        const auto error = static_cast<std::uint32_t>(refused.error) & SECCOMP_RET_DATA;
        filter.push_back(
            BPF_STMT(BPF_RET | BPF_K, refused.error == kHeldUp ? SECCOMP_RET_USER_NOTIF : SECCOMP_RET_ERRNO | error));
    }
    filter.push_back(BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW));
    return filter;
}

inline void refuseSystemCalls(const std::vector<RefusedSystemCall>& calls)
{
    std::vector<sock_filter> filter = filterOf(calls);
    const sock_fprog program = {static_cast<unsigned short>(filter.size()), filter.data()};
    if (::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) != 0
        || ::prctl(PR_SET_SECCOMP, SECCOMP_MODE_FILTER, &program, 0, 0) != 0)
        throw std::runtime_error("the kernel takes no filter");
}

/// The same where some calls are held up: until the descriptor that it gives is closed, which nobody inherits.
[[nodiscard]] inline int holdUpSystemCalls(const std::vector<RefusedSystemCall>& calls)
{
    std::vector<sock_filter> filter = filterOf(calls);
    const sock_fprog program = {static_cast<unsigned short>(filter.size()), filter.data()};
    ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0);
    const long listener = ::syscall(SYS_seccomp, SECCOMP_SET_MODE_FILTER, SECCOMP_FILTER_FLAG_NEW_LISTENER, &program);
    if (listener < 0)
        throw std::runtime_error("the kernel takes no filter");
    return static_cast<int>(listener);
}

/// Runs `body` on a thread of its own to which `calls` are refused.
template <typename Body> void whileRefusing(const std::vector<RefusedSystemCall>& calls, Body body)
{
    std::thread([&] {
        refuseSystemCalls(calls);
        body();
    }).join();
}

} // namespace tests
