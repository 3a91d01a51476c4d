// Who of several tracks comes when, with tracks that are made up.
#include "linux/ffmpeg/exporting/output/TrackTurns.h"

#include <gmock/gmock.h>

#include <atomic>
#include <functional>
#include <latch>
#include <memory>
#include <string>
#include <thread>
#include <utility>
#include <vector>

namespace {

using ffmpeg::TrackTurns;
using testing::ElementsAre;

/// Ten packets a second, of `size` bytes.
class TenASecond final : public ffmpeg::TrackSource {
public:
    explicit TenASecond(int count, int size = 1) : m_count(count), m_size(size) {}

    base::Result<void> describe(AVStream&) override { return {}; }
    base::Result<bool> next(AVPacket& packet) override
    {
        if (given == m_count)
            return failure ? base::Result<bool>(failure) : base::Result<bool>(false);
        if (before)
            before(given);
        av_new_packet(&packet, m_size);
        packet.pts = packet.dts = given++;
        return true;
    }

    base::ErrorRef failure; ///< instead of the end
    std::function<void(int)> before;
    std::atomic<int> given = 0;

private:
    int m_count;
    int m_size;
};

std::vector<TrackTurns::Track> tracksOf(const std::vector<TenASecond*>& sources)
{
    std::vector<TrackTurns::Track> tracks;
    for (TenASecond* each : sources)
        tracks.push_back({each, {1, 10}, {1, 1000}});
    return tracks;
}

/// A word for each turn: the track, from when to when in milliseconds, and a point where it has no more.
std::vector<std::string> wordsOf(TrackTurns& turns)
{
    std::vector<std::string> words;
    for (;;) {
        const auto next = turns.next();
        if (!next)
            words.push_back(next.error()->description());
        if (!next || !next.value())
            return words;
        const TrackTurns::Turn& turn = *next.value();
        std::string word(1, static_cast<char>('A' + turn.track));
        if (!turn.packets.empty())
            word += std::to_string(turn.packets.front()->dts) + "-" + std::to_string(turn.packets.back()->dts);
        words.push_back(word + (turn.isLast ? "." : ""));
    }
}

TEST(TrackTurns, GoToTheTrackThatIsFurthestBehind)
{
    TenASecond a(12);
    TenASecond b(7);
    TrackTurns turns(tracksOf({&a, &b}));
    EXPECT_THAT(wordsOf(turns), ElementsAre("A0-400", "B0-400", "A500-900", "B500-600.", "A1000-1100."));
}

/// Asserts the thread that it is on, as every track does.
class Faithful final : public ffmpeg::TrackSource {
public:
    explicit Faithful(base::Result<bool> answer) : m_answer(std::move(answer)) {}

    base::Result<void> describe(AVStream&) override { return {}; }
    base::Result<bool> next(AVPacket&) override
    {
        assertHere();
        return m_answer;
    }

private:
    const base::Result<bool> m_answer;
};

TEST(TrackTurns, HaveTheTracksOnAThreadOfTheirOwnAndGiveThemBack)
{
    Faithful ending(false);
    Faithful failing(base::Error::make("ffmpeg", -1, "broken"));
    EXPECT_TRUE(ending.joints()) << "it is this thread's";
    {
        TrackTurns turns({{&ending, {1, 10}, {1, 1000}}, {&failing, {1, 10}, {1, 1000}}});
        EXPECT_THAT(wordsOf(turns), ElementsAre("A.", "broken"));
    }
    EXPECT_TRUE(ending.joints()) << "it is this thread's again";
    EXPECT_TRUE(failing.joints()) << "also after a failure";
}

TEST(TrackTurns, TellOfATrackWithoutPackets)
{
    TenASecond a(3);
    TenASecond b(0);
    TrackTurns turns(tracksOf({&a, &b}));
    EXPECT_THAT(wordsOf(turns), ElementsAre("B.", "A0-200."));
}

TEST(TrackTurns, EndWithTheErrorOfATrackBehindWhatCameBefore)
{
    TenASecond a(12);
    TenASecond b(7);
    b.failure = base::Error::make("ffmpeg", AVERROR_INVALIDDATA, "broken");
    TrackTurns turns(tracksOf({&a, &b}));
    EXPECT_THAT(wordsOf(turns), ElementsAre("A0-400", "B0-400", "A500-900", "broken"));
}

TEST(TrackTurns, AreGivenOutWhileATrackIsSlow)
{
    TenASecond a(10);
    std::latch gotFirst(1);
    a.before = [&](int number) {
        if (number == 7)
            gotFirst.wait();
    };
    TrackTurns turns(tracksOf({&a}));
    const auto first = turns.next();
    ASSERT_TRUE(first && first.value());
    EXPECT_EQ(first.value()->packets.size(), 5U);
    gotFirst.count_down();
    EXPECT_THAT(wordsOf(turns), ElementsAre("A500-900."));
}

TEST(TrackTurns, AreNotReadFarAheadOfWhoeverWantsThem)
{
    constexpr int kMegabyte = 1 << 20;
    // Twice eight of them, each time a turn of five more, then the turn that waits for room and the packet behind it.
    constexpr int kAhead = 2 * (8 + 5) + 5 + 1;
    TenASecond large(200, kMegabyte);
    TrackTurns turns(tracksOf({&large}));
    int taken = 0;
    for (auto next = turns.next(); next && next.value(); next = turns.next()) {
        for (int i = 0; i < 1000; ++i)
            std::this_thread::yield(); // whoever reads too far has the time for it
        ASSERT_LE(large.given, taken + kAhead);
        taken += static_cast<int>(next.value()->packets.size());
    }
    EXPECT_EQ(taken, 200);
}

TEST(TrackTurns, EndWhereNobodyWantsTheRest)
{
    TenASecond endless(-1, 1 << 20);
    TrackTurns turns(tracksOf({&endless}));
    EXPECT_TRUE(turns.next());
}

} // namespace
