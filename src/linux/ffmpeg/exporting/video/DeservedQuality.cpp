#include "linux/ffmpeg/exporting/video/DeservedQuality.h"

#include "linux/ffmpeg/VideoDecoder.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <string>
#include <vector>

namespace ffmpeg {

namespace {

constexpr int kPictures = 4;
constexpr double kMoreThanSource = 2.25;
/// Where less is to be seen it says nothing of what comes behind it: a black screen, for one.
constexpr std::int64_t kPixelsAByte = 400;

struct Sample {
    std::vector<FrameRef> pictures;
    std::int64_t bytes = 0; ///< of their packets
};

/// What the keyframe before `outTick` begins.
Sample sampleAt(PicturePackets& packets, std::int64_t outTick)
{
    Sample sample;
    const auto decoder =
        VideoDecoder::open(packets.stream(), packets.track(), 1, nullptr, VideoDecoder::Size::OfStream);
    if (!decoder)
        return sample;
    const auto receive = [&] {
        while (FrameRef picture = decoder.value()->receive())
            sample.pictures.push_back(std::move(picture));
    };
    packets.seek(outTick);
    const auto packet = newPacket();
    for (int i = 0; i < kPictures && packets.read(*packet) == 0; ++i) {
        sample.bytes += packet->size;
        decoder.value()->send(*packet);
        receive();
    }
    decoder.value()->finish();
    receive();
    return sample;
}

/// What the encoder makes of it in bytes; nothing when it fails.
std::int64_t encodedBytes(const PicturePackets& packets, const Sample& sample, const EncoderRequest& request,
                          Splicer& splicer)
{
    const auto encoder = PictureEncoder::open(request);
    if (!encoder)
        return 0;
    std::int64_t bytes = 0;
    const auto take = [&] {
        while (const auto packet = encoder.value()->take())
            if (splicer.adoptEncoded(*packet)) // without what encoders say of themselves
                bytes += packet->size;
    };
    std::int64_t last = std::numeric_limits<std::int64_t>::min();
    for (const FrameRef& picture : sample.pictures) {
        const AVFrame& coded = picture->picture();
        if (coded.width != request.width || coded.height != request.height || coded.format != request.format)
            return 0;
        const std::int64_t pts = packets.outTick(picture->pts()); // encoders go by how long pictures last
        if (pts <= last || !encoder.value()->encode(coded, pts, packets.outTicks(coded.pkt_duration)))
            continue;
        last = pts;
        take();
    }
    if (!encoder.value()->finish())
        return 0;
    take();
    return bytes;
}

} // namespace

int deservedQuality(PicturePackets& packets, std::int64_t outTick, EncoderRequest request, Splicer& splicer)
{
    const QualityScale& scale = request.scale.value();
    const Sample sample = sampleAt(packets, outTick);
    request.options["crf"] = std::to_string(scale.trial);
    if (sample.bytes <= std::int64_t(request.width) * request.height / kPixelsAByte)
        return scale.trial;
    const std::int64_t tried = encodedBytes(packets, sample, request, splicer);
    if (tried <= 0)
        return scale.finest;
    const double tooMuch = static_cast<double>(tried) / static_cast<double>(sample.bytes) / kMoreThanSource;
    const double crf = scale.trial + scale.stepsAHalf * std::log2(tooMuch);
    return static_cast<int>(std::lround(std::clamp<double>(crf, scale.finest, scale.coarsest)));
}

} // namespace ffmpeg
