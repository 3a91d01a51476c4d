#include "app/editor/WorkWatch.h"

#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <memory>
#include <string>
#include <thread>
#include <vector>

namespace {

using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::IsEmpty;

class WorkWatch : public testing::Test {
protected:
    std::vector<std::string> told()
    {
        machine.drain();
        return std::exchange(m_told, {});
    }

    tests::TestSystem machine;
    base::WorkList list;

private:
    std::vector<std::string> m_told;

protected:
    std::unique_ptr<app::WorkWatch> watch = std::make_unique<app::WorkWatch>(
        machine.mainQueue, list,
        app::WorkWatch::Handlers{[this] { m_told.emplace_back("begun"); }, [this] { m_told.emplace_back("ended"); },
                                 [this](std::optional<double> progress) {
                                     m_told.push_back(progress ? "show " + std::to_string(std::lround(*progress * 100))
                                                               : "show");
                                 },
                                 [this] { m_told.emplace_back("hide"); }});
};

TEST_F(WorkWatch, WhatIsOverWithinHalfASecondIsNotShown)
{
    auto work = list.begin();
    EXPECT_THAT(told(), ElementsAre("begun"));
    machine.advance(499ms);
    work.reset();
    EXPECT_THAT(told(), ElementsAre("ended"));
    machine.advance(1s);
    EXPECT_THAT(told(), IsEmpty());
}

TEST_F(WorkWatch, WhatLastsIsShownWithItsProgressUntilItEnds)
{
    auto work = list.begin();
    work->setProgress(0.1);
    EXPECT_THAT(told(), ElementsAre("begun"));
    machine.advance(500ms);
    EXPECT_THAT(told(), ElementsAre("show 10"));
    work->setProgress(0.2);
    work->setProgress(0.3);
    EXPECT_THAT(told(), ElementsAre("show 30")) << "what is outdated is not told";
    work.reset();
    EXPECT_THAT(told(), ElementsAre("hide", "ended"));
}

TEST_F(WorkWatch, WorkThatFollowsAtOnceIsTheSameWork)
{
    auto work = list.begin();
    EXPECT_THAT(told(), ElementsAre("begun"));
    machine.advance(500ms);
    EXPECT_THAT(told(), ElementsAre("show"));
    auto next = list.begin();
    work.reset();
    EXPECT_THAT(told(), ElementsAre("show"));
    next.reset();
    EXPECT_THAT(told(), ElementsAre("hide", "ended"));
}

TEST_F(WorkWatch, AnEarlierWorksDelayDoesNotShowALaterOne)
{
    auto work = list.begin();
    machine.drain();
    work.reset();
    machine.advance(400ms);
    work = list.begin();
    machine.drain();
    machine.advance(200ms);
    EXPECT_THAT(told(), testing::Not(testing::Contains("show")));
    machine.advance(300ms);
    EXPECT_THAT(told(), ElementsAre("show"));
}

TEST_F(WorkWatch, WorkMayBeginAndEndOnAnyThreadAndOutliveTheWatch)
{
    std::shared_ptr<base::Work> work;
    std::thread([&] { work = list.begin(); }).join();
    EXPECT_TRUE(watch->isWorking());
    watch.reset();
    machine.advance(1s);
    work.reset();
    EXPECT_THAT(told(), IsEmpty());
}

} // namespace
