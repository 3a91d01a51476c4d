#include "linux/ffmpeg/FFmpegAsset.h"
#include "support/EngineTest.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"

#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <unistd.h>
#include <utility>
#include <vector>

namespace {

using namespace std::chrono_literals;

std::string bytesOf(const std::string& path)
{
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

std::uint32_t wordAt(const std::string& bytes, std::size_t at)
{
    std::uint32_t number = 0;
    for (std::size_t i = 0; i < 4; ++i)
        number = number << 8 | static_cast<unsigned char>(bytes.at(at + i));
    return number;
}

/// Overwrites the words of the movie's first table of that name, from its `first` word on, each `step` words.
void lieIn(std::string& bytes, const char* table, std::size_t first, std::size_t step, std::uint32_t lie)
{
    const std::size_t name = bytes.find(table);
    ASSERT_NE(name, std::string::npos) << table;
    const std::size_t end = name - 4 + wordAt(bytes, name - 4);
    for (std::size_t at = name + 4 + 4 * first; at + 4 <= end; at += 4 * step)
        for (std::size_t i = 0; i < 4; ++i)
            bytes.at(at + i) = static_cast<char>(lie >> (24 - 8 * i));
}

/// Opened, sought and played: whatever comes of it, it comes soon, and the player is still in order.
class Robustness : public tests::EngineTest {
protected:
    void TearDown() override { std::filesystem::remove(path); }

    void write(const std::string& bytes) { std::ofstream(path, std::ios::binary) << bytes; }
    void use(const std::string& file)
    {
        if (open(file) != Status::ReadyToPlay) {
            EXPECT_TRUE(item->error());
            return;
        }
        ASSERT_TRUE(item->duration().isNumeric());
        const double length = item->duration().seconds();
        for (const double part : {0.9, 0.2, 1.0, 0.5}) {
            player->seekToTime(at(std::min(length, 1e6) * part));
            ASSERT_TRUE(waitFor([&] { return player->isSettled(); })) << file;
        }
        player->play();
        ASSERT_TRUE(waitFor([&] { return player->isRunning() || !player->isPlaying(); }));
        playOn(300ms, 50ms);
    }

    const std::string path = testing::TempDir() + "broken-" + std::to_string(getpid());
};

TEST_F(Robustness, ATruncatedMovieShowsWhatIsThere)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(asset->cutOff(), std::nullopt);
    ASSERT_EQ(open(movie("truncated.mp4")), Status::ReadyToPlay);
    ASSERT_TRUE(asset->cutOff());
    EXPECT_EQ(asset->cutOff()->secondsBefore, 4.0);
    EXPECT_LT(asset->cutOff()->seconds, 4);
    EXPECT_EQ(numberAt(at(1)), 30);
    const int last = numberAt(at(3.9));
    EXPECT_GT(last, 40);
    EXPECT_LT(last, 80);
    EXPECT_EQ(numberAt(at(1)), 30);
    use(movie("truncated.mp4"));
}

TEST_F(Robustness, AMovieWithSomethingBehindItIsWhole)
{
    const tests::PrivateDirectory directory;
    const std::string longer = directory.path() / "with-junk.mp4";
    std::ofstream(longer, std::ios::binary) << bytesOf(movie("clock.mp4")) << "AAAAjunk that a device put there";
    ASSERT_EQ(open(longer), Status::ReadyToPlay);
    EXPECT_EQ(asset->cutOff(), std::nullopt);
    EXPECT_EQ(asset->duration().seconds(), 4);
    std::filesystem::remove(longer);
}

TEST_F(Robustness, ADiskThatFailsAtTheHeaderOrTheFirstPictureIsWhatIsToldOf)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    const auto opened = std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie();
    const auto cancelled = std::make_shared<std::atomic<bool>>(false);
    const auto first = static_cast<std::uint32_t>(opened->packetIndex(cancelled)->packets().front().position);
    const tests::RefusedSystemCall picture{SYS_pread64, EIO, 3, first, true};
    const tests::RefusedSystemCall header{SYS_pread64, EIO, 0, 0, false, 3, 64 << 10}; // which comes last
    ASSERT_GT(bytesOf(movie("clock.mp4")).find("moov"), 64U << 10);
    for (const auto& each : {header, picture}) {
        std::string words;
        tests::whileRefusing({each}, [&] {
            auto file = std::move(ffmpeg::OpenFile::open(movie("clock.mp4"))).value();
            const auto result = ffmpeg::Movie::open(std::move(file), cancelled);
            words = result ? "it opens" : result.error()->description();
        });
        EXPECT_EQ(words, "“clock.mp4” is not a movie that can be opened: the disk or the network has an error.");
    }
}

TEST_F(Robustness, ATruncatedMoviePlaysToTheEndOfWhatIsThere)
{
    ASSERT_EQ(open(movie("truncated.mp4")), Status::ReadyToPlay);
    player->seekToTime(at(1));
    player->play();
    playOn(3100ms, 50ms);
    EXPECT_FALSE(player->isPlaying());
    EXPECT_EQ(player->currentTime(), item->duration());
    EXPECT_LT(item->duration().seconds(), 3);
    EXPECT_TRUE(waitFor([&] { return player->isSettled(); }));
    EXPECT_GT(tests::numberIn(player->currentFrame()), 40);
}

TEST_F(Robustness, NothingIsToDoWhilePausedAndSettled)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    int calls = 0;
    const auto token = player->addPeriodicTimeObserver(at(0.1), [&](MediaTime) { ++calls; });
    player->play();
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    playOn(200ms);
    player->pause();
    ASSERT_TRUE(waitFor([&] { return player->isSettled(); }));
    clock.advance(1h); // what was left from playing
    mainQueue.drain();
    const int before = calls;
    clock.advance(1h);
    EXPECT_EQ(mainQueue.runDue(), 0u);
    EXPECT_FALSE(mainQueue.untilNext());
    EXPECT_EQ(calls, before);
}

TEST_F(Robustness, DamagedPacketsDoNotStopAMovie)
{
    ASSERT_EQ(open(movie("corrupt.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(numberAt(at(0.5)), 15);
    player->seekToTime(at(2));
    ASSERT_TRUE(waitFor([&] { return player->isSettled(); }));
    player->seekToTime(at(3.9));
    ASSERT_TRUE(waitFor([&] { return player->isSettled(); }));
    EXPECT_NE(player->currentFrame(), nullptr);
    use(movie("corrupt.mp4"));
}

TEST_F(Robustness, AnUnknownCodecFailsInWords)
{
    std::string bytes = bytesOf(movie("no-sound.mp4"));
    const auto where = bytes.find("avc1", bytes.find("stsd"));
    ASSERT_NE(where, std::string::npos);
    bytes.replace(where, 4, "zzzz");
    write(bytes);
    EXPECT_EQ(open(path), Status::Failed);
    EXPECT_NE(item->error()->description().find("cannot be decoded"), std::string::npos)
        << item->error()->description();
}

TEST_F(Robustness, AnIndexThatLiesDoesNoHarm)
{
    // Words are counted from the table's flags: entries follow the flags and their count, sizes one word later.
    for (const auto& [table, first] : std::vector<std::pair<const char*, std::size_t>>{
             {"stsz", 1}, {"stsz", 2}, {"stsz", 3}, {"stco", 1}, {"stco", 2}, {"stsc", 2}, {"stts", 1}, {"stts", 2}})
        for (const std::uint32_t lie : {0u, 1u, 0x00ffffffu, 0x7fffffffu, 0xfffffff0u}) {
            std::string bytes = bytesOf(movie("no-sound.mp4"));
            ASSERT_NO_FATAL_FAILURE(lieIn(bytes, table, first, 1, lie));
            write(bytes);
            use(path);
            ASSERT_FALSE(HasFatalFailure()) << table << " from " << first << " is " << lie;
        }
}

TEST_F(Robustness, AMovieWhosePicturesTakeNoTimeIsOverAtOnce)
{
    std::string bytes = bytesOf(movie("no-sound.mp4"));
    ASSERT_NO_FATAL_FAILURE(lieIn(bytes, "stts", 3, 2, 0));
    write(bytes);
    use(path);
    if (item->status() != Status::ReadyToPlay)
        return;
    player->seekToTime(at(5));
    EXPECT_LE(player->currentTime(), item->duration());
    player->seekToTime(at(-5));
    EXPECT_EQ(player->currentTime().seconds(), 0);
}

TEST_F(Robustness, FilesCutAnywhereDoNoHarm)
{
    for (const auto* name : {"clock.mp4", "vfr.mkv", "vp9.webm", "size-change.ts"}) {
        const std::string whole = bytesOf(movie(name));
        for (const double part : {0.001, 0.01, 0.1, 0.35, 0.6, 0.97}) {
            write(whole.substr(0, static_cast<std::size_t>(static_cast<double>(whole.size()) * part)));
            use(path);
            ASSERT_FALSE(HasFatalFailure()) << name << " cut at " << part;
        }
    }
}

TEST_F(Robustness, FlippedBytesDoNoHarm)
{
    std::mt19937 random(20);
    for (const auto* name : {"clock.mp4", "edit-list.mp4", "vfr.mkv", "vp9.webm", "size-change.ts", "truncated.mp4"}) {
        const std::string whole = bytesOf(movie(name));
        for (int round = 0; round < 6; ++round) {
            std::string bytes = whole;
            // The header is where lies are told: at the front or at the back.
            const std::size_t span = round % 3 == 0 ? bytes.size() : std::min<std::size_t>(bytes.size(), 6000);
            const std::size_t from = round % 3 == 1 ? bytes.size() - span : 0;
            for (int i = 0; i < 40; ++i)
                bytes[from + random() % span] = static_cast<char>(random());
            write(bytes);
            use(path);
            ASSERT_FALSE(HasFatalFailure()) << name << " round " << round;
        }
    }
}

TEST_F(Robustness, AFileThatIsEmptiedWhileItPlaysDoesNoHarm)
{
    std::filesystem::copy_file(movie("long-gop.mp4"), path);
    ASSERT_EQ(open(path), Status::ReadyToPlay);
    player->play();
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    playOn(100ms);
    std::filesystem::resize_file(path, 1000);
    player->seekToTime(at(15));
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    playOn(100ms);
    player->pause();
    player->seekToTime(at(1));
    EXPECT_TRUE(waitFor([&] { return player->isSettled(); }));
}

TEST_F(Robustness, AFileThatIsRemovedWhileItPlaysPlaysOn)
{
    std::filesystem::copy_file(movie("long-gop.mp4"), path);
    ASSERT_EQ(open(path), Status::ReadyToPlay);
    player->play();
    ASSERT_TRUE(waitFor([&] { return player->isRunning(); }));
    std::filesystem::remove(path);
    playOn(200ms);
    // Waited for: a picture can be queued, and the player not told of it yet.
    EXPECT_TRUE(waitFor([&] { return tests::numberIn(player->currentFrame()) == 12; }));
    player->pause();
    EXPECT_EQ(numberAt(MediaTime::make(900, 60)), 900);
}

} // namespace
