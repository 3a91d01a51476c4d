// What is said of a movie, whatever it is kept in.
#include "linux/ffmpeg/MovieFacts.h"
#include "support/Paths.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <ostream>
#include <string>

namespace {

struct Kind {
    const char* file;
    const char* container; ///< part of its name
    const char* picture;
    const char* sound; ///< empty when there is none
    int pictures;
    friend void PrintTo(const Kind& kind, std::ostream* out) { *out << kind.file; }
};

class Facts : public testing::TestWithParam<Kind> {};

TEST_P(Facts, AreToldOfEveryKindOfMovie)
{
    const auto& [name, container, picture, sound, pictures] = GetParam();
    const auto cancelled = std::make_shared<std::atomic<bool>>(false);
    auto file = ffmpeg::OpenFile::open(tests::movie(name));
    ASSERT_TRUE(file);
    const auto movie = ffmpeg::Movie::open(std::move(file).value(), cancelled);
    ASSERT_TRUE(movie) << movie.error()->description();
    const auto facts = ffmpeg::MovieFacts::of(*movie.value(), cancelled);
    ASSERT_TRUE(facts) << facts.error()->description();
    EXPECT_NE(facts.value().container.find(container), std::string::npos) << facts.value().container;
    EXPECT_NEAR(facts.value().duration, 1, 0.15);
    ASSERT_TRUE(facts.value().picture);
    EXPECT_EQ(facts.value().picture->codec, picture);
    EXPECT_EQ(facts.value().picture->count, pictures);
    ASSERT_EQ(facts.value().sounds.size(), *sound ? 1U : 0U);
    if (*sound) {
        EXPECT_EQ(facts.value().sounds.front().codec, sound);
        EXPECT_EQ(facts.value().sounds.front().channels, 2);
    }
}

TEST(MovieFacts, OfAMovieWithAHeaderAreAlsoWhatOnlyItsPacketsTell)
{
    const auto cancelled = std::make_shared<std::atomic<bool>>(false);
    const auto movie =
        ffmpeg::Movie::open(std::move(ffmpeg::OpenFile::open(tests::movie("vp9.webm"))).value(), cancelled);
    const auto facts = ffmpeg::MovieFacts::of(*movie.value(), cancelled);
    ASSERT_TRUE(facts);
    EXPECT_EQ(facts.value().picture->profile, "Profile 0");
}

INSTANTIATE_TEST_SUITE_P(
    , Facts,
    // What is copied ends with the pictures that others need.
    testing::Values(Kind{"kind.avi", "AVI", "h264", "aac", 32}, Kind{"kind.flv", "FLV", "h264", "aac", 32},
                    Kind{"kind.nut", "NUT", "h264", "aac", 32}, Kind{"kind.ts", "MPEG-TS", "h264", "aac", 32},
                    Kind{"kind.latm.ts", "MPEG-TS", "h264", "aac_latm", 32},
                    Kind{"kind.mpeg4.avi", "AVI", "mpeg4", "mp3", 30},
                    Kind{"kind.mpeg4.mp4", "MP4", "mpeg4", "aac", 30},
                    Kind{"kind.mpg", "MPEG-PS", "mpeg2video", "mp2", 30}, Kind{"kind.asf", "ASF", "wmv2", "wmav2", 30},
                    Kind{"kind.ogg", "Ogg", "vp8", "opus", 30}, Kind{"kind.ivf", "IVF", "vp8", "", 30},
                    Kind{"kind.gif", "GIF", "gif", "", 25}),
    [](const auto& each) {
        std::string name = each.param.file;
        for (char& letter : name)
            letter = letter == '.' ? '_' : letter;
        return name;
    });

} // namespace
