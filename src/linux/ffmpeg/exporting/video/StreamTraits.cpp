#include "linux/ffmpeg/exporting/video/StreamTraits.h"

#include "linux/ffmpeg/bitstream/HdrMetadata.h"

#include <algorithm>

namespace ffmpeg {

base::Result<void> describeLike(const AVStream& source, const AVFrame& picture, AVRational timeBase, AVStream& output)
{
    int error = avcodec_parameters_copy(output.codecpar, source.codecpar);
    if (error >= 0)
        error = av_dict_copy(&output.metadata, source.metadata, 0);
    for (int i = 0; error >= 0 && i < source.nb_side_data; ++i) {
        const AVPacketSideData& data = source.side_data[i];
        std::uint8_t* copy = av_stream_new_side_data(&output, data.type, data.size);
        if (!copy)
            error = AVERROR(ENOMEM);
        else
            std::copy_n(data.data, data.size, copy);
    }
    if (error < 0)
        return base::Error::make("ffmpeg", error, textOf(error));
    // The muxer has words of its own for these.
    for (const char* key : {"encoder", "vendor_id", "DURATION", "DURATION-eng", "BPS", "BPS-eng", "timecode"})
        av_dict_set(&output.metadata, key, nullptr, 0);
    output.codecpar->codec_tag = 0;
    output.time_base = timeBase;
    output.disposition = source.disposition;
    output.avg_frame_rate = source.avg_frame_rate;
    output.sample_aspect_ratio =
        source.sample_aspect_ratio.num ? source.sample_aspect_ratio : source.codecpar->sample_aspect_ratio;
    return HdrMetadata::of(source, picture).describe(output);
}

std::int64_t usualStep(const AVStream& source, AVRational timeBase)
{
    for (const AVRational rate : {source.avg_frame_rate, source.r_frame_rate}) {
        if (rate.num > 0 && rate.den > 0)
            return std::max<std::int64_t>(1, av_rescale_q(1, av_inv_q(rate), timeBase));
    }
    return std::max<std::int64_t>(1, av_rescale_q(1, {1, 30}, timeBase));
}

} // namespace ffmpeg
