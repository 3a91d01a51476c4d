#include "app/host/DetachedWork.h"

#include "support/EventLoop.h"

#include <gmock/gmock.h>

#include <future>
#include <memory>
#include <optional>
#include <thread>
#include <vector>

using testing::ElementsAre;

namespace {

using Client = host::DetachedWork::Client;

TEST(DetachedWork, CallsInOrderOnTheThreadThatStartedIt)
{
    std::vector<int> called;
    std::thread::id thread;
    const host::DetachedWork work([&](Client& client) {
        client.post([&] { thread = std::this_thread::get_id(); });
        for (int i = 0; i < 3; ++i)
            client.post([&called, i] { called.push_back(i); });
    });
    EXPECT_TRUE(tests::pumpUntil([&] { return called.size() == 3; }));
    EXPECT_THAT(called, ElementsAre(0, 1, 2));
    EXPECT_EQ(thread, std::this_thread::get_id());
}

TEST(DetachedWork, IsLeftToItselfAndCallsNobodyOnceItWasDestroyed)
{
    std::promise<void> posted;
    std::promise<void> destroyed;
    const auto ended = std::make_shared<std::promise<bool>>(); // the thread may outlive this
    const auto watched = std::make_shared<std::promise<void>>();
    bool called = false;
    std::optional<host::DetachedWork> work(std::in_place, [&, ended, watched](Client& client) {
        client.post([&] { called = true; });
        posted.set_value();
        destroyed.get_future().wait();
        client.post([&] { called = true; });
        ended->set_value(client.isWaiting());
        watched->get_future().wait(); // its client lives on as long
    });
    posted.get_future().wait();
    work.reset(); // does not wait
    destroyed.set_value();
    EXPECT_FALSE(ended->get_future().get()) << "it was not told that nobody wants it any more";
    QCoreApplication::processEvents();
    EXPECT_FALSE(called);
    watched->set_value();
}

TEST(DetachedWork, IsStillHeardWhenNobodyWantsItAnyMore)
{
    std::promise<void> cancelled;
    std::optional<bool> wasWaiting;
    host::DetachedWork work([&](Client& client) {
        cancelled.get_future().wait();
        client.post([&, waiting = client.isWaiting()] { wasWaiting = waiting; });
    });
    work.cancel();
    cancelled.set_value();
    EXPECT_TRUE(tests::pumpUntil([&] { return wasWaiting.has_value(); }));
    EXPECT_EQ(wasWaiting, false);
}

} // namespace
