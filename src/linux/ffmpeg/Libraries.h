/// The FFmpeg libraries, with owners for what they hand out. Only sources of this folder include it.
#pragma once

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/display.h>
#include <libavutil/imgutils.h>
#include <libavutil/opt.h>
#include <libavutil/pixdesc.h>
#include <libswresample/swresample.h>
#include <libswscale/swscale.h>
}

#include "linux/ffmpeg/Words.h"

#include <memory>

namespace ffmpeg {

struct Freeing {
    void operator()(AVFormatContext* context) const { avformat_close_input(&context); }
    void operator()(AVCodecContext* context) const { avcodec_free_context(&context); }
    void operator()(AVFrame* frame) const { av_frame_free(&frame); }
    void operator()(AVPacket* packet) const { av_packet_free(&packet); }
    void operator()(AVDictionary* dictionary) const { av_dict_free(&dictionary); }
    void operator()(SwsContext* context) const { sws_freeContext(context); }
    void operator()(SwrContext* context) const { swr_free(&context); }
    void operator()(AVIOContext* context) const
    {
        av_freep(&context->buffer);
        avio_context_free(&context);
    }
};

template <typename T> using Owned = std::unique_ptr<T, Freeing>;

inline Owned<AVFrame> newFrame()
{
    return Owned<AVFrame>(av_frame_alloc());
}

inline Owned<AVPacket> newPacket()
{
    return Owned<AVPacket>(av_packet_alloc());
}

} // namespace ffmpeg
