// Parameter sets as x264 and x265 write them, read and written anew.
#include "linux/ffmpeg/bitstream/H264Headers.h"
#include "linux/ffmpeg/bitstream/HevcHeaders.h"
#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/ExportTest.h"
#include "linux/ffmpeg/exporting/video/HiddenPictures.h"
#include "linux/ffmpeg/exporting/video/Splicer.h"

#include <random>

namespace tests {
namespace {

namespace h264 = ffmpeg::h264;
namespace hevc = ffmpeg::hevc;

TEST(Bits, ComeBackAsTheyWereWritten)
{
    std::mt19937 random(3);
    ffmpeg::BitWriter out;
    std::vector<std::uint32_t> values;
    for (int i = 0; i < 1000; ++i) {
        values.push_back(static_cast<std::uint32_t>(random() >> (random() % 31 + 1)));
        out.ue(values.back());
    }
    out.finish();
    ffmpeg::BitReader in(out.bytes());
    for (const std::uint32_t value : values)
        ASSERT_EQ(in.ue(), value);
    EXPECT_FALSE(in.isBeyond());
    in.bits(32);
    EXPECT_TRUE(in.isBeyond());
}

TEST(Bits, HoldNoStartCode)
{
    const ffmpeg::Bytes payload{7, 0, 0, 0, 0, 0, 1, 0, 0, 3, 9, 0, 0, 2};
    const ffmpeg::Bytes nal = ffmpeg::withEmulation(payload);
    for (std::size_t i = 0; i + 2 < nal.size(); ++i)
        EXPECT_FALSE(nal[i] == 0 && nal[i + 1] == 0 && nal[i + 2] < 3);
    EXPECT_EQ(ffmpeg::withoutEmulation(nal), payload);
}

class Headers : public ExportTest {
protected:
    ffmpeg::Bytes headerOf(const std::string& name)
    {
        DecodedMovie movie(exportMovie(name));
        const auto view = ffmpeg::extradataOf(*movie.stream().codecpar);
        return {view.begin(), view.end()};
    }
};

TEST_F(Headers, OfH264AreReadAndKeptAsTheyAre)
{
    for (const char* name : {"h264-b.mp4", "h264-444.mp4", "h264-10bit.mp4", "h264-baseline.mp4"}) {
        const ffmpeg::Bytes header = headerOf(name);
        const auto configuration = h264::Configuration::parse(header);
        ASSERT_TRUE(configuration) << name;
        EXPECT_EQ(configuration->bytes(), header) << name;
        EXPECT_TRUE(h264::parseSps(configuration->sps.front())->restriction);
    }
    const auto b = h264::Configuration::parse(headerOf("h264-b.mp4"));
    EXPECT_EQ(h264::parseSps(b->sps.front())->restriction->reorderFrames, 2U);
}

TEST_F(Headers, OfH264SayHowFarPicturesAreReordered)
{
    const auto configuration = h264::Configuration::parse(headerOf("h264-b.mp4"));
    const ffmpeg::Bytes& sps = configuration->sps.front();
    EXPECT_EQ(h264::inUseLike(sps, sps, *h264::parseSps(sps)->restriction), sps) << "the same written again";
    const auto changed = h264::inUseLike(sps, sps, {1, 5});
    ASSERT_TRUE(changed);
    EXPECT_EQ(h264::parseSps(*changed)->restriction->reorderFrames, 1U);
    EXPECT_EQ(h264::parseSps(*changed)->restriction->bufferedFrames, 5U);
    EXPECT_EQ(h264::parseSps(*changed)->level, h264::parseSps(sps)->level);
}

TEST_F(Headers, OfH264SayHowLargeItsPicturesAre)
{
    for (const char* name : {"h264.mp4", "h264-422.mp4", "h264-444.mp4", "h264-interlaced.mp4", "h264-odd.mp4"}) {
        const auto sps = h264::parseSps(h264::Configuration::parse(headerOf(name))->sps.front());
        ASSERT_TRUE(sps) << name;
        EXPECT_EQ(sps->width, 320) << name;
        EXPECT_EQ(sps->height, 180) << name;
    }
}

TEST_F(Headers, OfH264AreUsedLikeThoseBesideThem)
{
    constexpr std::size_t kProfile = 1;
    constexpr std::size_t kConstraints = 2;
    const ffmpeg::Bytes set = h264::Configuration::parse(headerOf("h264-b.mp4"))->sps.front();
    ffmpeg::Bytes other = set;
    other[kProfile] = 122;
    other[kConstraints] = 0x30;
    ffmpeg::Bytes own = set;
    own[kConstraints] = 0x50;
    const auto restriction = *h264::parseSps(set)->restriction;
    const auto made = h264::parseSps(h264::inUseLike(own, other, restriction).value());
    EXPECT_EQ(made->profile, 122) << "a decoder is chosen once";
    EXPECT_EQ(made->constraints, 0x10) << "what is true of both";
    EXPECT_EQ(h264::parseSps(h264::inUseLike(other, own, restriction).value())->profile, 122);

    // How far motion goes, at most, and the least compression.
    const auto withReach = [&](std::uint32_t compression, std::uint32_t motion) {
        const ffmpeg::Bytes payload = ffmpeg::withoutEmulation(set);
        ffmpeg::BitWriter out;
        out.copy(payload, 0, h264::parseSps(set)->restrictionBit);
        out.bits(0b10, 2); // a restriction; nothing beyond the picture
        for (const std::uint32_t each : {compression, compression, motion, motion, 2U, 4U})
            out.ue(each);
        out.finish();
        return ffmpeg::withEmulation(out.bytes());
    };
    const auto inUse = [&](const ffmpeg::Bytes& a, const ffmpeg::Bytes& b) {
        return h264::inUseLike(a, b, {2, 4}).value();
    };
    EXPECT_EQ(inUse(withReach(2, 9), withReach(4, 11)), withReach(2, 11));
    EXPECT_EQ(inUse(withReach(4, 11), withReach(2, 9)), withReach(2, 11));
    EXPECT_EQ(inUse(withReach(4, 11), withReach(0, 9)), withReach(0, 11)) << "0 is no bound";
}

TEST_F(Headers, OfH264AreJoinedOnlyWhereTheyAgreeInWhatDecodersKeep)
{
    const h264::Sps set = *h264::parseSps(h264::Configuration::parse(headerOf("h264-b.mp4"))->sps.front());
    const auto follows = [&](auto change) {
        h264::Sps other = set;
        change(other);
        EXPECT_EQ(h264::canFollow(set, other), h264::canFollow(other, set));
        return h264::canFollow(set, other);
    };
    EXPECT_TRUE(follows([](h264::Sps& other) {
        other.id = 3;
        other.frameNumBits = 9;
        other.orderType = 2;
        other.orderBits = 9;
        other.hasFrameNumGaps = true;
    }));
    EXPECT_FALSE(follows([](h264::Sps& other) { other.chromaFormat = 3; }));
    EXPECT_FALSE(follows([](h264::Sps& other) { other.lumaDepth = 10; }));
    EXPECT_FALSE(follows([](h264::Sps& other) { other.chromaDepth = 10; }));
    EXPECT_FALSE(follows([](h264::Sps& other) { other.hasSeparatePlanes = true; }));
    EXPECT_FALSE(follows([](h264::Sps& other) { other.bypassesTransform = true; }));
    EXPECT_FALSE(follows([](h264::Sps& other) { other.isProgressive = false; }));
    EXPECT_FALSE(follows([](h264::Sps& other) { other.macroblocksWide *= 2; }));
    EXPECT_FALSE(follows([](h264::Sps& other) { other.macroblocks *= 2; }));
    for (std::size_t side = 0; side < 4; ++side)
        EXPECT_FALSE(follows([side](h264::Sps& other) { ++other.cropping[side]; })) << side;
}

TEST_F(Headers, OfHevcAreJoinedOnlyWherePicturesLookAlike)
{
    hevc::Sps set;
    const auto header = hevc::Configuration::parse(headerOf("hevc.mp4")).value();
    for (const ffmpeg::Bytes& each : header.sets)
        if (hevc::unitOf(each) == hevc::Unit::Sps)
            set = *hevc::parseSps(each);
    ASSERT_EQ(set.width, 320U);
    const auto follows = [&](auto change) {
        hevc::Sps other = set;
        change(other);
        return hevc::canFollow(set, other);
    };
    EXPECT_TRUE(follows([](hevc::Sps& other) { other.height += 8, other.window[3] += 4; })) << "another block size";
    EXPECT_FALSE(follows([](hevc::Sps& other) { other.height += 8; }));
    EXPECT_FALSE(follows([](hevc::Sps& other) { other.width += 8; }));
    EXPECT_FALSE(follows([](hevc::Sps& other) { other.window[0] += 4, other.window[1] -= 4; }));
    EXPECT_FALSE(follows([](hevc::Sps& other) { other.window[2] += 4, other.window[3] -= 4; }));
    EXPECT_FALSE(follows([](hevc::Sps& other) { other.chromaFormat = 0; }));
    EXPECT_FALSE(follows([](hevc::Sps& other) { other.hasSeparatePlanes = true; }));
    EXPECT_FALSE(follows([](hevc::Sps& other) { other.lumaDepth = 10; }));
    EXPECT_FALSE(follows([](hevc::Sps& other) { other.chromaDepth = 10; }));
}

TEST_F(Headers, OfHevcSayHowManyPicturesAllLayersKeep)
{
    const auto bufferingOf = [&](const char* name) {
        const auto header = hevc::Configuration::parse(headerOf(name)).value();
        for (const ffmpeg::Bytes& each : header.sets)
            if (hevc::unitOf(each) == hevc::Unit::Sps)
                return hevc::parseSps(each).value();
        return hevc::Sps();
    };
    const hevc::Sps plain = bufferingOf("hevc.mp4");
    const hevc::Sps layered = bufferingOf("hevc-layers.mp4");
    EXPECT_EQ(plain.layers, 0U);
    EXPECT_EQ(layered.layers, 1U);
    EXPECT_EQ(layered.width, 320U);
    EXPECT_TRUE(hevc::canFollow(plain, layered));
    EXPECT_GT(layered.buffering.reordered, 0U);
    EXPECT_GT(layered.buffering.pictures, layered.buffering.reordered);
}

TEST_F(Headers, OfAv1StandBeforeEachKeyframeThatIsCopied)
{
    DecodedMovie file(exportMovie("av1.mp4"));
    const auto packet = ffmpeg::newPacket();
    ASSERT_GE(av_read_frame(&file.context(), packet.get()), 0);
    const ffmpeg::ByteView whole = ffmpeg::payloadOf(*packet);
    const std::size_t header = ffmpeg::picturesOfAv1(whole).bytesToHeader;
    ASSERT_GT(header, 0U);
    const ffmpeg::Bytes bare(whole.begin() + std::ptrdiff_t(header), whole.end());
    av_packet_unref(packet.get());
    ASSERT_EQ(av_new_packet(packet.get(), int(bare.size())), 0);
    std::copy(bare.begin(), bare.end(), packet->data);
    packet->flags = AV_PKT_FLAG_KEY;
    auto picture = ffmpeg::newFrame();
    picture->format = AV_PIX_FMT_YUV420P;
    const auto splicer = ffmpeg::Splicer::make(file.stream(), *picture).value();
    ASSERT_TRUE(splicer->adoptCopied(*packet));
    const auto pictures = ffmpeg::picturesOfAv1(ffmpeg::payloadOf(*packet));
    EXPECT_TRUE(pictures.hasHeader && pictures.startsGroup);
    EXPECT_EQ(std::size_t(packet->size), bare.size() + pictures.bytesToHeader);
}

TEST_F(Headers, ThatAreDamagedAreRefused)
{
    const ffmpeg::Bytes h264Header = headerOf("h264-b.mp4");
    const ffmpeg::Bytes hevcHeader = headerOf("hevc.mp4");
    for (std::size_t size = 0; size < h264Header.size() - 4; ++size)
        h264::Configuration::parse(ffmpeg::ByteView(h264Header).first(size));
    for (std::size_t size = 0; size < hevcHeader.size(); ++size)
        hevc::Configuration::parse(ffmpeg::ByteView(hevcHeader).first(size));
    std::mt19937 random(5);
    for (int i = 0; i < 2000; ++i) {
        ffmpeg::Bytes one = h264Header;
        ffmpeg::Bytes other = hevcHeader;
        one[random() % one.size()] = static_cast<std::uint8_t>(random());
        other[random() % other.size()] = static_cast<std::uint8_t>(random());
        if (const auto found = h264::Configuration::parse(one))
            for (const auto& set : found->sps)
                h264::inUseLike(set, found->sps.front(), {1, 2});
        if (const auto found = hevc::Configuration::parse(other))
            for (const auto& set : found->sets)
                hevc::renumbered(set, {1, 1, 15});
        ffmpeg::picturesOfAv1(other);
        ffmpeg::picturesOfVp9(one);
    }
    EXPECT_FALSE(h264::Configuration::parse(ffmpeg::ByteView(h264Header).first(20)));
}

TEST_F(Headers, OfHevcGetOtherNumbers)
{
    const auto configuration = hevc::Configuration::parse(headerOf("hevc.mp4"));
    ASSERT_TRUE(configuration);
    for (const ffmpeg::Bytes& set : configuration->sets) {
        const auto changed = hevc::renumbered(set, {3, 7, 20});
        ASSERT_TRUE(changed);
        EXPECT_EQ(hevc::unitOf(*changed), hevc::unitOf(set));
        if (hevc::unitOf(set) == hevc::Unit::Vps) {
            EXPECT_EQ(hevc::idOfVps(*changed), 3U);
        }
        if (hevc::unitOf(set) == hevc::Unit::Sps) {
            EXPECT_EQ(hevc::parseSps(*changed)->id, 7U);
            EXPECT_EQ(hevc::parseSps(*changed)->vps, 3U);
        }
        if (hevc::unitOf(set) == hevc::Unit::Pps) {
            EXPECT_EQ(hevc::idsOfPps(*changed).pps, 20U);
            EXPECT_EQ(hevc::idsOfPps(*changed).sps, 7U);
        }
        EXPECT_EQ(hevc::renumbered(*changed, {0, 0, 0}), set) << "and back";
    }
}

// Decoders hold pictures back by what the sets say; where they differ, some are lost at the joint.
TEST_F(Headers, OfAnExportAgreeOnHowFarPicturesAreReordered)
{
    for (const char* name : {"h264.mp4", "h264-b.mp4", "h264-b.mkv", "h264-vfr.mp4"}) {
        ASSERT_EQ(cut(exportMovie(name), output(name), fromTo(0.3, 4.5)), ExportStatus::Completed) << errorText();
        DecodedMovie decoded(output(name));
        const auto header = h264::Configuration::parse(ffmpeg::extradataOf(*decoded.stream().codecpar));
        ASSERT_TRUE(header);
        ASSERT_EQ(header->sps.size(), 2U) << name;
        const auto first = h264::parseSps(header->sps[0])->restriction;
        const auto second = h264::parseSps(header->sps[1])->restriction;
        ASSERT_TRUE(first && second);
        EXPECT_EQ(first->reorderFrames, second->reorderFrames) << name;
        EXPECT_EQ(first->bufferedFrames, second->bufferedFrames) << name;
    }
}

TEST_F(Headers, OfExportsOfExportsDoNotPileUp)
{
    for (const char* name : {"h264-b.mp4", "hevc.mp4", "hevc-open.mp4"}) {
        std::string from = exportMovie(name);
        const std::size_t count = DecodedMovie(from).all(DecodedMovie::Look::AtNumbers).size();
        for (int i = 0; i < 5; ++i) {
            const std::string to = output(std::to_string(i) + name);
            ASSERT_EQ(cut(from, to, fromTo(0.2, 10)), ExportStatus::Completed) << errorText();
            from = to;
            const Complaints complaints;
            DecodedMovie decoded(from);
            const auto pictures = decoded.all();
            EXPECT_EQ(Complaints::texts(), "");
            EXPECT_EQ(pictures.size(), count - unsigned(i + 1) * 6);
            EXPECT_EQ(pictures.front().number, (i + 1) * 6);
            const auto header = ffmpeg::extradataOf(*decoded.stream().codecpar);
            if (const auto found = h264::Configuration::parse(header))
                EXPECT_LE(found->sps.size(), 3U);
            else
                EXPECT_LE(hevc::Configuration::parse(header)->sets.size(), 9U);
        }
    }
    EXPECT_FALSE(saysEncodedAsAWhole());
}

TEST_F(Headers, OfHevcSayThatACutBeginsAnew)
{
    ASSERT_EQ(cut(exportMovie("hevc-open.mp4"), output(), fromTo(0.5, 10)), ExportStatus::Completed) << errorText();
    DecodedMovie file(output());
    std::vector<hevc::Unit> keyframes;
    const auto packet = ffmpeg::newPacket();
    while (av_read_frame(&file.context(), packet.get()) >= 0) {
        const auto units = ffmpeg::unitsBehindLengths(ffmpeg::payloadOf(*packet), 4);
        ASSERT_TRUE(units);
        for (const ffmpeg::ByteView nal : *units)
            if (hevc::unitOf(nal) >= hevc::Unit::FirstIrap && hevc::unitOf(nal) <= hevc::Unit::LastIrap)
                keyframes.push_back(hevc::unitOf(nal));
        av_packet_unref(packet.get());
    }
    // What was encoded, the first group that was copied, and the next, which is as it was.
    ASSERT_EQ(keyframes.size(), 3U);
    EXPECT_GE(keyframes[0], hevc::Unit::IdrWithLeading);
    EXPECT_LE(keyframes[0], hevc::Unit::Idr);
    EXPECT_EQ(keyframes[1], hevc::Unit::Bla);
    EXPECT_EQ(keyframes[2], hevc::Unit::Cra);
}

TEST(NalUnits, EndBeforeZerosThatBelongToNobody)
{
    const ffmpeg::Bytes lengths{0, 0, 0, 4, 0x68, 1, 0, 0, 0, 0, 0, 1, 0, 0, 0, 0, 2, 0x65, 2};
    const auto behind = ffmpeg::unitsBehindLengths(lengths, 4);
    ASSERT_EQ(behind->size(), 2U);
    EXPECT_EQ(behind->front().size(), 2U);
    EXPECT_EQ(behind->back().size(), 2U);
    const ffmpeg::Bytes codes{0, 0, 0, 1, 0x68, 1, 0, 0, 0, 1, 0x65, 2, 0};
    ASSERT_EQ(ffmpeg::unitsBetweenStartCodes(codes).size(), 2U);
    for (const ffmpeg::ByteView unit : ffmpeg::unitsBetweenStartCodes(codes))
        EXPECT_EQ(unit.size(), 2U);
}

TEST(HevcHeaders, SayItOfEachLayerOrOfAll)
{
    for (const bool isSaidOfEach : {false, true}) {
        ffmpeg::BitWriter out;
        const auto zeros = [&](int count) {
            for (; count > 0; --count)
                out.bit(0);
        };
        out.bits(0x4201, 16);
        out.bits(0b0000'001'1, 8); // one layer more
        zeros(96);
        out.bits(0b11, 2); // which has a profile and a level of its own
        zeros(14 + 88 + 8);
        for (const std::uint32_t each : {2U, 1U, 320U, 180U})
            out.ue(each);
        out.bit(0);
        for (const std::uint32_t each : {0U, 0U, 4U})
            out.ue(each);
        out.bit(isSaidOfEach);
        if (isSaidOfEach)
            for (const std::uint32_t each : {1U, 0U, 0U})
                out.ue(each);
        for (const std::uint32_t each : {4U, 2U, 5U})
            out.ue(each);
        out.finish();
        const auto sps = hevc::parseSps(ffmpeg::withEmulation(out.bytes()));
        ASSERT_TRUE(sps);
        EXPECT_EQ(sps->id, 2U);
        EXPECT_EQ(sps->width, 320U);
        EXPECT_EQ(sps->buffering.pictures, 4U);
        EXPECT_EQ(sps->buffering.reordered, 2U);
        EXPECT_EQ(sps->buffering.latency, 5U);
    }
}

TEST(H264Information, SaysHowLongPicturesAreNotWholeYet)
{
    // A recovery point of 29, then one of 0; another message before the former.
    EXPECT_EQ(h264::picturesUntilRefreshed(ffmpeg::Bytes{0x06, 0x06, 0x02, 0x0F, 0x40, 0x80}), 29U);
    EXPECT_EQ(h264::picturesUntilRefreshed(ffmpeg::Bytes{0x06, 0x06, 0x01, 0xC4, 0x80}), 0U);
    EXPECT_EQ(h264::picturesUntilRefreshed(ffmpeg::Bytes{0x06, 0x01, 0x01, 0x44, 0x06, 0x02, 0x0F, 0x40, 0x80}), 29U);
    for (const ffmpeg::Bytes& damaged : {ffmpeg::Bytes{0x06},
                                         {0x06, 0xFF},
                                         {0x06, 0x06, 0xFF, 0xFF, 0x01, 0x02},
                                         {0x06, 0x06, 0x05, 0x00, 0x00, 0x80, 0x01, 0x40, 0x80}})
        EXPECT_EQ(h264::picturesUntilRefreshed(damaged), 0U);
}

TEST(HevcHeaders, TheFirstPictureOfAnOpenGroupBecomesABeginning)
{
    // An open group's (21) and one that is shown behind others but needs none of them (19); both would have what was
    // decoded before forgotten.
    EXPECT_EQ(hevc::closed(ffmpeg::Bytes{0x2A, 0x01, 0xE0, 0x12}), (ffmpeg::Bytes{0x24, 0x01, 0xA0, 0x12}));
    EXPECT_EQ(hevc::closed(ffmpeg::Bytes{0x26, 0x01, 0xE0, 0x12}), (ffmpeg::Bytes{0x28, 0x01, 0xA0, 0x12}));
}

} // namespace
} // namespace tests
