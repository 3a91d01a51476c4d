// Movies of which only the first part is there, whatever their headers tell; and what else does not come along.
#include "linux/ffmpeg/FileMarks.h"
#include "linux/ffmpeg/exporting/ExportTest.h"
#include "linux/ffmpeg/exporting/sound/DecodedSound.h"
#include "support/CaseName.h"

#include <gmock/gmock.h>

namespace tests {
namespace {

namespace fs = std::filesystem;
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;

class ACutOffMovie : public ExportTest, public testing::WithParamInterface<const char*> {
protected:
    /// A copy of the movie that lacks the rest of its bytes.
    std::string firstPart(double part) const
    {
        const std::string path = output("part-" + std::string(GetParam()));
        fs::copy_file(exportMovie(GetParam()), path, fs::copy_options::overwrite_existing);
        fs::resize_file(path, static_cast<std::uintmax_t>(part * static_cast<double>(fs::file_size(path))));
        return path;
    }
    std::vector<std::string> said() const { return log.texts(base::MemoryLog::Line::Kind::Message); }
};

TEST_P(ACutOffMovie, IsAsLongAsWhatIsThere)
{
    ASSERT_EQ(open(exportMovie(GetParam())), Status::ReadyToPlay);
    const double whole = item->duration().seconds();
    const auto movie = std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie();
    EXPECT_FALSE(movie->durationBeforeCut());
    EXPECT_LE(ffmpeg::announcedSize(*movie->file()).value_or(0), movie->file()->size());

    const std::string path = firstPart(0.4);
    ASSERT_EQ(open(path), Status::ReadyToPlay);
    const double left = item->duration().seconds();
    EXPECT_GT(left, 0.2 * whole);
    EXPECT_LT(left, 0.6 * whole);
    const auto cut = std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie();
    ASSERT_TRUE(cut->durationBeforeCut());
    if (cut->durationBeforeCut()->isNumeric()) { // the library does not believe all headers then
        EXPECT_NEAR(cut->durationBeforeCut()->seconds(), whole, 0.1);
    }
    for (const auto& track : asset->tracks())
        EXPECT_LE(track.timeRange.end().seconds(), left + 0.001);
}

TEST_P(ACutOffMovie, IsExportedAsFarAsItGoesAndThatIsSaid)
{
    const std::string path = firstPart(0.4);
    ASSERT_EQ(cut(path, output(), std::nullopt), ExportStatus::Completed) << errorText();
    EXPECT_THAT(said(), testing::Contains(AllOf(HasSubstr("“part-" + std::string(GetParam()) + "” was cut off: "),
                                                HasSubstr("only the first "))));
    const double left = asset->duration().seconds();
    EXPECT_NEAR(double(DecodedMovie(output()).all().size()), 30 * left, 8);
}

TEST_P(ACutOffMovie, IsNotExportedWhereNothingIsLeftOfIt)
{
    const std::string path = firstPart(0.4);
    EXPECT_EQ(cut(path, output(), fromTo(2.9, 3.9)), ExportStatus::Failed);
    EXPECT_THAT(errorText(), HasSubstr("the range begins behind its end"));
    EXPECT_FALSE(fs::exists(output()));
}

TEST_P(ACutOffMovie, IsWholeWhereOnlyTheLastBytesAreMissing)
{
    const std::string path = firstPart(0.999);
    ASSERT_EQ(cut(path, output(), std::nullopt), ExportStatus::Completed) << errorText();
    EXPECT_THAT(said(), Not(testing::Contains(HasSubstr("cut off"))));
}

INSTANTIATE_TEST_SUITE_P(, ACutOffMovie,
                         testing::Values("heavy.mkv", "heavy.avi", "heavy.flv", "heavy.asf", "vp8.webm"),
                         [](const auto& each) { return caseName(each.param); });

class Leftovers : public ExportTest {};

TEST_F(Leftovers, AreNamedInOneLine)
{
    ASSERT_EQ(cut(movie("others.mkv"), output(), std::nullopt), ExportStatus::Completed) << errorText();
    EXPECT_THAT(log.texts(base::MemoryLog::Line::Kind::Message),
                ElementsAre("Of “others.mkv” does not come along: another picture track (h264), subtitles (subrip), an "
                            "attached file."));
    ASSERT_EQ(cut(exportMovie("two-tracks.mp4"), output("all.mp4"), fromTo(1, 3)), ExportStatus::Completed);
    EXPECT_EQ(log.texts(base::MemoryLog::Line::Kind::Message).size(), 1U) << "there are none";
}

TEST_F(Leftovers, OfSoundThatNobodyCanDecodeAreNamedOnceInACutAndInAMix)
{
    const std::string source = output("source.mkv");
    std::string bytes = bytesOf(exportMovie("sound.mkv"));
    const std::size_t codec = bytes.rfind("A_AAC");
    ASSERT_NE(codec, std::string::npos);
    std::ofstream(source, std::ios::binary) << bytes.replace(codec, 5, "A_XYZ");
    ASSERT_EQ(open(source), Status::ReadyToPlay);
    platform::AudioMix mix;
    for (const auto& track : asset->tracks())
        if (track.type == platform::MediaType::Audio)
            mix.inputs.push_back({track.trackID});
    ASSERT_FALSE(mix.inputs.empty());
    std::vector<std::string> lines;
    for (const auto& each : {std::optional<platform::AudioMix>(), std::optional(mix)}) {
        const auto session = sessionFor(source, output(each ? "mix.mp4" : "cut.mp4"), std::nullopt);
        session->setAudioMix(each);
        ASSERT_EQ(run(session), ExportStatus::Completed) << errorText();
        lines.emplace_back("Of “source.mkv” does not come along: sound that cannot be decoded.");
        EXPECT_EQ(log.texts(base::MemoryLog::Line::Kind::Message), lines);
    }
}

} // namespace
} // namespace tests
