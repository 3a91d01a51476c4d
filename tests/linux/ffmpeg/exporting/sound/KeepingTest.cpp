#include "DecodedSound.h"
#include "ExportedSound.h"
#include "SoundFiles.h"

#include "support/PrivateDirectory.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>

namespace {

using namespace tests;

class KeepingSound : public testing::Test {
protected:
    std::string path(const std::string& name) const { return (directory.path() / name).string(); }
    static SoundTrackSpec track(const std::string& encoder, double seconds = 4, int channels = 2)
    {
        SoundTrackSpec spec;
        spec.encoder = encoder;
        spec.signal = speechLike(0.4);
        spec.seconds = seconds;
        spec.channels = channels;
        return spec;
    }

    PrivateDirectory directory;
};

TEST_F(KeepingSound, AWholeMovieKeepsEveryPacketWhereMp4CarriesThem)
{
    for (const char* encoder : {"aac", "libopus", "libmp3lame", "ac3", "alac", "flac"}) {
        SCOPED_TRACE(encoder);
        makeSoundFile(path("source.mp4"), {track(encoder)});
        const auto exported = exportSound(path("source.mp4"), path("out.mp4"), 0, -1);
        EXPECT_EQ(exported.error, "");
        EXPECT_EQ(exported.log, std::vector<std::string>{});
        const auto source = decodeSound(path("source.mp4"));
        const auto out = decodeSound(path("out.mp4"));
        EXPECT_EQ(out.bytes, source.bytes);
        EXPECT_EQ(out.start, source.start);
        EXPECT_EQ(out.firstPts, source.firstPts);
        EXPECT_EQ(out.channels, source.channels);
        EXPECT_EQ(out.errors, 0);
    }
}

TEST_F(KeepingSound, AllTracksStayWithWhatTheySayOfThemselves)
{
    auto app = track("aac");
    app.language = "eng";
    app.handler = "App sound";
    auto microphone = track("aac", 4, 1);
    microphone.language = "deu";
    microphone.handler = "Microphone";
    microphone.isDefault = false;
    auto other = track("libopus", 4, 1);
    other.language = "fra";
    other.handler = "Notes";
    other.isDefault = false;
    makeSoundFile(path("source.mp4"), {app, microphone, other});
    const auto exported = exportSound(path("source.mp4"), path("cut.mp4"), 1.1, 3.3);
    ASSERT_EQ(exported.tracks, 3u);
    EXPECT_EQ(exported.log.size(), 1u) << "only the last had to be encoded again";
    for (int i = 0; i < 3; ++i) {
        const auto source = decodeSound(path("source.mp4"), i);
        const auto cut = decodeSound(path("cut.mp4"), i);
        EXPECT_EQ(cut.language, source.language);
        EXPECT_EQ(cut.handler, source.handler);
        EXPECT_EQ(cut.disposition, source.disposition);
        EXPECT_EQ(cut.channels.size(), source.channels.size());
        EXPECT_EQ(cut.codec, "aac");
    }
}

TEST_F(KeepingSound, TracksThatBeginLateOrEndEarlyKeepTheirPlaces)
{
    auto late = track("aac", 2);
    late.start = 1.5;
    makeSoundFile(path("source.mp4"), {track("aac", 6), late, track("aac", 1)});
    for (const auto& [from, to] : {std::pair{0.7, 5.0}, {0.7, 2.5}, {2.0, 5.0}}) {
        SCOPED_TRACE(std::to_string(from) + " to " + std::to_string(to));
        const auto exported = exportSound(path("source.mp4"), path("cut.mp4"), from, to);
        EXPECT_EQ(exported.tracks, from < 1 ? 3u : 2u);
        EXPECT_EQ(exported.log.size(), from < 1 ? 0u : 1u);
        const auto source = decodeSound(path("source.mp4"), 1);
        const auto cut = decodeSound(path("cut.mp4"), 1);
        const auto moved = std::llround(from * 48000);
        for (std::int64_t i = std::max<std::int64_t>(0, 80000 - moved); i < 165000 - moved; i += 7)
            if (i < std::llround((to - from) * 48000)) {
                ASSERT_NEAR(cut.at(i, 0), source.at(i + moved, 0), 0.005) << i;
            }
        for (std::int64_t i = 0; i < 70000 - moved; i += 7)
            ASSERT_EQ(cut.at(i, 0), 0) << i;
    }
}

TEST_F(KeepingSound, WithoutSoundInTheRangeATrackIsLeftOutWhateverItsCodec)
{
    makeSoundFile(path("source.mkv"), {track("aac", 6), track("libvorbis", 1), track("aac", 1)});
    const auto exported = exportSound(path("source.mkv"), path("cut.mp4"), 3, 5);
    EXPECT_EQ(exported.error, "");
    EXPECT_EQ(exported.tracks, 1u);
    EXPECT_EQ(std::count_if(exported.log.begin(), exported.log.end(),
                            [](const std::string& line) {
                                return line.find("no sound of it in the range") != std::string::npos;
                            }),
              2);
}

TEST_F(KeepingSound, BroadcastStreamsAreCutToo)
{
    makeSoundFile(path("source.ts"), {track("aac", 6)});
    const auto source = decodeSound(path("source.ts"));
    const auto exported = exportSound(path("source.ts"), path("cut.mp4"), 1.2, 4.7);
    EXPECT_EQ(exported.error, "");
    EXPECT_EQ(exported.log, std::vector<std::string>{});
    const auto cut = decodeSound(path("cut.mp4"));
    EXPECT_EQ(cut.errors, 0);
    // Its times begin with the first packet.
    double off = 0;
    for (std::int64_t i = 0; i < 160000; ++i)
        off = std::max(off, static_cast<double>(
                                std::abs(cut.at(i, 0) - source.at(source.start + i + std::llround(1.2 * 48000), 0))));
    EXPECT_LT(off, 0.01);
}

TEST_F(KeepingSound, MatroskasMillisecondsDoNotTearTheSoundApart)
{
    for (const int rate : {48000, 44100}) {
        auto spec = track("aac", 6);
        spec.rate = rate;
        makeSoundFile(path("source.mkv"), {spec});
        const auto exported = exportSound(path("source.mkv"), path("cut.mp4"), 2.3, 5.1);
        EXPECT_EQ(exported.log, std::vector<std::string>{});
        const auto source = decodeSound(path("source.mkv"));
        const auto cut = decodeSound(path("cut.mp4"));
        // To the sample, but for where the file's first packet was rounded.
        double best = 1;
        for (std::int64_t shift = -30; shift <= 30; ++shift) {
            double off = 0;
            for (std::int64_t i = 0; i < static_cast<std::int64_t>(2.8 * rate); ++i)
                off = std::max(off, static_cast<double>(
                                        std::abs(cut.at(i, 0) - source.at(i + std::llround(2.3 * rate) + shift, 0))));
            best = std::min(best, off);
        }
        EXPECT_LT(best, 0.02);
    }
}

TEST_F(KeepingSound, AGapInTheSoundStaysAGap)
{
    auto spec = track("aac", 2);
    auto second = spec;
    second.start = 3;
    // Two parts in one track: the packets of the second follow those of the first, a second later.
    makeSoundFile(path("first.mp4"), {spec});
    {
        AVFormatContext* opened = nullptr;
        ASSERT_GE(avformat_open_input(&opened, path("first.mp4").c_str(), nullptr, nullptr), 0);
        ffmpeg::Owned<AVFormatContext> input(opened);
        AVFormatContext* output = nullptr;
        avformat_alloc_output_context2(&output, nullptr, nullptr, path("gap.mp4").c_str());
        AVStream* stream = avformat_new_stream(output, nullptr);
        avcodec_parameters_copy(stream->codecpar, input->streams[0]->codecpar);
        stream->time_base = {1, 48000};
        avio_open(&output->pb, path("gap.mp4").c_str(), AVIO_FLAG_WRITE);
        output->avoid_negative_ts = AVFMT_AVOID_NEG_TS_DISABLED;
        ASSERT_GE(avformat_write_header(output, nullptr), 0);
        const auto packet = ffmpeg::newPacket();
        while (av_read_frame(input.get(), packet.get()) >= 0) {
            if (packet->pts >= 48 * 1024)
                packet->pts = packet->dts += 48000;
            av_write_frame(output, packet.get());
            av_packet_unref(packet.get());
        }
        av_write_trailer(output);
        avio_closep(&output->pb);
        avformat_free_context(output);
    }
    const auto source = decodeSound(path("gap.mp4"));
    for (const bool isMixed : {false, true}) {
        auto mix = mixOfAll(path("gap.mp4"));
        const auto exported =
            exportSound(path("gap.mp4"), path("cut.mp4"), 0.5, 2.7, isMixed ? std::optional(mix) : std::nullopt);
        EXPECT_EQ(exported.error, "");
        const auto cut = decodeSound(path("cut.mp4"));
        for (std::int64_t i = 1000; i < 100000; i += 11) {
            const std::int64_t at = i + 24000;
            if (at < 47 * 1024 || at > 49 * 1024 + 48000) {
                ASSERT_NEAR(cut.at(i, 0), source.at(at, 0), 0.01) << i;
            }
        }
    }
}

TEST_F(KeepingSound, AacWithoutAHeaderGetsOne)
{
    for (const int channels : {1, 2}) {
        SCOPED_TRACE(channels);
        makeSoundFile(path("source.mp4"), {track("aac", 4, channels)});
        std::filesystem::copy(path("source.mp4"), path("bare.mp4"), std::filesystem::copy_options::overwrite_existing);
        removeAacHeaders(path("bare.mp4"));
        const auto source = decodeSound(path("source.mp4"));
        for (const auto& [from, to] : {std::pair{0.0, -1.0}, {1.1, 3.3}}) {
            const auto exported = exportSound(path("bare.mp4"), path("out.mp4"), from, to);
            EXPECT_EQ(exported.error, "");
            EXPECT_EQ(exported.log, std::vector<std::string>{});
            const auto out = decodeSound(path("out.mp4"));
            EXPECT_EQ(out.errors, 0);
            ASSERT_EQ(out.channels.size(), source.channels.size());
            for (std::int64_t i = 0; i < 100000; i += 7)
                ASSERT_NEAR(out.at(i, 0), source.at(i + std::llround(from * 48000), 0), 0.005) << i;
        }
        ASSERT_EQ(exportSound(path("bare.mp4"), path("out.mp4"), 0, -1, mixOfAll(path("bare.mp4"))).tracks, 1u);
        EXPECT_EQ(decodeSound(path("out.mp4")).bytes, source.bytes);
    }
}

TEST_F(KeepingSound, ATrackThatIsDamagedAsAWholeIsLeftOutForThatReason)
{
    makeSoundFile(path("source.mp4"), {track("aac")});
    removeAacHeaders(path("source.mp4"));
    damagePackets(path("source.mp4"));
    for (const bool isMixed : {false, true}) {
        const auto mix = isMixed ? std::optional(mixOfAll(path("source.mp4"))) : std::nullopt;
        const auto exported = exportSound(path("source.mp4"), path("out.mp4"), 0, -1, mix);
        EXPECT_EQ(exported.tracks, 0u);
        ASSERT_FALSE(exported.log.empty());
        EXPECT_NE(exported.log[0].find("its packets are damaged"), std::string::npos) << exported.log[0];
        for (const std::string& line : exported.log)
            EXPECT_EQ(line.find("no sound of it in the range"), std::string::npos) << line;
    }
}

TEST_F(KeepingSound, AacOfTwiceTheRateIsKeptWhereNothingIsCut)
{
    for (const auto doubled : {DoubledRate::InHeader, DoubledRate::InPackets})
        for (const char* name : {"source.mp4", "fragments.mp4", "source.mkv", "source.mov"}) {
            SCOPED_TRACE(std::string(name) + (doubled == DoubledRate::InHeader ? " (header)" : " (packets)"));
            auto spec = track("aac");
            spec.rate = 24000;
            spec.doubled = doubled;
            spec.start =
                -1500.0 / 24000; // as much as phones begin before what is heard: 0.105 s with the encoder's own
            makeSoundFile(path(name), {spec});
            const auto source = decodeSound(path(name));
            ASSERT_EQ(source.rate, 48000);
            for (const bool isMixed : {false, true}) {
                const auto mix = isMixed ? std::optional(mixOfAll(path(name))) : std::nullopt;
                const auto exported = exportSound(path(name), path("out.mp4"), 0, -1, mix);
                EXPECT_EQ(exported.error, "");
                EXPECT_EQ(exported.log, std::vector<std::string>{});
                const auto out = decodeSound(path("out.mp4"));
                EXPECT_EQ(out.bytes, source.bytes);
                EXPECT_EQ(out.rate, 48000);
                EXPECT_NEAR(static_cast<double>(out.start), static_cast<double>(source.start), 48);
                EXPECT_NEAR(static_cast<double>(out.length()), static_cast<double>(source.length()), 48);
            }
        }
}

TEST_F(KeepingSound, PacketsThatDoNotSayHowLongTheyLastAreKept)
{
    for (const char* encoder : {"libopus", "flac", "alac", "libmp3lame", "aac"})
        for (const char* name : {"fragments.mp4", "source.mkv"}) {
            SCOPED_TRACE(encoder + std::string(" in ") + name);
            makeSoundFile(path(name), {track(encoder)});
            const auto exported = exportSound(path(name), path("out.mp4"), 0, -1);
            EXPECT_EQ(exported.error, "");
            EXPECT_EQ(exported.log, std::vector<std::string>{});
            const auto source = decodeSound(path(name));
            const auto out = decodeSound(path("out.mp4"));
            EXPECT_EQ(out.bytes, source.bytes);
            EXPECT_EQ(out.errors, 0);
            // Matroska rounds its times to milliseconds.
            for (const std::int64_t place : {4800, 150000}) {
                double alike = 0;
                EXPECT_LE(std::abs(latenessOf(out, place, source, place, 24000, 60, &alike)), 48) << place;
                EXPECT_GT(alike, 0.99) << place;
            }
        }
}

TEST_F(KeepingSound, AacOfTwiceTheRateIsCutToTheSampleByEncodingIt)
{
    for (const auto doubled : {DoubledRate::InHeader, DoubledRate::InPackets}) {
        auto spec = track("aac");
        spec.rate = 24000;
        spec.doubled = doubled;
        makeSoundFile(path("source.mp4"), {spec});
        const auto source = decodeSound(path("source.mp4"));
        const auto exported = exportSound(path("source.mp4"), path("out.mp4"), 1.1, 3.3);
        EXPECT_EQ(exported.error, "");
        EXPECT_EQ(exported.log.size(), 1u);
        const auto out = decodeSound(path("out.mp4"));
        EXPECT_EQ(out.rate, 48000);
        EXPECT_NEAR(static_cast<double>(out.length()), 2.2 * 48000, 2048);
        for (std::int64_t i = 0; i < 100000; i += 7)
            ASSERT_NEAR(out.at(i, 0), source.at(i + std::llround(1.1 * 48000), 0), 0.02) << i;
    }
}

TEST_F(KeepingSound, TracksOfTwiceTheRateAreMixedAtIt)
{
    auto app = track("aac");
    app.rate = 24000;
    app.doubled = DoubledRate::InPackets;
    auto microphone = app;
    microphone.channels = 1;
    microphone.doubled = DoubledRate::InHeader;
    makeSoundFile(path("source.mp4"), {app, microphone});
    const auto exported = exportSound(path("source.mp4"), path("out.mp4"), 0, -1, mixOfAll(path("source.mp4")));
    EXPECT_EQ(exported.log, std::vector<std::string>{});
    const auto first = decodeSound(path("source.mp4"), 0);
    const auto second = decodeSound(path("source.mp4"), 1);
    const auto out = decodeSound(path("out.mp4"));
    EXPECT_EQ(out.rate, 48000);
    for (std::int64_t i = 4800; i < 180000; i += 7) {
        const double sum = static_cast<double>(first.at(i, 0)) + static_cast<double>(second.at(i, 0));
        if (std::abs(sum) < 0.5) { // elsewhere it is kept from clipping
            ASSERT_NEAR(out.at(i, 0), sum, 0.05) << i;
        }
    }
}

TEST_F(KeepingSound, WhatIsNoLongerWantedEndsSoon)
{
    makeSoundFile(path("source.webm"), {track("libvorbis", 6)});
    auto file = ffmpeg::OpenFile::open(path("source.webm"));
    const auto movie = ffmpeg::Movie::open(std::move(file).value(), nullptr);
    const auto cancelled = std::make_shared<std::atomic<bool>>(false);
    const ffmpeg::ExportRange range{base::MediaTime::make(0, 1000), base::MediaTime::make(5000, 1000)};
    auto sources = ffmpeg::openSoundSources(movie.value(), range, std::nullopt, ffmpeg::SoundMode::Copy, cancelled,
                                            [](const std::string&) {});
    ASSERT_EQ(sources.value().size(), 1u);
    *cancelled = true;
    const auto packet = ffmpeg::newPacket();
    const auto next = sources.value()[0]->next(*packet);
    ASSERT_FALSE(next);
    EXPECT_EQ(next.error()->code(), AVERROR_EXIT);
    EXPECT_FALSE(ffmpeg::openSoundSources(movie.value(), range, std::nullopt, ffmpeg::SoundMode::Copy, cancelled,
                                          [](const std::string&) {}));
}

} // namespace
