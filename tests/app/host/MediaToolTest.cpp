// The loop of a command without a window: it sleeps until there is something to do, and then does it.
#include "app/host/MediaTool.h"

#include "support/SignalMask.h"

#include <gtest/gtest.h>

#include <future>
#include <optional>

namespace {

class ATool : public ::testing::Test {
protected:
    /// How often the loop has looked whether it is done.
    int looksUntil(const bool& done, const std::function<void()>& meanwhile = {})
    {
        int looks = 0;
        EXPECT_TRUE(m_tool->runUntil([&] { return ++looks, done; }, meanwhile));
        return looks;
    }

private:
    const tests::SignalMask m_mask;

protected:
    std::optional<host::MediaTool> m_tool{std::in_place};
    base::MainQueue& m_main = m_tool->system().mainQueue;
};

TEST_F(ATool, SleepsUntilWhatIsDue)
{
    bool due = false;
    m_main.postAfter(std::chrono::milliseconds(20), [&] { due = true; });
    EXPECT_LE(looksUntil(due), 4);
}

TEST_F(ATool, IsWokenByEachWordFromAWorker)
{
    for (int i = 0; i < 3; ++i) {
        bool came = false;
        m_tool->system().backgroundQueue.post([&] { m_main.post([&] { came = true; }); });
        EXPECT_LE(looksUntil(came), 4);
    }
    bool due = false;
    m_main.postAfter(std::chrono::milliseconds(20), [&] { due = true; });
    EXPECT_LE(looksUntil(due), 4) << "what woke it is over";
}

TEST_F(ATool, WaitsForAllThatIsUnderWayAndForWhatThatHasPosted)
{
    bool told = false;
    m_tool->system().backgroundQueue.post([this, &told, work = m_tool->works().begin()]() mutable {
        m_main.post([&told] { told = true; });
        work.reset();
    });
    m_tool->finishWork([] { ADD_FAILURE() << "nobody interrupts it"; }, {});
    EXPECT_TRUE(told);
    EXPECT_TRUE(m_tool->works().isEmpty());
}

TEST_F(ATool, IsWokenByTheEndOfWhatIsUnderWay)
{
    std::promise<void> looked;
    m_tool->system().backgroundQueue.post(
        [gate = looked.get_future().share(), work = m_tool->works().begin()] { gate.wait(); });
    int looks = 0;
    EXPECT_TRUE(m_tool->runUntil([&] {
        if (++looks == 1)
            looked.set_value();
        return m_tool->works().isEmpty();
    }));
    EXPECT_LE(looks, 4);
}

TEST_F(ATool, DoesWhatIsToBeDoneMeanwhileNowAndThen)
{
    int times = 0;
    bool enough = false;
    const base::Instant begin = m_tool->system().clock.now();
    EXPECT_LE(looksUntil(enough, [&] { enough = ++times == 3; }), 8);
    EXPECT_GE(m_tool->system().clock.now() - begin, std::chrono::milliseconds(200)) << "ten times a second";
}

} // namespace
