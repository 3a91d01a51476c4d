// The window as a screen reader has it, over the real bus of assistive technology.
#include "end_to_end/Desktop.h"
#include "end_to_end/Screen.h"

#include <gmock/gmock.h>

#include <cstdlib>

using namespace tests;
using testing::IsEmpty;

namespace {

class AssistiveTechnology : public testing::Test {
protected:
    AssistiveTechnology()
    {
        m_machine.set("QT_QPA_PLATFORM", "xcb");
        m_machine.set("DISPLAY", m_screen.name());
        m_machine.set("QT_LINUX_ACCESSIBILITY_ALWAYS_ON", "1");
    }
    ~AssistiveTechnology() override
    {
        // Its bus and its registry go with the session's bus.
        const auto services = m_machine.processes();
        m_desktop.end();
        for (const pid_t service : services)
            EXPECT_TRUE(waitForEnd(service, Child::kDeadline));
        EXPECT_THAT(m_machine.remains(), IsEmpty());
    }

    std::unique_ptr<Child> open(const std::string& idiom)
    {
        return std::make_unique<Child>(Machine::Words{program("clipsa"), "open", m_machine.movie("clock.mp4"),
                                                      "--device", idiom, "--app-name", "Tux Racer"},
                                       m_machine.environment());
    }
    /// Takes the steps; what it prints.
    std::string follow(const Machine::Words& steps)
    {
        Machine::Words words{"/usr/bin/python3", "-B", sourceFile("tests/end_to_end/assistive_technology.py")};
        words.insert(words.end(), steps.begin(), steps.end());
        const auto end = Child(words, m_machine.environment()).wait(std::chrono::seconds(60));
        EXPECT_EQ(end.exitStatus, 0) << end.err;
        return end.out;
    }

    Machine m_machine;
    Screen m_screen;
    Desktop m_desktop{m_machine};
};

} // namespace

TEST_F(AssistiveTechnology, SharesTheMovieAloneFromTheShareButtonToDone)
{
    m_desktop.startPortal("done");
    const auto editor = open("phone");
    const std::string sheet = follow({"do Share", "wait Show in folder", "tree"});
    EXPECT_EQ(sheet, "frame “Clipsa”\n"
                     "  dialog “Share”\n"
                     "    label “Tux Racer 2024-05-17 09-30-00”\n"
                     "    label “4 seconds, 96.3 kB”\n"
                     "    push button “Close”\n"
                     "    push button “Mail”\n"
                     "    push button “Open with…”\n"
                     "    push button “Save a copy…”\n"
                     "    push button “Show in folder”\n"
                     "    push button “Save to Videos”\n");
    EXPECT_EQ(follow({"do Mail", "wait Done", "do Done"}), "");
    const auto end = editor->wait();
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_EQ(end.out, "Mail\n");
    EXPECT_TRUE(m_desktop.hasReceived(0));
}
