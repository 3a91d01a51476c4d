#include "DecodedSound.h"
#include "ExportedSound.h"
#include "SoundFiles.h"

#include "linux/ffmpeg/exporting/sound/Limiter.h"
#include "support/PrivateDirectory.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace {

using namespace tests;

/// The loudest moment, between the samples too: eight times as many, by a long filter.
double truePeak(const std::vector<float>& samples)
{
    constexpr int kReach = 32;
    constexpr int kPlaces = 8;
    double peak = 0;
    for (std::size_t i = kReach; i + kReach < samples.size(); ++i) {
        if (std::abs(samples[i]) < 0.4f && std::abs(samples[i + 1]) < 0.4f)
            continue;
        for (int place = 0; place < kPlaces; ++place) {
            double sum = 0;
            for (int tap = -kReach + 1; tap <= kReach; ++tap) {
                const double x = std::numbers::pi * (tap - static_cast<double>(place) / kPlaces);
                const double window = 0.5 + 0.5 * std::cos(x / kReach);
                sum += static_cast<double>(samples[i + static_cast<std::size_t>(tap + kReach) - kReach])
                       * (x == 0 ? 1 : std::sin(x) / x) * window;
            }
            peak = std::max(peak, std::abs(sum));
        }
    }
    return peak;
}

SoundTrackSpec track(Signal signal, const std::string& encoder = "aac", int rate = 48000, int channels = 2,
                     double seconds = 5)
{
    SoundTrackSpec spec;
    spec.signal = std::move(signal);
    spec.encoder = encoder;
    spec.rate = rate;
    spec.channels = channels;
    spec.seconds = seconds;
    spec.bitRate = encoder == "aac" ? 192000 : 0;
    return spec;
}

class Mixing : public testing::Test {
protected:
    std::string path(const std::string& name) const { return (directory.path() / name).string(); }
    ExportedSound mix(const std::string& name, double from = 0, double to = -1)
    {
        const auto exported = exportSound(path(name), path("mix.mp4"), from, to, mixOfAll(path(name)));
        EXPECT_EQ(exported.error, "");
        EXPECT_EQ(exported.tracks, 1u);
        return exported;
    }

    PrivateDirectory directory;
};

TEST_F(Mixing, EachTrackIsHeardAtItsOwnLevelOnBothSides)
{
    makeSoundFile(path("two.mp4"), {track(tone(440, 0.3)), track(tone(1000, 0.2), "aac", 48000, 1)});
    EXPECT_EQ(mix("two.mp4").log, std::vector<std::string>{});
    const auto mixed = decodeSound(path("mix.mp4"));
    EXPECT_EQ(mixed.codec, "aac");
    EXPECT_EQ(mixed.rate, 48000);
    ASSERT_EQ(mixed.channels.size(), 2u);
    for (const auto& channel : mixed.channels) {
        EXPECT_NEAR(decibels(toneIn(channel, 48000, 440, 48000, 192000)), decibels(0.3), 0.1);
        EXPECT_NEAR(decibels(toneIn(channel, 48000, 1000, 48000, 192000)), decibels(0.2), 0.1);
    }
}

TEST_F(Mixing, TwoLoudTracksDoNotClipAndStayWhatTheyAreWhereTheyAreSoft)
{
    const auto loudFor = [](double frequency) {
        return [=](double seconds, int) {
            const double level = seconds > 2 && seconds < 3 ? 0.98 : 0.2;
            return level * std::sin(2 * std::numbers::pi * frequency * seconds + 0.4);
        };
    };
    makeSoundFile(path("loud.mp4"), {track(loudFor(440)), track(loudFor(997))});
    mix("loud.mp4");
    const auto mixed = decodeSound(path("mix.mp4"));
    for (const auto& channel : mixed.channels) {
        EXPECT_LT(truePeak(channel), 1.0);
        EXPECT_GT(truePeak(channel), 0.8);
        EXPECT_NEAR(decibels(toneIn(channel, 48000, 440, 24000, 90000)), decibels(0.2), 0.1);
        EXPECT_NEAR(decibels(toneIn(channel, 48000, 997, 150000, 230000)), decibels(0.2), 0.1);
    }
}

TEST_F(Mixing, SilenceStaysDigitalSilence)
{
    const auto silence = [](double, int) { return 0.0; };
    makeSoundFile(path("silent.mp4"), {track(silence), track(silence, "aac", 44100, 1)});
    mix("silent.mp4");
    const auto mixed = decodeSound(path("mix.mp4"));
    ASSERT_GT(mixed.length(), 230000u);
    for (const auto& channel : mixed.channels)
        EXPECT_TRUE(std::all_of(channel.begin(), channel.end(), [](float sample) { return sample == 0; }));
}

TEST_F(Mixing, TracksOfOtherRatesLayoutsStartsAndLengthsMeetInTheirPlaces)
{
    // A click every half second, in each track at the same moments.
    const auto clicks = [](double frequency, double start) {
        return [=](double seconds, int) {
            const double within = std::fmod(seconds + start, 0.5);
            return within < 0.008 ? 0.05 * std::sin(2 * std::numbers::pi * frequency * within) : 0.0;
        };
    };
    auto late = track(clicks(250, 1.25), "flac", 24000, 1, 3);
    late.start = 1.25;
    makeSoundFile(path("many.mkv"),
                  {track(clicks(250, 0)), late, track(clicks(250, 0), "pcm_s16le", 44100, 2, 4),
                   track(clicks(250, 0), "flac", 32000, 2, 5), track(clicks(250, 0), "ac3", 48000, 6)});
    mix("many.mkv");
    const auto mixed = decodeSound(path("mix.mp4"));
    EXPECT_EQ(mixed.rate, 48000);
    EXPECT_NEAR(static_cast<double>(mixed.length()), 5 * 48000, 3000);
    // Matroska has no time before 0: all of it moved by the first track's priming.
    constexpr std::int64_t kMoved = 1024;
    for (int click = 1; click < 9; ++click) {
        const std::int64_t wanted = click * 24000 + kMoved;
        double best = 0;
        std::int64_t found = 0;
        for (std::int64_t at = wanted - 480; at < wanted + 480; ++at) {
            double sum = 0;
            for (std::int64_t i = 0; i < 384; ++i)
                sum += static_cast<double>(mixed.at(at + i, 0))
                       * std::sin(2 * std::numbers::pi * 250 * static_cast<double>(i) / 48000);
            if (sum > best) {
                best = sum;
                found = at;
            }
        }
        EXPECT_LE(std::abs(found - wanted), 24) << "click " << click;
        // All that sound at this moment add up, which they do only when they are in step; the one with six channels counts
        // for more.
        const double heard = best * 2 / 384;
        EXPECT_GT(heard, click == 8 ? 0.22 : click < 3 ? 0.23 : 0.27) << "click " << click;
    }
}

TEST_F(Mixing, AfterTenMinutesTheTracksAreStillInTheirPlaces)
{
    // A short tone every minute; the second track's half a minute later, at a rate that has to be changed.
    const auto clicks = [](double offset) {
        return [=](double seconds, int) {
            const double within = std::fmod(seconds + offset, 60);
            return within < 0.02 ? 0.4 * std::sin(2 * std::numbers::pi * 500 * within) : 0.0;
        };
    };
    makeSoundFile(path("long.mp4"),
                  {track(clicks(0), "aac", 16000, 1, 600), track(clicks(30), "libmp3lame", 11025, 1, 600)});
    mix("long.mp4");
    const DecodedSound sources[] = {decodeSound(path("long.mp4"), 0), decodeSound(path("long.mp4"), 1)};
    const auto mixed = decodeSound(path("mix.mp4"));
    ASSERT_EQ(mixed.rate, 16000);
    const auto placeIn = [](const DecodedSound& sound, double around) {
        double best = 0;
        double found = 0;
        const auto from = std::llround((around - 0.2) * sound.rate);
        for (std::int64_t at = from; at < from + sound.rate * 2 / 5; ++at) {
            double sum = 0;
            for (std::int64_t i = 0; i < sound.rate / 50; ++i)
                sum += static_cast<double>(sound.at(at + i, 0))
                       * std::sin(2 * std::numbers::pi * 500 * static_cast<double>(i) / sound.rate);
            if (sum > best) {
                best = sum;
                found = static_cast<double>(at) / sound.rate;
            }
        }
        return found;
    };
    for (const int minute : {1, 5, 9}) {
        EXPECT_NEAR(placeIn(mixed, minute * 60), placeIn(sources[0], minute * 60), 0.001) << minute;
        EXPECT_NEAR(placeIn(mixed, minute * 60 + 30), placeIn(sources[1], minute * 60 + 30), 0.001) << minute;
    }
}

TEST_F(Mixing, ADamagedTrackIsNamedAndTheOthersAreHeard)
{
    makeSoundFile(path("good.mkv"), {track(tone(440, 0.2)), track(tone(1000, 0.2), "flac"), track(tone(3000, 0.1))});
    // Of the second track nothing is left that could be decoded.
    {
        AVFormatContext* opened = nullptr;
        ASSERT_GE(avformat_open_input(&opened, path("good.mkv").c_str(), nullptr, nullptr), 0);
        ffmpeg::Owned<AVFormatContext> input(opened);
        avformat_find_stream_info(opened, nullptr);
        AVFormatContext* output = nullptr;
        avformat_alloc_output_context2(&output, nullptr, nullptr, path("bad.mkv").c_str());
        for (unsigned i = 0; i < input->nb_streams; ++i) {
            AVStream* stream = avformat_new_stream(output, nullptr);
            avcodec_parameters_copy(stream->codecpar, input->streams[i]->codecpar);
            stream->time_base = input->streams[i]->time_base;
        }
        avio_open(&output->pb, path("bad.mkv").c_str(), AVIO_FLAG_WRITE);
        ASSERT_GE(avformat_write_header(output, nullptr), 0);
        const auto packet = ffmpeg::newPacket();
        while (av_read_frame(input.get(), packet.get()) >= 0) {
            if (packet->stream_index == 1) {
                ASSERT_GE(av_packet_make_writable(packet.get()), 0);
                for (int i = 0; i < packet->size; ++i)
                    packet->data[i] = static_cast<std::uint8_t>(i * 31 + 7);
            }
            av_write_frame(output, packet.get());
            av_packet_unref(packet.get());
        }
        av_write_trailer(output);
        avio_closep(&output->pb);
        avformat_free_context(output);
    }
    const auto exported = mix("bad.mkv");
    ASSERT_EQ(exported.log.size(), 1u);
    EXPECT_NE(exported.log.front().find("Sound track 2 of “bad.mkv”"), std::string::npos) << exported.log.front();
    const auto mixed = decodeSound(path("mix.mp4"));
    EXPECT_NEAR(decibels(toneIn(mixed.channels[0], 48000, 440, 48000, 192000)), decibels(0.2), 0.1);
    EXPECT_NEAR(decibels(toneIn(mixed.channels[0], 48000, 3000, 48000, 192000)), decibels(0.1), 0.1);
    EXPECT_LT(decibels(toneIn(mixed.channels[0], 48000, 1000, 48000, 192000)), -60);
}

TEST_F(Mixing, SixteenTracksAddUp)
{
    std::vector<SoundTrackSpec> tracks;
    for (int i = 0; i < 16; ++i)
        tracks.push_back(track(tone(300 + 100 * i, 0.03), "aac", i % 2 ? 44100 : 48000, 1 + i % 2, 3));
    makeSoundFile(path("sixteen.mp4"), tracks);
    mix("sixteen.mp4");
    const auto mixed = decodeSound(path("mix.mp4"));
    for (int i = 0; i < 16; ++i)
        EXPECT_NEAR(decibels(toneIn(mixed.channels[1], 48000, 300 + 100 * i, 24000, 120000)), decibels(0.03), 0.2) << i;
}

TEST_F(Mixing, AMixOfNothingHasNoSoundAndWhatIsNoSoundIsLeftOut)
{
    makeSoundFile(path("two.mp4"), {track(tone(440, 0.3)), track(tone(1000, 0.2))});
    EXPECT_EQ(exportSound(path("two.mp4"), path("mix.mp4"), 0, -1, platform::AudioMix{}).tracks, 0u);
    auto inputs = mixOfAll(path("two.mp4"));
    inputs.inputs.push_back({77});
    const auto exported = exportSound(path("two.mp4"), path("mix.mp4"), 0, -1, inputs);
    EXPECT_EQ(exported.tracks, 1u);
    ASSERT_EQ(exported.log.size(), 1u);
    EXPECT_NE(exported.log.front().find("Track 77"), std::string::npos);
}

TEST_F(Mixing, ASingleAacTrackKeepsItsPackets)
{
    makeSoundFile(path("one.mp4"), {track(speechLike(0.4))});
    const auto exported = exportSound(path("one.mp4"), path("mix.mp4"), 0, -1, mixOfAll(path("one.mp4")));
    EXPECT_EQ(exported.log, std::vector<std::string>{});
    EXPECT_EQ(decodeSound(path("mix.mp4")).bytes, decodeSound(path("one.mp4")).bytes);
}

TEST_F(Mixing, TheRangeIsMixedToTheSample)
{
    makeSoundFile(path("two.mp4"), {track(speechLike(0.3)), track(tone(5000, 0.01), "aac", 48000, 1)});
    const auto source = decodeSound(path("two.mp4"));
    const double from = 1.2345;
    mix("two.mp4", from, 4.2);
    const auto mixed = decodeSound(path("mix.mp4"));
    EXPECT_EQ(mixed.start, 0);
    EXPECT_NEAR(static_cast<double>(mixed.length()), (4.2 - from) * 48000 + 512, 514);
    double off = 0;
    for (std::int64_t i = 2000; i < 100000; ++i) {
        const double error = static_cast<double>(mixed.at(i, 0) - source.at(i + std::llround(from * 48000), 0));
        off += error * error;
    }
    EXPECT_LT(decibels(std::sqrt(off / 98000)), -38) << "the tone of the other track and little else";
}

TEST(Limiting, LeavesEverythingAloneThatIsSoftEnough)
{
    ffmpeg::Limiter limiter(48000, 2);
    ffmpeg::Planes samples(2, std::vector<float>(20000));
    for (std::size_t i = 0; i < 20000; ++i)
        samples[0][i] = samples[1][i] = static_cast<float>(0.88 * std::sin(0.05 * static_cast<double>(i)));
    samples[1][10000] = 1.7f;
    auto given = limiter.push(samples);
    const auto rest = limiter.finish();
    for (std::size_t channel = 0; channel < 2; ++channel)
        given[channel].insert(given[channel].end(), rest[channel].begin(), rest[channel].end());
    ASSERT_EQ(given[0].size(), 20000u);
    for (std::size_t i = 0; i < 20000; ++i) {
        ASSERT_LE(std::abs(given[1][i]), ffmpeg::Limiter::kCeiling + 1e-6f) << i;
        if (i < 9500 || i > 10500) {
            ASSERT_EQ(given[0][i], samples[0][i]) << i;
        }
    }
    EXPECT_LT(std::abs(given[0][9990]), std::abs(samples[0][9990]) * 0.6f) << "both sides, or the sound would move";
}

TEST(Limiting, DoesNotDependOnHowTheSoundIsHandedIn)
{
    ffmpeg::Planes samples(1, std::vector<float>(30000));
    for (std::size_t i = 0; i < 30000; ++i)
        samples[0][i] = static_cast<float>((i / 3000 % 2 ? 1.6 : 0.5) * std::sin(0.3 * static_cast<double>(i)));
    std::vector<float> whole;
    for (const std::size_t step : {30000u, 1000u, 37u}) {
        ffmpeg::Limiter limiter(48000, 1);
        std::vector<float> given;
        for (std::size_t from = 0; from < 30000; from += step) {
            const std::size_t until = std::min<std::size_t>(from + step, 30000);
            const auto some = limiter.push({{samples[0].begin() + static_cast<std::ptrdiff_t>(from),
                                             samples[0].begin() + static_cast<std::ptrdiff_t>(until)}});
            given.insert(given.end(), some[0].begin(), some[0].end());
        }
        const auto rest = limiter.finish();
        given.insert(given.end(), rest[0].begin(), rest[0].end());
        ASSERT_EQ(given.size(), 30000u);
        if (whole.empty())
            whole = given;
        for (std::size_t i = 0; i < given.size(); ++i)
            ASSERT_NEAR(given[i], whole[i], 1e-6) << step << ", " << i;
        EXPECT_LT(truePeak(given), 0.91);
    }
}

} // namespace
