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

struct FileActions : posix_spawn_file_actions_t {
    FileActions() { ::posix_spawn_file_actions_init(this); }
    ~FileActions() { ::posix_spawn_file_actions_destroy(this); }
    FileActions(const FileActions&) = delete;
    FileActions& operator=(const FileActions&) = delete;
};

struct Attributes : posix_spawnattr_t {
    Attributes() { ::posix_spawnattr_init(this); }
    ~Attributes() { ::posix_spawnattr_destroy(this); }
    Attributes(const Attributes&) = delete;
    Attributes& operator=(const Attributes&) = delete;
};

/// 0 or an error number.
int spawn(const ProcessStart& start, pid_t& pid)
{
    std::vector<std::string> arguments = {start.program};
    arguments.insert(arguments.end(), start.arguments.begin(), start.arguments.end());
    const std::vector<std::string> environment = environmentWith(start.environment);

    FileActions files;
    ::posix_spawn_file_actions_addopen(&files, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    ::posix_spawn_file_actions_adddup2(&files, STDERR_FILENO, STDOUT_FILENO);
    if (start.lock)
        ::posix_spawn_file_actions_adddup2(&files, *start.lock, dbus::kEditorLockDescriptor);
    if (start.report)
        ::posix_spawn_file_actions_adddup2(&files, *start.report, dbus::kEditorReportDescriptor);

    Attributes attributes; // with a new process group and no signal blocked, unless others are named
    ::posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETPGROUP | POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
    sigset_t signals = {};
    for (const int number : {SIGINT, SIGTERM, SIGHUP, SIGPIPE})
        ::sigaddset(&signals, number);
    ::posix_spawnattr_setsigdefault(&attributes, &signals);

    return ::posix_spawn(&pid, start.program.c_str(), &files, &attributes, pointersTo(arguments).data(),
                         pointersTo(environment).data());
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
    posix::FileDescriptor descriptor; ///< of the process, and of none that gets its number later
    std::function<void(ProcessEnd)> ended;
    std::optional<QSocketNotifier> notifier;

    /// Does nothing once it has ended.
    void signal(int number) const { ::pidfd_send_signal(descriptor.get(), number, nullptr, 0); }

    /// Nothing when that was told before.
    std::optional<ProcessEnd> waitForEnd() const
    {
        siginfo_t end = {};
        if (TEMP_FAILURE_RETRY(::waitid(P_PIDFD, static_cast<id_t>(descriptor.get()), &end, WEXITED)) != 0)
            return std::nullopt;
        return end.si_code == CLD_EXITED ? ProcessEnd{end.si_status, 0} : ProcessEnd{0, end.si_status};
    }

    void hasEnded()
    {
        notifier.reset();
        const auto handler = std::exchange(ended, {});
        if (const auto end = waitForEnd())
            handler(*end); // may destroy us
    }
};

EditorProcess::EditorProcess(std::unique_ptr<State> state) : m_state(std::move(state)) {}

EditorProcess::~EditorProcess()
{
    m_affinity.assertHere();
    m_state->signal(SIGKILL);
    m_state->waitForEnd();
}

base::Result<std::unique_ptr<EditorProcess>> EditorProcess::start(const ProcessStart& start,
                                                                  std::function<void(ProcessEnd)> ended)
{
    pid_t pid = 0;
    if (const int error = spawn(start, pid); error != 0)
        return base::Error::fromErrno(error, "cannot start " + start.program);
    auto state = std::make_unique<State>();
    state->ended = std::move(ended);
    state->descriptor = posix::FileDescriptor(::pidfd_open(pid, 0));
    if (!state->descriptor) {
        const auto error = base::Error::fromErrno(errno, "cannot watch " + start.program);
        ::kill(pid, SIGKILL);
        ::waitpid(pid, nullptr, 0);
        return error;
    }
    state->notifier.emplace(state->descriptor.get(), QSocketNotifier::Read);
    State* const plain = state.get();
    // Out of the notifier's own signal, which ends it.
    QObject::connect(
        &*state->notifier, &QSocketNotifier::activated, &*state->notifier, [plain] { plain->hasEnded(); },
        Qt::QueuedConnection);
    return std::unique_ptr<EditorProcess>(new EditorProcess(std::move(state)));
}

void EditorProcess::signal(int number)
{
    m_affinity.assertHere();
    m_state->signal(number);
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
