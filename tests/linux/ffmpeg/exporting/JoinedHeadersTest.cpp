// Parameter sets of pictures that are encoded beside copied ones: they agree in what decoders keep from one to the other.
#include "linux/ffmpeg/bitstream/H264Headers.h"
#include "linux/ffmpeg/bitstream/HevcHeaders.h"
#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/CutsTest.h"
#include "support/CaseName.h"

namespace tests {
namespace {

namespace h264 = ffmpeg::h264;
namespace hevc = ffmpeg::hevc;

class JoinedHeaders : public CutsTest {
protected:
    ffmpeg::Bytes headerOf(const std::string& path)
    {
        DecodedMovie file(path);
        const auto view = ffmpeg::extradataOf(*file.stream().codecpar);
        return {view.begin(), view.end()};
    }
};

class LosslessRecordings : public JoinedHeaders, public testing::WithParamInterface<const char*> {};

TEST_P(LosslessRecordings, AreCutWithoutLoss)
{
    ASSERT_NO_FATAL_FAILURE(take(exportMovie(GetParam())));
    ASSERT_NO_FATAL_FAILURE(cutAndCheck(0.5, 1.7));
    ASSERT_NO_FATAL_FAILURE(cutAndCheck(0.1, 0.9));
    EXPECT_EQ(copies, 36 + 24) << "also of those that were encoded";
    EXPECT_FALSE(saysEncodedAsAWhole());
}

INSTANTIATE_TEST_SUITE_P(, LosslessRecordings,
                         testing::Values("h264-lossless.mp4", "h264-lossless-444.mp4", "h264-lossless-10bit.mp4",
                                         "hevc-lossless.mp4"),
                         [](const auto& each) { return caseName(each.param); });

TEST_F(JoinedHeaders, OfH264SayTheSameOfHowPicturesAreUsed)
{
    for (const char* name :
         {"h264.mp4", "h264-b.mp4", "h264-b.ts", "h264-444.mp4", "h264-10bit.mp4", "h264-interlaced.mp4",
          "h264-mixed.mp4", "h264-full-range.mp4", "h264-baseline.mp4", "h264-lossless.mp4"}) {
        SCOPED_TRACE(name);
        ASSERT_EQ(cut(exportMovie(name), output(), fromTo(0.5, 2.5)), ExportStatus::Completed) << errorText();
        const auto header = h264::Configuration::parse(headerOf(output()));
        ASSERT_TRUE(header);
        ASSERT_EQ(header->sps.size(), 2U);
        const auto first = *h264::parseSps(header->sps[0]);
        const auto second = *h264::parseSps(header->sps[1]);
        EXPECT_TRUE(h264::canFollow(first, second));
        EXPECT_EQ(first.profile, second.profile);
        EXPECT_EQ(first.level, second.level);
        EXPECT_EQ(first.referenceFrames, second.referenceFrames);
        const auto usability = [](const ffmpeg::Bytes& set, const h264::Sps& sps) {
            const ffmpeg::Bytes payload = ffmpeg::withoutEmulation(set);
            ffmpeg::BitWriter out;
            out.copy(payload, sps.vuiBit, sps.restrictionBit);
            return out.bytes();
        };
        EXPECT_EQ(usability(header->sps[0], first), usability(header->sps[1], second));
        std::filesystem::remove(output());
    }
    EXPECT_FALSE(saysEncodedAsAWhole());
}

TEST_F(JoinedHeaders, OfHevcSayTheSameOfHowManyPicturesAreKept)
{
    for (const char* name : {"hevc.mp4", "hevc-b.mkv", "hevc-open.mp4", "hevc-10bit.mp4"}) {
        SCOPED_TRACE(name);
        ASSERT_EQ(cut(exportMovie(name), output(), fromTo(0.5, 2.5)), ExportStatus::Completed) << errorText();
        std::vector<hevc::Sps> found;
        const auto header = hevc::Configuration::parse(headerOf(output())).value_or(hevc::Configuration());
        for (const ffmpeg::Bytes& set : header.sets)
            if (hevc::unitOf(set) == hevc::Unit::Sps)
                found.push_back(*hevc::parseSps(set));
        ASSERT_EQ(found.size(), 2U);
        EXPECT_TRUE(hevc::canFollow(found[0], found[1]));
        EXPECT_EQ(found[0].width, found[1].width);
        EXPECT_EQ(found[0].height, found[1].height);
        EXPECT_EQ(found[0].buffering.pictures, found[1].buffering.pictures);
        EXPECT_EQ(found[0].buffering.reordered, found[1].buffering.reordered);
        std::filesystem::remove(output());
    }
    EXPECT_FALSE(saysEncodedAsAWhole());
}

// The encoder crops nothing at the left, and decoders go on with what they cropped first.
TEST_F(JoinedHeaders, ThatCannotAgreeAreNotJoined)
{
    const std::vector<std::string> names{"h264-cropped.mp4", "hevc-cropped.mp4"};
    for (const std::string& name : names) {
        ASSERT_NO_FATAL_FAILURE(take(exportMovie(name)));
        cutAndCheck(0.5, 1.7);
    }
    EXPECT_EQ(copies, 0);
    const auto lines = log.texts(base::MemoryLog::Line::Kind::Message);
    ASSERT_EQ(lines.size(), names.size());
    for (std::size_t i = 0; i < lines.size(); ++i)
        EXPECT_EQ(lines[i],
                  "“" + names[i]
                      + "” is encoded as a whole: no pictures can be encoded that decoders take for its own.");
}

TEST_F(JoinedHeaders, AreNotNeededWhereNothingIsEncoded)
{
    for (const char* name : {"h264-cropped.mp4", "hevc-cropped.mp4"}) {
        copies = 0;
        ASSERT_NO_FATAL_FAILURE(take(exportMovie(name)));
        cutAndCheck(20.0 / 30, 2);
        EXPECT_GT(copies, 30);
    }
    EXPECT_FALSE(saysEncodedAsAWhole());
}

} // namespace
} // namespace tests
