// Processes that are killed, at either end of the connection: whatever happens, the recording is untouched, and nothing
// is left for ever.
#include "end_to_end/Machine.h"

#include <gmock/gmock.h>

#include <fstream>

using namespace tests;
using testing::IsEmpty;
using testing::SizeIs;

namespace {

class Accidents : public testing::Test {
protected:
    Accidents() : m_movie(m_machine.movie("clock.mp4")), m_bytes(PrivateDirectory::read(m_movie))
    {
        m_machine.setScript("wait picture\nprint on the screen");
    }
    void TearDown() override { EXPECT_EQ(PrivateDirectory::read(m_movie), m_bytes); }

    /// A host whose editor shows the movie.
    std::unique_ptr<Child> startEditing()
    {
        auto host = std::make_unique<Child>(std::vector<std::string>{program("clipsa"), "open", m_movie},
                                            m_machine.environment());
        EXPECT_TRUE(host->waitForText("on the screen\n")) << host->wait(Milliseconds(0)).err;
        return host;
    }
    pid_t editor() const
    {
        const auto found = m_machine.processes("clipsa-editor");
        EXPECT_THAT(found, SizeIs(1));
        return found.empty() ? 0 : found.front();
    }

    Machine m_machine;
    const std::filesystem::path m_movie;
    const std::string m_bytes;
};

} // namespace

TEST_F(Accidents, AHostWhoseEditorIsKilledSaysHowItEndedAndThatTheRecordingIsUntouched)
{
    const auto host = startEditing();
    ::kill(editor(), SIGKILL);
    const auto end = host->wait();
    EXPECT_EQ(end.exitStatus, 3);
    EXPECT_THAT(end.out, IsEmpty());
    EXPECT_EQ(end.err, "on the screen\nclipsa: the editor ended early, by signal 9 (Killed); "
                       "your recording is untouched: "
                           + m_movie.native() + "\n");
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Accidents, AnEditorWhoseHostIsKilledEndsByItselfAndTheNextHostSweepsUp)
{
    const auto host = startEditing();
    const pid_t orphan = editor();
    host->signal(SIGKILL);
    host->wait();
    EXPECT_TRUE(waitForEnd(orphan, Child::kDeadline));
    EXPECT_THAT(m_machine.processes(), IsEmpty());
    EXPECT_THAT(m_machine.editorDirectories(), SizeIs(1));

    m_machine.setScript("wait ready\ntap Cancel");
    EXPECT_EQ(m_machine.open(m_movie).exitStatus, 0);
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Accidents, WhatALivingEditorUsesIsNotSwept)
{
    const auto first = startEditing();
    m_machine.setScript("wait ready\ntap Cancel");
    EXPECT_EQ(m_machine.open(m_movie).exitStatus, 0);
    EXPECT_THAT(m_machine.editorDirectories(), SizeIs(1));
    EXPECT_THAT(m_machine.processes("clipsa-editor"), SizeIs(1));
    first->signal(SIGTERM);
    EXPECT_EQ(first->wait().exitStatus, 128 + SIGTERM);
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Accidents, AHostThatHangsLeavesNoWindowThatDoesNotClose)
{
    // The host is stopped before the tap, so that it never learns of it.
    const auto stopped = m_machine.home() / "stopped";
    m_machine.setScript("wait picture\nprint on the screen\nwait file " + stopped.native() + "\ntap Cancel");
    const auto host = startEditing();
    host->signal(SIGSTOP);
    siginfo_t stop{};
    EXPECT_EQ(::waitid(P_PID, static_cast<id_t>(host->process()), &stop, WSTOPPED), 0);
    std::ofstream(stopped) << "now";
    EXPECT_TRUE(waitForEnd(editor(), Child::kDeadline));
    host->signal(SIGCONT);
    EXPECT_EQ(host->wait().exitStatus, 0) << "it reads the message when it can";
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}

TEST_F(Accidents, AnInterruptedHostTakesItsEditorAlong)
{
    const auto host = startEditing();
    host->signal(SIGINT);
    const auto end = host->wait();
    EXPECT_EQ(end.exitStatus, 128 + SIGINT);
    EXPECT_THAT(m_machine.remains(), IsEmpty());
}
