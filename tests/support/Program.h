/// Runs programs: with variables of their own, what they print caught in files. One thread at a time.
#pragma once

#include "support/PrivateDirectory.h"

#include <csignal>
#include <cstdlib>
#include <fcntl.h>
#include <map>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace tests {

class Program {
public:
    using Variables = std::map<std::string, std::string>;

    Program(const std::vector<std::string>& words, const Variables& variables)
    {
        m_process = ::fork();
        if (m_process != 0)
            return;
        for (const auto& [name, value] : variables)
            ::setenv(name.c_str(), value.c_str(), 1);
        const int mode = O_WRONLY | O_CREAT | O_TRUNC;
        ::dup2(::open((m_directory.path() / "out").c_str(), mode, 0600), STDOUT_FILENO);
        ::dup2(::open((m_directory.path() / "err").c_str(), mode, 0600), STDERR_FILENO);
        std::vector<char*> arguments;
        for (const std::string& word : words)
            arguments.push_back(const_cast<char*>(word.c_str()));
        arguments.push_back(nullptr);
        ::execvp(arguments[0], arguments.data());
        ::_exit(127);
    }
    ~Program()
    {
        signal(SIGKILL);
        wait();
    }
    Program(const Program&) = delete;
    Program& operator=(const Program&) = delete;

    pid_t process() const { return m_process; }
    void signal(int number) const
    {
        if (m_process > 0)
            ::kill(m_process, number);
    }

    /// The exit status; 128 and the signal when it was ended by one.
    int wait()
    {
        if (m_process > 0) {
            int status = 0;
            ::waitpid(m_process, &status, 0);
            m_process = -1;
            m_status = WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
        }
        return m_status;
    }

    std::string output() const { return PrivateDirectory::read(m_directory.path() / "out"); }
    std::string errors() const { return PrivateDirectory::read(m_directory.path() / "err"); }

private:
    PrivateDirectory m_directory;
    pid_t m_process = -1;
    int m_status = -1;
};

/// What the next one who opens a named pipe writes into it; waits until it is closed again.
inline std::string readPipe(const std::filesystem::path& pipe)
{
    return PrivateDirectory::read(pipe);
}

} // namespace tests
