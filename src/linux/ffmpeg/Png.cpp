#include "linux/ffmpeg/Png.h"

#include "linux/ffmpeg/Libraries.h"

#include <algorithm>
#include <cstddef>

namespace ffmpeg {

namespace {

base::ErrorRef failure(int error)
{
    return base::Error::make("ffmpeg", error, "a picture cannot be written as PNG: " + textOf(error));
}

void copyWithoutAlpha(const platform::Bitmap& from, AVFrame& to)
{
    for (int y = 0; y < from.height; ++y) {
        std::uint8_t* pixel = to.data[0] + std::ptrdiff_t(y) * to.linesize[0];
        for (int x = 0; x < from.width; ++x, pixel += 3) {
            const std::uint8_t* source = from.at(x, y);
            std::copy(source, source + 3, pixel);
        }
    }
}

} // namespace

base::Result<std::vector<std::uint8_t>> pngOf(const platform::Bitmap& bitmap)
{
    const AVCodec* codec = avcodec_find_encoder(AV_CODEC_ID_PNG);
    if (!codec)
        return failure(AVERROR_ENCODER_NOT_FOUND);
    Owned<AVCodecContext> context(avcodec_alloc_context3(codec));
    const Owned<AVFrame> frame = newFrame();
    context->width = frame->width = bitmap.width;
    context->height = frame->height = bitmap.height;
    context->pix_fmt = AV_PIX_FMT_RGB24;
    frame->format = AV_PIX_FMT_RGB24;
    context->time_base = {1, 1};
    context->thread_count = 1;
    int error = avcodec_open2(context.get(), codec, nullptr);
    if (error >= 0)
        error = av_frame_get_buffer(frame.get(), 0);
    if (error < 0)
        return failure(error);
    copyWithoutAlpha(bitmap, *frame);
    const Owned<AVPacket> packet = newPacket();
    error = avcodec_send_frame(context.get(), frame.get());
    if (error >= 0)
        error = avcodec_receive_packet(context.get(), packet.get());
    if (error < 0)
        return failure(error);
    return std::vector<std::uint8_t>(packet->data, packet->data + packet->size);
}

} // namespace ffmpeg
