// Sending by KDE Connect and GSConnect, which say only whether they take a file.
#include "Nearby.h"

#include "support/RefusedSystemCalls.h"

#include <sys/syscall.h>

using testing::HasSubstr;

namespace tests {

namespace {

std::string phone(const std::string& more)
{
    return R"({"devices": {"p1": {"name": "Ada’s phone", "type": "phone", "isReachable": true, "isPaired": true,
                                  "plugins": ["kdeconnect_share"]}}, )"
           + more + "}";
}
std::string gsPhone(const std::string& more)
{
    return R"({"devices": {"p1": {"Name": "Ada’s phone", "Connected": true, "Paired": true, "sharing": true}}, )" + more
           + "}";
}

} // namespace

class HandingOver : public Nearby {
protected:
    std::size_t inOutbox() const
    {
        std::error_code none;
        std::size_t count = 0;
        for (const auto& entry : std::filesystem::recursive_directory_iterator(m_directory.path() / "outbox", none))
            count += entry.is_regular_file() && entry.path().filename().string().starts_with("Tux Racer") ? 1 : 0;
        return count;
    }
};

TEST_F(HandingOver, GivesKdeConnectEachFileUnderItsGoodName)
{
    m_items = {"Look at this", base::Url::fromPath(m_directory.write("a #1 %41&+;é.mp4", m_bytes)), "and at this",
               base::Url::fromPath(m_directory.write("notes é.txt", m_notes))};
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    start();
    EXPECT_FALSE(m_works.isEmpty()) << "the process must not end now";
    expectCompleted();
    EXPECT_TRUE(isReceived("Tux Racer a #1 %41&+;é.mp4", m_bytes));
    EXPECT_TRUE(isReceived("Tux Racer notes é.txt", m_notes));
    EXPECT_EQ(m_found[0]->receiver(), "Ada’s phone");
    EXPECT_EQ(m_going.progress.front(), std::nullopt);
}

TEST_F(HandingOver, GivesGsConnectEachFileAndOpensNone)
{
    m_items.emplace_back(base::Url::fromPath(m_directory.write("notes é #2.txt", m_notes)));
    Scripted daemon("gsconnect.py", m_session.address(), gsPhone(receiving()));
    find();
    start();
    expectCompleted();
    ASSERT_TRUE(until([&] { return daemon.hasSaid("received Tux Racer notes é #2.txt"); })) << daemon.said();
    EXPECT_TRUE(isReceived("Tux Racer movie.mp4", m_bytes));
    EXPECT_TRUE(isReceived("Tux Racer notes é #2.txt", m_notes));
    EXPECT_THAT(daemon.said(), testing::Not(HasSubstr("opens True")));
}

TEST_F(HandingOver, LeavesTheFileWhereItIsForWhoReadsItLater)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving(R"(, "later": true)")));
    find();
    start();
    expectCompleted();
    m_found.clear();
    m_provider.reset();
    std::filesystem::remove(m_directory.path() / "movie.mp4");
    m_outbox.sweep();
    daemon.command("transfer");
    ASSERT_TRUE(until([&] { return daemon.hasSaid("received Tux Racer movie.mp4"); }));
    EXPECT_TRUE(isReceived("Tux Racer movie.mp4", m_bytes));
}

TEST_F(HandingOver, SaysWhichDeviceHasGone)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    daemon.command("lose p1");
    ASSERT_TRUE(until([&] { return daemon.hasSaid("lost"); }));
    start();
    expectFailure("“Ada’s phone” cannot be reached by KDE Connect. Bring it near, see that it is on, and share again.");
    EXPECT_FALSE(m_system.log.texts(base::MemoryLog::Line::Kind::Error).empty());
}

TEST_F(HandingOver, CanBeTriedAgain)
{
    m_items.emplace_back(base::Url::fromPath(m_directory.write("notes.txt", m_notes)));
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving(R"(, "refuses": "notes.txt")")));
    find();
    start();
    awaitEnd();
    EXPECT_FALSE(m_going.end->completed);
    daemon.command("relent");
    std::filesystem::remove(m_directory.path() / "received/Tux Racer movie.mp4");
    start();
    expectCompleted();
    EXPECT_TRUE(isReceived("Tux Racer movie.mp4", m_bytes));
    EXPECT_TRUE(isReceived("Tux Racer notes.txt", m_notes));
}

TEST_F(HandingOver, SaysWhatWasRefused)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving(R"(, "refuses": "movie.mp4")")));
    find();
    start();
    expectFailure(
        "“Tux Racer movie.mp4” was not sent to “Ada’s phone”, because KDE Connect refused it. See whether the "
        "device is still paired, and share again.");
}

TEST_F(HandingOver, SaysThatTheServiceHasGone)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    daemon.kill();
    start();
    expectFailure("“Tux Racer movie.mp4” was not sent to “Ada’s phone”, because KDE Connect is not running. Start it, "
                  "and share again.");
}

TEST_F(HandingOver, SaysSoWhenTheServiceIsKilledInTheMiddle)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    daemon.freeze();
    start();
    m_system.drain();
    ASSERT_FALSE(pumpUntil([this] { return m_going.end.has_value(); }, std::chrono::milliseconds(20)));
    daemon.kill();
    expectFailure("“Tux Racer movie.mp4” was not sent to “Ada’s phone”, because KDE Connect is not running. Start it, "
                  "and share again.");
}

TEST_F(HandingOver, WaitsTenSecondsForAnAnswer)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    daemon.freeze();
    start();
    m_system.drain();
    m_system.advance(std::chrono::milliseconds(9'999));
    EXPECT_FALSE(m_going.end);
    m_system.advance(std::chrono::milliseconds(1));
    expectFailure("“Tux Racer movie.mp4” was perhaps not sent to “Ada’s phone”, because KDE Connect does not answer. "
                  "Look there, and share again if it is missing.");
    daemon.thaw();
    ASSERT_TRUE(until([&] { return daemon.hasSaid("received Tux Racer movie.mp4"); })) << "late, and nobody minds";
}

TEST_F(HandingOver, SaysThatGsConnectsDeviceHasGone)
{
    for (const char* const way : {"disable p1", "remove p1"}) {
        Scripted daemon("gsconnect.py", m_session.address(), gsPhone(receiving()));
        find();
        daemon.command(way);
        ASSERT_TRUE(until([&] { return daemon.hasSaid("disabled") || daemon.hasSaid("removed"); }));
        start();
        expectFailure(
            "“Ada’s phone” cannot be reached by GSConnect. Bring it near, see that it is on, and share again.");
        EXPECT_FALSE(daemon.hasSaid("opens False"));
    }
}

TEST_F(HandingOver, EndsAtOnceWhenItIsCancelledAndGivesNothing)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    start();
    m_found.front()->cancel();
    ASSERT_TRUE(m_going.end);
    EXPECT_FALSE(m_going.end->completed);
    EXPECT_FALSE(m_going.end->error);
    EXPECT_TRUE(m_works.isEmpty());
    m_system.drain();
    EXPECT_EQ(inOutbox(), 0U) << "nobody wants it any more";
    m_found.front()->cancel();
    find();
    EXPECT_FALSE(daemon.hasSaid("received Tux Racer movie.mp4"));
}

TEST_F(HandingOver, GivesNothingWhenItIsCancelledOnceTheFileIsReady)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    start();
    m_system.defaultQueue.drain();
    m_found.front()->cancel();
    m_system.drain();
    find();
    EXPECT_FALSE(daemon.hasSaid("received Tux Racer movie.mp4"));
}

TEST_F(HandingOver, IsGivenUpByWhoLetsGoOfIt)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    start();
    m_found.clear();
    EXPECT_TRUE(m_works.isEmpty());
    m_system.drain();
    EXPECT_EQ(inOutbox(), 0U);
    EXPECT_FALSE(m_going.end);
}

TEST_F(HandingOver, CanBeLetGoOfByWhoHearsOfItsEnd)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    start();
    m_found.front()->setEndHandler([this](const platform::Activity::End& end) {
        m_going.end = end;
        m_found.clear();
    });
    expectCompleted();
}

TEST_F(HandingOver, TellsHowFarCopyingIs)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    std::string large;
    large.resize(20'000'000, 'x');
    m_items = {base::Url::fromPath(m_directory.write("large.mp4", large))};
    find();
    start();
    whileRefusing({noReflinks(), {SYS_linkat, EXDEV}, {SYS_copy_file_range, EXDEV}},
                  [this] { m_system.defaultQueue.drain(); });
    expectCompleted();
    EXPECT_TRUE(isReceived("Tux Racer large.mp4", large));
    ASSERT_GT(m_going.progress.size(), 2U);
    for (std::size_t i = 2; i < m_going.progress.size(); ++i)
        EXPECT_GT(m_going.progress[i], m_going.progress[i - 1]);
    EXPECT_LE(*m_going.progress.back(), 1);
}

TEST_F(HandingOver, SaysWhatToDoWhenTheDiskIsFull)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    start();
    whileRefusing({noReflinks(),
                   {SYS_linkat, EXDEV},
                   {SYS_copy_file_range, ENOSPC},
                   {SYS_sendfile, ENOSPC},
                   {SYS_pwrite64, ENOSPC},
                   {SYS_fallocate, ENOSPC}},
                  [this] { m_system.defaultQueue.drain(); });
    expectFailure("“Tux Racer movie.mp4” cannot be shared, because the disk is full. Make room, and try again.");
    EXPECT_EQ(inOutbox(), 0U);
    EXPECT_FALSE(daemon.hasSaid("received Tux Racer movie.mp4"));
}

TEST_F(HandingOver, SaysThatTheMovieIsNotThereAnyMore)
{
    Scripted daemon("kdeconnect.py", m_session.address(), phone(receiving()));
    find();
    std::filesystem::remove(m_directory.path() / "movie.mp4");
    start();
    expectFailure("“Tux Racer movie.mp4” cannot be shared: it is no longer there.");
}

} // namespace tests
