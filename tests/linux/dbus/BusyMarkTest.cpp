#include "linux/dbus/BusyMark.h"

#include "support/PrivateDirectory.h"

#include <gtest/gtest.h>

#include <atomic>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

namespace {

class TheBusyMark : public testing::Test {
protected:
    bool isSet() const { return dbus::BusyMark::isSet(m_directory.path()); }

    tests::PrivateDirectory m_directory;
    dbus::BusyMark m_mark{m_directory.path()};
};

TEST_F(TheBusyMark, IsSetUntilItIsCleared)
{
    EXPECT_FALSE(isSet());
    EXPECT_TRUE(m_mark.set());
    EXPECT_TRUE(isSet());
    EXPECT_TRUE(m_mark.set()) << "once more is as good";
    EXPECT_TRUE(isSet());
    m_mark.clear();
    EXPECT_FALSE(isSet());
    EXPECT_TRUE(m_mark.set());
    EXPECT_TRUE(isSet());
}

TEST_F(TheBusyMark, GoesWithItsProcess)
{
    const pid_t process = ::fork();
    if (process == 0)
        ::_exit(m_mark.set() && isSet() ? 0 : 1);
    int status = -1;
    ::waitpid(process, &status, 0);
    EXPECT_EQ(status, 0);
    EXPECT_FALSE(isSet());
}

TEST_F(TheBusyMark, CannotBeSetWhereThereIsNoDirectory)
{
    dbus::BusyMark nowhere(m_directory.path() / "missing");
    EXPECT_FALSE(nowhere.set());
    EXPECT_FALSE(dbus::BusyMark::isSet(m_directory.path() / "missing"));
}

TEST_F(TheBusyMark, IsNotKeptFromBeingSetByThoseWhoLook)
{
    std::atomic<bool> enough = false;
    std::thread host([&] {
        while (!enough)
            isSet();
    });
    int refused = 0;
    for (int i = 0; i < 20'000; ++i) {
        refused += m_mark.set() ? 0 : 1;
        m_mark.clear();
    }
    enough = true;
    host.join();
    EXPECT_EQ(refused, 0);
}

} // namespace
