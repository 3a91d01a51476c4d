// A recorder in another program, on a bus of its own: it hands in an open file, and is told what the user did.
#include "end_to_end/Machine.h"

#include <gmock/gmock.h>

using namespace tests;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

namespace fs = std::filesystem;

class RecorderService : public testing::Test {
protected:
    RecorderService()
    {
        // The bus starts the service when somebody asks for it, by the file that is installed.
        std::string file = PrivateDirectory::read(sourceFile("packaging/org.clipsa.Clipsa.service.in"));
        const std::string place = "@CMAKE_INSTALL_FULL_BINDIR@";
        const std::size_t at = file.find(place);
        EXPECT_NE(at, std::string::npos);
        m_machine.write("home/data/dbus-1/services/org.clipsa.Clipsa.service",
                        at == std::string::npos ? file : file.replace(at, place.size(), program("")));
        m_machine.set("XDG_DATA_HOME", m_machine.home() / "data");
        m_machine.keepReport();
        m_machine.setScript("wait picture\nwait ready\nprint {title} {date}\ntap Cancel");
        m_address = "unix:path=" + (m_machine.home() / "bus").native();
        m_bus = std::make_unique<Child>(Machine::Words{"dbus-daemon", "--session", "--nofork", "--nopidfile",
                                                       "--print-address=1", "--address=" + m_address},
                                        m_machine.environment());
        EXPECT_TRUE(m_bus->waitForText("\n"));
        m_machine.set("DBUS_SESSION_BUS_ADDRESS", m_address);
    }
    ~RecorderService() override
    {
        // Whatever has connected to it goes with it.
        const auto services = m_machine.processes("clipsa");
        m_bus->signal(SIGTERM);
        m_bus->wait();
        for (const pid_t service : services)
            EXPECT_TRUE(waitForEnd(service, Child::kDeadline));
        EXPECT_THAT(m_machine.remains(), IsEmpty());
    }

    Child::End record(const fs::path& movie)
    {
        Child recorder({"/usr/bin/python3", sourceFile("docs/examples/record_and_edit.py"), movie, "Notes"},
                       m_machine.environment());
        return recorder.wait();
    }

    Machine m_machine;
    std::string m_address;
    std::unique_ptr<Child> m_bus;
};

} // namespace

TEST_F(RecorderService, TellsTheRecorderWhatTheUserDidWithItsOpenFile)
{
    const auto movie = m_machine.movie("clock.mp4");
    const std::string bytes = PrivateDirectory::read(movie);

    const auto end = record(movie);

    EXPECT_TRUE(end.inTime);
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(end.out, IsEmpty()); // no activity, no line
    EXPECT_THAT(end.err, IsEmpty());
    EXPECT_THAT(m_machine.report(), testing::ElementsAre("Notes May 17 09:30 AM"));
    EXPECT_EQ(PrivateDirectory::read(movie), bytes);
}

TEST_F(RecorderService, RefusesWhatIsNoMovieFileInOneLine)
{
    const auto end = record(m_machine.movie("empty.mp4"));
    EXPECT_EQ(end.exitStatus, 1);
    EXPECT_THAT(end.err, HasSubstr("empty"));
    EXPECT_THAT(m_machine.report(), IsEmpty());
}

TEST_F(RecorderService, TellsTheRecorderThatTheEditorHasEndedEarly)
{
    m_machine.setScript("wait picture\npicture no/such/directory.png");
    const auto end = record(m_machine.movie("clock.mp4"));
    EXPECT_EQ(end.exitStatus, 1);
    EXPECT_THAT(end.err, HasSubstr("ended early"));
}
