// Movies in containers of every kind: whoever goes to a place finds there what stands there for who came from the start.
#include "linux/ffmpeg/SoundMixer.h"
#include "linux/ffmpeg/VideoSource.h"
#include "linux/ffmpeg/exporting/sound/TrackPackets.h"
#include "linux/ffmpeg/images/PictureWalk.h"
#include "support/CaseName.h"
#include "support/EngineTest.h"
#include "support/RefusedSystemCalls.h"

#include <algorithm>
#include <cmath>
#include <fstream>
#include <random>
#include <vector>

namespace {

using ffmpeg::SoundMixer;
using ffmpeg::VideoSource;

constexpr int kRate = 48000;

class Places : public tests::EngineTest {
protected:
    struct Shown {
        std::int64_t pts;
        int number;
    };

    void use(const std::string& name)
    {
        auto file = ffmpeg::OpenFile::open(movie("export/" + name));
        auto result = ffmpeg::Movie::open(std::move(file).value(), cancelled);
        ASSERT_TRUE(result) << result.error()->description();
        opened = result.value();
    }
    /// All pictures in one go from the start, by a reader that was never moved.
    std::vector<Shown> everyPicture()
    {
        const auto demuxer = std::move(ffmpeg::Demuxer::open(opened->file(), cancelled)).value();
        const int stream = opened->video()->stream;
        const auto decoder =
            std::move(ffmpeg::VideoDecoder::open(demuxer->stream(stream), *opened->video(), 1)).value();
        demuxer->select({stream});
        std::vector<Shown> all;
        const auto takeAll = [&] {
            while (const auto frame = decoder->receive())
                all.push_back({frame->pts(), tests::numberIn(frame)});
        };
        for (const auto packet = ffmpeg::newPacket(); demuxer->read(*packet) == 0; takeAll())
            decoder->send(*packet);
        decoder->finish();
        takeAll();
        return all;
    }
    template <typename Item> static std::vector<Item> shuffled(std::vector<Item> all)
    {
        std::shuffle(all.begin(), all.end(), std::mt19937(7));
        all.resize(std::min<std::size_t>(all.size(), 24));
        return all;
    }
    /// What tells one packet from the others, with its times.
    struct Read {
        std::int64_t pts, dts, position;
        std::vector<std::uint8_t> bytes;
        /// Where pictures are reordered, some formats do not know at once when they are decoded.
        bool operator==(const Read& other) const
        {
            const bool isTimed = dts != AV_NOPTS_VALUE && other.dts != AV_NOPTS_VALUE;
            return pts == other.pts && (dts == other.dts || !isTimed) && position == other.position
                   && bytes == other.bytes;
        }
    };
    std::unique_ptr<ffmpeg::Demuxer> picturesOnly() const
    {
        auto demuxer = std::move(ffmpeg::Demuxer::open(opened->file(), cancelled)).value();
        demuxer->select({opened->video()->stream});
        return demuxer;
    }
    /// What comes next, as many as there are.
    static std::vector<Read> read(ffmpeg::Demuxer& demuxer, std::size_t atMost)
    {
        std::vector<Read> all;
        const auto packet = ffmpeg::newPacket();
        while (all.size() < atMost && demuxer.read(*packet) == 0)
            all.push_back({packet->pts, packet->dts, packet->pos, {packet->data, packet->data + packet->size}});
        return all;
    }
    static std::vector<float> mix(SoundMixer& from, double seconds)
    {
        std::vector<float> samples(static_cast<std::size_t>(seconds * kRate) * 2);
        from.mix(samples.data(), samples.size() / 2);
        return samples;
    }
    /// What is left of the power of `part` when what is heard so much earlier in `all` than at `frame` is taken away.
    static double differenceOf(const std::vector<float>& part, const std::vector<float>& all, int frame, int late)
    {
        double power = 0;
        double difference = 0;
        constexpr std::size_t kStep = 12; // the noise has nothing above 2.5 kHz
        for (std::size_t i = 0; i < part.size(); i += kStep) {
            const std::int64_t at = (std::int64_t{frame} - late) * 2 + std::int64_t(i);
            const float expected = at < 0 ? 0 : all[std::size_t(at)];
            power += double(expected) * double(expected);
            difference += std::pow(double(part[i]) - double(expected), 2);
        }
        return difference / power;
    }
    /// By how many pairs of samples `part` is late.
    static int latenessOf(const std::vector<float>& part, const std::vector<float>& all, int frame)
    {
        constexpr int kFarthest = kRate / 200;
        int best = 0;
        for (int late = -kFarthest; late <= kFarthest; ++late)
            if (differenceOf(part, all, frame, late) < differenceOf(part, all, frame, best))
                best = late;
        return best;
    }
    /// All that this process ever read, in bytes.
    static std::int64_t bytesRead()
    {
        std::ifstream about("/proc/self/io");
        std::string name;
        std::int64_t count = 0;
        about >> name >> count;
        EXPECT_EQ(name, "rchar:");
        return count;
    }

    std::shared_ptr<std::atomic<bool>> cancelled = std::make_shared<std::atomic<bool>>(false);
    std::shared_ptr<const ffmpeg::Movie> opened;
};

class PlacesIn : public Places, public testing::WithParamInterface<const char*> {};

INSTANTIATE_TEST_SUITE_P(ContainersOfEveryKind, PlacesIn,
                         testing::Values("h264.avi", "mpeg4.avi", "wmv.asf", "h264.flv", "mpeg2.mpg", "h264.nut",
                                         "theora.ogv", "h264.ts", "vp8-one-group.webm", "vp8-live.webm",
                                         "h264-one-group.mkv", "h264-live.mkv", "h264-live-one-group.mkv",
                                         "many-bytes.mkv", "sound.mkv", "sound-fragmented.mp4"),
                         [](const auto& about) { return tests::caseName(about.param); });

TEST_P(PlacesIn, HaveTheirPictureInThePlayerWhereverOneComesFrom)
{
    ASSERT_NO_FATAL_FAILURE(use(GetParam()));
    const auto all = everyPicture();
    ASSERT_GE(all.size(), 100u);
    for (std::size_t i = 1; i < all.size(); ++i)
        ASSERT_EQ(all[i].number, all[i - 1].number + 1);
    const auto source = std::move(VideoSource::open(opened, cancelled, 1)).value();
    for (const Shown& each : shuffled(all)) {
        const auto shown = source->at(each.pts, VideoSource::Want::Full, [] { return false; });
        ASSERT_TRUE(shown) << each.number;
        EXPECT_EQ(tests::numberIn(shown->frame), each.number);
        EXPECT_EQ(shown->frame->pts(), each.pts);
    }
}

TEST_P(PlacesIn, HaveTheirThumbnailWhereverOneComesFrom)
{
    ASSERT_NO_FATAL_FAILURE(use(GetParam()));
    const auto all = everyPicture();
    const auto walk = std::move(ffmpeg::PictureWalk::open(opened, cancelled)).value();
    for (const Shown& each : shuffled(all)) {
        const auto frame = walk->at(each.pts, ffmpeg::PictureWalk::Then::Rest);
        ASSERT_TRUE(frame) << each.number;
        EXPECT_EQ(tests::numberIn(frame), each.number);
    }
}

TEST_P(PlacesIn, HaveTheirSoundWhereverOneComesFrom)
{
    ASSERT_NO_FATAL_FAILURE(use(GetParam()));
    const auto from = std::move(SoundMixer::open(opened, cancelled)).value();
    const auto all = mix(*from, 3);
    for (const int frame : {96000, 24000, 110001, 60000, 0, 130000, 1}) {
        from->seek(frame);
        const auto part = mix(*from, 0.1);
        // Containers round times to milliseconds.
        const int late = latenessOf(part, all, frame);
        EXPECT_LE(std::abs(late), kRate / 1000) << "at " << frame;
        EXPECT_LT(differenceOf(part, all, frame, late), 0.05) << "at " << frame;
    }
}

TEST_P(PlacesIn, HaveThePacketsThatComeThereFromTheStart)
{
    ASSERT_NO_FATAL_FAILURE(use(GetParam()));
    const auto all = read(*picturesOnly(), 1000);
    const auto index = opened->packetIndex(cancelled);
    ASSERT_EQ(all.size(), index->packets().size());
    const auto demuxer = picturesOnly();
    for (const auto& wanted : shuffled(index->packets())) {
        const auto isWanted = [&](const Read& each) {
            return each.position == wanted.position && (each.pts == wanted.pts || each.dts == wanted.pts)
                   && each.bytes.size() == std::size_t(wanted.size);
        };
        const auto from = std::find_if(all.begin(), all.end(), isWanted);
        ASSERT_NE(from, all.end());
        ASSERT_TRUE(demuxer->seekTo(opened->video()->stream, wanted)) << wanted.pts;
        const auto some = read(*demuxer, 20);
        ASSERT_EQ(some.size(), std::min<std::size_t>(20, std::size_t(all.end() - from)));
        EXPECT_TRUE(std::equal(some.begin(), some.end(), from)) << wanted.pts;
    }
}

TEST_P(PlacesIn, AreGoneToWithoutComingFromTheStart)
{
    ASSERT_NO_FATAL_FAILURE(use(GetParam()));
    auto keyframes = opened->packetIndex(cancelled)->packets();
    std::erase_if(keyframes, [](const auto& each) { return !each.isKey; });
    const auto demuxer = picturesOnly();
    const std::int64_t before = bytesRead();
    for (const auto& wanted : shuffled(keyframes))
        EXPECT_TRUE(demuxer->seekTo(opened->video()->stream, wanted));
    // A program stream has no marks where its pictures begin, which is found out from one before.
    const std::int64_t size = opened->file()->size();
    const std::int64_t most = std::string(GetParam()) == "mpeg2.mpg" ? size : std::max<std::int64_t>(size / 2, 80'000);
    EXPECT_LT(bytesRead() - before, std::int64_t(keyframes.size()) * most);
}

TEST_F(Places, InAMovieWithATableAreFoundWithoutReadingOnToItsEnd)
{
    ASSERT_NO_FATAL_FAILURE(use("many-bytes.mkv"));
    const std::int64_t size = opened->file()->size();
    ASSERT_GT(size, 4'000'000);
    const auto sound = std::move(SoundMixer::open(opened, cancelled)).value();
    for (const double seconds : {2.1, 1.2, 3.3, 0.4}) {
        const std::int64_t before = bytesRead();
        sound->seek(std::int64_t(seconds * kRate));
        mix(*sound, 0.1);
        EXPECT_LT(bytesRead() - before, size * 45 / 100) << "the sound at " << seconds;
    }
    const auto source = std::move(VideoSource::open(opened, cancelled, 1)).value();
    for (const double seconds : {2.01, 1.01, 3.01}) {
        const std::int64_t before = bytesRead();
        ASSERT_TRUE(source->at(std::int64_t(seconds * 1000), VideoSource::Want::Full, [] { return false; }));
        EXPECT_LT(bytesRead() - before, size * 35 / 100) << "the picture at " << seconds;
    }
}

TEST_F(Places, AtAPicturesPlaceHaveSoundThatBeginsShortlyBefore)
{
    ASSERT_NO_FATAL_FAILURE(use("many-bytes.mkv"));
    const auto packets =
        std::move(ffmpeg::TrackPackets::open(opened, opened->audioStreams().front(), cancelled)).value();
    const auto packet = ffmpeg::newPacket();
    for (const double seconds : {2.0, 3.0, 2.02}) {
        packets->seek(seconds);
        ASSERT_EQ(packets->read(*packet), 0);
        const double begins = double(packet->pts) * av_q2d(packets->stream().time_base);
        EXPECT_LE(begins, seconds);
        EXPECT_GT(begins, seconds - 1.5) << "not from the start";
    }
}

TEST_F(Places, AreFoundByATableOnlyWhereThereIsOne)
{
    for (const auto* name : {"vp8-one-group.webm", "vp8-live.webm", "h264-live.mkv", "h264-recorded.mkv"}) {
        ASSERT_NO_FATAL_FAILURE(use(name));
        EXPECT_FALSE(opened->hasTable(cancelled)) << name;
    }
    for (const auto* name : {"many-bytes.mkv", "vp9.webm", "h264.mp4"}) {
        ASSERT_NO_FATAL_FAILURE(use(name));
        EXPECT_TRUE(opened->hasTable(cancelled)) << name;
    }
}

TEST_F(Places, AreStillFoundWhereStartingOverFailedForAMoment)
{
    ASSERT_NO_FATAL_FAILURE(use("h264.ts"));
    const auto all = read(*picturesOnly(), 1000);
    const auto index = opened->packetIndex(cancelled);
    const auto demuxer = picturesOnly();
    ASSERT_EQ(read(*demuxer, 2).size(), 2U);
    demuxer->detach();
    tests::whileRefusing({{SYS_pread64, EIO}}, [&] {
        EXPECT_FALSE(demuxer->seekToStart(0));
        demuxer->detach();
    });
    EXPECT_EQ(read(*demuxer, 1).size(), 0U) << "it stands nowhere";
    const std::int64_t last = std::prev(all.end(), 15)->pts;
    ASSERT_TRUE(demuxer->seekTo(opened->video()->stream, *index->keyframeAt(last)));
    const auto rest = read(*demuxer, 1000);
    ASSERT_LT(rest.size(), 40U);
    EXPECT_TRUE(std::equal(rest.begin(), rest.end(), all.end() - std::ssize(rest)));
}

TEST_F(Places, ThatCannotBeReadAreNotTakenForTheEnd)
{
    for (const auto* name : {"h264.ts", "h264.avi", "h264.nut", "many-bytes.mkv"}) {
        ASSERT_NO_FATAL_FAILURE(use(name));
        const auto demuxer = picturesOnly();
        const auto first = opened->packetIndex(cancelled)->packets().front();
        int error = 0;
        const tests::RefusedSystemCall secondBuffer{SYS_pread64, EIO, 0, 0, false, 3, 64 << 10};
        demuxer->detach();
        tests::whileRefusing({secondBuffer}, [&] {
            // Opening may have read all of it: from the start again.
            demuxer->seekTo(opened->video()->stream, first);
            const auto packet = ffmpeg::newPacket();
            while ((error = demuxer->read(*packet)) == 0) {}
            demuxer->detach();
        });
        EXPECT_EQ(error, AVERROR(EIO)) << name;
        EXPECT_EQ(demuxer->readError(), AVERROR(EIO)) << name;
    }
}

TEST_F(Places, ThatWereReadOfAMovieWithoutATableAreKnownFromThenOn)
{
    ASSERT_NO_FATAL_FAILURE(use("vp8-live.webm"));
    const auto demuxer = picturesOnly();
    const auto all = read(*demuxer, 1000);
    ASSERT_TRUE(demuxer->seekToStart(0));
    EXPECT_EQ(read(*demuxer, 1).front(), all.front());
    ASSERT_TRUE(demuxer->seek(0, all[65].pts));
    EXPECT_EQ(read(*demuxer, 1).front(), all[60]);
}

TEST_F(Places, InAMovieWithoutATableAreFoundWithoutReadingAllBeforeThem)
{
    ASSERT_NO_FATAL_FAILURE(use("mpeg4.avi"));
    const std::int64_t most = opened->file()->size() * 2 / 5;
    const auto& packets = opened->packetIndex(cancelled)->packets();
    const auto source = std::move(VideoSource::open(opened, cancelled, 1)).value();
    const auto walk = std::move(ffmpeg::PictureWalk::open(opened, cancelled)).value();
    for (const std::size_t picture : {110U, 80U, 95U}) {
        const std::int64_t tick = packets[picture].pts;
        const std::int64_t before = bytesRead();
        ASSERT_TRUE(source->at(tick, VideoSource::Want::Full, [] { return false; }));
        const std::int64_t between = bytesRead();
        EXPECT_LT(between - before, most) << "the picture " << picture;
        ASSERT_TRUE(walk->at(tick, ffmpeg::PictureWalk::Then::Rest));
        EXPECT_LT(bytesRead() - between, most) << "the thumbnail " << picture;
    }
}

TEST_F(Places, AtTheStartAreShownBeforeAllOthersAreKnown)
{
    ASSERT_NO_FATAL_FAILURE(use("mpeg4.avi"));
    const auto source = std::move(VideoSource::open(opened, cancelled, 1)).value();
    const std::int64_t before = bytesRead();
    ASSERT_TRUE(source->at(opened->firstFrame()->pts(), VideoSource::Want::Full, [] { return false; }));
    EXPECT_LT(bytesRead() - before, opened->file()->size() / 2);
}

TEST_F(Places, AtTheStartAreThoseAlsoOfAReaderThatHasOnlyGoneElsewhere)
{
    ASSERT_NO_FATAL_FAILURE(use("many-bytes.mkv"));
    const auto first = read(*picturesOnly(), 1);
    const auto demuxer = picturesOnly();
    ASSERT_TRUE(demuxer->seek(0, 3000));
    ASSERT_TRUE(demuxer->seekToStart(0));
    EXPECT_EQ(read(*demuxer, 1), first);
}

TEST_F(Places, AtTheStartCostAReaderThatWasNeverMovedNothing)
{
    ASSERT_NO_FATAL_FAILURE(use("h264-live-one-group.mkv"));
    const auto demuxer = std::move(ffmpeg::Demuxer::open(opened->file(), cancelled)).value();
    const std::int64_t before = bytesRead();
    EXPECT_TRUE(demuxer->seekToStart(0));
    EXPECT_LT(bytesRead() - before, 200) << "but for what the question reads";
    const auto packet = ffmpeg::newPacket();
    ASSERT_EQ(demuxer->read(*packet), 0);
    const std::int64_t first = packet->pos;
    ASSERT_EQ(demuxer->read(*packet), 0);
    EXPECT_NE(packet->pos, first);
    EXPECT_TRUE(demuxer->seekToStart(0));
    ASSERT_EQ(demuxer->read(*packet), 0);
    EXPECT_EQ(packet->pos, first);
}

} // namespace
