// The files of a request on their way to an editor, where copying is the only one.
#include "app/host/DeliverFiles.h"

#include "support/EventLoop.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <fcntl.h>
#include <future>
#include <optional>

using testing::HasSubstr;

namespace {

class Delivering : public ::testing::Test {
protected:
    /// Delivers into `directory` once `before` has been done; until everything has been told.
    void deliver(const std::string& directory, const std::function<void(host::DetachedWork& work)>& before = {})
    {
        const auto movie = m_directory.write("movie.mp4", "moving pictures");
        const auto delivery = std::make_shared<host::FileDelivery>();
        delivery->movie = posix::FileDescriptor(::open(movie.c_str(), O_RDONLY | O_CLOEXEC));
        delivery->movieName = "movie.mp4";
        delivery->movieDirectory = directory;
        delivery->movieArrived = std::make_shared<host::Promise>();
        delivery->movieArrived->whenKept([this](const base::Result<runtime::Value>& value) { m_arrived = value; });
        const host::DeliveryEvents events{[](std::uint64_t) {},
                                          [this](const base::ErrorRef& error) { m_failure = error; }};
        bool ended = false;
        std::promise<void> begin;
        host::DetachedWork work([=, &ended, begun = begin.get_future().share()](host::DetachedWork::Client& client) {
            tests::refuseSystemCalls({{SYS_linkat, EXDEV}, tests::noReflinks()});
            begun.wait();
            host::deliverFiles(*delivery, events, client);
            client.post([&ended] { ended = true; });
        });
        if (before)
            before(work);
        begin.set_value();
        ASSERT_TRUE(tests::pumpUntil([&] { return ended; }));
    }

    tests::PrivateDirectory m_directory;
    tests::PrivateDirectory m_target;
    std::optional<base::Result<runtime::Value>> m_arrived;
    base::ErrorRef m_failure;
};

TEST_F(Delivering, TellsWhereTheEditorFindsTheMovie)
{
    deliver(m_target.path());
    ASSERT_TRUE(m_arrived);
    EXPECT_EQ(runtime::fromValue<std::string>(m_arrived->value()), "/private/var/mobile/Library/Velkor/movie.mp4");
    EXPECT_EQ(tests::PrivateDirectory::read(m_target.path() / "movie.mp4"), "moving pictures");
    EXPECT_FALSE(m_failure);
}

TEST_F(Delivering, TellsWhyThereIsNoMovie)
{
    deliver(m_target.path() / "none");
    ASSERT_TRUE(m_failure);
    EXPECT_THAT(m_failure->description(), HasSubstr("cannot make"));
    EXPECT_FALSE(m_arrived && *m_arrived);
}

TEST_F(Delivering, HasNotFailedWhenNobodyWantsItAnyMore)
{
    deliver(m_target.path(), [](host::DetachedWork& work) { work.cancel(); });
    EXPECT_FALSE(m_failure) << "it would be taken for the reason why the editor ended: " << m_failure->description();
    EXPECT_FALSE(std::filesystem::exists(m_target.path() / "movie.mp4"));
}

} // namespace
