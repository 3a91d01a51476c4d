#include "SoundFiles.h"

#include "SoundOutput.h"

#include "linux/ffmpeg/exporting/sound/AacFrame.h"

extern "C" {
#include <libavutil/intreadwrite.h>
}

#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <iterator>
#include <memory>
#include <random>

namespace tests {

using namespace ffmpeg;

namespace {

Owned<AVCodecContext> newEncoder(const SoundTrackSpec& spec)
{
    const AVCodec* codec = avcodec_find_encoder_by_name(spec.encoder.c_str());
    EXPECT_TRUE(codec) << spec.encoder;
    Owned<AVCodecContext> context(avcodec_alloc_context3(codec));
    context->sample_fmt = codec->sample_fmts ? codec->sample_fmts[0] : AV_SAMPLE_FMT_FLTP;
    context->sample_rate = spec.rate;
    context->time_base = {1, spec.rate};
    context->flags |= AV_CODEC_FLAG_GLOBAL_HEADER | AV_CODEC_FLAG_BITEXACT;
    context->bit_rate = spec.bitRate;
    context->thread_count = 1;
    if (spec.encoder == "aac")
        av_opt_set_int(context->priv_data, "aac_pns", 0, 0); // noise that differs each time cannot be compared
    av_channel_layout_default(&context->ch_layout, spec.channels);
    EXPECT_GE(avcodec_open2(context.get(), codec, nullptr), 0) << spec.encoder;
    return context;
}

void putSample(AVFrame& frame, int channel, int index, double value)
{
    const int channels = frame.ch_layout.nb_channels;
    const bool isPlanar = av_sample_fmt_is_planar(static_cast<AVSampleFormat>(frame.format));
    std::uint8_t* data = frame.extended_data[isPlanar ? channel : 0];
    const int at = isPlanar ? index : index * channels + channel;
    switch (av_get_packed_sample_fmt(static_cast<AVSampleFormat>(frame.format))) {
    case AV_SAMPLE_FMT_S16:
        reinterpret_cast<std::int16_t*>(data)[at] =
            static_cast<std::int16_t>(std::lrint(std::clamp(value * 32768, -32768.0, 32767.0)));
        break;
    case AV_SAMPLE_FMT_S32:
        reinterpret_cast<std::int32_t*>(data)[at] =
            static_cast<std::int32_t>(std::llrint(std::clamp(value, -1.0, 0.999999) * 2147483648.0));
        break;
    default:
        reinterpret_cast<float*>(data)[at] = static_cast<float>(value);
    }
}

Owned<AVFrame> newSoundFrame(const AVCodecContext& encoder, int count, std::int64_t pts)
{
    auto frame = newFrame();
    frame->format = encoder.sample_fmt;
    frame->sample_rate = encoder.sample_rate;
    frame->nb_samples = count;
    frame->pts = pts;
    av_channel_layout_copy(&frame->ch_layout, &encoder.ch_layout);
    EXPECT_GE(av_frame_get_buffer(frame.get(), 0), 0);
    return frame;
}

struct EncodedSound {
    Owned<AVCodecContext> encoder;
    std::vector<Owned<AVPacket>> packets;
};

EncodedSound encodeSound(const SoundTrackSpec& spec)
{
    EncodedSound encoded{newEncoder(spec), {}};
    AVCodecContext& encoder = *encoded.encoder;
    const int size = encoder.frame_size > 0 ? encoder.frame_size : 1024;
    const auto total = static_cast<std::int64_t>(spec.seconds * spec.rate);
    const auto drain = [&] {
        for (auto packet = newPacket(); avcodec_receive_packet(&encoder, packet.get()) >= 0; packet = newPacket())
            encoded.packets.push_back(std::move(packet));
    };
    for (std::int64_t at = 0; at < total; at += size) {
        const int count = static_cast<int>(std::min<std::int64_t>(size, total - at));
        const auto frame = newSoundFrame(encoder, count, at);
        for (int channel = 0; channel < spec.channels; ++channel)
            for (int i = 0; i < count; ++i)
                putSample(*frame, channel, i, spec.signal(static_cast<double>(at + i) / spec.rate, channel));
        EXPECT_GE(avcodec_send_frame(&encoder, frame.get()), 0);
        drain();
    }
    avcodec_send_frame(&encoder, nullptr);
    drain();
    return encoded;
}

/// What a packet of AAC says at its end: that the upper half of the band follows, of which there is nothing.
void addUpperBand(AVPacket& packet)
{
    constexpr unsigned kFill = 6;
    constexpr unsigned kUpperBand = 13;
    constexpr unsigned kEnd = 7;
    std::vector<bool> bits;
    for (int i = 0; i < packet.size * 8; ++i)
        bits.push_back(packet.data[i / 8] >> (7 - i % 8) & 1);
    while (!bits.back())
        bits.pop_back();
    bits.resize(bits.size() - 3); // the end
    const auto append = [&](unsigned value, int count) {
        for (int i = count; i-- > 0;)
            bits.push_back(value >> i & 1);
    };
    append(kFill, 3);
    append(1, 4); // byte
    append(kUpperBand, 4);
    append(0, 4);
    append(kEnd, 3);
    auto longer = newPacket();
    ASSERT_GE(av_new_packet(longer.get(), static_cast<int>((bits.size() + 7) / 8)), 0);
    std::fill_n(longer->data, longer->size, std::uint8_t{0});
    for (std::size_t i = 0; i < bits.size(); ++i)
        longer->data[i / 8] = static_cast<std::uint8_t>(longer->data[i / 8] | (bits[i] ? 0x80 >> i % 8 : 0));
    av_packet_copy_props(longer.get(), &packet);
    av_packet_unref(&packet);
    av_packet_move_ref(&packet, longer.get());
}

void doubleRate(const SoundTrackSpec& spec, AVCodecParameters& parameters)
{
    if (spec.doubled == DoubledRate::No)
        return;
    // Behind what plain AAC needs, the encoder says that nothing is doubled.
    ASSERT_EQ(parameters.extradata_size, 5);
    constexpr int kFasterBy = 3; // places in the table of rates
    const int place = (parameters.extradata[0] & 7) << 1 | parameters.extradata[1] >> 7;
    if (spec.doubled == DoubledRate::InPackets)
        parameters.extradata_size = 2;
    else
        parameters.extradata[4] = static_cast<std::uint8_t>(0x80 | (place - kFasterBy) << 3);
    parameters.sample_rate = 2 * spec.rate;
    parameters.frame_size *= 2;
}

std::string bytesOf(const std::string& path)
{
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

void writeTracks(const std::string& path, const std::vector<SoundTrackSpec>& specs, std::vector<EncodedSound> tracks)
{
    const auto output = newOutput(path);
    for (std::size_t i = 0; i < tracks.size(); ++i) {
        AVStream* stream = avformat_new_stream(output.get(), nullptr);
        avcodec_parameters_from_context(stream->codecpar, tracks[i].encoder.get());
        stream->codecpar->codec_tag = 0;
        doubleRate(specs[i], *stream->codecpar);
        stream->time_base = {1, specs[i].rate};
        stream->disposition = specs[i].isDefault ? AV_DISPOSITION_DEFAULT : 0;
        if (!specs[i].language.empty())
            av_dict_set(&stream->metadata, "language", specs[i].language.c_str(), 0);
        if (!specs[i].handler.empty())
            av_dict_set(&stream->metadata, "handler_name", specs[i].handler.c_str(), 0);
    }
    output->strict_std_compliance = FF_COMPLIANCE_EXPERIMENTAL; // for FLAC
    AVDictionary* options = nullptr;
    av_dict_set(&options, "avoid_negative_ts", path.ends_with(".mp4") ? "disabled" : "auto", 0);
    if (path.find("fragments") != std::string::npos)
        av_dict_set(&options, "movflags", "frag_keyframe+empty_moov+default_base_moof", 0);
    ASSERT_GE(avformat_write_header(output.get(), &options), 0) << path;
    av_dict_free(&options);
    std::vector<std::size_t> next(tracks.size());
    for (;;) {
        std::size_t chosen = tracks.size();
        double earliest = 0;
        for (std::size_t i = 0; i < tracks.size(); ++i) {
            if (next[i] == tracks[i].packets.size())
                continue;
            const double at = static_cast<double>(tracks[i].packets[next[i]]->pts) / specs[i].rate + specs[i].start;
            if (chosen == tracks.size() || at < earliest) {
                chosen = i;
                earliest = at;
            }
        }
        if (chosen == tracks.size())
            break;
        AVPacket& packet = *tracks[chosen].packets[next[chosen]++];
        packet.pts += std::llround(specs[chosen].start * specs[chosen].rate);
        packet.dts = packet.pts;
        if (specs[chosen].doubled == DoubledRate::InPackets)
            addUpperBand(packet);
        packet.stream_index = static_cast<int>(chosen);
        av_packet_rescale_ts(&packet, {1, specs[chosen].rate}, output->streams[chosen]->time_base);
        ASSERT_GE(av_interleaved_write_frame(output.get(), &packet), 0);
    }
    ASSERT_GE(av_write_trailer(output.get()), 0);
}

} // namespace

void makeSoundFile(const std::string& path, const std::vector<SoundTrackSpec>& tracks)
{
    std::vector<EncodedSound> encoded;
    for (const auto& track : tracks)
        encoded.push_back(encodeSound(track));
    writeTracks(path, tracks, std::move(encoded));
}

void replaceIn(const std::string& path, const std::string& what, const std::string& with)
{
    std::string bytes = bytesOf(path);
    for (auto at = bytes.find(what); at != std::string::npos; at = bytes.find(what, at + with.size()))
        bytes.replace(at, what.size(), with);
    std::ofstream(path, std::ios::binary) << bytes;
}

void removeAacHeaders(const std::string& path)
{
    replaceIn(path, "\x05\x80\x80\x80", "\x7f\x80\x80\x80"); // a tag that nobody knows
}

void damagePackets(const std::string& path)
{
    std::string bytes = bytesOf(path);
    const auto begin = bytes.find("mdat") + 4;
    const auto end = bytes.find("moov") - 4;
    std::minstd_rand random(1);
    for (auto at = begin; at < end; ++at)
        bytes[at] = static_cast<char>(random() % 127);
    std::ofstream(path, std::ios::binary) << bytes;
}

void makeSineWindowedFile(const std::string& path, const SoundTrackSpec& spec)
{
    // Each packet spans two frames, and needs each bent in its own way: two encoders make every other packet each.
    EncodedSound both{newEncoder(spec), {}};
    const auto frames = static_cast<std::int64_t>(spec.seconds * spec.rate) / kAacFrame;
    std::vector<Owned<AVPacket>> made[2];
    for (int odd = 0; odd < 2; ++odd) {
        const auto encoder = newEncoder(spec);
        const auto drain = [&] {
            for (auto packet = newPacket(); avcodec_receive_packet(encoder.get(), packet.get()) >= 0;
                 packet = newPacket())
                made[odd].push_back(std::move(packet));
        };
        for (std::int64_t index = 0; index < frames; ++index) {
            const auto frame = newSoundFrame(*encoder, kAacFrame, index * kAacFrame);
            for (int channel = 0; channel < spec.channels; ++channel) {
                auto* samples = reinterpret_cast<float*>(frame->extended_data[channel]);
                for (int i = 0; i < kAacFrame; ++i)
                    samples[i] = static_cast<float>(
                        spec.signal(static_cast<double>(index * kAacFrame + i) / spec.rate, channel));
                // Packet p spans the frames p - 1 and p.
                if ((index + 1) % 2 == odd)
                    bendForRisingHalf({samples, kAacFrame}, 1, 0);
                else
                    bendForFallingHalf({samples, kAacFrame}, 1, 0);
            }
            ASSERT_GE(avcodec_send_frame(encoder.get(), frame.get()), 0);
            drain();
        }
        avcodec_send_frame(encoder.get(), nullptr);
        drain();
    }
    for (std::size_t i = 0; i < made[0].size(); ++i) {
        auto packet = std::move(made[i % 2][i]);
        const auto windows = aacWindowsOf(*packet, spec.channels);
        ASSERT_TRUE(windows && windows->isOfAll);
        const bool isAtEnd = i <= 10 || i + 3 >= made[0].size();
        ASSERT_TRUE(isAtEnd || windows->sequence == AacWindows::Sequence::Long) << "packet " << i << " is restless";
        if (windows->sequence == AacWindows::Sequence::Long && windows->shape == 1) {
            ASSERT_GE(av_packet_make_writable(packet.get()), 0);
            setAacShape(*packet, *windows, 0);
        }
        both.packets.push_back(std::move(packet));
    }
    std::vector<EncodedSound> tracks;
    tracks.push_back(std::move(both));
    writeTracks(path, {spec}, std::move(tracks));
}

} // namespace tests
