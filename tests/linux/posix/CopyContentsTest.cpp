// Copying a file's contents, in whichever way the file systems know.
#include "linux/posix/CopyContents.h"

#include "linux/posix/FileDescriptor.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"
#include "support/SystemCalls.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <fcntl.h>
#include <fstream>
#include <string>
#include <vector>

namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using tests::PrivateDirectory;
using tests::RefusedSystemCall;

constexpr std::uint64_t kMebibyte = std::uint64_t{1024} * 1024;

/// No two places have the same byte for a long way.
std::string someBytes(std::size_t size)
{
    std::string bytes(size, '\0');
    std::uint32_t state = 1;
    for (char& byte : bytes) {
        state = state * 1664525U + 1013904223U;
        byte = static_cast<char>(state >> 24U);
    }
    return bytes;
}

/// In one piece: some are large.
std::string contentsOf(const std::filesystem::path& path)
{
    std::string contents(std::filesystem::file_size(path), '\0');
    std::ifstream(path, std::ios::binary).read(contents.data(), static_cast<std::streamsize>(contents.size()));
    return contents;
}

class Copying : public testing::Test {
protected:
    ~Copying() override { tests::systemCalls() = {}; }

    struct Outcome {
        int number = -1;
        std::vector<std::uint64_t> told;
    };

    /// On a thread where `refused` are refused.
    Outcome copy(std::optional<std::uint64_t> size, const std::vector<RefusedSystemCall>& refused = {})
    {
        Outcome outcome;
        tests::whileRefusing(refused, [&] {
            outcome.number = posix::copyContents(from.get(), to.get(), size, [&](std::uint64_t copied) {
                outcome.told.push_back(copied);
                return true;
            });
        });
        return outcome;
    }
    std::string copied() const { return contentsOf(target); }

    PrivateDirectory directory;
    const std::string bytes = someBytes(3'000'001);
    const std::filesystem::path source = directory.write("source", bytes);
    const std::filesystem::path target = directory.write("target", "");
    const posix::FileDescriptor from{::open(source.c_str(), O_RDWR | O_CLOEXEC)};
    const posix::FileDescriptor to{::open(target.c_str(), O_RDWR | O_CLOEXEC)};

    static constexpr RefusedSystemCall kNoCopies{SYS_copy_file_range, EXDEV};
    static constexpr RefusedSystemCall kNoSending{SYS_sendfile, EINVAL};
};

TEST_F(Copying, InTheKernelMovesTheProgressAtEverySixteenMebibytes)
{
    ASSERT_EQ(::ftruncate(from.get(), 40 * kMebibyte), 0);
    const auto outcome = copy(40 * kMebibyte);
    EXPECT_EQ(outcome.number, 0);
    EXPECT_THAT(outcome.told, ElementsAre(16 * kMebibyte, 32 * kMebibyte, 40 * kMebibyte));
    EXPECT_EQ(std::filesystem::file_size(target), 40 * kMebibyte);
    EXPECT_EQ(copied().substr(0, bytes.size()), bytes);
}

TEST_F(Copying, WithoutASizeTakesAllThereIsInSuchSteps)
{
    ASSERT_EQ(::ftruncate(from.get(), 20 * kMebibyte), 0);
    const auto outcome = copy(std::nullopt);
    EXPECT_EQ(outcome.number, 0);
    EXPECT_THAT(outcome.told, ElementsAre(16 * kMebibyte, 20 * kMebibyte));
    EXPECT_EQ(copied(), contentsOf(source));
}

TEST_F(Copying, ByHandMovesTheProgressAtEveryMebibyte)
{
    const auto outcome = copy(bytes.size(), {kNoCopies, kNoSending});
    EXPECT_EQ(outcome.number, 0);
    EXPECT_THAT(outcome.told, ElementsAre(kMebibyte, 2 * kMebibyte, bytes.size()));
    EXPECT_EQ(copied(), bytes);
}

TEST_F(Copying, TakesNoMoreThanItIsToldTo)
{
    for (const auto& refused : {std::vector<RefusedSystemCall>{}, {kNoCopies}, {kNoCopies, kNoSending}}) {
        ASSERT_EQ(::ftruncate(to.get(), 0), 0);
        EXPECT_EQ(copy(2'500'000, refused).number, 0);
        EXPECT_EQ(copied(), bytes.substr(0, 2'500'000)) << refused.size();
    }
}

TEST_F(Copying, OfNothingIsDoneAtOnce)
{
    const auto outcome = copy(0, {{SYS_copy_file_range, EIO}});
    EXPECT_EQ(outcome.number, 0);
    EXPECT_THAT(outcome.told, IsEmpty());
}

TEST_F(Copying, LeavesThePlaceWhereTheSourceIsReadAlone)
{
    for (const auto& refused : {std::vector<RefusedSystemCall>{}, {kNoCopies}, {kNoCopies, kNoSending}}) {
        ASSERT_EQ(::lseek(from.get(), 17, SEEK_SET), 17);
        EXPECT_EQ(copy(bytes.size(), refused).number, 0);
        EXPECT_EQ(::lseek(from.get(), 0, SEEK_CUR), 17) << refused.size();
    }
}

TEST_F(Copying, SaysWhenTheSourceEndsTooEarlyInWhicheverWay)
{
    for (const auto& refused : {std::vector<RefusedSystemCall>{}, {kNoCopies}, {kNoCopies, kNoSending}})
        EXPECT_EQ(copy(bytes.size() + 1, refused).number, ENODATA) << refused.size();
    EXPECT_EQ(copied(), bytes);
}

TEST_F(Copying, GoesOnByHandWhereTheKernelGivesNothing)
{
    for (const auto size : {std::optional<std::uint64_t>(bytes.size()), std::optional<std::uint64_t>()}) {
        ASSERT_EQ(::ftruncate(to.get(), 0), 0);
        EXPECT_EQ(copy(size, {{SYS_copy_file_range, 0}, {SYS_sendfile, 0}}).number, 0);
        EXPECT_EQ(copied(), bytes);
    }
}

TEST_F(Copying, TakesAnOlderSignalForNone)
{
    int calls = 0;
    tests::systemCalls().copying = [&](std::size_t) -> std::optional<ssize_t> {
        if (++calls > 1)
            return std::nullopt;
        errno = EINTR; // of something else, long ago
        return 0;
    };
    EXPECT_EQ(copy(bytes.size()).number, 0);
    EXPECT_EQ(calls, 1);
    EXPECT_EQ(copied(), bytes);
}

TEST_F(Copying, OfOneByteIsCopyingToo)
{
    ASSERT_EQ(::ftruncate(from.get(), 1), 0);
    const auto outcome = copy(1, {{SYS_sendfile, EIO}});
    EXPECT_EQ(outcome.number, 0);
    EXPECT_THAT(outcome.told, ElementsAre(1U));
    EXPECT_EQ(copied(), bytes.substr(0, 1));
}

TEST_F(Copying, IsNotNeededWhereBlocksAreShared)
{
    tests::whileRefusing({{SYS_ioctl, 0, 1, FICLONE, true}},
                         [&] { EXPECT_TRUE(posix::shareContents(from.get(), to.get())); });
    tests::whileRefusing({tests::noReflinks()}, [&] { EXPECT_FALSE(posix::shareContents(from.get(), to.get())); });
}

TEST_F(Copying, GoesOnInAnotherWayWhereOneIsRefusedMidway)
{
    ASSERT_EQ(::ftruncate(from.get(), 40 * kMebibyte), 0);
    int calls = 0;
    tests::systemCalls().copying = [&](std::size_t) -> std::optional<ssize_t> {
        if (++calls == 1)
            return std::nullopt;
        errno = EXDEV;
        return -1;
    };
    EXPECT_EQ(copy(40 * kMebibyte, {kNoSending}).number, 0);
    EXPECT_EQ(calls, 2) << "what is refused once is not asked for again";
    EXPECT_EQ(copied(), contentsOf(source));
}

TEST_F(Copying, GoesOnBehindASignal)
{
    int calls = 0;
    tests::systemCalls().copying = [&](std::size_t) -> std::optional<ssize_t> {
        if (++calls > 2)
            return std::nullopt;
        errno = EINTR;
        return -1;
    };
    EXPECT_EQ(copy(bytes.size(), {{SYS_sendfile, EIO}}).number, 0) << "in the same way";
    EXPECT_EQ(calls, 3);
    EXPECT_EQ(copied(), bytes);
}

TEST_F(Copying, ByHandGoesOnBehindASignalAndBehindPartsThatAreTooSmall)
{
    int calls = 0;
    tests::systemCalls().writing = [&](std::size_t count) -> std::optional<ssize_t> {
        if (++calls % 2 == 0)
            return static_cast<ssize_t>(count / 2 + 1);
        errno = EINTR;
        return -1;
    };
    EXPECT_EQ(copy(bytes.size(), {kNoCopies, kNoSending}).number, 0);
    EXPECT_EQ(copied(), bytes);
}

TEST_F(Copying, ByHandEndsWithTheDisksOwnError)
{
    tests::systemCalls().writing = [](std::size_t) -> std::optional<ssize_t> {
        errno = ENOSPC;
        return -1;
    };
    EXPECT_EQ(copy(bytes.size(), {kNoCopies, kNoSending}).number, ENOSPC);
    // Also when the last way is refused.
    EXPECT_EQ(copy(bytes.size(), {kNoCopies, kNoSending, {SYS_pread64, EINVAL}}).number, EINVAL);
}

TEST_F(Copying, SendsNothingToWhereItCannotGo)
{
    EXPECT_EQ(copy(bytes.size(), {kNoCopies, {SYS_lseek, EIO}}).number, EIO);
    EXPECT_EQ(copied(), "");
}

TEST_F(Copying, StopsWhenItIsToldTo)
{
    ASSERT_EQ(::ftruncate(from.get(), 40 * kMebibyte), 0);
    std::vector<std::uint64_t> told;
    const int number = posix::copyContents(from.get(), to.get(), 40 * kMebibyte, [&](std::uint64_t copied) {
        told.push_back(copied);
        return told.size() < 2;
    });
    EXPECT_EQ(number, ECANCELED);
    EXPECT_THAT(told, ElementsAre(16 * kMebibyte, 32 * kMebibyte));
}

/// What a file system says of a way that it does not know, and the rest of what it can say.
class CopyingWhereTheKernelSays : public Copying, public testing::WithParamInterface<int> {};

using CopyingWhereTheKernelRefusesWith = CopyingWhereTheKernelSays;
using CopyingWhereTheKernelFailsWith = CopyingWhereTheKernelSays;

TEST_P(CopyingWhereTheKernelRefusesWith, IsDoneByHand)
{
    const auto outcome = copy(bytes.size(), {{SYS_copy_file_range, GetParam()}, {SYS_sendfile, GetParam()}});
    EXPECT_EQ(outcome.number, 0);
    EXPECT_EQ(copied(), bytes);
}

TEST_P(CopyingWhereTheKernelFailsWith, EndsWithThat)
{
    EXPECT_EQ(copy(bytes.size(), {{SYS_copy_file_range, GetParam()}}).number, GetParam());
    EXPECT_EQ(copy(bytes.size(), {kNoCopies, {SYS_sendfile, GetParam()}}).number, GetParam());
    EXPECT_EQ(copied(), "");
}

const auto kErrorName = [](const auto& error) { return std::string(::strerrorname_np(error.param)); };

INSTANTIATE_TEST_SUITE_P(Errors, CopyingWhereTheKernelRefusesWith,
                         testing::Values(EXDEV, EINVAL, ENOSYS, EOPNOTSUPP, EPERM, EBADF, ETXTBSY), kErrorName);
INSTANTIATE_TEST_SUITE_P(Errors, CopyingWhereTheKernelFailsWith, testing::Values(ENOSPC, EDQUOT, EIO, EFBIG),
                         kErrorName);

} // namespace
