/// A program that a test runs as its users do: with an environment of its own, its output read while it runs, every wait
/// with a deadline. One thread.
#pragma once

#include "support/Mutation.h"

#include <array>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <fcntl.h>
#include <optional>
#include <poll.h>
#include <spawn.h>
#include <stdexcept>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>
#include <vector>

extern "C" {
#include <sys/pidfd.h> // glibc 2.36 forgets to say that these are C
}

namespace tests {

using Milliseconds = std::chrono::milliseconds;

/// Waits for the end of any process, a child or not. False when `deadline` has passed first.
inline bool waitForEnd(pid_t process, Milliseconds deadline)
{
    const int descriptor = ::pidfd_open(process, 0);
    if (descriptor < 0)
        return errno == ESRCH;
    pollfd poll = {descriptor, POLLIN, 0};
    int ready = 0;
    while ((ready = ::poll(&poll, 1, static_cast<int>(deadline.count()))) < 0 && errno == EINTR) {}
    ::close(descriptor);
    return ready == 1;
}

class Child {
public:
    struct End {
        bool inTime = true; ///< else it was killed by us
        int exitStatus = -1;
        int signal = 0;
        std::string out;
        std::string err;
    };

    static constexpr Milliseconds kDeadline = std::chrono::seconds(30);

    /// `environment` is all of it, as NAME=value; standard input is empty.
    Child(const std::vector<std::string>& arguments, const std::vector<std::string>& environment)
    {
        std::array<int, 2> out{};
        std::array<int, 2> err{};
        if (::pipe2(out.data(), O_CLOEXEC) != 0 || ::pipe2(err.data(), O_CLOEXEC) != 0)
            throw std::runtime_error("no pipe");
        posix_spawn_file_actions_t files;
        ::posix_spawn_file_actions_init(&files);
        ::posix_spawn_file_actions_addopen(&files, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
        ::posix_spawn_file_actions_adddup2(&files, out[1], STDOUT_FILENO);
        ::posix_spawn_file_actions_adddup2(&files, err[1], STDERR_FILENO);
        const int error = ::posix_spawnp(&m_process, arguments.front().c_str(), &files, nullptr,
                                         pointersTo(arguments).data(), pointersTo(withMutation(environment)).data());
        ::posix_spawn_file_actions_destroy(&files);
        ::close(out[1]);
        ::close(err[1]);
        m_out.descriptor = out[0];
        m_err.descriptor = err[0];
        if (error != 0)
            throw std::runtime_error("cannot start " + arguments.front());
        m_watch = ::pidfd_open(m_process, 0);
        for (const int descriptor : {out[0], err[0]})
            ::fcntl(descriptor, F_SETFL, O_NONBLOCK);
    }
    ~Child()
    {
        if (!m_ended)
            wait(Milliseconds(0));
        for (const int descriptor : {m_out.descriptor, m_err.descriptor, m_watch})
            ::close(descriptor);
    }
    Child(const Child&) = delete;
    Child& operator=(const Child&) = delete;

    pid_t process() const { return m_process; }
    void signal(int number) const { ::kill(m_process, number); }

    /// Until standard output or error holds `text`. False when the program ends, or the deadline passes, without.
    bool waitForText(const std::string& text, Milliseconds deadline = kDeadline)
    {
        const auto until = std::chrono::steady_clock::now() + deadline;
        const auto isThere = [&] {
            return m_out.text.find(text) != std::string::npos || m_err.text.find(text) != std::string::npos;
        };
        while (!isThere())
            if (!readUntil(until))
                return isThere();
        return true;
    }

    /// Until the program has ended; whatever else holds its output's other end is not waited for.
    End wait(Milliseconds deadline = kDeadline)
    {
        const auto until = std::chrono::steady_clock::now() + deadline;
        while (readUntil(until)) {}
        End end;
        end.inTime = waitForEnd(m_process, Milliseconds(0));
        if (!end.inTime)
            signal(SIGKILL);
        int status = 0;
        while (::waitpid(m_process, &status, 0) < 0 && errno == EINTR) {}
        m_ended = true;
        if (WIFEXITED(status))
            end.exitStatus = WEXITSTATUS(status);
        else
            end.signal = WTERMSIG(status);
        take(m_out);
        take(m_err);
        end.out = m_out.text;
        end.err = m_err.text;
        return end;
    }

private:
    struct Stream {
        int descriptor = -1;
        std::string text;
        bool open = true;
    };

    static std::vector<char*> pointersTo(const std::vector<std::string>& texts)
    {
        std::vector<char*> pointers;
        for (const std::string& text : texts)
            pointers.push_back(const_cast<char*>(text.c_str())); // posix_spawn does not write to them
        pointers.push_back(nullptr);
        return pointers;
    }

    static void take(Stream& stream)
    {
        std::array<char, 4096> buffer;
        ssize_t count = 0;
        while (stream.open && (count = ::read(stream.descriptor, buffer.data(), buffer.size())) > 0)
            stream.text.append(buffer.data(), static_cast<std::size_t>(count));
        if (count == 0)
            stream.open = false;
    }

    /// Waits for output and takes it. False when the program has ended or the time is up.
    bool readUntil(std::chrono::steady_clock::time_point until)
    {
        const auto left = std::chrono::ceil<Milliseconds>(until - std::chrono::steady_clock::now());
        std::array<pollfd, 3> polls = {{{m_watch, POLLIN, 0},
                                        {m_out.open ? m_out.descriptor : -1, POLLIN, 0},
                                        {m_err.open ? m_err.descriptor : -1, POLLIN, 0}}};
        const int ready = ::poll(polls.data(), polls.size(), std::max(0, static_cast<int>(left.count())));
        take(m_out);
        take(m_err);
        return (ready > 0 || (ready < 0 && errno == EINTR)) && polls[0].revents == 0;
    }

    pid_t m_process = -1;
    int m_watch = -1;
    Stream m_out;
    Stream m_err;
    bool m_ended = false;
};

} // namespace tests
