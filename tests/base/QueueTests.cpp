#include "base/Queue.h"

#include <gmock/gmock.h>

#include <atomic>
#include <string>
#include <vector>

namespace {

using namespace std::chrono_literals;
using testing::ElementsAre;

struct MainQueueTests : testing::Test {
    base::ManualClock clock;
    base::MainQueue queue{clock};
    std::vector<std::string> said;

    base::Task say(const std::string& text)
    {
        return [this, text] { said.push_back(text); };
    }
};

TEST_F(MainQueueTests, TasksRunInTheOrderInWhichTheyWerePosted)
{
    queue.post(say("a"));
    queue.post(say("b"));
    EXPECT_EQ(queue.runDue(), 2U);
    EXPECT_THAT(said, ElementsAre("a", "b"));
}

TEST_F(MainQueueTests, WhatIsPostedByATaskWaitsForTheNextTurn)
{
    queue.post([this] { queue.post(say("later")); });
    EXPECT_EQ(queue.runDue(), 1U);
    EXPECT_THAT(said, ElementsAre());
    EXPECT_EQ(queue.runDue(), 1U);
    EXPECT_THAT(said, ElementsAre("later"));
}

TEST_F(MainQueueTests, DrainingRunsWhatIsPostedMeanwhile)
{
    queue.post([this] { queue.post(say("later")); });
    queue.drain();
    EXPECT_THAT(said, ElementsAre("later"));
}

TEST_F(MainQueueTests, DelayedTasksWaitForTheClock)
{
    queue.postAfter(10ms, say("ten"));
    EXPECT_EQ(queue.untilNext(), 10ms);
    clock.advance(9ms);
    EXPECT_EQ(queue.runDue(), 0U);
    EXPECT_EQ(queue.untilNext(), 1ms);
    clock.advance(1ms);
    EXPECT_EQ(queue.runDue(), 1U);
    EXPECT_EQ(queue.untilNext(), std::nullopt);
}

TEST_F(MainQueueTests, DelayedTasksRunInTheOrderOfTheirTimesAndThenOfTheirPosting)
{
    queue.postAfter(20ms, say("twenty"));
    queue.postAfter(10ms, say("ten"));
    queue.postAfter(10ms, say("ten too"));
    clock.advance(30ms);
    queue.runDue();
    EXPECT_THAT(said, ElementsAre("ten", "ten too", "twenty"));
}

TEST_F(MainQueueTests, ADelayThatHasPassedIsDueNow)
{
    queue.postAfter(10ms, say("ten"));
    clock.advance(1h);
    EXPECT_EQ(queue.untilNext(), 0ms);
}

TEST_F(MainQueueTests, APostedTaskIsDueNowWhateverWaits)
{
    queue.postAfter(10ms, say("ten"));
    queue.post(say("now"));
    EXPECT_EQ(queue.untilNext(), 0ms);
}

TEST_F(MainQueueTests, PostingWakesTheEventLoop)
{
    int woken = 0;
    queue.setWake([&] { ++woken; });
    queue.post([] {});
    queue.postAfter(1ms, [] {});
    EXPECT_EQ(woken, 2);
}

TEST_F(MainQueueTests, WhatATaskHeldIsGoneBeforeTheNextTaskRuns)
{
    auto held = std::make_shared<int>(1);
    const std::weak_ptr<int> weak = held;
    queue.post([held] {});
    held.reset();
    bool gone = false;
    queue.post([&] { gone = weak.expired(); });
    queue.runDue();
    EXPECT_TRUE(gone);
}

TEST_F(MainQueueTests, RunningOnTheOwnQueueHappensAtOnce)
{
    queue.run(say("now"));
    EXPECT_THAT(said, ElementsAre("now"));
}

TEST(WorkerQueue, RunsTasksInOrderOnAThreadOfItsOwn)
{
    base::WorkerQueue worker;
    std::vector<int> order;
    bool current = false;
    for (int i = 0; i < 3; ++i)
        worker.post([&order, i] { order.push_back(i); });
    worker.run([&] { current = worker.isCurrent(); });
    EXPECT_THAT(order, ElementsAre(0, 1, 2));
    EXPECT_TRUE(current);
    EXPECT_FALSE(worker.isCurrent());
}

TEST(WorkerQueue, FinishesWhatWasPostedBeforeItDies)
{
    std::atomic<int> ran{0};
    {
        base::WorkerQueue worker;
        for (int i = 0; i < 100; ++i)
            worker.post([&] { ++ran; });
    }
    EXPECT_EQ(ran, 100);
}

TEST(WorkerQueue, RunsWhatItIsToldAtTheStartFirst)
{
    std::vector<std::string> said;
    {
        base::WorkerQueue worker([&] { said.emplace_back("start"); });
        worker.post([&] { said.emplace_back("task"); });
    }
    EXPECT_THAT(said, ElementsAre("start", "task"));
}

TEST(WorkerQueue, WaitingForManyTasksOneByOneIsSafe)
{
    base::WorkerQueue worker;
    int sum = 0;
    for (int i = 0; i < 1000; ++i)
        worker.run([&] { ++sum; });
    EXPECT_EQ(sum, 1000);
}

TEST(ManualQueue, RunsUntilNothingIsLeft)
{
    base::ManualQueue queue;
    bool current = false;
    queue.post([&] { queue.post([&] { current = queue.isCurrent(); }); });
    EXPECT_EQ(queue.pending(), 1U);
    EXPECT_EQ(queue.drain(), 2U);
    EXPECT_TRUE(current);
    EXPECT_FALSE(queue.isCurrent());
}

TEST(ManualClock, BothKindsOfTimeAdvanceTogether)
{
    base::ManualClock clock({100});
    clock.advance(1500ms);
    EXPECT_EQ(clock.now(), 1500ms);
    EXPECT_DOUBLE_EQ(clock.date().secondsSince1970, 101.5);
}

TEST(SystemClock, NeverGoesBack)
{
    const base::SystemClock clock;
    const auto first = clock.now();
    EXPECT_GE(clock.now(), first);
    EXPECT_GT(clock.date().secondsSince1970, 1.7e9);
}

} // namespace
