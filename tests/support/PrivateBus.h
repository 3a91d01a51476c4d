/// A message bus of a test's own, gone with it.
#pragma once

#include <csignal>
#include <cstdlib>
#include <stdexcept>
#include <string>
#include <sys/types.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tests {

/// Sets `variable`, and so must be made before anybody in this process asks for that bus.
class PrivateBus {
public:
    explicit PrivateBus(const char* variable = "DBUS_SESSION_BUS_ADDRESS",
                        const std::string& configuration = "--session")
    {
        int ends[2];
        if (::pipe(ends) != 0)
            throw std::runtime_error("no pipe");
        m_process = ::fork();
        if (m_process == 0) {
            ::close(ends[0]);
            const std::string address = "--print-address=" + std::to_string(ends[1]);
            ::execlp("dbus-daemon", "dbus-daemon", configuration.c_str(), "--nofork", "--nopidfile", address.c_str(),
                     static_cast<char*>(nullptr));
            ::_exit(127);
        }
        ::close(ends[1]);
        for (char character = 0; ::read(ends[0], &character, 1) == 1 && character != '\n';)
            m_address += character;
        ::close(ends[0]);
        if (m_address.empty())
            throw std::runtime_error("dbus-daemon did not start");
        ::setenv(variable, m_address.c_str(), 1);
    }
    ~PrivateBus()
    {
        ::kill(m_process, SIGTERM);
        ::waitpid(m_process, nullptr, 0);
    }
    PrivateBus(const PrivateBus&) = delete;
    PrivateBus& operator=(const PrivateBus&) = delete;

    const std::string& address() const { return m_address; }

private:
    pid_t m_process = -1;
    std::string m_address;
};

} // namespace tests
