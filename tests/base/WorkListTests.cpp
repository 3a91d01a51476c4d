#include "base/WorkList.h"

#include <gtest/gtest.h>

#include <memory>
#include <optional>

namespace {

TEST(WorkListTests, WorkIsUnderWayUntilItsLastReferenceGoes)
{
    base::WorkList list;
    EXPECT_TRUE(list.isEmpty());
    auto work = list.begin();
    auto other = work;
    work.reset();
    EXPECT_FALSE(list.isEmpty());
    other.reset();
    EXPECT_TRUE(list.isEmpty());
}

TEST(WorkListTests, ProgressIsThatOfAllWorkWhoseProgressIsKnown)
{
    base::WorkList list;
    EXPECT_EQ(list.progress(), std::nullopt);
    const auto first = list.begin();
    const auto second = list.begin();
    const auto third = list.begin();
    EXPECT_EQ(list.progress(), std::nullopt);
    first->setProgress(0.5);
    EXPECT_EQ(list.progress(), 0.5);
    second->setProgress(7);
    EXPECT_EQ(list.progress(), 0.75) << "no more than all";
}

TEST(WorkListTests, EveryChangeIsTold)
{
    base::WorkList list;
    int changes = 0;
    list.setChangeHandler([&] { ++changes; });
    auto work = list.begin();
    work->setProgress(0.1);
    work.reset();
    EXPECT_EQ(changes, 3);
}

TEST(WorkListTests, WorkMayOutliveItsListAndThenTellsNobody)
{
    int changes = 0;
    std::shared_ptr<base::Work> work;
    {
        base::WorkList list;
        list.setChangeHandler([&] { ++changes; });
        work = list.begin();
    }
    work->setProgress(0.5);
    work.reset();
    EXPECT_EQ(changes, 1);
}

} // namespace
