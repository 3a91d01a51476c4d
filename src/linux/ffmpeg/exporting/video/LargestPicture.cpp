#include "linux/ffmpeg/exporting/video/LargestPicture.h"

#include "linux/ffmpeg/VideoDecoder.h"

#include <thread>

namespace ffmpeg {

namespace {

enum class SizeChanges { Never, AtKeyframes, Anywhere };

SizeChanges sizeChangesOf(AVCodecID codec)
{
    if (codec == AV_CODEC_ID_VP9 || codec == AV_CODEC_ID_AV1)
        return SizeChanges::Anywhere;
    // Where every picture is a keyframe, looking at all would take as long as encoding; nobody records such with two sizes.
    const AVCodecDescriptor* about = avcodec_descriptor_get(codec);
    return about && (about->props & AV_CODEC_PROP_INTRA_ONLY) ? SizeChanges::Never : SizeChanges::AtKeyframes;
}

std::int64_t areaOf(const FrameRef& frame)
{
    return std::int64_t{frame->picture().width} * frame->picture().height;
}

} // namespace

base::Result<FrameRef> largestPicture(PicturePackets& packets, std::int64_t start, std::int64_t end)
{
    FrameRef largest = packets.movie().firstFrame();
    const SizeChanges changes = sizeChangesOf(packets.stream().codecpar->codec_id);
    if (changes == SizeChanges::Never)
        return largest;
    const int threads = static_cast<int>(std::thread::hardware_concurrency()) + 1;
    const auto decoder = VideoDecoder::open(packets.stream(), packets.track(), threads);
    if (!decoder)
        return decoder.error();
    const auto takeAll = [&] {
        while (const FrameRef frame = decoder.value()->receive())
            if (areaOf(frame) > areaOf(largest))
                largest = frame;
    };
    packets.seek(start);
    const auto packet = newPacket();
    int behind = 0;
    while (behind <= PicturePackets::kFarthestReorder && packets.read(*packet) == 0) {
        const bool isBehind = packet->pts != AV_NOPTS_VALUE && packets.outTick(packet->pts) >= end;
        behind += isBehind;
        if (isBehind || (changes == SizeChanges::AtKeyframes && !(packet->flags & AV_PKT_FLAG_KEY)))
            continue;
        decoder.value()->send(*packet);
        takeAll();
    }
    decoder.value()->finish();
    takeAll();
    if (packets.isCancelled())
        return base::Error::make("ffmpeg", AVERROR_EXIT, "it is no longer wanted");
    return largest;
}

} // namespace ffmpeg
