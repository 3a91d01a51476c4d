// The file of an export: whole or absent, never in place of another; its source may go.
#include "linux/ffmpeg/exporting/CannotCopy.h"
#include "linux/ffmpeg/exporting/ExportTest.h"
#include "linux/ffmpeg/exporting/output/MovieWriter.h"
#include "linux/ffmpeg/exporting/output/OutputCheck.h"
#include "linux/ffmpeg/exporting/sound/SoundSources.h"
#include "linux/ffmpeg/exporting/video/VideoSources.h"
#include "support/WithoutPrivileges.h"

#include <gmock/gmock.h>

#include <csignal>
#include <sys/resource.h>
#include <thread>

namespace tests {
namespace {

using testing::HasSubstr;

class AnOutput : public ExportTest {};

TEST_F(AnOutput, DoesNotReplaceAFile)
{
    std::ofstream(output()) << "mine";
    EXPECT_EQ(cut(exportMovie("h264.mp4"), output(), fromTo(1, 2)), ExportStatus::Failed);
    EXPECT_THAT(errorText(), HasSubstr("out.mp4"));
    EXPECT_THAT(errorText(), HasSubstr("there is such a file already"));
    EXPECT_EQ(bytesOf(output()), "mine");
}

TEST_F(AnOutput, DoesNotReplaceALinkThatLeadsNowhere)
{
    const auto session = sessionFor(exportMovie("h264.mp4"), output(), std::nullopt);
    std::filesystem::create_symlink("/nowhere", output());
    EXPECT_EQ(run(session), ExportStatus::Failed);
    EXPECT_TRUE(std::filesystem::is_symlink(output()));
}

TEST_F(AnOutput, DoesNotReplaceAFileThatComesMeanwhile)
{
    ASSERT_EQ(open(exportMovie("h264.mp4")), Status::ReadyToPlay);
    ffmpeg::ExportJob job{std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie(),
                          output(),
                          fromTo(1, 2),
                          std::nullopt,
                          std::make_shared<std::atomic<bool>>(false),
                          {},
                          &log};
    job.progress = [&](double) { std::ofstream(output()) << "mine"; };
    for (const auto& calls : {std::vector<RefusedSystemCall>{}, std::vector<RefusedSystemCall>{noUnnamedFiles()}}) {
        base::Result<void> result;
        whileRefusing(calls, [&] { result = job.run(); });
        ASSERT_FALSE(result);
        EXPECT_THAT(result.error()->description(), HasSubstr("there is such a file already"));
        EXPECT_EQ(bytesOf(output()), "mine");
        EXPECT_EQ(files(), std::vector<std::string>{"out.mp4"});
        std::filesystem::remove(output());
    }
}

TEST_F(AnOutput, IsWholeWhereAFileWithoutANameGetsNone)
{
    for (const auto& calls :
         {std::vector<RefusedSystemCall>{{SYS_linkat, EPERM}}, std::vector<RefusedSystemCall>{noUnnamedFiles()},
          std::vector<RefusedSystemCall>{noUnnamedFiles(), {SYS_renameat2, EINVAL}}}) {
        const auto result = runJobRefusing(calls, exportMovie("h264.mp4"), fromTo(1, 2));
        ASSERT_TRUE(result) << result.error()->description();
        EXPECT_EQ(files(), std::vector<std::string>{"out.mp4"});
        EXPECT_EQ(DecodedMovie(output()).all().size(), 30U);
        std::filesystem::remove(output());
    }
}

TEST_F(AnOutput, IsAsPrivateAsItsSourceHoweverItIsMade)
{
    const std::string source = output("source.mp4");
    std::filesystem::copy_file(exportMovie("h264.mp4"), source);
    std::filesystem::permissions(source, std::filesystem::perms(0600));
    for (const auto& calls : {std::vector<RefusedSystemCall>{}, {{SYS_linkat, EPERM}}, {noUnnamedFiles()}}) {
        const auto result = runJobRefusing(calls, source, fromTo(1, 2));
        ASSERT_TRUE(result) << result.error()->description();
        EXPECT_EQ(std::filesystem::status(output()).permissions(), std::filesystem::perms(0600));
        std::filesystem::remove(output());
    }
}

TEST_F(AnOutput, SweepsWhatKilledExportsHaveLeftBesideIt)
{
    std::ofstream(output(".clipsa-12-3.part")) << "half";
    std::ofstream(output("film.part")) << "not ours";
    const auto result = runJobRefusing({noUnnamedFiles()}, exportMovie("h264.mp4"), fromTo(1, 2));
    ASSERT_TRUE(result) << result.error()->description();
    EXPECT_EQ(files(), (std::vector<std::string>{"film.part", "out.mp4"}));
}

TEST_F(AnOutput, NeedsSomewhereToWriteTo)
{
    EXPECT_EQ(cut(exportMovie("h264.mp4"), directory() + "/none/out.mp4", fromTo(1, 2)), ExportStatus::Failed);
    EXPECT_THAT(errorText(), HasSubstr("there is no such file or directory"));
    const auto session = sessionFor(exportMovie("h264.mp4"), output(), fromTo(1, 2));
    session->setOutputURL(std::nullopt);
    EXPECT_EQ(run(session), ExportStatus::Failed);
    EXPECT_THAT(errorText(), HasSubstr("there is no file to write to"));
}

TEST_F(AnOutput, SaysWhatCannotBeWrittenIntoADirectoryOfOthers)
{
    std::filesystem::permissions(directory(), std::filesystem::perms::owner_read | std::filesystem::perms::owner_exec);
    const ffmpeg::ExportJob job = jobOf(exportMovie("h264.mp4"), fromTo(1, 2));
    base::Result<void> result;
    std::thread([&] {
        const WithoutPrivileges without;
        result = job.run();
    }).join();
    std::filesystem::permissions(directory(), std::filesystem::perms::owner_all);
    ASSERT_FALSE(result);
    EXPECT_THAT(result.error()->description(), HasSubstr("“out.mp4” cannot be written: that is not allowed"));
    EXPECT_TRUE(files().empty());
}

TEST_F(AnOutput, LeavesNothingOnAFullDisk)
{
    for (const auto& calls : {std::vector<RefusedSystemCall>{{SYS_pwrite64, ENOSPC}},
                              std::vector<RefusedSystemCall>{{SYS_pwrite64, ENOSPC}, noUnnamedFiles()}}) {
        const auto result = runJobRefusing(calls, exportMovie("h264.mp4"), fromTo(1, 2));
        ASSERT_FALSE(result);
        EXPECT_THAT(result.error()->description(), HasSubstr("“out.mp4” cannot be written: the disk is full"));
        EXPECT_TRUE(files().empty());
    }
}

TEST_F(AnOutput, LeavesNothingOfAFileThatMayNotGrowFurther)
{
    rlimit before{};
    getrlimit(RLIMIT_FSIZE, &before);
    std::signal(SIGXFSZ, SIG_IGN);
    const rlimit small{90'000, before.rlim_max};
    setrlimit(RLIMIT_FSIZE, &small);
    const auto result = runJob(exportMovie("h264-sparse.mp4"), std::nullopt);
    setrlimit(RLIMIT_FSIZE, &before);
    ASSERT_FALSE(result);
    EXPECT_THAT(result.error()->description(),
                HasSubstr("“out.mp4” cannot be written: the disk takes no file that large"));
    EXPECT_TRUE(files().empty());
}

TEST_F(AnOutput, IsWholeAlsoWhereEveryFileHasAName)
{
    const auto result = runJobRefusing({noUnnamedFiles()}, exportMovie("h264.mp4"), fromTo(1, 2));
    ASSERT_TRUE(result) << result.error()->description();
    EXPECT_EQ(files(), std::vector<std::string>{"out.mp4"});
    EXPECT_EQ(DecodedMovie(output()).all().size(), 30U);
}

TEST_F(AnOutput, HasItsIndexInFront)
{
    ASSERT_EQ(cut(exportMovie("two-tracks.mp4"), output(), fromTo(1, 3)), ExportStatus::Completed);
    const std::string bytes = bytesOf(output());
    EXPECT_LT(bytes.find("moov"), bytes.find("mdat"));
}

TEST_F(AnOutput, TakesNoMoreRoomThanItNeeds)
{
    for (const char* name : {"h264.mp4", "h264-b.mp4", "two-tracks.mp4", "hevc.mp4", "h264-fragmented.mp4"}) {
        ASSERT_EQ(cut(exportMovie(name), output(), std::nullopt), ExportStatus::Completed) << errorText();
        const auto size = std::filesystem::file_size(output());
        const auto source = std::filesystem::file_size(exportMovie(name));
        EXPECT_LT(size, source + source / 20 + 2000) << name;
        const std::string bytes = bytesOf(output());
        EXPECT_LT(bytes.find("moov"), bytes.find("mdat"));
        std::filesystem::remove(output());
    }
}

TEST_F(AnOutput, IsMadeOfAMovieWhoseFileIsGone)
{
    std::filesystem::copy_file(exportMovie("h264.mp4"), output("source.mp4"));
    const auto session = sessionFor(output("source.mp4"), output(), fromTo(1, 2));
    ASSERT_EQ(open(output("source.mp4")), Status::ReadyToPlay);
    std::filesystem::remove(output("source.mp4"));
    EXPECT_EQ(run(session), ExportStatus::Completed) << errorText();
    EXPECT_EQ(DecodedMovie(output()).all().size(), 30U);
}

TEST_F(AnOutput, OfAMovieThatIsRemovedAtTheStartIsWholeAThousandTimes)
{
    base::WorkerQueue remover;
    for (int i = 0; i < 1000; ++i) {
        const std::string source = output("source.mp4");
        std::filesystem::copy_file(exportMovie("h264-open.mp4"), source);
        // The editor holds the movie open as it plays it; it asks for the removal and then for the export.
        const auto played = media.assetWithURL(base::Url::fromPath(source));
        ASSERT_TRUE(waitFor([&] { return played->duration().isNumeric(); }));
        remover.post([source] { std::filesystem::remove(source); });
        ASSERT_EQ(cut(source, output(), Range{at(i % 40 * 0.1), at(1)}), ExportStatus::Completed)
            << i << ": " << errorText();
        remover.finish();
        ASSERT_EQ(files(), std::vector<std::string>{"out.mp4"});
        std::filesystem::remove(output());
    }
}

TEST_F(AnOutput, MayTakeTheNameOfItsSourceWhenThatIsRemoved)
{
    const std::string source = output("movie.mp4");
    std::filesystem::copy_file(exportMovie("h264.mp4"), source);
    ASSERT_EQ(open(source), Status::ReadyToPlay);
    base::WorkerQueue remover;
    ffmpeg::ExportJob job{std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie(),
                          source,
                          fromTo(1, 2),
                          std::nullopt,
                          std::make_shared<std::atomic<bool>>(false),
                          {},
                          &log};
    // As late as it can come before the name is given.
    job.progress = [&, isAsked = false](double part) mutable {
        if (part >= 1 && !std::exchange(isAsked, true))
            remover.post([&] { std::filesystem::remove(source); });
    };
    const auto result = job.run();
    ASSERT_TRUE(result) << result.error()->description();
    EXPECT_EQ(DecodedMovie(source).all().size(), 30U);
}

TEST_F(AnOutput, DoesNotReplaceItsSourceWhenThatStays)
{
    const std::string source = output("movie.mp4");
    std::filesystem::copy_file(exportMovie("h264.mp4"), source);
    EXPECT_EQ(cut(source, source, fromTo(1, 2)), ExportStatus::Failed);
    EXPECT_THAT(errorText(), HasSubstr("there is such a file already"));
    EXPECT_EQ(bytesOf(source), bytesOf(exportMovie("h264.mp4")));
}

TEST_F(AnOutput, HasRoomForItsIndexAlsoWhereMorePacketsComeThanThought)
{
    ASSERT_EQ(open(exportMovie("h264-b.mp4")), Status::ReadyToPlay);
    const auto source = std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie();
    const auto cancelled = std::make_shared<std::atomic<bool>>(false);
    std::vector<std::unique_ptr<ffmpeg::TrackSource>> tracks;
    tracks.push_back(ffmpeg::openVideoSource(source, {at(0), at(5)}, ffmpeg::VideoMode::Copy, cancelled, {}).value());
    auto file = ffmpeg::OutputFile::create(output()).value();
    // As if the index had been thought to be nearly empty.
    const ffmpeg::WriteJob job{*file, tracks, nullptr, source->timescale(), -1450, 5, cancelled, {}};
    const auto written = ffmpeg::writeMovie(job);
    ASSERT_TRUE(written) << written.error()->description();
    EXPECT_TRUE(ffmpeg::checkOutput(*file, written.value(), cancelled));
    ASSERT_TRUE(file->publish());
    const std::string bytes = bytesOf(output());
    EXPECT_LT(bytes.find("moov"), bytes.find("mdat"));
    EXPECT_EQ(DecodedMovie(output()).all().size(), 150U);
    EXPECT_LT(bytes.size(), std::filesystem::file_size(exportMovie("h264-b.mp4")) + 2000);
}

class NothingAtAll final : public ffmpeg::TrackSource {
public:
    base::Result<void> describe(AVStream& output) override
    {
        output.codecpar->codec_type = AVMEDIA_TYPE_AUDIO;
        output.codecpar->codec_id = AV_CODEC_ID_MP3;
        output.codecpar->sample_rate = 48000;
        av_channel_layout_default(&output.codecpar->ch_layout, 2);
        output.time_base = {1, 48000};
        return {};
    }
    base::Result<bool> next(AVPacket& /*none*/) override { return false; }
};

TEST_F(AnOutput, MayLackATrackThatHasNothingInTheRange)
{
    ASSERT_EQ(open(exportMovie("h264.mp4")), Status::ReadyToPlay);
    const auto source = std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie();
    const auto cancelled = std::make_shared<std::atomic<bool>>(false);
    std::vector<std::unique_ptr<ffmpeg::TrackSource>> tracks;
    tracks.push_back(std::make_unique<NothingAtAll>());
    tracks.push_back(ffmpeg::openVideoSource(source, {at(0), at(3)}, ffmpeg::VideoMode::Copy, cancelled, {}).value());
    auto file = ffmpeg::OutputFile::create(output()).value();
    const auto written =
        ffmpeg::writeMovie({*file, tracks, nullptr, source->timescale(), 1000, 3, cancelled, {}}).value();
    const auto checked = ffmpeg::checkOutput(*file, written, cancelled);
    EXPECT_TRUE(checked) << checked.error()->description();
    auto wanted = written;
    wanted.push_back(written.back());
    const auto wrong = ffmpeg::checkOutput(*file, wanted, cancelled);
    ASSERT_FALSE(wrong);
    EXPECT_THAT(wrong.error()->description(), HasSubstr("not all of its tracks are in it"));
}

TEST_F(AnOutput, WhoseSoundIsWrongIsNoReasonToEncodeItsPictures)
{
    ASSERT_EQ(open(exportMovie("sound-late.mp4")), Status::ReadyToPlay);
    const auto source = std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie();
    const auto cancelled = std::make_shared<std::atomic<bool>>(false);
    const ffmpeg::ExportRange range{at(0), at(3)};
    std::vector<std::unique_ptr<ffmpeg::TrackSource>> tracks;
    tracks.push_back(ffmpeg::openVideoSource(source, range, ffmpeg::VideoMode::Copy, cancelled, {}).value());
    auto sounds = ffmpeg::openSoundSources(source, range, std::nullopt, ffmpeg::SoundMode::Copy, cancelled,
                                           [](const std::string&) {});
    tracks.push_back(std::move(sounds.value().front()));
    auto file = ffmpeg::OutputFile::create(output()).value();
    const auto written =
        ffmpeg::writeMovie({*file, tracks, nullptr, source->timescale(), 1000, 3, cancelled, {}}).value();
    ASSERT_TRUE(ffmpeg::checkOutput(*file, written, cancelled));
    for (const std::size_t track : {0U, 1U}) {
        auto wanted = written;
        ++wanted[track].packets;
        const auto checked = ffmpeg::checkOutput(*file, wanted, cancelled);
        ASSERT_FALSE(checked);
        EXPECT_EQ(ffmpeg::saysCannotCopy(checked.error()), track == 0);
        EXPECT_EQ(ffmpeg::saysCannotCopySound(checked.error()), track == 1);
    }
}

} // namespace
} // namespace tests
