// The loop of a command without a window: it sleeps until there is something to do, and then does it.
#include "app/host/MediaTool.h"

#include "support/SignalMask.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>
#include <future>
#include <optional>
#include <unistd.h>

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

TEST_F(ATool, GivesUpWhatIsUnderWayWhenASignalComesAndWaitsForItsEnd)
{
    std::promise<void> givenUp;
    bool ended = false;
    m_tool->system().backgroundQueue.post(
        [this, &ended, gate = givenUp.get_future().share(), work = m_tool->works().begin()]() mutable {
            gate.wait();
            m_main.post([&ended] { ended = true; });
            work.reset();
        });
    ::kill(::getpid(), SIGTERM);
    m_tool->finishWork([&] { givenUp.set_value(); }, {});
    EXPECT_EQ(m_tool->interruption(), SIGTERM);
    EXPECT_TRUE(ended);
}

/// An export that lasts until it is cancelled.
class EndlessExport final : public platform::ExportSession {
public:
    explicit EndlessExport(base::WorkList& works) : m_works(works) {}

    void setOutputURL(std::optional<base::Url>) override {}
    void setOutputFileType(platform::FileType) override {}
    void setTimeRange(std::optional<base::MediaTimeRange>) override {}
    void setAudioMix(std::optional<platform::AudioMix>) override {}
    void exportAsynchronously(std::function<void()>) override { m_work = m_works.begin(); }
    void cancelExport() override { m_work.reset(); }
    Status status() const override { return Status::Cancelled; }
    base::ErrorRef error() const override { return nullptr; }
    std::optional<base::Url> outputURL() const override { return std::nullopt; }
    double progress() const override { return 0; }

private:
    base::WorkList& m_works;
    std::shared_ptr<base::Work> m_work;
};

TEST_F(ATool, CancelsItsExportWhenASignalComes)
{
    const auto session = std::make_shared<EndlessExport>(m_tool->works());
    ::kill(::getpid(), SIGINT);
    const base::ErrorRef error = m_tool->runExport(*session, {});
    ASSERT_TRUE(error);
    EXPECT_EQ(error->code(), ECANCELED);
    EXPECT_EQ(m_tool->fail(error), 128 + SIGINT);
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
