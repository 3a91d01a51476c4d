// Random ranges of movies of every kind, each output decoded and compared with its source picture by picture.
#include "linux/ffmpeg/exporting/ExportTest.h"

#include <random>
#include <set>

namespace tests {
namespace {

struct Kind {
    const char* file;
    /// Whether ranges that hold a whole group keep its packets.
    bool isCopied;
    int seed;
};

void PrintTo(const Kind& kind, std::ostream* stream)
{
    *stream << kind.file;
}

constexpr int kRanges = 20;
constexpr double kTolerance = 0.001;
constexpr double kAlike = 45; // dB

class RandomCuts : public ExportTest, public testing::WithParamInterface<Kind> {
protected:
    /// What is expected of a range: the source's pictures with the times that they have in it.
    struct Expected {
        const DecodedPicture* picture;
        double seconds;
    };

    std::vector<Expected> expected(double start, double end) const
    {
        std::vector<Expected> pictures;
        for (const DecodedPicture& each : source) {
            if (each.seconds >= end - 1e-7)
                break;
            if (each.seconds <= start + 1e-7)
                pictures.clear();
            pictures.push_back({&each, std::max(0.0, each.seconds - start)});
        }
        return pictures;
    }

    void check(const std::string& path, double start, double end)
    {
        const auto wanted = expected(start, end);
        const Complaints complaints;
        DecodedMovie decoded(path);
        ASSERT_TRUE(decoded.isGood());
        const auto got = decoded.all();
        EXPECT_EQ(Complaints::texts(), "");
        EXPECT_EQ(decoded.refused(), 0);
        ASSERT_EQ(got.size(), wanted.size());
        int copied = 0;
        std::set<int> shown;
        for (std::size_t i = 0; i < got.size(); ++i) {
            ASSERT_EQ(got[i].number, wanted[i].picture->number) << "picture " << i;
            ASSERT_NEAR(got[i].seconds, wanted[i].seconds, kTolerance) << "picture " << i;
            copied += got[i].hash == wanted[i].picture->hash;
            ASSERT_GT(likeness(got[i], *wanted[i].picture), kAlike) << "picture " << i;
            shown.insert(got[i].number);
        }
        copies += copied;
        const double last = wanted.back().seconds;
        const double length = double(decoded.context().duration) / AV_TIME_BASE;
        EXPECT_GT(length, last);
        EXPECT_LE(length, end - start + 0.002);
        for (const DecodedPicture& each : DecodedMovie(path, DecodedMovie::Edits::Ignore).all())
            EXPECT_TRUE(shown.contains(each.number)) << each.number << " was removed";
        for (const double part : {0.9, 0.1, 0.5}) {
            const std::size_t which = std::size_t(part * double(got.size()));
            EXPECT_EQ(decoded.numberAfterSeeking(got[which].seconds), got[which].number);
        }
    }

    std::vector<DecodedPicture> source;
    int copies = 0;
};

TEST_P(RandomCuts, HaveExactlyTheirPictures)
{
    const std::string path = exportMovie(GetParam().file);
    ASSERT_EQ(open(path), Status::ReadyToPlay);
    source = DecodedMovie(path).all();
    ASSERT_FALSE(source.empty());
    const double origin = path.ends_with(".ts") ? source.front().seconds : 0;
    for (DecodedPicture& each : source)
        each.seconds -= origin;
    const double length = asset->duration().seconds();
    std::mt19937 random(static_cast<unsigned>(GetParam().seed));
    std::uniform_real_distribution<double> moment(0, length);
    for (int i = 0; i < kRanges && !HasFatalFailure(); ++i) {
        double start = 0;
        double end = 0;
        do {
            start = moment(random);
            end = moment(random);
        } while (end - start < 0.1 || expected(start, end).empty());
        SCOPED_TRACE(std::to_string(i) + ": " + std::to_string(start) + " to " + std::to_string(end));
        const Range range{MediaTime::fromSeconds(start, 90000), MediaTime::fromSeconds(end - start, 90000)};
        ASSERT_EQ(cut(path, output(), range), ExportStatus::Completed) << errorText();
        const std::int32_t ticks = asset->duration().timescale;
        check(output(), range.start.convertedTo(ticks).seconds(), range.end().convertedTo(ticks).seconds());
        std::filesystem::remove(output());
    }
    if (!GetParam().isCopied)
        return;
    EXPECT_GT(copies, 20);
    for (const std::string& line : log.texts(base::MemoryLog::Line::Kind::Message))
        EXPECT_NE(line.find("no group of pictures begins in the range"), std::string::npos) << line;
}

INSTANTIATE_TEST_SUITE_P(
    , RandomCuts,
    testing::Values(Kind{"h264.mp4", true, 1}, Kind{"h264-b.mp4", true, 2}, Kind{"h264-open.mp4", true, 3},
                    Kind{"h264-sparse.mp4", true, 4}, Kind{"h264-one-group.mp4", false, 5},
                    Kind{"h264-444.mp4", true, 6}, Kind{"h264-10bit.mp4", true, 7}, Kind{"h264-baseline.mp4", true, 8},
                    Kind{"h264-interlaced.mp4", true, 9}, Kind{"h264-in-band.mp4", true, 10},
                    Kind{"h264-changing.mp4", false, 11}, Kind{"h264-b.mkv", true, 12}, Kind{"h264-b.ts", true, 13},
                    Kind{"h264-fragmented.mp4", true, 14}, Kind{"h264-vfr.mp4", true, 15},
                    Kind{"h264-vfr.mkv", true, 16}, Kind{"h264-edit-list.mp4", true, 17},
                    Kind{"h264-rotated.mp4", true, 18}, Kind{"h264-late.mp4", true, 19},
                    Kind{"two-tracks.mp4", true, 20}, Kind{"vp9.webm", true, 21}, Kind{"vp9-hidden.webm", true, 22},
                    Kind{"vp9-444.mkv", true, 23}, Kind{"av1.mp4", true, 24}, Kind{"av1-hidden.mkv", true, 25},
                    Kind{"vp8.webm", false, 26}, Kind{"mpeg4.mp4", false, 27}, Kind{"mjpeg.mov", false, 28},
                    Kind{"hevc.mp4", true, 29}, Kind{"hevc-b.mkv", true, 30}, Kind{"hevc-open.mp4", false, 31},
                    Kind{"hevc-10bit.mp4", true, 32}),
    [](const auto& each) {
        std::string name = each.param.file;
        std::replace_if(
            name.begin(), name.end(), [](char c) { return c == '-' || c == '.'; }, '_');
        return name;
    });

} // namespace
} // namespace tests
