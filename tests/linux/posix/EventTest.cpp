#include "linux/posix/Event.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <poll.h>

namespace {

bool hasHappened(const posix::Event& event)
{
    pollfd input = {event.descriptor(), POLLIN, 0};
    return ::poll(&input, 1, 0) == 1;
}

TEST(AnEvent, IsThereFromWhenItHappensUntilItIsForgotten)
{
    const posix::Event event;
    EXPECT_FALSE(hasHappened(event));
    event.happen();
    event.happen();
    EXPECT_TRUE(hasHappened(event));
    EXPECT_TRUE(hasHappened(event)) << "looking changes nothing";
    event.forget();
    EXPECT_FALSE(hasHappened(event));
    event.forget(); // which does not wait for one
    event.happen();
    EXPECT_TRUE(hasHappened(event));
}

TEST(AnEvent, IsNotHandedToOtherPrograms)
{
    EXPECT_NE(::fcntl(posix::Event().descriptor(), F_GETFD) & FD_CLOEXEC, 0);
}

} // namespace
