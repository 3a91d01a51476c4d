#include "base/Affinity.h"

#include <gtest/gtest.h>

#include <thread>

namespace {

#ifndef NDEBUG

void elsewhere(const auto& work)
{
    std::thread(work).join();
}

TEST(Affinity, IsToTheThreadThatMadeIt)
{
    const base::Affinity affinity;
    affinity.assertHere();
    EXPECT_DEATH(elsewhere([&] { affinity.assertHere(); }),
                 "AffinityTest.cpp:[0-9]+: .* was called on thread .*, but belongs to");
}

TEST(Affinity, ThatIsDetachedIsToWhoeverAsksFirst)
{
    const base::Affinity affinity = base::Affinity::detached();
    elsewhere([&] {
        affinity.assertHere();
        affinity.assertHere();
    });
    EXPECT_DEATH(affinity.assertHere(), "belongs to thread");
}

TEST(Affinity, GoesToTheNextThreadThatItIsDetachedFor)
{
    base::Affinity affinity;
    affinity.detach();
    elsewhere([&] { affinity.assertHere(); });
    EXPECT_DEATH(affinity.assertHere(), "belongs to thread");
    affinity.detach();
    affinity.assertHere();
}

TEST(Affinity, OfACopyOfWhatIsDetachedIsDetachedToo)
{
    const base::Affinity original = base::Affinity::detached();
    const base::Affinity copy = original; // NOLINT(performance-unnecessary-copy-initialization)
    elsewhere([&] { copy.assertHere(); });
}

TEST(Affinity, OfACopyIsToTheThreadThatCopied)
{
    const base::Affinity affinity;
    elsewhere([&] {
        const base::Affinity copy = affinity; // NOLINT(performance-unnecessary-copy-initialization)
        copy.assertHere();
    });
}

#endif

} // namespace
