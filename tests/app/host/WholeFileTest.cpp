// Files that appear whole, or not at all, and replace others only when they are told to.
#include "app/host/WholeFile.h"

#include "support/Names.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <sys/stat.h>

namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::StartsWith;

using tests::namesIn;
using tests::PrivateDirectory;
using tests::RefusedSystemCall;

namespace fs = std::filesystem;

constexpr fs::perms kOpen = fs::perms(0644);

class AWholeFile : public testing::Test {
protected:
    /// The code of the error, on a thread where `refused` are refused; 0 when the file is there.
    std::int64_t write(bool replaces, const std::vector<RefusedSystemCall>& refused = {}, fs::perms permissions = kOpen)
    {
        std::int64_t code = -1;
        tests::whileRefusing(refused, [&] {
            const auto written = host::writeWholeFile(m_path, m_bytes, replaces, permissions);
            code = written ? 0 : written.error()->code();
            if (!written) {
                EXPECT_THAT(written.error()->description(), StartsWith("cannot write " + m_path.native()));
            }
        });
        return code;
    }
    bool isNew() const
    {
        const std::string found = PrivateDirectory::read(m_path);
        return std::vector<std::uint8_t>(found.begin(), found.end()) == m_bytes;
    }

    PrivateDirectory m_directory;
    const fs::path m_path = m_directory.path() / "picture.png";
    const std::vector<std::uint8_t> m_bytes = [] {
        std::vector<std::uint8_t> bytes(3'000'001);
        for (std::size_t i = 0; i < bytes.size(); ++i)
            bytes[i] = static_cast<std::uint8_t>((i * 2654435761U) >> 13U);
        return bytes;
    }();
    static constexpr RefusedSystemCall kNoFlags{SYS_renameat2, EINVAL};
};

TEST_F(AWholeFile, HoldsAllOfItsBytes)
{
    EXPECT_EQ(write(false), 0);
    EXPECT_TRUE(isNew());
    EXPECT_THAT(namesIn(m_directory.path()), ElementsAre("picture.png"));
}

TEST_F(AWholeFile, MayBeEmpty)
{
    EXPECT_TRUE(host::writeWholeFile(m_path, {}, false, kOpen));
    EXPECT_EQ(fs::file_size(m_path), 0U);
}

TEST_F(AWholeFile, IsReadByThoseWhoMayReadWhatItWasMadeFrom)
{
    const mode_t before = ::umask(022);
    const std::pair<unsigned, unsigned> kModes[] = {{0600, 0600}, {0640, 0640}, {0777, 0644}, {0, 0600}, {0444, 0644}};
    for (const auto& [given, made] : kModes) {
        EXPECT_EQ(write(true, {}, fs::perms(given)), 0);
        EXPECT_EQ(fs::status(m_path).permissions(), fs::perms(made)) << given;
        fs::remove(m_path);
    }
    ::umask(before);
}

TEST_F(AWholeFile, ReplacesAnotherWhenItIsToldTo)
{
    m_directory.write("picture.png", "old");
    EXPECT_EQ(write(true), 0);
    EXPECT_TRUE(isNew());
    EXPECT_THAT(namesIn(m_directory.path()), ElementsAre("picture.png"));
}

TEST_F(AWholeFile, ReplacesNothingElseAndLeavesNothingBesideIt)
{
    m_directory.write("picture.png", "old");
    for (const auto& refused : {std::vector<RefusedSystemCall>{}, {kNoFlags}}) {
        EXPECT_EQ(write(false, refused), EEXIST);
        EXPECT_EQ(PrivateDirectory::read(m_path), "old");
        EXPECT_THAT(namesIn(m_directory.path()), ElementsAre("picture.png"));
    }
}

TEST_F(AWholeFile, GetsItsNameWhereRenamingKnowsNoFlags)
{
    EXPECT_EQ(write(false, {kNoFlags}), 0);
    EXPECT_TRUE(isNew());
    EXPECT_THAT(namesIn(m_directory.path()), ElementsAre("picture.png"));
    EXPECT_EQ(fs::hard_link_count(m_path), 1U);
}

TEST_F(AWholeFile, IsNotThereWhenTheDiskIsFull)
{
    m_directory.write("picture.png", "old");
    for (const bool replaces : {false, true}) {
        EXPECT_EQ(write(replaces, {{SYS_write, ENOSPC}}), ENOSPC);
        EXPECT_EQ(PrivateDirectory::read(m_path), "old");
        EXPECT_THAT(namesIn(m_directory.path()), ElementsAre("picture.png"));
    }
}

TEST_F(AWholeFile, IsNotThereWhenItGetsNoName)
{
    EXPECT_EQ(write(true, {{SYS_rename, EROFS}}), EROFS);
    EXPECT_EQ(write(false, {{SYS_renameat2, EROFS}}), EROFS);
    EXPECT_EQ(write(false, {kNoFlags, {SYS_link, EDQUOT}}), EDQUOT);
    EXPECT_THAT(namesIn(m_directory.path()), IsEmpty());
}

TEST_F(AWholeFile, NeedsAPlace)
{
    EXPECT_FALSE(host::writeWholeFile(m_directory.path() / "none/picture.png", m_bytes, false, kOpen));
    m_directory.write(".picture.png." + std::to_string(::getpid()), "somebody's");
    EXPECT_EQ(write(true), EEXIST);
    EXPECT_EQ(PrivateDirectory::read(m_directory.path() / (".picture.png." + std::to_string(::getpid()))),
              "somebody's");
}

} // namespace
