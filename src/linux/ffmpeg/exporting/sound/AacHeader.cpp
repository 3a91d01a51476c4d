#include "linux/ffmpeg/exporting/sound/AacHeader.h"

#include "linux/ffmpeg/bitstream/Bits.h"
#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/sound/AacFrame.h"
#include "linux/ffmpeg/exporting/sound/SoundDecoder.h"

#include <algorithm>
#include <array>

namespace ffmpeg {

namespace {

/// By their numbers in a header (ISO/IEC 14496-3, 1.6.3.4).
constexpr std::array kRates = {96000, 88200, 64000, 48000, 44100, 32000, 24000, 22050, 16000, 12000, 11025, 8000, 7350};
/// Twice of that is as much as anybody hears; nobody doubles more.
constexpr int kFastestDoubled = 24000;
constexpr int kAacLc = 2;
constexpr int kMostChannels = 8;

int placeOf(int rate)
{
    const auto found = std::find(kRates.begin(), kRates.end(), rate);
    return found == kRates.end() ? -1 : static_cast<int>(found - kRates.begin());
}

bool writeHeader(AVCodecParameters& parameters, int rate, int channels)
{
    const int place = placeOf(rate);
    if (place < 0 || channels < 1 || channels == 7 || channels > kMostChannels)
        return false;
    BitWriter bits;
    bits.bits(kAacLc, 5);
    bits.bits(static_cast<unsigned>(place), 4);
    bits.bits(channels == kMostChannels ? 7 : static_cast<unsigned>(channels), 4);
    bits.bits(0, 3); // frames of 1,024 samples, no core, no extension
    return setExtradata(parameters, bits.bytes());
}

/// Containers often say stereo of a track that is not.
int channelsIn(const AVPacket& packet, int said)
{
    constexpr int kSingle = 0;
    constexpr int kPair = 1;
    const int first = packet.size > 0 ? packet.data[0] >> 5 : -1;
    return said > 2 ? said : first == kSingle ? 1 : first == kPair ? 2 : said;
}

} // namespace

bool hasOwnAacHeader(const AVPacket& packet)
{
    // Twelve bits that are set, and a layer of 0; no packet of plain AAC begins with its end.
    return packet.size > 1 && packet.data[0] == 0xff && (packet.data[1] & 0xf6) == 0xf0;
}

bool mayHoldMoreThanItSays(const AVCodecParameters& parameters)
{
    if (!isPlainAac(parameters))
        return true;
    BitReader bits({parameters.extradata, static_cast<std::size_t>(parameters.extradata_size)});
    bits.skip(5);
    const std::uint32_t place = bits.bits(4);
    return place >= kRates.size() || kRates.at(place) <= kFastestDoubled;
}

std::optional<AacHeard> hearAac(const AVCodecParameters& parameters, const std::vector<Owned<AVPacket>>& packets)
{
    const auto decoder = SoundDecoder::open(parameters, {1, std::max(1, parameters.sample_rate)});
    if (!decoder)
        return std::nullopt;
    for (const auto& packet : packets) {
        if (!decoder->send(packet.get()))
            continue;
        if (const AVFrame* frame = decoder->receive(); frame && frame->nb_samples > 0)
            return AacHeard{frame->sample_rate, frame->ch_layout.nb_channels, frame->nb_samples};
    }
    return std::nullopt;
}

bool makeAacHeader(AVCodecParameters& parameters, const std::vector<Owned<AVPacket>>& packets, AVRational ticks)
{
    if (packets.empty())
        return false;
    // Containers name the rate that is heard, which may be twice the one that is coded.
    int rate = parameters.sample_rate;
    const std::int64_t samples = av_rescale_q(packets.front()->duration, ticks, {1, std::max(1, rate)});
    if (samples == 2 * kAacFrame)
        rate /= 2;
    return writeHeader(parameters, rate, channelsIn(*packets.front(), parameters.ch_layout.nb_channels))
           && hearAac(parameters, packets);
}

} // namespace ffmpeg
