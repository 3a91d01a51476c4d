// What whoever exports sees: status, errors, ranges, what is kept.
#include "linux/ffmpeg/exporting/ExportTest.h"
#include "linux/ffmpeg/exporting/sound/DecodedSound.h"
#include "support/CaseName.h"

#include <gmock/gmock.h>

#include <future>
#include <limits>
#include <thread>

namespace tests {
namespace {

using testing::HasSubstr;

class AnExport : public ExportTest {};

TEST_F(AnExport, TellsItsEndOnceOnAThreadOfItsOwn)
{
    const auto session = sessionFor(exportMovie("h264.mp4"), output(), fromTo(1, 2));
    EXPECT_EQ(session->status(), ExportStatus::Unknown);
    EXPECT_EQ(session->progress(), 0);
    std::atomic<int> ended = 0;
    std::thread::id thread;
    session->exportAsynchronously([&] {
        thread = std::this_thread::get_id();
        EXPECT_EQ(session->status(), ExportStatus::Completed);
        ++ended;
    });
    EXPECT_EQ(ended, 0);
    EXPECT_EQ(session->status(), ExportStatus::Waiting);
    ASSERT_TRUE(waitFor([&] { return ended > 0; }));
    EXPECT_NE(thread, std::this_thread::get_id());
    EXPECT_EQ(session->error(), nullptr);
    EXPECT_EQ(session->progress(), 1);
    EXPECT_EQ(session->outputURL()->path(), output());
}

TEST_F(AnExport, MayWaitForTheMainQueueWhereItTellsItsEnd)
{
    bool ran = false;
    std::atomic<bool> told = false;
    {
        const auto session = sessionFor(exportMovie("h264.mp4"), output(), fromTo(1, 2));
        session->exportAsynchronously([&] {
            mainQueue.run([&] { ran = true; });
            told = true;
        });
    }
    // Nobody but itself holds the session now.
    asset = nullptr;
    EXPECT_TRUE(waitFor([&] { return told.load(); }));
    EXPECT_TRUE(ran);
    EXPECT_EQ(files(), std::vector<std::string>{"out.mp4"});
}

TEST_F(AnExport, ToTheNameOfAnotherThatIsUnderWayFailsAtOnceAndTheOtherIsThere)
{
    const auto first = sessionFor(exportMovie("h264.mp4"), output(), fromTo(1, 2));
    const auto keepOpen = asset;
    const auto second = sessionFor(exportMovie("h264.mp4"), output(), fromTo(3, 4));
    std::atomic<bool> ended = false;
    std::promise<void> refused;
    first->exportAsynchronously([&] { ended = true; });
    second->exportAsynchronously([&] { refused.set_value(); });
    // The main queue stands still meanwhile: no movie is opened for it.
    ASSERT_EQ(refused.get_future().wait_for(std::chrono::seconds(30)), std::future_status::ready);
    EXPECT_EQ(second->status(), ExportStatus::Failed);
    EXPECT_THAT(second->error()->description(), HasSubstr("“out.mp4” cannot be written"));
    ASSERT_TRUE(waitFor([&] { return ended.load(); }));
    EXPECT_EQ(first->status(), ExportStatus::Completed);
    EXPECT_EQ(DecodedMovie(output()).all().size(), 30U);

    std::filesystem::remove(output());
    EXPECT_EQ(cut(exportMovie("h264.mp4"), output(), fromTo(3, 4)), ExportStatus::Completed)
        << "the name is free again";
}

TEST_F(AnExport, LeavesTheSourceAsItIs)
{
    const std::string before = bytesOf(exportMovie("h264-b.mp4"));
    ASSERT_EQ(cut(exportMovie("h264-b.mp4"), output(), fromTo(0.5, 3)), ExportStatus::Completed);
    EXPECT_EQ(bytesOf(exportMovie("h264-b.mp4")), before);
}

TEST_F(AnExport, HasTheRangeThatLiesInTheMovie)
{
    ASSERT_EQ(cut(exportMovie("h264.mp4"), output("late.mp4"), Range{at(4), at(1000)}), ExportStatus::Completed);
    EXPECT_EQ(DecodedMovie(output("late.mp4")).all().size(), 30U);
    ASSERT_EQ(cut(exportMovie("h264.mp4"), output("early.mp4"), Range{at(-1), at(2)}), ExportStatus::Completed);
    EXPECT_EQ(DecodedMovie(output("early.mp4")).all().size(), 30U);
    ASSERT_EQ(cut(exportMovie("h264.mp4"), output("endless.mp4"), Range{at(4), MediaTime::positiveInfinity()}),
              ExportStatus::Completed)
        << errorText();
    EXPECT_EQ(DecodedMovie(output("endless.mp4")).all().size(), 30U);
}

TEST_F(AnExport, RefusesRangesThatHoldNothing)
{
    for (const Range& range :
         {Range{at(1), at(0)}, Range{at(2), at(-1)}, Range{at(5), at(1)}, Range{at(100), at(1)}, Range{at(-2), at(1)},
          Range{MediaTime::invalid(), at(1)}, Range{at(1), MediaTime::invalid()}, Range{MediaTime::indefinite(), at(1)},
          Range{at(1), MediaTime::make(1, 1'000'000'000)},
          Range{MediaTime::make(std::numeric_limits<std::int64_t>::max(), 1), at(1)}}) {
        EXPECT_EQ(cut(exportMovie("h264.mp4"), output(), range), ExportStatus::Failed);
        EXPECT_THAT(errorText(), HasSubstr("“h264.mp4” cannot be exported: the range"));
    }
    EXPECT_TRUE(files().empty());
}

TEST_F(AnExport, OfARangeBeforeTheFirstPictureShowsThat)
{
    for (const char* name : {"h264-late.mp4", "sound-early.mp4"}) {
        SCOPED_TRACE(name);
        std::filesystem::remove(output());
        ASSERT_EQ(cut(exportMovie(name), output(), fromTo(0.1, 0.5)), ExportStatus::Completed) << errorText();
        DecodedMovie decoded(output());
        const auto pictures = decoded.all();
        ASSERT_EQ(pictures.size(), 1U);
        EXPECT_EQ(pictures[0].number, 0);
        EXPECT_EQ(pictures[0].seconds, 0);
        EXPECT_NEAR(pictures[0].duration, 0.4, 0.001);
        EXPECT_NEAR(static_cast<double>(decoded.context().duration) / AV_TIME_BASE, 0.4, 0.025);
    }
    for (const std::string& line : log.texts(base::MemoryLog::Line::Kind::Message))
        EXPECT_THAT(line, HasSubstr("is encoded as a whole: the range ends before the first picture."));
}

TEST_F(AnExport, KeepsSoundWhoseHeaderOrLengthsTheFileDoesNotTell)
{
    for (const char* name : {"sound-no-header.mp4", "sound-doubled.mp4", "sound-doubled.mkv",
                             "sound-doubled-fragmented.mp4", "opus-fragmented.mp4"}) {
        SCOPED_TRACE(name);
        std::filesystem::remove(output());
        ASSERT_EQ(cut(exportMovie(name), output(), std::nullopt), ExportStatus::Completed) << errorText();
        EXPECT_EQ(log.texts(base::MemoryLog::Line::Kind::Message), std::vector<std::string>{});
        const auto out = decodeSound(output());
        EXPECT_EQ(out.errors, 0);
        EXPECT_EQ(out.rate, 48000);
        EXPECT_NEAR(static_cast<double>(out.length()), static_cast<double>(decodeSound(exportMovie(name)).length()),
                    2048);
    }
}

TEST_F(AnExport, KeepsEveryPacketWhenNothingIsCut)
{
    for (const char* name :
         {"h264-b.mp4", "h264-open.mp4", "h264-one-group.mp4", "h264-b.mkv", "h264-b.ts", "hevc-open.mp4"}) {
        ASSERT_EQ(cut(exportMovie(name), output(), std::nullopt), ExportStatus::Completed) << errorText();
        const auto source = DecodedMovie(exportMovie(name)).all();
        const auto copy = DecodedMovie(output()).all();
        ASSERT_EQ(copy.size(), source.size());
        for (std::size_t i = 0; i < copy.size(); ++i)
            EXPECT_EQ(copy[i].hash, source[i].hash) << name << i;
        EXPECT_NEAR(copy.back().seconds + copy.back().duration - copy.front().seconds,
                    source.back().seconds + source.back().duration - source.front().seconds, 0.002);
        std::filesystem::remove(output());
    }
    EXPECT_FALSE(saysEncodedAsAWhole());
}

TEST_F(AnExport, KeepsWhatIsSaidOfTheMovie)
{
    ASSERT_EQ(cut(exportMovie("two-tracks.mp4"), output(), fromTo(1, 3)), ExportStatus::Completed);
    DecodedMovie decoded(output());
    const auto value = [](AVDictionary* metadata, const char* key) {
        const AVDictionaryEntry* entry = av_dict_get(metadata, key, nullptr, 0);
        return std::string(entry ? entry->value : "");
    };
    AVFormatContext& context = decoded.context();
    EXPECT_THAT(value(context.metadata, "creation_time"), HasSubstr("2024-05-17T09:30:00"));
    EXPECT_EQ(value(context.metadata, "title"), "Recording");
    ASSERT_EQ(context.nb_streams, 3U);
    EXPECT_EQ(value(context.streams[1]->metadata, "handler_name"), "App sound");
    EXPECT_EQ(value(context.streams[2]->metadata, "handler_name"), "Microphone");
    const AVCodecParameters& parameters = *decoded.stream().codecpar;
    EXPECT_EQ(parameters.color_space, AVCOL_SPC_BT709);
    EXPECT_EQ(parameters.color_range, AVCOL_RANGE_MPEG);
}

TEST_F(AnExport, OfAMovieWithATimeCodeIsCopiedWithoutIt)
{
    for (const char* name : {"timecode.mp4", "timecode.mov"}) {
        for (const std::optional<Range>& range : {std::optional<Range>(), std::optional(fromTo(0.5, 2.5))}) {
            ASSERT_EQ(cut(exportMovie(name), output(), range), ExportStatus::Completed) << name << errorText();
            DecodedMovie decoded(output());
            EXPECT_EQ(decoded.context().nb_streams, 1U);
            EXPECT_EQ(av_dict_get(decoded.context().metadata, "timecode", nullptr, 0), nullptr);
            EXPECT_EQ(av_dict_get(decoded.stream().metadata, "timecode", nullptr, 0), nullptr);
            const auto pictures = decoded.all();
            EXPECT_EQ(pictures.size(), range ? 60U : 90U);
            EXPECT_EQ(pictures.front().number, range ? 15 : 0);
            std::filesystem::remove(output());
        }
    }
    EXPECT_FALSE(saysEncodedAsAWhole());
}

TEST_F(AnExport, OfAMovieThatBeginsSmallHasItsLargestSize)
{
    for (const char* name : {"vp8-growing.webm", "vp9-growing.webm"}) {
        for (const double start : {0.0, 0.2}) {
            ASSERT_EQ(cut(exportMovie(name), output(), fromTo(start, 1.8)), ExportStatus::Completed) << errorText();
            DecodedMovie decoded(output());
            // As the header says, which nothing that was decoded changes.
            AVFormatContext* opened = nullptr;
            ASSERT_GE(avformat_open_input(&opened, output().c_str(), nullptr, nullptr), 0);
            const ffmpeg::Owned<AVFormatContext> header(opened);
            EXPECT_EQ(header->streams[0]->codecpar->width, 320) << name;
            EXPECT_EQ(header->streams[0]->codecpar->height, 180) << name;
            const auto pictures = decoded.all();
            ASSERT_EQ(pictures.size(), start > 0 ? 48U : 54U) << name;
            EXPECT_EQ(pictures.back().number, 53);
            EXPECT_EQ(pictures.back().luma.size(), 320U * 180);
            std::filesystem::remove(output());
        }
    }
}

TEST_F(AnExport, SaysWhyMostOfItIsEncoded)
{
    ASSERT_EQ(cut(exportMovie("h264-sparse.mp4"), output(), fromTo(5, 11)), ExportStatus::Completed) << errorText();
    EXPECT_EQ(
        log.texts(base::MemoryLog::Line::Kind::Message),
        std::vector<std::string>{"“h264-sparse.mp4” is encoded for the most part: the first group of pictures in the "
                                 "range begins late."});
    ASSERT_EQ(cut(exportMovie("h264.mp4"), output("other.mp4"), fromTo(0.5, 4.5)), ExportStatus::Completed);
    EXPECT_EQ(log.texts(base::MemoryLog::Line::Kind::Message).size(), 1U) << "that is as expected";
}

TEST_F(AnExport, OfVp9ThatMp4CannotDescribeIsEncoded)
{
    ASSERT_EQ(cut(exportMovie("vp9-440.webm"), output(), std::nullopt), ExportStatus::Completed) << errorText();
    EXPECT_EQ(DecodedMovie(output()).stream().codecpar->codec_id, AV_CODEC_ID_H264);
    EXPECT_EQ(log.texts(base::MemoryLog::Line::Kind::Message),
              std::vector<std::string>{"“vp9-440.webm” is encoded as a whole: MP4 does not hold VP9 whose colours are "
                                       "halved in height alone."});
}

TEST_F(AnExport, HasNoLargerSizeThanThePicturesInItsRange)
{
    ASSERT_EQ(cut(exportMovie("vp8-growing.webm"), output(), fromTo(0, 0.4)), ExportStatus::Completed) << errorText();
    EXPECT_EQ(DecodedMovie(output()).stream().codecpar->width, 160);
    EXPECT_EQ(DecodedMovie(output()).stream().codecpar->height, 90);
}

TEST_F(AnExport, SaysOnceWhatItFindsAgainWhenItBeginsAnew)
{
    const auto session = sessionFor(exportMovie("h264-changing.mp4"), output(), std::nullopt);
    platform::AudioMix mix;
    mix.inputs.push_back({99});
    session->setAudioMix(mix);
    ASSERT_EQ(run(session), ExportStatus::Completed) << errorText();
    EXPECT_TRUE(saysEncodedAsAWhole());
    const auto lines = log.texts(base::MemoryLog::Line::Kind::Message);
    EXPECT_EQ(std::count_if(lines.begin(), lines.end(),
                            [](const std::string& line) { return line.starts_with("Track 99 of"); }),
              1);
}

// A keyframe there is only where a refresh begins, and the pictures behind it are not whole yet.
TEST_F(AnExport, OfPicturesThatAreRefreshedPartByPartHasAllOfThem)
{
    for (const auto& [start, end] : {std::pair(1.05, 1.4), {1.5, 1.9}, {1.95, 2.2}, {3.9, 4.0}}) {
        ASSERT_EQ(cut(exportMovie("h264-refresh.mp4"), output(), fromTo(start, end)), ExportStatus::Completed);
        const auto source = DecodedMovie(exportMovie("h264-refresh.mp4")).all();
        for (const DecodedPicture& each : DecodedMovie(output()).all()) {
            ASSERT_GE(each.number, 0);
            EXPECT_GT(likeness(each, source[std::size_t(each.number)]), 40) << each.number;
        }
        std::filesystem::remove(output());
    }
}

TEST_F(AnExport, KeepsHowThePictureIsTurned)
{
    ASSERT_EQ(cut(exportMovie("h264-rotated.mp4"), output(), fromTo(1.1, 3)), ExportStatus::Completed);
    ASSERT_EQ(open(output()), Status::ReadyToPlay);
    const auto turned = asset->tracks().front().preferredTransform;
    ASSERT_EQ(open(exportMovie("h264-rotated.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(asset->tracks().front().preferredTransform, turned);
    EXPECT_NE(turned, base::AffineTransform());
}

TEST_F(AnExport, EndsSoonWhenItIsCancelled)
{
    const auto session = sessionFor(exportMovie("h264-one-group.mp4"), output(), fromTo(0.5, 3));
    std::atomic<bool> ended = false;
    session->exportAsynchronously([&] { ended = true; });
    session->cancelExport();
    ASSERT_TRUE(waitFor([&] { return ended.load(); }));
    EXPECT_EQ(session->status(), ExportStatus::Cancelled);
    EXPECT_EQ(session->error(), nullptr);
    EXPECT_TRUE(files().empty());
}

TEST_F(AnExport, EndsSoonWhenItIsCancelledOnTheWay)
{
    for (const char* name : {"h264-one-group.mp4", "h264.mp4", "two-tracks.mp4"}) {
        ASSERT_EQ(open(exportMovie(name)), Status::ReadyToPlay);
        const auto cancelled = std::make_shared<std::atomic<bool>>(false);
        double reached = 0;
        ffmpeg::ExportJob job{std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie(),
                              output(),
                              fromTo(0.5, 3),
                              std::nullopt,
                              cancelled,
                              {},
                              &log};
        job.progress = [&](double part) {
            EXPECT_GE(part, reached);
            reached = part;
            *cancelled = part > 0.4;
        };
        EXPECT_FALSE(job.run());
        EXPECT_GT(reached, 0.4);
        EXPECT_LT(reached, 0.5);
        EXPECT_TRUE(files().empty());
    }
}

class BadMovies : public AnExport, public testing::WithParamInterface<const char*> {};

TEST_P(BadMovies, GiveAMovieOrAnErrorThatNamesThem)
{
    for (const auto& range : {std::optional<Range>(), std::optional(fromTo(0.4, 1.3)), std::optional(fromTo(1.2, 3))}) {
        const auto status = cut(movie(GetParam()), output(), range);
        if (status == ExportStatus::Completed) {
            EXPECT_TRUE(DecodedMovie(output()).isGood() || std::string(GetParam()) == "audio-only.m4a");
            std::filesystem::remove(output());
        } else {
            EXPECT_EQ(status, ExportStatus::Failed);
            EXPECT_THAT(errorText(), HasSubstr(GetParam()));
        }
        EXPECT_TRUE(files().empty());
    }
}

INSTANTIATE_TEST_SUITE_P(, BadMovies,
                         testing::Values("empty.mp4", "not-a-movie.mp4", "no-moov.mp4", "truncated.mp4", "corrupt.mp4",
                                         "audio-only.m4a", "one-frame.mp4", "size-change.ts", "edit-list.mp4",
                                         "start-offset.mp4", "vfr.mkv", "non-square.mp4", "does-not-exist.mp4"),
                         [](const auto& each) { return caseName(each.param); });

TEST_F(AnExport, SaysWhatIsMissingOfATruncatedMovie)
{
    ASSERT_EQ(cut(movie("truncated.mp4"), output(), std::nullopt), ExportStatus::Completed) << errorText();
    bool isSaid = false;
    for (const std::string& line : log.texts(base::MemoryLog::Line::Kind::Message))
        isSaid = isSaid || line.find("“truncated.mp4” was cut off: of 4.0 s only the first") != std::string::npos;
    EXPECT_TRUE(isSaid);
    EXPECT_GT(DecodedMovie(output()).all().size(), 30U);
}

TEST_F(AnExport, SaysThatFieldsInPacketsOfTheirOwnAreNotCopied)
{
    ASSERT_EQ(cut(exportMovie("h264-fields.mp4"), output("pairs.mp4"), fromTo(0.5, 2.5)), ExportStatus::Completed);
    EXPECT_TRUE(log.texts(base::MemoryLog::Line::Kind::Message).empty());
    ASSERT_EQ(cut(exportMovie("h264-fields-apart.mp4"), output(), fromTo(0.5, 2.5)), ExportStatus::Completed);
    const auto lines = log.texts(base::MemoryLog::Line::Kind::Message);
    ASSERT_EQ(lines.size(), 1U);
    EXPECT_THAT(lines.front(), HasSubstr("the fields of its pictures stand in packets of their own"));
}

TEST_F(AnExport, OfOneThatChangesItsSizeShowsAllOfEachPicture)
{
    ASSERT_EQ(cut(movie("size-change.ts"), output(), std::nullopt), ExportStatus::Completed) << errorText();
    EXPECT_TRUE(saysEncodedAsAWhole());
    const auto pictures = DecodedMovie(output()).all();
    EXPECT_EQ(pictures.size(), 60U);
    EXPECT_EQ(pictures.front().number, 0);
}
} // namespace
} // namespace tests
