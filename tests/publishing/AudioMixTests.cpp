#include "publishing/VKAudioMixUtility.h"

#include "support/FakePlatform.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <chrono>
#include <optional>
#include <string>
#include <thread>
#include <vector>

namespace {

using base::Url;
using platform::ExportSession;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;

class AudioMix : public testing::Test {
protected:
    static constexpr const char* kMovie = "/movie.mp4";

    tests::FakePlatform fake;
    int completions = 0;
    std::vector<std::string> loggedByThen; ///< on the console, when the completion was called
    std::optional<Url> output;
    base::ErrorRef error;
    std::thread::id completedOn;

    /// A session that runs lives until it ends.
    void TearDown() override
    {
        fake.machine.drain();
        if (const auto session = fake.media.exportSession(); session && session->isRunning())
            session->finish(ExportSession::Status::Completed);
        fake.machine.drain();
    }

    void movieWithSoundTracks(int count)
    {
        fake.media.movies[kMovie] = tests::FakeMovie::lasting(10, {640, 360}, count);
    }
    void mix(const std::optional<Url>& movie)
    {
        VKAudioMixUtility::mixAudioForMovie_withCompletionHandler(
            fake.platform, movie, [this](const std::optional<Url>& theOutput, const base::ErrorRef& theError) {
                ++completions;
                output = theOutput;
                error = theError;
                completedOn = std::this_thread::get_id();
                loggedByThen = consoleLog();
            });
    }
    void mixMovie()
    {
        mix(Url::fromPath(kMovie));
        fake.machine.drain();
    }
    std::vector<std::string> consoleLog() const { return fake.machine.log.texts(base::MemoryLog::Line::Kind::Console); }
};

TEST_F(AudioMix, WithoutAMovieTheCompletionIsCalledBeforeTheMethodReturns)
{
    mix(std::nullopt);
    ASSERT_EQ(completions, 1);
    EXPECT_EQ(output, std::nullopt);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->code(), -5818);
    EXPECT_FALSE(error->description().empty());
    EXPECT_EQ(fake.media.exportSessionCount(), 0u);
    EXPECT_THAT(consoleLog(), IsEmpty());
}

TEST_F(AudioMix, EachSoundTrackIsAnInputInTheMoviesOrder)
{
    movieWithSoundTracks(2);
    mixMovie();
    const auto session = fake.media.exportSession();
    ASSERT_TRUE(session->isRunning());
    ASSERT_TRUE(session->audioMix);
    EXPECT_THAT(session->audioMix->inputs, ElementsAre(platform::AudioMixInput{2}, platform::AudioMixInput{3}));
    EXPECT_EQ(session->fileType, platform::FileType::Mpeg4);
    EXPECT_EQ(session->timeRange, std::nullopt);
    EXPECT_THAT(session->asset->url(), Optional(Url::fromPath(kMovie)));
}

TEST_F(AudioMix, AMovieWithoutSoundIsExportedWithAnEmptyMix)
{
    movieWithSoundTracks(0);
    mixMovie();
    const auto session = fake.media.exportSession();
    ASSERT_TRUE(session->isRunning());
    ASSERT_TRUE(session->audioMix);
    EXPECT_THAT(session->audioMix->inputs, IsEmpty());
}

TEST_F(AudioMix, TheOutputIsNamedAfterTheSecondInTheTemporaryStore)
{
    movieWithSoundTracks(1);
    const auto second = std::to_string(fake.machine.clock.date().wholeSeconds());
    EXPECT_EQ(VKAudioMixUtility::tempFileURL(fake.platform).path(),
              "/private/var/mobile/Library/Velkor//VKClipsa_Final" + second + ".mp4");
    mixMovie();
    EXPECT_EQ(fake.media.exportSession()->outputURL(), VKAudioMixUtility::tempFileURL(fake.platform));
    EXPECT_FALSE(fake.files.holds(VKAudioMixUtility::tempFileURL(fake.platform).path()));
}

TEST_F(AudioMix, TwoCallsInOneSecondHaveTheSameOutputSoThatTheSecondFails)
{
    movieWithSoundTracks(1);
    fake.machine.advance(std::chrono::milliseconds(1)); // the clock began with a second
    mixMovie();
    const auto first = fake.media.exportSession();
    fake.machine.advance(std::chrono::milliseconds(998));
    mixMovie();
    const auto second = fake.media.exportSession();
    ASSERT_NE(first, second);
    EXPECT_EQ(first->outputURL(), second->outputURL());
    fake.machine.advance(std::chrono::milliseconds(1));
    EXPECT_NE(VKAudioMixUtility::tempFileURL(fake.platform), first->outputURL()) << "the next second has its own";

    first->finish(ExportSession::Status::Completed);
    EXPECT_EQ(output, first->outputURL());
    fake.files.addFile(output->path(), 500);
    second->finish(ExportSession::Status::Failed, base::Error::fromErrno(EEXIST, "create " + output->path()));
    EXPECT_EQ(completions, 2);
    EXPECT_EQ(output, std::nullopt);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->code(), -5812);
    EXPECT_TRUE(fake.files.holds(first->outputURL()->path())) << "what the first has made is not the second's";
}

TEST_F(AudioMix, SuccessGivesTheOutputAndNoError)
{
    movieWithSoundTracks(1);
    mixMovie();
    EXPECT_EQ(completions, 0);
    const auto session = fake.media.exportSession();
    session->finish(ExportSession::Status::Completed);
    ASSERT_EQ(completions, 1);
    EXPECT_EQ(output, session->outputURL());
    EXPECT_FALSE(error);
    EXPECT_THAT(consoleLog(), IsEmpty());
}

TEST_F(AudioMix, AnyStatusButFailedAndCancelledIsSuccess)
{
    movieWithSoundTracks(1);
    mixMovie();
    fake.media.exportSession()->finish(ExportSession::Status::Unknown);
    EXPECT_TRUE(output);
    EXPECT_FALSE(error);
}

TEST_F(AudioMix, AFailedExportIsAnErrorOfTheSystemsOwn)
{
    movieWithSoundTracks(1);
    mixMovie();
    fake.media.exportSession()->finish(ExportSession::Status::Failed, base::Error::make("ffmpeg", -28, "No space."));
    ASSERT_EQ(completions, 1);
    EXPECT_EQ(output, std::nullopt);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->code(), -5812);
    EXPECT_THAT(consoleLog(), ElementsAre("VKAudioMixUtility: MovieWriterFailed"));
    EXPECT_EQ(loggedByThen, consoleLog());
}

TEST_F(AudioMix, ACancelledExportIsTheSameErrorWithItsOwnLogLine)
{
    movieWithSoundTracks(1);
    mixMovie();
    fake.media.exportSession()->finish(ExportSession::Status::Cancelled);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->code(), -5812);
    EXPECT_THAT(consoleLog(), ElementsAre("VKAudioMixUtility: MovieWriterStatusCancelled"));
    EXPECT_EQ(loggedByThen, consoleLog());
}

TEST_F(AudioMix, AMovieThatCannotBeOpenedIsStillHandedToTheExportWhichFails)
{
    fake.media.movies[kMovie] = tests::FakeMovie::failing();
    mixMovie();
    const auto session = fake.media.exportSession();
    ASSERT_TRUE(session->isRunning());
    EXPECT_THAT(session->audioMix->inputs, IsEmpty());
}

TEST_F(AudioMix, TheCompletionRunsOnTheExportsThreadAndWhatItKeptGoesOnTheMainQueue)
{
    movieWithSoundTracks(1);
    mixMovie();
    std::weak_ptr<tests::FakeExportSession> weak;
    std::thread::id exporter;
    {
        auto session = fake.media.exportSession();
        weak = session;
        std::thread thread([&exporter, session = std::move(session)]() mutable {
            exporter = std::this_thread::get_id();
            session->finish(ExportSession::Status::Completed);
            session.reset();
        });
        thread.join();
    }
    EXPECT_EQ(completedOn, exporter);
    EXPECT_FALSE(weak.expired()) << "its last reference must not go on another thread";
    fake.machine.drain();
    EXPECT_TRUE(weak.expired());
}

TEST_F(AudioMix, ItMayBeCalledFromAnyThread)
{
    movieWithSoundTracks(2);
    std::thread([this] { mix(Url::fromPath(kMovie)); }).join();
    EXPECT_EQ(fake.media.exportSessionCount(), 0u) << "set up on the main queue";
    fake.machine.drain();
    ASSERT_TRUE(fake.media.exportSession());
    EXPECT_TRUE(fake.media.exportSession()->isRunning());
}

} // namespace
