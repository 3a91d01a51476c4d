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
#include <thread>
#include <vector>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

/// Time that goes on each time that somebody looks.
class PassingClock final : public base::Clock {
public:
    explicit PassingClock(base::Instant step) : m_step(step) {}
    base::Instant now() const override { return m_now += m_step; }
    base::Date date() const override { return {}; }

private:
    base::Instant m_step;
    mutable base::Instant m_now{0};
};

class Delivering : public ::testing::Test {
protected:
    /// Delivers into `directory` once `before` has been done; until everything has been told.
    void deliver(const std::string& directory, const std::function<void(host::DetachedWork& work)>& before = {})
    {
        const auto movie = m_directory.write("movie.mp4", "moving pictures");
        std::filesystem::resize_file(movie, m_size);
        const auto delivery = std::make_shared<host::FileDelivery>();
        delivery->movie = posix::FileDescriptor(::open(movie.c_str(), O_RDONLY | O_CLOEXEC));
        delivery->movieName = "movie.mp4";
        delivery->movieDirectory = directory;
        delivery->movieArrived = std::make_shared<host::Promise>();
        delivery->movieArrived->whenKept([this](const base::Result<runtime::Value>& value) { m_arrived = value; });
        if (m_withAttachment) {
            const auto attachment = m_directory.write("notes.txt", "notes");
            delivery->attachment = posix::FileDescriptor(::open(attachment.c_str(), O_RDONLY | O_CLOEXEC));
            delivery->attachmentName = "notes.txt";
            delivery->attachmentDirectory = m_target.path() / "attachment";
            delivery->attachmentArrived = std::make_shared<host::Promise>();
            delivery->attachmentArrived->whenKept([this](const base::Result<runtime::Value>& value) {
                EXPECT_FALSE(m_arrived) << "the movie is the last that the editor waits for";
                m_attachmentArrived = value;
                m_attachmentThread = std::this_thread::get_id();
            });
        }
        const host::DeliveryEvents events{[this, here = std::this_thread::get_id()](std::uint64_t total) {
                                              EXPECT_EQ(std::this_thread::get_id(), here);
                                              m_copying.push_back(total);
                                          },
                                          [this](const base::ErrorRef& error) { m_failure = error; }};
        bool ended = false;
        std::promise<void> begin;
        host::DetachedWork work(
            [=, &ended, step = m_step, begun = begin.get_future().share()](host::DetachedWork::Client& client) {
                tests::refuseSystemCalls({{SYS_linkat, EXDEV}, tests::noReflinks()});
                begun.wait();
                host::deliverFiles(*delivery, events, client, PassingClock(step));
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
    std::vector<std::uint64_t> m_copying;
    std::optional<base::Result<runtime::Value>> m_attachmentArrived;
    std::thread::id m_attachmentThread;

    std::uintmax_t m_size = 15;
    bool m_withAttachment = false;
    base::Instant m_step{0}; ///< of the clock
};

TEST_F(Delivering, TellsWhereTheEditorFindsTheMovie)
{
    deliver(m_target.path());
    ASSERT_TRUE(m_arrived);
    EXPECT_EQ(runtime::fromValue<std::string>(m_arrived->value()), "/private/var/mobile/Library/Velkor/movie.mp4");
    EXPECT_EQ(tests::PrivateDirectory::read(m_target.path() / "movie.mp4"), "moving pictures");
    EXPECT_FALSE(m_failure);
}

TEST_F(Delivering, TellsOnceOfACopyThatTakesLongerThanASecond)
{
    m_size = 112 << 20; // seven steps of copying
    m_step = std::chrono::milliseconds(250);
    deliver(m_target.path());
    EXPECT_THAT(m_copying, ElementsAre(m_size));
    m_copying.clear();
    m_step = std::chrono::milliseconds(142); // short of the second
    std::filesystem::remove(m_target.path() / "movie.mp4");
    deliver(m_target.path());
    EXPECT_THAT(m_copying, IsEmpty());
    EXPECT_EQ(std::filesystem::file_size(m_target.path() / "movie.mp4"), m_size);
}

TEST_F(Delivering, TellsOfAnAttachmentOnItsClientsThreadToo)
{
    m_withAttachment = true;
    deliver(m_target.path());
    ASSERT_TRUE(m_attachmentArrived);
    const auto path = runtime::fromValue<std::string>(m_attachmentArrived->value());
    EXPECT_EQ(path, m_target.path() / "attachment/notes.txt");
    EXPECT_EQ(tests::PrivateDirectory::read(path), "notes");
    EXPECT_EQ(m_attachmentThread, std::this_thread::get_id());
    EXPECT_TRUE(m_arrived);
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
