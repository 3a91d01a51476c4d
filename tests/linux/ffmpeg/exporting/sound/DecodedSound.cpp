#include "linux/ffmpeg/exporting/sound/DecodedSound.h"

#include "linux/ffmpeg/Libraries.h"

#include <gtest/gtest.h>

#include <cmath>

namespace tests {

using namespace ffmpeg;

DecodedSound decodeSound(const std::string& path, int track, bool everything)
{
    DecodedSound sound;
    AVFormatContext* opened = nullptr;
    AVDictionary* options = nullptr;
    if (everything)
        av_dict_set(&options, "ignore_editlist", "1", 0);
    const int error = avformat_open_input(&opened, path.c_str(), nullptr, &options);
    av_dict_free(&options);
    EXPECT_GE(error, 0) << path;
    if (error < 0)
        return sound;
    Owned<AVFormatContext> context(opened);
    EXPECT_GE(avformat_find_stream_info(opened, nullptr), 0);
    const AVStream* stream = nullptr;
    for (unsigned i = 0, sounds = 0; i < context->nb_streams; ++i)
        if (context->streams[i]->codecpar->codec_type == AVMEDIA_TYPE_AUDIO && static_cast<int>(sounds++) == track)
            stream = context->streams[i];
    EXPECT_TRUE(stream) << path << " has no sound track " << track;
    if (!stream)
        return sound;
    const auto text = [&](const char* key) {
        const auto* entry = av_dict_get(stream->metadata, key, nullptr, 0);
        return std::string(entry ? entry->value : "");
    };
    sound.language = text("language");
    sound.handler = text("handler_name");
    sound.disposition = stream->disposition;
    sound.codec = avcodec_get_name(stream->codecpar->codec_id);
    sound.profile = stream->codecpar->profile;
    const AVCodec* codec = avcodec_find_decoder(stream->codecpar->codec_id);
    Owned<AVCodecContext> decoder(avcodec_alloc_context3(codec));
    avcodec_parameters_to_context(decoder.get(), stream->codecpar);
    decoder->pkt_timebase = stream->time_base;
    if (everything)
        decoder->flags2 |= AV_CODEC_FLAG2_SKIP_MANUAL;
    EXPECT_GE(avcodec_open2(decoder.get(), codec, nullptr), 0);
    const auto packet = newPacket();
    const auto frame = newFrame();
    bool isFirst = true;
    const auto take = [&] {
        while (avcodec_receive_frame(decoder.get(), frame.get()) >= 0) {
            SwrContext* made = nullptr;
            AVChannelLayout layout = frame->ch_layout;
            swr_alloc_set_opts2(&made, &layout, AV_SAMPLE_FMT_FLTP, frame->sample_rate, &layout,
                                static_cast<AVSampleFormat>(frame->format), frame->sample_rate, 0, nullptr);
            Owned<SwrContext> converter(made);
            swr_init(made);
            std::vector<std::vector<float>> planes(static_cast<std::size_t>(frame->ch_layout.nb_channels),
                                                   std::vector<float>(static_cast<std::size_t>(frame->nb_samples)));
            std::vector<std::uint8_t*> pointers;
            for (auto& plane : planes)
                pointers.push_back(reinterpret_cast<std::uint8_t*>(plane.data()));
            swr_convert(made, pointers.data(), frame->nb_samples,
                        const_cast<const std::uint8_t**>(frame->extended_data), frame->nb_samples);
            // What a decoder gives at the very end may have no time of its own.
            const std::int64_t at = frame->pts == AV_NOPTS_VALUE
                                        ? sound.start + static_cast<std::int64_t>(sound.length())
                                        : av_rescale_q(frame->pts, stream->time_base, {1, frame->sample_rate});
            if (isFirst)
                sound.start = at;
            isFirst = false;
            sound.rate = frame->sample_rate;
            sound.channels.resize(planes.size());
            // Gaps are silent.
            const std::int64_t gap = at - sound.start - static_cast<std::int64_t>(sound.length());
            for (std::size_t channel = 0; channel < planes.size(); ++channel) {
                if (gap > sound.rate / 500)
                    sound.channels[channel].resize(sound.channels[channel].size() + static_cast<std::size_t>(gap));
                sound.channels[channel].insert(sound.channels[channel].end(), planes[channel].begin(),
                                               planes[channel].end());
            }
        }
    };
    while (av_read_frame(context.get(), packet.get()) >= 0) {
        if (packet->stream_index == stream->index) {
            if (sound.packets++ == 0)
                sound.firstPts = av_rescale_q(packet->pts, stream->time_base, {1, stream->codecpar->sample_rate});
            sound.bytes.emplace_back(packet->data, packet->data + packet->size);
            if (avcodec_send_packet(decoder.get(), packet.get()) < 0)
                ++sound.errors;
            take();
        }
        av_packet_unref(packet.get());
    }
    avcodec_send_packet(decoder.get(), nullptr);
    take();
    return sound;
}

std::int64_t latenessOf(const DecodedSound& cut, std::int64_t at, const DecodedSound& source, std::int64_t sourceAt,
                        std::int64_t samples, std::int64_t farthest, double* likeness)
{
    constexpr std::size_t kStep = 3; // sounds to compare have nothing in the highest octave
    const auto taken = [](const DecodedSound& sound, std::int64_t from, std::int64_t count) {
        std::vector<double> part;
        for (std::int64_t i = from; i < from + count; ++i)
            part.push_back(static_cast<double>(sound.at(i, 0)));
        return part;
    };
    const std::vector<double> there = taken(source, sourceAt, samples);
    const std::vector<double> here = taken(cut, at - farthest, samples + 2 * farthest);
    double loudness = 0;
    for (std::size_t i = 0; i < there.size(); i += kStep)
        loudness += there[i] * there[i];
    double best = -2;
    std::int64_t found = 0;
    for (std::int64_t lag = -farthest; lag <= farthest; ++lag) {
        const double* moved = here.data() + (lag + farthest);
        double sum = 0;
        double own = 0;
        for (std::size_t i = 0; i < there.size(); i += kStep) {
            sum += moved[i] * there[i];
            own += moved[i] * moved[i];
        }
        const double alike = own > 0 && loudness > 0 ? sum / std::sqrt(own * loudness) : -1;
        if (alike > best) {
            best = alike;
            found = lag;
        }
    }
    if (likeness)
        *likeness = best;
    return found;
}

} // namespace tests
