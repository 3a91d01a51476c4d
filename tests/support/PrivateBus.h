/// A message bus of a test's own, gone with it.
#pragma once

#include <csignal>
#include <cstdlib>
#include <fcntl.h>
#include <stdexcept>
#include <string>
#include <sys/types.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace tests {

/// Sets environment variables, and so must be made before anybody in this process asks for a bus.
class PrivateBus {
public:
    explicit PrivateBus(const std::vector<const char*>& variables = {"DBUS_SESSION_BUS_ADDRESS"})
    {
        int ends[2];
        if (::pipe(ends) != 0)
            throw std::runtime_error("no pipe");
        m_process = ::fork();
        if (m_process == 0) {
            ::close(ends[0]);
            ::dup2(::open("/dev/null", O_WRONLY), STDERR_FILENO); // it complains about limits that nobody needs
            const std::string address = "--print-address=" + std::to_string(ends[1]);
            ::execlp("dbus-daemon", "dbus-daemon", "--session", "--nofork", "--nopidfile", address.c_str(),
                     static_cast<char*>(nullptr));
            ::_exit(127);
        }
        ::close(ends[1]);
        for (char character = 0; ::read(ends[0], &character, 1) == 1 && character != '\n';)
            m_address += character;
        ::close(ends[0]);
        if (m_address.empty())
            throw std::runtime_error("dbus-daemon did not start");
        for (const char* const variable : variables)
            ::setenv(variable, m_address.c_str(), 1);
    }
    ~PrivateBus() { end(); }
    PrivateBus(const PrivateBus&) = delete;
    PrivateBus& operator=(const PrivateBus&) = delete;

    /// Before all who are on it.
    void end()
    {
        if (m_process <= 0)
            return;
        ::kill(m_process, SIGKILL); // else it says who leaves
        ::waitpid(m_process, nullptr, 0);
        m_process = -1;
    }

    const std::string& address() const { return m_address; }

private:
    pid_t m_process = -1;
    std::string m_address;
};

} // namespace tests
