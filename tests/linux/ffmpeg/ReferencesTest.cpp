#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/images/PacketsAhead.h"
#include "support/EngineTest.h"

#include <gmock/gmock.h>

#include <limits>
#include <set>
#include <vector>

using testing::Contains;
using testing::UnorderedElementsAre;

namespace {

using ffmpeg::H264References;
using Kind = ffmpeg::h264::Slice::Kind;

class References : public tests::EngineTest {
protected:
    std::unique_ptr<ffmpeg::Demuxer> demuxer(const std::string& name)
    {
        auto file = ffmpeg::OpenFile::open(movie(name));
        auto opened = std::move(ffmpeg::Demuxer::open(std::move(file).value(), nullptr)).value();
        opened->select({0});
        return opened;
    }
    std::unique_ptr<H264References> of(const std::string& name)
    {
        return H264References::of(*demuxer(name)->stream(0).codecpar);
    }
    std::vector<H264References::Picture> all(const std::string& name)
    {
        const auto reader = demuxer(name);
        const auto references = H264References::of(*reader->stream(0).codecpar);
        std::vector<H264References::Picture> pictures;
        for (const auto packet = ffmpeg::newPacket(); reader->read(*packet) == 0;)
            pictures.push_back(references->follow(*packet));
        return pictures;
    }
};

TEST_F(References, OfAnEncoderForRecordingsAreThoseBesideEachPicture)
{
    const auto pictures = all("refs-recorder.mp4");
    ASSERT_EQ(pictures.size(), 75U);
    for (std::size_t group = 0; group < 75; group += 25) {
        EXPECT_TRUE(pictures[group].slice.isIdr);
        EXPECT_TRUE(pictures[group].refersTo.empty());
        std::int64_t before = pictures[group].number; // the P picture, or the keyframe
        for (std::size_t i = group + 1; i + 2 < group + 25; i += 3) {
            const auto& p = pictures[i];
            const auto& between = pictures[i + 1];
            const auto& unreferred = pictures[i + 2];
            ASSERT_TRUE(p.isKnown && between.isKnown && unreferred.isKnown) << i;
            EXPECT_EQ(p.slice.kind, Kind::P);
            EXPECT_FALSE(p.canBeReplaced());
            EXPECT_THAT(p.refersTo, UnorderedElementsAre(before)) << i;
            EXPECT_TRUE(between.canBeReplaced()) << i;
            EXPECT_THAT(between.refersTo, UnorderedElementsAre(before, p.number)) << i;
            EXPECT_FALSE(unreferred.canBeReplaced()) << i;
            EXPECT_THAT(unreferred.refersTo, UnorderedElementsAre(between.number, p.number)) << i;
            EXPECT_THAT(unreferred.kept, UnorderedElementsAre(before, between.number, p.number)) << i;
            before = p.number;
        }
    }
}

TEST_F(References, NeverLeadOutOfAGroupThatBeginsAnewNorToWhatIsNoReference)
{
    for (const char* name : {"refs-recorder.mp4", "refs-strict.mp4", "refs-deep.mp4", "refs-temporal.mp4",
                             "refs-slices.mp4", "long-gop.mp4"}) {
        std::int64_t first = 0;
        std::set<std::int64_t> can;
        for (const auto& each : all(name)) {
            ASSERT_TRUE(each.isKnown) << name << each.number;
            if (each.slice.isIdr)
                first = each.number;
            EXPECT_EQ(each.refersTo.empty(), each.slice.kind == Kind::I);
            for (const std::int64_t other : each.refersTo) {
                EXPECT_GE(other, first) << name;
                EXPECT_THAT(can, Contains(other)) << name;
            }
            can = {each.kept.begin(), each.kept.end()};
            EXPECT_EQ(each.keeps(each.number), each.slice.importance != 0) << name;
        }
    }
}

TEST_F(References, AreNotKnownBetweenAStartElsewhereAndAGroupThatBeginsAnew)
{
    const auto reader = demuxer("refs-recorder.mp4");
    const auto references = H264References::of(*reader->stream(0).codecpar);
    const auto packet = ffmpeg::newPacket();
    for (int i = 0; i < 10; ++i) {
        reader->read(*packet);
        ASSERT_TRUE(references->follow(*packet).isKnown);
    }
    references->restart();
    for (int i = 10; i < 30; ++i) {
        reader->read(*packet);
        EXPECT_EQ(references->follow(*packet).isKnown, i >= 25) << i;
    }
}

TEST_F(References, AreNotKnownOnceAPictureIsMissing)
{
    const auto reader = demuxer("refs-recorder.mp4");
    const auto references = H264References::of(*reader->stream(0).codecpar);
    const auto packet = ffmpeg::newPacket();
    for (int i = 0; i < 30; ++i) {
        reader->read(*packet);
        if (i == 4)
            continue;
        EXPECT_EQ(references->follow(*packet).isKnown, i < 4 || i >= 25) << i;
    }
}

TEST_F(References, OfOtherStreamsAreNotLookedFor)
{
    EXPECT_FALSE(of("refs-hevc.mp4"));
    EXPECT_FALSE(of("refs-vp9.webm"));
    EXPECT_FALSE(of("size-change.ts"));
    EXPECT_TRUE(of("refs-deep.mp4"));
}

TEST_F(References, OfDamagedPacketsAreNotKnownAndHurtNobody)
{
    const auto reader = demuxer("refs-deep.mp4");
    const auto references = H264References::of(*reader->stream(0).codecpar);
    std::vector<ffmpeg::Owned<AVPacket>> packets;
    for (auto packet = ffmpeg::newPacket(); reader->read(*packet) == 0; packet = ffmpeg::newPacket())
        packets.push_back(std::move(packet));
    for (std::uint32_t seed = 1; seed < 400; ++seed) {
        references->restart();
        std::uint32_t state = seed;
        for (std::size_t i = 0; i < 12; ++i) {
            ASSERT_EQ(av_packet_make_writable(packets[i].get()), 0);
            const ffmpeg::Owned<AVPacket> damaged(av_packet_clone(packets[i].get()));
            ASSERT_EQ(av_packet_make_writable(damaged.get()), 0);
            for (int change = 0; change < 2; ++change) {
                state = state * 1664525 + 1013904223;
                damaged->data[(state >> 8) % static_cast<std::uint32_t>(std::min(damaged->size, 24))] =
                    static_cast<std::uint8_t>(state >> 24);
            }
            const auto picture = references->follow(*damaged);
            EXPECT_TRUE(!picture.canBeReplaced() || references->standInFor(*damaged, picture, true));
        }
    }
}

/// With every packet at hand: which pictures must be decoded for the last one.
std::vector<bool> neededForTheLast(const std::vector<H264References::Picture>& pictures, std::int64_t last)
{
    std::vector<bool> needed(pictures.size());
    for (std::size_t i = pictures.size(); i-- > 0;) {
        needed[i] = pictures[i].slice.kind != Kind::B || pictures[i].number == last;
        for (std::size_t user = i + 1; user < pictures.size(); ++user)
            needed[i] = needed[i] || (needed[user] && pictures[user].refersToPicture(pictures[i].number));
    }
    return needed;
}

TEST_F(References, LetNothingBeReplacedThatIsNeededHoweverShortTheLookAhead)
{
    for (const char* name : {"refs-recorder.mp4", "refs-strict.mp4", "refs-deep.mp4", "refs-temporal.mp4"}) {
        const auto pictures = all(name);
        const auto needed = neededForTheLast(pictures, 74);
        for (const std::size_t enough : {1U, 2U, 3U, 4U, 5U, 8U, 17U, 60U}) {
            const auto reader = demuxer(name);
            ffmpeg::PacketsAhead ahead(reader->stream(0), enough);
            std::size_t at = 0;
            int replaced = 0;
            for (ahead.fill(*reader); !ahead.isEmpty(); ahead.fill(*reader), ++at) {
                if (ahead.standInForFirst(std::numeric_limits<std::int64_t>::max(), false)) {
                    EXPECT_FALSE(needed[at]) << name << " " << at << " of " << enough;
                    ++replaced;
                }
                ahead.take();
            }
            EXPECT_EQ(at, 75U);
            EXPECT_TRUE(enough < 8 || replaced >= 20 || name != std::string("refs-recorder.mp4")) << enough;
        }
    }
}

/// A stream that was never coded: only what its slices say about references.
class WrittenReferences : public testing::Test {
protected:
    void SetUp() override
    {
        ffmpeg::BitWriter sps;
        for (const std::uint32_t byte : {0x67U, 77U, 0U, 30U})
            sps.bits(byte, 8);
        for (const std::uint32_t value : {0U, 0U, 0U, 4U, 4U}) // 4 bits of numbers, 8 of the order, 4 references
            sps.ue(value);
        sps.bit(0);
        sps.ue(19);
        sps.ue(10);
        sps.bits(0b1100, 4);
        sps.finish();
        ffmpeg::h264::Configuration header;
        header.sps = {sps.bytes()};
        header.pps = {ffmpeg::h264::standInParameters(0, 0)};
        extradata = header.bytes();
        stream.codecpar = &parameters;
        parameters.codec_id = AV_CODEC_ID_H264;
        parameters.extradata = extradata.data();
        parameters.extradata_size = static_cast<int>(extradata.size());
    }
    /// A reference that is shown at `order`. A P picture refers to the one that is `back` references before it.
    static ffmpeg::Owned<AVPacket> picture(Kind kind, std::uint32_t number, std::uint32_t order, std::uint32_t back = 1)
    {
        ffmpeg::BitWriter out;
        out.bits(kind == Kind::I ? 0x65 : 0x61, 8);
        out.ue(0);
        out.ue(static_cast<std::uint32_t>(kind));
        out.ue(0);
        out.bits(number, 4);
        if (kind == Kind::I)
            out.ue(0);
        out.bits(order, 8);
        if (kind == Kind::B)
            out.bits(0b1000, 4);
        if (kind == Kind::P) {
            out.bits(0b01, 2);
            out.ue(0);
            out.ue(back - 1);
            out.ue(3);
        }
        out.bits(0, kind == Kind::I ? 2 : 1);
        out.finish();
        auto packet = ffmpeg::newPacket();
        EXPECT_TRUE(ffmpeg::replacePayload(*packet, {out.bytes()}, 4));
        packet->pts = order;
        return packet;
    }

    ffmpeg::Bytes extradata;
    AVCodecParameters parameters{};
    AVStream stream{};
};

TEST_F(WrittenReferences, OfWhatLiesBeyondTheLookAheadAreReckonedWith)
{
    for (const std::uint32_t back : {2U, 3U}) {
        ffmpeg::PacketsAhead ahead(stream);
        ahead.add(picture(Kind::I, 0, 0));
        ahead.add(picture(Kind::P, 1, 8));
        ahead.add(picture(Kind::B, 2, 4));
        ahead.add(picture(Kind::P, 3, 16, 2));
        ahead.take();
        ahead.take();
        EXPECT_FALSE(ahead.standInForFirst(100, true)) << "the next one can refer to it";
        ahead.add(picture(Kind::P, 4, 24, back));
        ahead.add(picture(Kind::P, 5, 32, 1));
        EXPECT_FALSE(ahead.standInForFirst(100, true)) << "the next one can refer to it";
        ahead.add(picture(Kind::P, 6, 40, 1)); // the fourth since
        EXPECT_EQ(ahead.standInForFirst(100, true) == nullptr, back == 2) << "whether any does";
        EXPECT_FALSE(ahead.standInForFirst(4, true)) << "it is what is looked for";
    }
}

} // namespace
