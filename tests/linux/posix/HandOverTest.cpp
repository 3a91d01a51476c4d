#include "linux/posix/HandOver.h"

#include "linux/posix/FileDescriptor.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>

namespace {

constexpr timespec kDate = {1'600'000'000, 123'456'789};

class HandingOver : public ::testing::Test {
protected:
    HandingOver()
    {
        const timespec dates[] = {kDate, kDate};
        ::utimensat(AT_FDCWD, m_movie.c_str(), dates, 0);
    }

    base::Result<posix::HandOverWay> handOver(posix::HandOverWay first = posix::HandOverWay::HardLink,
                                              const posix::CopyProgress& goOn = {})
    {
        const posix::FileDescriptor source(::open(m_movie.c_str(), O_RDONLY | O_CLOEXEC));
        std::vector<posix::HandOverWay> ways;
        for (const auto way : {posix::HandOverWay::HardLink, posix::HandOverWay::Reflink, posix::HandOverWay::Copy})
            if (way >= first)
                ways.push_back(way);
        return posix::handOver(source.get(), m_target.path(), "movie.mp4", goOn, ways);
    }

    static struct stat statusOf(const std::filesystem::path& path)
    {
        struct stat status = {};
        EXPECT_EQ(::lstat(path.c_str(), &status), 0) << path;
        return status;
    }

    /// The bytes, the date, and that the source has but its own name.
    void expectUntouched()
    {
        EXPECT_EQ(tests::PrivateDirectory::read(m_movie), m_bytes);
        EXPECT_EQ(statusOf(m_movie).st_nlink, 1U);
        EXPECT_EQ(statusOf(m_movie).st_mtim.tv_sec, kDate.tv_sec);
        EXPECT_EQ(statusOf(m_movie).st_mtim.tv_nsec, kDate.tv_nsec);
    }

    static std::string pattern(std::size_t size)
    {
        std::string bytes(size, '\0');
        for (std::size_t i = 0; i < size; ++i)
            bytes[i] = static_cast<char>((i * 2654435761U) >> 13);
        return bytes;
    }

    tests::PrivateDirectory m_directory;
    tests::PrivateDirectory m_target;
    std::string m_bytes = pattern(3'000'001);
    std::filesystem::path m_movie = m_directory.write("source.mp4", m_bytes);
    std::filesystem::path m_copy = m_target.path() / "movie.mp4";
};

TEST_F(HandingOver, ACopyHasThePermissionsOfTheMovie)
{
    for (const mode_t mode : {0600U, 0640U, 0644U}) {
        ASSERT_EQ(::chmod(m_movie.c_str(), mode), 0);
        ASSERT_TRUE(handOver(posix::HandOverWay::Copy));
        EXPECT_EQ(statusOf(m_copy).st_mode & ACCESSPERMS, mode);
        std::filesystem::remove(m_copy);
    }
}

TEST_F(HandingOver, CopiesToWhereFilesHaveNoPermissions)
{
    tests::whileRefusing({{SYS_fchmod, EPERM}}, [&] {
        const auto way = handOver(posix::HandOverWay::Copy);
        ASSERT_TRUE(way) << way.error()->description();
    });
    EXPECT_EQ(tests::PrivateDirectory::read(m_copy), m_bytes);
    EXPECT_EQ(statusOf(m_copy).st_mtim.tv_sec, kDate.tv_sec);
}

TEST_F(HandingOver, GivesASecondNameWithinAFileSystem)
{
    const auto way = handOver();
    ASSERT_TRUE(way) << way.error()->description();
    EXPECT_EQ(way.value(), posix::HandOverWay::HardLink);
    EXPECT_EQ(statusOf(m_copy).st_ino, statusOf(m_movie).st_ino);

    std::filesystem::remove(m_copy);
    expectUntouched();
}

TEST_F(HandingOver, CopiesWhereNothingElseWorks)
{
    ASSERT_EQ(handOver(posix::HandOverWay::Copy).value(), posix::HandOverWay::Copy);
    EXPECT_NE(statusOf(m_copy).st_ino, statusOf(m_movie).st_ino);
    EXPECT_EQ(tests::PrivateDirectory::read(m_copy), m_bytes);
    EXPECT_EQ(statusOf(m_copy).st_mtim.tv_sec, kDate.tv_sec) << "the recording's date";
    EXPECT_EQ(statusOf(m_copy).st_mtim.tv_nsec, kDate.tv_nsec);
    EXPECT_EQ(statusOf(m_copy).st_mode & 07777, statusOf(m_movie).st_mode & 07777);
    expectUntouched();

    std::ofstream(m_copy) << "scribble";
    expectUntouched();
}

TEST_F(HandingOver, ReflinksOrCopiesWhenAHardLinkIsNotWanted)
{
    const auto way = handOver(posix::HandOverWay::Reflink);
    ASSERT_TRUE(way);
    EXPECT_NE(way.value(), posix::HandOverWay::HardLink);
    EXPECT_EQ(tests::PrivateDirectory::read(m_copy), m_bytes);
    EXPECT_EQ(statusOf(m_copy).st_mtim.tv_nsec, kDate.tv_nsec);
    expectUntouched();
}

TEST_F(HandingOver, CopiesFromOneFileSystemToAnother)
{
    struct stat shared = {};
    if (::stat("/dev/shm", &shared) != 0 || shared.st_dev == statusOf(m_directory.path()).st_dev)
        return; // one file system is all there is
    for (const bool intoMemory : {true, false}) {
        const tests::PrivateDirectory memory("/dev/shm");
        const auto source = intoMemory ? m_movie : memory.write("source.mp4", m_bytes);
        const auto target = intoMemory ? memory.path() : m_target.path();
        const posix::FileDescriptor file(::open(source.c_str(), O_RDONLY | O_CLOEXEC));
        const auto way = posix::handOver(file.get(), target, "movie.mp4");
        ASSERT_TRUE(way) << way.error()->description();
        EXPECT_EQ(way.value(), posix::HandOverWay::Copy);
        EXPECT_EQ(tests::PrivateDirectory::read(target / "movie.mp4"), m_bytes);
    }
    expectUntouched();
}

TEST_F(HandingOver, TakesASourceThatMayOnlyBeRead)
{
    ::chmod(m_movie.c_str(), 0400);
    ASSERT_TRUE(handOver());
    EXPECT_EQ(tests::PrivateDirectory::read(m_copy), m_bytes);
    std::filesystem::remove(m_copy);
    ASSERT_TRUE(handOver(posix::HandOverWay::Copy));
    EXPECT_EQ(statusOf(m_movie).st_mode & 07777, 0400U);
    expectUntouched();
}

TEST_F(HandingOver, TakesAFileThatHasLostItsName)
{
    const posix::FileDescriptor source(::open(m_movie.c_str(), O_RDONLY | O_CLOEXEC));
    std::filesystem::remove(m_movie);
    const auto way = posix::handOver(source.get(), m_target.path(), "movie.mp4");
    ASSERT_TRUE(way);
    EXPECT_EQ(tests::PrivateDirectory::read(m_copy), m_bytes);
}

TEST_F(HandingOver, LeavesThePositionOfTheDescriptorAlone)
{
    const posix::FileDescriptor source(::open(m_movie.c_str(), O_RDONLY | O_CLOEXEC));
    ASSERT_EQ(::lseek(source.get(), 1000, SEEK_SET), 1000);
    ASSERT_TRUE(posix::handOver(source.get(), m_target.path(), "movie.mp4", {}, {posix::HandOverWay::Copy}));
    EXPECT_EQ(::lseek(source.get(), 0, SEEK_CUR), 1000);
    EXPECT_EQ(tests::PrivateDirectory::read(m_copy), m_bytes);
}

TEST_F(HandingOver, NeverWritesOverWhatIsThere)
{
    m_target.write("movie.mp4", "somebody's");
    for (const auto first : {posix::HandOverWay::HardLink, posix::HandOverWay::Reflink, posix::HandOverWay::Copy}) {
        EXPECT_FALSE(handOver(first));
        EXPECT_EQ(tests::PrivateDirectory::read(m_copy), "somebody's");
    }
    std::filesystem::remove(m_copy);
    const auto precious = m_directory.write("precious", "bytes");
    std::filesystem::create_symlink(precious, m_copy);
    EXPECT_FALSE(handOver(posix::HandOverWay::Copy));
    EXPECT_EQ(tests::PrivateDirectory::read(precious), "bytes");
    expectUntouched();
}

TEST_F(HandingOver, LeavesNothingBehindWhenItIsStopped)
{
    std::uint64_t total = 0;
    const auto way = handOver(posix::HandOverWay::Copy, [&](std::uint64_t, std::uint64_t all) {
        total = all;
        return false;
    });
    ASSERT_FALSE(way);
    EXPECT_EQ(way.error()->code(), ECANCELED);
    EXPECT_EQ(total, m_bytes.size());
    EXPECT_FALSE(std::filesystem::exists(m_copy));
    expectUntouched();
}

TEST_F(HandingOver, SaysWhenItCannot)
{
    const posix::FileDescriptor source(::open(m_movie.c_str(), O_RDONLY | O_CLOEXEC));
    EXPECT_FALSE(posix::handOver(source.get(), m_target.path() / "nowhere", "movie.mp4"));
    EXPECT_FALSE(posix::handOver(-1, m_target.path(), "movie.mp4"));
}

TEST_F(HandingOver, CopiesWhatTheEditorCouldNotReadUnderASecondName)
{
    tests::whileRefusing({{SYS_access, EACCES}}, [&] {
        const auto way = handOver();
        ASSERT_TRUE(way) << way.error()->description();
        EXPECT_NE(way.value(), posix::HandOverWay::HardLink);
    });
    EXPECT_EQ(tests::PrivateDirectory::read(m_copy), m_bytes);
    expectUntouched();
}

TEST_F(HandingOver, SharesTheBlocksWhereFileSystemsCan)
{
    // One that says so is believed; this one has done nothing.
    tests::whileRefusing({{SYS_linkat, EXDEV}, {SYS_ioctl, 0, 1, FICLONE, true}}, [&] {
        EXPECT_EQ(handOver().value(), posix::HandOverWay::Reflink);
        EXPECT_EQ(statusOf(m_copy).st_size, 0);
        std::filesystem::remove(m_copy);
        EXPECT_EQ(handOver(posix::HandOverWay::Copy).value(), posix::HandOverWay::Copy);
    });
    EXPECT_EQ(tests::PrivateDirectory::read(m_copy), m_bytes);
}

TEST_F(HandingOver, SaysWhyACopyCannotBeMade)
{
    const std::pair<tests::RefusedSystemCall, const char*> kFailures[] = {
        {{SYS_copy_file_range, ENOSPC}, "cannot copy the recording"},
        {{SYS_utimensat, EROFS}, "cannot date "},
        {{SYS_openat, EDQUOT, 2, O_CREAT}, "cannot make "}};
    for (const auto& [refused, words] : kFailures)
        tests::whileRefusing({{SYS_linkat, EXDEV}, tests::noReflinks(), refused},
                             [&, error = refused.error, words = words] {
                                 const auto way = handOver();
                                 ASSERT_FALSE(way);
                                 EXPECT_EQ(way.error()->code(), error);
                                 EXPECT_THAT(way.error()->description(), testing::StartsWith(words));
                                 EXPECT_FALSE(std::filesystem::exists(m_copy));
                             });
    const auto stopped = handOver(posix::HandOverWay::Copy, [](std::uint64_t, std::uint64_t) { return false; });
    EXPECT_THAT(stopped.error()->description(), testing::StartsWith("copying the recording was stopped"));
    expectUntouched();
}

} // namespace
