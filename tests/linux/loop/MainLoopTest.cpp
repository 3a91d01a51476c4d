// The main queue inside Qt's event loop.
#include "linux/loop/MainLoop.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QEventLoop>
#include <QTimer>

#include <gmock/gmock.h>

#include <chrono>
#include <thread>

namespace tests {

namespace {

using namespace std::chrono_literals;

class Loop : public ::testing::Test {
protected:
    /// Runs Qt's loop until `quit` is posted, or too long.
    void run()
    {
        QTimer::singleShot(5000, &events, &QEventLoop::quit);
        events.exec();
    }

    base::SystemClock time;
    base::MainQueue queue{time};
    QEventLoop events;
};

TEST_F(Loop, RunsWhatWasPostedBeforeAndAfterItWasMade)
{
    std::vector<int> order;
    queue.post([&] { order.push_back(1); });
    loop::MainLoop mainLoop(queue);
    queue.post([&] { order.push_back(2); });
    queue.post([&] { events.quit(); });
    EXPECT_TRUE(order.empty());
    run();
    EXPECT_THAT(order, ::testing::ElementsAre(1, 2));
}

TEST_F(Loop, RunsOnItsThreadWhatOthersPost)
{
    loop::MainLoop mainLoop(queue);
    std::thread::id ran;
    std::thread other([&] {
        queue.post([&] {
            ran = std::this_thread::get_id();
            events.quit();
        });
    });
    run();
    other.join();
    EXPECT_EQ(ran, std::this_thread::get_id());
}

TEST_F(Loop, RunsDelayedTasksWhenTheyAreDue)
{
    loop::MainLoop mainLoop(queue);
    const base::Instant start = time.now();
    std::vector<int> order;
    queue.postAfter(30ms, [&] {
        order.push_back(2);
        events.quit();
    });
    queue.postAfter(10ms, [&] { order.push_back(1); });
    run();
    EXPECT_THAT(order, ::testing::ElementsAre(1, 2));
    EXPECT_GE(time.now() - start, 30ms);
}

TEST_F(Loop, TasksThatPostEachOtherLeaveRoomForEvents)
{
    loop::MainLoop mainLoop(queue);
    int rounds = 0;
    const std::function<void()> again = [&] {
        if (++rounds < 1'000'000)
            queue.post(again);
    };
    queue.post(again);
    QTimer::singleShot(20, &events, &QEventLoop::quit);
    events.exec();
    EXPECT_LT(rounds, 1'000'000);
    EXPECT_GT(rounds, 1);
    rounds = 1'000'000;
}

TEST_F(Loop, StopsRunningWhenItEnds)
{
    bool ran = false;
    {
        loop::MainLoop mainLoop(queue);
        queue.post([&] { ran = true; });
    }
    QCoreApplication::processEvents();
    EXPECT_FALSE(ran);
    queue.drain();
    EXPECT_TRUE(ran);
}

} // namespace

} // namespace tests
