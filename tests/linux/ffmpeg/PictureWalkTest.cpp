#include "linux/ffmpeg/images/PictureWalk.h"
#include "support/CaseName.h"
#include "support/EngineTest.h"

#include <algorithm>
#include <map>
#include <numeric>
#include <ostream>
#include <random>
#include <vector>

namespace {

using ffmpeg::PictureWalk;
using Then = PictureWalk::Then;

/// Of all bytes that are shown.
std::uint64_t hashOf(const AVFrame& picture)
{
    std::uint64_t hash = 14695981039346656037u;
    for (int plane = 0; plane < 3; ++plane) {
        const int shift = plane == 0 ? 0 : 1;
        for (int y = 0; y < picture.height >> shift; ++y)
            for (int x = 0; x < picture.width >> shift; ++x)
                hash = (hash ^ picture.data[plane][std::ptrdiff_t(y) * picture.linesize[plane] + x]) * 1099511628211u;
    }
    return hash;
}

class Walks : public tests::EngineTest, public testing::WithParamInterface<const char*> {
protected:
    struct Whole {
        std::int64_t pts;
        std::uint64_t hash;
        bool operator==(const Whole&) const = default;
        friend std::ostream& operator<<(std::ostream& out, const Whole& whole) { return out << whole.pts; }
    };

    void use(const std::string& name)
    {
        auto file = ffmpeg::OpenFile::open(movie(name));
        opened = ffmpeg::Movie::open(std::move(file).value(), cancelled).value();
    }
    std::unique_ptr<PictureWalk> walk() { return std::move(PictureWalk::open(opened, cancelled)).value(); }
    static Whole wholeOf(const ffmpeg::FrameRef& frame)
    {
        return frame ? Whole{frame->pts(), hashOf(frame->picture())} : Whole{-1, 0};
    }
    /// Every picture, decoded one after the other with nothing left out.
    std::vector<Whole> everyPicture()
    {
        const auto demuxer = std::move(opened->demuxer(cancelled)).value();
        const int stream = opened->video()->stream;
        const auto decoder =
            std::move(ffmpeg::VideoDecoder::open(demuxer->stream(stream), *opened->video(), 1)).value();
        demuxer->select({stream});
        demuxer->seekToStart(stream);
        std::vector<Whole> all;
        const auto takeAll = [&] {
            while (const auto frame = decoder->receive())
                all.push_back(wholeOf(frame));
        };
        for (const auto packet = ffmpeg::newPacket(); demuxer->read(*packet) == 0; takeAll())
            decoder->send(*packet);
        decoder->finish();
        takeAll();
        return all;
    }

    std::shared_ptr<std::atomic<bool>> cancelled = std::make_shared<std::atomic<bool>>(false);
    std::shared_ptr<const ffmpeg::Movie> opened;
};

constexpr const char* kMovies[] = {"refs-recorder.mp4",  "refs-strict.mp4", "refs-deep.mp4",    "refs-temporal.mp4",
                                   "refs-slices.mp4",    "refs-open.mp4",   "refs-forward.mp4", "refs-hevc.mp4",
                                   "refs-hevc-open.mp4", "refs-vp9.webm",   "refs-av1.mp4"};
INSTANTIATE_TEST_SUITE_P(OfManyKinds, Walks, testing::ValuesIn(kMovies),
                         [](const auto& about) { return tests::caseName(about.param); });

TEST_P(Walks, ToSinglePicturesGiveThemBitForBit)
{
    use(GetParam());
    const std::vector<Whole> all = everyPicture();
    ASSERT_GE(all.size(), 75U);
    std::vector<std::size_t> order(all.size());
    std::iota(order.begin(), order.end(), 0);
    std::shuffle(order.begin(), order.end(), std::mt19937(11));
    const auto steady = walk();
    for (const std::size_t i : order) {
        EXPECT_EQ(wholeOf(steady->at(all[i].pts, Then::Rest)), all[i]) << i;
        const std::int64_t until = i + 1 < all.size() ? all[i + 1].pts : all[i].pts + 1;
        EXPECT_EQ(wholeOf(walk()->at(until - 1, Then::Rest)), all[i]) << i << " until the next";
    }
}

TEST_P(Walks, ThatGoOnGiveEachPictureBitForBit)
{
    use(GetParam());
    const std::vector<Whole> all = everyPicture();
    std::mt19937 random(3);
    for (int turn = 0; turn < 12; ++turn) {
        const auto forward = walk();
        if (turn % 4 == 3)
            forward->setThreads(2);
        for (std::size_t i = random() % 5; i < all.size(); i += 1 + random() % (turn % 3 == 0 ? 3 : 20)) {
            const Then then = random() % 3 == 0 ? Then::Rest : Then::GoOn;
            ASSERT_EQ(wholeOf(forward->at(all[i].pts, then)), all[i]) << i << " in turn " << turn;
        }
    }
}

TEST_F(Walks, ToAKeyframeDecodeNothingElse)
{
    use("refs-recorder.mp4");
    const std::vector<Whole> all = everyPicture();
    const auto resting = walk();
    EXPECT_EQ(wholeOf(resting->at(all[50].pts, Then::Rest)), all[50]);
    EXPECT_EQ(resting->decodedCount(), 1);
}

TEST_F(Walks, LeaveOutWhatOnlyItsNeighboursReferTo)
{
    use("refs-recorder.mp4");
    const std::vector<Whole> all = everyPicture();
    const auto resting = walk();
    EXPECT_EQ(wholeOf(resting->at(all[48].pts, Then::Rest)), all[48]);
    EXPECT_LE(resting->decodedCount(), 1 + 8 + 2) << "the keyframe, a third of the others, and those beside the last";
    const auto second = walk();
    EXPECT_EQ(wholeOf(second->at(all[47].pts, Then::Rest)), all[47]);
    EXPECT_LE(second->decodedCount(), 1 + 8 + 2);
}

TEST_F(Walks, ThatGoOnDoNotDecodeTwice)
{
    use("refs-recorder.mp4");
    const std::vector<Whole> all = everyPicture();
    const auto forward = walk();
    for (const Whole& each : all)
        ASSERT_EQ(wholeOf(forward->at(each.pts, Then::GoOn)), each);
    EXPECT_LE(forward->decodedCount(), 75);
}

TEST_F(Walks, KeepGoingBackToAGroupCheapWhenMuchOfItWasDecoded)
{
    use("long-gop.mp4");
    const auto resting = walk();
    ASSERT_TRUE(resting->at(500 * 256, Then::Rest));
    const auto once = resting->decodedCount();
    ASSERT_TRUE(resting->at(510 * 256, Then::Rest));
    EXPECT_LE(resting->decodedCount(), once + 20);
}

} // namespace
