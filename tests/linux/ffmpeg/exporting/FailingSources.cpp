// Movies whose files cannot be read to the end, or become others meanwhile: what was made of them is not the movie.
#include "linux/ffmpeg/exporting/ExportTest.h"
#include "support/CaseName.h"

#include <gmock/gmock.h>

#include <sys/stat.h>
#include <unistd.h>

namespace tests {
namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;

class AFailingSource : public ExportTest, public testing::WithParamInterface<const char*> {
protected:
    std::string source() const { return directory() + "/source-" + GetParam(); }
    void SetUp() override
    {
        fs::copy_file(exportMovie(GetParam()), source());
        ASSERT_EQ(open(source()), Status::ReadyToPlay);
        job.movie = std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie();
        job.output = output();
        job.cancelled = std::make_shared<std::atomic<bool>>(false);
        job.log = &log;
    }
    /// As a disk with a bad place: what lies behind the first half cannot be read, on the thread that runs `body`.
    template <typename Body> void onABadDisk(Body body)
    {
        const auto half = static_cast<std::uint32_t>(fs::file_size(source()) / 2);
        const auto file = static_cast<std::uint32_t>(descriptorOf(source()));
        whileRefusing({{SYS_pread64, EIO, 0, file, true, 3, half}}, body);
    }
    static int descriptorOf(const std::string& path)
    {
        for (const auto& each : fs::directory_iterator("/proc/self/fd")) {
            std::error_code error;
            if (fs::read_symlink(each.path(), error) == path)
                return std::stoi(each.path().filename());
        }
        ADD_FAILURE() << path << " is not open";
        return -1;
    }
    void expectNothingButWords(const base::Result<void>& result, const std::string& words) const
    {
        ASSERT_FALSE(result);
        EXPECT_THAT(result.error()->description(), HasSubstr("“source-" + std::string(GetParam()) + "”"));
        EXPECT_THAT(result.error()->description(), HasSubstr(words));
        EXPECT_EQ(files(), std::vector<std::string>{"source-" + std::string(GetParam())});
    }

    ffmpeg::ExportJob job;
};

TEST_P(AFailingSource, IsNotTakenForItsFirstHalfWhereTheDiskFails)
{
    base::Result<void> result;
    onABadDisk([&] { result = job.run(); });
    expectNothingButWords(result, "it cannot be read to its end");
}

TEST_P(AFailingSource, IsNotMixedToItsFirstHalfWhereTheDiskFails)
{
    job.mix = platform::audioMixOfAllTracks(*asset);
    base::Result<void> result;
    onABadDisk([&] { result = job.run(); });
    expectNothingButWords(result, "it cannot be read to its end");
}

TEST_P(AFailingSource, MayHaveFailedBefore)
{
    onABadDisk([&] { EXPECT_FALSE(job.run()); });
    const auto again = job.run();
    EXPECT_TRUE(again) << again.error()->description();
}

TEST_P(AFailingSource, MayNotBecomeShorterMeanwhile)
{
    bool isShort = false;
    job.progress = [&](double) {
        if (!std::exchange(isShort, true))
            fs::resize_file(source(), fs::file_size(source()) / 2);
    };
    expectNothingButWords(job.run(), "it was changed");
    EXPECT_TRUE(isShort);
}

TEST_P(AFailingSource, MayNotBecomeLongerMeanwhile)
{
    job.progress = [&](double) { std::ofstream(source(), std::ios::app) << "more"; };
    expectNothingButWords(job.run(), "it was changed");
}

TEST_P(AFailingSource, MayNotBeOverwrittenMeanwhile)
{
    const std::string other(fs::file_size(source()), 'x');
    job.progress = [&](double) { std::ofstream(source(), std::ios::binary | std::ios::in) << other; };
    expectNothingButWords(job.run(), "it was changed");
}

TEST_P(AFailingSource, MayNotHaveBecomeAnotherSinceItWasOpened)
{
    fs::resize_file(source(), fs::file_size(source()) / 2);
    expectNothingButWords(job.run(), "it was changed");
    EXPECT_FALSE(saysEncodedAsAWhole()) << "that takes long, for nothing";
}

TEST_P(AFailingSource, MayGetAnotherNameAndBeRemovedMeanwhile)
{
    job.progress = [&](double) {
        std::error_code error;
        fs::create_hard_link(source(), output("other"), error);
        fs::remove(source(), error);
    };
    const auto result = job.run();
    EXPECT_TRUE(result) << result.error()->description();
}

INSTANTIATE_TEST_SUITE_P(, AFailingSource,
                         testing::Values("heavy.mp4", "heavy.mkv", "heavy.ts", "heavy.nut", "heavy.avi", "heavy.flv",
                                         "heavy.asf", "heavy-fragmented.mp4"),
                         [](const auto& each) { return caseName(each.param); });

} // namespace
} // namespace tests
