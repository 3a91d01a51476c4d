#include "app/host/EditorProcess.h"

#include "base/Environment.h"
#include "linux/dbus/EditorReport.h"
#include "linux/dbus/ExtensionConnection.h"
#include "linux/posix/FileDescriptor.h"

#include <QSocketNotifier>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <optional>
#include <spawn.h>
#include <sstream>
#include <sys/wait.h>
#include <unistd.h>

extern "C" {
#include <sys/pidfd.h> // glibc 2.36 forgets to say that these are C
extern char** environ;
}

namespace host {

namespace {

std::vector<char*> pointersTo(const std::vector<std::string>& texts)
{
    std::vector<char*> pointers;
    for (const std::string& text : texts)
        pointers.push_back(const_cast<char*>(text.c_str())); // posix_spawn does not write to them
    pointers.push_back(nullptr);
    return pointers;
}

std::vector<std::string> environmentWith(const std::vector<std::pair<std::string, std::string>>& additions)
{
    std::vector<std::string> environment;
    for (const auto& [name, value] : additions)
        environment.push_back(name + "=" + value);
    for (char** entry = environ; *entry; ++entry) {
        const std::string_view text = *entry;
        const std::string_view name = text.substr(0, text.find('='));
        bool replaced = false;
        for (const auto& addition : additions)
            replaced |= addition.first == name;
        if (!replaced)
            environment.emplace_back(text);
    }
    return environment;
}

/// 0 or an error number.
int spawn(const ProcessStart& start, pid_t& pid)
{
    std::vector<std::string> arguments = {start.program};
    arguments.insert(arguments.end(), start.arguments.begin(), start.arguments.end());
    const std::vector<std::string> environment = environmentWith(start.environment);

    posix_spawn_file_actions_t files;
    ::posix_spawn_file_actions_init(&files);
    ::posix_spawn_file_actions_addopen(&files, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    ::posix_spawn_file_actions_adddup2(&files, STDERR_FILENO, STDOUT_FILENO);
    if (start.lock)
        ::posix_spawn_file_actions_adddup2(&files, *start.lock, dbus::kEditorLockDescriptor);
    if (start.report)
        ::posix_spawn_file_actions_adddup2(&files, *start.report, dbus::kEditorReportDescriptor);

    posix_spawnattr_t attributes;
    ::posix_spawnattr_init(&attributes);
    ::posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETPGROUP | POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
    ::posix_spawnattr_setpgroup(&attributes, 0);
    sigset_t signals;
    ::sigemptyset(&signals);
    ::posix_spawnattr_setsigmask(&attributes, &signals);
    for (const int number : {SIGINT, SIGTERM, SIGHUP, SIGPIPE})
        ::sigaddset(&signals, number);
    ::posix_spawnattr_setsigdefault(&attributes, &signals);

    const int result = ::posix_spawn(&pid, start.program.c_str(), &files, &attributes, pointersTo(arguments).data(),
                                     pointersTo(environment).data());
    ::posix_spawnattr_destroy(&attributes);
    ::posix_spawn_file_actions_destroy(&files);
    return result;
}

bool isProgram(const std::string& path)
{
    return ::access(path.c_str(), X_OK) == 0 && std::filesystem::is_regular_file(path);
}

} // namespace

std::string ProcessEnd::words() const
{
    if (signal == 0)
        return "with exit status " + std::to_string(exitStatus);
    return "by signal " + std::to_string(signal) + " (" + ::sigdescr_np(signal) + ")";
}

struct EditorProcess::State {
    pid_t pid = 0;
    posix::FileDescriptor descriptor;
    std::function<void(ProcessEnd)> ended;
    std::optional<QSocketNotifier> notifier;
    bool running = true;

    void reap()
    {
        int status = 0;
        static_cast<void>(TEMP_FAILURE_RETRY(::waitpid(pid, &status, 0)));
        running = false;
        ProcessEnd end;
        if (WIFSIGNALED(status))
            end.signal = WTERMSIG(status);
        else
            end.exitStatus = WEXITSTATUS(status);
        if (const auto handler = std::exchange(ended, {}))
            handler(end); // may destroy us
    }
};

EditorProcess::EditorProcess(std::unique_ptr<State> state) : m_state(std::move(state)) {}

EditorProcess::~EditorProcess()
{
    m_affinity.assertHere();
    m_state->ended = {};
    if (m_state->running) {
        signal(SIGKILL);
        m_state->reap();
    }
}

base::Result<std::unique_ptr<EditorProcess>> EditorProcess::start(const ProcessStart& start,
                                                                  std::function<void(ProcessEnd)> ended)
{
    auto state = std::make_unique<State>();
    if (const int error = spawn(start, state->pid); error != 0)
        return base::Error::fromErrno(error, "cannot start " + start.program);
    state->ended = std::move(ended);
    state->descriptor = posix::FileDescriptor(::pidfd_open(state->pid, 0));
    if (!state->descriptor) {
        const auto error = base::Error::fromErrno(errno, "cannot watch " + start.program);
        ::kill(state->pid, SIGKILL);
        ::waitpid(state->pid, nullptr, 0);
        return error;
    }
    ::fcntl(state->descriptor.get(), F_SETFD, FD_CLOEXEC);
    state->notifier.emplace(state->descriptor.get(), QSocketNotifier::Read);
    State* const plain = state.get();
    QObject::connect(&*state->notifier, &QSocketNotifier::activated, &*state->notifier, [plain] {
        plain->notifier->setEnabled(false);
        // Out of the notifier's own signal, because the handler may destroy it.
        QMetaObject::invokeMethod(
            &*plain->notifier, [plain] { plain->reap(); }, Qt::QueuedConnection);
    });
    return std::unique_ptr<EditorProcess>(new EditorProcess(std::move(state)));
}

void EditorProcess::signal(int number)
{
    m_affinity.assertHere();
    if (m_state->running)
        ::pidfd_send_signal(m_state->descriptor.get(), number, nullptr, 0);
}

base::Result<std::string> findEditorProgram()
{
    std::vector<std::string> candidates;
    if (const std::string named = base::environment("CLIPSA_EDITOR"); !named.empty())
        candidates.push_back(named);
    std::error_code error;
    const std::filesystem::path own = std::filesystem::read_symlink("/proc/self/exe", error).parent_path();
    candidates.push_back(own / "clipsa-editor");
    candidates.push_back(own.parent_path() / "libexec/clipsa/clipsa-editor");
    std::istringstream path(base::environment("PATH"));
    for (std::string directory; std::getline(path, directory, ':');)
        if (directory.starts_with('/'))
            candidates.push_back(directory + "/clipsa-editor");
    for (const std::string& candidate : candidates)
        if (isProgram(candidate))
            return candidate;
    return base::Error::make(base::kPosixErrorDomain, ENOENT,
                             "there is no clipsa-editor beside this program; install Clipsa again");
}

} // namespace host
