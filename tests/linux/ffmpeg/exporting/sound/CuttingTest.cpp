#include "DecodedSound.h"
#include "ExportedSound.h"
#include "SoundFiles.h"

#include "support/PrivateDirectory.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>

namespace {

using namespace tests;

class CuttingSound : public testing::Test {
protected:
    std::string path(const std::string& name) const { return (directory.path() / name).string(); }

    /// The loudest difference to the source in windows of 5 ms, in dB of full scale; `from` and `to` in seconds.
    static double worstDifference(const DecodedSound& source, const DecodedSound& cut, double from, double to)
    {
        const auto first = std::llround(std::round(from * 90000) * source.rate / 90000); // as the range has it
        const auto last = std::llround(to * source.rate);
        const std::int64_t window = source.rate / 200;
        double worst = 0;
        for (std::size_t channel = 0; channel < source.channels.size(); ++channel) {
            // The channel for low frequencies cannot begin at once.
            if (source.channels.size() == 6 && channel == 3)
                continue;
            for (std::int64_t at = first; at + window <= last; at += window) {
                double sum = 0;
                for (std::int64_t i = at; i < at + window; ++i) {
                    const double off = static_cast<double>(cut.at(i - first, channel) - source.at(i, channel));
                    sum += off * off;
                }
                worst = std::max(worst, std::sqrt(sum / static_cast<double>(window)));
            }
        }
        return decibels(worst);
    }

    PrivateDirectory directory;
};

SoundTrackSpec speech(const std::string& encoder, int rate, int channels, double seconds = 6)
{
    SoundTrackSpec spec;
    spec.encoder = encoder;
    spec.rate = rate;
    spec.channels = channels;
    spec.signal = speechLike(0.4);
    spec.seconds = seconds;
    return spec;
}

TEST_F(CuttingSound, ACutOfAacIsTheSourcesSoundToTheSampleAndMostPacketsAreTheSourcesOwn)
{
    for (const auto& [rate, channels] : {std::pair{48000, 2}, {44100, 1}, {48000, 6}, {32000, 2}}) {
        SCOPED_TRACE(std::to_string(rate) + " Hz, " + std::to_string(channels) + " channels");
        makeSoundFile(path("source.mp4"), {speech("aac", rate, channels)});
        const auto source = decodeSound(path("source.mp4"));
        std::mt19937 random(7);
        for (int i = 0; i < 6; ++i) {
            const double from = std::uniform_real_distribution(0.0, 3.0)(random);
            const double to = from + std::uniform_real_distribution(1.0, 2.9)(random);
            SCOPED_TRACE(std::to_string(from) + " to " + std::to_string(to));
            const auto exported = exportSound(path("source.mp4"), path("cut.mp4"), from, to);
            ASSERT_EQ(exported.error, "");
            EXPECT_EQ(exported.log, std::vector<std::string>{});
            const auto cut = decodeSound(path("cut.mp4"));
            EXPECT_EQ(cut.errors, 0);
            EXPECT_EQ(cut.start, 0);
            // Decoders give whole frames, the last one too.
            EXPECT_NEAR(static_cast<double>(cut.length()), (to - from) * rate + 512, 514);
            EXPECT_LT(worstDifference(source, cut, from, to), channels == 6 ? -55 : -60);
            std::size_t own = 0;
            for (const auto& bytes : cut.bytes)
                own += std::find(source.bytes.begin(), source.bytes.end(), bytes) != source.bytes.end();
            EXPECT_GT(own + 12, cut.packets);
        }
    }
}

TEST_F(CuttingSound, PacketsOfEncodersWithOtherWindowsAreJoinedJustAsWell)
{
    for (const int channels : {1, 2}) {
        auto spec = speech("aac", 48000, channels);
        spec.signal = humming(0.4);
        spec.bitRate = 128000 * channels;
        makeSineWindowedFile(path("source.mp4"), spec);
        const auto source = decodeSound(path("source.mp4"));
        {
            // The file is what it is meant to be.
            const auto wanted = humming(0.4);
            double worst = 0;
            for (std::int64_t i = 48000; i < 200000; ++i)
                worst = std::max(worst, std::abs(source.at(i, 0) - wanted(static_cast<double>(i) / 48000, 0)));
            ASSERT_LT(worst, 0.03);
        }
        std::mt19937 random(3);
        for (int i = 0; i < 6; ++i) {
            const double from = std::uniform_real_distribution(0.1, 3.0)(random);
            const double to = from + std::uniform_real_distribution(1.0, 2.8)(random);
            SCOPED_TRACE(std::to_string(from) + " to " + std::to_string(to));
            const auto exported = exportSound(path("source.mp4"), path("cut.mp4"), from, to);
            EXPECT_EQ(exported.log, std::vector<std::string>{});
            // The noise in it is beyond what AAC keeps; windows that do not fit would leave -30 dB.
            EXPECT_LT(worstDifference(source, decodeSound(path("cut.mp4")), from, to), -57);
        }
    }
}

TEST_F(CuttingSound, NothingFromOutsideTheRangeIsLeftInTheFile)
{
    struct Kind {
        const char* encoder;
        double from; ///< seconds; for AAC at different places within a packet
    };
    for (const auto& [encoder, from] :
         {Kind{"aac", 1.7531}, Kind{"aac", 1.7585}, Kind{"aac", 1.7639}, Kind{"aac", 1.7693}, Kind{"libopus", 1.7531},
          Kind{"libmp3lame", 1.7531}, Kind{"flac", 1.7531}, Kind{"ac3", 1.7531}}) {
        SCOPED_TRACE(encoder + std::string(" from ") + std::to_string(from));
        auto spec = speech(encoder, 48000, 2);
        spec.bitRate = std::string(encoder) == "flac" ? 0 : 256000;
        // A loud tone up to the very start of the range and from its very end on, a soft other one within.
        const double to = from + 2.3676;
        spec.signal = [from = from, to](double seconds, int) {
            const bool isWithin = seconds >= from && seconds < to;
            return isWithin ? 0.05 * std::sin(2 * std::numbers::pi * 440 * seconds)
                            : 0.7 * std::sin(2 * std::numbers::pi * 3000 * seconds);
        };
        const auto name = path(std::string(encoder) == "flac" ? "source.mkv" : "source.mp4");
        makeSoundFile(name, {spec});
        ASSERT_EQ(exportSound(name, path("cut.mp4"), from + 0.002, to - 0.002).error, "");
        const auto all = decodeSound(path("cut.mp4"), 0, true);
        ASSERT_GT(all.length(), 48000u);
        double worst = 0;
        for (std::size_t at = 0; at + 240 <= all.length(); at += 60)
            worst = std::max(worst, toneIn(all.channels[0], 48000, 3000, at, at + 240));
        // What these codecs smear over a moment that is so near.
        EXPECT_LT(decibels(worst), -34);
        EXPECT_NEAR(toneIn(all.channels[0], 48000, 440, 24000, 48000), 0.05, 0.004);
    }
}

TEST_F(CuttingSound, WhatCannotBeCutIsEncodedAnewAtItsPlaceAndTheLogSaysWhy)
{
    struct Kind {
        const char* encoder;
        const char* file;
        int rate;
        int channels;
        const char* result;
    };
    for (const Kind& kind :
         {Kind{"libopus", "source.webm", 48000, 2, "aac"}, Kind{"libopus", "source.mp4", 48000, 1, "aac"},
          Kind{"libvorbis", "source.webm", 44100, 2, "aac"}, Kind{"libmp3lame", "source.mp4", 44100, 2, "aac"},
          Kind{"ac3", "source.mp4", 48000, 6, "aac"}, Kind{"flac", "source.mkv", 44100, 2, "flac"},
          Kind{"alac", "source.mp4", 48000, 2, "alac"}, Kind{"pcm_s16le", "source.mkv", 48000, 2, "aac"},
          Kind{"pcm_s16le", "source.mkv", 22050, 1, "aac"}}) {
        SCOPED_TRACE(std::string(kind.encoder) + " in " + kind.file);
        makeSoundFile(path(kind.file), {speech(kind.encoder, kind.rate, kind.channels)});
        const auto source = decodeSound(path(kind.file));
        std::mt19937 random(11);
        for (int i = 0; i < 4; ++i) {
            const double from = std::uniform_real_distribution(0.2, 3.0)(random);
            const double to = from + std::uniform_real_distribution(1.0, 2.5)(random);
            SCOPED_TRACE(std::to_string(from) + " to " + std::to_string(to));
            const auto exported = exportSound(path(kind.file), path("cut.mp4"), from, to);
            ASSERT_EQ(exported.error, "");
            ASSERT_EQ(exported.log.size(), 1u);
            EXPECT_NE(exported.log.front().find("is encoded again"), std::string::npos) << exported.log.front();
            const auto cut = decodeSound(path("cut.mp4"));
            EXPECT_EQ(cut.codec, kind.result);
            EXPECT_EQ(cut.rate, kind.rate);
            EXPECT_EQ(cut.channels.size(), static_cast<std::size_t>(kind.channels));
            EXPECT_EQ(cut.start, 0);
            EXPECT_NEAR(static_cast<double>(cut.length()), (to - from) * kind.rate + 512, 514);
            // Files whose times are rounded to milliseconds allow no more than that.
            const std::int64_t skipped = kind.rate / 5;
            const auto late =
                latenessOf(cut, skipped, source, std::llround(from * kind.rate) + skipped, kind.rate / 2, 600);
            EXPECT_LE(std::abs(late), kind.rate / 1500);
            if (cut.codec == "alac") {
                EXPECT_LT(worstDifference(source, cut, from, to), -100);
            }
        }
    }
}

} // namespace
