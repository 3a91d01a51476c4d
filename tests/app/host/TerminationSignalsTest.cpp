#include "app/host/TerminationSignals.h"

#include "support/EventLoop.h"
#include "support/SignalMask.h"

#include <gmock/gmock.h>

#include <csignal>
#include <unistd.h>
#include <vector>

namespace {

TEST(TerminationSignals, AreToldOfOnce)
{
    const tests::SignalMask mask;
    std::vector<int> told;
    const host::TerminationSignals signals([&](int number) { told.push_back(number); });
    ::kill(::getpid(), SIGHUP);
    EXPECT_TRUE(tests::pumpUntil([&] { return !told.empty(); }));
    for (int turn = 0; turn < 1000; ++turn)
        QCoreApplication::processEvents();
    EXPECT_THAT(told, testing::ElementsAre(SIGHUP));
}

} // namespace
