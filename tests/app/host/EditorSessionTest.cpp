// One editor's session as its host sees it: what is told, in which order, on which thread, and how long is waited.
#include "app/host/EditorSession.h"

#include "support/EventLoop.h"
#include "support/Paths.h"
#include "support/PrivateDirectory.h"
#include "support/Program.h"
#include "support/RefusedSystemCalls.h"

#include <QThread>

#include <gmock/gmock.h>

#include <csignal>
#include <fcntl.h>
#include <fstream>
#include <optional>
#include <sys/stat.h>
#include <thread>

using testing::ElementsAre;
using testing::HasSubstr;

namespace {

class AnEditorsSession : public ::testing::Test {
protected:
    /// An editor that does what `script` says; a movie of so many bytes is on its way to it.
    void start(const std::string& script, std::uintmax_t movieSize = 15)
    {
        auto started = host::EditorSession::start(
            request(script, movieSize), m_place,
            {.noted = [this](const dbus::MovieNote& note) { m_told.push_back("noted " + note.path); },
             .finished =
                 [this](const std::vector<std::string>& types) {
                     m_told.push_back("finished with " + std::to_string(types.size()));
                 },
             .copying = [this](std::uint64_t) { m_told.emplace_back("copying"); },
             .ended =
                 [this](const host::EditorOutcome& outcome) {
                     m_outcome = outcome;
                     m_endedOn = std::this_thread::get_id();
                     m_told.emplace_back("ended");
                     m_session.reset(); // as its owners do
                 }});
        ASSERT_TRUE(started) << started.error()->description();
        m_session = std::move(started).value();
    }
    /// One that soon loses its patience; its owner keeps it.
    std::unique_ptr<host::EditorSession> startImpatiently(const std::string& script,
                                                          std::optional<host::EditorOutcome>& outcome)
    {
        host::EditorSession::Handlers handlers;
        handlers.ended = [&](const host::EditorOutcome& ended) { outcome = ended; };
        auto session = host::EditorSession::start(
            request(script), {m_place.editorProgram, m_place.directoriesRoot, std::chrono::milliseconds(20)},
            std::move(handlers));
        EXPECT_TRUE(session) << session.error()->description();
        return session ? std::move(session).value() : nullptr;
    }
    dbus::EditRequest request(const std::string& script, std::uintmax_t movieSize = 15)
    {
        const auto movie = m_directory.write("race.mp4", "moving pictures");
        std::filesystem::resize_file(movie, movieSize);
        dbus::EditRequest request;
        request.movie = posix::FileDescriptor(::open(movie.c_str(), O_RDONLY | O_CLOEXEC));
        request.movieName = m_movieName;
        request.environment = {{"FAKE_EDITOR", script}};
        return request;
    }
    std::filesystem::path pipe(const char* name)
    {
        const auto path = m_directory.path() / name;
        EXPECT_EQ(::mkfifo(path.c_str(), 0600), 0);
        return path;
    }
    void waitForEnd()
    {
        ASSERT_TRUE(tests::pumpUntil([this] { return m_outcome.has_value(); }));
        EXPECT_EQ(m_endedOn, std::this_thread::get_id());
    }

    tests::PrivateDirectory m_directory;
    std::string m_movieName = "race.mp4";
    host::EditorSession::Place m_place{.editorProgram = tests::program("fake-editor"),
                                       .directoriesRoot = m_directory.path() / "clipsa",
                                       .leavingLimit = std::chrono::hours(1),
                                       .filesLimit = std::chrono::hours(1)};
    std::vector<std::string> m_told;
    std::optional<host::EditorOutcome> m_outcome;
    std::thread::id m_endedOn;
    std::unique_ptr<host::EditorSession> m_session;
};

TEST_F(AnEditorsSession, TellsInTheOrderInWhichItHappened)
{
    start("saved=/one finish=a,b wait saved=/two");
    waitForEnd();
    EXPECT_THAT(m_told, ElementsAre("noted /one", "finished with 2", "noted /two", "ended"));
    EXPECT_THAT(m_outcome->activityTypes, testing::Optional(ElementsAre("a", "b")));
    EXPECT_EQ(m_outcome->end.exitStatus, 0);
    EXPECT_FALSE(m_outcome->closed);
}

TEST_F(AnEditorsSession, LeavesNothingBehindInItsPlace)
{
    start("finish=a wait");
    waitForEnd();
    EXPECT_TRUE(std::filesystem::is_empty(m_place.directoriesRoot));
}

TEST_F(AnEditorsSession, DoesNotWaitForACopyThatNobodyNeedsAnyMore)
{
    m_place.editorProgram = "/bin/false";
    const std::filesystem::path dead = std::filesystem::path(m_place.directoriesRoot) / "editor-dead";
    std::filesystem::create_directories(dead);
    std::ofstream(dead / "lock").flush();
    // There is no way but to copy, for this thread.
    const std::unique_ptr<QThread> thread(QThread::create([this] {
        tests::refuseSystemCalls({{SYS_linkat, EXDEV}, tests::noReflinks()});
        start("", std::uintmax_t{4} << 40); // which takes hours
        waitForEnd();
    }));
    thread->start();
    thread->wait();
    ASSERT_TRUE(m_outcome);
    EXPECT_FALSE(m_outcome->error) << "that the copy was stopped is not why it ended";
    EXPECT_EQ(m_outcome->words(), "the editor ended early, with exit status 1");
    EXPECT_FALSE(std::filesystem::exists(dead)) << "what comes behind the copy is waited for";
}

TEST_F(AnEditorsSession, IsClosedByItsOwner)
{
    start("wait");
    m_session->close();
    waitForEnd();
    EXPECT_TRUE(m_outcome->closed);
    EXPECT_FALSE(m_outcome->activityTypes);
    EXPECT_THAT(m_told, ElementsAre("ended"));
}

TEST_F(AnEditorsSession, OfAnEditorThatEndedWellWithoutAWordWasClosed)
{
    EXPECT_EQ(host::EditorOutcome().words(), "the editor was closed before it showed the recording");
}

TEST_F(AnEditorsSession, MakesAnEditorGoThatDoesNot)
{
    const auto there = pipe("there");
    std::optional<host::EditorOutcome> outcome;
    auto session = startImpatiently("tell=" + there.native() + " finish=save hang", outcome);
    EXPECT_THAT(tests::whilePumping([&] { return tests::readPipe(there); }), HasSubstr("MovieURLKey"));

    EXPECT_TRUE(tests::pumpUntil([&] { return outcome.has_value(); }));
    EXPECT_EQ(outcome->end.signal, SIGKILL);
    EXPECT_THAT(outcome->activityTypes, testing::Optional(ElementsAre("save")));
    session.reset();
    EXPECT_TRUE(std::filesystem::is_empty(m_place.directoriesRoot));
}

TEST_F(AnEditorsSession, MakesAnEditorGoThatHasLeftWithoutAWordAndDoesNotEnd)
{
    std::optional<host::EditorOutcome> outcome;
    auto session = startImpatiently("leave hang", outcome);
    EXPECT_TRUE(tests::pumpUntil([&] { return outcome.has_value(); }));
    EXPECT_EQ(outcome->end.signal, SIGKILL);
    EXPECT_EQ(outcome->activityTypes, std::nullopt);
    EXPECT_FALSE(outcome->closed);
    session.reset();
    EXPECT_TRUE(std::filesystem::is_empty(m_place.directoriesRoot));
}

TEST_F(AnEditorsSession, WaitsForAnEditorThatHasSomethingToFinish)
{
    const auto finishing = pipe("finishing");
    std::optional<host::EditorOutcome> busy, idle;
    auto session = startImpatiently("busy finish=save wait tell=" + finishing.native(), busy);
    auto other = startImpatiently("finish= hang", idle);
    EXPECT_TRUE(tests::pumpUntil([&] { return idle.has_value(); })) << "it was killed, and that takes twice as long";
    EXPECT_FALSE(busy);
    EXPECT_THAT(tests::whilePumping([&] { return tests::readPipe(finishing); }), HasSubstr("MovieURLKey"));
    EXPECT_TRUE(tests::pumpUntil([&] { return busy.has_value(); }));
    EXPECT_EQ(busy->end.signal, 0);
    EXPECT_EQ(busy->end.exitStatus, 0);
    session.reset();
    other.reset();
    EXPECT_TRUE(std::filesystem::is_empty(m_place.directoriesRoot));
}

TEST_F(AnEditorsSession, SaysThatAMovieCannotBeHandedOver)
{
    m_movieName = "no/such/place.mp4";
    start("wait");
    waitForEnd();
    ASSERT_TRUE(m_outcome->error);
    EXPECT_THAT(m_outcome->error->description(), HasSubstr("cannot make"));
    EXPECT_FALSE(m_outcome->activityTypes);
}

} // namespace
