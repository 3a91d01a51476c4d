#include "ExportedSound.h"

#include "SoundOutput.h"

#include <gtest/gtest.h>

#include <cstdint>

namespace tests {

using namespace ffmpeg;

platform::AudioMix mixOfAll(const std::string& path)
{
    auto file = OpenFile::open(path);
    const auto opened = Movie::open(std::move(file).value(), nullptr);
    platform::AudioMix mix;
    for (const auto& track : opened.value()->tracks())
        if (track.type == platform::MediaType::Audio)
            mix.inputs.push_back({track.trackID});
    return mix;
}

ExportedSound exportSound(const std::string& from, const std::string& into, double start, double to,
                          const std::optional<platform::AudioMix>& mix)
{
    ExportedSound result;
    auto file = OpenFile::open(from);
    if (!file) {
        result.error = file.error()->description();
        return result;
    }
    const auto opened = Movie::open(std::move(file).value(), nullptr);
    if (!opened) {
        result.error = opened.error()->description();
        return result;
    }
    const ExportRange range{base::MediaTime::fromSeconds(start, 90000),
                            to < 0 ? opened.value()->duration() : base::MediaTime::fromSeconds(to, 90000)};
    auto sources = openSoundSources(opened.value(), range, mix, SoundMode::Copy, nullptr,
                                    [&](const std::string& line) { result.log.push_back(line); });
    if (!sources) {
        result.error = sources.error()->description();
        return result;
    }
    result.tracks = sources.value().size();
    if (sources.value().empty())
        return result;
    const auto output = newOutput(into);
    std::vector<AVRational> timeBases;
    for (const auto& source : sources.value()) {
        AVStream* stream = avformat_new_stream(output.get(), nullptr);
        const auto described = source->describe(*stream);
        EXPECT_TRUE(described);
        timeBases.push_back(stream->time_base);
    }
    AVDictionary* options = nullptr;
    av_dict_set(&options, "avoid_negative_ts", "disabled", 0);
    av_dict_set(&options, "movie_timescale", "90000", 0);
    output->strict_std_compliance = FF_COMPLIANCE_EXPERIMENTAL; // for FLAC
    const int begun = avformat_write_header(output.get(), &options);
    av_dict_free(&options);
    EXPECT_GE(begun, 0);
    if (begun < 0)
        return result;
    const auto packet = newPacket();
    for (std::size_t i = 0; i < sources.value().size(); ++i) {
        std::int64_t last = INT64_MIN;
        for (;;) {
            const auto more = sources.value()[i]->next(*packet);
            if (!more) {
                result.error = more.error()->description();
                break;
            }
            if (!more.value())
                break;
            EXPECT_GT(packet->dts, last) << "decode times must grow";
            EXPECT_GT(packet->duration, 0);
            last = packet->dts;
            packet->stream_index = static_cast<int>(i);
            av_packet_rescale_ts(packet.get(), timeBases[i], output->streams[i]->time_base);
            EXPECT_GE(av_write_frame(output.get(), packet.get()), 0);
        }
    }
    EXPECT_GE(av_write_trailer(output.get()), 0);
    return result;
}

} // namespace tests
