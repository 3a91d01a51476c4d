#include "base/HandBack.h"
#include "base/SharedDictionary.h"

#include <gtest/gtest.h>

#include <string>
#include <thread>

namespace {

struct Watched {
    explicit Watched(std::thread::id& whereItEnded) : ended(whereItEnded) {}
    ~Watched() { ended = std::this_thread::get_id(); }
    std::thread::id& ended;
};

TEST(HandBack, TheLastReferenceGoesOnTheMainQueueWhicheverThreadHadIt)
{
    base::ManualClock clock;
    base::MainQueue mainQueue(clock);
    std::thread::id ended;
    auto object = std::make_shared<Watched>(ended);
    std::thread worker([kept = base::handedBackTo(mainQueue, object)]() mutable {
        auto copy = kept;
        kept.reset();
        copy.reset();
    });
    object.reset();
    worker.join();
    EXPECT_EQ(ended, std::thread::id());
    mainQueue.drain();
    EXPECT_EQ(ended, std::this_thread::get_id());
}

TEST(HandBack, AnObjectThatOthersHaveStays)
{
    base::ManualClock clock;
    base::MainQueue mainQueue(clock);
    std::thread::id ended;
    const auto object = std::make_shared<Watched>(ended);
    {
        const auto kept = base::handedBackTo(mainQueue, object);
        EXPECT_EQ(kept.get(), object.get());
        EXPECT_EQ(object.use_count(), 2);
    }
    mainQueue.drain();
    EXPECT_EQ(object.use_count(), 1);
    EXPECT_EQ(ended, std::thread::id());
}

TEST(SharedDictionary, KeepsWhatSeveralThreadsPutIntoIt)
{
    base::SharedDictionary<int, std::string> dictionary;
    EXPECT_FALSE(dictionary.object(1));
    std::thread worker([&] {
        for (int i = 0; i < 500; ++i)
            dictionary.setObject("worker", i);
    });
    for (int i = 500; i < 1000; ++i) {
        dictionary.setObject("here", i);
        EXPECT_EQ(dictionary.object(i), "here");
    }
    worker.join();
    EXPECT_EQ(dictionary.count(), 1000U);
    EXPECT_EQ(dictionary.object(3), "worker");
    dictionary.setObject("again", 3);
    EXPECT_EQ(dictionary.object(3), "again");
    EXPECT_EQ(dictionary.count(), 1000U);
}

} // namespace
