/// A desktop of a machine's own: a session bus, and a portal on it whose user does what a test says.
#pragma once

#include "end_to_end/Machine.h"

#include <gmock/gmock.h>

#include <memory>
#include <string>

namespace tests {

class Desktop {
public:
    /// Programs that `machine` starts from now on find the bus.
    explicit Desktop(Machine& machine) : m_machine(machine)
    {
        const std::string address = "unix:path=" + (machine.home() / "bus").native();
        m_bus = std::make_unique<Child>(Machine::Words{"dbus-daemon", "--session", "--nofork", "--nopidfile",
                                                       "--print-address=1", "--address=" + address},
                                        machine.environment());
        EXPECT_TRUE(m_bus->waitForText("\n"));
        machine.set("DBUS_SESSION_BUS_ADDRESS", address);
    }
    ~Desktop() { end(); }

    /// The bus is there, and lets nobody in; until it ends.
    void freeze() { m_bus->signal(SIGSTOP); }

    /// Until the portal, told to hold, has what it was asked.
    bool waitUntilHeld() { return m_portal->waitForText("holds"); }
    /// The bus dies, with nobody told that anybody has left it.
    void killBus() { m_bus->signal(SIGKILL); }

    void end()
    {
        for (auto* program : {&m_portal, &m_bus})
            if (*program) {
                (*program)->signal(SIGTERM);
                (*program)->signal(SIGCONT);
                (*program)->wait();
                program->reset();
            }
    }

    /// `behaviour` is one of portal.py's.
    void startPortal(const std::string& behaviour)
    {
        m_machine.write("home/desktop/calls", "");
        m_portal =
            std::make_unique<Child>(Machine::Words{"/usr/bin/python3", sourceFile("tests/linux/portals/portal.py"),
                                                   path(), behaviour, "Email=4", "OpenURI=4", "FileChooser=4"},
                                    m_machine.environment());
        ASSERT_TRUE(m_portal->waitForText("ready")) << m_portal->wait(Milliseconds(0)).err;
    }

    /// Where the portal keeps what it was asked, and what it was given.
    std::filesystem::path path() const { return m_machine.home() / "desktop"; }
    std::string calls() const { return PrivateDirectory::read(path() / "calls"); }
    /// What could be read from the n-th file that it was given.
    std::string received(int n) const { return PrivateDirectory::read(path() / ("bytes-" + std::to_string(n))); }
    bool hasReceived(int n) const { return std::filesystem::exists(path() / ("bytes-" + std::to_string(n))); }

private:
    Machine& m_machine;
    std::unique_ptr<Child> m_bus;
    std::unique_ptr<Child> m_portal;
};

} // namespace tests
