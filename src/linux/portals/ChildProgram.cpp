#include "linux/portals/ChildProgram.h"

#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <mutex>
#include <spawn.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>
#include <utility>

namespace portals {

struct ChildProgram::State {
    Ended ended; ///< on the main queue

    std::mutex mutex;                 ///< guards what follows
    base::MainQueue* queue = nullptr; ///< none once nobody listens
    pid_t process = -1;               ///< while it has not been waited for: nobody else can have its number
    bool isUnwanted = false;
};

namespace {

/// Its process, or -1. It reads nothing, and is in a session of its own: what ends our terminal does not end it.
pid_t start(const std::vector<std::string>& arguments)
{
    posix_spawn_file_actions_t files;
    ::posix_spawn_file_actions_init(&files);
    ::posix_spawn_file_actions_addopen(&files, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    posix_spawnattr_t attributes;
    ::posix_spawnattr_init(&attributes);
    sigset_t none;
    ::sigemptyset(&none);
    ::posix_spawnattr_setsigmask(&attributes, &none);
    ::posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSID | POSIX_SPAWN_SETSIGMASK);
    std::vector<char*> pointers;
    for (const std::string& argument : arguments)
        pointers.push_back(const_cast<char*>(argument.c_str())); // posix_spawn does not write to them
    pointers.push_back(nullptr);
    pid_t process = -1;
    if (::posix_spawnp(&process, pointers.front(), &files, &attributes, pointers.data(), environ) != 0)
        process = -1;
    ::posix_spawnattr_destroy(&attributes);
    ::posix_spawn_file_actions_destroy(&files);
    return process;
}

/// Until it has ended. It stays to be waited for.
void waitForEnd(pid_t process)
{
    siginfo_t information = {};
    while (::waitid(P_PID, static_cast<id_t>(process), &information, WEXITED | WNOWAIT) != 0 && errno == EINTR) {}
}

} // namespace

ChildProgram::ChildProgram(base::MainQueue& queue, std::vector<std::string> arguments, Ended ended)
    : m_state(std::make_shared<State>())
{
    m_state->ended = std::move(ended);
    m_state->queue = &queue;
    // It takes its time to start where memory is large, and for ever to end.
    std::thread([state = m_state, arguments = std::move(arguments)] {
        int result = kNotStarted;
        const pid_t process = start(arguments);
        if (process >= 0) {
            {
                const std::lock_guard lock(state->mutex);
                state->process = process;
                if (state->isUnwanted)
                    ::kill(process, SIGTERM);
            }
            waitForEnd(process);
        }
        const std::lock_guard lock(state->mutex);
        if (process >= 0) {
            state->process = -1;
            int status = 0;
            ::waitpid(process, &status, 0);
            result = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
        }
        if (state->queue)
            state->queue->post([state, result] {
                if (const Ended tell = std::exchange(state->ended, {}))
                    tell(result);
            });
    }).detach();
}

ChildProgram::~ChildProgram()
{
    m_affinity.assertHere();
    m_state->ended = {};
    const std::lock_guard lock(m_state->mutex);
    m_state->queue = nullptr;
}

void ChildProgram::terminate()
{
    m_affinity.assertHere();
    const std::lock_guard lock(m_state->mutex);
    m_state->isUnwanted = true;
    if (m_state->process >= 0)
        ::kill(m_state->process, SIGTERM);
}

} // namespace portals
