/// The program that publishes a movie, stopped before and after each of its system calls.
#pragma once

#include "support/Child.h"
#include "support/Paths.h"

#include <stdexcept>
#include <string>
#include <sys/ptrace.h>
#include <sys/wait.h>
#include <utility>
#include <vector>

namespace tests {

/// With its first arguments, where they are descriptors.
struct SystemCall {
    long number;
    int first;
    int second;
    int third;
};

/// The thread that made it drives it.
class TracedPublisher {
public:
    TracedPublisher(std::vector<std::string> words, std::vector<std::string> environment)
    {
        words.insert(words.begin(), program("photos-publisher"));
        environment = withMutation(std::move(environment));
        const auto pointersTo = [](std::vector<std::string>& texts) {
            std::vector<char*> pointers;
            for (std::string& text : texts)
                pointers.push_back(text.data());
            pointers.push_back(nullptr);
            return pointers;
        };
        posix_spawn_file_actions_t files;
        ::posix_spawn_file_actions_init(&files);
        ::posix_spawn_file_actions_addopen(&files, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
        const int error = ::posix_spawn(&m_process, words.front().c_str(), &files, nullptr, pointersTo(words).data(),
                                        pointersTo(environment).data());
        ::posix_spawn_file_actions_destroy(&files);
        if (error != 0)
            throw std::runtime_error("cannot start the publisher");
    }
    ~TracedPublisher() { kill(); }
    TracedPublisher(const TracedPublisher&) = delete;
    TracedPublisher& operator=(const TracedPublisher&) = delete;

    /// Until it has been stopped `stops` times, or has ended: gives the number of stops.
    int run(int stops)
    {
        int count = 0;
        while (count < stops && m_process > 0) {
            int status = 0;
            const pid_t thread = ::waitpid(-1, &status, __WALL);
            if (thread < 0)
                break;
            if (WIFEXITED(status) || WIFSIGNALED(status)) {
                if (thread == m_process) {
                    m_process = -1;
                    m_exitStatus = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
                }
                continue;
            }
            if (!m_begun) {
                m_begun = true;
                ::ptrace(PTRACE_SETOPTIONS, thread, nullptr,
                         PTRACE_O_TRACESYSGOOD | PTRACE_O_TRACECLONE | PTRACE_O_EXITKILL);
            }
            if (WSTOPSIG(status) == (SIGTRAP | 0x80)) {
                note(thread);
                if (++count == stops)
                    break;
            }
            // Their first stop, and the one that it asks for itself, are for us; no other signals come.
            ::ptrace(PTRACE_SYSCALL, thread, nullptr, nullptr);
        }
        return count;
    }

    void kill()
    {
        if (m_process <= 0)
            return;
        ::kill(m_process, SIGKILL);
        int status = 0;
        while (::waitpid(-1, &status, __WALL) > 0) {}
        m_process = -1;
    }

    int exitStatus() const { return m_exitStatus; }
    /// The system calls until now, in the order in which they began.
    const std::vector<SystemCall>& calls() const { return m_calls; }

private:
    void note(pid_t thread)
    {
        __ptrace_syscall_info info = {};
        if (::ptrace(PTRACE_GET_SYSCALL_INFO, thread, sizeof info, &info) > 0 && info.op == PTRACE_SYSCALL_INFO_ENTRY)
            m_calls.push_back({static_cast<long>(info.entry.nr), static_cast<int>(info.entry.args[0]),
                               static_cast<int>(info.entry.args[1]), static_cast<int>(info.entry.args[2])});
    }

    pid_t m_process = -1;
    bool m_begun = false;
    int m_exitStatus = -1;
    std::vector<SystemCall> m_calls;
};

} // namespace tests
